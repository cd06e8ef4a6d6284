// The replayed market: reference data and values from the file, each value
// from its market time on, at the chosen speed, paused, or moved forward.
#include <gtest/gtest.h>

#include "ReplayFixture.h"
#include "terminal/host/ReplaySource.h"

using term::ReplaySource;
using term::rec::ValueEvent;

namespace {

constexpr std::uint32_t kStart = 5000;  // the tick at which market time 0 plays

struct Replay {
  TempDir dir;
  term::rec::Summary summary;
  std::unique_ptr<ReplaySource> source;

  explicit Replay(double speed = 1.0) {
    const std::string path = dir.File("r.mvrec");
    WriteRecording(path,
                   {
                       {0, 0, "BID", 0, 0, "1.500"},
                       {0, 0, "BUY", 1, 1, "1.500"},
                       {0, 0, "BUY", 2, 1, "1.495"},
                       {100, 0, "BID", 0, 0, "1.505"},
                       {250, 1, "LAST", 0, 0, "2.000"},
                       {1000, 0, "BID", 0, 0, "1.510"},
                       {1000, 0, "BUY", 2, 1, ""},
                   },
                   2000);
    std::string error;
    EXPECT_TRUE(term::rec::Scan(path, summary, error)) << error;
    source = std::make_unique<ReplaySource>(summary, kStart, speed);
  }
  std::string Bid() { return source->FieldValue(0, "BID", 0, 0); }
};

std::vector<int> Changed(ReplaySource& s) {
  std::vector<int> out;
  for (const auto& [i, bits] : s.TakeChangedWithBits()) {
    EXPECT_EQ(bits, term::MarketSource::kMarketChanged);
    out.push_back(i);
  }
  return out;
}

}  // namespace

TEST(ReplaySource, OffersTheRecordedReferenceDataAndTheFirstMomentAtOnce) {
  Replay r;
  ReplaySource& s = *r.source;
  ASSERT_EQ(s.Instruments().size(), 2u);
  EXPECT_EQ(s.Products().size(), 1u);
  EXPECT_EQ(s.Exchanges().size(), 1u);
  EXPECT_EQ(s.Find(101, "BBB"), 1);
  EXPECT_EQ(s.Find(102, "BBB"), -1);
  EXPECT_EQ(s.FindByCode("AAA"), 0);
  EXPECT_EQ(s.FindByChartCode("BBB.SI"), 1);
  EXPECT_EQ(s.FindByChartCode("nope"), -1);
  ASSERT_NE(s.FindExchange("SGX"), nullptr);
  EXPECT_EQ(s.FindProduct(101)->productName, "Equities");
  EXPECT_EQ(s.Session().date, "2026-12-07");
  EXPECT_EQ(s.TimeText(), "10:30:00");
  EXPECT_EQ(s.EndMs(), 2000u);
  // Values of market time 0 are there before any view asks.
  EXPECT_EQ(r.Bid(), "1.500");
  std::vector<std::string> book;
  s.DepthField(0, "BUY", 3, book);
  EXPECT_EQ(book, (std::vector<std::string>{"1.500", "1.495", ""}));
  EXPECT_EQ(s.FieldValue(1, "LAST", 0, 0), "") << "not recorded yet";
  EXPECT_EQ(s.FieldValue(0, "NEVER", 0, 0), "");
  EXPECT_EQ(s.FieldValue(0, "BID", 0, 1), "") << "another kind is another value";
  EXPECT_TRUE(s.Problem().empty());
}

TEST(ReplaySource, PlaysEachValueFromItsMarketTimeAtTheChosenSpeed) {
  Replay r;
  ReplaySource& s = *r.source;
  Changed(s);
  s.AdvanceTo(kStart + 99);
  EXPECT_EQ(r.Bid(), "1.500");
  EXPECT_TRUE(Changed(s).empty());
  s.AdvanceTo(kStart + 100);
  EXPECT_EQ(r.Bid(), "1.505");
  EXPECT_EQ(s.ElapsedMs(), 100u);
  EXPECT_EQ(Changed(s), std::vector<int>{0});
  EXPECT_TRUE(Changed(s).empty()) << "each change is reported once";

  s.SetSpeed(10);  // from the last tick on
  s.AdvanceTo(kStart + 115);
  EXPECT_EQ(s.ElapsedMs(), 250u);
  EXPECT_EQ(s.FieldValue(1, "LAST", 0, 0), "2.000");
  EXPECT_EQ(Changed(s), std::vector<int>{1});

  s.SetPaused(true);
  s.AdvanceTo(kStart + 5000);
  EXPECT_EQ(s.ElapsedMs(), 250u) << "a paused market stands still";
  s.SetPaused(false);
  s.AdvanceTo(kStart + 5010);
  EXPECT_EQ(s.ElapsedMs(), 350u);

  s.AdvanceTo(kStart + 4000);  // a clock stepped back
  EXPECT_EQ(s.ElapsedMs(), 350u);
  s.SetSpeed(0);
  s.SetSpeed(-2);
  EXPECT_EQ(s.Speed(), 10) << "speeds must be above zero";

  s.AdvanceTo(kStart + 5100);  // 900 ms of market time
  EXPECT_EQ(r.Bid(), "1.510");
  std::vector<std::string> book;
  s.DepthField(0, "BUY", 2, book);
  EXPECT_EQ(book[1], "") << "an emptied level reads empty";
  s.AdvanceTo(kStart + 60000);
  EXPECT_EQ(s.ElapsedMs(), 2000u) << "never past the end";
  EXPECT_TRUE(s.Ended());
}

TEST(ReplaySource, JumpsOnlyForwardAndNotPastTheEnd) {
  Replay r(2.0);
  ReplaySource& s = *r.source;
  s.AdvanceTo(kStart + 100);
  EXPECT_EQ(s.ElapsedMs(), 200u);
  EXPECT_FALSE(s.JumpTo(150));
  EXPECT_FALSE(s.JumpTo(200));
  EXPECT_EQ(r.Bid(), "1.505");
  Changed(s);
  EXPECT_TRUE(s.JumpTo(1000));
  EXPECT_EQ(r.Bid(), "1.510");
  EXPECT_EQ(s.FieldValue(1, "LAST", 0, 0), "2.000");
  EXPECT_EQ(Changed(s), (std::vector<int>{0, 1}));
  // The speed goes on from the jump's time.
  s.AdvanceTo(kStart + 150);
  EXPECT_EQ(s.ElapsedMs(), 1100u);
  EXPECT_TRUE(s.JumpTo(999999));
  EXPECT_EQ(s.ElapsedMs(), 2000u);
  EXPECT_TRUE(s.Ended());
  EXPECT_FALSE(s.JumpTo(999999));
}

TEST(ReplaySource, AFileThatWentAwayLeavesTheReferenceDataAndSaysWhy) {
  TempDir dir;
  const std::string path = dir.File("gone.mvrec");
  WriteRecording(path, {{0, 0, "BID", 0, 0, "1.5"}}, 100);
  term::rec::Summary summary;
  std::string error;
  ASSERT_TRUE(term::rec::Scan(path, summary, error)) << error;
  fs::remove(path);
  ReplaySource s(summary, kStart);
  EXPECT_EQ(s.Instruments().size(), 2u);
  EXPECT_NE(s.Problem().find(path), std::string::npos) << s.Problem();
  s.AdvanceTo(kStart + 1000);
  EXPECT_EQ(s.FieldValue(0, "BID", 0, 0), "");
}
