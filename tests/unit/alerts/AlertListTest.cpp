// The price-alert list and its grid through the scripted host.
#include "AlertFixture.h"

#include "hostview/Buttons.h"

namespace alerttest {
namespace {

using AlertList = AlertFixture;

// Answers 601 with one row for the asked exchange (delay by exchange code).
void AnswerMarketInfo(mvtest::ScriptedHost& host, std::map<std::string, int> delays, int* asked = nullptr) {
  auto rows = std::make_shared<std::vector<JMarketInfo>>();
  host.AnswerWith(hm::MarketInfo, [=](const mvtest::Feedback& f) -> std::optional<LPARAM> {
    if (asked) ++*asked;
    const auto request = std::any_cast<JMarketInfoRequest>(f.extra);
    rows->clear();
    if (auto it = delays.find(request.exchangeCode); it != delays.end())
      rows->push_back({request.productId, request.exchangeCode, it->second, "Open", "09:00", "17:00", "Market"});
    return ToLParam(rows.get());
  });
}

TEST_F(AlertList, Arrival_ShowsTheStoreWithTheColumnsUsersSee) {
  AnswerMarketInfo(host, {{"SGX", 0}, {"HKEX", 15}});
  CPriceAlertList* list = MakeList();
  PriceAlertItem a = Alert(1, instruments[0]);
  a.priceField = "LAST";
  a.comparator = "<=";
  a.triggerValue = 9.5;
  PriceAlertItem b = Alert(2, instruments[2], "Triggered");
  b.triggerOnce = false;
  b.validUntil = "2027-02-01";
  Deliver(list, {a, b});
  const auto rows = Dump(list->Grid());
  ASSERT_EQ(rows.size(), 3u);
  EXPECT_EQ(rows[0], (QStringList{"", "", "Exchange", "Symbol", "Name", "Once", "Valid Until", "Delay", "Condition",
                                  "Value", "Status"}))
      << "the alert-via column is hidden by default";
  EXPECT_EQ(rows[1], (QStringList{"", "", "SGX", "D05", "D05 Holdings", "Yes", "15 Jan 2027", "",
                                  "Last Done <= 9.50", "", "Active"}))
      << "a market without delay shows an empty cell";
  EXPECT_EQ(rows[2], (QStringList{"", "", "HKEX", "0005", "0005 Holdings", "No", "01 Feb 2027", "15",
                                  "Ask >= 10.50", "", "Fired"}));
  EXPECT_EQ(list->Grid()->Visibility(), L"111111111101");

  // The status colours of the style.
  CGridCell cell;
  list->Grid()->GetCell(list->Grid()->ColumnOf(AlertGrid::kStatus), 1, cell);
  EXPECT_EQ(cell.textColor, QColor(0, 0, 200));
  // The alert-via texts when the column is shown.
  list->Grid()->SetVisibility(L"111111111111");
  EXPECT_EQ(list->Grid()->CellText(list->Grid()->ColumnOf(AlertGrid::kAlertVia), 0), "Brantic");
}

TEST_F(AlertList, Arrival_AsksTheMarketDelayOncePerProductAndExchange) {
  int asked = 0;
  AnswerMarketInfo(host, {{"SGX", 5}}, &asked);
  CPriceAlertList* list = MakeList();
  host.ClearRequests();
  Deliver(list, {Alert(1, instruments[0]), Alert(2, instruments[0]), Alert(3, instruments[3]),
                 Alert(4, instruments[4])});
  const auto requests = Sent<JMarketInfoRequest>(hm::MarketInfo);
  ASSERT_EQ(requests.size(), 2u) << "product 1 and product 2 on SGX";
  EXPECT_EQ(requests[0].productId, 1);
  EXPECT_EQ(requests[0].exchangeCode, "SGX");
  EXPECT_EQ(requests[1].productId, 2);
  EXPECT_EQ(Dump(list->Grid())[1][7], "5");
  // Known delays are not asked again; an exchange the terminal does not know is
  // asked once per list.
  host.ClearRequests();
  Deliver(list, {Alert(1, instruments[0]), Alert(5, instruments[2]), Alert(6, instruments[2])});
  ASSERT_EQ(Sent<JMarketInfoRequest>(hm::MarketInfo).size(), 1u);
  EXPECT_EQ(Sent<JMarketInfoRequest>(hm::MarketInfo)[0].exchangeCode, "HKEX");
}

TEST_F(AlertList, Ticks_ModifyNeedsExactlyOneDeleteAtLeastOne) {
  CPriceAlertList* list = MakeList();
  Deliver(list, {Alert(1, instruments[0]), Alert(2, instruments[0]), Alert(3, instruments[4])});
  CBranticButton* modify = list->Button(CPriceAlertList::kModifyId);
  CBranticButton* remove = list->Button(CPriceAlertList::kDeleteId);
  EXPECT_TRUE(list->Button(CPriceAlertList::kNewId)->isEnabled());
  EXPECT_FALSE(modify->isEnabled());
  EXPECT_FALSE(remove->isEnabled());
  ClickTick(list->Grid(), 0);
  EXPECT_TRUE(modify->isEnabled());
  EXPECT_TRUE(remove->isEnabled());
  ClickTick(list->Grid(), 2);
  EXPECT_FALSE(modify->isEnabled()) << "two ticked";
  EXPECT_TRUE(remove->isEnabled());
  ClickTick(list->Grid(), 0);
  EXPECT_TRUE(modify->isEnabled()) << "one left";
  ClickTick(list->Grid(), 2);
  EXPECT_FALSE(remove->isEnabled());
  // The tick is written into the store.
  ClickTick(list->Grid(), 1);
  EXPECT_TRUE(alerts::Store().FindPtr(2)->ticked);
  EXPECT_FALSE(alerts::Store().FindPtr(1)->ticked);
  // A fresh list from the terminal keeps the marks of the alerts still there.
  Deliver(list, {Alert(2, instruments[0]), Alert(7, instruments[0])});
  EXPECT_EQ(list->Grid()->TickedIds(), (std::vector<std::int32_t>{2}));
  EXPECT_TRUE(modify->isEnabled());
}

TEST_F(AlertList, Filter_OptionsTwoAndThreeAndTheHeadingTickReachesHiddenAlerts) {
  CAlertSetting setting;
  setting.SetPriceAlertOption(CAlertSetting::kActive);
  GetUserSettings().SetAlertSetting(setting);
  CPriceAlertList* list = MakeList();
  Deliver(list, {Alert(1, instruments[0]), Alert(2, instruments[0], "Triggered"), Alert(3, instruments[0], "Odd")});
  ASSERT_EQ(list->Grid()->Rows().size(), 1u);
  EXPECT_EQ(list->Grid()->Rows()[0].alertId, 1);
  EXPECT_EQ(alerts::Store().Records().size(), 3u) << "the triggered alert is in the store";

  ClickTick(list->Grid(), -1);
  EXPECT_TRUE(list->Grid()->AllTicked());
  for (const PriceAlertItem& a : alerts::Store().Records()) EXPECT_TRUE(a.ticked) << a.alertId;
  EXPECT_TRUE(list->Button(CPriceAlertList::kModifyId)->isEnabled()) << "one row ticked in the grid";
  ClickTick(list->Grid(), -1);
  for (const PriceAlertItem& a : alerts::Store().Records()) EXPECT_FALSE(a.ticked) << a.alertId;

  // Option 3 over a list of active alerts only: an empty grid, after 2600.
  setting.SetPriceAlertOption(CAlertSetting::kExpired);
  GetUserSettings().SetAlertSetting(setting);
  Deliver(list, {Alert(1, instruments[0]), Alert(4, instruments[4])});
  host.Send(list, hm::SettingsChanged);
  EXPECT_EQ(list->Grid()->GetNumberRows(), 0);
  EXPECT_EQ(Dump(list->Grid()).size(), 1u);
}

TEST_F(AlertList, Buttons_NewModifyAndDeleteAskTheTerminal) {
  CPriceAlertList* list = MakeList();
  PriceAlertItem mailed = Alert(5, instruments[0]);
  mailed.viaEmail = true;
  Deliver(list, {Alert(4, instruments[0]), mailed});
  host.ClearRequests();
  Click(list->Button(CPriceAlertList::kNewId), list->Button(CPriceAlertList::kNewId)->rect().center());
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::OpenAlertForm, hm::OpenView, hm::Alert705}));
  auto open = Sent<ViewOpenRequest>(hm::OpenAlertForm);
  EXPECT_EQ(open[0].className, L"CNewPriceAlertAdv");
  EXPECT_EQ(open[0].width, 470);
  EXPECT_EQ(open[0].height, 350);
  EXPECT_EQ(host.RequestsOf(hm::OpenView)[0].link->className, L"CNewPriceAlertAdv");
  auto fill = Sent<PriceAlertItem>(hm::Alert705);
  EXPECT_EQ(fill[0].alertId, -1);
  EXPECT_EQ(fill[0].productId, -1);

  // Modify of an alert with e-mail: the tall frame.
  ClickTick(list->Grid(), 1);
  host.ClearRequests();
  list->OnModify();
  open = Sent<ViewOpenRequest>(hm::OpenAlertForm);
  ASSERT_EQ(open.size(), 1u);
  EXPECT_EQ(open[0].height, 430);
  fill = Sent<PriceAlertItem>(hm::Alert705);
  ASSERT_EQ(fill.size(), 1u);
  EXPECT_EQ(fill[0].alertId, 5);
  EXPECT_EQ(fill[0].instrumentCode, "D05");

  ClickTick(list->Grid(), 0);
  host.ClearRequests();
  list->OnModify();
  EXPECT_TRUE(host.Requests().empty()) << "two ticked: nothing to modify";
  Click(list->Button(CPriceAlertList::kDeleteId), list->Button(CPriceAlertList::kDeleteId)->rect().center());
  const auto deleted = Sent<std::vector<std::int32_t>>(hm::Alert704);
  ASSERT_EQ(deleted.size(), 1u);
  EXPECT_EQ(deleted[0], (std::vector<std::int32_t>{4, 5}));
  EXPECT_EQ(alerts::Store().Records().size(), 2u) << "nothing changes until the terminal's list";
}

