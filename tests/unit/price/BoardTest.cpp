// The price view's board mode through the scripted host: the quantity check,
// the tile layout, what the tiles report to the grid, the switch between
// board and list, the re-check after a settings change and the market delay
// of a tile.
#include <QKeyEvent>
#include <QLineEdit>
#include <QValidator>

#include "PriceFixture.h"
#include "grid/GridDropList.h"
#include "views/price/BoardGrid.h"
#include "views/price/QuantityCheck.h"

namespace pricetest {
namespace {

void DecodeSaves(mvtest::ScriptedHost& host) {
  for (UINT m : {hm::SaveWatchlistNames, hm::SaveUserWatchlist, hm::SaveKeldoWatchlist, hm::RenameWatchlist})
    host.AddDecoder(m, [](LPARAM d) { return std::any(*FromLParam<const WatchlistFeedback>(d)); });
}

struct Board : PriceFixture {
  static BoardGrid* Grid(CPriceViewAdv* view) { return view->GetBoardGrid(); }

  // A view in board mode, `width` wide.
  CPriceViewAdv* MakeBoard(int width = 900) {
    CPriceViewAdv* view = Make();
    view->OnCommand(CPriceViewAdv::kBoardModeButtonId);
    view->resize(width, 500);
    return view;
  }

  static QPoint At(BoardGrid* grid, int index, PBoardTypeEx::Area area) {
    int col = 0, row = 0;
    grid->TileCell(index, &col, &row);
    const PBoardTypeEx::Box b = PBoardTypeEx::AreaBox(grid->CellRect(col, row), area);
    return QPoint((b.l + b.r) / 2, (b.t + b.b) / 2);
  }
  static void Send(BoardGrid* grid, QEvent::Type type, QPoint pt, Qt::MouseButton button = Qt::LeftButton) {
    const Qt::MouseButtons buttons =
        type == QEvent::MouseButtonRelease || type == QEvent::MouseMove ? Qt::NoButton : Qt::MouseButtons(button);
    QMouseEvent e(type, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                  type == QEvent::MouseMove ? Qt::NoButton : button, buttons, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &e);
  }
  static void Click(BoardGrid* grid, int index, PBoardTypeEx::Area area) {
    const QPoint pt = At(grid, index, area);
    Send(grid, QEvent::MouseButtonPress, pt);
    Send(grid, QEvent::MouseButtonRelease, pt);
  }
  static void Hover(BoardGrid* grid, int index, PBoardTypeEx::Area area) {
    Send(grid, QEvent::MouseMove, At(grid, index, area));
  }

  static std::vector<std::wstring> TileCodes(BoardGrid* grid) {
    std::vector<std::wstring> out;
    for (const auto& k : grid->Rows()) out.push_back(k.InstrumentCode);
    return out;
  }
  // The dump's lines as cells; the first holds the headings.
  static std::vector<QStringList> BoardDump(BoardGrid* grid) {
    std::vector<QStringList> rows;
    for (const QString& line : grid->dumpTsv().split(QLatin1Char('\n'), Qt::SkipEmptyParts))
      rows.push_back(line.split('\t'));
    return rows;
  }
  static QString DumpCell(BoardGrid* grid, int index, const QString& heading) {
    const auto rows = BoardDump(grid);
    const int col = rows.at(0).indexOf(heading);
    EXPECT_GE(col, 0) << heading.toStdString();
    return rows.at(std::size_t(index) + 1).value(col);
  }

