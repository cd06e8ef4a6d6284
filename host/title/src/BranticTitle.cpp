#include "hosttitle/BranticTitle.h"

#include <QEvent>
#include <QMouseEvent>
#include <QPainter>
#include <QWindow>
#include <algorithm>

#include "hostview/Buttons.h"
#include "hostview/StyleRoles.h"

namespace {
constexpr int kHeight = 24;
constexpr int kButtonSize = 18;
}  // namespace

// The bar itself: paints the caption and moves the window when dragged.
class BranticTitleBar : public QWidget {
 public:
  BranticTitleBar(CBranticTitle* owner, QWidget* parent) : QWidget(parent), m_owner(owner) {
    setAttribute(Qt::WA_OpaquePaintEvent);
  }

 protected:
  void paintEvent(QPaintEvent*) override {
    QPainter p(this);
    const IStyleManager* sm = m_owner->m_styleManager;
    const QColor back = sm ? sm->Color(hv::style::kTitleBackground) : palette().color(QPalette::Highlight);
    const QColor fore = sm ? sm->Color(hv::style::kTitleText) : palette().color(QPalette::HighlightedText);
    p.fillRect(rect(), back);
    p.setPen(fore);
    QFont f = sm ? sm->GetFont(hv::style::kFontTitle) : font();
    f.setBold(true);
    p.setFont(f);
    int right = width() - 4;
    for (const auto& b : m_owner->m_buttons)
      if (b.button) right = std::min(right, b.button->x() - 4);
    const QRect textRect(8, 0, std::max(0, right - 8), height());
    p.drawText(textRect, Qt::AlignLeft | Qt::AlignVCenter,
               QFontMetrics(f).elidedText(QString::fromStdWString(m_owner->GetTitleText()), Qt::ElideRight,
                                          textRect.width()));
  }

  void mousePressEvent(QMouseEvent* e) override {
    if (e->button() != Qt::LeftButton) return;
    QWidget* w = m_owner->m_window;
    if (!w) return;
    // A top-level window is best moved by the window system where it can.
    if (!m_owner->m_mdiChild && w->isWindow() && w->windowHandle() && w->windowHandle()->startSystemMove()) return;
    m_dragging = true;
    m_pressGlobal = e->globalPosition().toPoint();
    m_startPos = w->pos();
  }

  void mouseMoveEvent(QMouseEvent* e) override {
    QWidget* w = m_owner->m_window;
    if (!m_dragging || !w) return;
    QPoint to = m_startPos + (e->globalPosition().toPoint() - m_pressGlobal);
    if (!w->isWindow() && w->parentWidget()) {
      // Keep a child window's bar reachable inside its parent.
      const QRect area = w->parentWidget()->rect();
      to.setX(std::clamp(to.x(), area.left() - w->width() + 40, area.right() - 40));
      to.setY(std::clamp(to.y(), area.top(), std::max(area.top(), area.bottom() - kHeight)));
    }
    w->move(to);
  }

  void mouseReleaseEvent(QMouseEvent*) override { m_dragging = false; }

 private:
  CBranticTitle* m_owner;
  bool m_dragging = false;
  QPoint m_pressGlobal;
  QPoint m_startPos;
};

CBranticTitle::CBranticTitle(QObject* parent) : QObject(parent) {}

CBranticTitle::~CBranticTitle() { Detach(); }

void CBranticTitle::Detach() {
  if (m_window) {
    m_window->removeEventFilter(this);
    m_window->setContentsMargins(m_savedMargins);
  }
  delete m_bar;  // also deletes the quick buttons
  m_bar = nullptr;
  m_window = nullptr;
}

bool CBranticTitle::SubClassWnd(QWidget* window) {
  if (!window) return false;
  Detach();
  m_window = window;
  if (!m_mdiChild && window->isWindow()) window->setWindowFlag(Qt::FramelessWindowHint, true);
  auto* bar = new BranticTitleBar(this, window);
  m_bar = bar;
  m_savedMargins = window->contentsMargins();
  QMargins m = m_savedMargins;
  m.setTop(m.top() + kHeight);
  window->setContentsMargins(m);
  window->installEventFilter(this);
  // Re-create the buttons on the new bar.
  for (auto& b : m_buttons) {
    auto* button = new CImageButton(bar, b.commandId);
    button->SetStyleManager(m_styleManager);
    button->SetTooltipText(b.tooltip);
    connect(button, &CHostButton::commandClicked, this, &CBranticTitle::OnButton);
    b.button = button;
    LoadButtonImage(b);
    button->show();
  }
  Layout();
  bar->show();
  bar->raise();
  return true;
}

