#pragma once
// A clickable link text (CHyperlinkStatic) and a styled tool tip (CPPToolTip).
#include <QPointer>
#include <QWidget>
#include <functional>
#include <map>
#include <string>

#include "hostview/Services.h"
#include "hostview/Types.h"

// A text that opens a web address when clicked. The address is handed to the
// process-wide URL opener (by default the desktop's browser); tests and the
// headless terminal replace it with SetUrlOpener.
class HV_API CHyperlinkStatic : public QWidget {
  Q_OBJECT
 public:
  using UrlOpener = std::function<bool(const QString& url)>;

  explicit CHyperlinkStatic(QWidget* parent = nullptr);
  void SetStyleManager(IStyleManager* styleManager);
  void SetCaption(const std::wstring& caption);
  const std::wstring& GetCaption() const { return m_caption; }
  void SetHyperlink(const std::wstring& url);
  const std::wstring& GetHyperlink() const { return m_url; }
  void SetLinkColor(COLORREF color);
  // Opens the link as a click does; false when there is none or opening failed.
  bool OpenLink();
  // Replaces the opener; an empty function restores the desktop one.
  static void SetUrlOpener(UrlOpener opener);

  QSize sizeHint() const override;

 signals:
  void linkClicked(QString url);

 protected:
  void paintEvent(QPaintEvent* event) override;
  void mouseReleaseEvent(QMouseEvent* event) override;
  void keyPressEvent(QKeyEvent* event) override;

 private:
  IStyleManager* m_styleManager = nullptr;
  std::wstring m_caption;
  std::wstring m_url;
  QColor m_color;
  bool m_hasColor = false;
};

// A tool tip window in the style's colours. Texts may hold simple HTML.
// Tools are widgets: hovering one shows its text below the pointer, leaving it
// hides it. ShowHelpTooltip shows a text at a given place for widgets that
// manage areas themselves (grid cells).
class HV_API CPPToolTip : public QWidget {
  Q_OBJECT
 public:
  explicit CPPToolTip(QWidget* parent = nullptr);
  ~CPPToolTip() override;
  void SetStyleManager(IStyleManager* styleManager);
  void AddTool(QWidget* tool, const std::wstring& text);
  void UpdateTipText(const std::wstring& text, QWidget* tool);
  void RemoveTool(QWidget* tool);
  bool HasTool(QWidget* tool) const { return m_tools.count(tool) != 0; }
  std::wstring GetToolText(QWidget* tool) const;
  void ShowHelpTooltip(QPoint globalPos, const std::wstring& text);
  void HideTooltip();
  bool IsShown() const { return isVisible(); }
  std::wstring GetShownText() const { return m_text; }

 protected:
  bool eventFilter(QObject* watched, QEvent* event) override;
  void paintEvent(QPaintEvent* event) override;

 private:
  IStyleManager* m_styleManager = nullptr;
  std::map<QWidget*, std::wstring> m_tools;
  std::wstring m_text;
};
