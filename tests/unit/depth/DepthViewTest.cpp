// The market-depth view through the scripted host: what it asks the terminal
// for, what it shows, and how it reacts to the user.
#include "DepthFixture.h"

#include <QLineEdit>

#include "controls/InstrumentComboBox.h"
#include "hostview/Buttons.h"
#include "hostview/Text.h"
#include "views/instrument/TimeAndSalesAdv.h"

namespace depthtest {
namespace {

using Fields = std::vector<std::string>;
const Fields kDepthFields{"ORDS_BVOL", "BVOL", "BUY", "SELL", "SVOL", "ORDS_SVOL"};

struct ExpectedRequest {
  UINT message;
  std::string field;
  int kind;
};

// The three batches of one subscription, in order.
std::vector<ExpectedRequest> BatchesFor() {
  std::vector<ExpectedRequest> out;
  for (const auto& f : kDepthFields) out.push_back({hm::WithdrawField, f, 0});
  out.push_back({hm::WithdrawField, "PMP_Submit", 0});
  for (const auto& f : kDepthFields) out.push_back({hm::RequestField, f, 0});
  out.push_back({hm::FetchFields, "ORDS_BVOL,BVOL,BUY,SELL,SVOL,ORDS_SVOL", 0});
  for (const auto& f : kDepthFields) out.push_back({hm::RequestField, f, 1});
  out.push_back({hm::RequestField, "PMP_Submit", 1});
  return out;
}

using DepthView = DepthFixture;

TEST_F(DepthView, Selection_RequestsLeaveOnTheNextTickInBatchOrder) {
  CMarketDepthAdv* view = Make();
  host.ClearRequests();
  Select(view, instruments[0]);
  EXPECT_TRUE(FieldRequests().empty());  // nothing at selection time
  // The title names the instrument.
  ASSERT_FALSE(host.RequestsOf(hm::Title).empty());
  EXPECT_EQ(host.RequestsOf(hm::Title).back().wtext, L"Market Depth - D05 Holdings");

  host.Advance(200);
  const auto sent = FieldRequests();
  const auto expected = BatchesFor();
  ASSERT_EQ(sent.size(), expected.size());
  for (std::size_t i = 0; i < sent.size(); ++i) {
    SCOPED_TRACE(i);
    EXPECT_EQ(sent[i].message, expected[i].message);
    EXPECT_EQ(sent[i].field->fieldName, expected[i].field);
    EXPECT_EQ(sent[i].field->kind, expected[i].kind);
    EXPECT_EQ(sent[i].field->param, 5);
    EXPECT_EQ(sent[i].field->productId, 1);
    EXPECT_EQ(sent[i].field->instrumentCode, "D05");
  }
  host.ClearRequests();
  host.Advance(1000);
  EXPECT_TRUE(FieldRequests().empty());  // asked once
}

TEST_F(DepthView, Selection_EmptyBookShowsTheHostTextUntilRowsArrive) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"No depth yet");
  host.Advance(200);
  PushLevels(view, instruments[0], 1, 2);
  host.Advance(200);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"");
  const auto rows = Dump(view);
  ASSERT_EQ(rows.size(), 3u);
  EXPECT_EQ(rows[0], (QStringList{"Buy Vol", "Buy", "Sell", "Sell Vol"}));
  EXPECT_EQ(rows[1], (QStringList{"100", "9.99", "10.02", "101"}));
  EXPECT_EQ(rows[2], (QStringList{"100", "9.98", "10.03", "101"}));
  // Asked once per view, then reused.
  Select(view, instruments[3]);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"No depth yet");
  EXPECT_EQ(host.RequestsOf(hm::TextByKey).size(), 1u);
}

TEST_F(DepthView, LevelCount_GrowsBySixteenWhileFilledAndStopsAt99) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  std::vector<int> asked;
  int filled = 0;
  for (int round = 0; round < 10; ++round) {
    host.ClearRequests();
    PushLevels(view, instruments[0], filled + 1, view->LevelCount());
    filled = view->LevelCount();
    host.Advance(200);  // sees the rows, grows the count
    host.Advance(200);  // sends the new subscription
    for (const auto& f : FieldRequests())
      if (f.message == hm::WithdrawField && f.field->fieldName == "PMP_Submit") asked.push_back(f.field->param);
  }
  EXPECT_EQ(asked, (std::vector<int>{21, 37, 53, 69, 85, 99}));
  EXPECT_EQ(view->LevelCount(), 99);
  EXPECT_EQ(view->GetDepthGrid()->GetNumberRows(), 99);
  // Every level's records exist: level 99 shows.
  EXPECT_EQ(Dump(view).back()[1], "9.01");
}

