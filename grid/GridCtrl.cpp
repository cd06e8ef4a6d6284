#include "grid/GridCtrl.h"

#include <QApplication>
#include <QDrag>
#include <QDropEvent>
#include <QHelpEvent>
#include <QMimeData>
#include <QPointer>
#include <QKeyEvent>
#include <QLineEdit>
#include <QMouseEvent>
#include <QPainter>
#include <QScrollBar>
#include <QToolTip>

#include "hostview/Services.h"
#include "platform/Platform.h"
#include "skin/Skin.h"

CGridCtrl::CGridCtrl(QWidget* parent) : QAbstractScrollArea(parent) {
  m_font = font();
  m_headFont = font();
  m_headFont.setBold(true);
  viewport()->setMouseTracking(true);
  viewport()->setAttribute(Qt::WA_OpaquePaintEvent, true);
  viewport()->setAutoFillBackground(false);
  setFocusPolicy(Qt::StrongFocus);
  setFrameShape(QFrame::NoFrame);
  setHorizontalScrollBarPolicy(Qt::ScrollBarAsNeeded);
  setVerticalScrollBarPolicy(Qt::ScrollBarAsNeeded);
  UpdateColPos();
}

CGridCtrl::~CGridCtrl() {
  m_openDrop = nullptr;
  m_hoverType = nullptr;
  m_pressType = nullptr;
}

// ---- Shape -----------------------------------------------------------------

void CGridCtrl::UpdateColPos() {
  m_colPos.resize(m_colWidths.size() + 1);
  int x = 0;
  for (std::size_t i = 0; i < m_colWidths.size(); ++i) { m_colPos[i] = x; x += m_colWidths[i]; }
  m_colPos.back() = x;
}

void CGridCtrl::SetNumberCols(int cols) {
  cols = std::max(0, cols);
  m_colWidths.resize(std::size_t(cols), m_defColWidth);
  UpdateColPos();
  if (m_curCol >= cols) m_curCol = cols - 1;
  if (m_editor && m_editCol >= cols) EndEdit(true);
  UpdateScrollBars();
  viewport()->update();
}

void CGridCtrl::SetNumberRows(int rows) {
  rows = std::max(0, rows);
  if (m_editor && m_editRow >= rows) EndEdit(true);
  const bool selectionLost = rows < m_rows && m_selCount > 0;
  m_rows = rows;
  m_selected.resize(std::size_t(rows), 0);
  if (selectionLost) {
    m_selCount = int(std::count(m_selected.begin(), m_selected.end(), char(1)));
  }
  if (m_curRow >= rows) m_curRow = rows - 1;
  if (m_anchorRow >= rows) m_anchorRow = rows - 1;
  UpdateScrollBars();
  viewport()->update();
}

void CGridCtrl::SetColWidth(int col, int width) {
  width = std::max(0, width);
  if (col == -1) { m_sideWidth = width; UpdateScrollBars(); viewport()->update(); return; }
  if (col < 0 || col >= GetNumberCols()) return;
  m_colWidths[std::size_t(col)] = width;
  UpdateColPos();
  UpdateScrollBars();
  PositionEditor();
  viewport()->update();
}

int CGridCtrl::GetColWidth(int col) const {
  if (col == -1) return m_sideWidth;
  if (col < 0 || col >= GetNumberCols()) return 0;
  return m_colWidths[std::size_t(col)];
}

void CGridCtrl::SetDefRowHeight(int height) {
  m_rowHeight = std::max(1, height);
  UpdateScrollBars();
  PositionEditor();
  viewport()->update();
}

void CGridCtrl::SetTH_Height(int height) {
  m_headHeight = std::max(0, height);
  UpdateScrollBars();
  viewport()->update();
}

void CGridCtrl::SetDefFont(const QFont& font) {
  m_font = font;
  viewport()->update();
}

void CGridCtrl::SetColors(const Colors& colors) {
  m_colors = colors;
  viewport()->update();
}

void CGridCtrl::ApplyStyle(const IStyleManager* style) {
  const skin::SkinColors sc = skin::ColorsFromStyle(style);
  if (style) {
    Colors c = m_colors;
    c.back = style->Color(skin::kRowEven);
    c.text = style->Color(skin::kCellText);
    c.headBack = sc.face;
    c.headText = sc.faceText;
    c.gridLine = sc.frame;
    c.headLine = sc.frame.darker(110);
    c.empty = c.back;
    SetColors(c);
  }
  skin::ApplySkin(this, sc);
}

int CGridCtrl::ClientDataWidth() const { return std::max(0, viewport()->width() - m_sideWidth); }
int CGridCtrl::ClientDataHeight() const { return std::max(0, viewport()->height() - m_headHeight); }

int CGridCtrl::VScrollBarWidth() const { return style()->pixelMetric(QStyle::PM_ScrollBarExtent, nullptr, this); }

void CGridCtrl::UpdateScrollBars() {
  const int dataW = ClientDataWidth();
  const int dataH = ClientDataHeight();
  const long long contentH = static_cast<long long>(m_rows) * m_rowHeight;
  verticalScrollBar()->setRange(0, int(std::max<long long>(0, std::min<long long>(contentH - dataH, INT32_MAX))));
  verticalScrollBar()->setSingleStep(m_rowHeight);
  verticalScrollBar()->setPageStep(std::max(m_rowHeight, dataH - dataH % m_rowHeight));
  horizontalScrollBar()->setRange(0, std::max(0, TotalColWidth() - dataW));
  horizontalScrollBar()->setSingleStep(20);
  horizontalScrollBar()->setPageStep(std::max(20, dataW));
}

// ---- Stored cells ----------------------------------------------------------

void CGridCtrl::SetCell(int col, int row, const CGridCell& cell) {
  m_stored[Key::Of(col, row)] = cell;
  RedrawCell(col, row);
}

bool CGridCtrl::HasStoredCell(int col, int row) const { return m_stored.count(Key::Of(col, row)) != 0; }

void CGridCtrl::QuickSetText(int col, int row, const QString& text) {
  m_stored[Key::Of(col, row)].text = text;
  RedrawCell(col, row);
}

void CGridCtrl::QuickSetCellType(int col, int row, CGridCellType* type) {
  m_stored[Key::Of(col, row)].cellType = type;
  RedrawCell(col, row);
}

