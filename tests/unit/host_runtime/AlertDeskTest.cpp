// The terminal's alert keeping and checking against the simulated market.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>

#include "terminal/host/AlertDesk.h"
#include "terminal/sim/Market.h"

using term::AlertDesk;
using term::AlertFiring;
using sim::Market;

namespace {

sim::MarketConfig Config() {
  sim::MarketConfig c;
  c.seed = 5;
  c.instruments = 600;
  return c;
}

std::string Clock(std::uint32_t ms) {
  char buf[16];
  std::snprintf(buf, sizeof buf, "%02u:%02u:%02u", ms / 3600000u, ms / 60000u % 60u, ms / 1000u % 60u);
  return buf;
}

struct DeskMarket {
  Market market{Config()};
  AlertDesk desk{market};
  int fx = market.FindByCode("EURUSD");

  PriceAlertItem Alert(const char* field, const char* cmp, double value, bool once = true) const {
    PriceAlertItem a;
    const auto& r = market.Instruments()[std::size_t(fx)];
    a.productId = r.productId;
    a.instrumentCode = r.instrumentCode;
    a.exchangeCode = r.exchangeCode;
    a.priceField = field;
    a.comparator = cmp;
    a.triggerValue = value;
    a.triggerOnce = once;
    a.validUntil = "2026-12-31";
    return a;
  }
};

}  // namespace

TEST(AlertDesk, ComparesTheWatchedFieldWithLessOrEqualAndGreaterOrEqual) {
  DeskMarket s;
  ASSERT_GE(s.fx, 0);
  const sim::Quote q = s.market.QuoteOf(s.fx);
  const auto askAt = s.desk.Create(s.Alert("ASK", "<=", q.ask));         // equal counts
  const auto bidBelow = s.desk.Create(s.Alert("BID", "<=", q.bid - 0.01));
  const auto lastAbove = s.desk.Create(s.Alert("LDONE", ">=", q.last));  // equal counts
  const auto lastFar = s.desk.Create(s.Alert("LAST", ">=", q.last + 1));  // "LAST" reads as last done
  bool changed = false;
  const auto fired = s.desk.Collect(&changed);
  EXPECT_TRUE(changed);
  ASSERT_EQ(fired.size(), 2u);
  EXPECT_EQ(fired[0].alertId, askAt);
  EXPECT_EQ(fired[1].alertId, lastAbove);
  EXPECT_EQ(s.desk.Find(askAt)->status, "Triggered");
  EXPECT_EQ(s.desk.Find(bidBelow)->status, "Active");
  EXPECT_EQ(s.desk.Find(lastAbove)->status, "Triggered");
  EXPECT_EQ(s.desk.Find(lastFar)->status, "Active");
  EXPECT_EQ(s.desk.Find(askAt)->hostNumber, 1);
  EXPECT_EQ(s.desk.Find(askAt)->hostTextA, "2026-12-07 10:30:00") << "when it fired";
  EXPECT_EQ(s.desk.Find(askAt)->hostTextB, s.market.FormatPrice(s.fx, q.ask)) << "at what value";
  // Nothing new on the same prices.
  EXPECT_TRUE(s.desk.Collect(&changed).empty());
  EXPECT_FALSE(changed);
}

TEST(AlertDesk, FiresOnTheCrossingEvenWhenThePriceTurnsBackBeforeTheCheck) {
  // Two markets that play the same session: the first shows the highest trade
  // of the next minute, the second watches for it with an alert.
  Market replay(Config());
  DeskMarket s;
  replay.AddInterest(s.fx);  // the alert makes its instrument a watched one
  const std::size_t before = replay.Trades(s.fx).size();
  replay.AdvanceTo(60 * 1000);
  const auto& tape = replay.Trades(s.fx);
  ASSERT_GT(tape.size(), before + 5) << "a busy minute";
  auto high = std::max_element(tape.begin() + long(before), tape.end(),
                               [](const sim::Trade& a, const sim::Trade& b) { return a.price < b.price; });
  ASSERT_LT(replay.QuoteOf(s.fx).last, high->price) << "the price fell back by the end";

  const auto id = s.desk.Create(s.Alert("LDONE", ">=", high->price));
  s.market.AdvanceTo(60 * 1000);  // one step: a check at its end alone would miss the high
  bool changed = false;
  const auto fired = s.desk.Collect(&changed);
  ASSERT_EQ(fired.size(), 1u);
  EXPECT_EQ(fired[0].alertId, id);
  EXPECT_DOUBLE_EQ(fired[0].value, high->price);
  EXPECT_EQ(fired[0].firedAt, "2026-12-07 " + Clock(high->timeMs)) << "the time of the trade that crossed";
  EXPECT_EQ(fired[0].valueText, s.market.FormatPrice(s.fx, high->price));
  EXPECT_EQ(s.desk.Find(id)->hostTextA, fired[0].firedAt);
}