TEST_F(DepthView, LevelCount_StaysWhileTheBookIsShorterThanAsked) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  PushLevels(view, instruments[0], 1, 4);
  host.Advance(400);
  EXPECT_EQ(view->LevelCount(), 5);
  PushLevel(view, instruments[0], 5);
  host.Advance(200);
  EXPECT_EQ(view->LevelCount(), 21);
  // A new selection starts again at 5.
  Select(view, instruments[3]);
  EXPECT_EQ(view->LevelCount(), 5);
}

TEST_F(DepthView, Updates_OnlyKindOneAndLevelsOneTo99Land) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  Push(view, instruments[0], 1, "BUY", "9.5", /*kind*/ 0);
  Push(view, instruments[0], 0, "BUY", "9.5");
  Push(view, instruments[0], 100, "BUY", "9.5");
  Push(view, instruments[0], 1, "BUY", "9.5", /*kind*/ 2, hm::RequestField);
  host.Advance(200);
  EXPECT_EQ(view->GetDepthGrid()->GetNumberRows(), 0);

  Push(view, instruments[0], 1, "BUY", "9.5", 1, hm::RequestField);  // an answer counts like a push
  Push(view, instruments[0], 1, "SELL", "9.6");
  host.Advance(200);
  ASSERT_EQ(view->GetDepthGrid()->GetNumberRows(), 1);
  EXPECT_EQ(Dump(view)[1], (QStringList{"", "9.50", "9.60", ""}));
}

TEST_F(DepthView, TwoViewsOnOneInstrument_ApplyEachUpdateOnce) {
  CMarketDepthAdv* first = Make();
  CMarketDepthAdv* second = Make();
  Select(first, instruments[0]);
  Select(second, instruments[0]);
  host.Advance(200);
  EXPECT_EQ(FieldRequests().size(), BatchesFor().size());  // one shared subscription

  // The terminal hands every update to both views.
  auto both = [&](int level, const std::string& field, const std::string& value) {
    Push(first, instruments[0], level, field, value);
    Push(second, instruments[0], level, field, value);
  };
  both(1, "BUY", "9.5");
  both(1, "SELL", "9.6");
  both(1, "BVOL", "100");
  both(1, "BVOL", "200");  // applied twice, the second would see no change
  host.Advance(200);
  for (CMarketDepthAdv* view : {first, second}) {
    DepthGrid* grid = view->GetDepthGrid();
    ASSERT_EQ(grid->GetNumberRows(), 1);
    CGridCell cell;
    grid->GetCell(0, 0, cell);
    EXPECT_EQ(cell.text, "200");
    EXPECT_EQ(cell.backColor, StyleColor(3105)) << "the change is highlighted in both views";
  }

  // An update handed to the second view alone is not applied.
  Push(second, instruments[0], 2, "BUY", "9.4");
  Push(second, instruments[0], 2, "SELL", "9.7");
  host.Advance(200);
  EXPECT_EQ(second->GetDepthGrid()->GetNumberRows(), 1);

  // The current view asks for what the others show, so that a terminal that
  // answers only the asking view reaches the view that applies the values.
  host.ClearRequests();
  Select(second, instruments[3]);
  host.Advance(200);
  ASSERT_EQ(FieldRequests().size(), BatchesFor().size());
  for (const auto& f : FieldRequests()) EXPECT_EQ(f.view, first);
  Select(second, instruments[0]);

  // When the first view closes, the second takes over and asks again for
  // what it shows (the terminal forgets the subscriptions of a closed view).
  host.Destroy(first);
  host.ClearRequests();
  host.Advance(200);
  ASSERT_EQ(FieldRequests().size(), BatchesFor().size());
  EXPECT_EQ(FieldRequests()[0].view, second);
  EXPECT_EQ(FieldRequests()[0].field->instrumentCode, "D05");
  Push(second, instruments[0], 2, "BUY", "9.4");
  Push(second, instruments[0], 2, "SELL", "9.7");
  host.Advance(200);
  EXPECT_EQ(second->GetDepthGrid()->GetNumberRows(), 2);
}