void CGridCtrl::QuickSetNumber(int col, int row, double number) {
  m_stored[Key::Of(col, row)].number = number;
  RedrawCell(col, row);
}

void CGridCtrl::QuickSetAlignment(int col, int row, int alignment) {
  m_stored[Key::Of(col, row)].alignment = alignment;
  RedrawCell(col, row);
}

void CGridCtrl::ClearStoredCells() {
  m_stored.clear();
  m_flags.clear();
  viewport()->update();
}

void CGridCtrl::SetCellFlags(int col, int row, std::uint32_t flags) {
  if (flags) m_flags[Key::Of(col, row)] = flags;
  else m_flags.erase(Key::Of(col, row));
}

std::uint32_t CGridCtrl::GetCellFlags(int col, int row) const {
  auto it = m_flags.find(Key::Of(col, row));
  return it == m_flags.end() ? 0 : it->second;
}

void CGridCtrl::GetCell(int col, int row, CGridCell& cell) {
  if (!m_stored.empty()) {
    auto it = m_stored.find(Key::Of(col, row));
    if (it != m_stored.end()) cell = it->second;
  }
  OnGetCell(col, row, cell);
  if (!m_flags.empty()) {
    auto it = m_flags.find(Key::Of(col, row));
    if (it != m_flags.end()) cell.flags |= it->second;
  }
}

CGridCellType* CGridCtrl::CellTypeOf(const CGridCell& cell, int col, int row) {
  if (cell.cellType) return cell.cellType;
  if (row < 0 || col < 0) return &m_headType;
  return GetDefCellType();
}

// ---- Geometry --------------------------------------------------------------

int CGridCtrl::ColAtX(int dataX) const {
  if (dataX < 0 || dataX >= TotalColWidth()) return -1;
  // Last column whose left edge is <= x (zero-width columns are skipped).
  auto it = std::upper_bound(m_colPos.begin(), m_colPos.end() - 1, dataX);
  return int(it - m_colPos.begin()) - 1;
}

int CGridCtrl::GetTopRow() const {
  if (m_rows == 0) return -1;
  return std::min(m_rows - 1, verticalScrollBar()->value() / m_rowHeight);
}

int CGridCtrl::GetBottomRow() const {
  if (m_rows == 0 || ClientDataHeight() == 0) return -1;
  const int last = (verticalScrollBar()->value() + ClientDataHeight() - 1) / m_rowHeight;
  return std::min(m_rows - 1, last);
}

int CGridCtrl::GetLeftCol() const { return ColAtX(horizontalScrollBar()->value()); }

int CGridCtrl::GetRightCol() const {
  if (GetNumberCols() == 0 || ClientDataWidth() == 0) return -1;
  const int c = ColAtX(horizontalScrollBar()->value() + ClientDataWidth() - 1);
  return c < 0 ? GetNumberCols() - 1 : c;
}

void CGridCtrl::SetTopRow(int row) {
  verticalScrollBar()->setValue(std::max(0, row) * m_rowHeight);
}

void CGridCtrl::EnsureVisible(int col, int row) {
  if (row >= 0 && row < m_rows) {
    const int top = row * m_rowHeight;
    auto* v = verticalScrollBar();
    if (top < v->value()) v->setValue(top);
    else if (top + m_rowHeight > v->value() + ClientDataHeight())
      v->setValue(top + m_rowHeight - ClientDataHeight());
  }
  if (col >= 0 && col < GetNumberCols()) {
    const int left = m_colPos[std::size_t(col)];
    const int right = left + m_colWidths[std::size_t(col)];
    auto* h = horizontalScrollBar();
    if (left < h->value()) h->setValue(left);
    else if (right > h->value() + ClientDataWidth()) h->setValue(std::min(left, right - ClientDataWidth()));
  }
}

bool CGridCtrl::HitTest(const QPoint& pt, int* col, int* row) const {
  int c = -2, r = -2;
  if (pt.x() >= 0 && pt.x() < m_sideWidth) c = -1;
  else if (pt.x() >= m_sideWidth) {
    const int x = ColAtX(pt.x() - m_sideWidth + horizontalScrollBar()->value());
    if (x >= 0) c = x;
  }
  if (pt.y() >= 0 && pt.y() < m_headHeight) r = -1;
  else if (pt.y() >= m_headHeight) {
    const long long y = static_cast<long long>(pt.y()) - m_headHeight + verticalScrollBar()->value();
    if (y / m_rowHeight < m_rows) r = int(y / m_rowHeight);
  }
  if (col) *col = c;
  if (row) *row = r;
  return c != -2 && r != -2;
}

QRect CGridCtrl::CellRect(int col, int row) const {
  int x, w, y, h;
  if (col == -1) { x = 0; w = m_sideWidth; }
  else if (col >= 0 && col < GetNumberCols()) {
    x = m_sideWidth + m_colPos[std::size_t(col)] - horizontalScrollBar()->value();
    w = m_colWidths[std::size_t(col)];
  } else return {};
  if (row == -1) { y = 0; h = m_headHeight; }
  else if (row >= 0 && row < m_rows) {
    y = m_headHeight + row * m_rowHeight - verticalScrollBar()->value();
    h = m_rowHeight;
  } else return {};
  return QRect(x, y, w, h);
}

int CGridCtrl::SizingBorderAt(const QPoint& pt) const {
  if (!m_colSizing || pt.y() < 0 || pt.y() >= m_headHeight || pt.x() < m_sideWidth) return -1;
  const int x = pt.x() - m_sideWidth + horizontalScrollBar()->value();
  // The nearest right border within 3 pixels; the last one wins for zero widths.
  int best = -1;
  for (int c = std::max(0, ColAtX(x) - 1); c < GetNumberCols(); ++c) {
    const int border = m_colPos[std::size_t(c) + 1];
    if (border - x > 3) break;
    if (std::abs(border - x) <= 3) best = c;
  }
  return best;
}

// ---- Painting --------------------------------------------------------------

void CGridCtrl::RedrawCell(int col, int row) {
  const QRect r = CellRect(col, row);
  if (!r.isEmpty()) viewport()->update(r);
}

