#include "terminal/app/MainWindow.h"

#include <QAction>
#include <QActionGroup>
#include <QApplication>
#include <QCloseEvent>
#include <QLabel>
#include <QMenuBar>
#include <QMimeData>
#include <QStatusBar>

#include "hostview/SuperBaseView.h"

namespace term {

QString MenuText(QString text) { return text.replace('&', QStringLiteral("&&")); }

// ---- ViewDock ---------------------------------------------------------------

ViewDock::ViewDock(CSuperBaseView* view, const QString& className, const QString& name, int instance, QWidget* parent)
    : QDockWidget(parent), m_view(view), m_className(className), m_name(name), m_instance(instance) {
  setObjectName(QString("dock-%1-%2").arg(className).arg(instance));
  setWindowTitle(name);
  setFeatures(QDockWidget::DockWidgetClosable | QDockWidget::DockWidgetMovable | QDockWidget::DockWidgetFloatable);
  setAcceptDrops(true);
  setWidget(view);
}

void ViewDock::closeEvent(QCloseEvent* event) {
  // Closing a dock closes its view for good (not just hides it).
  emit closing(this);
  QDockWidget::closeEvent(event);
  deleteLater();
}

bool ViewDock::Accepts(const QMimeData* mime) const {
  if (!m_view || !mime->hasFormat(kLinkMimeType)) return false;
  const QByteArray source = mime->data(kSourceMimeType);
  return source.isEmpty() ? m_view->EnableDropIn() : m_view->EnableDropIn(source.constData());
}

void ViewDock::dragEnterEvent(QDragEnterEvent* event) {
  if (Accepts(event->mimeData())) event->acceptProposedAction(); else event->ignore();
}

void ViewDock::dragMoveEvent(QDragMoveEvent* event) {
  if (Accepts(event->mimeData())) event->acceptProposedAction(); else event->ignore();
}

void ViewDock::dropEvent(QDropEvent* event) {
  if (!Accepts(event->mimeData())) { event->ignore(); return; }
  event->acceptProposedAction();
  emit dropped(this, QString::fromUtf8(event->mimeData()->data(kSourceMimeType)),
               QString::fromUtf8(event->mimeData()->data(kLinkMimeType)));
}

// ---- MainWindow -------------------------------------------------------------

MainWindow::MainWindow(const std::vector<ViewClass>& addonClasses, const std::vector<ViewClass>& terminalClasses,
                       const std::vector<Style>& styles, int currentStyle) {
  setObjectName("terminal-main-window");
  setWindowTitle("Brantic Terminal");
  setDockOptions(QMainWindow::AnimatedDocks | QMainWindow::AllowTabbedDocks | QMainWindow::AllowNestedDocks |
                 QMainWindow::GroupedDragging);
  setDockNestingEnabled(true);
  setTabPosition(Qt::AllDockWidgetAreas, QTabWidget::North);
  resize(1400, 900);
  BuildMenus(addonClasses, terminalClasses, styles, currentStyle);
  // The active view's title stays in the status bar; notices show over it for a while.
  m_activeTitle = new QLabel(this);
  m_activeTitle->setObjectName("active-view-title");
  statusBar()->addWidget(m_activeTitle, 1);
  connect(qApp, &QApplication::focusChanged, this, &MainWindow::OnFocusChanged);
  qApp->installEventFilter(this);
  // Clicking a tab of tabbed docks activates that view.
  connect(this, &QMainWindow::tabifiedDockWidgetActivated, this,
          [this](QDockWidget* d) { SetActiveDock(qobject_cast<ViewDock*>(d)); });
}

MainWindow::~MainWindow() {
  // Children die after this body: no focus or dock signal may reach a half-destroyed window.
  qApp->removeEventFilter(this);
  disconnect(qApp, nullptr, this, nullptr);
  disconnect(this, nullptr, this, nullptr);
  for (ViewDock* d : Docks()) disconnect(d, nullptr, this, nullptr);
}

void MainWindow::BuildMenus(const std::vector<ViewClass>& addonClasses, const std::vector<ViewClass>& terminalClasses,
                            const std::vector<Style>& styles, int currentStyle) {
  QMenu* file = menuBar()->addMenu("&File");
  file->addAction("&Settings...", this, &MainWindow::settingsRequested);
  file->addAction("Save &layout", this, &MainWindow::saveLayoutRequested);
  file->addSeparator();
  file->addAction("&Export watchlists...", this, &MainWindow::exportWatchlistsRequested);
  file->addAction("&Import watchlists...", this, &MainWindow::importWatchlistsRequested);
  file->addSeparator();
  QAction* quit = file->addAction("&Quit", this, &QWidget::close);
  quit->setShortcut(QKeySequence::Quit);

  m_viewMenu = menuBar()->addMenu("&View");
  auto addOpen = [&](const ViewClass& c) {
    m_names[c.className] = c.name;
    QAction* a = m_viewMenu->addAction(MenuText(c.name));
    a->setObjectName("open-" + c.className);
    a->setStatusTip(c.className);
    connect(a, &QAction::triggered, this, [this, cls = c.className] { emit openRequested(cls); });
  };
  for (const ViewClass& c : addonClasses) addOpen(c);
  m_viewMenu->addSeparator();
  for (const ViewClass& c : terminalClasses) addOpen(c);

  QMenu* display = menuBar()->addMenu("&Display");
  auto* group = new QActionGroup(this);
  for (const auto& s : styles) {
    QAction* a = display->addAction(s.name);
    a->setCheckable(true);
    a->setChecked(s.id == currentStyle);
    group->addAction(a);
    const int id = s.id;
    connect(a, &QAction::triggered, this, [this, id] { emit styleRequested(id); });
  }
  display->addSeparator();
  display->addAction("&Font size...", this, &MainWindow::fontSizeRequested);
  display->addAction("&Reload language texts", this, &MainWindow::languageReloadRequested);

  m_windowMenu = menuBar()->addMenu("&Window");
  connect(m_windowMenu, &QMenu::aboutToShow, this, [this] {
    m_windowMenu->clear();
    m_windowMenu->addAction("Dock all floating views", this, [this] {
      for (ViewDock* d : Docks()) d->setFloating(false);
    });
    m_windowMenu->addSeparator();
    for (ViewDock* d : Docks()) {
      QAction* a = m_windowMenu->addAction(MenuText(d->windowTitle()));
      connect(a, &QAction::triggered, this, [this, p = QPointer<ViewDock>(d)] {
        if (p) ActivateView(p->View());
      });
    }
  });
}

ViewDock* MainWindow::AddView(CSuperBaseView* view, const QString& className, const QString& objectName) {
  int instance = 1;
  if (!objectName.isEmpty()) {
    // "dock-<Class>-<n>": keep the saved number so the saved state finds the dock.
    bool ok = false;
    const int n = objectName.section('-', -1).toInt(&ok);
    if (ok && n > 0) instance = n;
  }
  for (bool taken = true; taken;) {
    taken = false;
    for (ViewDock* d : Docks())
      if (d->ClassName() == className && d->Instance() == instance) { taken = true; ++instance; break; }
  }
  auto* dock = new ViewDock(view, className, NameOf(className), instance, this);
  // Tab it with the newest dock of the same class. Otherwise it gets a place of
  // its own in its side of the window, up to three per side; beyond that it is
  // tabbed with the last one so no view is squeezed to nothing.
  static const QStringList kLeft = {"CPriceViewAdv", "CInsExpViewEx", "CPriceAlertList", "CNewPriceAlertAdv"};
  const Qt::DockWidgetArea area = kLeft.contains(className) ? Qt::LeftDockWidgetArea : Qt::RightDockWidgetArea;
  ViewDock* sibling = nullptr;
  for (ViewDock* d : Docks())
    if (d->ClassName() == className && !d->isFloating()) sibling = d;
  std::vector<ViewDock*> heads;  // one dock per place in the area
  for (ViewDock* d : Docks()) {
    if (d->isFloating() || dockWidgetArea(d) != area) continue;
    bool grouped = false;
    for (ViewDock* h : heads)
      if (tabifiedDockWidgets(h).contains(d)) grouped = true;
    if (!grouped) heads.push_back(d);
  }
  if (!sibling && heads.size() >= 3) sibling = heads.back();
  addDockWidget(area, dock, Qt::Vertical);
  if (sibling) {
    tabifyDockWidget(sibling, dock);
  } else {
    QList<QDockWidget*> column(heads.begin(), heads.end());
    column << dock;
    QList<int> heights;
    for (int i = 0; i < column.size(); ++i) heights << std::max(200, height() / static_cast<int>(column.size()));
    resizeDocks(column, heights, Qt::Vertical);
    if (heads.empty()) {
      // A side's first view: the two sides share the width.
      QList<QDockWidget*> row{dock};
      resizeDocks(row, {width() / 2}, Qt::Horizontal);
    }
  }
  m_docks.push_back(dock);
  connect(dock, &ViewDock::closing, this, &MainWindow::OnDockClosing);
  connect(dock, &ViewDock::dropped, this, [this](ViewDock* d, const QString& source, const QString& link) {
    if (d->View()) emit dropRequested(d->View(), source, link);
  });
  dock->show();
  RefreshTitles();
  return dock;
}

QString MainWindow::NameOf(const QString& className) const {
  auto it = m_names.find(className);
  return it == m_names.end() || it->second.isEmpty() ? className : it->second;
}

void MainWindow::SetClassNames(const std::vector<ViewClass>& classes) {
  for (const ViewClass& c : classes) {
    m_names[c.className] = c.name;
    if (QAction* a = m_viewMenu->findChild<QAction*>("open-" + c.className)) a->setText(MenuText(NameOf(c.className)));
  }
  for (ViewDock* d : Docks()) d->SetName(NameOf(d->ClassName()));
  RefreshTitles();
}

void MainWindow::RefreshTitles() {
  std::map<QString, int> seen;
  for (ViewDock* d : Docks()) {
    const QString base = d->BaseTitle();
    const int n = ++seen[base];
    const QString title = n > 1 ? QString("%1 %2").arg(base).arg(n) : base;
    if (d->windowTitle() != title) d->setWindowTitle(title);
  }
  m_activeTitle->setText(ActiveTitle());
}

QString MainWindow::ActiveTitle() const { return m_active && m_active->View() ? m_active->windowTitle() : QString(); }

std::vector<ViewDock*> MainWindow::Docks() const {
  std::vector<ViewDock*> out;
  for (const auto& d : m_docks)
    if (d && d->View()) out.push_back(d);
  return out;
}

ViewDock* MainWindow::DockOf(const CSuperBaseView* view) const {
  for (ViewDock* d : Docks())
    if (d->View() == view) return d;
  return nullptr;
}

ViewDock* MainWindow::DockAt(QObject* o) const {
  for (; o; o = o->parent())
    if (auto* d = qobject_cast<ViewDock*>(o)) return d->View() ? d : nullptr;
  return nullptr;
}

void MainWindow::SetViewTitle(CSuperBaseView* view, const QString& title) {
  ViewDock* d = DockOf(view);
  if (!d) return;
  d->SetViewTitle(title.trimmed());
  RefreshTitles();
}

CSuperBaseView* MainWindow::ActiveView() const { return m_active ? m_active->View() : nullptr; }

void MainWindow::ActivateView(CSuperBaseView* view) {
  ViewDock* d = DockOf(view);
  if (!d) return;
  d->show();
  d->raise();
  SetActiveDock(d);
}

void MainWindow::SetActiveDock(ViewDock* dock) {
  if (dock == m_active || m_closingAll) return;
  ViewDock* old = m_active;
  m_active = dock;
  if (old && old->View()) emit activationChanged(old->View(), false);
  if (dock && dock->View()) emit activationChanged(dock->View(), true);
  m_activeTitle->setText(ActiveTitle());
}

void MainWindow::OnFocusChanged(QWidget*, QWidget* now) {
  if (ViewDock* d = DockAt(now)) SetActiveDock(d);
}

bool MainWindow::eventFilter(QObject* watched, QEvent* event) {
  if (event->type() == QEvent::MouseButtonPress && watched->isWidgetType())
    if (ViewDock* d = DockAt(watched)) SetActiveDock(d);
  return QMainWindow::eventFilter(watched, event);
}

void MainWindow::OnDockClosing(ViewDock* dock) {
  if (!dock->View()) return;
  CSuperBaseView* view = dock->View();
  if (dock == m_active) m_active = nullptr;
  emit viewClosing(view);
  m_docks.erase(std::remove(m_docks.begin(), m_docks.end(), QPointer<ViewDock>(dock)), m_docks.end());
  if (!m_closingAll) RefreshTitles();
}

void MainWindow::CloseAllViews() {
  m_closingAll = true;
  for (ViewDock* d : Docks()) {
    emit viewClosing(d->View());
    removeDockWidget(d);
    delete d;  // the view with it
  }
  m_docks.clear();
  m_active = nullptr;
  m_closingAll = false;
  m_activeTitle->setText({});
}

void MainWindow::ShowNotice(const QString& text) { statusBar()->showMessage(text, 15000); }

void MainWindow::closeEvent(QCloseEvent* event) {
  emit closingWindow();
  QMainWindow::closeEvent(event);
}

}  // namespace term
