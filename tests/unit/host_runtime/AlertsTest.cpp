#include <gtest/gtest.h>

#include "RecordingView.h"

namespace {
PriceAlertItem AlertOn(const JInstrumentUnderlying& ins, const char* field, const char* cmp, double value) {
  PriceAlertItem a;
  a.alertId = -1;
  a.productId = ins.productId;
  a.exchangeCode = ins.exchangeCode;
  a.instrumentCode = ins.instrumentCode;
  a.priceField = field;
  a.comparator = cmp;
  a.triggerValue = value;
  a.validUntil = "2026-12-31";
  a.status = "Active";
  return a;
}
std::vector<PriceAlertItem> List(RecordingView& v) {
  v.Send(hm::Alert701);
  return v.notes.back().alerts;
}
}  // namespace

TEST(HostAlerts, CreateChangeAndDeleteAreStoredAndAnnounced) {
  Harness h;
  RecordingView& form = h.View("CNewPriceAlertAdv");
  RecordingView& list = h.View("CPriceAlertList");
  // The list answers an announcement with 701, as the alert list view does.
  list.onNote = [&](const RecordingView::Note& n) {
    if (n.msg == hm::Alert702 || n.msg == hm::Alert703 || n.msg == hm::Alert704) list.Send(hm::Alert701);
  };
  const auto& ins = h.Ins(h.Busy());
  PriceAlertItem a = AlertOn(ins, "ASK", ">=", 1e6);
  form.Send(hm::Alert702, ToLParam(&a));
  form.Send(hm::AlertSubmitted);
  ASSERT_EQ(list.Of(hm::Alert702).size(), 1u);
  auto got = list.Of(hm::Alert701).back()->alerts;
  ASSERT_EQ(got.size(), 1u);
  EXPECT_GT(got[0].alertId, 0);
  EXPECT_EQ(got[0].status, "Active");
  EXPECT_EQ(got[0].instrumentCode, ins.instrumentCode);
  EXPECT_EQ(h.store.alerts.size(), 1u);

  PriceAlertItem change = got[0];
  change.triggerValue = 2e6;
  change.comparator = "<=";
  form.Send(hm::Alert703, ToLParam(&change));
  got = list.Of(hm::Alert701).back()->alerts;
  EXPECT_DOUBLE_EQ(got[0].triggerValue, 2e6);
  EXPECT_EQ(h.store.alerts[0].comparator, "<=");

  const std::vector<std::int32_t> ids = {got[0].alertId};
  list.Send(hm::Alert704, ToLParam(&ids));
  EXPECT_TRUE(List(list).empty());
  EXPECT_TRUE(h.store.alerts.empty());
  // An alert without an instrument is refused.
  PriceAlertItem none;
  form.Send(hm::Alert702, ToLParam(&none));
  EXPECT_TRUE(List(list).empty());
}

TEST(HostAlerts, EvaluationTriggersNotifiesAndExpires) {
  Harness h;
  RecordingView& list = h.View("CPriceAlertList");
  const auto& ins = h.Ins(h.Busy());
  const sim::Quote q = h.runtime->Market().QuoteOf(h.Busy());
  PriceAlertItem hit = AlertOn(ins, "BID", "<=", q.bid * 2);
  PriceAlertItem miss = AlertOn(ins, "LDONE", "<=", q.last / 2);
  PriceAlertItem old = AlertOn(ins, "ASK", ">=", q.ask * 2);
  old.validUntil = "2026-12-01";
  for (auto* a : {&hit, &miss, &old}) list.Send(hm::Alert702, ToLParam(a));
  list.Clear();
  h.Pump(600);
  const auto alerts = List(list);
  ASSERT_EQ(alerts.size(), 3u);
  EXPECT_EQ(alerts[0].status, "Triggered");
  EXPECT_EQ(alerts[0].hostNumber, 1);
  EXPECT_EQ(alerts[1].status, "Active");
  EXPECT_EQ(alerts[2].status, "Expired");
  EXPECT_EQ(list.Of(hm::Alert703).size(), 1u) << "one announcement for the changes of a check";
  ASSERT_EQ(h.shell.notices.size(), 1u);
  EXPECT_NE(h.shell.notices[0].find(hv::Widen(ins.instrumentCode)), std::wstring::npos);
  EXPECT_EQ(h.store.alerts[0].status, "Triggered");
  EXPECT_EQ(h.runtime->Stats().alertsFired, 1u);
  // Stored alerts come back with a new terminal.
  term::MemoryHostStore copy = h.store;
  Harness again(42, &copy);
  RecordingView& v = again.View("CPriceAlertList");
  EXPECT_EQ(List(v).size(), 3u);
}

TEST(HostAlerts, EachFiringIsShownLoggedAndKeptWithItsAlert) {
  Harness h;
  RecordingView& list = h.View("CPriceAlertList");
  const auto& ins = h.Ins(h.Busy());
  const sim::Quote q = h.runtime->Market().QuoteOf(h.Busy());
  PriceAlertItem quiet = AlertOn(ins, "ASK", "<=", q.ask * 2);
  quiet.viaApp = false;  // no notice on screen, still logged and kept
  PriceAlertItem loud = AlertOn(ins, "BID", ">=", q.bid / 2);
  list.Send(hm::Alert702, ToLParam(&quiet));
  list.Send(hm::Alert702, ToLParam(&loud));
  h.Pump(100);
  ASSERT_EQ(h.store.firings.size(), 2u);
  const auto alerts = List(list);
  for (const auto& f : h.store.firings) {
    const PriceAlertItem* a = nullptr;
    for (const auto& x : alerts) if (x.alertId == f.alertId) a = &x;
    ASSERT_NE(a, nullptr);
    EXPECT_EQ(f.firedAt, a->hostTextA);
    EXPECT_EQ(f.valueText, a->hostTextB);
    EXPECT_NE(f.notice.find(ins.instrumentCode), std::string::npos);
    EXPECT_NE(f.notice.find(f.firedAt), std::string::npos);
  }
  ASSERT_EQ(h.shell.notices.size(), 1u) << "only the alert that notifies in the terminal";
  EXPECT_EQ(h.shell.notices[0], hv::Widen(h.store.firings[1].notice));
  EXPECT_EQ(h.store.LoadAlertFirings(h.store.firings[1].alertId).size(), 1u);
  // Deleting an alert deletes its history.
  const std::vector<std::int32_t> ids = {h.store.firings[0].alertId};
  list.Send(hm::Alert704, ToLParam(&ids));
  ASSERT_EQ(h.store.firings.size(), 1u);
  EXPECT_NE(h.store.firings[0].alertId, ids[0]);
}