void CGridCtrl::RedrawRow(int row) {
  if (row < 0 || row >= m_rows) return;
  const QRect r = CellRect(-1, row);
  if (!r.isNull()) viewport()->update(QRect(0, r.top(), viewport()->width(), r.height()));
}

void CGridCtrl::PaintCell(QPainter& p, int col, int row, const QRect& rect, CGridCell& cell) {
  GetCell(col, row, cell);
  CGridCellType* type = CellTypeOf(cell, col, row);
  const bool selected = row >= 0 && col >= 0 && m_selCount > 0 && m_selected[std::size_t(row)];
  const bool current = col == m_curCol && row == m_curRow;
  type->OnDraw(p, rect, col, row, cell, selected, current);
}

void CGridCtrl::PaintTo(QPainter& p, const QRect& clip) {
  const int W = viewport()->width(), H = viewport()->height();
  const int hOff = horizontalScrollBar()->value(), vOff = verticalScrollBar()->value();
  const int nCols = GetNumberCols();
  const int r0 = GetTopRow(), r1 = GetBottomRow();
  int c0 = GetLeftCol(), c1 = GetRightCol();
  if (c0 < 0) c1 = -1;
  const int dataRight = m_sideWidth + TotalColWidth() - hOff;
  const long long dataBottom = m_headHeight + static_cast<long long>(m_rows) * m_rowHeight - vOff;

  // The empty area right of and below the cells.
  if (dataRight < W) p.fillRect(QRect(dataRight, 0, W - dataRight, H) & clip, m_colors.empty);
  if (dataBottom < H) p.fillRect(QRect(0, int(dataBottom), W, H - int(dataBottom)) & clip, m_colors.empty);

  CGridCell cell;
  const QRect dataArea = QRect(m_sideWidth, m_headHeight, W - m_sideWidth, H - m_headHeight) & clip;
  if (!dataArea.isEmpty() && r0 >= 0 && c0 >= 0) {
    p.save();
    p.setClipRect(dataArea);
    for (int r = r0; r <= r1; ++r) {
      const int y = m_headHeight + r * m_rowHeight - vOff;
      if (y + m_rowHeight <= dataArea.top() || y > dataArea.bottom()) continue;
      for (int c = c0; c <= c1 && c < nCols; ++c) {
        const int w = m_colWidths[std::size_t(c)];
        if (w <= 0) continue;
        const int x = m_sideWidth + m_colPos[std::size_t(c)] - hOff;
        if (x + w <= dataArea.left() || x > dataArea.right()) continue;
        cell = CGridCell();
        PaintCell(p, c, r, QRect(x, y, w, m_rowHeight), cell);
      }
    }
    if (m_showCurrent && m_curRow >= 0 && m_curCol >= 0 && hasFocus()) {
      const QRect cr = CellRect(m_curCol, m_curRow);
      if (!cr.isEmpty()) {
        p.setPen(QPen(m_colors.text, 1, Qt::DotLine));
        p.setBrush(Qt::NoBrush);
        p.drawRect(cr.adjusted(0, 0, -2, -2));
      }
    }
    p.restore();
  }

  // Top heading.
  if (m_headHeight > 0 && c0 >= 0) {
    const QRect area = QRect(m_sideWidth, 0, W - m_sideWidth, m_headHeight) & clip;
    if (!area.isEmpty()) {
      p.save();
      p.setClipRect(area);
      for (int c = c0; c <= c1 && c < nCols; ++c) {
        const int w = m_colWidths[std::size_t(c)];
        if (w <= 0) continue;
        cell = CGridCell();
        PaintCell(p, c, -1, QRect(m_sideWidth + m_colPos[std::size_t(c)] - hOff, 0, w, m_headHeight), cell);
      }
      p.restore();
    }
  }
  // Side heading and corner button.
  if (m_sideWidth > 0) {
    const QRect area = QRect(0, m_headHeight, m_sideWidth, H - m_headHeight) & clip;
    if (!area.isEmpty() && r0 >= 0) {
      p.save();
      p.setClipRect(area);
      for (int r = r0; r <= r1; ++r) {
        cell = CGridCell();
        PaintCell(p, -1, r, QRect(0, m_headHeight + r * m_rowHeight - vOff, m_sideWidth, m_rowHeight), cell);
      }
      p.restore();
    }
    if (m_headHeight > 0 && clip.intersects(QRect(0, 0, m_sideWidth, m_headHeight))) {
      cell = CGridCell();
      PaintCell(p, -1, -1, QRect(0, 0, m_sideWidth, m_headHeight), cell);
    }
  }

  // Drop marks while dragging a column or rows.
  if (m_drag == Drag::ColMove && m_dropTarget >= 0) {
    const int x = m_sideWidth + (m_dropTarget < nCols ? m_colPos[std::size_t(m_dropTarget)] : TotalColWidth()) - hOff;
    p.fillRect(QRect(x - 1, 0, 3, H), m_colors.selBack.darker(150));
  } else if ((m_drag == Drag::RowMove || m_dragOutRunning) && m_dropTarget >= 0) {
    const int y = m_headHeight + m_dropTarget * m_rowHeight - vOff;
    p.fillRect(QRect(0, y - 1, W, 3), m_colors.selBack.darker(150));
  }
}

void CGridCtrl::paintEvent(QPaintEvent* e) {
  QPainter p(viewport());
  PaintTo(p, e->rect());
}

void CGridCtrl::resizeEvent(QResizeEvent* e) {
  QAbstractScrollArea::resizeEvent(e);
  UpdateScrollBars();
  PositionEditor();
  OnSize(viewport()->width(), viewport()->height());
}

void CGridCtrl::scrollContentsBy(int, int) {
  viewport()->update();
  PositionEditor();
  if (m_openDrop) m_openDrop->CloseList();
  OnScrolled();
}

// ---- Selection ---------------------------------------------------------------

bool CGridCtrl::IsRowSelected(int row) const {
  return row >= 0 && row < m_rows && m_selected[std::size_t(row)];
}

std::vector<int> CGridCtrl::GetSelectedRows() const {
  std::vector<int> rows;
  if (m_selCount == 0) return rows;
  rows.reserve(std::size_t(m_selCount));
  for (int r = 0; r < m_rows; ++r)
    if (m_selected[std::size_t(r)]) rows.push_back(r);
  return rows;
}

