#pragma once
// Starting bin/terminal as a child process from an integration test.
#include <QString>
#include <QStringList>

namespace mvtest {

// A guard against a hung terminal, not a wait.
constexpr int kTerminalTimeoutMs = 120000;

// MV_BIN/terminal, else bin/terminal next to the test's folder (<build>/tests/..).
QString TerminalPath();

struct RunResult {
  int exitCode = -1;  // -1: crashed or did not finish
  QString out;
  QString err;
};

// Runs the terminal with `args` (Qt offscreen) to its end and collects its output.
RunResult RunTerminal(const QStringList& args, int timeoutMs = kTerminalTimeoutMs);

}  // namespace mvtest
