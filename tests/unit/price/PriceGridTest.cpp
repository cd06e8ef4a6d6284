// The price grid inside a price view: cell texts and colours, sorting, double
// clicks, hints, the cursor, the context menu, columns and copying.
#include <QApplication>
#include <QClipboard>
#include <QKeyEvent>

#include "PriceFixture.h"
#include "views/price/TipDialogs.h"

namespace pricetest {
namespace {

using pricecol::Col;

struct PriceGridTest : PriceFixture {
  CPriceViewAdv* view = nullptr;
  PriceGrid* grid = nullptr;

  // Every column of the layout shown.
  static void ShowAllColumns() {
    CWatchlistSetting s = GetUserSettings().GetWatchlistSetting();
    ColumnSettingInfo info;
    ASSERT_TRUE(s.GetSettingInfo(pricecol::LayoutIdOf(s), info));
    for (auto& item : info.items) item.visible = true;
    s.SetSettingInfo(info.id, info);
    GetUserSettings().SetWatchlistSetting(s);
  }

  void Open() {
    ShowAllColumns();
    view = Make();
    grid = view->GetPriceGrid();
  }

  // The cell as it would be drawn.
  CGridCell Cell(Col c, int row) {
    CGridCell cell;
    grid->GetCell(ColOf(grid, c), row, cell);
    return cell;
  }

  void Header(Col c, QEvent::Type type) { Mouse(grid, type, ColOf(grid, c), -1); }
  void HeaderClick(Col c) {
    Header(c, QEvent::MouseButtonPress);
    Header(c, QEvent::MouseButtonRelease);
  }
};

TEST_F(PriceGridTest, Columns_EveryKeyWithItsAlignmentAndEmptyMarkerHeadings) {
  Open();
  EXPECT_EQ(grid->GetNumberCols(), 27);
  for (Col c : {Col::Icon, Col::Link, Col::Arrow}) EXPECT_TRUE(grid->CellText(ColOf(grid, c), -1).isEmpty());
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Last), -1), "Last");
  for (Col c : {Col::Symbol, Col::Name, Col::Rem, Col::Exchange, Col::Currency, Col::LS, Col::CFD, Col::DMA,
                Col::Month, Col::Year})
    EXPECT_TRUE(Cell(c, 0).alignment & Qt::AlignLeft) << pricecol::InfoOf(c).key;
  for (Col c : {Col::Last, Col::Ask, Col::Bid, Col::TAC, Col::BuyVol, Col::SellVol, Col::TotVol, Col::Change,
                Col::PerChange, Col::Open, Col::PrevClose, Col::High, Col::Low, Col::Delay})
    EXPECT_TRUE(Cell(c, 0).alignment & Qt::AlignRight) << pricecol::InfoOf(c).key;
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Symbol), 0), "D05");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Name), 0), "D05 Holdings");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Exchange), 0), "SGX");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Currency), 0), "SGD");
}

TEST_F(PriceGridTest, QuoteTexts_PricesWithInstrumentDecimalsVolumesThroughDouble2Str) {
  Open();
  Push(view, instruments[0], "LAST", "10.5");
  Push(view, instruments[0], "BVOL", "1,234,567");
  Push(view, instruments[0], "VOL", "12");
  Push(view, instruments[0], "REMARKS", "CD");
  Push(view, instruments[0], "CFD_STATUS", "L/-");
  Push(view, instruments[0], "LAST", "nan");  // never shown
  host.Advance(200);
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Last), 0), "10.50");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::BuyVol), 0), "1,234,567.00");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::TotVol), 0), "12.00");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::SellVol), 0), "0.00");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Rem), 0), "CD");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::LS), 0), "L/-");
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::TAC), 0), "");
  view->ShowWatchlist(kUserWatchlists, L"Asia");
  Push(view, instruments[4], "BID", "98.1");
  host.Advance(200);
  EXPECT_EQ(grid->CellText(ColOf(grid, Col::Bid), 0), "98.100");
  const QString dump = grid->dumpTsv();
  EXPECT_FALSE(dump.contains("nan") || dump.contains("inf"));
}

