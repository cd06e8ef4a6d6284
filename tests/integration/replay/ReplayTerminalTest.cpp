// The terminal records a headless session and replays it: with the same
// views open, every dump file comes out byte for byte the same. Bad
// recordings are refused with the line and the reason.
#include <gtest/gtest.h>

#include "mvtest/TerminalProcess.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringList>
#include <QTemporaryDir>

namespace {

constexpr int kProcessTimeoutMs = 180000;  // a guard against a hung terminal, not a wait
const QString kSeed = "4242";
const QString kSeconds = "8";

using mvtest::RunResult;
using mvtest::TerminalPath;

RunResult RunTerminal(const QStringList& args) { return mvtest::RunTerminal(args, kProcessTimeoutMs); }

// "PRODUCTID:CODE" of the first simulated share on SGX.
QString Share() {
  static QString share;
  if (!share.isEmpty()) return share;
  const RunResult list = RunTerminal({"--seed", kSeed, "--list-instruments"});
  for (const QString& line : list.out.split('\n', Qt::SkipEmptyParts)) {
    const QStringList f = line.split('\t');
    if (f.size() >= 3 && f[2] == "SGX") return share = f[0] + ":" + f[1];
  }
  return {};
}

// One view class of the identity check: whether it opens on an instrument.
struct ViewCase {
  const char* viewClass;
  bool onInstrument;
};

// One line per view that dumps a grid.
const ViewCase kViews[] = {
    {"CMarketDepthAdv", true},
    {"CTimeAndSalesAdv", true},
    {"CPriceViewAdv", false},
    {"CTradeSummaryAdv", true},
};

QStringList OpenArgs(const std::vector<ViewCase>& views) {
  QStringList args;
  for (const ViewCase& v : views)
    args << "--open" << (v.onInstrument ? QString(v.viewClass) + ":" + Share() : QString(v.viewClass));
  return args;
}

// Every view's dump file of a dump folder by name (not the simulator's
// market-*.tsv files: tapes, summaries, quotes, which a replay does not write).
std::map<QString, QByteArray> DumpFiles(const QString& dir) {
  std::map<QString, QByteArray> out;
  for (const QFileInfo& f : QDir(dir).entryInfoList(QDir::Files)) {
    if (f.fileName().startsWith("market-")) continue;  // the simulator's files, not a view's
    QFile file(f.filePath());
    if (file.open(QIODevice::ReadOnly)) out[f.fileName()] = file.readAll();
  }
  return out;
}

// Records a session with `views` open, replays it with the same views, and
// compares the dumps.
void ExpectIdenticalReplay(const std::vector<ViewCase>& views) {
  ASSERT_TRUE(QFile::exists(TerminalPath())) << TerminalPath().toStdString();
  ASSERT_FALSE(Share().isEmpty());
  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  const QString recording = dir.filePath("session.mvrec");
  const QStringList common = QStringList{"--headless", "--no-restore"} + OpenArgs(views);
  const RunResult live = RunTerminal(common + QStringList{"--seed", kSeed, "--seconds", kSeconds, "--data-dir",
                                                          dir.filePath("live-data"), "--dump", dir.filePath("live"),
                                                          "--record", recording});
  ASSERT_EQ(live.exitCode, 0) << live.err.toStdString();
  EXPECT_TRUE(live.err.contains("recorded the market to " + recording)) << live.err.toStdString();

  const RunResult replay = RunTerminal(common + QStringList{"--data-dir", dir.filePath("replay-data"), "--dump",
                                                            dir.filePath("replay"), "--replay", recording});
  ASSERT_EQ(replay.exitCode, 0) << replay.err.toStdString();
  EXPECT_TRUE(replay.err.contains("replaying " + recording + " (2026-12-07) for " + kSeconds + " simulated seconds"))
      << "a headless replay lasts as long as its recording: " << replay.err.toStdString();
  EXPECT_FALSE(replay.err.contains("warning")) << replay.err.toStdString();

  const auto recorded = DumpFiles(dir.filePath("live"));
  const auto replayed = DumpFiles(dir.filePath("replay"));
  EXPECT_TRUE(QDir(dir.filePath("replay")).entryList({"market-trades-*"}).isEmpty())
      << "the simulator's tapes are not the replayed market";
  for (const ViewCase& v : views)
    EXPECT_TRUE(recorded.count(QString(v.viewClass) + "-1.tsv")) << v.viewClass << " wrote no dump";
  ASSERT_EQ(replayed.size(), recorded.size());
  for (const auto& [name, bytes] : recorded) {
    SCOPED_TRACE(name.toStdString());
    ASSERT_TRUE(replayed.count(name));
    EXPECT_GT(bytes.count('\n'), 2) << "the dump shows a market";
    EXPECT_EQ(replayed.at(name), bytes) << "recorded:\n" << bytes.toStdString() << "\nreplayed:\n"
                                        << replayed.at(name).toStdString();
  }
}

class ReplayIdentity : public ::testing::TestWithParam<ViewCase> {};

}  // namespace

