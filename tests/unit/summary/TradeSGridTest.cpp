// TradeSGrid on its own: rows from the summary stores (lines, the blank row
// and the totals row), the page-count limit, widths, colours of changed
// values, the pages it registers and the trade request of a price click.
#include <gtest/gtest.h>

#include "SummaryFixture.h"
#include "addon/RegisteredMessages.h"

namespace summarytest {
namespace {

// The grid's parent: records the window messages the grid sends it.
class Parent : public QWidget, public platform::MessageTarget {
 public:
  struct Sent {
    UINT message;
    std::wstring text;
    LPARAM lParam;
  };
  LRESULT OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) override {
    Sent s{message, {}, lParam};
    if (message == addon::Msg().wlOpenTrade && wParam) s.text = *FromLParam<const std::wstring>(LPARAM(wParam));
    sent.push_back(s);
    return 0;
  }
  std::vector<Sent> sent;
};

struct TradeSGridTest : ::testing::Test {
  mvtest::ScriptedHost host;
  Parent parent;
  TradeSGrid* grid = nullptr;
  const JInstrumentUnderlying ins = Instrument(7, FreshCode("GRID"), "SGX");
  const InstrumentKey key = InstrumentKey{7, hv::Widen(ins.instrumentCode)};

  void TearDown() override { addon::SummaryPageFeed::Instance().Reset(); }
  void SetUp() override {
    addon::SummaryPageFeed::Instance().TakePending();
    parent.resize(600, 400);
    grid = new TradeSGrid(&parent);
    grid->resize(503, 300);
    parent.show();
    grid->SetInstrument(key);
  }
  void Apply(const std::string& field, const std::string& value, int page = 1) {
    summary::ApplyUpdate(FieldUpdate{ins.productId, ins.instrumentCode, field, value, page, 3}, host.clock.Now());
  }
  QStringList Row(int row) {
    QStringList cells;
    for (int col = 0; col < grid->GetNumberCols(); ++col) cells << grid->CellText(col, row);
    return cells;
  }
  int ClientWidth() const { return grid->width() - 2 * grid->frameWidth(); }
};

TEST_F(TradeSGridTest, ThreeLinesMakeFiveRowsWithABlankAndATotalRow) {
  grid->NewestStamp();
  EXPECT_EQ(grid->GetNumberRows(), 0) << "nothing stored yet";
  Apply("TRADEDATA", Join({Item("10.5", 2, 1200, 500, 700), Item("10.4", 1, 50, 0, 50), Item("10.3", 4, 1000000, 1000000, 0),
                           Item("TOTALS:", 7, 1001250, 1000500, 750)}));
  EXPECT_GT(grid->NewestStamp(), 0u);
  ASSERT_EQ(grid->GetNumberRows(), 5);
  EXPECT_EQ(grid->FilledLines(), 3);
  EXPECT_EQ(grid->dumpTsv(),
            "Price\tTrades\tVolume\tBid Vol\tAsk Vol\n"
            "10.500\t2\t1,200\t500\t700\n"
            "10.400\t1\t50\t0\t50\n"
            "10.300\t4\t1,000,000\t1,000,000\t0\n"
            "\t\t\t\t\n"
            "Total\t7\t1,001,250\t1,000,500\t750\n");
  // The totals row in the totals font; data rows in the cell font.
  CGridCell total, data;
  grid->GetCell(1, 4, total);
  grid->GetCell(1, 0, data);
  ASSERT_TRUE(total.font);
  EXPECT_TRUE(total.font->bold());
  EXPECT_EQ(grid->LineOfRow(4), summary::kTotalsLine);
  EXPECT_EQ(grid->LineOfRow(3), 0);
  EXPECT_EQ(grid->LineOfRow(0), 1);
}

TEST_F(TradeSGridTest, PageCountLimitsTheRowsBlankRowStaysBlank) {
  Apply("TRADEDATA", Lines(1, 40), 1);
  Apply("TRADEDATA", Lines(41, 80), 2);
  Apply("TRADEDATA", Lines(81, 90), 3);
  Apply("PAGECOUNT", "2");
  grid->NewestStamp();
  EXPECT_EQ(grid->FilledLines(), 80);
  EXPECT_EQ(grid->GetNumberRows(), 82);
  EXPECT_EQ(Row(80), (QStringList{"", "", "", "", ""})) << "line 81 is stored but beyond the limit";
  Apply("PAGECOUNT", "0");
  grid->NewestStamp();
  EXPECT_EQ(grid->GetNumberRows(), 92) << "a page count of 0 allows 999 lines";
}

TEST_F(TradeSGridTest, ChangedValuesTakeTheChangedColoursUntilTheMarkExpires) {
  grid->SetStyleManager(&host.style);
  host.style.colors[3103] = MakeColorRef(1, 2, 3);
  host.style.colors[3105] = MakeColorRef(250, 240, 10);
  grid->SetStyleManager(&host.style);
  Apply("TRADEDATA", Item("10.5", 1, 100, 100, 0));
  host.clock.Advance(50);
  Apply("TRADEDATA", Item("10.5", 2, 300, 100, 200));
  grid->NewestStamp();
  CGridCell vol, bid, price;
  grid->GetCell(TradeSGrid::kVolume, 0, vol);
  grid->GetCell(TradeSGrid::kBid, 0, bid);
  grid->GetCell(TradeSGrid::kPrice, 0, price);
  EXPECT_EQ(vol.textColor, QColor(1, 2, 3));
  EXPECT_EQ(vol.backColor, QColor(250, 240, 10));
  EXPECT_EQ(bid.backColor, grid->RowBackColor(0)) << "an unchanged value";
  EXPECT_EQ(price.backColor, grid->RowBackColor(0));
  SummaryLineStore::Instance().ExpireMarks(host.clock.Now() + 1500);
  grid->GetCell(TradeSGrid::kVolume, 0, vol);
  EXPECT_EQ(vol.backColor, grid->RowBackColor(0));
}

TEST_F(TradeSGridTest, WidthsAreEqualWithTheRestInThePriceColumn) {
  const int w = ClientWidth();
  EXPECT_EQ(grid->GetColWidth(1), w / 5);
  EXPECT_EQ(grid->GetColWidth(4), w / 5);
  EXPECT_EQ(grid->GetColWidth(0), w / 5 + w % 5);
  // Rows that do not fit leave room for the scroll bar.
  Apply("TRADEDATA", Lines(1, 30), 1);
  grid->NewestStamp();
  const int narrow = w - grid->VScrollBarWidth();
  EXPECT_EQ(grid->GetColWidth(1), narrow / 5);
  EXPECT_EQ(grid->GetColWidth(0), narrow / 5 + narrow % 5);
}

TEST_F(TradeSGridTest, PagesRegisterOnlyWhenTheCountGrows) {
  // Page 1 at selection.
  auto pending = addon::SummaryPageFeed::Instance().TakePending();
  ASSERT_EQ(pending.size(), 1u);
  EXPECT_EQ(pending[0], (addon::SummaryPageFeed::Pending{key, 1}));
  EXPECT_EQ(grid->RegisteredPages(), 1);
  grid->RegisterPagesUpTo(1);
  grid->RegisterPagesUpTo(0);
  EXPECT_TRUE(addon::SummaryPageFeed::Instance().TakePending().empty()) << "a page count that does not grow registers nothing";
  grid->RegisterPagesUpTo(3);
  pending = addon::SummaryPageFeed::Instance().TakePending();
  ASSERT_EQ(pending.size(), 2u);
  EXPECT_EQ(pending[0].params, 2);
  EXPECT_EQ(pending[1].params, 3);
  grid->RegisterPagesUpTo(3);
  EXPECT_TRUE(addon::SummaryPageFeed::Instance().TakePending().empty());
  grid->RegisterPagesUpTo(250);
  EXPECT_EQ(grid->RegisteredPages(), 99);
  EXPECT_EQ(addon::SummaryPageFeed::Instance().TakePending().size(), 96u);
  // Without an instrument nothing registers.
  grid->Reset();
  grid->RegisterPagesUpTo(5);
  EXPECT_TRUE(addon::SummaryPageFeed::Instance().TakePending().empty());
  EXPECT_EQ(grid->NewestStamp(), 0u);
}

TEST_F(TradeSGridTest, PriceClickAsksForATicketWithoutSideBlankAndTotalRowsSendNothing) {
  Apply("TRADEDATA", Join({Item("10.5", 2, 1200, 500, 700), Item("10.4", 1, 50, 0, 50), Item("TOTALS:", 3, 1250, 500, 750)}));
  grid->NewestStamp();
  ASSERT_EQ(grid->GetNumberRows(), 4);
  SummaryFixture::ClickCell(grid, TradeSGrid::kPrice, 1);
  ASSERT_EQ(parent.sent.size(), 1u);
  EXPECT_EQ(parent.sent[0].message, addon::Msg().wlOpenTrade);
  EXPECT_EQ(parent.sent[0].lParam, 0);
  const auto link = addon::ReadLinkText(parent.sent[0].text);
  ASSERT_TRUE(link);
  EXPECT_EQ(link->type, "price view");
  EXPECT_EQ(link->Get(addon::linkkey::kInstrumentCode), ins.instrumentCode);
  EXPECT_EQ(link->Get(addon::linkkey::kProductId), "7");
  EXPECT_EQ(link->Get(addon::linkkey::kTradePrice), "10.400");
  EXPECT_FALSE(link->Has(addon::linkkey::kSide));

  parent.sent.clear();
  SummaryFixture::ClickCell(grid, TradeSGrid::kPrice, 2);  // blank row
  SummaryFixture::ClickCell(grid, TradeSGrid::kPrice, 3);  // totals row
  SummaryFixture::ClickCell(grid, TradeSGrid::kVolume, 0); // not the price column
  EXPECT_TRUE(parent.sent.empty());
  grid->Reset();
  EXPECT_FALSE(grid->OpenTrade(TradeSGrid::kPrice, 0));
  EXPECT_TRUE(parent.sent.empty());
}

TEST_F(TradeSGridTest, HeadingsFromTheLanguageTable) {
  mvtest::FakeLanguage language;
  language.Set(13, 652, L"Deals");
  grid->ApplyLanguage(&language);
  EXPECT_EQ(grid->dumpTsv(), "Price\tDeals\tVolume\tBid Vol\tAsk Vol\n");
  EXPECT_EQ(grid->HeadingText(TradeSGrid::kTrade), L"Deals");
  EXPECT_EQ(TradeSGrid::Columns()[4].key, std::string("colAsk"));
}

}  // namespace
}  // namespace summarytest