TEST_F(PriceGridTest, Colours_SignOnUnselectedRowsMarksOnEveryRow) {
  Open();
  const auto& colors = grid->RowPalette();
  EXPECT_EQ(colors.riseBack, QColor(0, 200, 0));
  Push(view, instruments[0], "CHANGE", "0.2");
  Push(view, instruments[1], "CHANGE", "0.2");
  Push(view, instruments[2], "CHANGE", "0");
  host.Advance(200);
  Push(view, instruments[0], "CHANGE", "-0.5");  // falls: mark 3
  Push(view, instruments[1], "CHANGE", "-0.5");
  Push(view, instruments[0], "PCHANGE", "-1.5");
  host.Advance(200);
  grid->SelectRow(1);

  // Unselected row 0: red text on the fall background... (the mark wins for the background).
  EXPECT_EQ(Cell(Col::Change, 0).backColor, colors.fallBack);
  EXPECT_EQ(Cell(Col::Change, 0).textColor, colors.changedText);
  // Once the mark is gone: the sign colour.
  host.Advance(1600);
  EXPECT_EQ(Cell(Col::Change, 0).textColor, ColorFromRef(0x0000FA));
  EXPECT_EQ(Cell(Col::PerChange, 0).textColor, ColorFromRef(0x0000FA));
  EXPECT_EQ(Cell(Col::Change, 0).backColor, colors.evenRow);
  // The selected row keeps the selected row's text colour.
  EXPECT_EQ(Cell(Col::Change, 1).textColor, colors.selText);
  EXPECT_EQ(Cell(Col::Change, 1).backColor, colors.selBack);
  // Zero keeps the row's colour; a positive change is green.
  EXPECT_EQ(Cell(Col::Change, 2).textColor, colors.text);
  Push(view, instruments[2], "CHANGE", "0.1");
  host.Advance(1700);
  EXPECT_EQ(Cell(Col::Change, 2).textColor, ColorFromRef(0x009600));

  // A rising last: the rise background on any row, the selected one too.
  Push(view, instruments[0], "LAST", "10");
  Push(view, instruments[1], "LAST", "10");
  host.Advance(200);
  Push(view, instruments[0], "LAST", "11");
  Push(view, instruments[1], "LAST", "11");
  host.Advance(200);
  for (int row : {0, 1}) {
    EXPECT_EQ(Cell(Col::Last, row).backColor, colors.riseBack) << row;
    EXPECT_EQ(Cell(Col::Last, row).textColor, colors.changedText) << row;
  }
  // Open, previous close and TAC are never coloured.
  for (const char* field : {"OPEN", "CLOSE", "TAC"}) {
    Push(view, instruments[0], field, "5");
    Push(view, instruments[0], field, "6");
  }
  host.Advance(200);
  for (Col c : {Col::Open, Col::PrevClose, Col::TAC}) EXPECT_EQ(Cell(c, 0).backColor, colors.evenRow);
  // Volumes and texts show the changed background.
  Push(view, instruments[0], "VOL", "100");
  Push(view, instruments[0], "VOL", "200");
  host.Advance(200);
  EXPECT_EQ(Cell(Col::TotVol, 0).backColor, colors.changedBack);
  host.Advance(1600);
  EXPECT_EQ(Cell(Col::TotVol, 0).backColor, colors.evenRow);
  EXPECT_EQ(Cell(Col::Last, 0).backColor, colors.evenRow);
  // Alternating rows.
  EXPECT_EQ(Cell(Col::Symbol, 2).backColor, colors.evenRow);
  grid->ClearSelection();
  EXPECT_EQ(Cell(Col::Symbol, 1).backColor, colors.oddRow);
}

TEST_F(PriceGridTest, DefaultRowColours_BeforeAStyleIsKnown) {
  PriceGrid bare;
  EXPECT_EQ(bare.RowPalette().evenRow, QColor(255, 255, 255));
  EXPECT_EQ(bare.RowPalette().oddRow, QColor(240, 240, 240));
  EXPECT_EQ(bare.RowPalette().selBack, QColor(0xC5, 0xD2, 0xFA));
}