TEST_F(DepthView, OtherInstrumentViewsOpenedFirst_DoNotSilenceTheDepthView) {
  host.Send(host.Adopt(new CTimeAndSalesAdv), hm::Activate);
  CMarketDepthAdv* view = Make();
  EXPECT_TRUE(view->IsCurrentRegistration());
  EXPECT_GT(view->RegistrationValue(), 1);
  Select(view, instruments[0]);
  host.Advance(200);
  EXPECT_EQ(FieldRequests().size(), BatchesFor().size());
  PushLevel(view, instruments[0], 1);
  host.Advance(200);
  EXPECT_EQ(view->GetDepthGrid()->GetNumberRows(), 1);
}

TEST_F(DepthView, Highlight_ClearedOnTheFirstTickAtLeast1500msAfterTheChange) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  PushLevel(view, instruments[0], 1, 100);
  host.Advance(100);  // between ticks
  Push(view, instruments[0], 1, "SVOL", "555");
  Push(view, instruments[0], 1, "SELL", "10.50");  // prices are never highlighted
  const std::uint32_t changedAt = host.clock.Now();
  DepthGrid* grid = view->GetDepthGrid();
  auto highlighted = [&](int col) {
    CGridCell cell;
    grid->GetCell(col, 0, cell);
    return cell.backColor == StyleColor(3105) && cell.textColor == StyleColor(3103);
  };
  EXPECT_TRUE(highlighted(3));
  EXPECT_FALSE(highlighted(2));
  EXPECT_FALSE(highlighted(0));  // first values are not changes

  bool cleared = false;
  for (int tick = 0; tick < 12 && !cleared; ++tick) {
    host.Advance(100);  // lands on a tick (ticks every 200 ms from activation)
    const std::uint32_t age = host.clock.Now() - changedAt;
    cleared = !highlighted(3);
    if (age < 1500) {
      EXPECT_FALSE(cleared) << "age " << age;
    } else {
      EXPECT_TRUE(cleared) << "age " << age;
    }
    host.Advance(100);
    if (!cleared) {
      EXPECT_TRUE(highlighted(3)) << "marks age on ticks only";
    }
  }
  EXPECT_TRUE(cleared);
  CGridCell cell;
  grid->GetCell(3, 0, cell);
  EXPECT_EQ(cell.text, "555");
  EXPECT_EQ(cell.backColor, grid->RowBackColor(0));
}

TEST_F(DepthView, ColumnMask_OrderCountsOnlyForSgxWithTheGeneralSetting) {
  CGeneralSetting general;
  general.SetEnableONDisplay(true);
  GetUserSettings().SetGeneralSetting(general);
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);  // SGX
  EXPECT_EQ(view->GetDepthGrid()->ColumnMask(), L"111111");
  EXPECT_EQ(Dump(view)[0].size(), 6);
  Select(view, instruments[3]);  // HKEX: whatever the setting says
  EXPECT_EQ(view->GetDepthGrid()->ColumnMask(), L"011110");
  EXPECT_EQ(Dump(view)[0].size(), 4);

  Select(view, instruments[0]);
  general.SetEnableONDisplay(false);
  GetUserSettings().SetGeneralSetting(general);
  EXPECT_EQ(view->GetDepthGrid()->ColumnMask(), L"111111");  // until told
  host.Send(view, hm::SettingsChanged);
  EXPECT_EQ(view->GetDepthGrid()->ColumnMask(), L"011110");
  EXPECT_EQ(Dump(view)[0], (QStringList{"Buy Vol", "Buy", "Sell", "Sell Vol"}));
}

