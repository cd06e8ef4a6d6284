// The terminal's side of the trade-summary pages: a page request (kind 3,
// param = page) is answered at once from the simulated trades and pushed again
// whenever new trades change it.
#include <gtest/gtest.h>

#include <map>

#include "RecordingView.h"
#include "TapeParsing.h"

namespace {

const char* const kSummaryFields[] = {"TIME",       "WEIGHTED_AVG", "RATIO",     "LAST",     "AVG_TRADE_SIZE",
                                      "QUOTE_LIST", "COUNT",        "PAGECOUNT", "TRADEDATA"};

void AskPage(RecordingView& v, const JInstrumentUnderlying& ins, int page) {
  for (const char* f : kSummaryFields) v.Field(hm::RequestField, ins.productId, ins.instrumentCode, f, page, 3);
  v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "PMP_Submit", page, 3);
}

TEST(HostRuntime, SummaryPagesAreAnsweredFromTheTradesAndPushedWhenTradesChangeThem) {
  Harness h;
  RecordingView& v = h.View("CTradeSummaryAdv");
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  h.Pump(2000);
  AskPage(v, ins, 1);
  std::map<std::string, std::string> header;
  std::string page1;
  for (const auto* n : v.Of(hm::RequestField)) {
    EXPECT_EQ(n->update.kind, 3);
    EXPECT_EQ(n->update.param, 1);
    if (n->update.fieldName == "TRADEDATA") page1 = n->update.value;
    else header[n->update.fieldName] = n->update.value;
  }
  ASSERT_EQ(header.size(), 8u) << "every field of the batch is answered once";
  const auto lines = h.runtime->Market().Summary(i);
  ASSERT_FALSE(lines.empty());
  EXPECT_EQ(std::atoi(header["COUNT"].c_str()), int(lines.size()));
  EXPECT_EQ(std::atoi(header["PAGECOUNT"].c_str()), int(lines.size() + 39) / 40);

  // Page 1: the first 40 prices, highest first, and the day's totals.
  auto parsed = tape::ParseSummaryPage(page1, 1);
  ASSERT_TRUE(parsed.count(99999));
  const std::size_t shown = std::min<std::size_t>(40, lines.size());
  for (std::size_t k = 0; k < shown; ++k) {
    const auto& line = parsed[int(k) + 1];
    EXPECT_EQ(line.price, h.runtime->Market().FormatPrice(i, lines[k].price));
    EXPECT_EQ(std::stoll(line.bid), lines[k].bidVolume);
    EXPECT_EQ(std::stoll(line.ask), lines[k].askVolume);
  }
  EXPECT_EQ(std::stoll(parsed[99999].volume), h.runtime->Market().QuoteOf(i).volume);

  // New trades: the page comes again, with growing totals; never twice the same.
  v.Clear();
  h.Pump(20000);
  long long lastTotal = std::stoll(parsed[99999].volume);
  std::string lastText = page1;
  int pushes = 0;
  for (const auto* n : v.Of(hm::FieldValue)) {
    if (n->update.fieldName != "TRADEDATA") continue;
    ++pushes;
    EXPECT_NE(n->update.value, lastText) << "pushed only when changed";
    lastText = n->update.value;
    const auto page = tape::ParseSummaryPage(n->update.value, 1);
    ASSERT_TRUE(page.count(99999));
    const long long total = std::stoll(page.at(99999).volume);
    EXPECT_GE(total, lastTotal);
    lastTotal = total;
  }
  EXPECT_GT(pushes, 0);
  EXPECT_EQ(lastTotal, h.runtime->Market().QuoteOf(i).volume);
}

TEST(HostRuntime, SummaryPageBeyondTheLinesIsAnsweredEmptyAndNotFetched) {
  Harness h;
  RecordingView& v = h.View("CTradeSummaryAdv");
  const auto& ins = h.Ins(h.Busy());
  AskPage(v, ins, 99);
  std::string page;
  for (const auto* n : v.Of(hm::RequestField))
    if (n->update.fieldName == "TRADEDATA") page = n->update.value;
  EXPECT_EQ(page, "") << "no 99th page of prices";
  // The view asks again with 400; an empty value is not answered.
  v.Clear();
  v.Field(hm::FetchFields, ins.productId, ins.instrumentCode, "TRADEDATA", 99, 3);
  h.Pump(200);
  for (const auto* n : v.Of(hm::RequestField)) EXPECT_NE(n->update.fieldName, "TRADEDATA");
}

}  // namespace
