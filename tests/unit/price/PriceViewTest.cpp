// The price view through the scripted host: what it asks the terminal for,
// how it shows and edits watchlists, and how it reacts to the user.
#include <QDrag>
#include <QKeyEvent>
#include <QMimeData>
#include <QLineEdit>

#include "controls/InstrumentComboBox.h"

#include "PriceFixture.h"
#include "hostview/Buttons.h"
#include "hostview/CustomTabCtrl.h"
#include "hostview/DragData.h"
#include "views/price/TipDialogs.h"

namespace pricetest {
namespace {

using PriceView = PriceFixture;

const std::vector<std::string> kQuoteFields{"BID",  "ASK",  "BVOL",   "SVOL",       "LAST",       "CHANGE",
                                            "PCHANGE", "OPEN", "HIGH", "LOW",  "CLOSE", "VOL",
                                            "REMARKS", "CFD_STATUS", "DMA_STATUS", "MONTH", "YEAR", "TAC"};

std::vector<std::wstring> TabTexts(CCustomTabCtrl* tabs) {
  std::vector<std::wstring> out;
  for (int i = 0; i < tabs->GetItemCount(); ++i) out.push_back(tabs->GetItemText(i));
  return out;
}

WatchlistFeedback FeedbackOf(const mvtest::Feedback& f) { return std::any_cast<WatchlistFeedback>(f.extra); }

void DecodeSaves(mvtest::ScriptedHost& host) {
  for (UINT m : {hm::SaveWatchlistNames, hm::SaveUserWatchlist, hm::SaveKeldoWatchlist, hm::RenameWatchlist})
    host.AddDecoder(m, [](LPARAM d) { return std::any(*FromLParam<const WatchlistFeedback>(d)); });
}

// ---- Start and subscriptions --------------------------------------------------------------

TEST_F(PriceView, Activation_ShowsTheFirstUserWatchlistAndAsksRemarksAndMode) {
  CPriceViewAdv* view = Make();
  EXPECT_EQ(view->GetListKind(), kUserWatchlists);
  EXPECT_EQ(view->CurrentName(kUserWatchlists), L"Banks");
  EXPECT_EQ(TabTexts(view->Tabs(kUserWatchlists)), (std::vector<std::wstring>{L"Banks", L"Asia", L"Empty"}));
  EXPECT_EQ(view->Tabs(kUserWatchlists)->GetItemData(1), 12);
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
  ASSERT_EQ(host.RequestsOf(hm::ViewSizeRequest).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::ViewSizeRequest)[0].size->width, 300);
  EXPECT_EQ(host.RequestsOf(hm::RemarkMessages).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::SystemParameter).back().text, "MODSA");
  EXPECT_TRUE(view->IsActive());
  // The loaders log their start and end.
  int loaderLines = 0;
  for (const auto& line : host.logs.Texts())
    if (line.rfind("Info:CPriceViewAdv::LoadWatchlistTabs file:PriceViewAdv.cpp line:", 0) == 0) ++loaderLines;
  EXPECT_EQ(loaderLines, 2);
  // The brand button carries the "OLDWL" text; the families with lists are offered.
  EXPECT_EQ(static_cast<CHostButton*>(view->Control(CPriceViewAdv::kKeldoButtonId))->GetWindowText(), L"Brand Lists");
  EXPECT_FALSE(view->Control(CPriceViewAdv::kWorldButtonId)->isHidden());
  EXPECT_EQ(static_cast<CHostButton*>(view->Control(CPriceViewAdv::kUserButtonId))->GetWindowText(), L"Tirvane");
}

TEST_F(PriceView, DisplayMode101_WatchlistButtonAndNoBrandFamily) {
  CPriceViewAdv* view = Make();
  host.Send(view, hm::DisplayMode, 101);
  view->ApplyLanguage();
  auto* user = static_cast<CHostButton*>(view->Control(CPriceViewAdv::kUserButtonId));
  EXPECT_EQ(user->GetWindowText(), L"Watchlist");
  EXPECT_EQ(user->toolTip(), QString("Watchlist"));
  EXPECT_TRUE(view->Control(CPriceViewAdv::kKeldoButtonId)->isHidden());
}

TEST_F(PriceView, NewlyShownInstrument_ThreeBatchesInOrderOnTheNextSecond) {
  CPriceViewAdv* view = Make();
  host.ClearRequests();
  host.Advance(1000);
  const auto sent = FieldRequests();
  const std::size_t perInstrument = 18 + 1 + 18 + 1 + 18 + 1;
  ASSERT_EQ(sent.size(), 3 * perInstrument);
  std::vector<std::pair<UINT, std::string>> expected;
  for (const auto& f : kQuoteFields) expected.push_back({hm::WithdrawField, f});
  expected.push_back({hm::WithdrawField, "PMP_Submit"});
  for (const auto& f : kQuoteFields) expected.push_back({hm::RequestField, f});
  std::string joined;
  for (const auto& f : kQuoteFields) joined += (joined.empty() ? "" : ",") + f;
  expected.push_back({hm::FetchFields, joined});
  for (const auto& f : kQuoteFields) expected.push_back({hm::RequestField, f});
  expected.push_back({hm::RequestField, "PMP_Submit"});
  std::set<std::string> codes;
  for (std::size_t i = 0; i < sent.size(); ++i) {
    SCOPED_TRACE(i);
    EXPECT_EQ(sent[i].message, expected[i % perInstrument].first);
    EXPECT_EQ(sent[i].field->fieldName, expected[i % perInstrument].second);
    EXPECT_EQ(sent[i].field->kind, 0);
    EXPECT_EQ(sent[i].field->param, 0);
    codes.insert(sent[i].field->instrumentCode);
  }
  EXPECT_EQ(codes, (std::set<std::string>{"D05", "O39", "U11"}));
  // Asked once; a list shown later asks for its own instruments only.
  host.ClearRequests();
  host.Advance(1000);
  EXPECT_TRUE(FieldRequests().empty());
  view->ShowWatchlist(kUserWatchlists, L"Asia");
  host.Advance(1000);
  ASSERT_EQ(FieldRequests().size(), perInstrument);
  EXPECT_EQ(FieldRequests()[0].field->instrumentCode, "0005");
}