TEST_F(DepthView, ColumnMask_SavedWithTheStartParametersAndRestored) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  view->GetDepthGrid()->ToggleColumn(DepthGrid::kUCSVol);  // the user shows sell orders
  EXPECT_EQ(view->GetStartParams().at("User_field_product_id"), L"011111");
  EXPECT_EQ(view->GetStartProductId(), 1);
  EXPECT_EQ(view->GetStartInstrumentCode(), "D05");

  CMarketDepthAdv* restored = Make();
  host.SendLink(restored, LinkFor(instruments[0], "0", "011111"));
  EXPECT_EQ(restored->GetDepthGrid()->ColumnMask(), L"011111");
  Select(restored, instruments[0]);  // a later selection chooses again
  EXPECT_EQ(restored->GetDepthGrid()->ColumnMask(), L"011110");
}

TEST_F(DepthView, AccessStatus_NotViewableNotTradeableAndBoth) {
  // The refusals are the view's own texts: a terminal text for the message
  // code 17007 does not replace them, and is not even asked for.
  host.AnswerText("17007, 0", L"not from here");
  CMarketDepthAdv* view = Make();

  // 2: refused with the system's text, no subscription.
  Select(view, instruments[1]);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"Counter is not Viewable.");
  EXPECT_EQ(view->GetDepthGrid()->ColumnMask(), L"011110");
  EXPECT_EQ(view->CurrentInstrument(), nullptr);
  host.Advance(400);
  EXPECT_TRUE(FieldRequests().empty());
  EXPECT_TRUE(host.RequestsOf(hm::MessageText).empty());

  // 1: data shown, every ticket refused.
  Select(view, instruments[2]);
  host.Advance(200);
  EXPECT_FALSE(FieldRequests().empty());
  PushLevel(view, instruments[2], 1);
  host.Advance(200);
  ASSERT_EQ(view->GetDepthGrid()->GetNumberRows(), 1);
  host.ClearRequests();
  ClickCell(view->GetDepthGrid(), 1, 0);
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, QString("Counter is not Tradeable."));
  EXPECT_EQ(host.dialogs.shown[0].caption, QString("Terminal"));
  EXPECT_EQ(host.dialogs.shown[0].icon, platform::Icon::Exclamation);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());
  EXPECT_TRUE(host.RequestsOf(hm::MessageText).empty());

  // 3: the ticket opens with side and price of the clicked cell.
  Select(view, instruments[0]);
  host.Advance(200);
  PushLevel(view, instruments[0], 1);
  host.Advance(200);
  host.ClearRequests();
  ClickCell(view->GetDepthGrid(), 2, 0);  // the sell price
  EXPECT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::OpenView, hm::LinkData}));
  const auto& link = *host.Requests()[0].link;
  EXPECT_EQ(link.className, L"CTradeView");
  EXPECT_EQ(link.flag, 1);
  const auto text = addon::ReadLinkText(link.link);
  ASSERT_TRUE(text);
  EXPECT_EQ(text->type, "price view");
  EXPECT_EQ(text->Get("Field_instrument_code"), "D05");
  EXPECT_EQ(text->Get("Field_product_id"), "1");
  EXPECT_EQ(text->Get("Field_side"), "Sell");
  EXPECT_EQ(text->Get("Field_Trade_price"), "10.02");
  EXPECT_EQ(host.Requests()[1].link->link, link.link);

  // A click on a volume opens nothing.
  host.ClearRequests();
  ClickCell(view->GetDepthGrid(), 0, 0);
  EXPECT_TRUE(host.Requests().empty());
}

TEST_F(DepthView, AccessStatus_AlternateWhenTheHostSaysSo) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[6]);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"Counter is not Viewable.");
  host.AnswerValue(hm::AltStatus, 1);
  Select(view, instruments[6]);
  EXPECT_EQ(view->AccessStatus(), 3);
  ASSERT_NE(view->CurrentInstrument(), nullptr);
  EXPECT_EQ(view->CurrentInstrument()->instrumentCode, "O39");
}

