#include "hostview/CustomTabCtrl.h"

#include <QApplication>
#include <QKeyEvent>
#include <QLineEdit>
#include <QMouseEvent>
#include <QPainter>
#include <QHelpEvent>
#include <QToolTip>
#include <algorithm>

#include "hostview/StyleRoles.h"
#include "hostview/Text.h"

namespace {
constexpr int kPad = 10;        // text padding inside a tab
constexpr int kMinTab = 40;
constexpr int kMaxTab = 200;
constexpr int kButton = 16;     // add and scroll buttons
constexpr int kClose = 12;
constexpr int kGap = 2;         // between tabs
constexpr int kDragOutMargin = 12;

QString Q(const std::wstring& w) { return QString::fromStdWString(w); }
}  // namespace

CCustomTabCtrl::CCustomTabCtrl(QWidget* parent, unsigned style, int notifyId)
    : QWidget(parent), m_style(style), m_notifyId(notifyId) {
  setFocusPolicy(Qt::StrongFocus);
  setMouseTracking(false);
  setAttribute(Qt::WA_OpaquePaintEvent);
  setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Fixed);
}

CCustomTabCtrl::~CCustomTabCtrl() = default;

void CCustomTabCtrl::SetStyleManager(IStyleManager* styleManager) {
  m_styleManager = styleManager;
  if (m_styleManager) setFont(m_styleManager->GetFont(hv::style::kFontControl));
  updateGeometry();
  update();
}

void CCustomTabCtrl::ModifyStyle(unsigned remove, unsigned add) {
  m_style = (m_style & ~remove) | add;
  updateGeometry();
  update();
}

QColor CCustomTabCtrl::RoleColor(int role, QColor fallback) const {
  return m_styleManager ? m_styleManager->Color(role) : fallback;
}

// ---- items ----

int CCustomTabCtrl::InsertItem(int index, const std::wstring& text, LPARAM data) {
  index = std::clamp(index, 0, GetItemCount());
  if (IsEditing()) CancelEdit();
  m_items.insert(m_items.begin() + index, Item{text, data});
  if (m_cur >= index) ++m_cur;
  updateGeometry();
  update();
  return index;
}

bool CCustomTabCtrl::DeleteItem(int index) {
  if (index < 0 || index >= GetItemCount()) return false;
  if (IsEditing()) CancelEdit();
  m_items.erase(m_items.begin() + index);
  if (m_items.empty()) m_cur = -1;
  else if (m_cur > index) --m_cur;
  else if (m_cur == index) m_cur = std::min(index, GetItemCount() - 1);
  m_first = std::clamp(m_first, 0, std::max(0, GetItemCount() - 1));
  if (m_pressItem == index) m_pressItem = -1;
  updateGeometry();
  update();
  return true;
}

void CCustomTabCtrl::DeleteAllItems() {
  if (IsEditing()) CancelEdit();
  m_items.clear();
  m_cur = -1;
  m_first = 0;
  m_pressItem = -1;
  m_dragging = false;
  updateGeometry();
  update();
}

std::wstring CCustomTabCtrl::GetItemText(int index) const {
  if (index < 0 || index >= GetItemCount()) return {};
  return m_items[index].text;
}

bool CCustomTabCtrl::SetItemText(int index, const std::wstring& text) {
  if (index < 0 || index >= GetItemCount()) return false;
  m_items[index].text = text;
  updateGeometry();
  update();
  return true;
}

LPARAM CCustomTabCtrl::GetItemData(int index) const {
  if (index < 0 || index >= GetItemCount()) return 0;
  return m_items[index].data;
}

bool CCustomTabCtrl::SetItemData(int index, LPARAM data) {
  if (index < 0 || index >= GetItemCount()) return false;
  m_items[index].data = data;
  return true;
}

int CCustomTabCtrl::FindItemData(LPARAM data) const {
  for (int i = 0; i < GetItemCount(); ++i)
    if (m_items[i].data == data) return i;
  return -1;
}

bool CCustomTabCtrl::MoveItem(int from, int to) {
  const int n = GetItemCount();
  if (from < 0 || from >= n || to < 0 || to >= n) return false;
  if (from == to) return true;
  if (IsEditing()) CancelEdit();
  Item moved = std::move(m_items[from]);
  m_items.erase(m_items.begin() + from);
  m_items.insert(m_items.begin() + to, std::move(moved));
  // The current item keeps being current wherever it went.
  if (m_cur == from) m_cur = to;
  else if (from < m_cur && to >= m_cur) --m_cur;
  else if (from > m_cur && to <= m_cur) ++m_cur;
  update();
  return true;
}