TEST_F(PriceView, SilentInstrument_AskedAgainEveryTenSecondsAtMostFiveTimes) {
  Make();
  host.Advance(1000);  // the first request
  std::map<std::string, int> asked;
  for (int second = 0; second < 90; ++second) {
    host.ClearRequests();
    host.Advance(1000);
    for (const auto& f : FieldRequests())
      if (f.message == hm::WithdrawField && f.field->fieldName == "PMP_Submit") ++asked[f.field->instrumentCode];
  }
  EXPECT_EQ(asked["D05"], 5);
  EXPECT_EQ(asked["O39"], 5);
}

TEST_F(PriceView, InstrumentThatAnswers_IsNotAskedAgain) {
  CPriceViewAdv* view = Make();
  host.Advance(1000);
  Push(view, instruments[0], "LAST", "10.5");
  int asked = 0;
  for (int second = 0; second < 30; ++second) {
    host.ClearRequests();
    host.Advance(1000);
    for (const auto& f : FieldRequests())
      if (f.message == hm::WithdrawField && f.field->fieldName == "PMP_Submit" && f.field->instrumentCode == "D05") ++asked;
  }
  EXPECT_EQ(asked, 0);
}

TEST_F(PriceView, QuoteUpdates_OnlyKindZeroAndOnlyByOneView) {
  CPriceViewAdv* first = Make();
  CPriceViewAdv* second = Make();
  PriceGrid* grid = first->GetPriceGrid();
  const int last = ColOf(grid, pricecol::Col::Last);
  Push(first, instruments[0], "LAST", "10.5", /*kind*/ 1);
  Push(second, instruments[0], "LAST", "11");  // the second view does not write
  host.Advance(200);
  EXPECT_EQ(grid->CellText(last, 0), "0.000");  // the store's default text
  Push(first, instruments[0], "LAST", "10.5");
  host.Advance(200);
  EXPECT_EQ(grid->CellText(last, 0), "10.50");
  EXPECT_EQ(second->GetPriceGrid()->CellText(last, 0), "10.50");  // both grids read the one store
  // The second view takes over the quotes while it is the active one.
  host.Send(first, hm::Deactivate);
  EXPECT_TRUE(second->IsQuoteApplier());
  EXPECT_FALSE(first->IsQuoteApplier());
  // With no price view active the leading one writes.
  host.Send(second, hm::Deactivate);
  EXPECT_TRUE(first->IsQuoteApplier());
  Push(first, instruments[0], "LAST", "10.75");
  host.Advance(200);
  EXPECT_EQ(grid->CellText(last, 0), "10.75");
}

TEST_F(PriceView, NewApplier_AsksAgainForWhatEveryPriceViewShows) {
  CPriceViewAdv* first = Make();
  CPriceViewAdv* second = Make();
  second->ShowWatchlist(kUserWatchlists, L"Asia");
  host.Advance(1000);
  // The applier (the first active view) asks for both views' instruments.
  std::set<std::pair<CSuperBaseView*, std::string>> asked;
  for (const auto& f : FieldRequests()) asked.insert({f.view, f.field->instrumentCode});
  EXPECT_TRUE(asked.count({first, "0005"}));
  EXPECT_FALSE(asked.count({second, "0005"}));
  host.ClearRequests();
  host.Send(first, hm::Deactivate);
  host.Advance(1000);
  asked.clear();
  for (const auto& f : FieldRequests()) asked.insert({f.view, f.field->instrumentCode});
  EXPECT_TRUE(asked.count({second, "0005"}));
  EXPECT_TRUE(asked.count({second, "D05"}));
}

// ---- Watchlist replies and tabs -------------------------------------------------------------

TEST_F(PriceView, TwoPriceViews_ApplyA610ReplyOnceAndBothReloadOn300) {
  CPriceViewAdv* first = Make();
  CPriceViewAdv* second = Make();
  EXPECT_TRUE(first->IsLeadingPriceView());
  EXPECT_FALSE(second->IsLeadingPriceView());
  host.ClearRequests();
  const std::vector<JWatchlistRow> rows{Row(21, "Fresh", 1, "D05"), Row(11, "Banks", 1, "O39")};
  host.Send(first, hm::WatchlistList, ToLParam(&rows));
  host.Send(second, hm::WatchlistList, ToLParam(&rows));
  // Applied by the leading view alone: one 300 with 0.
  const auto notices = host.RequestsOf(hm::WatchlistsLoaded);
  ASSERT_EQ(notices.size(), 1u);
  EXPECT_EQ(notices[0].view, first);
  EXPECT_EQ(notices[0].value, 0);
  // A reply only the second view sees changes nothing.
  const std::vector<JWatchlistRow> ignored{Row(31, "Ignored", 1, "D05")};
  host.Send(second, hm::WatchlistList, ToLParam(&ignored));
  EXPECT_EQ(UserWatchlistStore().IndexOf(L"Ignored"), -1);
  // The terminal relays 300 to both: both show the new tabs and list.
  host.Send(first, hm::WatchlistsLoaded, 0);
  host.Send(second, hm::WatchlistsLoaded, 0);
  for (CPriceViewAdv* v : {first, second}) {
    EXPECT_EQ(TabTexts(v->Tabs(kUserWatchlists)), (std::vector<std::wstring>{L"Fresh", L"Banks"}));
    EXPECT_EQ(Codes(v->GetPriceGrid()), (std::vector<std::wstring>{L"O39"}));  // "Banks" is still on screen
  }
}

TEST_F(PriceView, Notice300WhileInactive_ReloadsOnTheNextActivation) {
  CPriceViewAdv* view = Make();
  host.Send(view, hm::Deactivate);
  const std::vector<JWatchlistRow> rows{Row(11, "Banks", 1, "U11"), Row(41, "Later", 1, "D05")};
  host.Send(view, hm::WatchlistList, ToLParam(&rows));
  host.Send(view, hm::WatchlistsLoaded, 0);
  EXPECT_EQ(TabTexts(view->Tabs(kUserWatchlists)).size(), 3u);
  host.Send(view, hm::Activate);
  EXPECT_EQ(TabTexts(view->Tabs(kUserWatchlists)), (std::vector<std::wstring>{L"Banks", L"Later"}));
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"U11"}));
}

