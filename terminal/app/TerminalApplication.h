#pragma once
// The terminal's QApplication: it can tell when a widget's paint has returned
// (the end of the paint of a view's window, for --latency-report).
#include <QApplication>
#include <functional>

namespace term {

class TerminalApplication : public QApplication {
 public:
  TerminalApplication(int& argc, char** argv) : QApplication(argc, argv) {}
  // Called after each paint event of a widget has been handled; empty: nothing.
  std::function<void(QWidget*)> afterPaint;
  bool notify(QObject* receiver, QEvent* event) override;
};

}  // namespace term
