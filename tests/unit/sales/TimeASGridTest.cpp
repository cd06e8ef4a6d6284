// TimeASGrid on its own: rows from the live page, row r shows trade
// (rows - r), cell texts and side colours, equal widths, the stamp the view
// redraws by, and the trade request of a price click.
#include <gtest/gtest.h>

#include <QApplication>
#include <QMouseEvent>

#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "hostview/Text.h"
#include "mvtest/ScriptedHost.h"
#include "views/instrument/SalesFeed.h"
#include "views/instrument/TimeASGrid.h"

namespace {

class Parent : public QWidget, public platform::MessageTarget {
 public:
  LRESULT OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) override {
    if (message == addon::Msg().wlOpenTrade && wParam) tickets.push_back(*FromLParam<const std::wstring>(LPARAM(wParam)));
    origins.push_back(lParam);
    return 0;
  }
  std::vector<std::wstring> tickets;
  std::vector<LPARAM> origins;
};

struct TestGrid : TimeASGrid {
  using TimeASGrid::TimeASGrid;
  using TimeASGrid::OnMouseMove;
};

// One trade item: time | price | volume | side | unused | number.
std::string Item(int number, const std::string& time = "2026120710:30:00", const std::string& price = "1.250",
                 const std::string& volume = "1500", const std::string& side = "1") {
  return time + "|" + price + "|" + volume + "|" + side + "||" + std::to_string(number);
}
// Trades newest..oldest, newest first, as the terminal sends a page.
std::string Page(int newest, int oldest) {
  std::string s;
  for (int n = newest; n >= oldest; --n) s += (s.empty() ? "" : ";") + Item(n, "2026120710:30:00", std::to_string(n) + ".000");
  return s;
}

struct TimeASGridTest : ::testing::Test {
  mvtest::ScriptedHost host;
  Parent parent;
  TestGrid* grid = nullptr;
  // Each test has an instrument of its own: the stores live for the process.
  const std::string code = ::testing::UnitTest::GetInstance()->current_test_info()->name();
  const InstrumentKey key{7, hv::Widen(code)};

  void SetUp() override {
    sales::ClearPending();
    host.style.colors[3101] = MakeColorRef(0, 150, 0);
    host.style.colors[3102] = MakeColorRef(200, 0, 0);
    host.style.colors[109] = MakeColorRef(10, 10, 10);
    parent.resize(500, 400);
    grid = new TestGrid(&parent);
    grid->resize(400, 300);
    grid->SetStyleManager(&host.style);
    parent.show();
    grid->SetInstrument(key);
  }
  void TearDown() override {
    delete grid;
    sales::ClearPending();
  }

  // A value as the view stores it from a 410/412.
  void Feed(int param, const std::string& field, const std::string& value) {
    sales::ApplyUpdate(FieldUpdate{7, code, field, value, param, 2}, host.clock.Now());
  }
  void Live(const std::string& text) { Feed(sales::kLivePage, "TRADEDATA", text); }
  QStringList Row(int row) {
    QStringList cells;
    for (int col = 0; col < grid->GetNumberCols(); ++col) cells << grid->CellText(col, row);
    return cells;
  }
  void Click(int col, int row) {
    const QPoint pt = grid->CellRect(col, row).center();
    QMouseEvent press(QEvent::MouseButtonPress, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                      Qt::LeftButton, Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &press);
    QMouseEvent release(QEvent::MouseButtonRelease, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                        Qt::LeftButton, Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &release);
  }
  int ClientWidth() const { return grid->width() - 2 * grid->frameWidth(); }
};