TEST_F(PriceView, AcknowledgedIds_GoToStoreAndTabsWithoutOverwriting) {
  CPriceViewAdv* view = Make();
  view->CreateWatchlist();
  const std::vector<JWatchlistIdRow> ids{{90, "NewWatchlist1"}, {91, "Banks"}};
  host.Send(view, hm::SaveWatchlistNames, ToLParam(&ids));
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"NewWatchlist1")->WatchlistID, 90);
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Banks")->WatchlistID, 11);
  EXPECT_EQ(view->Tabs(kUserWatchlists)->GetItemData(3), 90);
}

TEST_F(PriceView, Families_SwitchShowsEachFamilysListAndEmptyTexts) {
  CPriceViewAdv* view = Make();
  PriceGrid* grid = view->GetPriceGrid();
  view->OnCommand(CPriceViewAdv::kTop30ButtonId);
  EXPECT_EQ(view->GetListKind(), kTop30Watchlists);
  EXPECT_TRUE(static_cast<QAbstractButton*>(view->Control(CPriceViewAdv::kTop30ButtonId))->isDown());
  EXPECT_FALSE(static_cast<QAbstractButton*>(view->Control(CPriceViewAdv::kUserButtonId))->isDown());
  EXPECT_EQ(view->CurrentName(kTop30Watchlists), L"SGX - Top Gainers");
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"D05", L"O39"}));
  EXPECT_FALSE(view->Tabs(kTop30Watchlists)->isHidden());
  EXPECT_TRUE(view->Tabs(kUserWatchlists)->isHidden());
  // The menu of TOP30 lists: command 10000 + position.
  view->OnCommand(CPriceViewAdv::kCmdTop30First + 2);
  EXPECT_EQ(view->CurrentName(kTop30Watchlists), L"HKEX - TOPVOL");
  EXPECT_EQ(view->Tabs(kTop30Watchlists)->GetCurSel(), 2);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"0005"}));  // the unknown code is left out

  view->OnCommand(CPriceViewAdv::kWorldButtonId);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"HSI", L"DJI"}));
  EXPECT_EQ(grid->EmptyText(), L"");

  view->OnCommand(CPriceViewAdv::kKeldoButtonId);
  EXPECT_EQ(view->CurrentName(kKeldoWatchlists), L"Brand One");
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"[KELDO]C6L", L"D05"}));
  view->ShowWatchlist(kKeldoWatchlists, L"Brand Two");
  EXPECT_EQ(grid->EmptyText(), L"No brand items.");

  // Back to the user family: the list last shown there.
  view->ShowWatchlist(kUserWatchlists, L"Empty");
  view->OnCommand(CPriceViewAdv::kTop30ButtonId);
  view->OnCommand(CPriceViewAdv::kUserButtonId);
  EXPECT_EQ(view->CurrentName(kUserWatchlists), L"Empty");
  EXPECT_EQ(grid->EmptyText(), L"Add instruments above.");

  // An empty TOP30 list names itself in its text.
  std::vector<JTop30Group> groups{{"SGX", {{"TOPGAIN", {}}}}};
  host.Send(view, hm::WatchlistGroups521, ToLParam(&groups));
  host.Send(view, hm::WatchlistsLoaded, 1);
  view->OnCommand(CPriceViewAdv::kTop30ButtonId);
  EXPECT_EQ(grid->EmptyText(), L"SGX - Top Gainers is empty.");
}

TEST_F(PriceView, Top30Replies_RefreshTheListsOnlyWhenTheyMoved) {
  CPriceViewAdv* view = Make();
  host.ClearRequests();
  auto groups = Top30Groups();
  host.Send(view, hm::WatchlistGroups520, ToLParam(&groups));
  EXPECT_TRUE(host.RequestsOf(hm::WatchlistsLoaded).empty());
  std::swap(groups[0].lists[0].instruments[0], groups[0].lists[0].instruments[1]);
  host.Send(view, hm::WatchlistGroups520, ToLParam(&groups));
  ASSERT_EQ(host.RequestsOf(hm::WatchlistsLoaded).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::WatchlistsLoaded)[0].value, 1);
  // Every second the leading view asks for the lists again once the symbols are indexed.
  host.ClearRequests();
  host.Advance(1000);
  EXPECT_EQ(host.RequestsOf(hm::WatchlistGroups520).size(), 1u);
}

// ---- Editing ----------------------------------------------------------------------------------

TEST_F(PriceView, Create_FirstFreeNameAndNamesTextSaved) {
  userRows = {Row(1, "NewWatchlist1", 1, "D05"), Row(3, "NewWatchlist3", 1, "O39")};
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  host.ClearRequests();
  view->CreateWatchlist();
  EXPECT_EQ(TabTexts(view->Tabs(kUserWatchlists)),
            (std::vector<std::wstring>{L"NewWatchlist1", L"NewWatchlist3", L"NewWatchlist2"}));
  EXPECT_EQ(view->Tabs(kUserWatchlists)->GetCurSel(), 2);
  EXPECT_EQ(view->CurrentName(kUserWatchlists), L"NewWatchlist2");
  EXPECT_EQ(view->GetPriceGrid()->RowCount(), 0);
  const auto saves = host.RequestsOf(hm::SaveWatchlistNames);
  ASSERT_EQ(saves.size(), 1u);
  EXPECT_EQ(FeedbackOf(saves[0]).text,
            L"<watchlistmain><watchlistname WatchlistID=\"1\" WatchlistName=\"NewWatchlist1\" SeqID=\"0\" />"
            L"<watchlistname WatchlistID=\"3\" WatchlistName=\"NewWatchlist3\" SeqID=\"1\" />"
            L"<watchlistname WatchlistID=\"0\" WatchlistName=\"NewWatchlist2\" SeqID=\"2\" /></watchlistmain>");
}