void CGridCtrl::ClearSelection() {
  if (m_selCount == 0) return;
  std::fill(m_selected.begin(), m_selected.end(), char(0));
  m_selCount = 0;
  viewport()->update();
}

void CGridCtrl::SelectRow(int row, bool add) {
  if (row < 0 || row >= m_rows) return;
  if (!add || m_selMode == SingleSelection) {
    std::fill(m_selected.begin(), m_selected.end(), char(0));
    m_selCount = 0;
  }
  if (!m_selected[std::size_t(row)]) { m_selected[std::size_t(row)] = 1; ++m_selCount; }
  viewport()->update();
}

void CGridCtrl::SelectRange(int first, int last, bool add) {
  if (m_rows == 0) return;
  if (first > last) std::swap(first, last);
  first = std::clamp(first, 0, m_rows - 1);
  last = std::clamp(last, 0, m_rows - 1);
  if (m_selMode == SingleSelection) { SelectRow(last); return; }
  if (!add) { std::fill(m_selected.begin(), m_selected.end(), char(0)); m_selCount = 0; }
  for (int r = first; r <= last; ++r)
    if (!m_selected[std::size_t(r)]) { m_selected[std::size_t(r)] = 1; ++m_selCount; }
  viewport()->update();
}

void CGridCtrl::NotifySelection() { OnSelectionChanged(); }

void CGridCtrl::SetCurrent(int col, int row) {
  const int oc = m_curCol, orow = m_curRow;
  if (oc == col && orow == row) return;
  m_curCol = col;
  m_curRow = row;
  if (m_showCurrent) { RedrawCell(oc, orow); RedrawCell(col, row); }
  OnCellChange(oc, col, orow, row);
}

void CGridCtrl::GotoCell(int col, int row) {
  if (row < 0 || row >= m_rows) return;
  col = std::clamp(col, 0, std::max(0, GetNumberCols() - 1));
  EnsureVisible(col, row);
  SelectRow(row);
  m_anchorRow = row;
  SetCurrent(col, row);
  NotifySelection();
}

void CGridCtrl::MoveCurrentBy(int dCol, int dRow, Qt::KeyboardModifiers mods) {
  if (m_rows == 0) return;
  const int row = std::clamp((m_curRow < 0 ? 0 : m_curRow) + dRow, 0, m_rows - 1);
  const int col = std::clamp((m_curCol < 0 ? 0 : m_curCol) + dCol, 0, std::max(0, GetNumberCols() - 1));
  EnsureVisible(col, row);
  if ((mods & Qt::ShiftModifier) && m_selMode == MultiSelection) {
    if (m_anchorRow < 0) m_anchorRow = row;
    SelectRange(m_anchorRow, row);
  } else {
    SelectRow(row);
    m_anchorRow = row;
  }
  SetCurrent(col, row);
  NotifySelection();
}

// ---- Mouse -----------------------------------------------------------------

void CGridCtrl::mousePressEvent(QMouseEvent* e) {
  const QPoint pt = e->position().toPoint();
  if (m_editor) EndEdit(false);
  setFocus(Qt::MouseFocusReason);
  int col, row;
  const bool hit = HitTest(pt, &col, &row);
  m_pressPt = pt;
  m_pressCol = hit ? col : -2;
  m_pressRow = hit ? row : -2;
  m_pressType = nullptr;
  m_pressHandled = false;
  m_drag = Drag::None;

  if (e->button() == Qt::LeftButton) {
    const int border = SizingBorderAt(pt);
    if (border >= 0) {
      m_drag = Drag::ColSize;
      m_sizeCol = border;
      m_sizeStartWidth = GetColWidth(border);
      return;
    }
  }
  CGridCell cell;
  CGridCellType* type = nullptr;
  if (hit) {
    GetCell(col, row, cell);
    type = CellTypeOf(cell, col, row);
  }
  if (m_openDrop && type != m_openDrop) m_openDrop->CloseList();
  if (!hit) return;
  const QRect rect = CellRect(col, row);

  if (e->button() == Qt::RightButton) {
    if (row >= 0 && col >= 0) {
      if (!IsRowSelected(row)) { SelectRow(row); m_anchorRow = row; NotifySelection(); }
      SetCurrent(col, row);
    }
    m_pressType = type;
    if (type->OnRClicked(col, row, true, rect, pt)) { m_pressHandled = true; return; }
    if (row == -1 && col >= 0) OnTH_RClicked(col, true, rect, pt);
    else if (row >= 0 && col >= 0) OnRClicked(col, row, true, rect, pt);
    return;
  }
  if (e->button() != Qt::LeftButton) return;

  if (row == -1 && col == -1) { OnCB_LClicked(true, rect, pt); return; }
  if (row == -1) {
    m_pressType = type;
    m_pressHandled = type->OnLClicked(col, row, true, rect, pt);
    if (!m_pressHandled) OnTH_LClicked(col, true, rect, pt);
    if (m_colMoving && !m_pressHandled) m_drag = Drag::Pending;
    return;
  }
  if (col == -1) {
    const bool ctrl = e->modifiers() & Qt::ControlModifier;
    const bool shift = e->modifiers() & Qt::ShiftModifier;
    if (shift && m_selMode == MultiSelection && m_anchorRow >= 0) SelectRange(m_anchorRow, row);
    else { SelectRow(row, ctrl); m_anchorRow = row; }
    SetCurrent(std::max(0, m_curCol), row);
    NotifySelection();
    OnSH_LClicked(row, true, rect, pt);
    if (m_rowMoving) m_drag = Drag::Pending;
    return;
  }
  // A data cell.
  const bool ctrl = e->modifiers() & Qt::ControlModifier;
  const bool shift = e->modifiers() & Qt::ShiftModifier;
  const bool keepSelection = (m_rowMoving || m_dragOut) && IsRowSelected(row) && !ctrl && !shift && m_selCount > 1;
  if (m_selMode == MultiSelection && shift && m_anchorRow >= 0) SelectRange(m_anchorRow, row);
  else if (m_selMode == MultiSelection && ctrl) {
    if (IsRowSelected(row)) { m_selected[std::size_t(row)] = 0; --m_selCount; viewport()->update(); }
    else SelectRow(row, true);
    m_anchorRow = row;
  } else if (!keepSelection) {
    SelectRow(row);
    m_anchorRow = row;
  }
  SetCurrent(col, row);
  NotifySelection();
  // The callbacks above may have changed the grid: look the cell up again.
  if (row >= m_rows || col >= GetNumberCols()) return;
  cell = CGridCell();
  GetCell(col, row, cell);
  type = CellTypeOf(cell, col, row);
  m_pressType = type;
  m_pressHandled = type->OnLClicked(col, row, true, rect, pt);
  if (!m_pressHandled) OnLClicked(col, row, true, rect, pt);
  if (type->HandlesMouse()) return;
  if ((m_rowMoving || m_dragOut) && !ctrl && !shift) m_drag = Drag::Pending;
  else if (m_selMode == MultiSelection && !ctrl) m_drag = Drag::Select;
}