int CCustomTabCtrl::SetCurSel(int index) {
  const int previous = m_cur;
  if (index < -1 || index >= GetItemCount()) return -1;
  m_cur = index;
  if (m_cur >= 0) EnsureVisible(m_cur);
  update();
  return previous;
}

void CCustomTabCtrl::EnsureVisible(int index) {
  if (index < 0 || index >= GetItemCount()) return;
  if (index < m_first) { m_first = index; update(); return; }
  for (int guard = 0; guard < GetItemCount(); ++guard) {
    const Layout l = ComputeLayout();
    const QRect r = l.tabs[index];
    if (!r.isEmpty() && r.right() <= l.tabsRight) break;
    if (m_first >= index) break;
    ++m_first;
  }
  update();
}

void CCustomTabCtrl::SetStatusText(const std::wstring& text) {
  m_status = text;
  update();
}

void CCustomTabCtrl::SetDragCursors(const QCursor& inside, const QCursor& outside) {
  m_dragInside = inside;
  m_dragOutside = outside;
}

// ---- layout ----

int CCustomTabCtrl::TabWidth(int index) const {
  const QFontMetrics fm(font());
  int w = fm.horizontalAdvance(Q(m_items[index].text)) + 2 * kPad;
  if ((m_style & CTCS_CLOSEBUTTON) && index == m_cur) w += kClose + 4;
  return std::clamp(w, kMinTab, kMaxTab);
}

CCustomTabCtrl::Layout CCustomTabCtrl::ComputeLayout() const {
  Layout l;
  const int h = height();
  const QFontMetrics fm(font());
  int right = width() - 2;
  if (!m_status.empty()) {
    const int sw = std::min(fm.horizontalAdvance(Q(m_status)) + 2 * kPad, width() / 2);
    l.status = QRect(right - sw, 0, sw, h);
    right -= sw;
  }
  int total = 0;
  for (int i = 0; i < GetItemCount(); ++i) total += TabWidth(i) + kGap;
  const int addW = (m_style & CTCS_ADDBUTTON) ? kButton + 4 : 0;
  const bool scroll = total + addW > right - 2 || m_first > 0;
  if (scroll) {
    const int by = (h - kButton) / 2;
    l.right = QRect(right - kButton, by, kButton, kButton);
    l.left = QRect(right - 2 * kButton - 2, by, kButton, kButton);
    right = l.left.left() - 2;
  }
  if (m_style & CTCS_ADDBUTTON) right -= addW;
  l.tabsRight = right;
  l.tabs.assign(m_items.size(), QRect());
  int x = 2;
  for (int i = m_first; i < GetItemCount(); ++i) {
    const int w = TabWidth(i);
    if (x + w > right && i > m_first) break;  // the first visible tab is always shown
    l.tabs[i] = QRect(x, 2, std::min(w, std::max(0, right - x)), h - 2);
    x += w + kGap;
  }
  if (m_style & CTCS_ADDBUTTON) l.add = QRect(std::min(x, right) + 2, (h - kButton) / 2, kButton, kButton);
  return l;
}

int CCustomTabCtrl::HitTest(QPoint pos) const {
  const Layout l = ComputeLayout();
  for (int i = 0; i < GetItemCount(); ++i)
    if (!l.tabs[i].isEmpty() && l.tabs[i].contains(pos)) return i;
  return -1;
}

QRect CCustomTabCtrl::GetItemRect(int index) const {
  if (index < 0 || index >= GetItemCount()) return {};
  return ComputeLayout().tabs[index];
}

QRect CCustomTabCtrl::GetAddButtonRect() const { return ComputeLayout().add; }

QRect CCustomTabCtrl::GetCloseButtonRect() const {
  if (!(m_style & CTCS_CLOSEBUTTON) || m_cur < 0) return {};
  const QRect r = GetItemRect(m_cur);
  if (r.isEmpty()) return {};
  return QRect(r.right() - kClose - 4, r.center().y() - kClose / 2, kClose, kClose);
}

QSize CCustomTabCtrl::sizeHint() const {
  const QFontMetrics fm(font());
  int w = 4;
  for (int i = 0; i < GetItemCount(); ++i) w += TabWidth(i) + kGap;
  if (m_style & CTCS_ADDBUTTON) w += kButton + 4;
  return QSize(std::max(w, 100), std::max(fm.height() + 10, kButton + 6));
}