TEST_F(PriceView, Create_RefusedAtTheWatchlistLimit) {
  CPriceViewAdv* view = Make();
  addon::SettingTextTable::Instance().Set("MAXWT", L"3");
  host.ClearRequests();
  view->CreateWatchlist();
  EXPECT_EQ(view->Tabs(kUserWatchlists)->GetItemCount(), 3);
  EXPECT_TRUE(host.RequestsOf(hm::SaveWatchlistNames).empty());
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, QString("Number of watchlist is limited to 3"));
  EXPECT_EQ(host.dialogs.shown[0].caption, QString("Terminal"));
  EXPECT_EQ(host.dialogs.shown[0].icon, platform::Icon::Exclamation);
  // A missing or broken limit is 50.
  addon::SettingTextTable::Instance().Set("MAXWT", L"-1");
  view->CreateWatchlist();
  EXPECT_EQ(view->Tabs(kUserWatchlists)->GetItemCount(), 4);
}

struct RenameCase {
  const wchar_t* typed;
  const wchar_t* message;  // nullptr: accepted
  const wchar_t* label;    // the tab afterwards
  bool saved;
};

TEST_F(PriceView, Rename_RefusalsRestoreTheLabel) {
  const RenameCase cases[] = {
      {L"  Asia ", L"Asia T409", L"Banks", false},  // another watchlist's name, blanks around it
      {L"   ", L"T408", L"Banks", false},           // blanks only
      {L" Banks ", nullptr, L"Banks", false},        // unchanged after trimming
      {L" Lenders ", nullptr, L"Lenders", true},
  };
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  CCustomTabCtrl* tabs = view->Tabs(kUserWatchlists);
  for (const RenameCase& c : cases) {
    SCOPED_TRACE(QString::fromWCharArray(c.typed).toStdString());
    host.ClearRequests();
    host.dialogs.shown.clear();
    ASSERT_TRUE(tabs->EditLabel(0));
    auto* editor = tabs->findChild<QLineEdit*>();
    ASSERT_NE(editor, nullptr);
    editor->setText(QString::fromWCharArray(c.typed));
    tabs->CommitEdit();
    EXPECT_EQ(tabs->GetItemText(0), c.label);
    if (c.message) {
      ASSERT_EQ(Boxes().size(), 1u);
      EXPECT_EQ(Boxes()[0], QString::fromWCharArray(c.message));
    } else {
      EXPECT_TRUE(Boxes().empty());
    }
    EXPECT_EQ(host.RequestsOf(hm::SaveWatchlistNames).size(), c.saved ? 1u : 0u);
  }
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Lenders")->WatchlistID, 11);
  EXPECT_EQ(view->CurrentName(kUserWatchlists), L"Lenders");
  EXPECT_EQ(Codes(view->GetPriceGrid()).size(), 3u);
}

TEST_F(PriceView, RenameBrandList_Sends617WithIdAndName) {
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  view->OnCommand(CPriceViewAdv::kKeldoButtonId);
  CCustomTabCtrl* tabs = view->Tabs(kKeldoWatchlists);
  view->ShowTabMenu(kKeldoWatchlists, 1, QPoint());  // no answer: nothing chosen
  host.dialogs.menuAnswers = {CPriceViewAdv::kCmdRenameKeldo};
  view->ShowTabMenu(kKeldoWatchlists, 1, QPoint());
  auto* editor = tabs->findChild<QLineEdit*>();
  ASSERT_NE(editor, nullptr);
  editor->setText("Brand 2");
  tabs->CommitEdit();
  const auto renames = host.RequestsOf(hm::RenameWatchlist);
  ASSERT_EQ(renames.size(), 1u);
  EXPECT_EQ(FeedbackOf(renames[0]).WatchlistID, 502);
  EXPECT_EQ(FeedbackOf(renames[0]).text, L"Brand 2");
  EXPECT_NE(KeldoWatchlistStore().FindPtr(L"Brand 2"), nullptr);
}

TEST_F(PriceView, Delete_FromTheStripAsksAndTheLastOneIsRefusedWithoutAQuestion) {
  CPriceViewAdv* view = Make();
  CCustomTabCtrl* tabs = view->Tabs(kUserWatchlists);
  // No: kept.
  host.dialogs.boxAnswers = {platform::IdNo};
  EXPECT_FALSE(view->DeleteFromTabStrip(0));
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, QString("T407"));
  EXPECT_EQ(host.dialogs.shown[0].buttons, platform::Buttons::YesNo);
  EXPECT_EQ(UserWatchlistStore().Records().size(), 3u);
  // Yes: removed, names saved, the strip shows the next list.
  host.ClearRequests();
  ASSERT_TRUE(tabs->GetCloseButtonRect().isValid());
  QMouseEvent press(QEvent::MouseButtonPress, QPointF(tabs->GetCloseButtonRect().center()),
                    QPointF(tabs->mapToGlobal(tabs->GetCloseButtonRect().center())), Qt::LeftButton, Qt::LeftButton,
                    Qt::NoModifier);
  QApplication::sendEvent(tabs, &press);
  QMouseEvent release(QEvent::MouseButtonRelease, QPointF(tabs->GetCloseButtonRect().center()),
                      QPointF(tabs->mapToGlobal(tabs->GetCloseButtonRect().center())), Qt::LeftButton, Qt::NoButton,
                      Qt::NoModifier);
  QApplication::sendEvent(tabs, &release);
  EXPECT_EQ(TabTexts(tabs), (std::vector<std::wstring>{L"Asia", L"Empty"}));
  EXPECT_EQ(UserWatchlistStore().IndexOf(L"Banks"), -1);
  EXPECT_EQ(host.RequestsOf(hm::SaveWatchlistNames).size(), 1u);
  EXPECT_EQ(view->CurrentName(kUserWatchlists), L"Asia");
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"0005"}));
  // The menu path asks nothing.
  host.dialogs.shown.clear();
  view->DeleteFromMenu(0);
  EXPECT_TRUE(host.dialogs.shown.empty());
  EXPECT_EQ(TabTexts(tabs), (std::vector<std::wstring>{L"Empty"}));
  EXPECT_EQ(view->CurrentName(kUserWatchlists), L"Empty");
  // The only one left: refused, no question.
  EXPECT_FALSE(view->DeleteFromTabStrip(0));
  EXPECT_TRUE(host.dialogs.shown.empty());
  EXPECT_EQ(UserWatchlistStore().Records().size(), 1u);
}

