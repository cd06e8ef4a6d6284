// A session recorded through the host runtime and replayed through it: the
// views receive the same answers and pushes in the same order.
#include <gtest/gtest.h>

#include <map>
#include <tuple>

#include "RecordingView.h"
#include "ReplayFixture.h"
#include "terminal/host/MarketSource.h"
#include "terminal/host/ReplaySource.h"

namespace {

constexpr std::uint64_t kSeed = 42;
constexpr int kInstruments = 800;

term::HostOptions Options() {
  term::HostOptions o;
  o.seed = kSeed;
  o.instruments = kInstruments;
  o.logToStderr = false;
  o.imageDir = QDir::tempPath().toStdString() + "/host-replay-tests-images";
  return o;
}

// The most traded share of the simulated market the runtime builds.
JInstrumentUnderlying BusyShare() {
  sim::MarketConfig c;
  c.seed = kSeed;
  c.instruments = kInstruments;
  sim::Market m(c);
  int best = 0, trades = -1;
  for (int i = 0; i < int(m.Instruments().size()); ++i) {
    const auto& r = m.Instruments()[std::size_t(i)];
    if (r.productType != "ES" || r.exchangeCode == "WIDX" || r.accessStatus != 3) continue;
    if (m.QuoteOf(i).trades > trades) { trades = m.QuoteOf(i).trades; best = i; }
  }
  return m.Instruments()[std::size_t(best)];
}

// A session: four views as the add-on's would ask, 4 seconds of market, a
// fifth view joining and one leaving halfway. Returns every field answer and
// push each view received, in order.
std::vector<std::string> PlaySession(const term::HostOptions& options, const JInstrumentUnderlying& ins,
                                     std::vector<std::wstring>* notices = nullptr) {
  EnsureApp();
  RecordingShell shell;
  term::MemoryHostStore store;
  std::vector<std::string> seen;
  {
    term::HostRuntime runtime(options, &shell, &store);
    shell.runtime = &runtime;
    std::uint32_t now = platform::UseVirtualClock().Now();
    std::vector<std::unique_ptr<RecordingView>> views;
    auto open = [&](const char* cls) -> RecordingView& {
      views.push_back(std::make_unique<RecordingView>(cls));
      RecordingView& v = *views.back();
      const std::string tag = cls + std::to_string(views.size());
      v.onNote = [&seen, tag](const RecordingView::Note& n) {
        if (n.msg != hm::FieldValue && n.msg != hm::RequestField) return;
        const FieldUpdate& u = n.update;
        seen.push_back(tag + "|" + std::to_string(n.msg) + "|" + u.fieldName + "|" + std::to_string(u.param) + "|" +
                       std::to_string(u.kind) + "|" + u.value);
      };
      runtime.AttachView(&v);
      return v;
    };
    const std::int64_t pid = ins.productId;
    const std::string code = ins.instrumentCode;
    RecordingView& depth = open("CMarketDepthAdv");
    for (const char* f : {"BUY", "SELL", "BVOL", "SVOL", "ORDS_BVOL", "ORDS_SVOL"})
      depth.Field(hm::RequestField, pid, code, f, 10, 1);
    depth.Field(hm::RequestField, pid, code, "PMP_Submit", 10, 1);
    RecordingView& price = open("CPriceViewAdv");
    price.Subscribe(pid, code, {"BID", "ASK", "LAST", "VOL", "CHANGE", "HIGH", "LOW", "BUY", "SELL"});
    RecordingView& tas = open("CTimeAndSalesAdv");
    tas.Field(hm::RequestField, pid, code, "TRADEDATA", 99998, 2);
    for (const char* f : {"DTIME", "LAST", "TOTAL_VOLUME", "PAGECOUNT"}) tas.Field(hm::RequestField, pid, code, f, 99999, 2);
    tas.Field(hm::RequestField, pid, code, "PMP_Submit", 99999, 2);
    RecordingView& summary = open("CTradeSummaryAdv");
    summary.Field(hm::RequestField, pid, code, "TRADEDATA", 1, 3);
    for (const char* f : {"WEIGHTED_AVG", "COUNT", "RATIO"}) summary.Field(hm::RequestField, pid, code, f, 0, 3);
    summary.Field(hm::RequestField, pid, code, "PMP_Submit", 0, 3);

    for (int step = 1; step <= 80; ++step) {
      now += 50;
      runtime.Pump(now);
      if (step == 40) {
        // A second price view asks for the same fields; the depth view pages
        // the history and drops its book.
        RecordingView& second = open("CPriceViewAdv");
        second.Subscribe(pid, code, {"BID", "ASK", "LAST", "VOL"});
        tas.Field(hm::RequestField, pid, code, "TRADEDATA", 1, 2);
        tas.Field(hm::RequestField, pid, code, "PMP_Submit", 1, 2);
        for (const char* f : {"BUY", "SELL"}) depth.Field(hm::WithdrawField, pid, code, f, 10, 1);
        depth.Field(hm::WithdrawField, pid, code, "PMP_Submit", 10, 1);
      }
    }
    for (auto& v : views) runtime.DestroyView(v.get());
  }
  if (notices) *notices = shell.notices;
  return seen;
}

}  // namespace