TEST_F(AlertList, Modify_AnInstrumentMissingFromTheStoreShowsText20AndOpensNothing) {
  CPriceAlertList* list = MakeList();
  Deliver(list, {Alert(8, Instrument(1, "GONE", "SGX"))});
  ClickTick(list->Grid(), 0);
  host.ClearRequests();
  list->OnModify();
  EXPECT_TRUE(host.Requests().empty());
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, "Instrument not found.");
  EXPECT_EQ(host.dialogs.shown[0].caption, "Brantic");
  // An alert gone from the store: text 21.
  alerts::Store().Fill(std::vector<PriceAlertItem>{});
  list->OnModify();
  ASSERT_EQ(host.dialogs.shown.size(), 2u);
  EXPECT_EQ(host.dialogs.shown[1].text, "Alert not found.");
  EXPECT_TRUE(host.Requests().empty());
}

TEST_F(AlertList, TwoLists_TheFirstStoresListsAndAnswersChangesTheOtherFollows) {
  CPriceAlertList* first = MakeList();
  CPriceAlertList* second = MakeList();
  host.ClearRequests();
  Deliver(second, {Alert(1, instruments[0])});
  EXPECT_TRUE(alerts::Store().Records().empty()) << "only the first list stores";
  for (UINT change : {hm::Alert702, hm::Alert703, hm::Alert704}) {
    host.Send(first, change);
    host.Send(second, change);
  }
  ASSERT_EQ(host.RequestsOf(hm::Alert701).size(), 3u);
  for (const auto& r : host.RequestsOf(hm::Alert701)) EXPECT_EQ(r.view, first);

  Deliver(first, {Alert(1, instruments[0]), Alert(2, instruments[4])});
  EXPECT_EQ(first->Grid()->GetNumberRows(), 2);
  EXPECT_EQ(second->Grid()->GetNumberRows(), 0);
  host.Advance(200);
  EXPECT_EQ(second->Grid()->GetNumberRows(), 2) << "the other list follows the store's version";
  // When the first closes, the next one takes over.
  host.Destroy(first);
  host.ClearRequests();
  host.Send(second, hm::Alert703);
  EXPECT_EQ(host.RequestsOf(hm::Alert701).size(), 1u);
}

