#include "terminal/app/TerminalStyle.h"

#include <QMainWindow>
#include <QStyleFactory>
#include <QStyleOptionTab>
#include <QTabBar>

namespace term {

namespace {
// The tab bars the main window makes for tabbed docks.
bool IsDockTabBar(const QWidget* widget) {
  return qobject_cast<const QTabBar*>(widget) && qobject_cast<const QMainWindow*>(widget->parentWidget());
}
}  // namespace

TerminalStyle::TerminalStyle() : QProxyStyle(QStyleFactory::create(QStringLiteral("Fusion"))) {}

void TerminalStyle::drawControl(ControlElement element, const QStyleOption* option, QPainter* painter,
                                const QWidget* widget) const {
  if (element == CE_TabBarTabLabel && IsDockTabBar(widget)) {
    if (const auto* tab = qstyleoption_cast<const QStyleOptionTab*>(option); tab && tab->text.contains('&')) {
      QStyleOptionTab copy(*tab);
      copy.text.replace('&', QStringLiteral("&&"));
      QProxyStyle::drawControl(element, &copy, painter, widget);
      return;
    }
  }
  QProxyStyle::drawControl(element, option, painter, widget);
}

QSize TerminalStyle::sizeFromContents(ContentsType type, const QStyleOption* option, const QSize& size,
                                      const QWidget* widget) const {
  QSize out = QProxyStyle::sizeFromContents(type, option, size, widget);
  if (type == CT_TabBarTab && IsDockTabBar(widget)) {
    // The tab was measured without its "&"s.
    if (const auto* tab = qstyleoption_cast<const QStyleOptionTab*>(option))
      out.rwidth() += int(tab->text.count('&')) * widget->fontMetrics().horizontalAdvance('&');
  }
  return out;
}

}  // namespace term