TEST_F(DepthView, Refusals_CfdAndDisabledExchangeWithCachedTexts) {
  host.AnswerText("14009, 2", L"CFDs are not available in this view.");
  host.AnswerText("17001, 1", L"Market depth is not available for this exchange.");
  CMarketDepthAdv* view = Make();
  Select(view, instruments[4]);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"CFDs are not available in this view.");

  host.AnswerValue(hm::ExchangeEnabled, 0);
  Select(view, instruments[3]);
  Select(view, instruments[3]);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"Market depth is not available for this exchange.");
  const auto asked = host.RequestsOf(hm::MessageText);
  ASSERT_EQ(asked.size(), 2u);  // "14009, 2" and "17001, 1", each once
  EXPECT_EQ(asked[1].text, "17001, 1");
  EXPECT_EQ(host.RequestsOf(hm::ExchangeEnabled).size(), 2u);  // a disabled exchange is asked again

  // Without a host text the key itself shows, and is asked again next time.
  host.ClearAnswers();
  host.AnswerValue(hm::ExchangeEnabled, 0);
  CMarketDepthAdv* other = Make();
  Select(other, instruments[3]);
  Select(other, instruments[3]);
  EXPECT_EQ(other->GetDepthGrid()->GetMessage(), L"17001, 1");
  EXPECT_EQ(host.RequestsOf(hm::MessageText).size(), 4u);

  // An enabled exchange is remembered: no second 604.
  host.AnswerValue(hm::ExchangeEnabled, 1);
  host.ClearRequests();
  Select(other, instruments[0]);
  Select(other, instruments[0]);
  EXPECT_EQ(host.RequestsOf(hm::ExchangeEnabled).size(), 1u);
}

TEST_F(DepthView, Shortcuts_OpenTicketsWith206FirstAndAreAlwaysConsumed) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  host.ClearRequests();
  PressKey(view->GetDepthGrid(), Qt::Key_F5);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::ShortcutContext, hm::OpenView, hm::LinkData}));
  EXPECT_EQ(host.Requests()[0].wtext, L"OPEN_TRADE_SHORTCUT");
  auto text = addon::ReadLinkText(host.Requests()[1].link->link);
  ASSERT_TRUE(text);
  EXPECT_EQ(text->Get("Field_side"), "buy");
  EXPECT_EQ(text->Get("Field_Fill_price"), "ASK");
  EXPECT_EQ(text->Get("Field_product_id"), "1");

  host.ClearRequests();
  PressKey(view->GetDepthGrid(), Qt::Key_Minus, Qt::KeypadModifier);
  ASSERT_EQ(host.Messages().size(), 3u);
  text = addon::ReadLinkText(host.Requests()[2].link->link);
  EXPECT_EQ(text->Get("Field_side"), "sell");
  EXPECT_EQ(text->Get("Field_Fill_price"), "BID");

  // With the shortcut setting off the keys are still taken, and do nothing.
  CKeyboardShortcutsSetting keys;
  keys.SetEnableKeyboardShortcuts(false);
  GetUserSettings().SetKeyboardShortcutsSetting(keys);
  host.ClearRequests();
  QKeyEvent f9(QEvent::KeyPress, Qt::Key_F9, Qt::NoModifier);
  f9.setAccepted(false);
  QApplication::sendEvent(view->GetDepthGrid(), &f9);
  EXPECT_TRUE(f9.isAccepted());
  EXPECT_TRUE(host.Requests().empty());
}

TEST_F(DepthView, Shortcuts_NotTradeableRefusedAndSearchBoxKeepsTypedMinus) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[2]);  // view only
  host.ClearRequests();
  PressKey(view->GetDepthGrid(), Qt::Key_F5);
  EXPECT_TRUE(host.Requests().empty());
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, QString("Counter is not Tradeable."));

  // Typing a code with "-" in the instrument search box is text, not a ticket.
  Select(view, instruments[0]);
  host.ClearRequests();
  QLineEdit* edit = view->Combo()->lineEdit();
  ASSERT_NE(edit, nullptr);
  PressKey(edit, Qt::Key_Minus);  // even when the box does not take it
  EXPECT_TRUE(host.Requests().empty());
  edit->setFocus();
  PressKey(edit, Qt::Key_Minus, Qt::NoModifier, "-");
  EXPECT_TRUE(host.Requests().empty());
  EXPECT_TRUE(edit->text().endsWith('-'));
  PressKey(edit, Qt::Key_F9);  // function keys still trade
  EXPECT_EQ(host.RequestsOf(hm::ShortcutContext).size(), 1u);
}