TEST(RecordReplay, AReplayedSessionGivesTheViewsWhatTheRecordedOneGave) {
  TempDir dir;
  const JInstrumentUnderlying ins = BusyShare();
  term::HostOptions recordOptions = Options();
  recordOptions.record = std::make_shared<term::rec::Writer>();
  std::string error;
  ASSERT_TRUE(recordOptions.record->Open(dir.File("session.mvrec"), error)) << error;
  const std::vector<std::string> recorded = PlaySession(recordOptions, ins);
  ASSERT_TRUE(recordOptions.record->Finished());
  ASSERT_TRUE(recordOptions.record->Ok()) << recordOptions.record->Error();
  ASSERT_GT(recorded.size(), 150u) << "a busy share moves";

  auto summary = std::make_shared<term::rec::Summary>();
  ASSERT_TRUE(term::rec::Scan(dir.File("session.mvrec"), *summary, error)) << error;
  EXPECT_TRUE(summary->warnings.empty());
  EXPECT_TRUE(summary->closed);
  EXPECT_EQ(summary->endMs, 4000u);
  EXPECT_EQ(summary->session.seed, kSeed);
  EXPECT_EQ(summary->reference.instruments.size(), std::size_t(kInstruments));

  term::HostOptions replayOptions = Options();
  replayOptions.seed = 999;  // the recording's seed and day hold
  replayOptions.replay = summary;
  const std::vector<std::string> replayed = PlaySession(replayOptions, ins);
  ASSERT_EQ(replayed.size(), recorded.size());
  for (std::size_t k = 0; k < recorded.size(); ++k) ASSERT_EQ(replayed[k], recorded[k]) << "delivery " << k;
}

TEST(RecordReplay, TheRecordingHoldsOnlyChangesAtTheirMarketTime) {
  TempDir dir;
  term::HostOptions o = Options();
  o.record = std::make_shared<term::rec::Writer>();
  std::string error;
  ASSERT_TRUE(o.record->Open(dir.File("s.mvrec"), error)) << error;
  PlaySession(o, BusyShare());
  term::rec::Reader r;
  ASSERT_TRUE(r.Open(dir.File("s.mvrec"), error)) << error;
  std::map<std::tuple<int, std::string, int, int>, std::string> last;
  term::rec::ValueEvent e;
  std::size_t count = 0, depthLines = 0;
  while (r.Next(e) == term::rec::Reader::Step::Value) {
    ++count;
    EXPECT_EQ(e.timeMs % 50, 0u) << "values move with the market's 50 ms steps";
    EXPECT_LE(e.timeMs, 4000u);
    if (e.depth) {
      // Levels between the first and the last that changed, in one line.
      ++depthLines;
      ASSERT_FALSE(e.levels.empty());
      for (std::size_t k = 0; k < e.levels.size(); ++k) {
        std::string& before = last[{e.instrument, e.field, e.param + int(k), 1}];
        if (k == 0 || k + 1 == e.levels.size()) {
          EXPECT_NE(before, e.levels[k]) << "the span ends where values changed";
        }
        before = e.levels[k];
      }
      continue;
    }
    auto [it, fresh] = last.try_emplace({e.instrument, e.field, e.param, e.kind}, e.value);
    if (!fresh) {
      EXPECT_NE(it->second, e.value) << "an unchanged value is not written again: " << e.field;
      it->second = e.value;
    } else {
      EXPECT_FALSE(e.value.empty()) << "a value that starts empty is not written";
    }
  }
  EXPECT_GT(depthLines, 10u);
  EXPECT_TRUE(r.Error().empty()) << r.Error();
  EXPECT_GT(count, 100u);
}

TEST(RecordReplay, ARecordingOnDiskLagsTheMarketByAtMostASecond) {
  EnsureApp();
  TempDir dir;
  const JInstrumentUnderlying ins = BusyShare();
  term::HostOptions o = Options();
  o.record = std::make_shared<term::rec::Writer>();
  std::string error;
  ASSERT_TRUE(o.record->Open(dir.File("live.mvrec"), error)) << error;
  RecordingShell shell;
  term::MemoryHostStore store;
  term::HostRuntime runtime(o, &shell, &store);
  shell.runtime = &runtime;
  RecordingView depth("CMarketDepthAdv");
  runtime.AttachView(&depth);
  for (const char* f : {"BUY", "SELL", "BVOL", "SVOL"}) depth.Field(hm::RequestField, ins.productId, ins.instrumentCode, f, 20, 1);
  depth.Field(hm::RequestField, ins.productId, ins.instrumentCode, "PMP_Submit", 20, 1);
  std::uint32_t now = platform::UseVirtualClock().Now();
  for (int step = 0; step < 50; ++step) runtime.Pump(now += 50);  // 2.5 s
  // As a crash would leave it: the runtime is still running.
  term::rec::Summary s;
  ASSERT_TRUE(term::rec::Scan(dir.File("live.mvrec"), s, error)) << error;
  EXPECT_FALSE(s.closed);
  EXPECT_GE(s.endMs + 1000 + 50, runtime.Source().ElapsedMs()) << "the last value on disk is at most a second old";
  runtime.DestroyView(&depth);
}

