#pragma once
// The two legends of the price view: CLSTipDlg explains the long/short status
// codes, CRemTipDlg the exchange's remark codes (with a link to the broker's
// site). The view creates both once, fills them and shows them next to the
// pointer; the dialogs only draw. Painting works at the fixed places of the
// legend layout, below the caption bar.
//
//   CLSTipDlg tip(view);
//   tip.SetLanguage(language); tip.SetStyleManager(style);
//   tip.Create(); tip.ApplyStyle(styleId);
//   tip.SetRows({L"L/S :New trades for both Long and Short", ...});
//   tip.move(pos); tip.show();
//
// UI thread only; timer 34 goes through platform/ (virtual clock in tests).
#include <QDialog>
#include <QFont>
#include <string>
#include <utility>
#include <vector>

#include "hostview/Services.h"
#include "platform/Platform.h"

class CBranticTitle;
class CHyperlinkStatic;

// The legend table: rows drawn from the board's first visible row down, 18
// pixels apart. Kind "LS": one text per row, its first four characters in the
// code font and the rest from x 74; kind "Remark": code, ": " and definition.
class CCustomBoard : public QWidget {
  Q_OBJECT
 public:
  static constexpr int kId = 9001;
  static constexpr int kRowHeight = 18;
  static constexpr int kFirstRowY = 3;
  // Style font ids of the code and of the text.
  static constexpr int kCodeFont = 54;
  static constexpr int kTextFont = 53;

  CCustomBoard(QWidget* parent, std::wstring kind);
  const std::wstring& Kind() const { return m_kind; }

  void SetStyleManager(IStyleManager* style) { m_style = style; }
  void SetStyleID(int styleId);
  void SetColors(const QColor& back, const QColor& text);
  // "LS": one text per row.
  void SetTexts(std::vector<std::wstring> rows);
  // "Remark": (code, definition) pairs.
  void SetPairs(std::vector<std::pair<std::wstring, std::wstring>> rows);
  int RowCount() const;
  // The first row drawn (0 at creation); the mouse wheel moves it.
  void SetFirstRow(int row);
  int FirstRow() const { return m_first; }
  // The rows drawn at the current size, from the first visible row on.
  int VisibleRowCount() const;

 protected:
  void paintEvent(QPaintEvent* e) override;
  void wheelEvent(QWheelEvent* e) override;

 private:
  QFont Font(int id) const;

  std::wstring m_kind;
  IStyleManager* m_style = nullptr;
  int m_styleId = 0;
  QColor m_back{255, 255, 255}, m_text{0, 0, 0};
  std::vector<std::wstring> m_texts;
  std::vector<std::pair<std::wstring, std::wstring>> m_pairs;
  int m_first = 0;
};

// What both legends share.
class CTipDialogBase : public QDialog, public platform::TimerHandler {
  Q_OBJECT
 public:
  static constexpr UINT kFontTimer = 34;
  static constexpr UINT kFontTimerMs = 300;
  static constexpr int kCloseCommand = 11000;
  static constexpr int kLinkId = 1000;
  static constexpr int kLinkFont = 40;
  static constexpr int kTemplateId = 1008;
  static constexpr const wchar_t* kCloseImage = L"images/QuickBar/[styleID]/toclose.bmp";

  CTipDialogBase(QWidget* parent, std::wstring title, std::wstring boardKind, int boardRight);
  ~CTipDialogBase() override;

  void SetLanguage(ILanguage* language) { m_language = language; }
  void SetStyleManager(IStyleManager* style);
  // Builds the title bar, the legend board and the link (the creation step).
  void Create();
  bool IsCreated() const { return m_board != nullptr; }
  // Quick buttons, colours, board and link colours; restarts timer 34.
  void ApplyStyle(int styleId);
  void OnTimer(UINT id) override;

  const std::wstring& TitleText() const { return m_title; }
  CBranticTitle* Title() const { return m_titleBar; }
  CCustomBoard* Board() const { return m_board; }
  CHyperlinkStatic* Link() const { return m_link; }
  QColor BackColor() const { return m_back; }
  QColor TextColor() const { return m_text; }

 protected:
  void paintEvent(QPaintEvent* e) override;
  // What each legend draws over the background at (20, 20) and below.
  virtual void PaintTexts(QPainter& p, int top) = 0;
  virtual void OnCreated() {}
  std::wstring LanguageText(int entry) const;
  // Top of the client area below the caption bar.
  int ContentTop() const;

  ILanguage* m_language = nullptr;
  IStyleManager* m_style = nullptr;
  int m_styleId = 0;
  std::wstring m_title;
  std::wstring m_boardKind;
  int m_boardRight;
  CBranticTitle* m_titleBar = nullptr;
  CCustomBoard* m_board = nullptr;
  CHyperlinkStatic* m_link = nullptr;
  QColor m_back{255, 255, 255}, m_text{0, 0, 0};
};

class CLSTipDlg : public CTipDialogBase {
  Q_OBJECT
 public:
  explicit CLSTipDlg(QWidget* parent = nullptr);
  // The five texts of the long/short legend.
  static std::vector<std::wstring> LegendTexts();

 protected:
  void PaintTexts(QPainter& p, int top) override;
  void OnCreated() override;
};

class CRemTipDlg : public CTipDialogBase {
  Q_OBJECT
 public:
  static constexpr const wchar_t* kBrokerSite = L"https://www.brantic.example/remarks";
  explicit CRemTipDlg(QWidget* parent = nullptr);
  // Set when the dialog was closed with OK (or its close button).
  bool WasClosed() const { return m_closed; }
  // Where text 30 starts: x 120 when it holds "click" after its first character, else 177.
  static int ClickTextX(const std::wstring& text);

 protected:
  void PaintTexts(QPainter& p, int top) override;
  void OnCreated() override;
  void done(int result) override;

 private:
  bool m_closed = false;
};