QSize CCustomTabCtrl::minimumSizeHint() const {
  const QFontMetrics fm(font());
  return QSize(3 * kButton + 10, std::max(fm.height() + 10, kButton + 6));
}

// ---- notifications ----

CTCNotify CCustomTabCtrl::MakeNotify(int code, int item) const {
  CTCNotify n;
  n.idFrom = m_notifyId;
  n.code = code;
  n.item = item;
  return n;
}

bool CCustomTabCtrl::Notify(CTCNotify& n) {
  if (m_handler) m_handler(n);
  return !n.refuse;
}

void CCustomTabCtrl::UserSelect(int index) {
  if (index < 0 || index >= GetItemCount() || index == m_cur) return;
  SetCurSel(index);
  CTCNotify n = MakeNotify(CTCN_SELCHANGE, index);
  Notify(n);
  emit selectionChanged(m_cur);
}

void CCustomTabCtrl::UserDelete(int index) {
  if (index < 0 || index >= GetItemCount()) return;
  CTCNotify n = MakeNotify(CTCN_DELETEREQUEST, index);
  if (!Notify(n)) return;
  // The handler may have changed the items; delete only what it asked about.
  if (index >= GetItemCount()) return;
  const int before = m_cur;
  DeleteItem(index);
  emit itemDeleted(index);
  if (m_cur >= 0 && (before == index || m_cur != before)) {
    CTCNotify s = MakeNotify(CTCN_SELCHANGE, m_cur);
    Notify(s);
    emit selectionChanged(m_cur);
  }
}

// ---- rename in place ----

bool CCustomTabCtrl::EditLabel(int index) {
  if (index < 0 || index >= GetItemCount()) return false;
  if (IsEditing()) CommitEdit();
  if (index >= GetItemCount()) return false;
  EnsureVisible(index);
  if (!m_editor) {
    m_editor = new QLineEdit(this);
    m_editor->setFrame(true);
    m_editor->installEventFilter(this);
  }
  m_editItem = index;
  m_editor->setText(Q(m_items[index].text));
  m_editor->selectAll();
  m_editor->setGeometry(GetItemRect(index).adjusted(2, 2, -2, -2));
  m_editor->show();
  m_editor->setFocus();
  return true;
}

void CCustomTabCtrl::CommitEdit() {
  if (!IsEditing()) return;
  const int index = m_editItem;
  m_editItem = -1;
  const std::wstring text = m_editor->text().toStdWString();
  m_editor->hide();
  if (index >= GetItemCount() || text == m_items[index].text) return;
  CTCNotify n = MakeNotify(CTCN_LABELUPDATE, index);
  n.oldText = m_items[index].text;
  m_items[index].text = text;
  update();
  if (!Notify(n)) {
    if (index < GetItemCount()) SetItemText(index, n.oldText);
    return;
  }
  emit labelChanged(index, Q(n.oldText));
}

void CCustomTabCtrl::CancelEdit() {
  if (!IsEditing()) return;
  m_editItem = -1;
  m_editor->hide();
}

bool CCustomTabCtrl::eventFilter(QObject* watched, QEvent* event) {
  if (watched == m_editor && IsEditing()) {
    if (event->type() == QEvent::KeyPress) {
      auto* k = static_cast<QKeyEvent*>(event);
      if (k->key() == Qt::Key_Return || k->key() == Qt::Key_Enter) { CommitEdit(); setFocus(); return true; }
      if (k->key() == Qt::Key_Escape) { CancelEdit(); setFocus(); return true; }
    } else if (event->type() == QEvent::FocusOut) {
      CommitEdit();
    }
  }
  return QWidget::eventFilter(watched, event);
}

// ---- mouse and keys ----

