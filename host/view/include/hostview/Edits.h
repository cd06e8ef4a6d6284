#pragma once
// Styled edits: free text (CBranticEdit), a decimal number (CFloatEdit), the
// arrow pair that steps a number (CBranticSpinBt) and a date picker
// (CptDatetimeCtrl). Each takes SetStyleManager.
#include <QDate>
#include <QDateEdit>
#include <QLineEdit>
#include <QPointer>
#include <QWidget>
#include <string>

#include "hostview/Services.h"
#include "hostview/Types.h"

class QPlainTextEdit;
class QToolButton;

// Applies the edit colours and font of the style (or the palette's) to `w`.
HV_API void ApplyEditStyle(QWidget* w, const IStyleManager* styleManager);

// Single-line or multi-line text. Multi-line has a vertical scroll bar and a border.
class HV_API CBranticEdit : public QWidget {
  Q_OBJECT
 public:
  explicit CBranticEdit(QWidget* parent = nullptr, bool multiLine = false);
  void SetStyleManager(IStyleManager* styleManager);
  void SetMultiLine(bool multiLine);  // keeps the text
  bool IsMultiLine() const { return m_multi != nullptr; }
  void SetWindowText(const std::wstring& text);
  std::wstring GetWindowText() const;
  void SetReadOnly(bool readOnly);
  // Longest text in characters; 0 = no limit. Longer input is cut.
  void SetLimitText(int limit);
  QWidget* Editor() const;  // the inner line or text edit

 signals:
  void textChanged();

 private:
  void Enforce();

  IStyleManager* m_styleManager = nullptr;
  QLineEdit* m_line = nullptr;
  QPlainTextEdit* m_multi = nullptr;
  int m_limit = 0;
  bool m_readOnly = false;
};

// A decimal number with a fixed number of decimals (0..10). Typing is limited
// to digits, one "." and the allowed number of decimals; a "-" only when the
// range allows negatives (the range is 0 to 1e15 until SetRange). Separators
// are never typed; the value is plain. Values are rounded as Double2Str does;
// on leaving the edit the text is shown with all decimals and within range.
class HV_API CFloatEdit : public QLineEdit {
  Q_OBJECT
 public:
  explicit CFloatEdit(QWidget* parent = nullptr, int decimals = 2);
  void SetStyleManager(IStyleManager* styleManager);
  // Re-shows the current value with the new number of decimals.
  void SetDecimals(int decimals);
  int GetDecimals() const { return m_decimals; }
  // Shows `value` rounded to the decimals (clamped to the range).
  void SetValue(double value);
  // The typed number; 0 when the text is empty or not a number.
  double GetValue() const;
  bool HasValue() const;  // the text is a number
  void SetRange(double min, double max);
  double GetMin() const { return m_min; }
  double GetMax() const { return m_max; }
  void Clear() { clear(); }

 signals:
  void valueChanged(double value);

 private:
  void UpdateValidator();
  int m_decimals = 2;
  double m_min = 0.0;
  double m_max = 1e15;
};

// Up and down arrows stepping a position, with an optional buddy edit.
// A press first emits positionChanging(delta) (delta +1 up, -1 down) so that
// the owner can prepare the step, then moves the position within the range
// and emits scrolled(position). With a CFloatEdit buddy and a buddy step set,
// the buddy's value also moves by delta x step (never below the buddy's minimum).
class HV_API CBranticSpinBt : public QWidget {
  Q_OBJECT
 public:
  explicit CBranticSpinBt(QWidget* parent = nullptr, int ctrlId = 0);
  void SetStyleManager(IStyleManager* styleManager);
  void SetCtrlId(int id) { m_ctrlId = id; }
  int GetCtrlId() const { return m_ctrlId; }
  // The Up and Down keys in the buddy step as the arrows do.
  void SetBuddy(QWidget* buddy);
  QWidget* GetBuddy() const { return m_buddy; }
  void SetBuddyStep(double step) { m_buddyStep = step; }
  void SetRange(int min, int max);
  void SetPos(int pos);
  int GetPos() const { return m_pos; }
  // The same as pressing an arrow.
  void Step(int delta);

 signals:
  void positionChanging(int delta);
  void scrolled(int position);

 protected:
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  IStyleManager* m_styleManager = nullptr;
  QToolButton* m_up = nullptr;
  QToolButton* m_down = nullptr;
  QPointer<QWidget> m_buddy;
  int m_ctrlId = 0;
  int m_min = -1000000;
  int m_max = 1000000;
  int m_pos = 0;
  double m_buddyStep = 0.0;
};

// A date with a drop-down calendar, limited to a range. The format uses the
// tokens d, dd, ddd, MMM, MMMM, M, MM, yy, yyyy ("dd MMM yyyy"); month names
// are English whatever the machine's locale.
class HV_API CptDatetimeCtrl : public QDateEdit {
  Q_OBJECT
 public:
  explicit CptDatetimeCtrl(QWidget* parent = nullptr);
  void SetStyleManager(IStyleManager* styleManager);
  void SetFormat(const std::wstring& format);
  // A date outside the new range is moved into it. min after max is refused.
  bool SetRange(const QDate& min, const QDate& max);
  void GetRange(QDate& min, QDate& max) const;
  // False (nothing changes) for an invalid date; a date out of range is clamped.
  bool SetTime(const QDate& date);
  QDate GetTime() const { return date(); }
};