  // The link text of the last ticket, and how many opened.
  std::vector<std::wstring> Tickets() const {
    std::vector<std::wstring> out;
    for (const auto& f : host.RequestsOf(hm::LinkData))
      if (f.link && f.link->className == L"CTradeView") out.push_back(f.link->link);
    return out;
  }
  static std::string Field(const std::wstring& link, const std::string& key) {
    const auto text = addon::ReadLinkText(link);
    return text ? text->Get(key) : std::string();
  }
};

// ---- The quantity check ----------------------------------------------------------------------

TEST(QuantityCheck, ChecksRunInTheirOrderAndTheFirstFailureDecides) {
  GetUserSettings().ResetToDefaults();
  JInstrumentUnderlying ins = Instrument(7, "D05", "SGX");
  ins.lotSize = 100;
  ins.maxQty1 = 1000;
  ins.maxQty2 = 500;
  std::vector<std::pair<std::string, std::int64_t>> asked;
  const qtycheck::TextLookup lookup = [&asked](const std::string& code, std::int64_t pid) {
    asked.emplace_back(code, pid);
    return L"text of " + hv::Widen(code);
  };
  auto check = [&](int mode, std::int64_t q) { return qtycheck::Check(ins, mode, q, lookup); };

  // Lot 100: 150 is not a multiple, 50 is below the lot, 0 in mode 0 says nothing.
  auto v = check(qtycheck::kBuy, 150);
  EXPECT_FALSE(v.valid);
  EXPECT_EQ(v.text, L"Shares enter is invalid");
  EXPECT_TRUE(v.code.empty());
  v = check(qtycheck::kBuy, 50);
  EXPECT_EQ(v.code, "11014");
  EXPECT_EQ(v.text, L"text of 11014");
  ASSERT_EQ(asked.size(), 1u);
  EXPECT_EQ(asked[0], (std::pair<std::string, std::int64_t>{"11014", 7}));
  v = check(qtycheck::kAnyOrder, 0);
  EXPECT_FALSE(v.valid);
  EXPECT_TRUE(v.text.empty() && v.code.empty());
  EXPECT_EQ(check(qtycheck::kBuy, 0).code, "11007");
  EXPECT_EQ(check(qtycheck::kSell, 0).code, "11007");
  // The maximum of the mode ("11013"); a mode-0 order has none.
  EXPECT_EQ(check(qtycheck::kBuy, 1100).code, "11013");
  EXPECT_TRUE(check(qtycheck::kBuy, 500).valid);
  EXPECT_EQ(check(qtycheck::kSell, 600).code, "11013");
  EXPECT_TRUE(check(qtycheck::kAnyOrder, 1100).valid);
  // A maximum of 0 is no maximum.
  ins.maxQty1 = 0;
  EXPECT_TRUE(check(qtycheck::kBuy, 100000).valid);

  // The user's trading limit of the mode ("11015"), checked after the maximum.
  CTradingLimit limit;
  TradingLimitRule sgx;
  sgx.exchangeCode = "SGX";
  sgx.maxQuantity[qtycheck::kBuy] = 300;
  limit.rules.push_back(sgx);
  CTradeSetting trade;
  trade.SetTradingLimit(limit);
  GetUserSettings().SetTradeSetting(trade);
  EXPECT_EQ(check(qtycheck::kBuy, 400).code, "11015");
  EXPECT_TRUE(check(qtycheck::kBuy, 300).valid);
  EXPECT_TRUE(check(qtycheck::kSell, 400).valid);  // no limit for selling
  ins.maxQty1 = 350;
  EXPECT_EQ(check(qtycheck::kBuy, 400).code, "11013");

  // Earlier checks win: an unknown product and a lot below 1 fail silently.
  ins.productId = -1;
  EXPECT_TRUE(check(qtycheck::kBuy, 150).text.empty());
  EXPECT_FALSE(check(qtycheck::kBuy, 150).valid);
  ins.productId = 7;
  ins.lotSize = 0;
  v = check(qtycheck::kBuy, 5);
  EXPECT_FALSE(v.valid);
  EXPECT_TRUE(v.text.empty() && v.code.empty());
  // Without a lookup (the silent re-check) the code comes without a text.
  ins.lotSize = 100;
  v = qtycheck::Check(ins, qtycheck::kBuy, 50);
  EXPECT_EQ(v.code, "11014");
  EXPECT_TRUE(v.text.empty());
  GetUserSettings().ResetToDefaults();
}

TEST(QuantityCheck, TypedQuantities) {
  EXPECT_EQ(qtycheck::ParseQuantity(L"1,000"), 1000);
  EXPECT_EQ(qtycheck::ParseQuantity(L" 200 "), 200);
  EXPECT_EQ(qtycheck::ParseQuantity(L""), 0);
  EXPECT_EQ(qtycheck::ParseQuantity(L"12a"), std::nullopt);
  EXPECT_EQ(qtycheck::ParseQuantity(L"-5"), std::nullopt);
  EXPECT_EQ(qtycheck::ParseQuantity(L",5"), std::nullopt);
  EXPECT_EQ(qtycheck::ParseQuantity(L"99999999999999999999"), std::nullopt);
}

// ---- Layout ------------------------------------------------------------------------------------

TEST_F(Board, Layout_ColumnsFromTheWidthLessTheScrollBarAtLeastThreeRowsRoundedUp) {
  EXPECT_EQ(BoardGrid::ColumnsFor(700, 0), 3);
  EXPECT_EQ(BoardGrid::ColumnsFor(900, 0), 4);
  EXPECT_EQ(BoardGrid::ColumnsFor(900 + 17, 17), 4);
  EXPECT_EQ(BoardGrid::ColumnsFor(879 + 17, 17), 3);
  EXPECT_EQ(BoardGrid::ColumnsFor(200, 17), 3);
  EXPECT_EQ(BoardGrid::ColumnsFor(0, 0), 3);

  CPriceViewAdv* view = MakeBoard();
  BoardGrid* grid = Grid(view);
  const int extra = grid->VScrollBarWidth() + 2 * grid->frameWidth();
  view->resize(700 + extra, 500);
  EXPECT_EQ(grid->TileColumns(), 3);
  view->resize(900 + extra, 500);
  EXPECT_EQ(grid->TileColumns(), 4);
  for (int c = 0; c < grid->TileColumns(); ++c) EXPECT_EQ(grid->GetColWidth(c), BoardGrid::kTileWidth);
  EXPECT_EQ(grid->GetDefRowHeight(), BoardGrid::kTileHeight);
  EXPECT_EQ(grid->GetTH_Height(), 0);

  // Ten instruments in four columns make three rows; the last two cells hold none.
  std::vector<InstrumentKey> ten;
  for (const auto& i : instruments) ten.push_back(InstrumentKeyOf(i));
  ASSERT_EQ(ten.size(), 10u);
  grid->LoadItems(kUserWatchlists, L"Ten", ten);
  EXPECT_EQ(grid->TileRows(), 3);
  EXPECT_EQ(grid->TileIndex(1, 2), 9);
  EXPECT_EQ(grid->TileIndex(2, 2), -1);
  EXPECT_EQ(grid->TileKey(5), ten[5]);
  // Narrower: three columns, four rows, and the picked tile stays picked.
  Click(grid, 5, PBoardTypeEx::kBody);
  EXPECT_EQ(grid->SelectedKeys(), (std::vector<InstrumentKey>{ten[5]}));
  view->resize(700 + extra, 500);
  EXPECT_EQ(grid->TileColumns(), 3);
  EXPECT_EQ(grid->TileRows(), 4);
  EXPECT_EQ(grid->SelectedKeys(), (std::vector<InstrumentKey>{ten[5]}));
  EXPECT_EQ(grid->GetCurrentCol(), 2);
  EXPECT_EQ(grid->GetCurrentRow(), 1);
}

// ---- Board and list ------------------------------------------------------------------------------

TEST_F(Board, Switching_SameListSameInstrumentsSameSelectionAndTheStartParameter) {
  CPriceViewAdv* view = Make();
  PriceGrid* list = view->GetPriceGrid();
  BoardGrid* board = Grid(view);
  EXPECT_FALSE(view->Control(CPriceViewAdv::kBoardModeButtonId)->isHidden());
  list->SelectKeys({{1, L"O39"}});
  view->OnCommand(CPriceViewAdv::kBoardModeButtonId);
  EXPECT_EQ(view->GetDisplayMode(), CPriceViewAdv::kBoardMode);
  EXPECT_TRUE(list->isHidden());
  EXPECT_FALSE(board->isHidden());
  EXPECT_EQ(view->VisibleGrid(), board);
  EXPECT_EQ(TileCodes(board), Codes(list));
  EXPECT_EQ(board->SelectedKeys(), (std::vector<InstrumentKey>{{1, L"O39"}}));
  EXPECT_EQ(view->GetStartParams().at("User_field_display_mode"), L"Board");
  EXPECT_TRUE(view->Control(CPriceViewAdv::kBoardModeButtonId)->isHidden());
  EXPECT_FALSE(view->Control(CPriceViewAdv::kListModeButtonId)->isHidden());

  // Another tile picked on the board is the row selected in the list.
  Click(board, 2, PBoardTypeEx::kBody);
  view->OnCommand(CPriceViewAdv::kListModeButtonId);
  EXPECT_EQ(view->GetDisplayMode(), CPriceViewAdv::kListMode);
  EXPECT_TRUE(board->isHidden());
  EXPECT_EQ(list->SelectedKeys(), (std::vector<InstrumentKey>{{1, L"U11"}}));
  EXPECT_EQ(view->GetStartParams().at("User_field_display_mode"), L"List");

  // Another list while in board mode: both grids follow; a tab change shows tiles.
  view->OnCommand(CPriceViewAdv::kBoardModeButtonId);
  ASSERT_TRUE(view->ShowWatchlist(kUserWatchlists, L"Asia"));
  EXPECT_EQ(TileCodes(board), (std::vector<std::wstring>{L"0005"}));
  EXPECT_FALSE(board->isHidden());
  EXPECT_TRUE(list->isHidden());
  // A selection that is gone stays gone.
  EXPECT_TRUE(board->SelectedKeys().empty());

  // The start parameter of a restored layout.
  host.SendLink(view, L"{\"type\":\"start\",\"data\":[{\"User_field_display_mode\":\"List\"}]}");
  EXPECT_EQ(view->GetDisplayMode(), CPriceViewAdv::kListMode);
  host.SendLink(view, L"{\"type\":\"start\",\"data\":[{\"User_field_display_mode\":\"Board\"}]}");
  EXPECT_EQ(view->GetDisplayMode(), CPriceViewAdv::kBoardMode);
  EXPECT_EQ(TileCodes(board), (std::vector<std::wstring>{L"0005"}));
}

TEST_F(Board, EmptyList_ShowsTheFamilysTextAndAddingFromTheBoxMakesATile) {
  CPriceViewAdv* view = MakeBoard();
  BoardGrid* board = Grid(view);
  ASSERT_TRUE(view->ShowWatchlist(kUserWatchlists, L"Empty"));
  EXPECT_EQ(board->RowCount(), 0);
  EXPECT_EQ(board->EmptyText(), L"Add instruments above.");
  view->AddChosenInstrument(instruments[2]);
  EXPECT_EQ(TileCodes(board), (std::vector<std::wstring>{L"U11"}));
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"U11"}));
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Empty")->items, (std::vector<InstrumentKey>{{1, L"U11"}}));
  EXPECT_TRUE(board->EmptyText().empty());
  // The same instrument again is refused by the board as by the list.
  view->AddChosenInstrument(instruments[2]);
  EXPECT_EQ(Boxes(), (std::vector<QString>{"T12"}));
}

