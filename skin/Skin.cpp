#include "skin/Skin.h"

#include <QAbstractItemView>
#include <QAbstractScrollArea>
#include <QLineEdit>
#include <QPainter>
#include <QPainterPath>
#include <QScrollBar>
#include <QStyleFactory>
#include <QStyleOption>
#include <map>

#include "hostview/Services.h"

namespace skin {

SkinColors DefaultColors() { return SkinColors{}; }

SkinColors ColorsFromStyle(const IStyleManager* style) {
  SkinColors c;
  if (!style) return c;
  c.back = style->Color(kEditBack);
  c.text = style->Color(kEditText);
  c.frame = style->Color(kFrame);
  c.face = style->Color(kHeadBack);
  c.faceText = style->Color(kHeadText);
  // The groove sits between the window and the thumb.
  c.track = QColor((c.back.red() * 3 + c.face.red()) / 4, (c.back.green() * 3 + c.face.green()) / 4,
                   (c.back.blue() * 3 + c.face.blue()) / 4);
  return c;
}

QPalette PaletteFor(const SkinColors& c) {
  QPalette pal;
  pal.setColor(QPalette::Window, c.back);
  pal.setColor(QPalette::WindowText, c.text);
  pal.setColor(QPalette::Base, c.back);
  pal.setColor(QPalette::AlternateBase, c.track);
  pal.setColor(QPalette::Text, c.text);
  pal.setColor(QPalette::Button, c.face);
  pal.setColor(QPalette::ButtonText, c.faceText);
  pal.setColor(QPalette::Highlight, c.highlight);
  pal.setColor(QPalette::HighlightedText, c.highlightText);
  pal.setColor(QPalette::PlaceholderText, c.placeholder);
  pal.setColor(QPalette::Mid, c.frame);
  pal.setColor(QPalette::Dark, c.frame.darker(120));
  pal.setColor(QPalette::Light, c.face.lighter(110));
  pal.setColor(QPalette::Disabled, QPalette::Text, c.placeholder);
  pal.setColor(QPalette::Disabled, QPalette::WindowText, c.placeholder);
  pal.setColor(QPalette::Disabled, QPalette::ButtonText, c.placeholder);
  return pal;
}

CSkinStyle::CSkinStyle(const SkinColors& colors)
    : QProxyStyle(QStyleFactory::create(QStringLiteral("Fusion"))), m_colors(colors) {}

QPalette CSkinStyle::standardPalette() const { return PaletteFor(m_colors); }

void CSkinStyle::polish(QPalette& palette) { palette = PaletteFor(m_colors); }

int CSkinStyle::pixelMetric(PixelMetric metric, const QStyleOption* option, const QWidget* widget) const {
  switch (metric) {
    case PM_ScrollBarExtent: return 14;
    case PM_ScrollBarSliderMin: return 20;
    case PM_DefaultFrameWidth: return 1;
    default: return QProxyStyle::pixelMetric(metric, option, widget);
  }
}

namespace {
void Triangle(QPainter* p, const QRectF& r, Qt::ArrowType dir, const QColor& color) {
  const qreal s = std::min(r.width(), r.height()) * 0.36;
  const QPointF c = r.center();
  QPainterPath path;
  switch (dir) {
    case Qt::UpArrow: path.moveTo(c.x() - s, c.y() + s / 2); path.lineTo(c.x() + s, c.y() + s / 2); path.lineTo(c.x(), c.y() - s / 2); break;
    case Qt::DownArrow: path.moveTo(c.x() - s, c.y() - s / 2); path.lineTo(c.x() + s, c.y() - s / 2); path.lineTo(c.x(), c.y() + s / 2); break;
    case Qt::LeftArrow: path.moveTo(c.x() + s / 2, c.y() - s); path.lineTo(c.x() + s / 2, c.y() + s); path.lineTo(c.x() - s / 2, c.y()); break;
    default: path.moveTo(c.x() - s / 2, c.y() - s); path.lineTo(c.x() - s / 2, c.y() + s); path.lineTo(c.x() + s / 2, c.y()); break;
  }
  path.closeSubpath();
  p->fillPath(path, color);
}
}  // namespace

void CSkinStyle::DrawScrollBar(const QStyleOptionSlider* o, QPainter* p, const QWidget* w) const {
  const bool horizontal = o->orientation == Qt::Horizontal;
  p->save();
  p->setRenderHint(QPainter::Antialiasing, true);
  p->fillRect(o->rect, m_colors.track);
  p->setPen(m_colors.frame.lighter(115));
  if (horizontal) p->drawLine(o->rect.topLeft(), o->rect.topRight());
  else p->drawLine(o->rect.topLeft(), o->rect.bottomLeft());
  const bool enabled = o->state & State_Enabled;
  const QColor arrow = enabled ? m_colors.faceText : m_colors.placeholder;
  const QRect sub = subControlRect(CC_ScrollBar, o, SC_ScrollBarSubLine, w);
  const QRect add = subControlRect(CC_ScrollBar, o, SC_ScrollBarAddLine, w);
  Triangle(p, sub, horizontal ? Qt::LeftArrow : Qt::UpArrow, arrow);
  Triangle(p, add, horizontal ? Qt::RightArrow : Qt::DownArrow, arrow);
  if (enabled && o->maximum > o->minimum) {
    const QRect slider = subControlRect(CC_ScrollBar, o, SC_ScrollBarSlider, w);
    const bool hot = (o->activeSubControls & SC_ScrollBarSlider) && (o->state & (State_MouseOver | State_Sunken));
    QColor thumb = m_colors.face.darker(hot ? 125 : 112);
    p->setPen(m_colors.frame);
    p->setBrush(thumb);
    p->drawRoundedRect(QRectF(slider).adjusted(2.5, 2.5, -2.5, -2.5), 3, 3);
  }
  p->restore();
}

void CSkinStyle::DrawComboBox(const QStyleOptionComboBox* o, QPainter* p, const QWidget* w) const {
  p->save();
  p->setRenderHint(QPainter::Antialiasing, true);
  const QRectF r = QRectF(o->rect).adjusted(0.5, 0.5, -0.5, -0.5);
  const bool focus = o->state & State_HasFocus;
  p->setPen(focus ? m_colors.highlight : m_colors.frame);
  p->setBrush(o->editable ? m_colors.back : m_colors.face);
  p->drawRoundedRect(r, 2, 2);
  const QRect arrowRect = subControlRect(CC_ComboBox, o, SC_ComboBoxArrow, w);
  p->setPen(m_colors.frame.lighter(110));
  p->drawLine(arrowRect.topLeft() + QPoint(0, 3), arrowRect.bottomLeft() - QPoint(0, 3));
  Triangle(p, arrowRect, Qt::DownArrow, (o->state & State_Enabled) ? m_colors.faceText : m_colors.placeholder);
  p->restore();
}

void CSkinStyle::drawComplexControl(ComplexControl control, const QStyleOptionComplex* option, QPainter* painter,
                                    const QWidget* widget) const {
  if (control == CC_ScrollBar) {
    if (const auto* o = qstyleoption_cast<const QStyleOptionSlider*>(option)) { DrawScrollBar(o, painter, widget); return; }
  }
  if (control == CC_ComboBox) {
    if (const auto* o = qstyleoption_cast<const QStyleOptionComboBox*>(option)) { DrawComboBox(o, painter, widget); return; }
  }
  QProxyStyle::drawComplexControl(control, option, painter, widget);
}

void CSkinStyle::drawPrimitive(PrimitiveElement element, const QStyleOption* option, QPainter* painter,
                               const QWidget* widget) const {
  if (element == PE_Frame || element == PE_FrameLineEdit || element == PE_FrameMenu) {
    painter->save();
    painter->setPen(m_colors.frame);
    painter->setBrush(Qt::NoBrush);
    painter->drawRect(option->rect.adjusted(0, 0, -1, -1));
    painter->restore();
    return;
  }
  QProxyStyle::drawPrimitive(element, option, painter, widget);
}

namespace {
// One style per colour set for the life of the process: widgets never own a
// style, and a style must outlive every widget drawn with it.
CSkinStyle* StyleFor(const SkinColors& c) {
  static std::map<QString, CSkinStyle*> styles;
  QString key;
  for (const QColor* q : {&c.back, &c.text, &c.frame, &c.face, &c.faceText, &c.track, &c.highlight,
                          &c.highlightText, &c.placeholder})
    key += q->name(QColor::HexArgb);
  auto it = styles.find(key);
  if (it != styles.end()) return it->second;
  auto* style = new CSkinStyle(c);
  styles.emplace(key, style);
  return style;
}
}  // namespace

void ApplySkin(QWidget* widget, const SkinColors& colors) {
  if (!widget) return;
  CSkinStyle* style = StyleFor(colors);
  const QPalette pal = PaletteFor(colors);
  const auto apply = [&](QWidget* w) {
    if (w->style() != style) w->setStyle(style);
    w->setPalette(pal);
  };
  apply(widget);
  for (QScrollBar* bar : widget->findChildren<QScrollBar*>()) apply(bar);
  for (QLineEdit* edit : widget->findChildren<QLineEdit*>()) apply(edit);
  widget->update();
}

}  // namespace skin

CSkinComboBox::CSkinComboBox(QWidget* parent) : QComboBox(parent), m_colors(skin::DefaultColors()) {
  skin::ApplySkin(this, m_colors);
}

void CSkinComboBox::SetStyleManager(const IStyleManager* style) { SetSkinColors(skin::ColorsFromStyle(style)); }

void CSkinComboBox::SetSkinColors(const skin::SkinColors& colors) {
  m_colors = colors;
  skin::ApplySkin(this, colors);
  if (view()) skin::ApplySkin(view(), colors);
}