void CBranticTitle::SetStyleManager(IStyleManager* styleManager) {
  m_styleManager = styleManager;
  for (auto& b : m_buttons)
    if (b.button) b.button->SetStyleManager(styleManager);
  if (m_bar) m_bar->update();
}

void CBranticTitle::UpdateTitleStyle(int styleId) {
  m_styleId = styleId;
  for (auto& b : m_buttons) LoadButtonImage(b);
  Layout();
  if (m_bar) m_bar->update();
}

void CBranticTitle::LoadButtonImage(QuickButton& b) {
  if (!b.button) return;
  std::wstring path = b.path;
  const std::wstring placeholder = L"[styleID]";
  for (std::size_t at = path.find(placeholder); at != std::wstring::npos; at = path.find(placeholder, at)) {
    const std::wstring id = std::to_wstring(m_styleId);
    path.replace(at, placeholder.size(), id);
    at += id.size();
  }
  if (!b.button->LoadBitmap(path)) b.button->SetWindowText(b.tooltip.empty() ? L"" : b.tooltip.substr(0, 1));
  const QColor back = m_styleManager ? m_styleManager->Color(hv::style::kTitleBackground)
                                     : (m_bar ? m_bar->palette().color(QPalette::Highlight) : QColor());
  b.button->SetBkColor(MakeColorRef(back.red(), back.green(), back.blue()));
  const QColor fore = m_styleManager ? m_styleManager->Color(hv::style::kTitleText)
                                     : (m_bar ? m_bar->palette().color(QPalette::HighlightedText) : QColor());
  b.button->SetTextColor(MakeColorRef(fore.red(), fore.green(), fore.blue()));
}

void CBranticTitle::RemoveAllQuickButtons() {
  for (auto& b : m_buttons) delete b.button;
  m_buttons.clear();
  if (m_bar) m_bar->update();
}

bool CBranticTitle::AddQuickButton(int commandId, const std::wstring& bitmapPath, const std::wstring& tooltip) {
  if (std::any_of(m_buttons.begin(), m_buttons.end(), [&](const auto& b) { return b.commandId == commandId; }))
    return false;
  QuickButton b;
  b.commandId = commandId;
  b.path = bitmapPath;
  b.tooltip = tooltip;
  if (m_bar) {
    auto* button = new CImageButton(m_bar, commandId);
    button->SetStyleManager(m_styleManager);
    button->SetTooltipText(tooltip);
    connect(button, &CHostButton::commandClicked, this, &CBranticTitle::OnButton);
    b.button = button;
    LoadButtonImage(b);
    button->show();
  }
  m_buttons.push_back(std::move(b));
  Layout();
  return true;
}

std::vector<int> CBranticTitle::GetQuickButtonIds() const {
  std::vector<int> ids;
  for (const auto& b : m_buttons) ids.push_back(b.commandId);
  return ids;
}

CImageButton* CBranticTitle::GetQuickButton(int commandId) const {
  for (const auto& b : m_buttons)
    if (b.commandId == commandId) return b.button;
  return nullptr;
}

void CBranticTitle::OnButton(int commandId) {
  if (m_handler) m_handler(commandId);
  emit quickButtonClicked(commandId);
}

void CBranticTitle::SetTitleText(const std::wstring& text) {
  m_text = text;
  m_hasOwnText = true;
  if (m_bar) m_bar->update();
}

std::wstring CBranticTitle::GetTitleText() const {
  if (m_hasOwnText || !m_window) return m_text;
  return m_window->windowTitle().toStdWString();
}

int CBranticTitle::GetTitleHeight() const { return kHeight; }

void CBranticTitle::Layout() {
  if (!m_bar || !m_window) return;
  m_bar->setGeometry(0, 0, m_window->width(), kHeight);
  int x = m_bar->width() - 4;
  for (auto it = m_buttons.rbegin(); it != m_buttons.rend(); ++it) {
    if (!it->button) continue;
    x -= kButtonSize;
    it->button->setGeometry(x, (kHeight - kButtonSize) / 2, kButtonSize, kButtonSize);
    x -= 2;
  }
  m_bar->raise();
}

bool CBranticTitle::eventFilter(QObject* watched, QEvent* event) {
  if (watched == m_window) {
    switch (event->type()) {
      case QEvent::Resize:
      case QEvent::Show:
        Layout();
        break;
      case QEvent::WindowTitleChange:
      case QEvent::ActivationChange:
        if (m_bar) m_bar->update();
        break;
      case QEvent::ChildAdded:
        // Later children must not cover the bar.
        if (m_bar) m_bar->raise();
        break;
      default:
        break;
    }
  }
  return QObject::eventFilter(watched, event);
}