TEST(RecordReplay, AFailingRecordingIsReportedOnceAndTheSessionGoesOn) {
  if (!fs::exists("/dev/full")) GTEST_SKIP() << "no /dev/full here";
  EnsureApp();
  term::HostOptions o = Options();
  o.record = std::make_shared<term::rec::Writer>();
  std::string error;
  ASSERT_TRUE(o.record->Open("/dev/full", error)) << error;
  RecordingShell shell;
  term::MemoryHostStore store;
  term::HostRuntime runtime(o, &shell, &store);
  shell.runtime = &runtime;
  std::uint32_t now = platform::UseVirtualClock().Now();
  for (int step = 0; step < 10; ++step) runtime.Pump(now += 50);
  ASSERT_EQ(shell.notices.size(), 1u);
  EXPECT_EQ(shell.notices[0].rfind(L"Recording stopped: writing the recording /dev/full failed", 0), 0u);
  EXPECT_FALSE(runtime.FinishRecording(&error));
  EXPECT_NE(error.find("/dev/full"), std::string::npos) << error;
  EXPECT_GT(runtime.Source().ElapsedMs(), 0u) << "the market goes on";
}

TEST(RecordReplay, ARecordingDamagedAfterItsCheckStopsTheReplayWithANotice) {
  EnsureApp();
  TempDir dir;
  const std::string path = dir.File("changing.mvrec");
  WriteRecording(path, {{0, 0, "BID", 0, 0, "1.5"}, {100, 0, "BID", 0, 0, "1.6"}}, 1000);
  auto summary = std::make_shared<term::rec::Summary>();
  std::string error;
  ASSERT_TRUE(term::rec::Scan(path, *summary, error)) << error;
  // Someone rewrites the file after the terminal checked it.
  const term::rec::Reference r = SmallReference();
  {
    term::rec::Writer w;
    ASSERT_TRUE(w.Open(path, error));
    w.Begin(SmallSession(), r.products, r.exchanges, r.instruments);
    w.Value(0, 0, "BID", 0, 0, "1.5");
    w.Value(100, 0, "BID", 0, 9, "1.6");  // a kind no recording has
    w.Finish(1000);
  }
  term::HostOptions o = Options();
  o.replay = summary;
  RecordingShell shell;
  term::MemoryHostStore store;
  term::HostRuntime runtime(o, &shell, &store);
  shell.runtime = &runtime;
  std::uint32_t now = platform::UseVirtualClock().Now();
  for (int step = 0; step < 10; ++step) runtime.Pump(now += 50);
  ASSERT_EQ(shell.notices.size(), 1u) << "told once";
  EXPECT_EQ(shell.notices[0].rfind(L"The replay stopped: " + std::wstring(path.begin(), path.end()), 0), 0u);
  EXPECT_EQ(runtime.Source().FieldValue(0, "BID", 0, 0), "1.5") << "the market stays as it was";
  ASSERT_NE(runtime.Replay(), nullptr);
  EXPECT_NE(runtime.Replay()->Problem().find("the kind \"9\""), std::string::npos) << runtime.Replay()->Problem();
}

namespace {

// The 414s an activated price view receives over `minutes` of market time.
std::vector<std::string> PlayRenames(const term::HostOptions& options, int minutes) {
  EnsureApp();
  RecordingShell shell;
  term::MemoryHostStore store;
  std::vector<std::string> seen;
  term::HostRuntime runtime(options, &shell, &store);
  shell.runtime = &runtime;
  RecordingView price("CPriceViewAdv");
  price.onNote = [&seen](const RecordingView::Note& n) {
    if (n.msg == hm::InstrumentFieldUpdate)
      seen.push_back(n.update.instrumentCode + "|" + n.update.fieldName + "|" + n.update.value);
  };
  runtime.AttachView(&price);
  runtime.Activate(&price);
  std::uint32_t now = platform::UseVirtualClock().Now();
  for (int s = 0; s < minutes * 60; ++s) runtime.Pump(now += 1000);
  runtime.DestroyView(&price);
  return seen;
}

}  // namespace

TEST(RecordReplay, RenamesAreRecordedAndToldAgainInTheReplay) {
  TempDir dir;
  term::HostOptions recordOptions = Options();
  recordOptions.record = std::make_shared<term::rec::Writer>();
  std::string error;
  ASSERT_TRUE(recordOptions.record->Open(dir.File("renames.mvrec"), error)) << error;
  const std::vector<std::string> recorded = PlayRenames(recordOptions, 20);
  ASSERT_TRUE(recordOptions.record->Finish(20 * 60 * 1000)) << recordOptions.record->Error();
  ASSERT_GE(recorded.size(), 3u) << "twenty minutes of market bring a few renames";

  auto summary = std::make_shared<term::rec::Summary>();
  ASSERT_TRUE(term::rec::Scan(dir.File("renames.mvrec"), *summary, error)) << error;
  term::HostOptions replayOptions = Options();
  replayOptions.replay = summary;
  EXPECT_EQ(PlayRenames(replayOptions, 20), recorded);
}
