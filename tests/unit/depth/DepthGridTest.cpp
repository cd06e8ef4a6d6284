// DepthGrid on its own: columns and masks, cell texts from the depth store,
// filled levels, widths, the column menu and the trade request of a click.
#include <gtest/gtest.h>

#include <QApplication>
#include <QMouseEvent>
#include <QScrollBar>

#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "data/MarketStores.h"
#include "mvtest/ScriptedHost.h"
#include "addon/Feeds.h"
#include "views/instrument/DepthGrid.h"

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

struct TestGrid : DepthGrid {
  using DepthGrid::DepthGrid;
  using DepthGrid::OnColSized;
  using DepthGrid::OnMouseMove;
};

struct DepthGridTest : ::testing::Test {
  mvtest::ScriptedHost host;  // application, virtual clock, recording dialogs
  Parent parent;
  TestGrid* grid = nullptr;
  const InstrumentKey key{7, L"D05"};

  void SetUp() override {
    addon::DepthFeed::Instance().Reset();
    parent.resize(500, 400);
    grid = new TestGrid(&parent);
    grid->resize(400, 300);
    parent.show();
    grid->SetInstrument(key, 5);
  }

  void Set(int level, const wchar_t* field, const wchar_t* value) {
    DepthStore::Instance().Update(DepthKey{key.ProductID, key.InstrumentCode, level}, field, value, host.clock.Now());
  }
  void Level(int level, const wchar_t* buy, const wchar_t* sell, const wchar_t* bvol = L"100",
             const wchar_t* svol = L"200") {
    Set(level, L"BUY", buy);
    Set(level, L"SELL", sell);
    Set(level, L"BVOL", bvol);
    Set(level, L"SVOL", svol);
  }
  QStringList Row(int row) {
    QStringList cells;
    for (int col = 0; col < grid->GetNumberCols(); ++col) cells << grid->CellText(col, row);
    return cells;
  }
  int ClientWidth() const { return grid->width() - 2 * grid->frameWidth(); }
};

TEST_F(DepthGridTest, Mask_ShortTextFallsBackAndShownColumnsKeepTableOrder) {
  EXPECT_EQ(grid->ColumnMask(), L"011110");
  grid->SetColumnMask(L"11");
  EXPECT_EQ(grid->ColumnMask(), L"011110");
  EXPECT_EQ(grid->ShownColumns(), (std::vector<int>{1, 2, 3, 4}));
  EXPECT_EQ(grid->dumpTsv().split('\n')[0], "Buy Vol\tBuy\tSell\tSell Vol");

  grid->SetColumnMask(L"111111");
  EXPECT_EQ(grid->GetNumberCols(), 6);
  grid->SetColumnMask(L"100001");
  EXPECT_EQ(grid->dumpTsv(), "Buy Orders\tSell Orders\n");

  // Toggling the last shown column off leaves no columns at all.
  grid->ToggleColumn(DepthGrid::kUCBVol);
  grid->ToggleColumn(DepthGrid::kUCSVol);
  EXPECT_EQ(grid->ColumnMask(), L"000000");
  EXPECT_EQ(grid->GetNumberCols(), 0);
  EXPECT_EQ(grid->dumpTsv(), "\n");
  // Each toggle told the parent.
  EXPECT_EQ(parent.sent.size(), 2u);
  EXPECT_EQ(parent.sent[0].message, addon::Msg().mdColumnUpdate);
}

TEST_F(DepthGridTest, Headings_FromTheLanguageTable) {
  mvtest::FakeLanguage language;
  language.Set(13, 502, L"Bid Qty");
  language.Set(13, 505, L"Ask Qty");
  grid->ApplyLanguage(&language);
  EXPECT_EQ(grid->dumpTsv(), "Bid Qty\tBuy\tSell\tAsk Qty\n");
  EXPECT_EQ(grid->HeadingText(DepthGrid::kBVol), L"Bid Qty");
  // The hint over a heading is the heading's text.
  QString hint;
  ASSERT_TRUE(grid->HintAt(grid->CellRect(0, -1).center(), &hint));
  EXPECT_EQ(hint, QStringLiteral("Bid Qty"));
  ASSERT_TRUE(grid->HintAt(grid->CellRect(3, -1).center(), &hint));
  EXPECT_EQ(hint, QStringLiteral("Ask Qty"));

  // Every column reads its own entry (501 to 506); entries the table lacks
  // and a missing table give the built-in headings.
  grid->SetColumnMask(L"111111");
  language.Set(13, 501, L"Bid Orders");
  language.Set(13, 503, L"Bid");
  language.Set(13, 504, L"Ask");
  language.Set(13, 506, L"Ask Orders");
  grid->ApplyLanguage(&language);
  EXPECT_EQ(grid->dumpTsv(), "Bid Orders\tBid Qty\tBid\tAsk\tAsk Qty\tAsk Orders\n");
  language.Set(13, 503, L"");
  grid->ApplyLanguage(&language);
  EXPECT_EQ(grid->dumpTsv(), "Bid Orders\tBid Qty\tBuy\tAsk\tAsk Qty\tAsk Orders\n");
  grid->ApplyLanguage(nullptr);
  EXPECT_EQ(grid->dumpTsv(), "Buy Orders\tBuy Vol\tBuy\tSell\tSell Vol\tSell Orders\n");
}

