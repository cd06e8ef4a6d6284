// Background paging of the trade tape: which page is missing, the batch life
// cycle (start, finish, the 120 s cancel with its counts) and the requests
// and log lines it leaves behind.
#include <gtest/gtest.h>

#include <optional>

#include "views/instrument/SalesFeed.h"
#include "views/instrument/SalesPaging.h"

namespace {

using sales::BackgroundStep;
using sales::NextMissingPage;

const InstrumentKey kKey{7, L"D05"};

struct Sent {
  UINT message;
  FieldRequest request;
};

struct PagingTest : ::testing::Test {
  TradeTape tape;
  sales::PageBatches batches;
  SalesSummaryStore headers;
  std::vector<Sent> sent;
  std::vector<std::string> log;
  std::vector<int> registered;

  void SetUp() override { headers.Get(kKey, 0); }

  void PageCount(const wchar_t* text) { headers.Update(kKey, L"PAGECOUNT", text, 1); }
  std::optional<SalesSummaryRecord> Header() {
    SalesSummaryRecord r;
    if (!headers.Peek(kKey, r)) return std::nullopt;
    return r;
  }
  // Trades from..to (inclusive).
  void Trades(int from, int to) {
    for (int n = from; n <= to; ++n) {
      TradeRecord t;
      t.number = n;
      t.time = L"10:00:00";
      t.price = L"1.00";
      t.volume = L"100";
      t.side = L"1";
      tape.Store(kKey, t);
    }
  }
  int Missing(int rows) {
    const auto h = Header();
    return NextMissingPage(kKey, rows, h ? &*h : nullptr, tape);
  }
  void Step(std::uint32_t now, int rows) {
    sales::PagingContext ctx;
    ctx.uid = 3;
    ctx.key = kKey;
    ctx.rows = rows;
    ctx.now = now;
    ctx.send = [this](UINT message, LPARAM data) { sent.push_back({message, *FromLParam<const FieldRequest>(data)}); };
    ctx.log = [this](const std::string& line) { log.push_back(line); };
    ctx.registerPage = [this](const InstrumentKey& key, int page, std::uint32_t) {
      EXPECT_EQ(key, kKey);
      registered.push_back(page);
    };
    const auto h = Header();
    BackgroundStep(ctx, h ? &*h : nullptr, tape, batches);
  }
  // Batch ends sent, as "page" per 401 "TIMESALES_DATA" (each followed by its submit).
  std::vector<int> Ended() const {
    std::vector<int> pages;
    for (std::size_t i = 0; i < sent.size(); ++i) {
      EXPECT_EQ(sent[i].message, hm::WithdrawField);
      EXPECT_EQ(sent[i].request.kind, 2);
      EXPECT_EQ(sent[i].request.productId, 7);
      EXPECT_EQ(sent[i].request.instrumentCode, "D05");
      if (sent[i].request.fieldName == "TIMESALES_DATA") {
        pages.push_back(sent[i].request.param);
        EXPECT_TRUE(i + 1 < sent.size() && sent[i + 1].request.fieldName == "PMP_Submit" &&
                    sent[i + 1].request.param == sent[i].request.param);
      }
    }
    return pages;
  }
};

TEST_F(PagingTest, PageCountFiveWithTrade401MissingStartsABatchOfPagesOneToFive) {
  PageCount(L"5");
  Trades(402, 450);  // the live page of a 450-trade tape lacks its page's first trade
  EXPECT_EQ(Missing(450), 5);
  Step(10000, 450);
  EXPECT_EQ(registered, (std::vector<int>{5, 4, 3, 2, 1})) << "registered last down to first";
  ASSERT_NE(batches.Find(kKey), nullptr);
  EXPECT_EQ(batches.Find(kKey)->first, 1);
  EXPECT_EQ(batches.Find(kKey)->last, 5);
  EXPECT_EQ(log, (std::vector<std::string>{"(Uid:3) : Code(D05) Page(1-5) free time subscibe start."}));
  EXPECT_TRUE(sent.empty());
  // One batch per instrument: the next step waits for it.
  registered.clear();
  Step(20000, 450);
  EXPECT_TRUE(registered.empty());
}

TEST_F(PagingTest, NoBatchForPageCountsOutsideTheRangeOrASmallGrid) {
  for (const wchar_t* count : {L"0", L"1000", L"-3"}) {
    PageCount(count);
    EXPECT_EQ(Missing(450), 0) << count;
    Step(10000, 450);
  }
  PageCount(L"5");
  EXPECT_EQ(Missing(100), 0) << "a grid of 100 rows is the live page alone";
  Step(10000, 100);
  EXPECT_EQ(Missing(101), 5);
  // A header without a page count.
  headers.Get(InstrumentKey{7, L"Z74"}, 0);
  SalesSummaryRecord empty;
  headers.Peek(InstrumentKey{7, L"Z74"}, empty);
  EXPECT_EQ(NextMissingPage(InstrumentKey{7, L"Z74"}, 450, &empty, tape), 0);
  EXPECT_EQ(NextMissingPage(kKey, 450, nullptr, tape), 0);
  EXPECT_TRUE(registered.empty());
  EXPECT_TRUE(log.empty());
}

TEST_F(PagingTest, FullyLoadedTapeStartsNoBatchAndTheSearchEnds) {
  PageCount(L"12");
  Trades(1, 1150);
  EXPECT_EQ(Missing(1150), 0);
  Step(10000, 1150);
  EXPECT_TRUE(registered.empty());
  EXPECT_EQ(batches.Size(), 0u);
  // Page 1 alone missing its first trade is still found.
  TradeTape partial;
  for (int n = 2; n <= 1150; ++n) partial.Store(kKey, TradeRecord{n, L"t", L"1", L"1", L"1"});
  const auto h = Header();
  EXPECT_EQ(NextMissingPage(kKey, 1150, &*h, partial), 1);
}

TEST_F(PagingTest, APageWithAGapInsideIsMissingThoughItsFirstTradeArrived) {
  PageCount(L"4");
  Trades(1, 250);
  Trades(331, 400);  // a live page that jumped: 251..330 never arrived
  EXPECT_EQ(Missing(400), 4);
  Trades(351, 400);
  Trades(301, 330);
  EXPECT_EQ(Missing(400), 3) << "page 3 has trade 201 but lacks 251..300";
  Trades(251, 300);
  EXPECT_EQ(Missing(400), 0);
  // Trades beyond the rows the grid knows are not asked for yet.
  PageCount(L"5");
  EXPECT_EQ(Missing(400), 5);
}

TEST_F(PagingTest, PresentPageAbove998EndsTheSearch) {
  PageCount(L"999");
  Trades(99801, 99810);
  EXPECT_EQ(Missing(99810), 0);
  PageCount(L"998.75");  // the whole number counts
  Trades(99701, 99800);
  EXPECT_EQ(Missing(99810), 997);
}

TEST_F(PagingTest, ThreeOfSevenAnsweredIsCancelledAfter120SecondsWithItsCounts) {
  PageCount(L"9");
  Trades(802, 850);  // trade 801 missing
  Step(10000, 850);
  ASSERT_EQ(registered, (std::vector<int>{9, 8, 7, 6, 5, 4, 3}));
  batches.NoteAnswer(kKey, 9);
  batches.NoteAnswer(kKey, 5);
  batches.NoteAnswer(kKey, 5);  // the same page twice counts once
  batches.NoteAnswer(kKey, 2);  // not a page of the batch
  batches.NoteAnswer(kKey, 3);
  log.clear();
  registered.clear();
  Step(10000 + 120000, 850);
  EXPECT_TRUE(sent.empty()) << "120 s have not passed yet";
  EXPECT_TRUE(registered.empty());
  Step(10000 + 120001, 850);
  EXPECT_EQ(Ended(), (std::vector<int>{3, 4, 5, 6, 7, 8, 9}));
  ASSERT_GE(log.size(), 1u);
  EXPECT_EQ(log[0], "(Uid:3) : Code(D05) Page(3-9) free time subscibe cancel(3 of 7).");
  // Pages are still missing: the same step starts the next batch.
  ASSERT_EQ(log.size(), 2u);
  EXPECT_EQ(log[1], "(Uid:3) : Code(D05) Page(3-9) free time subscibe start.");
  EXPECT_EQ(registered, (std::vector<int>{9, 8, 7, 6, 5, 4, 3}));
  EXPECT_EQ(batches.Find(kKey)->AnsweredCount(), 0) << "a new batch counts afresh";
}

TEST_F(PagingTest, AnsweredBatchFinishesAndTheNextOneFollows) {
  PageCount(L"9");
  Trades(802, 850);  // trade 801 missing
  Step(10000, 850);
  for (int page = 3; page <= 9; ++page) {
    Trades(page * 100 - 99, page * 100);
    batches.NoteAnswer(kKey, page);
  }
  log.clear();
  registered.clear();
  Step(20000, 850);
  EXPECT_EQ(Ended(), (std::vector<int>{3, 4, 5, 6, 7, 8, 9}));
  EXPECT_EQ(log, (std::vector<std::string>{"(Uid:3) : Code(D05) Page(3-9) free time subscibe finish.",
                                           "(Uid:3) : Code(D05) Page(1-2) free time subscibe start."}));
  EXPECT_EQ(registered, (std::vector<int>{2, 1}));
  Trades(1, 200);
  batches.NoteAnswer(kKey, 1);
  batches.NoteAnswer(kKey, 2);
  log.clear();
  Step(30000, 850);
  EXPECT_EQ(log, (std::vector<std::string>{"(Uid:3) : Code(D05) Page(1-2) free time subscibe finish."}));
  EXPECT_EQ(batches.Size(), 0u);
}

TEST_F(PagingTest, FeedRegistersPagesOnceAndAnswersLandInTheStoresAndTheBatch) {
  // The process-wide feed, stores and batches; nothing else in this suite uses them.
  sales::ClearPending();
  sales::PageBatches::Instance().Clear();
  struct Cleanup {
    ~Cleanup() {
      sales::ClearPending();
      sales::PageBatches::Instance().Clear();
    }
  } cleanup;
  const std::uint32_t now = 5;
  sales::RegisterHeader(kKey, now);
  sales::RegisterPage(kKey, sales::kLivePage, now);
  sales::RegisterPage(kKey, sales::kLivePage, now);
  sales::RegisterPage(kKey, 1000, now);  // neither a history page nor the live page
  sales::RegisterPage(kKey, 2, now);
  // One header batch and one request per page, in the order registered.
  std::vector<FieldRequest> requests;
  sales::SendPending([&](UINT message, LPARAM data) {
    EXPECT_EQ(message, hm::RequestField);
    requests.push_back(*FromLParam<const FieldRequest>(data));
  });
  ASSERT_EQ(requests.size(), 9u + 2u + 2u);
  const std::vector<std::string> headerFields = {"DTIME", "HIGH", "LOW", "NETCHANGE", "LAST", "TOTALVALUE", "TOTAL_VOLUME",
                                           "PAGECOUNT", "PMP_Submit"};
  for (std::size_t k = 0; k < headerFields.size(); ++k) {
    EXPECT_EQ(requests[k].fieldName, headerFields[k]);
    EXPECT_EQ(requests[k].param, 99999);
    EXPECT_EQ(requests[k].kind, 2);
  }
  EXPECT_EQ(requests[9].fieldName, "TRADEDATA");
  EXPECT_EQ(requests[9].param, sales::kLivePage);
  EXPECT_EQ(requests[10].fieldName, "PMP_Submit");
  EXPECT_EQ(requests[10].param, sales::kLivePage);
  EXPECT_EQ(requests[11].fieldName, "TRADEDATA");
  EXPECT_EQ(requests[11].param, 2);
  EXPECT_EQ(requests[12].productId, 7);
  EXPECT_EQ(requests[12].instrumentCode, "D05");
  EXPECT_EQ(SalesPageStore::Instance().PendingCount(), 0u) << "the store's own list is not how pages leave";
  // Asked again after it was taken: queued again.
  sales::RegisterPage(kKey, 2, now);
  EXPECT_EQ(sales::SalesPageFeed::Instance().PendingCount(), 1u);

  sales::PageBatches::Instance().Start(kKey, 1, 2, now);
  FieldUpdate u{7, "D05", "TRADEDATA", "10:00:01|1.0|5|1||101;10:00:00|1.0|5|2||100", 2, 2};
  EXPECT_EQ(sales::ApplyUpdate(u, 9), sales::Applied::Page);
  EXPECT_EQ(sales::PageBatches::Instance().Find(kKey)->AnsweredCount(), 1);
  EXPECT_TRUE(TradeTape::Instance().Has(kKey, 100));
  EXPECT_TRUE(TradeTape::Instance().Has(kKey, 101));
  SalesPageRecord page;
  ASSERT_TRUE(SalesPageStore::Instance().Peek(PageKey{7, L"D05", 2}, page));
  EXPECT_EQ(page[0].text, L"10:00:01|1.0|5|1||101;10:00:00|1.0|5|2||100");

  u = FieldUpdate{7, "D05", "PAGECOUNT", "12", 99999, 2};
  EXPECT_EQ(sales::ApplyUpdate(u, 9), sales::Applied::Header);
  SalesSummaryRecord header;
  ASSERT_TRUE(sales::ReadHeader(kKey, header));
  EXPECT_EQ(header[SalesSummaryLayout::PageCount].text, L"12.00");
  u.kind = 0;
  EXPECT_EQ(sales::ApplyUpdate(u, 9), sales::Applied::Ignored);
  u.kind = 2;
  u.param = 1000;
  EXPECT_EQ(sales::ApplyUpdate(u, 9), sales::Applied::Ignored);
}

}  // namespace