TEST_F(PriceView, Reorder_TabsDraggedSaveTheNewOrder) {
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  host.ClearRequests();
  CCustomTabCtrl* tabs = view->Tabs(kUserWatchlists);
  tabs->MoveItem(2, 0);
  view->ReorderUserWatchlists();
  EXPECT_EQ(UserWatchlistStore().Records()[0].name, L"Empty");
  ASSERT_EQ(host.RequestsOf(hm::SaveWatchlistNames).size(), 1u);
  EXPECT_NE(FeedbackOf(host.RequestsOf(hm::SaveWatchlistNames)[0]).text.find(L"WatchlistName=\"Empty\" SeqID=\"0\""),
            std::wstring::npos);
}

TEST_F(PriceView, AddFromInstrumentBox_ChecksInOrderThenSaves) {
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  view->ShowWatchlist(kUserWatchlists, L"Asia");
  host.ClearRequests();

  view->AddChosenInstrument(instruments[3]);  // not viewable
  view->AddChosenInstrument(instruments[0]);
  view->AddChosenInstrument(instruments[4]);  // already there
  JInstrumentUnderlying none;
  none.productId = -1;
  view->AddChosenInstrument(none);            // nothing chosen: nothing
  view->AddChosenInstrument(Instrument(1, "NOTLISTED", "SGX"));
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Counter is not Viewable.", "T12"}));
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"0005", L"D05"}));
  const auto saves = host.RequestsOf(hm::SaveUserWatchlist);
  ASSERT_EQ(saves.size(), 1u);
  EXPECT_EQ(FeedbackOf(saves[0]).WatchlistID, 12);
  EXPECT_EQ(FeedbackOf(saves[0]).text,
            L"<watchlistnames><watchlistname ProductID=\"1\" InstrumentCode=\"0005\" SeqID=\"1\" />"
            L"<watchlistname ProductID=\"1\" InstrumentCode=\"D05\" SeqID=\"2\" /></watchlistnames>");
  EXPECT_EQ(host.RequestsOf(hm::AltStatus).size(), 3u);  // asked for each viewability check

  // The alternate status applies when the terminal answers 1 or 2.
  instruments[2].altAccessStatus = 0;
  host.AnswerValue(hm::AltStatus, 2);
  host.dialogs.shown.clear();
  view->AddChosenInstrument(instruments[2]);
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Counter is not Viewable."}));

  // The item limit comes first.
  addon::SettingTextTable::Instance().Set("MAXWL", L"2");
  host.dialogs.shown.clear();
  view->AddChosenInstrument(instruments[1]);
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Number of priceview items is limited to 2"}));
}

TEST_F(PriceView, AddToBrandList_ExchangeRuleThenLimitThen618) {
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  view->OnCommand(CPriceViewAdv::kKeldoButtonId);
  host.ClearRequests();
  view->AddChosenInstrument(instruments[5]);  // TSE: refused by "WLNOT"
  view->AddChosenInstrument(instruments[3]);  // brand lists check no viewability
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Not for brand lists."}));
  const auto saves = host.RequestsOf(hm::SaveKeldoWatchlist);
  ASSERT_EQ(saves.size(), 1u);
  EXPECT_EQ(FeedbackOf(saves[0]).WatchlistID, 501);
  EXPECT_NE(FeedbackOf(saves[0]).text.find(L"InstrumentCode=\"C6L\""), std::wstring::npos);
  EXPECT_NE(FeedbackOf(saves[0]).text.find(L"InstrumentCode=\"Z74\" Symbol=\"Z74\" Market=\"Singapore\""),
            std::wstring::npos);
  // TOP30 lists and world indices take nothing.
  view->OnCommand(CPriceViewAdv::kTop30ButtonId);
  host.ClearRequests();
  view->AddChosenInstrument(instruments[2]);
  EXPECT_TRUE(host.RequestsOf(hm::SaveUserWatchlist).empty());
  EXPECT_EQ(Codes(view->GetPriceGrid()).size(), 2u);
}

TEST_F(PriceView, MessagesFromOtherViews_AddNewFirstRemoveAndMove) {
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  const auto& msg = addon::Msg();
  // Add to "Asia" (position 1): new ones first in message order, no limit check.
  addon::SettingTextTable::Instance().Set("MAXWL", L"1");
  const std::vector<InstrumentKey> add{{1, L"U11"}, {1, L"0005"}, {1, L"D05"}};
  platform::SendMessage(view, msg.wlAddInsList, ToLParam(&add), 1);
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Asia")->items,
            (std::vector<InstrumentKey>{{1, L"U11"}, {1, L"D05"}, {1, L"0005"}}));
  EXPECT_EQ(Boxes(), (std::vector<QString>{"T12"}));
  EXPECT_EQ(FeedbackOf(host.RequestsOf(hm::SaveUserWatchlist).back()).WatchlistID, 12);

  // Remove from the list on screen: saved, told, reloaded.
  host.dialogs.shown.clear();
  const std::vector<InstrumentKey> remove{{1, L"O39"}};
  platform::SendMessage(view, msg.wlRemoveInsList, ToLParam(&remove), 0);
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"D05", L"U11"}));
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Instrument successfully removed from the list."}));

  // The brand add message is accepted and does nothing; the brand remove works.
  const std::size_t before = host.Requests().size();
  platform::SendMessage(view, msg.keldoWlAddInsList, ToLParam(&add), 0);
  EXPECT_EQ(host.Requests().size(), before);
  const std::vector<InstrumentKey> brand{{1, L"D05"}};
  platform::SendMessage(view, msg.keldoWlRemoveInsList, ToLParam(&brand), 0);
  EXPECT_EQ(KeldoWatchlistStore().FindPtr(L"Brand One")->items, (std::vector<InstrumentKey>{{1, L"[KELDO]C6L"}}));
  EXPECT_EQ(host.RequestsOf(hm::SaveKeldoWatchlist).size(), 1u);

  // Out-of-range positions and null lists are ignored.
  platform::SendMessage(view, msg.wlAddInsList, ToLParam(&add), 9);
  platform::SendMessage(view, msg.wlAddInsList, 0, 0);
  platform::SendMessage(view, msg.wlRemoveInsList, ToLParam(&remove), -1);

  // Rows moved in the grid: the grid's order is saved.
  host.ClearRequests();
  EXPECT_EQ(platform::SendMessage(view, msg.wlMoveIns, 0, 0), 0);
  ASSERT_EQ(host.RequestsOf(hm::SaveUserWatchlist).size(), 1u);
  EXPECT_EQ(FeedbackOf(host.RequestsOf(hm::SaveUserWatchlist)[0]).WatchlistID, 11);
}