void CGridCtrl::mouseMoveEvent(QMouseEvent* e) {
  const QPoint pt = e->position().toPoint();
  switch (m_drag) {
    case Drag::ColSize: {
      SetColWidth(m_sizeCol, std::max(0, m_sizeStartWidth + pt.x() - m_pressPt.x()));
      return;
    }
    case Drag::Pending: {
      if ((pt - m_pressPt).manhattanLength() < QApplication::startDragDistance()) return;
      if (m_pressRow == -1 && m_pressCol >= 0 && m_colMoving) m_drag = Drag::ColMove;
      else if (m_pressRow >= 0 && m_pressCol >= 0 && m_dragOut) {
        // A drag of rows; dropped back here it moves them. Rows that may not
        // leave are selected by the drag instead.
        m_drag = Drag::None;
        if (StartDragOut() || m_selMode != MultiSelection) return;
        m_drag = Drag::Select;
        mouseMoveEvent(e);
        return;
      } else if (m_pressRow >= 0 && m_rowMoving) m_drag = Drag::RowMove;
      else { m_drag = Drag::None; return; }
      viewport()->setCursor(Qt::DragMoveCursor);
      [[fallthrough]];
    }
    case Drag::ColMove:
    case Drag::RowMove: {
      if (m_drag == Drag::ColMove) {
        const int x = pt.x() - m_sideWidth + horizontalScrollBar()->value();
        int c = ColAtX(x);
        if (c < 0) c = x < 0 ? 0 : GetNumberCols();
        else if (x > m_colPos[std::size_t(c)] + m_colWidths[std::size_t(c)] / 2) ++c;
        m_dropTarget = c;
      } else {
        const long long y = static_cast<long long>(pt.y()) - m_headHeight + verticalScrollBar()->value();
        int r = y < 0 ? 0 : int(std::min<long long>(m_rows, (y + m_rowHeight / 2) / m_rowHeight));
        m_dropTarget = r;
        if (pt.y() < m_headHeight) verticalScrollBar()->triggerAction(QAbstractSlider::SliderSingleStepSub);
        else if (pt.y() >= viewport()->height()) verticalScrollBar()->triggerAction(QAbstractSlider::SliderSingleStepAdd);
      }
      viewport()->update();
      return;
    }
    case Drag::Select: {
      int col, row;
      if (HitTest(pt, &col, &row) && row >= 0 && m_anchorRow >= 0) {
        SelectRange(m_anchorRow, row);
        NotifySelection();
      }
      EnsureVisible(-1, row >= 0 ? row : (pt.y() < m_headHeight ? std::max(0, GetTopRow() - 1) : GetBottomRow() + 1));
      return;
    }
    case Drag::None: break;
  }

  int col, row;
  if (!HitTest(pt, &col, &row)) col = row = -2;
  m_cursor = SizingBorderAt(pt) >= 0 ? Qt::SplitHCursor : Qt::ArrowCursor;
  CGridCellType* type = nullptr;
  QRect rect;
  if (col != -2 && row != -2) {
    CGridCell cell;
    GetCell(col, row, cell);
    type = CellTypeOf(cell, col, row);
    rect = CellRect(col, row);
  }
  if ((col != m_hoverCol || row != m_hoverRow) && m_hoverType) m_hoverType->OnMouseMove(-1, -1, QRect(), pt);
  m_hoverCol = col;
  m_hoverRow = row;
  m_hoverType = type;
  if (type && m_cursor == Qt::ArrowCursor) type->OnMouseMove(col, row, rect, pt);
  OnMouseMove(col, row, pt, e->buttons());
  viewport()->setCursor(m_cursor);
}

void CGridCtrl::LeaveHover() {
  if (m_hoverType) m_hoverType->OnMouseMove(-1, -1, QRect(), QPoint(-1, -1));
  m_hoverType = nullptr;
  if (m_hoverCol != -2 || m_hoverRow != -2) {
    m_hoverCol = m_hoverRow = -2;
    OnMouseMove(-2, -2, QPoint(-1, -1), Qt::NoButton);
  }
}