TEST_F(DepthGridTest, Cells_VolumesGroupedZeroEmptyPricesAsStored) {
  grid->SetColumnMask(L"111111");
  Level(1, L"9.5", L"9.6", L"1234567", L"0");
  Set(1, L"ORDS_BVOL", L"12");
  grid->NewestStamp();
  ASSERT_EQ(grid->GetNumberRows(), 1);
  // The instrument's decimals are unknown here: the store's default format.
  EXPECT_EQ(Row(0), (QStringList{"12", "1,234,567", "9.500", "9.600", "", ""}));

  Set(1, L"SELL", L"0");
  EXPECT_EQ(grid->CellText(3, 0), "");
  // A row outside the book and a column outside the shown ones draw nothing.
  EXPECT_EQ(grid->CellText(1, 5), "");
  EXPECT_EQ(grid->CellText(9, 0), "");
}

TEST_F(DepthGridTest, FilledLevels_StopAtTheFirstLevelWithoutPrices) {
  Level(1, L"9.5", L"9.6");
  Level(2, L"9.4", L"");  // a buy price alone still counts
  Level(4, L"9.2", L"9.8");
  Level(5, L"9.1", L"9.9");
  const std::uint64_t stamp = grid->NewestStamp();
  EXPECT_EQ(grid->GetNumberRows(), 2);
  EXPECT_GT(stamp, 0u);
  // Level 3 arrives: the book reaches 5.
  Level(3, L"9.3", L"9.7");
  EXPECT_GT(grid->NewestStamp(), stamp);
  EXPECT_EQ(grid->GetNumberRows(), 5);
  // An emptied price withdraws the level's text.
  Set(1, L"BUY", L"");
  Set(1, L"SELL", L"");
  grid->NewestStamp();
  EXPECT_EQ(grid->GetNumberRows(), 0);

  grid->Reset();
  EXPECT_EQ(grid->NewestStamp(), 0u);
  EXPECT_EQ(grid->Instrument().ProductID, -1);
}

TEST_F(DepthGridTest, Widths_FollowTheRuleForSixAndOtherCounts) {
  grid->SetColumnMask(L"111111");
  const int w = ClientWidth() - 70;
  EXPECT_EQ(grid->GetColWidth(0), 35);
  EXPECT_EQ(grid->GetColWidth(5), 35);
  EXPECT_EQ(grid->GetColWidth(2), w / 4);
  EXPECT_EQ(grid->GetColWidth(3), w / 4);
  EXPECT_EQ(grid->GetColWidth(4), w / 4);
  EXPECT_EQ(grid->GetColWidth(1), w - 3 * (w / 4));

  grid->resize(403, 300);
  grid->SetColumnMask(L"011100");
  const int cw = ClientWidth();
  EXPECT_EQ(grid->GetColWidth(0), cw / 3 + cw % 3);
  EXPECT_EQ(grid->GetColWidth(1), cw / 3);
  EXPECT_EQ(grid->GetColWidth(2), cw / 3);

  // Rows that do not fit leave room for the scroll bar.
  grid->resize(403, 100);
  grid->SetLevelCount(20);
  for (int level = 1; level <= 10; ++level) Level(level, L"9", L"10");
  grid->NewestStamp();
  EXPECT_EQ(grid->GetNumberRows(), 10);
  const int narrow = ClientWidth() - grid->VScrollBarWidth();
  EXPECT_EQ(grid->GetColWidth(1), narrow / 3);
}

