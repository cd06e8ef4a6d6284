#include "views/instrument/InstrumentGrid.h"

#include <QPaintEvent>
#include <QPainter>

#include "hostview/Services.h"
#include "skin/Skin.h"

void CElidedHeadingType::OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool, bool) {
  DrawFace(p, rect, cell);
  if (cell.text.isEmpty()) return;
  p.setFont(cell.font ? *cell.font : (m_grid ? m_grid->GetHeadingFont() : QFont()));
  const CGridCtrl::Colors def;
  p.setPen(cell.textColor.isValid() ? cell.textColor : (m_grid ? m_grid->GetColors() : def).headText);
  int align = cell.alignment ? cell.alignment : int(Qt::AlignCenter);
  if (!(align & Qt::AlignVertical_Mask)) align |= Qt::AlignVCenter;
  const QRect area = rect.adjusted(3, 0, -4, -1);
  const QString text = p.fontMetrics().elidedText(cell.text, Qt::ElideRight, std::max(0, area.width()));
  p.drawText(area, align | Qt::TextSingleLine, text);
}

CInstrumentGrid::CInstrumentGrid(QWidget* parent) : CGridCtrl(parent) {}

CInstrumentGrid::~CInstrumentGrid() = default;

void CInstrumentGrid::SetMessage(const std::wstring& text) {
  if (text == m_message) return;
  m_message = text;
  viewport()->update();
}

void CInstrumentGrid::SetStyleManager(IStyleManager* style) {
  m_style = style;
  if (style) {
    m_oddRow = style->Color(kOddRow);
    m_evenRow = style->Color(kEvenRow);
    m_cellText = style->Color(kCellText);
    m_changedText = style->Color(kChangedText);
    m_changedBack = style->Color(kChangedBack);
    m_headBack = style->Color(kHeadBack);
    m_headText = style->Color(kHeadText);
  }
  ApplyStyle(style);
  if (style) {
    // Scroll bars and frame in the grid's own colours (not the edit fields').
    skin::SkinColors sc = skin::ColorsFromStyle(style);
    sc.back = m_evenRow;
    sc.text = m_cellText;
    sc.track = QColor((sc.back.red() * 3 + sc.face.red()) / 4, (sc.back.green() * 3 + sc.face.green()) / 4,
                      (sc.back.blue() * 3 + sc.face.blue()) / 4);
    skin::ApplySkin(this, sc);
  }
  Colors c = GetColors();
  c.back = m_evenRow;
  c.empty = m_evenRow;
  c.text = m_cellText;
  c.headBack = m_headBack;
  c.headText = m_headText;
  if (style) c.gridLine = style->Color(kFrame);
  SetColors(c);
}

void CInstrumentGrid::Reset() {
  SetNumberRows(0);
  ClearSelection();
}

void CInstrumentGrid::Redraw() { viewport()->update(); }

void CInstrumentGrid::paintEvent(QPaintEvent* e) {
  CGridCtrl::paintEvent(e);
  if (m_message.empty()) return;
  QPainter p(viewport());
  const int top = GetTH_Height() + GetNumberRows() * GetDefRowHeight() + 8;
  const QRect area(8, top, viewport()->width() - 16, std::max(0, viewport()->height() - top - 8));
  if (area.height() <= 0 || area.width() <= 0) return;
  p.setFont(GetDefFont());
  p.setPen(m_cellText);
  p.drawText(area, Qt::AlignHCenter | Qt::AlignTop | Qt::TextWordWrap, QString::fromStdWString(m_message));
}