TEST_P(ReplayIdentity, AReplayedSessionDumpsByteForByteWhatTheRecordedOneDumped) {
  ExpectIdenticalReplay({GetParam()});
}

INSTANTIATE_TEST_SUITE_P(Views, ReplayIdentity, ::testing::ValuesIn(kViews),
                         [](const ::testing::TestParamInfo<ViewCase>& info) { return std::string(info.param.viewClass); });

TEST(ReplayTerminal, AllTheseViewsTogetherReplayByteForByte) {
  ExpectIdenticalReplay(std::vector<ViewCase>(std::begin(kViews), std::end(kViews)));
}

TEST(ReplayTerminal, BadNewerAndCutOffRecordingsAreToldApart) {
  ASSERT_TRUE(QFile::exists(TerminalPath())) << TerminalPath().toStdString();
  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  const QStringList headless{"--headless", "--no-restore", "--data-dir", dir.filePath("data")};
  auto write = [&](const QString& name, const QByteArray& bytes) {
    QFile f(dir.filePath(name));
    EXPECT_TRUE(f.open(QIODevice::WriteOnly | QIODevice::Truncate));
    f.write(bytes);
    return dir.filePath(name);
  };
  const QByteArray header = "MVREC\t1\tseed=7\tdate=2026-12-07\tstart=10:30:00\n";
  const QByteArray reference =
      "P\t101\tES\tEquities\t\nX\tSGX\tSGX\tSingapore Exchange\t101\n"
      "I\tSGX\tAAA\t101\tAlpha\tAAA\t3\tAAA\t3\t3\t100\t0\t0\tFIN\t0\t1.5\tAAA.SI\tSGD\t\tES\nR\t1\t1\t1\n";

  const QString bad = write("bad.mvrec", header + reference + "V\t0\t0\tBID\t0\t0\t1.5\nV\t10\t3\tBID\t0\t0\t1.6\n");
  RunResult r = RunTerminal(headless + QStringList{"--replay", bad});
  EXPECT_EQ(r.exitCode, 1);
  EXPECT_TRUE(r.err.contains("terminal: " + bad + ":7: the instrument \"3\" is not one of the 1 recorded instruments"))
      << r.err.toStdString();

  const QString newer = write("newer.mvrec", "MVREC\t3\tdate=2027-01-04\tstart=09:00:00\n");
  r = RunTerminal(headless + QStringList{"--replay", newer});
  EXPECT_EQ(r.exitCode, 1);
  EXPECT_TRUE(r.err.contains(newer + ": a recording of format version 3, newer than this terminal reads (version 1)"))
      << r.err.toStdString();

  const QString cut = write("cut.mvrec", header + reference + "V\t0\t0\tBID\t0\t0\t1.5\nV\t3000\t0\tBID\t0\t0\t1.6\nV\t31");
  r = RunTerminal(headless + QStringList{"--replay", cut, "--open", "CMarketDepthAdv:101:AAA"});
  EXPECT_EQ(r.exitCode, 0) << r.err.toStdString();
  EXPECT_TRUE(r.err.contains("warning: " + cut + ":8: the last line is incomplete")) << r.err.toStdString();
  EXPECT_TRUE(r.err.contains("for 3 simulated seconds")) << "it plays up to its last event: " << r.err.toStdString();

  r = RunTerminal({"--replay", cut, "--list-instruments"});
  EXPECT_EQ(r.exitCode, 0);
  EXPECT_EQ(r.out, "101\tAAA\tSGX\tAlpha\n") << "the recording's instruments";

  r = RunTerminal(headless + QStringList{"--speed", "5"});
  EXPECT_EQ(r.exitCode, 2);
  EXPECT_TRUE(r.err.contains("use it with --replay FILE")) << r.err.toStdString();
  r = RunTerminal(headless + QStringList{"--record", dir.filePath("no/such/dir/x.mvrec")});
  EXPECT_EQ(r.exitCode, 1);
  EXPECT_TRUE(r.err.contains("cannot create the recording")) << r.err.toStdString();
}
