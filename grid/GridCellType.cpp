#include "grid/GridCellType.h"

#include <QKeyEvent>
#include <QLinearGradient>
#include <QMouseEvent>
#include <QPainterPath>
#include <QScrollBar>

#include "grid/GridCtrl.h"
#include "grid/GridDropList.h"

// ---- CGridCellType ---------------------------------------------------------

CGridCellType::~CGridCellType() = default;

std::wstring CGridCellType::GetName() const { return L"Text"; }

QUuid CGridCellType::GetUUID() const { return QUuid("{6A1C0E10-3B2D-4F1E-9C11-0A4E5C7D2B01}"); }

int CGridCellType::Notify(int col, int row, int code, std::intptr_t param) {
  return m_grid ? m_grid->CellTypeNotify(this, col, row, code, param) : 0;
}

QColor CGridCellType::BackColor(const CGridCell& cell, bool selected) const {
  if (selected && m_grid && m_grid->HighlightSelection()) return m_grid->GetColors().selBack;
  if (cell.backColor.isValid()) return cell.backColor;
  return m_grid ? m_grid->GetColors().back : QColor(Qt::white);
}

QColor CGridCellType::TextColor(const CGridCell& cell, bool selected) const {
  if (selected && m_grid && m_grid->HighlightSelection()) return m_grid->GetColors().selText;
  if (cell.textColor.isValid()) return cell.textColor;
  return m_grid ? m_grid->GetColors().text : QColor(Qt::black);
}

void CGridCellType::DrawBackground(QPainter& p, const QRect& rect, const CGridCell& cell, bool selected) const {
  p.fillRect(rect, BackColor(cell, selected));
}

void CGridCellType::DrawBorder(QPainter& p, const QRect& rect) const {
  if (m_hasBorderPen) p.setPen(m_borderPen);
  else p.setPen(m_grid ? m_grid->GetColors().gridLine : QColor(208, 208, 208));
  // Right and bottom edges: neighbouring cells share one line.
  p.drawLine(rect.right(), rect.top(), rect.right(), rect.bottom());
  p.drawLine(rect.left(), rect.bottom(), rect.right(), rect.bottom());
}

void CGridCellType::DrawText(QPainter& p, const QRect& rect, const CGridCell& cell, bool selected) const {
  if (cell.text.isEmpty()) return;
  if (cell.font) p.setFont(*cell.font);
  else if (m_grid) p.setFont(m_grid->GetDefFont());
  p.setPen(TextColor(cell, selected));
  int align = cell.alignment ? cell.alignment : int(Qt::AlignLeft | Qt::AlignVCenter);
  if (!(align & Qt::AlignVertical_Mask)) align |= Qt::AlignVCenter;
  const QRect r = rect.adjusted(3, 0, -4, -1);
  p.drawText(r, align | Qt::TextSingleLine, cell.text);
}

void CGridCellType::OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool selected, bool) {
  DrawBackground(p, rect, cell, selected);
  DrawBorder(p, rect);
  DrawText(p, rect, cell, selected);
}

// ---- Heading ----------------------------------------------------------------

QUuid CGridHeadingType::GetUUID() const { return QUuid("{6A1C0E10-3B2D-4F1E-9C11-0A4E5C7D2B02}"); }

void CGridHeadingType::DrawFace(QPainter& p, const QRect& rect, const CGridCell& cell) const {
  const CGridCtrl::Colors def;
  const auto& c = m_grid ? m_grid->GetColors() : def;
  const QColor back = cell.backColor.isValid() ? cell.backColor : c.headBack;
  QLinearGradient g(rect.topLeft(), rect.bottomLeft());
  g.setColorAt(0, back.lighter(106));
  g.setColorAt(1, back.darker(104));
  p.fillRect(rect, g);
  p.setPen(c.headLine);
  p.drawLine(rect.right(), rect.top() + 3, rect.right(), rect.bottom() - 3);
  p.drawLine(rect.left(), rect.bottom(), rect.right(), rect.bottom());
}