void CGridCtrl::mouseReleaseEvent(QMouseEvent* e) {
  const QPoint pt = e->position().toPoint();
  const Drag drag = m_drag;
  m_drag = Drag::None;
  const int pressCol = m_pressCol, pressRow = m_pressRow;
  CGridCellType* pressType = m_pressType;
  const bool pressHandled = m_pressHandled;
  m_pressType = nullptr;
  m_pressCol = m_pressRow = -2;
  int col, row;
  if (!HitTest(pt, &col, &row)) col = row = -2;

  if (drag == Drag::ColSize) {
    int width = GetColWidth(m_sizeCol);
    OnColSized(m_sizeCol, width);
    SetColWidth(m_sizeCol, width);
    return;
  }
  if (drag == Drag::ColMove || drag == Drag::RowMove) viewport()->setCursor(m_cursor);
  if (drag == Drag::ColMove) {
    const int from = pressCol;
    int to = m_dropTarget > from ? m_dropTarget - 1 : m_dropTarget;
    m_dropTarget = -1;
    to = std::clamp(to, 0, std::max(0, GetNumberCols() - 1));
    if (from >= 0 && to != from && OnCanMoveCol(from, to)) {
      MoveColumn(from, to);
      OnColMoved(from, to);
    }
    viewport()->update();
  } else if (drag == Drag::RowMove) {
    const int to = m_dropTarget;
    m_dropTarget = -1;
    MoveRowsTo(IsRowSelected(pressRow) ? GetSelectedRows() : std::vector<int>{pressRow}, to);
    viewport()->update();
  }

  const int typeCol = (col >= 0 && row >= 0) || (row == -1 && col >= 0) ? col : -1;
  const int typeRow = (col >= 0 && row >= 0) || (row == -1 && col >= 0) ? row : -1;
  const QRect rect = CellRect(col, row);
  if (e->button() == Qt::RightButton) {
    if (pressType && pressType->OnRClicked(typeCol, typeRow, false, rect, pt)) return;
    if (pressHandled) return;
    if (pressRow == -1 && pressCol >= 0) OnTH_RClicked(row == -1 ? col : -1, false, rect, pt);
    else if (pressRow >= 0 && pressCol >= 0) OnRClicked(typeCol, typeRow >= 0 ? typeRow : -1, false, rect, pt);
    return;
  }
  if (e->button() != Qt::LeftButton) return;
  if (pressRow == -1 && pressCol == -1) { OnCB_LClicked(false, rect, pt); return; }
  if (pressCol == -1 && pressRow >= 0) { OnSH_LClicked(col == -1 ? row : -1, false, rect, pt); return; }
  if (pressType && pressType->OnLClicked(typeCol, typeRow, false, rect, pt)) return;
  if (pressHandled) return;
  if (pressRow == -1 && pressCol >= 0) OnTH_LClicked(row == -1 && col >= 0 ? col : -1, false, rect, pt);
  else if (pressRow >= 0 && pressCol >= 0) OnLClicked(row >= 0 && col >= 0 ? col : -1, row >= 0 && col >= 0 ? row : -1, false, rect, pt);
}

void CGridCtrl::MoveRowsTo(std::vector<int> rows, int to) {
  rows.erase(std::remove_if(rows.begin(), rows.end(), [&](int r) { return r < 0 || r >= m_rows; }), rows.end());
  if (rows.empty() || to < 0) return;
  // A drop inside or right after a single contiguous block changes nothing.
  const bool contiguous = rows.back() - rows.front() + 1 == int(rows.size());
  const bool noop = contiguous && to >= rows.front() && to <= rows.back() + 1;
  if (noop || !OnCanMoveRows(rows, to)) return;
  OnRowsMoved(rows, to);
  int before = 0;
  for (int r : rows) if (r < to) ++before;
  const int first = to - before;
  SelectRange(first, first + int(rows.size()) - 1);
  m_anchorRow = first;
  SetCurrent(m_curCol, first);
  NotifySelection();
}

int CGridCtrl::RowInsertionAt(const QPoint& pt) const {
  const long long y = static_cast<long long>(pt.y()) - m_headHeight + verticalScrollBar()->value();
  return y < 0 ? 0 : int(std::min<long long>(m_rows, (y + m_rowHeight / 2) / m_rowHeight));
}

// ---- Dragging rows out ------------------------------------------------------

namespace {
CGridCtrl::DragRunner& Runner() {
  static CGridCtrl::DragRunner runner;
  return runner;
}
}  // namespace

void CGridCtrl::SetDragRunner(DragRunner runner) { Runner() = std::move(runner); }

bool CGridCtrl::StartDragOut() {
  if (m_dragOutRunning) return false;
  std::vector<int> rows = IsRowSelected(m_pressRow) ? GetSelectedRows() : std::vector<int>{m_pressRow};
  rows.erase(std::remove_if(rows.begin(), rows.end(), [&](int r) { return r < 0 || r >= m_rows; }), rows.end());
  if (rows.empty()) return false;
  auto* mime = new QMimeData;
  if (!OnDragOutData(rows, *mime)) {
    delete mime;
    return false;
  }
  // A token of this grid and this drag: a drop back here is a row move.
  static quint64 serial = 0;
  m_outToken = QByteArray::number(quintptr(this), 16) + '-' + QByteArray::number(++serial);
  mime->setData(kOwnRowsMimeType, m_outToken);
  m_outRows = rows;
  m_pressType = nullptr;
  m_pressHandled = true;  // the release, if it comes, ends nothing
  auto* drag = new QDrag(this);
  drag->setMimeData(mime);
  // The pressed row goes with the pointer (a number when there are more).
  const QRect pressed = CellRect(0, m_pressRow);
  if (!pressed.isEmpty()) {
    const QRect strip(0, pressed.top(), std::min(viewport()->width(), 360), pressed.height());
    QPixmap image = viewport()->grab(strip);
    if (rows.size() > 1) {
      QPainter p(&image);
      p.fillRect(QRect(image.width() - 28, 0, 28, image.height()), m_colors.selBack);
      p.setPen(m_colors.selText);
      p.drawText(QRect(image.width() - 28, 0, 28, image.height()), Qt::AlignCenter, QString::number(rows.size()));
    }
    drag->setPixmap(image);
    drag->setHotSpot(QPoint(std::clamp(m_pressPt.x(), 0, image.width() - 1), m_pressPt.y() - strip.top()));
  }
  QPointer<CGridCtrl> self(this);
  QPointer<QDrag> guard(drag);
  m_dragOutRunning = true;
  viewport()->setAcceptDrops(true);
  const Qt::DropAction action =
      Runner() ? Runner()(*drag) : drag->exec(Qt::CopyAction | Qt::MoveAction, Qt::CopyAction);
  if (guard) guard->deleteLater();
  if (!self) return true;  // closed while the drag ran
  m_dragOutRunning = false;
  viewport()->setAcceptDrops(false);
  m_dropTarget = -1;
  m_outRows.clear();
  m_outToken.clear();
  viewport()->update();
  OnDragOutDone(action);
  return true;
}

bool CGridCtrl::HandleDragOver(const QMimeData* mime, const QPoint& pt) {
  const bool own = m_dragOutRunning && mime && mime->data(kOwnRowsMimeType) == m_outToken && !m_outToken.isEmpty();
  if (!own || !m_rowMoving) {
    HandleDragLeave();
    return false;
  }
  m_dropTarget = RowInsertionAt(pt);
  if (pt.y() < m_headHeight) verticalScrollBar()->triggerAction(QAbstractSlider::SliderSingleStepSub);
  else if (pt.y() >= viewport()->height() - m_rowHeight / 2)
    verticalScrollBar()->triggerAction(QAbstractSlider::SliderSingleStepAdd);
  viewport()->update();
  return true;
}