// ---- What the tiles report -------------------------------------------------------------------------

TEST_F(Board, TradingParts_CheckTheQuantityThenOpenATicketWithSidePriceAndQuantity) {
  instruments[0].lotSize = 100;        // D05
  instruments[1].accessStatus = 1;     // O39: view only
  instruments[1].altAccessStatus = 1;
  CPriceViewAdv* view = MakeBoard();
  BoardGrid* board = Grid(view);
  Push(view, instruments[0], "BID", "12.34");
  Push(view, instruments[0], "ASK", "12.36");
  ASSERT_EQ(TileCodes(board), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
  // One lot until the user types another quantity.
  EXPECT_EQ(board->QuantityText(0), L"100");
  EXPECT_EQ(board->OfferedQuantities(0),
            (QStringList{"100", "200", "300", "400", "500", "1000", "2000", "3000", "4000", "5000"}));

  host.ClearRequests();
  Click(board, 0, PBoardTypeEx::kAskBox);
  ASSERT_EQ(Tickets().size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::OpenView).back().link->className, L"CTradeView");
  EXPECT_EQ(Field(Tickets()[0], "Field_instrument_code"), "D05");
  EXPECT_EQ(Field(Tickets()[0], "Field_side"), "Buy");
  EXPECT_EQ(Field(Tickets()[0], "Field_Trade_price"), "12.36");
  EXPECT_EQ(Field(Tickets()[0], "Field_qty"), "100");
  EXPECT_EQ(board->SelectedKeys(), (std::vector<InstrumentKey>{{1, L"D05"}}));
  // A double click on the ask part opens no second ticket.
  const QPoint ask = At(board, 0, PBoardTypeEx::kAskBox);
  Send(board, QEvent::MouseButtonDblClick, ask);
  Send(board, QEvent::MouseButtonRelease, ask);
  EXPECT_EQ(Tickets().size(), 1u);

  board->SetQuantityText(0, L"200");
  Click(board, 0, PBoardTypeEx::kBidBox);
  ASSERT_EQ(Tickets().size(), 2u);
  EXPECT_EQ(Field(Tickets()[1], "Field_side"), "Sell");
  EXPECT_EQ(Field(Tickets()[1], "Field_Trade_price"), "12.34");
  EXPECT_EQ(Field(Tickets()[1], "Field_qty"), "200");

  // Refusals show their message instead of a ticket and mark the tile.
  host.AnswerText("11014, 1", L"Below one lot");
  board->SetQuantityText(0, L"150");
  EXPECT_TRUE(board->IsQuantityInvalid(0));
  Click(board, 0, PBoardTypeEx::kAskBox);
  board->SetQuantityText(0, L"50");
  Click(board, 0, PBoardTypeEx::kBidBox);
  board->SetQuantityText(0, L"");
  Click(board, 0, PBoardTypeEx::kAskBox);
  EXPECT_EQ(Tickets().size(), 2u);
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Shares enter is invalid", "Below one lot", "11007, 1"}));
  EXPECT_TRUE(board->IsQuantityInvalid(0));
  EXPECT_EQ(DumpCell(board, 0, "Quantity check"), "invalid");
  // A double click elsewhere on the tile: a ticket without a side, if the quantity passes.
  board->SetQuantityText(0, L"300");
  EXPECT_FALSE(board->IsQuantityInvalid(0));
  const QPoint body = At(board, 0, PBoardTypeEx::kBody);
  Send(board, QEvent::MouseButtonPress, body);
  Send(board, QEvent::MouseButtonRelease, body);
  Send(board, QEvent::MouseButtonDblClick, body);
  Send(board, QEvent::MouseButtonRelease, body);
  ASSERT_EQ(Tickets().size(), 3u);
  EXPECT_EQ(Field(Tickets()[2], "Field_side"), "");
  EXPECT_EQ(Field(Tickets()[2], "Field_qty"), "300");

  // An instrument the user may only view: the view's "17007" text, no ticket.
  host.AnswerText("17007, 0", L"Not from here");
  host.dialogs.shown.clear();
  Click(board, 1, PBoardTypeEx::kAskBox);
  EXPECT_EQ(Tickets().size(), 3u);
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Not from here"}));
}

