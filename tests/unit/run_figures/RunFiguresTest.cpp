// The figures of measured runs: percentiles, the pairing of pushes with the
// next paint of the same view, the report lines, and the memory growth.
#include <gtest/gtest.h>

#include <sstream>

#include "terminal/app/RunFigures.h"

namespace term {
namespace {

std::vector<std::vector<std::string>> Lines(const std::string& text) {
  std::vector<std::vector<std::string>> out;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) {
    std::vector<std::string> cells;
    std::istringstream row(line);
    for (std::string cell; std::getline(row, cell, '\t');) cells.push_back(cell);
    out.push_back(cells);
  }
  return out;
}

TEST(DurationStats, PercentilesNeverReadBetterThanTheSamplesAndTheWorstIsExact) {
  DurationStats s;
  EXPECT_EQ(s.PercentileUs(0.5), 0);
  EXPECT_EQ(s.WorstUs(), 0);
  for (int ms = 1; ms <= 100; ++ms) s.Add(ms * 1000);
  EXPECT_EQ(s.Count(), 100u);
  EXPECT_GE(s.PercentileUs(0.5), 50000);
  EXPECT_LT(s.PercentileUs(0.5), 50000 + DurationStats::kBucketUs + 1);
  EXPECT_GE(s.PercentileUs(0.99), 99000);
  EXPECT_LE(s.PercentileUs(0.99), 99100);
  EXPECT_EQ(s.PercentileUs(1.0), 100000);  // the top bucket reads the exact worst
  EXPECT_EQ(s.WorstUs(), 100000);

  // Beyond the buckets' range: the worst; a negative time counts as none.
  DurationStats far;
  far.Add(-5);
  far.Add(25'000'000);
  EXPECT_LE(far.PercentileUs(0.5), DurationStats::kBucketUs);
  EXPECT_EQ(far.PercentileUs(1.0), 25'000'000);
  EXPECT_EQ(far.WorstUs(), 25'000'000);
}

TEST(LatencyRecorder, EveryPushIsClosedByTheNextPaintOfItsOwnViewAndGroupedByClass) {
  LatencyRecorder r;
  int price1 = 0, price2 = 0, depth = 0, stranger = 0;
  r.AddView(&price1, "CPriceViewAdv");
  r.AddView(&price2, "CPriceViewAdv");
  r.AddView(&depth, "CMarketDepthAdv");
  // Three values reach the first price view before it paints at 200 ms.
  r.Pushed(&price1, 0);
  r.Pushed(&price1, 50'000);
  r.Pushed(&price1, 120'000);
  r.Painted(&depth, 150'000);  // another view's paint closes nothing of this one
  r.Painted(&price1, 200'000);
  r.Painted(&price1, 400'000);  // nothing open: no sample
  r.Pushed(&price2, 300'000);
  r.Painted(&price2, 310'000);
  r.Pushed(&stranger, 0);  // not watched: ignored
  r.Painted(&stranger, 1'000'000);
  r.Pushed(&depth, 500'000);  // never painted

  const auto figures = r.Figures();
  ASSERT_EQ(figures.size(), 2u);
  const auto& price = figures.at("CPriceViewAdv");
  EXPECT_EQ(price.views, 2u);
  EXPECT_EQ(price.latency.Count(), 4u);  // 200, 150, 80 and 10 ms
  EXPECT_EQ(price.latency.WorstUs(), 200'000);
  EXPECT_GE(price.latency.PercentileUs(0.5), 80'000);
  EXPECT_LE(price.latency.PercentileUs(0.5), 80'100);
  EXPECT_EQ(price.unpainted, 0u);
  EXPECT_EQ(figures.at("CMarketDepthAdv").latency.Count(), 0u);
  EXPECT_EQ(figures.at("CMarketDepthAdv").unpainted, 1u);

  // A view that closes with values still open counts them as unpainted once.
  r.RemoveView(&depth);
  EXPECT_EQ(r.Figures().at("CMarketDepthAdv").unpainted, 1u);
  EXPECT_FALSE(r.Watches(&depth));

  const auto lines = Lines(r.Report("feed-to-pixel latency, pace 1"));
  ASSERT_EQ(lines.size(), 4u);
  EXPECT_EQ(lines[0][0], "# feed-to-pixel latency, pace 1");
  EXPECT_EQ(lines[1], (std::vector<std::string>{"class", "views", "pushes", "p50_ms", "p99_ms", "worst_ms", "unpainted"}));
  EXPECT_EQ(lines[2], (std::vector<std::string>{"CMarketDepthAdv", "1", "0", "0.0", "0.0", "0.0", "1"}));
  EXPECT_EQ(lines[3], (std::vector<std::string>{"CPriceViewAdv", "2", "4", "80.1", "200.0", "200.0", "0"}));
}

TEST(SoakFigures, GrowthIsTheSlopeAfterTheWarmUpAndTheReportNamesEveryFigure) {
  SoakFigures s;
  EXPECT_EQ(s.RssGrowthMbPerHour(600), 0.0);  // no samples
  s.SampleRss(0, 50'000);
  s.SampleRss(300, 150'000);  // the views' stores fill during the warm-up
  // From 10 minutes on: 2 MB an hour plus a wobble of a page either way.
  for (int minute = 10; minute <= 60; ++minute) {
    const double hours = minute / 60.0;
    const auto kb = static_cast<std::int64_t>(200'000 + hours * 2048) + (minute % 2 ? 4 : -4);
    // The heap in use grows by 1 MB an hour, the exchange's tapes by half of that.
    s.SampleRss(minute * 60.0, kb, static_cast<std::int64_t>(hours * 512), static_cast<std::int64_t>(90'000 + hours * 1024));
  }
  EXPECT_NEAR(s.RssGrowthMbPerHour(600), 2.0, 0.05);
  EXPECT_NEAR(s.HeapGrowthMbPerHour(600), 1.0, 0.01);
  EXPECT_GT(s.RssGrowthMbPerHour(0), 10.0);  // with the warm-up it would read as a leak

  s.Turn(1'000, 800);
  s.Turn(42'000, 30'000);
  s.SetPushes(7200, 3600);
  const std::string report = s.Report(600, 50);
  for (const char* key : {"rss_growth_mb_per_hour\t", "pushes\t7200\t(2 a second)", "turns\t2\t",
                          "turn_wall_ms_worst\t42.0", "turn_cpu_ms_worst\t30.0", "rss_kb\t3600\t",
                          "rss_growth_without_market_tapes_mb_per_hour\t1.50", "heap_growth_mb_per_hour\t1.00",
                          "heap_growth_without_market_tapes_mb_per_hour\t0.50"})
    EXPECT_NE(report.find(key), std::string::npos) << key << "\n" << report;
}

TEST(ReadRssKb, ReadsThisProcesssResidentMemory) {
  const std::int64_t kb = ReadRssKb();
  EXPECT_GT(kb, 100);  // a running test binary holds more than 100 kB
  EXPECT_GE(ReadHeapKb(), 0);
}

}  // namespace
}  // namespace term
