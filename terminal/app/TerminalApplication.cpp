#include "terminal/app/TerminalApplication.h"

#include <QEvent>
#include <QPointer>
#include <QWidget>

namespace term {

bool TerminalApplication::notify(QObject* receiver, QEvent* event) {
  if (!afterPaint || event->type() != QEvent::Paint || !receiver->isWidgetType())
    return QApplication::notify(receiver, event);
  QPointer<QWidget> widget(static_cast<QWidget*>(receiver));
  const bool handled = QApplication::notify(receiver, event);
  if (widget) afterPaint(widget);
  return handled;
}

}  // namespace term