void CGridHeadingType::OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool, bool) {
  DrawFace(p, rect, cell);
  if (cell.text.isEmpty()) return;
  p.setFont(cell.font ? *cell.font : (m_grid ? m_grid->GetHeadingFont() : QFont()));
  const CGridCtrl::Colors def;
  p.setPen(cell.textColor.isValid() ? cell.textColor : (m_grid ? m_grid->GetColors() : def).headText);
  int align = cell.alignment ? cell.alignment : int(Qt::AlignCenter);
  if (!(align & Qt::AlignVertical_Mask)) align |= Qt::AlignVCenter;
  p.drawText(rect.adjusted(3, 0, -4, -1), align | Qt::TextSingleLine, cell.text);
}

// ---- Check box --------------------------------------------------------------

QUuid CGridCheckBoxType::GetUUID() const { return QUuid("{6A1C0E10-3B2D-4F1E-9C11-0A4E5C7D2B03}"); }

QRect CGridCheckBoxType::BoxRect(const QRect& rect, int alignment) {
  const int side = std::max(0, std::min(13, std::min(rect.width(), rect.height()) - 4));
  int x = rect.left() + (rect.width() - side) / 2;
  if (alignment & Qt::AlignLeft) x = rect.left() + 4;
  else if (alignment & Qt::AlignRight) x = rect.right() - 4 - side;
  const int y = rect.top() + (rect.height() - side) / 2;
  return QRect(x, y, side, side);
}

void CGridCheckBoxType::DrawBox(QPainter& p, const QRect& box, bool ticked, const QColor& frame,
                                const QColor& back, const QColor& tick) const {
  p.fillRect(box, back);
  p.setPen(frame);
  p.drawRect(box.adjusted(0, 0, -1, -1));
  if (!ticked) return;
  p.save();
  p.setRenderHint(QPainter::Antialiasing, true);
  QPen pen(tick, std::max(1.5, box.width() / 6.0));
  pen.setCapStyle(Qt::RoundCap);
  pen.setJoinStyle(Qt::RoundJoin);
  p.setPen(pen);
  const QRectF b = QRectF(box).adjusted(2.5, 2.5, -2.5, -2.5);
  QPainterPath path;
  path.moveTo(b.left(), b.top() + b.height() * 0.55);
  path.lineTo(b.left() + b.width() * 0.4, b.bottom());
  path.lineTo(b.right(), b.top());
  p.drawPath(path);
  p.restore();
}

bool CGridCheckBoxType::OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) {
  if (!pressed || !m_grid || col < -1 || row < -1) return false;
  CGridCell cell;
  m_grid->GetCell(col, row, cell);
  if (cell.flags & CGridCell::kFlagDisabled) return true;
  // The whole cell is the target: the box is small.
  Notify(col, row, kNotifyCheckClicked, cell.number != 0 ? 0 : 1);
  return true;
}

void CGridCheckBoxType::OnDraw(QPainter& p, const QRect& rect, int, int row, const CGridCell& cell, bool selected,
                               bool) {
  if (row < 0 && m_grid) m_grid->GetHeadingType()->DrawFace(p, rect, cell);
  else { DrawBackground(p, rect, cell, selected); DrawBorder(p, rect); }
  const QRect box = BoxRect(rect, cell.alignment);
  const bool disabled = cell.flags & CGridCell::kFlagDisabled;
  const QColor text = TextColor(cell, selected);
  DrawBox(p, box, cell.number != 0, disabled ? QColor(160, 160, 160) : text.lighter(150),
          disabled ? QColor(235, 235, 235) : QColor(Qt::white), disabled ? QColor(160, 160, 160) : text);
}

// ---- Sort arrow -------------------------------------------------------------

QUuid CGridSortArrowType::GetUUID() const { return QUuid("{6A1C0E10-3B2D-4F1E-9C11-0A4E5C7D2B04}"); }

void CGridSortArrowType::DrawArrow(QPainter& p, const QRect& area, bool up, const QColor& color) {
  const int w = std::min(9, area.width());
  const int h = (w + 1) / 2;
  const int x = area.left() + (area.width() - w) / 2;
  const int y = area.top() + (area.height() - h) / 2;
  QPolygon tri;
  if (up) tri << QPoint(x, y + h) << QPoint(x + w, y + h) << QPoint(x + w / 2, y);
  else tri << QPoint(x, y) << QPoint(x + w, y) << QPoint(x + w / 2, y + h);
  p.save();
  p.setRenderHint(QPainter::Antialiasing, true);
  p.setPen(Qt::NoPen);
  p.setBrush(color);
  p.drawPolygon(tri);
  p.restore();
}