TEST_F(PriceGridTest, Sort_AscendingDescendingAscendingRowsWithoutValueLast) {
  Open();
  Push(view, instruments[0], "LAST", "10");
  Push(view, instruments[1], "LAST", "5");
  host.Advance(200);
  HeaderClick(Col::Last);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"O39", L"D05", L"U11"}));
  EXPECT_EQ(grid->SortFlag(), 1);
  CGridCell heading;
  grid->GetCell(ColOf(grid, Col::Last), -1, heading);
  EXPECT_EQ(heading.cellType->GetName(), L"SortArrow");
  EXPECT_EQ(heading.number, 0);  // arrow up
  HeaderClick(Col::Last);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
  grid->GetCell(ColOf(grid, Col::Last), -1, heading);
  EXPECT_EQ(heading.number, 1);
  HeaderClick(Col::Last);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"O39", L"D05", L"U11"}));

  // New values re-sort on the next tick, and the selection follows its row.
  grid->SelectRow(0);  // O39
  Push(view, instruments[1], "LAST", "20");
  host.Advance(200);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
  EXPECT_EQ(grid->GetSelectedRows(), (std::vector<int>{1}));

  // Another column starts ascending; press and release on different columns do nothing.
  HeaderClick(Col::Symbol);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
  EXPECT_EQ(grid->SortColumn(), ColOf(grid, Col::Symbol));
  Header(Col::Last, QEvent::MouseButtonPress);
  Header(Col::Name, QEvent::MouseButtonRelease);
  EXPECT_EQ(grid->SortColumn(), ColOf(grid, Col::Symbol));
  // Marker columns do not sort.
  HeaderClick(Col::Icon);
  HeaderClick(Col::Arrow);
  EXPECT_EQ(grid->SortColumn(), ColOf(grid, Col::Symbol));
}

TEST_F(PriceGridTest, NothingChanged_NoRedrawAndNoResort) {
  Open();
  host.Advance(200);
  const std::uint64_t seen = grid->UpdateCounter();
  host.Advance(600);
  EXPECT_EQ(grid->UpdateCounter(), seen);
  Push(view, instruments[0], "LAST", "10");
  EXPECT_GT(grid->UpdateCounter(), seen);
  // A change of an instrument that is not shown moves nothing here.
  const std::uint64_t now = grid->UpdateCounter();
  QuoteStore::Instance().Get(InstrumentKey{1, L"0005"}, 0);
  Push(view, instruments[4], "LAST", "10");
  EXPECT_EQ(grid->UpdateCounter(), now);
}

TEST_F(PriceGridTest, DoubleClick_BidSellsAskBuysTacOnlyAboveZero) {
  Open();
  Push(view, instruments[0], "BID", "9.9");
  Push(view, instruments[0], "ASK", "10.1");
  Push(view, instruments[0], "BVOL", "1,200");
  Push(view, instruments[0], "SVOL", "300");
  Push(view, instruments[0], "TAC", "0");
  host.Advance(200);
  struct Case {
    Col col;
    const char* side;
    const char* price;
    const char* qty;
    const char* trigger;
  };
  const Case cases[] = {{Col::Bid, "Sell", "9.90", "", "1"},
                        {Col::BuyVol, "Sell", "9.90", "1200", "1"},
                        {Col::Ask, "Buy", "10.10", "", "1"},
                        {Col::SellVol, "Buy", "10.10", "300", "1"}};
  for (const Case& c : cases) {
    SCOPED_TRACE(pricecol::InfoOf(c.col).key);
    host.ClearRequests();
    DoubleClick(grid, ColOf(grid, c.col), 0);
    const auto links = host.RequestsOf(hm::LinkData);
    ASSERT_EQ(links.size(), 1u);
    EXPECT_EQ(links[0].link->className, L"CTradeView");
    const auto text = addon::ReadLinkText(links[0].link->link);
    ASSERT_TRUE(text);
    EXPECT_EQ(text->Get("Field_instrument_code"), "D05");
    EXPECT_EQ(text->Get("Field_product_id"), "1");
    EXPECT_EQ(text->Get("Field_side"), c.side);
    EXPECT_EQ(text->Get("Field_Trade_price"), c.price);
    EXPECT_EQ(text->Get("Field_qty"), c.qty);
    EXPECT_EQ(text->Get("Field_Trigger_type"), c.trigger);
  }
  // TAC at 0: nothing; above 0: trigger type 0.
  host.ClearRequests();
  DoubleClick(grid, ColOf(grid, Col::TAC), 0);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());
  Push(view, instruments[0], "TAC", "10.05");
  host.Advance(200);
  DoubleClick(grid, ColOf(grid, Col::TAC), 0);
  ASSERT_EQ(host.RequestsOf(hm::LinkData).size(), 1u);
  EXPECT_EQ(addon::ReadLinkText(host.RequestsOf(hm::LinkData)[0].link->link)->Get("Field_Trigger_type"), "0");
  // A row that cannot be traded shows the "17007" text.
  view->ShowWatchlist(kUserWatchlists, L"Asia");
  view->AddChosenInstrument(instruments[0]);
  host.AnswerText("17007, 0", L"No trading here");
  instruments[4].accessStatus = 1;
  grid->RejoinInstruments();
  host.ClearRequests();
  DoubleClick(grid, ColOf(grid, Col::Bid), 0);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());
  EXPECT_EQ(Boxes().back(), QString("No trading here"));
}