TEST_F(DepthView, DisplayMode_AskedOncePerProcessOnceAnswered) {
  host.AnswerValue(hm::DisplayMode, 101);
  CMarketDepthAdv* first = Make();
  CMarketDepthAdv* second = Make();
  host.Send(first, hm::Activate);
  host.Send(second, hm::Activate);
  EXPECT_EQ(host.RequestsOf(hm::DisplayMode).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::DisplayMode)[0].value, 1);
  EXPECT_FALSE(first->ExplorerButton()->isVisible());  // 101 hides the explorer button
  EXPECT_EQ(second->DisplayModeValue(), 101);
}

TEST_F(DepthView, DisplayMode_AskedAgainWhileTheAnswerIsNotAMode) {
  host.AnswerValue(hm::DisplayMode, 5);
  CMarketDepthAdv* first = Make();
  host.Send(first, hm::Activate);
  EXPECT_EQ(host.RequestsOf(hm::DisplayMode).size(), 2u);
  EXPECT_TRUE(first->ExplorerButton()->isVisible());
}

TEST_F(DepthView, SaveSpace_OnlyTheTextOneTurnsItOn) {
  CMarketDepthAdv* view = Make();
  host.ClearRequests();
  host.SendLink(view, LinkFor(instruments[0], "yes"));
  EXPECT_EQ(view->SaveSpace(), 0);
  EXPECT_TRUE(host.RequestsOf(hm::CompactLayout).empty());
  EXPECT_TRUE(view->Combo()->isVisible());

  host.SendLink(view, LinkFor(instruments[0], "1"));
  EXPECT_EQ(view->SaveSpace(), 1);
  ASSERT_EQ(host.RequestsOf(hm::CompactLayout).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::CompactLayout)[0].value, 1);
  EXPECT_FALSE(view->Combo()->isVisible());
  EXPECT_EQ(view->GetDepthGrid()->geometry().top(), 0);  // the grid takes the whole view
  EXPECT_EQ(view->GetStartParams().at("User_field_save_space"), L"1");

  host.Send(view, hm::CompactLayout, 0);  // the terminal turns it off
  EXPECT_TRUE(view->Combo()->isVisible());
  EXPECT_GT(view->GetDepthGrid()->geometry().top(), 0);
}

TEST_F(DepthView, StartParams_UnknownInstrumentClearsAndMalformedIsIgnored) {
  CMarketDepthAdv* view = Make();
  host.SendLink(view, LinkFor(instruments[0], "1"));
  ASSERT_EQ(view->GetStartInstrumentCode(), "D05");
  ASSERT_EQ(view->SaveSpace(), 1);
  host.ClearRequests();
  // A text that is not a link changes nothing and asks nothing.
  for (const wchar_t* bad : {L"{not json", L"", L"[1, 2]", L"{\"type\":\"start\",\"data\":[]}",
                             L"{\"type\":\"start\",\"data\":[\"D05\"]}"}) {
    host.SendLink(view, bad);
    EXPECT_EQ(view->GetStartProductId(), 1) << hv::Narrow(bad);
    EXPECT_EQ(view->GetStartInstrumentCode(), "D05") << hv::Narrow(bad);
    ASSERT_NE(view->CurrentInstrument(), nullptr);
    EXPECT_EQ(view->CurrentInstrument()->instrumentCode, "D05");
    EXPECT_EQ(view->SaveSpace(), 1) << hv::Narrow(bad);
  }
  EXPECT_TRUE(host.Requests().empty());

  // A link to an instrument the list does not have clears the saved instrument.
  JInstrumentUnderlying unknown = Instrument(9, "NOPE", "SGX");
  host.SendLink(view, LinkFor(unknown));
  EXPECT_EQ(view->GetStartProductId(), -1);
  EXPECT_EQ(view->GetStartInstrumentCode(), "");
}