// ---- Other views and the host ----------------------------------------------------------------

TEST_F(PriceView, OpeningMessages_Send200Then310WithTheClassAndLink) {
  CPriceViewAdv* view = Make();
  const auto& msg = addon::Msg();
  const std::wstring link = L"{\"type\":\"price view\",\"data\":[{\"Field_instrument_code\":\"D05\"}]}";
  const std::pair<UINT, const wchar_t*> cases[] = {
      {msg.wlOpenDepth, L"CMarketDepthAdv"},      {msg.wlOpenSales, L"CTimeAndSalesAdv"},
      {msg.wlOpenSummary, L"CTradeSummaryAdv"},   {msg.wlOpenPriceAlert, L"CNewPriceAlertAdv"},
      {msg.wlOpenChart, L"CBranticChartView"},    {msg.wlOpenStockAnalytics, L"CStockAnalytics"},
      {msg.relatedNews, L"CFNews"},               {msg.wlOpenTrade, L"CTradeView"},
  };
  for (const auto& [message, className] : cases) {
    SCOPED_TRACE(QString::fromWCharArray(className).toStdString());
    host.ClearRequests();
    platform::SendMessage(view, message, ToLParam(&link), 0);
    ASSERT_EQ(host.Messages(), (std::vector<UINT>{hm::OpenView, hm::LinkData}));
    EXPECT_EQ(host.Requests()[0].link->className, className);
    EXPECT_EQ(host.Requests()[1].link->link, link);
  }
  // 99: from a shortcut, 206 first.
  host.ClearRequests();
  platform::SendMessage(view, msg.wlOpenTrade, ToLParam(&link), 99);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::ShortcutContext, hm::OpenView, hm::LinkData}));
  EXPECT_EQ(host.Requests()[0].wtext, L"OPEN_TRADE_SHORTCUT");
  // -1: the "17007" text and nothing opens.
  host.AnswerText("17007, 0", L"Not from here");
  host.ClearRequests();
  platform::SendMessage(view, msg.wlOpenTrade, ToLParam(&link), -1);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Not from here"}));
  // The trade link refresh sends 615 only; the column message is answered with 0.
  host.ClearRequests();
  platform::SendMessage(view, msg.refreshTradeLink, ToLParam(&link), 0);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::LinkedInstrument}));
  EXPECT_EQ(platform::SendMessage(view, msg.pvColumnUpdate, 7, 7), 0);
  // The explorer button.
  host.ClearRequests();
  view->OnCommand(CPriceViewAdv::kExplorerButtonId);
  ASSERT_EQ(host.Messages(), (std::vector<UINT>{hm::OpenView}));
  EXPECT_EQ(host.Requests()[0].wtext, L"CInsExpViewEx");
}

TEST_F(PriceView, Drops_AcceptedOnlyByUserAndBrandFamiliesFromOtherSources) {
  CPriceViewAdv* view = Make();
  EXPECT_TRUE(view->EnableDropIn());
  EXPECT_TRUE(view->EnableDropIn("CTradeView"));
  for (const char* refused : {"COrderStatusViewNew", "COpenPositionView", "CMarketDepthAdv", "CTimeAndSalesAdv",
                              "CTradeSummaryAdv", "price view"})
    EXPECT_FALSE(view->EnableDropIn(refused)) << refused;
  // A drop of two instruments adds both with the instrument box's checks.
  view->ShowWatchlist(kUserWatchlists, L"Empty");
  const std::wstring link =
      L"{\"type\":\"instrument view multiple\",\"data\":[{\"Field_instrument_code\":\"D05\",\"Field_product_id\":\"1\"},"
      L"{\"Field_instrument_code\":\"Z74\",\"Field_product_id\":\"1\"},"
      L"{\"Field_instrument_code\":\"0005\",\"Field_product_id\":\"1\"}]}";
  ViewLink drop;
  drop.className = L"COrderStatusView";
  drop.link = &link;
  view->DoDragDrop(hm::LinkData, ToLParam(&drop));
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"D05", L"0005"}));
  EXPECT_EQ(Boxes(), (std::vector<QString>{"Counter is not Viewable."}));
  // From a depth view: refused whatever it carries.
  drop.className = L"CMarketDepthAdv";
  view->ShowWatchlist(kUserWatchlists, L"Asia");
  view->DoDragDrop(hm::LinkData, ToLParam(&drop));
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"0005"}));
  // The TOP30 and world-index families take no drops.
  view->OnCommand(CPriceViewAdv::kTop30ButtonId);
  EXPECT_FALSE(view->EnableDropIn());
  EXPECT_FALSE(view->EnableDropIn("CTradeView"));
  view->OnCommand(CPriceViewAdv::kWorldButtonId);
  EXPECT_FALSE(view->EnableDropIn("CTradeView"));
  view->OnCommand(CPriceViewAdv::kKeldoButtonId);
  EXPECT_TRUE(view->EnableDropIn("CTradeView"));
}