TEST_F(DepthGridTest, ColumnSizing_NeverBelow35AndTellsTheParent) {
  int width = 10;
  grid->OnColSized(1, width);
  EXPECT_EQ(width, 35);
  width = 90;
  grid->OnColSized(1, width);
  EXPECT_EQ(width, 90);
  ASSERT_EQ(parent.sent.size(), 2u);
  EXPECT_EQ(parent.sent[1].message, addon::Msg().mdColumnUpdate);
}

TEST_F(DepthGridTest, ColumnMenu_ListsSixColumnsAndTogglesTheChosenOne) {
  host.dialogs.menuAnswers = {DepthGrid::kMenuFirstId + DepthGrid::kUCBVol};
  const QPoint pt = grid->CellRect(0, -1).center();
  QMouseEvent press(QEvent::MouseButtonPress, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                    Qt::RightButton, Qt::RightButton, Qt::NoModifier);
  QApplication::sendEvent(grid->viewport(), &press);
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  const auto& items = host.dialogs.shown[0].items;
  ASSERT_EQ(items.size(), 6u);
  EXPECT_EQ(items[0].id, 3000);
  EXPECT_EQ(items[5].id, 3005);
  EXPECT_FALSE(items[0].checked);
  EXPECT_TRUE(items[1].checked);
  EXPECT_EQ(grid->ColumnMask(), L"111110");
  EXPECT_EQ(parent.sent.back().message, addon::Msg().mdColumnUpdate);
}

TEST_F(DepthGridTest, PriceClick_SendsTheTradeRequestWithSideAndPrice) {
  Level(1, L"9.5", L"9.6");
  Level(2, L"9.4", L"9.7");
  grid->NewestStamp();
  auto click = [&](int col, int row) {
    const QPoint pt = grid->CellRect(col, row).center();
    QMouseEvent press(QEvent::MouseButtonPress, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                      Qt::LeftButton, Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &press);
    QMouseEvent release(QEvent::MouseButtonRelease, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                        Qt::LeftButton, Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &release);
  };
  click(1, 1);  // buy price of level 2
  ASSERT_EQ(parent.sent.size(), 1u);
  EXPECT_EQ(parent.sent[0].message, addon::Msg().wlOpenTrade);
  EXPECT_EQ(parent.sent[0].lParam, 0);
  EXPECT_EQ(parent.sent[0].text,
            L"{\"type\":\"price view\",\"data\":[{\"Field_instrument_code\":\"D05\",\"Field_product_id\":\"7\","
            L"\"Field_side\":\"Buy\",\"Field_Trade_price\":\"9.400\"}]}");
  click(0, 0);  // a volume
  EXPECT_EQ(parent.sent.size(), 1u);
  Set(1, L"SELL", L"");  // an emptied price
  click(2, 0);
  EXPECT_EQ(parent.sent.size(), 1u);
}

TEST_F(DepthGridTest, Cursor_HandOverPricesOnly) {
  grid->OnMouseMove(1, 0, QPoint(), Qt::NoButton);
  EXPECT_EQ(grid->GridCursor(), Qt::PointingHandCursor);
  grid->OnMouseMove(0, 0, QPoint(), Qt::NoButton);
  EXPECT_EQ(grid->GridCursor(), Qt::ArrowCursor);
  grid->OnMouseMove(1, -1, QPoint(), Qt::NoButton);
  EXPECT_EQ(grid->GridCursor(), Qt::ArrowCursor);
}

TEST_F(DepthGridTest, Registration_QueuesOncePerCountAndReadsCreateNothing) {
  auto& feed = addon::DepthFeed::Instance();
  EXPECT_EQ(feed.PendingCount(), 1u);
  grid->SetLevelCount(5);  // the same pair again
  EXPECT_EQ(feed.PendingCount(), 1u);
  grid->SetLevelCount(21);
  const auto pending = feed.TakePending();
  ASSERT_EQ(pending.size(), 2u);
  EXPECT_EQ(pending[0].params, 5);
  EXPECT_EQ(pending[1].params, 21);
  EXPECT_EQ(DepthStore::Instance().PendingCount(), 0u);
  const std::size_t records = DepthStore::Instance().Size();
  EXPECT_EQ(records, 21u);
  grid->NewestStamp();
  DepthRecord r;
  EXPECT_FALSE(feed.Read(DepthKey{key.ProductID, key.InstrumentCode, 22}, r));
  EXPECT_EQ(DepthStore::Instance().Size(), records);
}

}  // namespace
