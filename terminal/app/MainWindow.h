#pragma once
// The terminal's main window: every view lives in a dock of its own that can be
// tabbed with others, floated and docked again. The window knows views only as
// CSuperBaseView; what to do with them is the application's business (signals).
#include <QDockWidget>
#include <QMainWindow>
#include <QPointer>
#include <map>
#include <vector>

#include "hostview/DragData.h"

class CSuperBaseView;
class QActionGroup;
class QLabel;
class QMenu;
class QMimeData;

namespace term {

// Mime types of an instrument drag between docks (hostview/DragData.h).
inline constexpr const char* kLinkMimeType = hv::drag::kLinkMimeType;
inline constexpr const char* kSourceMimeType = hv::drag::kSourceMimeType;

// A menu text that shows "&" as itself rather than as a mnemonic.
QString MenuText(QString text);

class ViewDock : public QDockWidget {
  Q_OBJECT
 public:
  // `name`: the class's name for a person ("Market Depth"), the title until
  // the view says otherwise.
  ViewDock(CSuperBaseView* view, const QString& className, const QString& name, int instance, QWidget* parent);
  CSuperBaseView* View() const { return m_view; }
  const QString& ClassName() const { return m_className; }
  int Instance() const { return m_instance; }
  // The title before numbering: the view's own, else the class's name.
  QString BaseTitle() const { return m_viewTitle.isEmpty() ? m_name : m_viewTitle; }
  void SetViewTitle(const QString& title) { m_viewTitle = title; }
  void SetName(const QString& name) { m_name = name; }

 signals:
  void closing(ViewDock* dock);
  void dropped(ViewDock* dock, const QString& sourceClass, const QString& link);

 protected:
  void closeEvent(QCloseEvent* event) override;
  void dragEnterEvent(QDragEnterEvent* event) override;
  void dragMoveEvent(QDragMoveEvent* event) override;
  void dropEvent(QDropEvent* event) override;

 private:
  bool Accepts(const QMimeData* mime) const;
  QPointer<CSuperBaseView> m_view;
  QString m_className;
  QString m_name;
  QString m_viewTitle;
  int m_instance;
};

class MainWindow : public QMainWindow {
  Q_OBJECT
 public:
  struct Style {
    int id;
    QString name;
  };
  // A class the View menu offers, with its name for a person.
  struct ViewClass {
    QString className;
    QString name;
  };
  // `addonClasses`, `terminalClasses`: what the View menu offers; `styles`: the style switch.
  MainWindow(const std::vector<ViewClass>& addonClasses, const std::vector<ViewClass>& terminalClasses,
             const std::vector<Style>& styles, int currentStyle);
  ~MainWindow() override;

  // Puts a created view into a new dock (tabbed with a dock of the same class
  // when there is one). `objectName` restores a saved dock; empty makes a new one.
  ViewDock* AddView(CSuperBaseView* view, const QString& className, const QString& objectName = {});
  // The name a person reads for a class (the View menu's), the class name when unknown.
  QString NameOf(const QString& className) const;
  // New names after the language changed: the View menu and untitled docks.
  void SetClassNames(const std::vector<ViewClass>& classes);
  // Docks in opening order.
  std::vector<ViewDock*> Docks() const;
  ViewDock* DockOf(const CSuperBaseView* view) const;
  // The view's own title (empty: its class's name). Docks with the same title
  // are numbered in opening order ("Price View", "Price View 2").
  void SetViewTitle(CSuperBaseView* view, const QString& title);
  // The title shown in the status bar for the active view.
  QString ActiveTitle() const;
  // Makes `view` the active one (raises its tab); emits activationChanged as needed.
  void ActivateView(CSuperBaseView* view);
  CSuperBaseView* ActiveView() const;
  // Closes and deletes every dock (the views die with them).
  void CloseAllViews();
  // Tells the user something without stopping the program (status bar + log).
  void ShowNotice(const QString& text);

 signals:
  void openRequested(const QString& className);
  void activationChanged(CSuperBaseView* view, bool active);
  void viewClosing(CSuperBaseView* view);
  void styleRequested(int styleId);
  void languageReloadRequested();
  void fontSizeRequested();
  void settingsRequested();
  void saveLayoutRequested();
  void exportWatchlistsRequested();
  void importWatchlistsRequested();
  void dropRequested(CSuperBaseView* target, const QString& sourceClass, const QString& link);
  void closingWindow();

 protected:
  bool eventFilter(QObject* watched, QEvent* event) override;
  void closeEvent(QCloseEvent* event) override;

 private:
  void BuildMenus(const std::vector<ViewClass>& addonClasses, const std::vector<ViewClass>& terminalClasses,
                  const std::vector<Style>& styles, int currentStyle);
  void RefreshTitles();
  void OnFocusChanged(QWidget* old, QWidget* now);
  void SetActiveDock(ViewDock* dock);
  void OnDockClosing(ViewDock* dock);
  ViewDock* DockAt(QObject* o) const;

  std::vector<QPointer<ViewDock>> m_docks;
  QPointer<ViewDock> m_active;
  QMenu* m_windowMenu = nullptr;
  QMenu* m_viewMenu = nullptr;
  QLabel* m_activeTitle = nullptr;
  std::map<QString, QString> m_names;  // class name -> name for a person
  bool m_closingAll = false;
};

}  // namespace term
