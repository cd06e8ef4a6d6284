#pragma once
// One QApplication for the widget tests (offscreen platform from the test
// environment), and the virtual clock.
#include <QApplication>
#include <QImage>
#include <QPainter>
#include <QWidget>

#include "mvtest/ProcessStateReset.h"
#include "platform/Platform.h"

inline QApplication& UiApp() {
  static int argc = 1;
  static char name[] = "ui_tests";
  static char* argv[] = {name, nullptr};
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  static QApplication* app = [] {
    platform::UseVirtualClock();
    return new QApplication(argc, argv);
  }();
  return *app;
}

// Renders `w` as it would appear on screen.
inline QImage Render(QWidget* w) {
  QImage img(w->size(), QImage::Format_ARGB32_Premultiplied);
  img.fill(Qt::white);
  QPainter p(&img);
  w->render(&p);
  return img;
}
