// The terminal killed while it saves: a --save-churn run is killed with
// SIGKILL a few generations in, at several points; after each kill the
// terminal's own check finds every watchlist, alert, setting and the layout
// whole and none older than what the run said it had committed, and the next
// run carries on from there. (scripts/crash-churn does the same 1,000 times.)
#include <gtest/gtest.h>

#include <QProcess>
#include <QProcessEnvironment>
#include <QTemporaryDir>

#include "mvtest/TerminalProcess.h"

namespace {

constexpr int kGuardMs = 60000;  // against a hung terminal, not a wait

// Starts a churn and kills it once it has said `after` more generations were committed.
// Returns the last generation it said was committed (-1: none).
long long ChurnAndKill(const QString& dataDir, int after) {
  QProcess p;
  QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
  env.insert("QT_QPA_PLATFORM", "offscreen");
  p.setProcessEnvironment(env);
  p.start(mvtest::TerminalPath(), {"--headless", "--data-dir", dataDir, "--seconds", "1000000", "--save-churn"});
  if (!p.waitForStarted(kGuardMs)) return -2;
  long long last = -1;
  int seen = 0;
  QByteArray pending;
  while (seen < after && p.state() == QProcess::Running && p.waitForReadyRead(kGuardMs)) {
    pending += p.readAllStandardOutput();
    for (qsizetype nl; (nl = pending.indexOf('\n')) >= 0; pending.remove(0, nl + 1)) {
      const QByteArray line = pending.left(nl);
      if (line.startsWith("churn: committed ")) {
        last = line.mid(17).toLongLong();
        ++seen;
      }
    }
  }
  p.kill();  // SIGKILL, somewhere in the next generation's saves
  p.waitForFinished(kGuardMs);
  pending += p.readAllStandardOutput();
  for (const QByteArray& line : pending.split('\n'))
    if (line.startsWith("churn: committed ")) last = line.mid(17).toLongLong();
  return last;
}

TEST(CrashChurn, EverySetIsOldOrNewAfterEachKillAndTheNextRunCarriesOn) {
  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  const QString data = dir.filePath("data");
  long long committed = 0;
  for (int after : {1, 3, 2, 6}) {
    const long long last = ChurnAndKill(data, after);
    ASSERT_GE(last, committed) << "a run said it committed an older generation";
    committed = last;
    const mvtest::RunResult check = mvtest::RunTerminal({"--check-churn", QString::number(committed), "--data-dir", data});
    EXPECT_EQ(check.exitCode, 0) << check.out.toStdString() << check.err.toStdString();
    EXPECT_TRUE(check.out.contains(": ok")) << check.out.toStdString();
  }
  EXPECT_GE(committed, 8);  // each run first saves the newest generation again
}

TEST(CrashChurn, TheCheckRefusesAStoreThatLostWhatWasCommitted) {
  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  // Nothing was ever saved here, yet generation 5 is said to be committed.
  const mvtest::RunResult check = mvtest::RunTerminal({"--check-churn", "5", "--data-dir", dir.filePath("data")});
  EXPECT_EQ(check.exitCode, 3) << check.out.toStdString();
  EXPECT_TRUE(check.out.contains("FAILED")) << check.out.toStdString();
  EXPECT_TRUE(check.out.contains("the database is gone")) << check.out.toStdString();
}

}  // namespace
