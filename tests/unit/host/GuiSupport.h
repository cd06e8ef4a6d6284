#pragma once
// One QApplication per test process, and a style manager with known colours.
#include <QApplication>
#include <QFont>
#include <string>
#include <vector>

#include "hostview/Services.h"

inline QApplication* EnsureApp() {
  if (auto* app = qobject_cast<QApplication*>(QCoreApplication::instance())) return app;
  static int argc = 1;
  static char name[] = "host_controls_test";
  static char* argv[] = {name, nullptr};
  // Never destroyed: Qt's own statics go first at exit.
  static QApplication* app = new QApplication(argc, argv);
  return app;
}

class FakeStyle : public IStyleManager {
 public:
  int styleId = 3;
  std::string imageDir;  // where resolved images live; empty: none
  mutable std::vector<std::wstring> resolved;
  int GetStyleID() const override { return styleId; }
  COLORREF GetColor(int id) const override { return MakeColorRef(id & 0xFF, (id >> 8) & 0xFF, 0x40); }
  QFont GetFont(int) const override { return QFont(); }
  std::wstring ResolveImagePath(const std::wstring& path, int) const override {
    resolved.push_back(path);
    if (imageDir.empty()) return {};
    const auto slash = path.find_last_of(L"\\/");
    return std::wstring(imageDir.begin(), imageDir.end()) + L"/" + path.substr(slash + 1);
  }
};