TEST_F(Board, Shortcuts_TheSelectedTileWithItsCheckedQuantity) {
  instruments[2].lotSize = 100;  // U11
  CPriceViewAdv* view = MakeBoard();
  BoardGrid* board = Grid(view);
  Push(view, instruments[2], "ASK", "3.21");
  auto press = [&](int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    QKeyEvent e(QEvent::KeyPress, key, modifiers);
    QApplication::sendEvent(board->viewport(), &e);
  };
  host.ClearRequests();
  press(Qt::Key_F5);
  EXPECT_TRUE(Tickets().empty());  // no tile picked
  Click(board, 2, PBoardTypeEx::kBody);
  board->SetQuantityText(2, L"300");
  press(Qt::Key_F5);
  ASSERT_EQ(Tickets().size(), 1u);
  EXPECT_EQ(Field(Tickets()[0], "Field_instrument_code"), "U11");
  EXPECT_EQ(Field(Tickets()[0], "Field_side"), "buy");
  EXPECT_EQ(Field(Tickets()[0], "Field_qty"), "300");
  EXPECT_EQ(Field(Tickets()[0], "Field_Trade_price"), "3.21");
  EXPECT_EQ(host.RequestsOf(hm::ShortcutContext).size(), 1u);
  // A quantity that fails its check: its message, no ticket.
  board->SetQuantityText(2, L"250");
  press(Qt::Key_F9);
  EXPECT_EQ(Tickets().size(), 1u);
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Shares enter is invalid"}));
}

