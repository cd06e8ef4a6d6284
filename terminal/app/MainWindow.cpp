#include "terminal/app/MainWindow.h"

#include <QAction>
#include <QActionGroup>
#include <QApplication>
#include <QCloseEvent>
#include <QMenuBar>
#include <QMimeData>
#include <QStatusBar>

#include "hostview/SuperBaseView.h"

namespace term {

// ---- ViewDock ---------------------------------------------------------------

ViewDock::ViewDock(CSuperBaseView* view, const QString& className, int instance, QWidget* parent)
    : QDockWidget(parent), m_view(view), m_className(className), m_instance(instance) {
  setObjectName(QString("dock-%1-%2").arg(className).arg(instance));
  setWindowTitle(instance > 1 ? QString("%1 %2").arg(className).arg(instance) : className);
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

MainWindow::MainWindow(const QStringList& addonClasses, const QStringList& terminalClasses,
                       const std::vector<Style>& styles, int currentStyle) {
  setObjectName("terminal-main-window");
  setWindowTitle("Brantic Terminal");
  setDockOptions(QMainWindow::AnimatedDocks | QMainWindow::AllowTabbedDocks | QMainWindow::AllowNestedDocks |
                 QMainWindow::GroupedDragging);
  setDockNestingEnabled(true);
  setTabPosition(Qt::AllDockWidgetAreas, QTabWidget::North);
  resize(1400, 900);
  BuildMenus(addonClasses, terminalClasses, styles, currentStyle);
  statusBar()->showMessage("Ready");
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

void MainWindow::BuildMenus(const QStringList& addonClasses, const QStringList& terminalClasses,
                            const std::vector<Style>& styles, int currentStyle) {
  QMenu* file = menuBar()->addMenu("&File");
  file->addAction("&Settings...", this, &MainWindow::settingsRequested);
  file->addAction("Save &layout", this, &MainWindow::saveLayoutRequested);
  file->addSeparator();
  QAction* quit = file->addAction("&Quit", this, &QWidget::close);
  quit->setShortcut(QKeySequence::Quit);

  QMenu* view = menuBar()->addMenu("&View");
  auto addOpen = [&](const QString& cls) {
    QAction* a = view->addAction(cls);
    a->setObjectName("open-" + cls);
    connect(a, &QAction::triggered, this, [this, cls] { emit openRequested(cls); });
  };
  for (const QString& cls : addonClasses) addOpen(cls);
  view->addSeparator();
  for (const QString& cls : terminalClasses) addOpen(cls);

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
      QAction* a = m_windowMenu->addAction(d->windowTitle());
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
  auto* dock = new ViewDock(view, className, instance, this);
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
  return dock;
}

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
  if (ViewDock* d = DockOf(view); d && !title.isEmpty()) d->setWindowTitle(title);
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
  if (dock && dock->View()) {
    emit activationChanged(dock->View(), true);
    statusBar()->showMessage(dock->windowTitle());
  }
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
}

void MainWindow::ShowNotice(const QString& text) { statusBar()->showMessage(text, 15000); }

void MainWindow::closeEvent(QCloseEvent* event) {
  emit closingWindow();
  QMainWindow::closeEvent(event);
}

}  // namespace term