TEST(AlertDesk, TheNoticeSaysWhichAlertFiredAndWhy) {
  DeskMarket s;
  const sim::Quote q = s.market.QuoteOf(s.fx);
  const auto id = s.desk.Create(s.Alert("BID", "<=", q.bid + 1));
  const auto fired = s.desk.Collect(nullptr);
  ASSERT_EQ(fired.size(), 1u);
  const auto& ins = s.market.Instruments()[std::size_t(s.fx)];
  const std::string expected = "Price alert " + std::to_string(id) + " fired: " + ins.instrumentName + " (EURUSD, " +
                               ins.exchangeCode + ") bid " + s.market.FormatPrice(s.fx, q.bid) +
                               " met the condition <= " + s.market.FormatPrice(s.fx, q.bid + 1) +
                               " at 2026-12-07 10:30:00.";
  EXPECT_EQ(fired[0].notice, expected);
  EXPECT_EQ(fired[0].priceField, "BID");
  EXPECT_EQ(fired[0].comparator, "<=");
  EXPECT_DOUBLE_EQ(fired[0].threshold, q.bid + 1);
}

TEST(AlertDesk, ExpiresAfterTheLastValidDay) {
  DeskMarket s;
  auto a = s.Alert("ASK", ">=", 1e9);
  a.validUntil = "2026-12-06";
  const auto old = s.desk.Create(a);
  a.validUntil = "2026-12-07";
  const auto today = s.desk.Create(a);
  bool changed = false;
  s.desk.Collect(&changed);
  EXPECT_TRUE(changed);
  EXPECT_EQ(s.desk.Find(old)->status, "Expired");
  EXPECT_EQ(s.desk.Find(today)->status, "Active") << "valid through its last day";
}

TEST(AlertDesk, OnceFiresOnceRepeatingFiresEachTimeTheConditionTurnsTrue) {
  DeskMarket s;
  const double start = s.market.QuoteOf(s.fx).last;
  const auto once = s.desk.Create(s.Alert("LDONE", ">=", start, true));
  const auto again = s.desk.Create(s.Alert("LDONE", ">=", start, false));
  int onceFired = 0, againFired = 0;
  for (std::uint32_t t = 500; t <= 20u * 60u * 1000u; t += 500) {
    s.market.AdvanceTo(t);
    for (const AlertFiring& f : s.desk.Collect(nullptr)) {
      onceFired += f.alertId == once;
      againFired += f.alertId == again;
    }
  }
  EXPECT_EQ(onceFired, 1);
  EXPECT_GE(againFired, 2);
  EXPECT_EQ(s.desk.Find(again)->hostNumber, againFired);
  EXPECT_EQ(s.desk.Find(again)->status, "Triggered");
}

TEST(AlertDesk, LiveAlertsMakeTheirInstrumentWatched) {
  DeskMarket s;
  EXPECT_EQ(s.market.InterestCount(), 0);
  const double last = s.market.QuoteOf(s.fx).last;
  const auto far = s.desk.Create(s.Alert("LDONE", ">=", last * 10));
  EXPECT_EQ(s.market.InterestCount(), 1);
  const auto now = s.desk.Create(s.Alert("LDONE", ">=", last / 10));
  s.desk.Collect(nullptr);
  EXPECT_EQ(s.desk.Find(now)->status, "Triggered");
  EXPECT_EQ(s.market.InterestCount(), 1) << "counted once per live alert";
  s.desk.Remove({far});
  EXPECT_EQ(s.market.InterestCount(), 0) << "a fired one-time alert no longer counts";
  // An alert on an instrument the market does not know stays as it is.
  auto unknown = s.Alert("ASK", ">=", 1);
  unknown.instrumentCode = "NOSUCH";
  const auto id = s.desk.Create(unknown);
  s.desk.Collect(nullptr);
  EXPECT_EQ(s.desk.Find(id)->status, "Active");
  EXPECT_EQ(s.market.InterestCount(), 0);
}

TEST(AlertDesk, ChangeRearmsKeepsTheHistoryAndRemoveDeletes) {
  DeskMarket s;
  auto a = s.Alert("BID", ">=", 0.0001);
  const auto id = s.desk.Create(a);
  s.desk.Collect(nullptr);
  ASSERT_EQ(s.desk.Find(id)->status, "Triggered");
  const std::string firedAt = s.desk.Find(id)->hostTextA;
  a.alertId = id;
  a.triggerValue = 0.0002;
  a.hostTextA = "forged";
  EXPECT_TRUE(s.desk.Update(a));
  EXPECT_EQ(s.desk.Find(id)->status, "Active");
  EXPECT_EQ(s.desk.Find(id)->hostTextA, firedAt) << "the terminal's own fields are not the view's to change";
  EXPECT_EQ(s.desk.Collect(nullptr).size(), 1u);
  EXPECT_EQ(s.desk.Find(id)->hostNumber, 2);
  a.alertId = 999;
  EXPECT_FALSE(s.desk.Update(a));
  EXPECT_EQ(s.desk.Remove({id, 999}), 1);
  EXPECT_EQ(s.desk.Find(id), nullptr);
  // Ids keep growing after a reload, and a loaded alert keeps its status.
  a.status = "Triggered";
  s.desk.Load({a});
  EXPECT_EQ(s.desk.Create(a), 1000);
  EXPECT_EQ(s.desk.Find(999)->status, "Triggered");
}
