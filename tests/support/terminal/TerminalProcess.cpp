#include "mvtest/TerminalProcess.h"

#include <QDir>
#include <QFileInfo>
#include <QProcess>
#include <QProcessEnvironment>
#include <cstdlib>
#include <unistd.h>

namespace mvtest {

QString TerminalPath() {
  if (const char* bin = std::getenv("MV_BIN"); bin && *bin) return QDir(QString::fromLocal8Bit(bin)).filePath("terminal");
  char exe[4096];
  const ssize_t n = readlink("/proc/self/exe", exe, sizeof exe - 1);
  if (n <= 0) return QString();
  exe[n] = '\0';
  QDir dir = QFileInfo(QString::fromLocal8Bit(exe)).dir();
  return dir.cdUp() ? dir.filePath("bin/terminal") : QString();
}

RunResult RunTerminal(const QStringList& args, int timeoutMs) {
  QProcess p;
  QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
  env.insert("QT_QPA_PLATFORM", "offscreen");
  p.setProcessEnvironment(env);
  p.start(TerminalPath(), args);
  RunResult r;
  if (!p.waitForFinished(timeoutMs)) {
    p.kill();
    p.waitForFinished();
    r.err = "terminal did not finish";
    return r;
  }
  r.exitCode = p.exitStatus() == QProcess::NormalExit ? p.exitCode() : -1;
  r.out = QString::fromUtf8(p.readAllStandardOutput());
  r.err = QString::fromUtf8(p.readAllStandardError());
  return r;
}

}  // namespace mvtest