TEST_F(DepthView, StartParams_UnknownInstrumentClearsTheShownBook) {
  CMarketDepthAdv* view = Make();
  const JInstrumentUnderlying& shown = instruments[0];
  Select(view, shown);
  for (int level : {0, 1, 2, 3}) {
    if (level > 0) PushLevel(view, shown, level);
    host.Advance(200);
  }
  ASSERT_EQ(view->GetDepthGrid()->GetNumberRows(), 3);

  host.SendLink(view, LinkFor(Instrument(9, "NOPE", "SGX")));
  EXPECT_EQ(view->CurrentInstrument(), nullptr);
  EXPECT_EQ(view->GetDepthGrid()->GetNumberRows(), 0);
  EXPECT_EQ(view->GetDepthGrid()->GetMessage(), L"");
  EXPECT_EQ(view->GetTitle(), L"Market Depth");  // no instrument named
  EXPECT_EQ(view->GetStartProductId(), -1);
  // The old book goes on updating in the store, but no longer shows here.
  PushLevel(view, shown, 4);
  host.Advance(400);
  EXPECT_EQ(view->GetDepthGrid()->GetNumberRows(), 0);
  EXPECT_EQ(Dump(view).size(), 1u);  // headings only
}

TEST_F(DepthView, Title_CashForDmaAndFollowsTheLanguage) {
  CMarketDepthAdv* view = Make();
  Select(view, instruments[5]);
  EXPECT_EQ(view->GetTitle(), L"Cash Market Depth - U11 Holdings");
  host.language.Set(13, 7, L"Tiefe");
  view->ApplyLanguage();
  EXPECT_EQ(host.RequestsOf(hm::Title).back().wtext, L"Cash Tiefe - U11 Holdings");
}

TEST_F(DepthView, LinkUpdate_FollowsOnlyInOrderNumberMode) {
  const JInstrumentUnderlying* answer = &instruments[3];
  host.AnswerWith(hm::FindByCode, [&](const mvtest::Feedback&) { return std::optional<LPARAM>(ToLParam(answer)); });
  CMarketDepthAdv* view = Make();
  Select(view, instruments[0]);
  addon::LinkTextBuilder link("price view");
  link.Add("Field_instrument_code", "0005").AddInt64("Field_product_id", 1);
  const std::wstring text = link.Wide();
  host.SendText(view, hm::LinkedInstrument, text);
  EXPECT_EQ(view->CurrentInstrument()->instrumentCode, "D05");  // flag off
  host.Send(view, hm::LinkModeFlag, 1);
  host.SendText(view, hm::LinkedInstrument, text);
  ASSERT_EQ(host.RequestsOf(hm::FindByCode).size(), 1u);
  EXPECT_EQ(view->CurrentInstrument()->instrumentCode, "0005");
  EXPECT_EQ(view->Combo()->GetChosenInstrument().instrumentCode, "0005");
}

TEST_F(DepthView, Drops_AcceptedFromPriceViewAndInstrumentViews) {
  CMarketDepthAdv* view = Make();
  EXPECT_TRUE(view->EnableDropIn("price view"));
  EXPECT_TRUE(view->EnableDropIn("CTimeAndSalesAdv"));
  EXPECT_FALSE(view->EnableDropIn("COrderStatusViewNew"));
  host.popview = true;
  EXPECT_TRUE(view->EnableDropIn("price view"));
  EXPECT_FALSE(view->EnableDropIn("CMarketDepthAdv"));

  const std::wstring text = LinkFor(instruments[3]);
  ViewLink drop;
  drop.className = L"price view";
  drop.link = &text;
  view->DoDragDrop(hm::LinkData, ToLParam(&drop));
  ASSERT_NE(view->CurrentInstrument(), nullptr);
  EXPECT_EQ(view->CurrentInstrument()->instrumentCode, "0005");
}

}  // namespace
}  // namespace depthtest

namespace depthtest {
namespace {

TEST_F(DepthFixture, ExplorerButton_AsksTheTerminalForTheInstrumentExplorer) {
  CMarketDepthAdv* view = Make();
  host.ClearRequests();
  view->ExplorerButton()->click();
  ASSERT_EQ(host.Messages(), (std::vector<UINT>{hm::OpenView}));
  EXPECT_EQ(host.Requests()[0].wtext, L"CInsExpViewEx");
  // The image follows the style id.
  EXPECT_FALSE(host.style.imageReads.empty());
  EXPECT_EQ(host.style.imageReads.back(), L".\\images\\Toolbar\\1\\InstrumentExplorer.bmp");
  view->ChangeStyle(2);
  EXPECT_EQ(host.style.imageReads.back(), L".\\images\\Toolbar\\2\\InstrumentExplorer.bmp");
}

}  // namespace
}  // namespace depthtest