void CGridSortArrowType::OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
                                bool current) {
  // Text area leaves room for the arrow at the right.
  const QRect arrow(rect.right() - 16, rect.top(), 14, rect.height());
  CGridCell c = cell;
  CGridHeadingType::OnDraw(p, rect.adjusted(0, 0, 0, 0), col, row, c, selected, current);
  const CGridCtrl::Colors def;
  const QColor color = cell.textColor.isValid() ? cell.textColor : (m_grid ? m_grid->GetColors() : def).headText;
  DrawArrow(p, arrow, cell.number == 0, color);
}

// ---- Button -----------------------------------------------------------------

QUuid CGridButtonType::GetUUID() const { return QUuid("{6A1C0E10-3B2D-4F1E-9C11-0A4E5C7D2B05}"); }

void CGridButtonType::DrawFace(QPainter& p, const QRect& rect, const CGridCell& cell, bool pushed) const {
  const QRect r = rect.adjusted(1, 1, -2, -2);
  const QColor base = cell.backColor.isValid() ? cell.backColor : QColor(232, 232, 232);
  QLinearGradient g(r.topLeft(), r.bottomLeft());
  g.setColorAt(0, pushed ? base.darker(112) : base.lighter(108));
  g.setColorAt(1, pushed ? base.darker(104) : base.darker(108));
  p.save();
  p.setRenderHint(QPainter::Antialiasing, true);
  p.setPen(QColor(150, 150, 150));
  p.setBrush(g);
  p.drawRoundedRect(QRectF(r).adjusted(0.5, 0.5, -0.5, -0.5), 2.5, 2.5);
  p.restore();
}

bool CGridButtonType::OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) {
  if (!m_grid) return false;
  if (pressed) {
    CGridCell cell;
    m_grid->GetCell(col, row, cell);
    if (cell.flags & CGridCell::kFlagDisabled) return true;
    m_pressCol = col;
    m_pressRow = row;
    m_grid->SetCellFlags(col, row, m_grid->GetCellFlags(col, row) | CGridCell::kFlagPressed);
    m_grid->RedrawCell(col, row);
    return true;
  }
  const int pc = m_pressCol, pr = m_pressRow;
  m_pressCol = m_pressRow = -1;
  if (pc < -1) return true;
  m_grid->SetCellFlags(pc, pr, m_grid->GetCellFlags(pc, pr) & ~std::uint32_t(CGridCell::kFlagPressed));
  m_grid->RedrawCell(pc, pr);
  if (pc == col && pr == row) Notify(col, row, kNotifyButtonClicked, 0);
  return true;
}

void CGridButtonType::OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool selected, bool) {
  CGridCell back = cell;
  back.backColor = QColor();
  DrawBackground(p, rect, back, false);
  const bool pushed = cell.flags & CGridCell::kFlagPressed;
  DrawFace(p, rect, cell, pushed);
  CGridCell t = cell;
  if (!t.alignment) t.alignment = Qt::AlignCenter;
  if (cell.flags & CGridCell::kFlagDisabled) t.textColor = QColor(150, 150, 150);
  DrawText(p, pushed ? rect.translated(1, 1) : rect, t, false);
}

// ---- Drop list ----------------------------------------------------------------

CGridDropListType::CGridDropListType(CGridCtrl* grid) : CGridCellType(grid) {}

CGridDropListType::~CGridDropListType() {
  if (m_grid) m_grid->SetOpenDropList(nullptr);
  delete m_list;  // a child of the grid; deleted here when the type dies first
}

QUuid CGridDropListType::GetUUID() const { return QUuid("{6A1C0E10-3B2D-4F1E-9C11-0A4E5C7D2B06}"); }

QRect CGridDropListType::ButtonRect(const QRect& rect) {
  const int side = std::min(rect.height() - 2, 17);
  return QRect(rect.right() - side - 1, rect.top() + (rect.height() - side) / 2, side, side);
}

CUGLstBoxEx* CGridDropListType::DropList() {
  if (!m_list && m_grid) {
    m_list = new CUGLstBoxEx(m_grid->viewport());
    m_list->onChosen = [this](int index) {
      const int col = m_listCol, row = m_listRow;
      const QString text = index >= 0 ? m_list->ItemText(index) : QString();
      CloseList();
      if (index >= 0) OnDropListSelected(col, row, index, text);
    };
    // The grid may die before the type: forget the list then.
    QObject::connect(m_list, &QObject::destroyed, [this] { m_list = nullptr; });
  }
  return m_list;
}

