#include "controls/CellTypes.h"

#include <QBitmap>
#include <QFileInfo>
#include <QPainterPath>
#include <QStyle>
#include <QStyleOption>
#include <QStyledItemDelegate>

#include "grid/GridCtrl.h"
#include "hostview/Services.h"

// ---- CStyleImage --------------------------------------------------------------

void CStyleImage::SetPath(std::wstring path) {
  m_path = std::move(path);
  m_loaded = false;
}

std::wstring CStyleImage::ForStyle(const std::wstring& path, int styleId) {
  static const std::wstring tag = L"[styleID]";
  std::wstring out = path;
  const std::wstring id = std::to_wstring(styleId);
  for (std::size_t at = out.find(tag); at != std::wstring::npos; at = out.find(tag, at + id.size()))
    out.replace(at, tag.size(), id);
  return out;
}

const QPixmap& CStyleImage::Get(const IStyleManager* style, int styleId) {
  if (m_loaded && m_loadedStyle == styleId && m_loadedFrom == style) return m_pixmap;
  m_loaded = true;
  m_loadedStyle = styleId;
  m_loadedFrom = style;
  m_pixmap = QPixmap();
  if (m_path.empty()) return m_pixmap;
  // The terminal resolves its own image folders; without it the path is read
  // relative to the working directory.
  std::wstring file = style ? style->ResolveImagePath(m_path, styleId) : ForStyle(m_path, styleId);
  if (file.empty()) return m_pixmap;
  const QString name = QString::fromStdWString(file);
  if (!QFileInfo::exists(name)) return m_pixmap;
  QPixmap pm(name);
  if (!pm.isNull()) {
    const QBitmap mask = pm.createMaskFromColor(QColor(255, 0, 255), Qt::MaskInColor);
    pm.setMask(mask);
  }
  m_pixmap = pm;
  return m_pixmap;
}

// ---- PCheckBoxTypeEx ------------------------------------------------------------

void PCheckBoxTypeEx::OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
                             bool current) {
  if (row < 0 && m_grid) m_grid->GetHeadingType()->DrawFace(p, rect, cell);
  else { DrawBackground(p, rect, cell, selected); DrawBorder(p, rect); }
  const QColor text = TextColor(cell, selected);
  const QColor back = BackColor(cell, selected);
  // The box takes the cell's colours: a lighter frame of the text colour on a
  // background a touch brighter than the cell.
  const QRect box = BoxRect(rect, cell.alignment);
  DrawBox(p, box, cell.number != 0, text.lightness() > 160 ? text : text.lighter(170),
          back.lightness() > 200 ? QColor(Qt::white) : back.lighter(125), text);
}

// ---- PSortArrowTypeEx -------------------------------------------------------------

void PSortArrowTypeEx::OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
                              bool current) {
  CGridHeadingType::OnDraw(p, rect.adjusted(0, 0, -14, 0), col, row, cell, selected, current);
  // The face under the arrow continues the heading.
  const QRect arrowArea(rect.right() - 14, rect.top(), 15, rect.height());
  DrawFace(p, arrowArea, cell);
  const bool up = cell.number == 0;
  const CGridCtrl::Colors def;
  const QColor color = cell.textColor.isValid() ? cell.textColor : (m_grid ? m_grid->GetColors() : def).headText;
  if (m_themes && m_grid) {
    QStyleOptionSpinBox opt;
    opt.initFrom(m_grid);
    opt.rect = QRect(arrowArea.left() + 2, arrowArea.center().y() - 5, 10, 10);
    opt.palette.setColor(QPalette::ButtonText, color);
    opt.state |= QStyle::State_Enabled;
    opt.stepEnabled = QAbstractSpinBox::StepUpEnabled | QAbstractSpinBox::StepDownEnabled;
    m_grid->style()->drawPrimitive(up ? QStyle::PE_IndicatorArrowUp : QStyle::PE_IndicatorArrowDown, &opt, &p,
                                   m_grid);
    return;
  }
  DrawArrow(p, arrowArea.adjusted(2, 0, -2, 0), up, color);
}

// ---- PUDArrowTypeEx ---------------------------------------------------------------