// Drags rows of the price grid from `fromRow` far down, as a hand would; the
// runner stands in for the drag and may drop it back on the grid at the top.
struct GridDrag {
  PriceGrid* grid;
  bool dropBack = false;
  bool taken = false;
  std::function<void()> meanwhile;  // runs while the drag is on
  std::vector<std::string> links, sources;
  explicit GridDrag(PriceGrid* g) : grid(g) {
    CGridCtrl::SetDragRunner([this](QDrag& d) {
      links.push_back(d.mimeData()->data(hv::drag::kLinkMimeType).toStdString());
      sources.push_back(d.mimeData()->data(hv::drag::kSourceMimeType).toStdString());
      if (meanwhile) meanwhile();
      if (!dropBack) return Qt::IgnoreAction;
      taken = grid->HandleDrop(d.mimeData(), QPoint(grid->CellRect(0, 0).center().x(), grid->CellRect(0, 0).top() + 2));
      return taken ? Qt::MoveAction : Qt::IgnoreAction;
    });
  }
  ~GridDrag() { CGridCtrl::SetDragRunner(nullptr); }
  void From(int row) {
    const int col = grid->ColumnOf(pricecol::Col::Symbol);
    const QPoint from = grid->CellRect(col, row).center();
    auto send = [&](QEvent::Type type, QPoint at, Qt::MouseButton button, Qt::MouseButtons buttons) {
      const QPointF p(at);
      QMouseEvent e(type, p, grid->viewport()->mapToGlobal(p), button, buttons, Qt::NoModifier);
      QApplication::sendEvent(grid->viewport(), &e);
    };
    send(QEvent::MouseButtonPress, from, Qt::LeftButton, Qt::LeftButton);
    for (int dy = 4; dy <= 40; dy += 4) send(QEvent::MouseMove, from + QPoint(0, dy), Qt::NoButton, Qt::LeftButton);
    send(QEvent::MouseButtonRelease, from + QPoint(0, 40), Qt::LeftButton, Qt::NoButton);
  }
};

TEST_F(PriceView, DragOut_SelectedRowsTravelAsPriceViewLinksAndMoveOnlyInsideTheirWatchlist) {
  CPriceViewAdv* view = Make();
  DecodeSaves(host);
  PriceGrid* grid = view->GetPriceGrid();
  GridDrag drag(grid);
  // Banks: D05, O39, U11. The two selected rows go, in order, named "price view".
  grid->SelectRow(1);
  grid->SelectRow(2, true);
  host.ClearRequests();
  drag.From(2);
  ASSERT_EQ(drag.links.size(), 1u);
  EXPECT_EQ(drag.links[0],
            "{\"type\":\"price view\",\"data\":[{\"Field_product_id\":\"1\",\"Field_instrument_code\":\"O39\","
            "\"Field_exchange_code\":\"SGX\"},{\"Field_product_id\":\"1\",\"Field_instrument_code\":\"U11\","
            "\"Field_exchange_code\":\"SGX\"}]}");
  EXPECT_EQ(drag.sources[0], "price view");
  EXPECT_TRUE(host.Requests().empty()) << "dragging alone changes nothing";
  // Dropped on a price view (this one or another): refused, nothing added or saved.
  EXPECT_FALSE(view->EnableDropIn(drag.sources[0].c_str()));
  const std::wstring link = hv::Widen(drag.links[0]);
  ViewLink drop;
  drop.className = hv::Widen(drag.sources[0]);
  drop.link = &link;
  view->ShowWatchlist(kUserWatchlists, L"Empty");
  host.ClearRequests();
  view->DoDragDrop(hm::LinkData, ToLParam(&drop));
  EXPECT_TRUE(Codes(grid).empty());
  EXPECT_TRUE(host.Requests().empty());
  EXPECT_TRUE(Boxes().empty());

  // Dropped back on its own grid: the rows move to the top and the order is saved (612).
  view->ShowWatchlist(kUserWatchlists, L"Banks");
  grid->SelectRow(1);
  grid->SelectRow(2, true);
  drag.dropBack = true;
  host.ClearRequests();
  drag.From(1);
  EXPECT_TRUE(drag.taken);
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"O39", L"U11", L"D05"}));
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Banks")->items,
            (std::vector<InstrumentKey>{{1, L"O39"}, {1, L"U11"}, {1, L"D05"}}));
  ASSERT_EQ(host.RequestsOf(hm::SaveUserWatchlist).size(), 1u);
  const WatchlistFeedback saved = FeedbackOf(host.RequestsOf(hm::SaveUserWatchlist)[0]);
  EXPECT_EQ(saved.WatchlistID, 11);
  EXPECT_LT(saved.text.find(L"\"O39\""), saved.text.find(L"\"D05\""));

  // Sorted while the drag is on: the dragged instruments move, wherever the sort put them.
  grid->ClearSelection();
  grid->SelectRow(2);  // D05
  drag.meanwhile = [&] {
    grid->SortOnColumn(grid->ColumnOf(pricecol::Col::Symbol));  // D05, O39, U11
  };
  drag.From(2);
  drag.meanwhile = nullptr;
  EXPECT_EQ(Codes(grid), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Banks")->items,
            (std::vector<InstrumentKey>{{1, L"D05"}, {1, L"O39"}, {1, L"U11"}}));

  // A TOP30 list drags out too, but its order is not the user's to change.
  view->OnCommand(CPriceViewAdv::kTop30ButtonId);
  const std::vector<std::wstring> top30 = Codes(grid);
  ASSERT_EQ(top30.size(), 2u);
  grid->SelectRow(1);
  host.ClearRequests();
  drag.From(1);
  EXPECT_EQ(drag.links.size(), 4u);
  EXPECT_FALSE(drag.taken);
  EXPECT_EQ(Codes(grid), top30);
  EXPECT_TRUE(host.RequestsOf(hm::SaveUserWatchlist).empty());

  // World indices stay where they are.
  view->OnCommand(CPriceViewAdv::kWorldButtonId);
  ASSERT_EQ(grid->Rows().size(), 2u);
  drag.From(0);
  EXPECT_EQ(drag.links.size(), 4u);
}