void CCustomTabCtrl::mousePressEvent(QMouseEvent* event) {
  const QPoint pos = event->position().toPoint();
  const QPoint global = event->globalPosition().toPoint();
  if (IsEditing()) CommitEdit();
  const Layout l = ComputeLayout();
  if (event->button() == Qt::LeftButton) {
    if (!l.add.isEmpty() && l.add.contains(pos)) {
      CTCNotify n = MakeNotify(CTCN_ADDREQUEST, -1);
      Notify(n);
      emit addRequested();
      return;
    }
    if (!l.left.isEmpty() && l.left.contains(pos)) {
      if (m_first > 0) { --m_first; update(); }
      return;
    }
    if (!l.right.isEmpty() && l.right.contains(pos)) {
      const int last = GetItemCount() - 1;
      if (last >= 0 && l.tabs[last].isEmpty()) { ++m_first; update(); }
      return;
    }
    const QRect close = GetCloseButtonRect();
    if (!close.isEmpty() && close.contains(pos)) {
      UserDelete(m_cur);
      return;
    }
    const int item = HitTest(pos);
    if (item < 0) return;
    UserSelect(item);
    CTCNotify n = MakeNotify(CTCN_CLICK, item);
    n.globalPos = global;
    Notify(n);
    emit itemClicked(item);
    // The handler may have rebuilt the strip.
    if (item < GetItemCount() && (m_style & (CTCS_DRAGMOVE | CTCS_DRAGOUT))) {
      m_pressItem = item;
      m_pressPos = pos;
    }
  } else if (event->button() == Qt::RightButton) {
    const int item = HitTest(pos);
    CTCNotify n = MakeNotify(CTCN_RCLICK, item);
    n.globalPos = global;
    Notify(n);
    emit itemRightClicked(item, global);
  }
}

void CCustomTabCtrl::mouseMoveEvent(QMouseEvent* event) {
  if (m_pressItem < 0 || !(event->buttons() & Qt::LeftButton)) return;
  const QPoint pos = event->position().toPoint();
  if (!m_dragging) {
    if ((pos - m_pressPos).manhattanLength() < QApplication::startDragDistance()) return;
    m_dragging = true;
  }
  const bool outside = pos.y() < -kDragOutMargin || pos.y() > height() + kDragOutMargin;
  if (outside && (m_style & CTCS_DRAGOUT)) {
    // The owner takes the drag over from here; the strip only keeps the cursor
    // until the button is released.
    if (!m_draggedOut) {
      m_draggedOut = true;
      m_dropIndex = -1;
      setCursor(m_dragOutside);
      update();
      const int item = m_pressItem;
      const QPoint global = event->globalPosition().toPoint();
      CTCNotify n = MakeNotify(CTCN_BEGINDRAG, item);
      n.globalPos = global;
      Notify(n);
      emit dragStarted(item, global);
    }
    return;
  }
  if (m_draggedOut) {
    return;
  }
  if (m_style & CTCS_DRAGMOVE) {
    setCursor(m_dragInside);
    const int over = HitTest(QPoint(pos.x(), height() / 2));
    const int target = over >= 0 ? over : (pos.x() < 0 ? m_first : GetItemCount() - 1);
    if (target != m_dropIndex) { m_dropIndex = target; update(); }
  }
}

void CCustomTabCtrl::mouseReleaseEvent(QMouseEvent* event) {
  if (event->button() != Qt::LeftButton) return;
  const int from = m_pressItem;
  const int to = m_dropIndex;
  const bool moved = m_dragging && !m_draggedOut && (m_style & CTCS_DRAGMOVE) && from >= 0 && to >= 0 &&
                     from != to;
  EndDrag();
  if (moved && MoveItem(from, to)) {
    CTCNotify n = MakeNotify(CTCN_ITEMMOVED, from);
    n.target = to;
    n.globalPos = event->globalPosition().toPoint();
    Notify(n);
    emit itemMoved(from, to);
  }
}

void CCustomTabCtrl::EndDrag() {
  m_pressItem = -1;
  m_dragging = false;
  m_draggedOut = false;
  m_dropIndex = -1;
  unsetCursor();
  update();
}

void CCustomTabCtrl::mouseDoubleClickEvent(QMouseEvent* event) {
  if (event->button() != Qt::LeftButton) return;
  const int item = HitTest(event->position().toPoint());
  if (item < 0) return;
  CTCNotify n = MakeNotify(CTCN_DBLCLK, item);
  n.globalPos = event->globalPosition().toPoint();
  Notify(n);
  emit itemDoubleClicked(item);
  if ((m_style & CTCS_EDITLABELS) && item < GetItemCount()) EditLabel(item);
}

void CCustomTabCtrl::keyPressEvent(QKeyEvent* event) {
  switch (event->key()) {
    case Qt::Key_Left:
      if (m_cur > 0) UserSelect(m_cur - 1);
      return;
    case Qt::Key_Right:
      if (m_cur >= 0 && m_cur + 1 < GetItemCount()) UserSelect(m_cur + 1);
      return;
    case Qt::Key_F2:
      if ((m_style & CTCS_EDITLABELS) && m_cur >= 0) EditLabel(m_cur);
      return;
    case Qt::Key_Delete:
      if ((m_style & CTCS_CLOSEBUTTON) && m_cur >= 0) UserDelete(m_cur);
      return;
    default:
      QWidget::keyPressEvent(event);
  }
}