void PUDArrowTypeEx::OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool selected, bool) {
  DrawBackground(p, rect, cell, selected);
  DrawBorder(p, rect);
  const QColor color = TextColor(cell, selected);
  const int h = std::max(4, (rect.height() - 6) / 2);
  const QRect upper(rect.left() + 2, rect.top() + 2, rect.width() - 4, h);
  const QRect lower(rect.left() + 2, rect.bottom() - 2 - h, rect.width() - 4, h);
  CGridSortArrowType::DrawArrow(p, upper, true, color);
  CGridSortArrowType::DrawArrow(p, lower, false, color);
}

// ---- PEmptyTypeEx -----------------------------------------------------------------

PEmptyTypeEx::PEmptyTypeEx(CGridCtrl* grid) : CGridCellType(grid) {
  SetBorderPen(QPen(QColor(255, 255, 255), 1));
}

void PEmptyTypeEx::OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool, bool) {
  DrawBackground(p, rect, cell, false);
  DrawBorder(p, rect);
}

// ---- PArrowButtonTypeEx -------------------------------------------------------------

void PArrowButtonTypeEx::DrawInfoGlyph(QPainter& p, const QRect& r, const QColor& color) {
  const int d = std::min(r.width(), r.height());
  const QRectF c(r.center().x() - d / 2.0 + 0.5, r.center().y() - d / 2.0 + 0.5, d - 1, d - 1);
  p.save();
  p.setRenderHint(QPainter::Antialiasing, true);
  p.setPen(Qt::NoPen);
  p.setBrush(color);
  p.drawEllipse(c);
  p.setBrush(Qt::white);
  const qreal u = c.width() / 8.0;
  p.drawEllipse(QPointF(c.center().x(), c.top() + 2.2 * u), u * 0.75, u * 0.75);
  p.drawRoundedRect(QRectF(c.center().x() - u * 0.7, c.top() + 3.5 * u, u * 1.4, u * 3.4), u * 0.3, u * 0.3);
  p.restore();
}

void PArrowButtonTypeEx::OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell,
                                bool selected, bool current) {
  CGridCell back = cell;
  DrawBackground(p, rect, back, selected);
  DrawBorder(p, rect);
  const bool pushed = cell.flags & CGridCell::kFlagPressed;
  const QRect face = rect.adjusted(1, 1, -1, -1);
  CGridCell f;
  DrawFace(p, face, f, pushed);
  const QPixmap& pm = m_image.Get(m_style, m_styleId);
  const int side = std::min(face.width(), face.height()) - 6;
  QRect target(face.center().x() - side / 2, face.center().y() - side / 2, side, side);
  if (pushed) target.translate(1, 1);
  if (!pm.isNull()) {
    const QSize s = pm.size().scaled(target.size(), Qt::KeepAspectRatio);
    p.drawPixmap(QRect(QPoint(target.center().x() - s.width() / 2, target.center().y() - s.height() / 2), s), pm);
  } else {
    DrawInfoGlyph(p, target, QColor(40, 110, 190));
  }
}

// ---- PFilterCKListBox ------------------------------------------------------------------

namespace {
class FilterItemDelegate : public QStyledItemDelegate {
 public:
  using QStyledItemDelegate::QStyledItemDelegate;
  void paint(QPainter* p, const QStyleOptionViewItem& option, const QModelIndex&) const override {
    PFilterCKListBox::DrawItem(*p, option.rect, option.state & QStyle::State_Selected);
  }
  QSize sizeHint(const QStyleOptionViewItem& option, const QModelIndex&) const override {
    return QSize(option.rect.width(), PFilterCKListBox::kItemHeight);
  }
};
}  // namespace

PFilterCKListBox::PFilterCKListBox(QWidget* parent) : QListWidget(parent) {
  setItemDelegate(new FilterItemDelegate(this));
  setUniformItemSizes(true);
}

void PFilterCKListBox::DrawItem(QPainter& p, const QRect& rect, bool selected) {
  p.save();
  p.setRenderHint(QPainter::Antialiasing, false);
  p.setBrush(Qt::NoBrush);
  p.setPen(QPen(Qt::black, 1));
  // Right and bottom edges one pixel inside the item.
  p.drawRect(QRect(rect.left(), rect.top(), rect.width() - 2, rect.height() - 2));
  const int side = rect.height() - 5;
  p.setPen(QPen(selected ? Qt::black : Qt::white, 1));
  p.drawRect(QRect(rect.left() + 2, rect.top() + 2, side - 1, side - 1));
  p.restore();
}