TEST_F(Board, Buttons_AnalyticsForTheTerminalsInstrumentsRemoveFromEditableListsTips) {
  host.language.Set(13, 412, L"Remove this one");
  CPriceViewAdv* view = MakeBoard();
  BoardGrid* board = Grid(view);
  DecodeSaves(host);

  // The company-information button opens the stock analytics on the instrument.
  host.ClearRequests();
  Click(board, 1, PBoardTypeEx::kSecondButton);
  ASSERT_EQ(host.RequestsOf(hm::OpenView).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::OpenView)[0].link->className, L"CStockAnalytics");
  EXPECT_EQ(Field(host.RequestsOf(hm::LinkData)[0].link->link, "Field_instrument_code"), "O39");
  EXPECT_EQ(Field(host.RequestsOf(hm::LinkData)[0].link->link, "Field_exchange_code"), "SGX");
  // ... but not for a record of the view's own store (a renamed instrument).
  JInstrumentUnderlying renamed = instruments[1];
  renamed.instrumentName = "O39 Renamed";
  InstrumentMgr().Put(renamed);
  board->RejoinInstruments();
  EXPECT_GE(board->TileParam(1), PBoardTypeEx::kWritableBase);
  EXPECT_EQ(DumpCell(board, 1, "Name"), "O39 Renamed");
  host.ClearRequests();
  Click(board, 1, PBoardTypeEx::kSecondButton);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());

  // Tips over the buttons, gone when the pointer leaves.
  Hover(board, 0, PBoardTypeEx::kTitleButton);
  EXPECT_EQ(board->ShownTip(), "Remove this one");
  Hover(board, 0, PBoardTypeEx::kBidBox);
  EXPECT_TRUE(board->ShownTip().isEmpty());
  Hover(board, 0, PBoardTypeEx::kSecondButton);
  EXPECT_EQ(board->ShownTip(), "T415");

  // The remove button: the tile goes, the rest close up, the list is saved.
  host.ClearRequests();
  Click(board, 0, PBoardTypeEx::kTitleButton);
  EXPECT_EQ(TileCodes(board), (std::vector<std::wstring>{L"O39", L"U11"}));
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Banks")->items, (std::vector<InstrumentKey>{{1, L"O39"}, {1, L"U11"}}));
  ASSERT_EQ(host.RequestsOf(hm::SaveUserWatchlist).size(), 1u);
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"O39", L"U11"}));
  EXPECT_EQ(Boxes().back(), "Instrument successfully removed from the list.");

  // A brand list saves through its own message.
  view->OnCommand(CPriceViewAdv::kKeldoButtonId);
  ASSERT_EQ(TileCodes(board), (std::vector<std::wstring>{L"[KELDO]C6L", L"D05"}));
  Click(board, 1, PBoardTypeEx::kTitleButton);
  EXPECT_EQ(KeldoWatchlistStore().FindPtr(L"Brand One")->items, (std::vector<InstrumentKey>{{1, L"[KELDO]C6L"}}));
  EXPECT_EQ(host.RequestsOf(hm::SaveKeldoWatchlist).size(), 1u);

  // The terminal's own lists have no remove button: a press there removes nothing.
  view->OnCommand(CPriceViewAdv::kTop30ButtonId);
  const auto before = TileCodes(board);
  ASSERT_FALSE(before.empty());
  Hover(board, 0, PBoardTypeEx::kTitleButton);
  EXPECT_TRUE(board->ShownTip().isEmpty());
  Click(board, 0, PBoardTypeEx::kTitleButton);
  EXPECT_EQ(TileCodes(board), before);
}