void CGridDropListType::OpenList(int col, int row, const QRect& anchor, const QStringList& items) {
  CUGLstBoxEx* list = DropList();
  if (!list) return;
  m_listCol = col;
  m_listRow = row;
  list->Open(anchor, items);
  m_grid->SetOpenDropList(this);
}

void CGridDropListType::CloseList() {
  if (m_list) m_list->hide();
  m_listCol = m_listRow = -1;
  if (m_grid) m_grid->SetOpenDropList(nullptr);
}

bool CGridDropListType::IsListOpen() const { return m_list && m_list->isVisible(); }

bool CGridDropListType::OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) {
  if (!pressed || !m_grid) return false;
  if (!ButtonRect(rect).adjusted(-1, -1, 1, 1).contains(pt)) return false;
  if (IsListOpen() && m_listCol == col && m_listRow == row) { CloseList(); return true; }
  CGridCell cell;
  m_grid->GetCell(col, row, cell);
  QStringList items = cell.text.split(QLatin1Char('\n'), Qt::SkipEmptyParts);
  OpenList(col, row, rect, items);
  return true;
}

void CGridDropListType::OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
                               bool current) {
  DrawBackground(p, rect, cell, selected);
  DrawBorder(p, rect);
  CGridCell t = cell;
  t.text = cell.text.section(QLatin1Char('\n'), 0, 0);  // the first line is the value shown
  const QRect button = ButtonRect(rect);
  DrawText(p, rect.adjusted(0, 0, -button.width() - 2, 0), t, selected);
  p.fillRect(button, QColor(236, 236, 236));
  p.setPen(QColor(170, 170, 170));
  p.drawRect(button.adjusted(0, 0, -1, -1));
  CGridSortArrowType::DrawArrow(p, button.adjusted(3, 3, -3, -3), false, QColor(60, 60, 60));
}

void CGridDropListType::OnDropListSelected(int col, int row, int index, const QString& text) {
  Notify(col, row, kNotifyDropSelected, index);
}

// ---- The list ------------------------------------------------------------------

CUGLstBoxEx::CUGLstBoxEx(QWidget* parent) : QListWidget(parent) {
  setFrameShape(QFrame::Box);
  setUniformItemSizes(true);
  setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
  setStyleSheet(QStringLiteral("QListWidget{background:white;border:1px solid #808080;}"
                               "QListWidget::item{height:18px;padding-left:3px;}"
                               "QListWidget::item:selected{background:#3875d7;color:white;}"));
  hide();
  connect(this, &QListWidget::itemActivated, this, [this](QListWidgetItem* item) { Choose(row(item)); });
}

void CUGLstBoxEx::Open(const QRect& anchor, const QStringList& items, int current) {
  clear();
  addItems(items);
  const int shown = std::max(1, std::min(int(items.size()), 8));
  const int h = shown * 18 + 2;
  const QWidget* area = parentWidget();
  int y = anchor.bottom() + 1;
  if (area && y + h > area->height() && anchor.top() - h >= 0) y = anchor.top() - h;
  setGeometry(anchor.left(), y, std::max(anchor.width(), 60), h);
  if (current >= 0 && current < count()) setCurrentRow(current);
  show();
  raise();
  setFocus();
}

QString CUGLstBoxEx::ItemText(int index) const {
  const QListWidgetItem* it = item(index);
  return it ? it->text() : QString();
}

void CUGLstBoxEx::Choose(int index) {
  if (onChosen) onChosen(index);
}

void CUGLstBoxEx::keyPressEvent(QKeyEvent* e) {
  if (e->key() == Qt::Key_Escape) { Choose(-1); return; }
  if (e->key() == Qt::Key_Return || e->key() == Qt::Key_Enter) { Choose(currentRow()); return; }
  QListWidget::keyPressEvent(e);
}

void CUGLstBoxEx::mouseReleaseEvent(QMouseEvent* e) {
  QListWidget::mouseReleaseEvent(e);
  if (e->button() == Qt::LeftButton) {
    const QListWidgetItem* it = itemAt(e->position().toPoint());
    if (it) Choose(row(it));
  }
}