TEST_F(TimeASGridTest, LivePageStartingAt250GivesTheRowsNewestFirst) {
  const auto pending = sales::SalesPageFeed::Instance().TakePending();
  ASSERT_EQ(pending.size(), 1u) << "the live page is asked for on selection";
  EXPECT_EQ(pending[0].key, key);
  EXPECT_EQ(pending[0].params, sales::kLivePage);
  EXPECT_EQ(grid->CurrentPage(), sales::kLivePage);
  Live(Page(250, 151));
  grid->NewestStamp();
  ASSERT_EQ(grid->GetNumberRows(), 250);
  EXPECT_EQ(grid->TradeOfRow(0).number, 250);
  EXPECT_EQ(Row(0)[1], "250.000");
  EXPECT_EQ(Row(99)[1], "151.000");
  // Trades before the live page draw as empty rows until their page arrives.
  EXPECT_EQ(Row(100), QStringList({"", "", "", ""}));
  EXPECT_EQ(Row(249), QStringList({"", "", "", ""}));
  Feed(1, "TRADEDATA", Page(100, 1));
  grid->NewestStamp();
  EXPECT_EQ(grid->TradeOfRow(249).number, 1);
  EXPECT_EQ(Row(249)[1], "1.000");
  EXPECT_EQ(Row(100), QStringList({"", "", "", ""})) << "page 2 has not arrived";
  // New trades grow the tape at the top.
  Live(Page(253, 154));
  grid->NewestStamp();
  EXPECT_EQ(grid->GetNumberRows(), 253);
  EXPECT_EQ(Row(0)[1], "253.000");
  EXPECT_EQ(Row(252)[1], "1.000");
  const QStringList dump = grid->dumpTsv().split('\n', Qt::SkipEmptyParts);
  EXPECT_EQ(dump.size(), 254);
  EXPECT_EQ(dump[0], "Time\tPrice\tVolume\tSide");
}

TEST_F(TimeASGridTest, CellTextsTimeVolumeAndSides) {
  Live(Item(6, "2026120710:31:59", "1.250", "1234567", "1") + ";" + Item(5, "10:31:58", "1.240", "20", "2") + ";" +
       Item(4, "10:31:5", "1.230", "7", "3") + ";" + Item(3, "", "1.220", "x", "0") + ";" +
       Item(2, "10:31:56", "1.210", "1", "9") + ";" + Item(1, "10:31:55", "", "3000.0", "A"));
  grid->NewestStamp();
  ASSERT_EQ(grid->GetNumberRows(), 6);
  EXPECT_EQ(Row(0), QStringList({"10:31:59", "1.250", "1,234,567", "Buy"})) << "16 characters: the time after the date";
  EXPECT_EQ(Row(1), QStringList({"10:31:58", "1.240", "20", "Sell"})) << "8 characters: unchanged";
  EXPECT_EQ(Row(2), QStringList({"10:31:5", "1.230", "7", "Auction"}));
  EXPECT_EQ(Row(3), QStringList({"", "1.220", "x", "Married Deal"})) << "a volume that is no number stays";
  EXPECT_EQ(Row(4), QStringList({"10:31:56", "1.210", "1", ""}));
  EXPECT_EQ(Row(5), QStringList({"10:31:55", "", "3,000", ""}));

  CGridCell cell;
  grid->GetCell(TimeASGrid::kSide, 0, cell);
  EXPECT_EQ(cell.textColor, host.style.Color(3101));
  grid->GetCell(TimeASGrid::kSide, 1, cell);
  EXPECT_EQ(cell.textColor, host.style.Color(3102));
  grid->GetCell(TimeASGrid::kPrice, 1, cell);
  EXPECT_EQ(cell.textColor, host.style.Color(109));
  EXPECT_EQ(cell.alignment & Qt::AlignHCenter, int(Qt::AlignHCenter));

  // Words from the language table.
  host.language.Set(13, 614, L"Bought");
  host.language.Set(13, 615, L"Sold");
  host.language.Set(13, 601, L"Zeit");
  grid->ApplyLanguage(&host.language);
  EXPECT_EQ(Row(0)[3], "Bought");
  EXPECT_EQ(Row(1)[3], "Sold");
  EXPECT_EQ(grid->HeadingText(TimeASGrid::kTime), L"Zeit");
  EXPECT_EQ(grid->HeadingText(TimeASGrid::kVol), L"Volume");
}

TEST_F(TimeASGridTest, ColumnsShareTheWidthAndLeaveRoomForTheScrollBar) {
  grid->resize(403, 300);
  const int cw = ClientWidth();
  EXPECT_EQ(grid->GetColWidth(0), cw / 4 + cw % 4);
  for (int col = 1; col < 4; ++col) EXPECT_EQ(grid->GetColWidth(col), cw / 4);
  Live(Page(40, 1));  // 41 rows of 21 pixels do not fit in 300
  grid->NewestStamp();
  const int narrow = cw - grid->VScrollBarWidth();
  EXPECT_EQ(grid->GetColWidth(1), narrow / 4);
  EXPECT_EQ(grid->GetColWidth(0), narrow / 4 + narrow % 4);
}

