#pragma once
// Styled buttons. All take their colours and font from the style manager
// (hostview/StyleRoles.h) and fall back to the platform palette without one.
// Clicks are reported by QAbstractButton::clicked and by commandClicked(id)
// with the button's command id, which is what the views dispatch on.
#include <QAbstractButton>
#include <QPixmap>
#include <optional>
#include <string>

#include "hostview/Services.h"
#include "hostview/Types.h"

// Turns a terminal image path into a pixmap: through the style manager when
// one is given (IStyleManager::ResolveImagePath with its style id), otherwise
// as a file path with "\" read as "/" and a leading ".\" dropped. A null
// pixmap when the image cannot be read.
HV_API QPixmap LoadHostImage(const std::wstring& path, const IStyleManager* styleManager);

class HV_API CHostButton : public QAbstractButton {
  Q_OBJECT
 public:
  explicit CHostButton(QWidget* parent = nullptr, int commandId = 0);

  virtual void SetStyleManager(IStyleManager* styleManager);
  IStyleManager* GetStyleManager() const { return m_styleManager; }
  void SetCommandId(int id) { m_commandId = id; }
  int GetCommandId() const { return m_commandId; }
  void SetWindowText(const std::wstring& text) { setText(QString::fromStdWString(text)); }
  std::wstring GetWindowText() const { return text().toStdWString(); }
  void SetTooltipText(const std::wstring& text) { setToolTip(QString::fromStdWString(text)); }
  // Explicit colours win over the style's.
  void SetBkColor(COLORREF color) { m_back = color; update(); }
  void SetTextColor(COLORREF color) { m_text = color; update(); }
  QColor BackgroundColor() const;
  QColor ForegroundColor() const;

  QSize sizeHint() const override;

 signals:
  void commandClicked(int commandId);

 protected:
  void enterEvent(QEnterEvent* event) override;
  void leaveEvent(QEvent* event) override;
  bool IsHot() const { return m_hot; }
  QColor Role(int role, QColor fallback) const;

  IStyleManager* m_styleManager = nullptr;

 private:
  int m_commandId = 0;
  std::optional<COLORREF> m_back, m_text;
  bool m_hot = false;
};

// A button drawn from a bitmap. The bitmap may hold 1 to 4 states side by side
// of equal width: normal, under the pointer, pressed, disabled. Without a
// bitmap it draws its text.
class HV_API CImageButton : public CHostButton {
  Q_OBJECT
 public:
  explicit CImageButton(QWidget* parent = nullptr, int commandId = 0);
  // False when the image cannot be read (the button keeps drawing its text).
  bool LoadBitmap(const std::wstring& path, int stateCount = 1);
  void SetBitmap(const QPixmap& pixmap, int stateCount = 1);
  bool HasBitmap() const { return !m_image.isNull(); }
  const std::wstring& GetBitmapPath() const { return m_path; }
  QSize sizeHint() const override;

 protected:
  void paintEvent(QPaintEvent* event) override;
  QPixmap StateImage() const;

 private:
  QPixmap m_image;
  int m_states = 1;
  std::wstring m_path;
};

// A bitmap or text button that can also act as a check box (SetCheckBox):
// a click then toggles the check mark, shown as a box before the text.
class HV_API CButtonEx : public CImageButton {
  Q_OBJECT
 public:
  explicit CButtonEx(QWidget* parent = nullptr, int commandId = 0);
  void SetCheckBox(bool checkBox);
  bool IsCheckBox() const { return isCheckable(); }
  void SetCheck(bool checked) { setChecked(checked); }
  bool GetCheck() const { return isChecked(); }
  QSize sizeHint() const override;

 protected:
  void paintEvent(QPaintEvent* event) override;
};

// The terminal's text push button: a flat or raised face in the style's colours.
class HV_API CBranticButton : public CHostButton {
  Q_OBJECT
 public:
  explicit CBranticButton(QWidget* parent = nullptr, int commandId = 0);
  void SetFlat(bool flat) { m_flat = flat; update(); }
  bool IsFlat() const { return m_flat; }

 protected:
  void paintEvent(QPaintEvent* event) override;

 private:
  bool m_flat = false;
};