TEST_F(PriceGridTest, DoubleClick_RemarkAndLongShortOpenTheLegendsLinkSendsTheInstrument) {
  Open();
  DoubleClick(grid, ColOf(grid, Col::Rem), 1);
  host.Advance(0);
  host.Advance(500);
  EXPECT_TRUE(view->RemarkLegend()->isVisible());
  DoubleClick(grid, ColOf(grid, Col::LS), 1);
  host.Advance(0);
  host.Advance(500);
  EXPECT_TRUE(view->LongShortLegend()->isVisible());
  host.ClearRequests();
  DoubleClick(grid, ColOf(grid, Col::Link), 1);
  const auto sent = host.RequestsOf(hm::LinkedInstrument);
  ASSERT_EQ(sent.size(), 1u);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());
  // World indices keep their links to themselves.
  view->OnCommand(CPriceViewAdv::kWorldButtonId);
  host.ClearRequests();
  DoubleClick(grid, ColOf(grid, Col::Link), 0);
  EXPECT_TRUE(host.RequestsOf(hm::LinkedInstrument).empty());
}

TEST_F(PriceGridTest, HintsAndCursor) {
  Open();
  QString hint;
  EXPECT_TRUE(grid->HintAt(grid->CellRect(ColOf(grid, Col::Rem), 0).center(), &hint));
  EXPECT_EQ(hint, "Double-click for the legend");
  EXPECT_TRUE(grid->HintAt(grid->CellRect(ColOf(grid, Col::LS), 0).center(), &hint));
  EXPECT_FALSE(grid->HintAt(grid->CellRect(ColOf(grid, Col::Last), 0).center(), &hint));
  EXPECT_FALSE(grid->HintAt(grid->CellRect(ColOf(grid, Col::Delay), 0).center(), &hint));  // no delay text
  for (Col c : {Col::Bid, Col::Ask, Col::Last, Col::Symbol}) {
    Mouse(grid, QEvent::MouseMove, ColOf(grid, c), 0, Qt::NoButton);
    EXPECT_EQ(grid->GridCursor(), c == Col::Bid || c == Col::Ask ? Qt::PointingHandCursor : Qt::ArrowCursor)
        << pricecol::InfoOf(c).key;
  }
}

TEST_F(PriceGridTest, ContextMenu_OrderRangesAndMessages) {
  Open();
  grid->SelectRow(1);
  const auto items = grid->BuildContextMenu();
  std::vector<int> ids;
  for (const auto& i : items) ids.push_back(i.id);
  EXPECT_EQ(ids, (std::vector<int>{1000, 0, 1001, 1004, 1007, 0, 1003, 1006, 1005, 1002, 0, 0, 1200}));
  EXPECT_EQ(items[3].text, "T414");
  EXPECT_EQ(items[9].text, "T7");
  // The submenu lists every user watchlist but the current one.
  const auto& sub = items[11];
  EXPECT_EQ(sub.text, "T403");
  ASSERT_EQ(sub.children.size(), 2u);
  EXPECT_EQ(sub.children[0].id, 1101);
  EXPECT_EQ(sub.children[1].id, 1102);

  // Running a command: the selected rows go to the view.
  grid->SelectRow(2, true);
  grid->RunCommand(1101);
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Asia")->items,
            (std::vector<InstrumentKey>{{1, L"O39"}, {1, L"U11"}, {1, L"0005"}}));
  host.ClearRequests();
  host.dialogs.menuAnswers = {1002};
  grid->ShowContextMenu(QPoint());
  ASSERT_EQ(host.RequestsOf(hm::OpenView).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::OpenView)[0].link->className, L"CMarketDepthAdv");
  EXPECT_EQ(addon::ReadLinkText(host.RequestsOf(hm::LinkData)[0].link->link)->Get("Field_instrument_code"), "O39");
  grid->RunCommand(1200);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"D05"}));

  // World indices: no trade or view commands.
  view->OnCommand(CPriceViewAdv::kWorldButtonId);
  grid->SelectRow(0);
  ids.clear();
  for (const auto& i : grid->BuildContextMenu()) ids.push_back(i.id);
  EXPECT_EQ(ids, (std::vector<int>{0}));  // the add submenu only
  // Brand lists: no add submenu, the brand remove item.
  view->OnCommand(CPriceViewAdv::kKeldoButtonId);
  grid->SelectRow(0);
  const auto brand = grid->BuildContextMenu();
  EXPECT_EQ(brand.back().id, 1500);
  EXPECT_EQ(brand.back().text, "Remove From KELDO Watchlist");
  grid->RunCommand(1500);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"D05"}));
}