TEST_F(TimeASGridTest, StampGrowsWithHeaderAndPagesAndIsZeroWithoutInstrument) {
  EXPECT_EQ(grid->NewestStamp(), 0u) << "nothing received yet";
  sales::RegisterHeader(key, host.clock.Now());
  Feed(99999, "LAST", "1.25");
  const auto afterHeader = grid->NewestStamp();
  EXPECT_GT(afterHeader, 0u);
  Live(Page(3, 1));
  const auto afterPage = grid->NewestStamp();
  EXPECT_GT(afterPage, afterHeader);
  EXPECT_EQ(grid->NewestStamp(), afterPage) << "nothing moved";
  Feed(99999, "HIGH", "1.30");
  EXPECT_GT(grid->NewestStamp(), afterPage);
  // Another instrument's values do not move this grid's stamp.
  const auto before = grid->NewestStamp();
  sales::RegisterPage(InstrumentKey{8, key.InstrumentCode}, sales::kLivePage, host.clock.Now());
  sales::ApplyUpdate(FieldUpdate{8, code, "TRADEDATA", Item(9), sales::kLivePage, 2}, host.clock.Now());
  EXPECT_EQ(grid->NewestStamp(), before);
  grid->Reset();
  EXPECT_EQ(grid->NewestStamp(), 0u);
  EXPECT_EQ(grid->GetNumberRows(), 0);
}

TEST_F(TimeASGridTest, PriceClickOpensATicketWithTheSideOfAOrBOnly) {
  Live(Item(3, "10:00:03", "1.250", "100", "A") + ";" + Item(2, "10:00:02", "1.240", "100", "1") + ";" +
       Item(1, "10:00:01", "", "100", "B"));
  Feed(1, "TRADEDATA", Item(1, "10:00:01", "", "100", "B"));
  grid->NewestStamp();
  ASSERT_EQ(grid->GetNumberRows(), 3);
  Click(TimeASGrid::kPrice, 1);  // side "1"
  ASSERT_EQ(parent.tickets.size(), 1u);
  auto link = addon::ReadLinkText(parent.tickets[0]);
  ASSERT_TRUE(link);
  EXPECT_EQ(link->GetWide(addon::linkkey::kSide), L"");
  EXPECT_EQ(link->GetWide(addon::linkkey::kTradePrice), L"1.240");
  EXPECT_EQ(link->GetWide(addon::linkkey::kInstrumentCode), key.InstrumentCode);
  EXPECT_EQ(link->GetWide(addon::linkkey::kProductId), L"7");
  EXPECT_EQ(parent.origins[0], 0);
  Click(TimeASGrid::kPrice, 0);  // side "A"
  ASSERT_EQ(parent.tickets.size(), 2u);
  EXPECT_EQ(addon::ReadLinkText(parent.tickets[1])->GetWide(addon::linkkey::kSide), L"Buy");
  // No ticket: another column, a trade without a price.
  Click(TimeASGrid::kVol, 0);
  Click(TimeASGrid::kPrice, 2);
  EXPECT_EQ(parent.tickets.size(), 2u);
  // The hand shows over prices only.
  grid->OnMouseMove(TimeASGrid::kPrice, 0, QPoint(), Qt::NoButton);
  EXPECT_EQ(grid->GridCursor(), Qt::PointingHandCursor);
  grid->OnMouseMove(TimeASGrid::kTime, 0, QPoint(), Qt::NoButton);
  EXPECT_EQ(grid->GridCursor(), Qt::ArrowCursor);
}

TEST_F(TimeASGridTest, GarbledTradeNumberCannotBlowUpTheRowCount) {
  Live(Item(2147483647) + ";" + Item(2147483646));
  grid->NewestStamp();
  EXPECT_EQ(grid->GetNumberRows(), TimeASGrid::kMaxRows);
  EXPECT_EQ(Row(0), QStringList({"", "", "", ""}));
}

TEST_F(TimeASGridTest, AHistoryPageStartRegistersTheEarlierPages) {
  sales::ClearPending();
  grid->SetInstrument(key, 4);
  EXPECT_EQ(grid->CurrentPage(), 4);
  std::vector<int> pages;
  for (const auto& p : sales::SalesPageFeed::Instance().TakePending()) pages.push_back(p.params);
  EXPECT_EQ(pages, (std::vector<int>{1, 2, 3}));
}

}  // namespace