bool CCustomTabCtrl::event(QEvent* event) {
  // A shortened label shows in full as a tool tip.
  if (event->type() == QEvent::ToolTip) {
    auto* help = static_cast<QHelpEvent*>(event);
    const int item = HitTest(help->pos());
    if (item >= 0) {
      const QString full = Q(m_items[item].text);
      const QRect r = GetItemRect(item);
      if (QFontMetrics(font()).horizontalAdvance(full) > r.width() - kPad) {
        QToolTip::showText(help->globalPos(), full, this, r);
        return true;
      }
    }
    QToolTip::hideText();
    event->ignore();
    return true;
  }
  return QWidget::event(event);
}

void CCustomTabCtrl::resizeEvent(QResizeEvent* event) {
  QWidget::resizeEvent(event);
  // Scroll no further than the current item needs at the new width.
  m_first = 0;
  EnsureVisible(m_cur);
  if (IsEditing()) m_editor->setGeometry(GetItemRect(m_editItem).adjusted(2, 2, -2, -2));
}

// ---- painting ----

void CCustomTabCtrl::paintEvent(QPaintEvent*) {
  QPainter p(this);
  const QPalette& pal = palette();
  const QColor back = RoleColor(hv::style::kTabBackground, pal.color(QPalette::Window));
  const QColor face = RoleColor(hv::style::kTabFace, pal.color(QPalette::Button));
  const QColor text = RoleColor(hv::style::kTabText, pal.color(QPalette::ButtonText));
  const QColor selFace = RoleColor(hv::style::kTabSelectedFace, pal.color(QPalette::Base));
  const QColor selText = RoleColor(hv::style::kTabSelectedText, pal.color(QPalette::Text));
  const QColor border = RoleColor(hv::style::kTabBorder, pal.color(QPalette::Mid));
  const QColor status = RoleColor(hv::style::kTabStatusText, pal.color(QPalette::WindowText));
  p.fillRect(rect(), back);
  p.setPen(border);
  p.drawLine(0, height() - 1, width(), height() - 1);

  const Layout l = ComputeLayout();
  const QFontMetrics fm(font());
  for (int i = 0; i < GetItemCount(); ++i) {
    const QRect r = l.tabs[i];
    if (r.isEmpty()) continue;
    const bool sel = i == m_cur;
    p.setPen(border);
    p.setBrush(sel ? selFace : face);
    p.drawRect(r.adjusted(0, 0, -1, sel ? 0 : -1));
    p.setPen(sel ? selText : text);
    QRect tr = r.adjusted(kPad / 2, 0, -kPad / 2, 0);
    if (sel && (m_style & CTCS_CLOSEBUTTON)) tr.setRight(tr.right() - kClose - 4);
    p.drawText(tr, Qt::AlignCenter, fm.elidedText(Q(m_items[i].text), Qt::ElideRight, tr.width()));
  }
  const QRect close = GetCloseButtonRect();
  if (!close.isEmpty()) {
    p.setPen(QPen(selText, 1.5));
    p.drawLine(close.topLeft() + QPoint(3, 3), close.bottomRight() - QPoint(3, 3));
    p.drawLine(close.topRight() + QPoint(-3, 3), close.bottomLeft() + QPoint(3, -3));
  }
  if (m_dragging && m_dropIndex >= 0 && m_dropIndex < GetItemCount() && !l.tabs[m_dropIndex].isEmpty()) {
    const QRect r = l.tabs[m_dropIndex];
    const int x = m_dropIndex > m_pressItem ? r.right() : r.left();
    p.setPen(QPen(selText, 2));
    p.drawLine(x, r.top(), x, r.bottom());
  }
  auto drawButton = [&](const QRect& r, const QString& glyph) {
    if (r.isEmpty()) return;
    p.setPen(border);
    p.setBrush(face);
    p.drawRect(r.adjusted(0, 0, -1, -1));
    p.setPen(text);
    p.drawText(r, Qt::AlignCenter, glyph);
  };
  drawButton(l.add, QStringLiteral("+"));
  drawButton(l.left, QStringLiteral("\u25C2"));
  drawButton(l.right, QStringLiteral("\u25B8"));
  if (!l.status.isEmpty()) {
    p.setPen(status);
    p.drawText(l.status.adjusted(kPad / 2, 0, -kPad / 2, 0), Qt::AlignRight | Qt::AlignVCenter,
               fm.elidedText(Q(m_status), Qt::ElideLeft, l.status.width() - kPad));
  }
}