TEST_F(PriceGridTest, CtrlC_CopiesSelectedRowsWithTheVisibleHeadings) {
  view = Make();
  grid = view->GetPriceGrid();
  Push(view, instruments[0], "LAST", "10");
  host.Advance(200);
  grid->SelectRow(0);
  grid->SelectRow(2, true);
  QKeyEvent copy(QEvent::KeyPress, Qt::Key_C, Qt::ControlModifier);
  QApplication::sendEvent(grid, &copy);
  const QStringList lines = host.dialogs.clipboard.split('\n', Qt::SkipEmptyParts);
  ASSERT_EQ(lines.size(), 3);
  EXPECT_EQ(lines[0].split('\t')[2], "Symbol");
  EXPECT_EQ(lines[1].split('\t')[2], "D05");
  EXPECT_TRUE(lines[1].split('\t').contains("10.00"));
  EXPECT_EQ(lines[2].split('\t')[2], "U11");
}

TEST_F(PriceGridTest, WorldIndexColumns_FallBackAndWriteBackOrKeepTheStoredOrder) {
  CWatchlistSetting s = GetUserSettings().GetWatchlistSetting();
  const std::string fourteen =
      "colIcon,colLink,colSymbol,colName,colArrow,colDelay,colRem,colExchange,colPrevClose,colLast,colChange,"
      "colPerChange,colOpen,colHigh";
  s.SetWIDXCol(fourteen + ",colBogus");
  GetUserSettings().SetWatchlistSetting(s);
  view = Make();
  grid = view->GetPriceGrid();
  view->OnCommand(CPriceViewAdv::kWorldButtonId);
  EXPECT_EQ(grid->GetNumberCols(), 15);
  EXPECT_EQ(grid->ColumnAt(14), Col::Low);
  EXPECT_EQ(GetUserSettings().GetWatchlistSetting().GetWIDXCol(), CWatchlistSetting::DefaultWIDXCol());

  s = GetUserSettings().GetWatchlistSetting();
  s.SetWIDXCol("colLast," + std::string(fourteen).replace(fourteen.find("colLast,"), 8, "") + ",colLow");
  GetUserSettings().SetWatchlistSetting(s);
  host.Send(view, hm::SettingsChanged);
  EXPECT_EQ(grid->ColumnAt(0), Col::Last);
  EXPECT_EQ(grid->GetNumberCols(), 15);

  // A moved column is stored in the order text.
  ASSERT_TRUE(pricecol::MoveColumn(kWorldIndices, 0, 2));
  EXPECT_EQ(GetUserSettings().GetWatchlistSetting().GetWIDXCol().rfind("colIcon,colLink,colLast,", 0), 0u);
}

TEST_F(PriceGridTest, ColumnMove_StoredInTheLayoutAndSortCleared) {
  view = Make();
  grid = view->GetPriceGrid();
  HeaderClick(Col::Symbol);
  ASSERT_EQ(grid->SortColumn(), ColOf(grid, Col::Symbol));
  const int last = ColOf(grid, Col::Last);
  // Drag the "Last" heading to the front.
  const QPoint from = grid->CellRect(last, -1).center();
  const QPoint to = grid->CellRect(0, -1).topLeft() + QPoint(2, 5);
  auto send = [&](QEvent::Type type, QPoint pt, Qt::MouseButtons buttons) {
    QMouseEvent e(type, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)), Qt::LeftButton, buttons,
                  Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &e);
  };
  send(QEvent::MouseButtonPress, from, Qt::LeftButton);
  send(QEvent::MouseMove, from - QPoint(20, 0), Qt::LeftButton);
  send(QEvent::MouseMove, to, Qt::LeftButton);
  send(QEvent::MouseButtonRelease, to, Qt::NoButton);
  EXPECT_EQ(grid->ColumnAt(0), Col::Last);
  EXPECT_EQ(grid->SortColumn(), -1);
  ColumnSettingInfo info;
  CWatchlistSetting s = GetUserSettings().GetWatchlistSetting();
  ASSERT_TRUE(s.GetSettingInfo(pricecol::LayoutIdOf(s), info));
  EXPECT_EQ(info.items[0].key, "colLast");
  EXPECT_EQ(info.items.size(), 27u);  // hidden columns kept
}

}  // namespace
}  // namespace pricetest