TEST_F(Board, Quantity_DropListAndInPlaceEditingKeepWhatWasTypedAcrossReloads) {
  instruments[2].lotSize = 100;  // U11
  CPriceViewAdv* view = MakeBoard();
  BoardGrid* board = Grid(view);
  PBoardTypeEx& tile = board->TileType();

  // The list button opens the offered quantities; a choice becomes the quantity.
  Click(board, 2, PBoardTypeEx::kQtyListButton);
  ASSERT_TRUE(tile.IsListOpen());
  ASSERT_EQ(tile.DropList()->count(), BoardGrid::kOfferedQuantities);
  tile.DropList()->Choose(4);
  EXPECT_EQ(board->QuantityText(2), L"500");
  EXPECT_FALSE(board->IsQuantityInvalid(2));

  // The quantity field edits in place: digits only.
  Click(board, 2, PBoardTypeEx::kQtyField);
  ASSERT_TRUE(board->IsEditing());
  QLineEdit* editor = board->Editor();
  EXPECT_EQ(editor->text(), "500");
  int pos = 0;
  QString typed = QStringLiteral("12x");
  EXPECT_EQ(editor->validator()->validate(typed, pos), QValidator::Invalid);
  editor->setText(QStringLiteral("250"));
  board->EndEdit(false);
  EXPECT_EQ(board->QuantityText(2), L"250");
  EXPECT_TRUE(board->IsQuantityInvalid(2));  // not a whole number of lots
  // Escape keeps the quantity.
  Click(board, 2, PBoardTypeEx::kQtyField);
  board->Editor()->setText(QStringLiteral("9"));
  board->EndEdit(true);
  EXPECT_EQ(board->QuantityText(2), L"250");

  // The list shown again (another view changed it): what was typed stays.
  host.Send(view, hm::WatchlistsLoaded, 0);
  ASSERT_EQ(TileCodes(board), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
  EXPECT_EQ(board->QuantityText(2), L"250");
  EXPECT_TRUE(board->IsQuantityInvalid(2));
}

TEST_F(Board, SettingsChanged_RechecksEveryTileSilently) {
  CPriceViewAdv* view = MakeBoard();
  BoardGrid* board = Grid(view);
  for (int i = 0; i < 3; ++i) EXPECT_FALSE(board->IsQuantityInvalid(i));
  CTradingLimit limit;
  TradingLimitRule o39;
  o39.exchangeCode = "SGX";
  o39.instrumentCode = "O39";
  o39.maxQuantity[0] = 0;  // no limit at all for O39 ...
  TradingLimitRule all;
  all.maxQuantity[0] = 1;  // ... but one share for everything else
  limit.rules = {o39, all};
  CTradeSetting trade;
  trade.SetTradingLimit(limit);
  GetUserSettings().SetTradeSetting(trade);
  board->SetQuantityText(0, L"2");
  board->SetQuantityText(1, L"2");
  // Typing checks at once; the others change only with the settings notice.
  EXPECT_TRUE(board->IsQuantityInvalid(0));
  EXPECT_TRUE(board->IsQuantityInvalid(1));
  host.Send(view, hm::SettingsChanged, 0);
  EXPECT_TRUE(board->IsQuantityInvalid(0));
  EXPECT_TRUE(board->IsQuantityInvalid(1));
  EXPECT_FALSE(board->IsQuantityInvalid(2));  // one share is within the limit
  EXPECT_TRUE(Boxes().empty());
  EXPECT_TRUE(host.RequestsOf(hm::MessageText).empty());
}

TEST_F(Board, MarketDelay_A601AnswerFillsTheDelayATileShows) {
  static const std::vector<JMarketInfo> hk{{1, "HKEX", 15, "Open", "09:30", "16:00", "HKEX"}};
  host.AnswerWith(hm::MarketInfo, [](const mvtest::Feedback& f) -> std::optional<LPARAM> {
    const auto* req = FromLParam<const JMarketInfoRequest>(f.data);
    if (req && req->exchangeCode == "HKEX") return ToLParam(&hk);
    return std::nullopt;
  });
  CPriceViewAdv* view = MakeBoard();
  BoardGrid* board = Grid(view);
  ASSERT_TRUE(view->ShowWatchlist(kUserWatchlists, L"Asia"));
  host.ClearRequests();
  EXPECT_EQ(DumpCell(board, 0, "Delay"), "15");
  EXPECT_EQ(MarketDelayCache::Instance().Lookup(1, L"HKEX"), L"15");
  // Asked once: the next look finds it.
  EXPECT_EQ(host.RequestsOf(hm::MarketInfo).size(), 1u);
  EXPECT_EQ(DumpCell(board, 0, "Delay"), "15");
  EXPECT_EQ(host.RequestsOf(hm::MarketInfo).size(), 1u);

  // Market information that reaches any view fills the same texts.
  const std::vector<JMarketInfo> changed{{1, "HKEX", 30, "Open", "09:30", "16:00", "HKEX"}};
  host.Send(view, hm::MarketInfo, ToLParam(&changed));
  EXPECT_EQ(DumpCell(board, 0, "Delay"), "30");
  const std::vector<JMarketInfo> none{{1, "HKEX", 0, "Open", "09:30", "16:00", "HKEX"}};
  host.Send(view, hm::MarketInfo, ToLParam(&none));
  EXPECT_EQ(DumpCell(board, 0, "Delay"), "");
}

TEST_F(Board, Dump_TheTilesInIndexOrderWithTheirQuotes) {
  CPriceViewAdv* view = MakeBoard(700 + 40);
  BoardGrid* board = Grid(view);
  Push(view, instruments[2], "LAST", "3.45");
  Push(view, instruments[2], "CHANGE", "0.05");
  Push(view, instruments[2], "PCHANGE", "1.47");
  Push(view, instruments[2], "VOL", "2500000");
  const auto rows = BoardDump(board);
  ASSERT_EQ(rows.size(), 4u);
  EXPECT_EQ(rows[0].mid(0, 5), (QStringList{"Row", "Column", "Name", "Code", "Exchange"}));
  const QStringList& u11 = rows[3];
  const QStringList& h = rows[0];
  EXPECT_EQ(u11.value(h.indexOf("Row")), "0");
  EXPECT_EQ(u11.value(h.indexOf("Column")), "2");
  EXPECT_EQ(u11.value(h.indexOf("Name")), "U11 Holdings");
  EXPECT_EQ(u11.value(h.indexOf("Last")), "3.45");
  EXPECT_EQ(u11.value(h.indexOf("Change")), "+0.05");
  EXPECT_EQ(u11.value(h.indexOf("% Change")), "+1.470%");
  EXPECT_EQ(u11.value(h.indexOf("Volume")), "2.50M");
  EXPECT_EQ(u11.value(h.indexOf("Quantity")), "1");
  // Quote updates grow the counter the view's timer watches.
  const std::uint64_t seen = board->UpdateCounter();
  Push(view, instruments[1], "LAST", "9.99");
  EXPECT_GT(board->UpdateCounter(), seen);
  const std::uint64_t again = board->UpdateCounter();
  EXPECT_EQ(board->UpdateCounter(), again);
}

}  // namespace
}  // namespace pricetest