void CGridCtrl::HandleDragLeave() {
  if (m_dropTarget < 0) return;
  m_dropTarget = -1;
  viewport()->update();
}

bool CGridCtrl::HandleDrop(const QMimeData* mime, const QPoint& pt) {
  if (!HandleDragOver(mime, pt)) return false;
  const int to = m_dropTarget;
  m_dropTarget = -1;
  MoveRowsTo(m_outRows, to);
  viewport()->update();
  return true;
}

void CGridCtrl::mouseDoubleClickEvent(QMouseEvent* e) {
  const QPoint pt = e->position().toPoint();
  m_drag = Drag::None;
  m_pressType = nullptr;
  m_pressHandled = true;  // the release that follows belongs to the double click
  m_pressCol = m_pressRow = -2;
  if (e->button() != Qt::LeftButton) return;
  int col, row;
  if (!HitTest(pt, &col, &row)) return;
  if (SizingBorderAt(pt) >= 0) return;
  const QRect rect = CellRect(col, row);
  CGridCell cell;
  GetCell(col, row, cell);
  CGridCellType* type = CellTypeOf(cell, col, row);
  if (type->OnDClicked(col, row, rect, pt)) return;
  if (row == -1 && col >= 0) OnTH_DClicked(col, rect, pt);
  else if (col == -1 && row >= 0) OnSH_DClicked(row, rect, pt);
  else if (row >= 0 && col >= 0) OnDClicked(col, row, rect, pt);
}

bool CGridCtrl::viewportEvent(QEvent* e) {
  switch (e->type()) {
    case QEvent::ToolTip: {
      auto* he = static_cast<QHelpEvent*>(e);
      QString text;
      if (HintAt(he->pos(), &text)) {
        int col, row;
        HitTest(he->pos(), &col, &row);
        QToolTip::showText(he->globalPos(), text, viewport(), CellRect(col, row));
      } else {
        QToolTip::hideText();
        e->ignore();
      }
      return true;
    }
    case QEvent::Leave:
      LeaveHover();
      break;
    case QEvent::DragEnter:
    case QEvent::DragMove: {
      auto* de = static_cast<QDragMoveEvent*>(e);
      if (HandleDragOver(de->mimeData(), de->position().toPoint())) {
        de->setDropAction(Qt::MoveAction);
        de->accept();
      } else {
        de->ignore();
      }
      return true;
    }
    case QEvent::DragLeave:
      HandleDragLeave();
      return true;
    case QEvent::Drop: {
      auto* de = static_cast<QDropEvent*>(e);
      if (HandleDrop(de->mimeData(), de->position().toPoint())) {
        de->setDropAction(Qt::MoveAction);
        de->accept();
      } else {
        de->ignore();
      }
      return true;
    }
    default: break;
  }
  return QAbstractScrollArea::viewportEvent(e);
}

// ---- Keys ------------------------------------------------------------------

void CGridCtrl::keyPressEvent(QKeyEvent* e) {
  if (OnKeyDown(e->key(), e->modifiers())) return;
  const Qt::KeyboardModifiers mods = e->modifiers();
  const int page = std::max(1, ClientDataHeight() / m_rowHeight - 1);
  switch (e->key()) {
    case Qt::Key_Up: MoveCurrentBy(0, -1, mods); return;
    case Qt::Key_Down: MoveCurrentBy(0, 1, mods); return;
    case Qt::Key_Left: MoveCurrentBy(-1, 0, mods); return;
    case Qt::Key_Right: MoveCurrentBy(1, 0, mods); return;
    case Qt::Key_PageUp: MoveCurrentBy(0, -page, mods); return;
    case Qt::Key_PageDown: MoveCurrentBy(0, page, mods); return;
    case Qt::Key_Home: MoveCurrentBy(0, -m_rows, mods); return;
    case Qt::Key_End: MoveCurrentBy(0, m_rows, mods); return;
    case Qt::Key_F2:
    case Qt::Key_Return:
    case Qt::Key_Enter:
      if (m_curCol >= 0 && m_curRow >= 0) StartEdit(m_curCol, m_curRow);
      return;
    default: break;
  }
  if (e->matches(QKeySequence::Copy)) {
    platform::Dialogs().SetClipboardText(SelectionText());
    return;
  }
  if (e->matches(QKeySequence::SelectAll) && m_selMode == MultiSelection) {
    SelectRange(0, m_rows - 1);
    NotifySelection();
    return;
  }
  const QString text = e->text();
  if (!text.isEmpty() && text.at(0).isPrint() && !(mods & (Qt::ControlModifier | Qt::AltModifier)) &&
      m_curCol >= 0 && m_curRow >= 0) {
    StartEdit(m_curCol, m_curRow, text, true);
    return;
  }
  QAbstractScrollArea::keyPressEvent(e);
}

// ---- Editing -----------------------------------------------------------------

bool CGridCtrl::StartEdit(int col, int row, const QString& initial, bool useInitial) {
  if (col < 0 || row < 0 || col >= GetNumberCols() || row >= m_rows) return false;
  if (m_editor) EndEdit(false);
  if (m_editor) return false;
  CGridCell cell;
  GetCell(col, row, cell);
  if (cell.flags & (CGridCell::kFlagReadOnly | CGridCell::kFlagDisabled)) return false;
  QString text = cell.text;
  if (!OnEditStart(col, row, text)) return false;
  if (useInitial) text = initial;
  EnsureVisible(col, row);
  m_editCol = col;
  m_editRow = row;
  auto* edit = new QLineEdit(viewport());
  edit->setFrame(false);
  edit->setFont(cell.font ? *cell.font : m_font);
  edit->setText(text);
  if (!useInitial) edit->selectAll();
  edit->setAlignment(Qt::Alignment(cell.alignment ? cell.alignment : int(Qt::AlignLeft | Qt::AlignVCenter)));
  edit->installEventFilter(this);
  m_editor = edit;
  OnEditorCreated(col, row, edit);
  PositionEditor();
  edit->show();
  edit->setFocus();
  return true;
}