TEST_F(AlertList, Quotes_SubscribedOnTheTickAndShownAsTheWatchedField) {
  CPriceAlertList* list = MakeList();
  PriceAlertItem bid = Alert(1, instruments[0]);
  bid.priceField = "BID";
  Deliver(list, {bid, Alert(2, instruments[0]), Alert(3, instruments[4])});
  host.ClearRequests();
  host.Advance(200);
  int submits = 0;
  std::set<std::string> codes;
  for (const auto& f : host.Requests())
    if (f.field && f.message == hm::RequestField && f.field->fieldName == "PMP_Submit") {
      ++submits;
      codes.insert(f.field->instrumentCode);
    }
  EXPECT_EQ(submits, 2) << "one subscription per instrument";
  EXPECT_EQ(codes, (std::set<std::string>{"D05", "C6L"}));
  host.ClearRequests();
  host.Advance(200);
  EXPECT_TRUE(host.Requests().empty());

  host.SendField(list, hm::FieldValue, FieldUpdate{1, "D05", "BID", "9.90", 0, 0});
  host.SendField(list, hm::FieldValue, FieldUpdate{1, "D05", "ASK", "10.10", 0, 0});
  host.SendField(list, hm::FieldValue, FieldUpdate{1, "D05", "ASK", "99", 3, 1});  // depth: not a quote
  host.Advance(200);
  const auto rows = Dump(list->Grid());
  EXPECT_EQ(rows[1][9], "9.90");
  EXPECT_EQ(rows[2][9], "10.10");
  // An empty answer is asked again with 400.
  host.ClearRequests();
  host.SendField(list, hm::RequestField, FieldUpdate{2, "C6L", "LAST", "", 0, 0});
  ASSERT_EQ(host.RequestsOf(hm::FetchFields).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::FetchFields)[0].field->fieldName, "LAST");
}

TEST_F(AlertList, Hint_TellsWhenAndAtWhatValueATriggeredAlertFired) {
  CPriceAlertList* list = MakeList();
  PriceAlertItem fired = Alert(1, instruments[0], "Triggered");
  fired.hostTextA = "2027-01-10 10:31:05";
  fired.hostTextB = "10.55";
  Deliver(list, {fired});
  QString hint;
  const QPoint pt = list->Grid()->CellRect(list->Grid()->ColumnOf(AlertGrid::kStatus), 0).center();
  ASSERT_TRUE(list->Grid()->HintAt(pt, &hint));
  EXPECT_EQ(hint, "Fired 2027-01-10 10:31:05 at 10.55");
}

}  // namespace
}  // namespace alerttest
