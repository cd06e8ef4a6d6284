#pragma once
// The terminal's caption bar for pop-up dialogs: the dialog's title on the
// style's colours, with quick buttons (close, help, ...) at the right. The bar
// is a child widget laid over the top of the dialog; the dialog's contents
// margins grow by its height so that laid-out children start below it. A
// dialog that paints at fixed places should start at GetTitleHeight().
// Dragging the bar moves the dialog.
#include <QObject>
#include <QPointer>
#include <QWidget>
#include <functional>
#include <string>
#include <vector>

#include "hostview/Services.h"
#include "hostview/Types.h"

class CImageButton;

class HV_API CBranticTitle : public QObject {
  Q_OBJECT
 public:
  using CommandHandler = std::function<void(int commandId)>;

  explicit CBranticTitle(QObject* parent = nullptr);
  ~CBranticTitle() override;

  // Puts the bar on `window`; call it before the window is shown. A top-level
  // window loses its system frame, and with it resizing by the frame (unless
  // SetMDIChild was called: a child window keeps its place in its parent and
  // is moved within it). False when `window` is null; a second call moves the
  // bar to the new window.
  bool SubClassWnd(QWidget* window);
  QWidget* GetWindow() const { return m_window; }
  void SetMDIChild(bool isChild = true) { m_mdiChild = isChild; }
  bool IsMDIChild() const { return m_mdiChild; }

  void SetStyleManager(IStyleManager* styleManager);
  // Re-reads colours and font, and the quick buttons' images for `styleId`
  // ("[styleID]" in their paths is replaced by it).
  void UpdateTitleStyle(int styleId);

  void RemoveAllQuickButtons();
  // Adds a button at the right end; its click reports `commandId`. The image
  // path is a terminal image path (see LoadHostImage); a button whose image
  // cannot be read shows the first letter of its tooltip. False when a button
  // with that id exists already.
  bool AddQuickButton(int commandId, const std::wstring& bitmapPath, const std::wstring& tooltip);
  int GetQuickButtonCount() const { return static_cast<int>(m_buttons.size()); }
  std::vector<int> GetQuickButtonIds() const;
  CImageButton* GetQuickButton(int commandId) const;

  // Clicks reach the handler and the signal, in that order.
  void SetCommandHandler(CommandHandler handler) { m_handler = std::move(handler); }

  // Caption shown; by default the window's title, followed as it changes.
  void SetTitleText(const std::wstring& text);
  std::wstring GetTitleText() const;
  int GetTitleHeight() const;
  QWidget* GetBar() const { return m_bar; }

 signals:
  void quickButtonClicked(int commandId);

 protected:
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  friend class BranticTitleBar;
  struct QuickButton {
    int commandId = 0;
    std::wstring path;
    std::wstring tooltip;
    QPointer<CImageButton> button;
  };

  void Detach();
  void Layout();
  void LoadButtonImage(QuickButton& b);
  void OnButton(int commandId);

  QPointer<QWidget> m_window;
  QPointer<QWidget> m_bar;
  IStyleManager* m_styleManager = nullptr;
  int m_styleId = 0;
  bool m_mdiChild = false;
  bool m_hasOwnText = false;
  std::wstring m_text;
  QMargins m_savedMargins;
  std::vector<QuickButton> m_buttons;
  CommandHandler m_handler;
};