void CGridCtrl::PositionEditor() {
  if (!m_editor) return;
  const QRect r = CellRect(m_editCol, m_editRow);
  if (r.isEmpty()) { m_editor->hide(); return; }
  CGridCell cell;
  GetCell(m_editCol, m_editRow, cell);
  const QRect area = CellTypeOf(cell, m_editCol, m_editRow)->EditRect(m_editCol, m_editRow, r);
  m_editor->setGeometry(area == r ? r.adjusted(1, 1, -1, -1) : area);
  m_editor->show();
}

void CGridCtrl::EndEdit(bool cancel) {
  if (!m_editor || m_ending) return;
  m_ending = true;
  const QString text = m_editor->text();
  const int col = m_editCol, row = m_editRow;
  const bool accepted = OnEditFinish(col, row, text, cancel) || cancel;
  m_ending = false;
  if (!accepted) { if (m_editor) m_editor->setFocus(); return; }
  if (QLineEdit* e = m_editor) {
    m_editor = nullptr;
    e->removeEventFilter(this);
    e->hide();
    e->deleteLater();
  }
  m_editCol = m_editRow = -1;
  RedrawCell(col, row);
  setFocus();
}

bool CGridCtrl::IsEditing() const { return m_editor != nullptr; }
QLineEdit* CGridCtrl::Editor() const { return m_editor; }

bool CGridCtrl::eventFilter(QObject* obj, QEvent* e) {
  if (m_editor && obj == m_editor) {
    if (e->type() == QEvent::KeyPress) {
      auto* ke = static_cast<QKeyEvent*>(e);
      if (ke->key() == Qt::Key_Escape) { EndEdit(true); return true; }
      if (ke->key() == Qt::Key_Return || ke->key() == Qt::Key_Enter || ke->key() == Qt::Key_Tab) {
        EndEdit(false);
        return true;
      }
    } else if (e->type() == QEvent::FocusOut) {
      // Focus moving to a drop list of the same grid keeps the editor.
      EndEdit(false);
    }
  }
  return QAbstractScrollArea::eventFilter(obj, e);
}

// ---- Hints, find, copy -------------------------------------------------------

bool CGridCtrl::HintAt(const QPoint& pt, QString* text) {
  int col, row;
  if (!HitTest(pt, &col, &row)) return false;
  QString t;
  if (!OnHint(col, row, t) || t.isEmpty()) return false;
  if (text) *text = t;
  return true;
}

void CGridCtrl::ShowHint(const QString& text, const QPoint& viewportPt) {
  QToolTip::showText(viewport()->mapToGlobal(viewportPt), text, viewport());
}

void CGridCtrl::HideHint() { QToolTip::hideText(); }

bool CGridCtrl::FindNext(const QString& text) {
  const int cols = GetNumberCols();
  if (text.isEmpty() || m_rows == 0 || cols == 0) return false;
  const long long total = static_cast<long long>(m_rows) * cols;
  long long start = m_curRow < 0 ? 0 : static_cast<long long>(m_curRow) * cols + std::max(0, m_curCol) + 1;
  CGridCell cell;
  for (long long k = 0; k < total; ++k) {
    const long long i = (start + k) % total;
    const int r = int(i / cols), c = int(i % cols);
    cell = CGridCell();
    GetCell(c, r, cell);
    if (cell.text.contains(text, Qt::CaseInsensitive)) { GotoCell(c, r); return true; }
  }
  return false;
}

QString CGridCtrl::SelectionText() {
  QString out;
  CGridCell cell;
  for (int r : GetSelectedRows()) {
    for (int c = 0; c < GetNumberCols(); ++c) {
      if (m_colWidths[std::size_t(c)] <= 0) continue;
      cell = CGridCell();
      GetCell(c, r, cell);
      if (c) out += QLatin1Char('\t');
      out += cell.text;
    }
    out += QLatin1Char('\n');
  }
  return out;
}

// ---- Columns -------------------------------------------------------------------

void CGridCtrl::MoveColumn(int from, int to) {
  const int n = GetNumberCols();
  if (from < 0 || from >= n || to < 0 || to >= n || from == to) return;
  const auto remap = [&](int c) {
    if (c == from) return to;
    if (from < to && c > from && c <= to) return c - 1;
    if (to < from && c >= to && c < from) return c + 1;
    return c;
  };
  const int w = m_colWidths[std::size_t(from)];
  m_colWidths.erase(m_colWidths.begin() + from);
  m_colWidths.insert(m_colWidths.begin() + to, w);
  UpdateColPos();
  const auto rekey = [&](auto& map) {
    std::remove_reference_t<decltype(map)> moved;
    moved.reserve(map.size());
    for (auto& [k, v] : map) {
      const int c = int(std::int32_t(std::uint32_t(k >> 32)));
      const int r = int(std::int32_t(std::uint32_t(k)));
      moved.emplace(Key::Of(c >= 0 ? remap(c) : c, r), std::move(v));
    }
    map.swap(moved);
  };
  rekey(m_stored);
  rekey(m_flags);
  if (m_curCol >= 0) m_curCol = remap(m_curCol);
  viewport()->update();
}

void CGridCtrl::SetGridCursor(Qt::CursorShape shape) {
  m_cursor = shape;
  viewport()->setCursor(shape);
}

QString CGridCtrl::dumpTsv() const {
  // GetCell asks the derived grid for the content, which is not const.
  auto* self = const_cast<CGridCtrl*>(this);
  const int cols = GetNumberCols();
  QString out;
  auto line = [&](int row) {
    bool first = true;
    for (int col = 0; col < cols; ++col) {
      if (GetColWidth(col) <= 0) continue;
      CGridCell cell;
      self->GetCell(col, row, cell);
      QString text = cell.text;
      for (QChar& ch : text)
        if (ch == QLatin1Char('\t') || ch == QLatin1Char('\r') || ch == QLatin1Char('\n')) ch = QLatin1Char(' ');
      if (!first) out += QLatin1Char('\t');
      out += text;
      first = false;
    }
    out += QLatin1Char('\n');
  };
  line(kHeading);
  for (int row = 0; row < GetNumberRows(); ++row) line(row);
  return out;
}