TEST_F(PriceView, Shortcuts_BuyAndSellTheSelectedRowWithItsPriceWhenAboveZero) {
  CPriceViewAdv* view = Make();
  PriceGrid* grid = view->GetPriceGrid();
  auto press = [&](QWidget* target, int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    QKeyEvent e(QEvent::KeyPress, key, modifiers);
    QApplication::sendEvent(target, &e);
  };
  Push(view, instruments[0], "ASK", "10.02");
  Push(view, instruments[0], "BID", "0");
  host.ClearRequests();
  press(grid, Qt::Key_F5);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());  // no row selected
  grid->SelectRow(0);
  press(grid, Qt::Key_Plus, Qt::KeypadModifier);
  press(grid->viewport(), Qt::Key_Minus);
  const auto links = host.RequestsOf(hm::LinkData);
  ASSERT_EQ(links.size(), 2u);
  const auto buy = addon::ReadLinkText(links[0].link->link);
  const auto sell = addon::ReadLinkText(links[1].link->link);
  ASSERT_TRUE(buy && sell);
  EXPECT_EQ(links[0].link->className, L"CTradeView");
  EXPECT_EQ(buy->Get("Field_instrument_code"), "D05");
  EXPECT_EQ(buy->Get("Field_side"), "buy");
  EXPECT_EQ(buy->Get("Field_Trade_price"), "10.02");
  EXPECT_EQ(sell->Get("Field_side"), "sell");
  EXPECT_FALSE(sell->Has("Field_Trade_price"));  // a bid of 0 goes without a price
  EXPECT_EQ(host.RequestsOf(hm::ShortcutContext).size(), 2u);
  // In the search box the main-keyboard minus types.
  host.ClearRequests();
  ASSERT_NE(view->InstrumentBox()->lineEdit(), nullptr);
  press(view->InstrumentBox()->lineEdit(), Qt::Key_Minus);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());
  // Shortcuts off: nothing opens.
  CKeyboardShortcutsSetting off;
  off.SetEnableKeyboardShortcuts(false);
  GetUserSettings().SetKeyboardShortcutsSetting(off);
  press(grid, Qt::Key_F9);
  EXPECT_TRUE(host.RequestsOf(hm::OpenView).empty());
}

TEST_F(PriceView, FontSizeMenu_StoresTheChoiceAndAnnouncesIt) {
  CPriceViewAdv* view = Make();
  host.dialogs.menuAnswers = {CPriceViewAdv::kCmdFontFirst + 2};
  host.ClearRequests();
  host.Send(view, hm::FontSizeMenu);
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  const auto& items = host.dialogs.shown[0].items;
  ASSERT_EQ(items.size(), 4u);
  EXPECT_EQ(items[0].id, 190);
  EXPECT_TRUE(items[1].checked);  // the current size
  EXPECT_EQ(GetUserSettings().GetWatchlistSetting().GetFontSize(), 2);
  EXPECT_EQ(host.RequestsOf(hm::SettingsChanged).size(), 1u);
  EXPECT_EQ(view->GetPriceGrid()->GetDefFont().pointSize(), CWatchlistSetting::FontPointSize(2));
  // Another price view follows on 2600.
  CPriceViewAdv* other = Make();
  GetUserSettings().SetWatchlistSetting([] {
    CWatchlistSetting s = GetUserSettings().GetWatchlistSetting();
    s.SetFontSize(3);
    return s;
  }());
  host.Send(other, hm::SettingsChanged);
  EXPECT_EQ(other->GetPriceGrid()->GetDefFont().pointSize(), CWatchlistSetting::FontPointSize(3));
}

TEST_F(PriceView, Legends_OpenHalfASecondAfterTheGridsMessage) {
  CPriceViewAdv* view = Make();
  const std::vector<JRemarkMessage> remarks{{"HKEX", "XX", "Other"}, {"SGX", "CD", "Cum dividend"}, {"SGX", "XD", "Ex"}};
  host.Send(view, hm::RemarkMessages, ToLParam(&remarks));
  platform::PostMessage(view, PriceGrid::kLongShortLegendMsg, 0, 0);
  host.Advance(0);  // the message starts the timer
  host.Advance(400);
  EXPECT_FALSE(view->LongShortLegend()->isVisible());
  host.Advance(100);
  EXPECT_TRUE(view->LongShortLegend()->isVisible());
  EXPECT_EQ(view->LongShortLegend()->Board()->RowCount(), 5);
  host.Advance(1000);
  EXPECT_TRUE(view->LongShortLegend()->isVisible());  // the timer stopped itself
  platform::PostMessage(view, PriceGrid::kRemarkLegendMsg, 0, 0);
  host.Advance(0);
  host.Advance(500);
  EXPECT_TRUE(view->RemarkLegend()->isVisible());
  EXPECT_EQ(view->RemarkLegend()->Board()->RowCount(), 2);  // the SGX codes
}

TEST_F(PriceView, InstrumentFieldUpdates414_NameAndRemarksByTheLeadingView) {
  CPriceViewAdv* view = Make();
  PriceGrid* grid = view->GetPriceGrid();
  FieldUpdate u{1, "D05", "INSTRNAME", "Renamed Bank", 0, 0};
  host.Send(view, 414, ToLParam(&u));
  EXPECT_EQ(grid->CellText(ColOf(grid, pricecol::Col::Name), 0), "Renamed Bank");
  FieldUpdate r{1, "D05", "REMARKS", "XD", 0, 0};
  host.Send(view, 414, ToLParam(&r));
  host.Advance(200);
  EXPECT_EQ(grid->CellText(ColOf(grid, pricecol::Col::Rem), 0), "XD");
  FieldUpdate unknown{1, "NOPE", "INSTRNAME", "x", 0, 0};
  host.Send(view, 414, ToLParam(&unknown));
  EXPECT_EQ(InstrumentMgr().FindPtr(InstrumentKey{1, L"NOPE"}), nullptr);
}

}  // namespace
}  // namespace pricetest
