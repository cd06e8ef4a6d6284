// The playback bar drives the replayed market and says where it stands; the
// command line takes --record, --replay and --speed only where they make sense.
#include <gtest/gtest.h>

#include <QApplication>
#include <QComboBox>
#include <QSignalSpy>
#include <QTimeEdit>
#include <QToolButton>

#include "ReplayFixture.h"
#include "terminal/app/Options.h"
#include "terminal/app/PlaybackBar.h"
#include "terminal/host/ReplaySource.h"

namespace {

QApplication& App() {
  static int argc = 1;
  static char name[] = "replay_window_tests";
  static char* argv[] = {name, nullptr};
  static QApplication app(argc, argv);
  return app;
}

constexpr std::uint32_t kStart = 1000;

struct Fixture {
  TempDir dir;
  term::rec::Summary summary;
  Fixture() {
    WriteRecording(dir.File("r.mvrec"), {{0, 0, "BID", 0, 0, "1.5"}, {1500, 0, "BID", 0, 0, "1.6"}}, 2000);
    std::string error;
    EXPECT_TRUE(term::rec::Scan(dir.File("r.mvrec"), summary, error)) << error;
  }
};

bool Parse(std::vector<std::string> args, term::Options& o, std::string& error) {
  args.insert(args.begin(), "terminal");
  std::vector<char*> argv;
  for (auto& a : args) argv.push_back(a.data());
  return term::ParseOptions(int(argv.size()), argv.data(), o, error);
}

}  // namespace

TEST(PlaybackBar, PlaysPausesChangesSpeedAndSaysWhichDay) {
  App();
  Fixture f;
  term::ReplaySource replay(f.summary, kStart);
  term::PlaybackBar bar(replay);
  EXPECT_EQ(bar.StatusLabel()->text(), "Market: replay of 2026-12-07");
  EXPECT_EQ(bar.TimeLabel()->text().trimmed(), "10:30:00 of 10:30:02");
  QStringList speeds;
  for (int k = 0; k < bar.SpeedBox()->count(); ++k) speeds << bar.SpeedBox()->itemText(k);
  EXPECT_EQ(speeds, (QStringList{"1×", "2×", "5×", "10×", "60×"}));
  EXPECT_EQ(bar.SpeedBox()->currentText(), "1×");

  EXPECT_EQ(bar.PlayButton()->text(), "Pause");
  bar.PlayButton()->click();
  EXPECT_TRUE(replay.Paused());
  EXPECT_EQ(bar.PlayButton()->text(), "Play");
  EXPECT_TRUE(bar.TimeLabel()->text().contains("(paused)"));
  replay.AdvanceTo(kStart + 500);
  EXPECT_EQ(replay.ElapsedMs(), 0u);
  bar.PlayButton()->click();
  EXPECT_FALSE(replay.Paused());

  bar.SpeedBox()->setCurrentIndex(3);
  emit bar.SpeedBox()->activated(3);
  EXPECT_EQ(replay.Speed(), 10);
  replay.AdvanceTo(kStart + 600);  // 100 ms after the resume at 10x
  bar.Refresh();
  EXPECT_EQ(replay.ElapsedMs(), 1000u);
  EXPECT_EQ(bar.TimeLabel()->text().trimmed(), "10:30:01 of 10:30:02");
}

TEST(PlaybackBar, JumpsForwardToATimeOfTheSessionOnly) {
  App();
  Fixture f;
  term::ReplaySource replay(f.summary, kStart);
  term::PlaybackBar bar(replay);
  QSignalSpy notices(&bar, &term::PlaybackBar::notice);
  replay.AdvanceTo(kStart + 700);

  bar.JumpTime()->setTime(QTime(10, 30, 0));
  bar.JumpButton()->click();
  ASSERT_EQ(notices.count(), 1);
  EXPECT_EQ(notices.takeFirst().at(0).toString(), "The replay only jumps forward: choose a time after 10:30:00.");
  EXPECT_EQ(replay.ElapsedMs(), 700u);

  bar.JumpTime()->setTime(QTime(10, 30, 1, 500));
  bar.JumpButton()->click();
  EXPECT_EQ(replay.ElapsedMs(), 1500u);
  EXPECT_EQ(replay.FieldValue(0, "BID", 0, 0), "1.6");
  EXPECT_EQ(notices.count(), 0);

  bar.JumpTime()->setTime(QTime(11, 0, 0));
  bar.JumpButton()->click();
  ASSERT_EQ(notices.count(), 1);
  EXPECT_EQ(notices.takeFirst().at(0).toString(), "The recording ends at 10:30:02; the replay jumps to its end.");
  EXPECT_TRUE(replay.Ended());
  EXPECT_EQ(bar.TimeLabel()->text().trimmed(), "10:30:02 of 10:30:02 (end of the recording)");
}

TEST(PlaybackBar, OffersASpeedGivenOnTheCommandLineAndShowsAStoppedReplay) {
  App();
  Fixture f;
  term::ReplaySource replay(f.summary, kStart, 3);
  term::PlaybackBar bar(replay);
  EXPECT_EQ(bar.SpeedBox()->itemText(2), "3×");
  EXPECT_EQ(bar.SpeedBox()->currentText(), "3×");

  fs::remove(f.dir.File("r.mvrec"));
  term::ReplaySource gone(f.summary, kStart);
  term::PlaybackBar goneBar(gone);
  EXPECT_TRUE(goneBar.StatusLabel()->text().startsWith("Market: replay of 2026-12-07 - stopped: cannot open the recording"))
      << goneBar.StatusLabel()->text().toStdString();
}

TEST(ReplayOptions, TakesRecordReplayAndSpeedWhereTheyMakeSense) {
  term::Options o;
  std::string error;
  ASSERT_TRUE(Parse({"--record", "a.mvrec", "--replay", "b.mvrec", "--speed", "2.5"}, o, error)) << error;
  EXPECT_EQ(o.recordFile, "a.mvrec");
  EXPECT_EQ(o.replayFile, "b.mvrec");
  EXPECT_EQ(o.speed, 2.5);

  const std::vector<std::pair<std::vector<std::string>, std::string>> refused = {
      {{"--speed", "2"}, "--speed sets the speed of a replay; use it with --replay FILE"},
      {{"--replay", "b", "--speed", "0"}, "--speed: expected a speed from 0.1 to 1000 (1 is real time), got \"0\""},
      {{"--replay", "b", "--speed", "fast"}, "--speed: expected a speed from 0.1 to 1000 (1 is real time), got \"fast\""},
      {{"--record", "x", "--replay", "x"}, "--record and --replay name the same file"},
      {{"--record"}, "--record needs a value"},
      {{"--replay="}, "--replay needs a file name"},
  };
  for (const auto& [args, message] : refused) {
    term::Options bad;
    EXPECT_FALSE(Parse(args, bad, error)) << message;
    EXPECT_EQ(error, message);
  }
}
