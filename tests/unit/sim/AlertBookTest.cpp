#include <gtest/gtest.h>

#include "terminal/sim/Market.h"

using sim::AlertBook;
using sim::Market;

namespace {

struct AlertMarket {
  Market market{[] {
    sim::MarketConfig c;
    c.seed = 5;
    c.instruments = 600;
    return c;
  }()};
  int fx = market.FindByCode("EURUSD");

  PriceAlertItem Alert(const char* field, const char* cmp, double value, bool once = true) {
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

TEST(AlertBook, ComparesTheWatchedFieldWithLessOrEqualAndGreaterOrEqual) {
  AlertMarket s;
  ASSERT_GE(s.fx, 0);
  const sim::Quote q = s.market.QuoteOf(s.fx);
  AlertBook book;
  const auto askAt = book.Create(s.Alert("ASK", "<=", q.ask));         // equal counts
  const auto bidBelow = book.Create(s.Alert("BID", "<=", q.bid - 0.01));
  const auto lastAbove = book.Create(s.Alert("LDONE", ">=", q.last));  // equal counts
  const auto lastFar = book.Create(s.Alert("LAST", ">=", q.last + 1));  // "LAST" reads as last done
  bool changed = false;
  const auto fired = book.Evaluate(s.market, &changed);
  EXPECT_TRUE(changed);
  ASSERT_EQ(fired.size(), 2u);
  EXPECT_EQ(fired[0].alert.alertId, askAt);
  EXPECT_EQ(fired[1].alert.alertId, lastAbove);
  EXPECT_EQ(book.Find(askAt)->status, "Triggered");
  EXPECT_EQ(book.Find(bidBelow)->status, "Active");
  EXPECT_EQ(book.Find(lastAbove)->status, "Triggered");
  EXPECT_EQ(book.Find(lastFar)->status, "Active");
  EXPECT_EQ(book.Find(askAt)->hostNumber, 1);
  EXPECT_FALSE(book.Find(askAt)->hostTextA.empty());
  // Nothing new on the same prices.
  EXPECT_TRUE(book.Evaluate(s.market, &changed).empty());
  EXPECT_FALSE(changed);
}

TEST(AlertBook, ExpiresAfterTheLastValidDay) {
  AlertMarket s;
  AlertBook book;
  auto a = s.Alert("ASK", ">=", 1e9);
  a.validUntil = "2026-12-06";
  const auto old = book.Create(a);
  a.validUntil = "2026-12-07";
  const auto today = book.Create(a);
  bool changed = false;
  book.Evaluate(s.market, &changed);
  EXPECT_TRUE(changed);
  EXPECT_EQ(book.Find(old)->status, "Expired");
  EXPECT_EQ(book.Find(today)->status, "Active") << "valid through its last day";
}

TEST(AlertBook, OnceFiresOnceRepeatingFiresEachTimeTheConditionTurnsTrue) {
  AlertMarket s;
  s.market.AddInterest(s.fx);
  const double start = s.market.QuoteOf(s.fx).last;
  AlertBook book;
  const auto once = book.Create(s.Alert("LDONE", ">=", start, true));
  const auto again = book.Create(s.Alert("LDONE", ">=", start, false));
  int onceFired = 0, againFired = 0;
  for (std::uint32_t t = 500; t <= 20u * 60u * 1000u; t += 500) {
    s.market.AdvanceTo(t);
    for (const auto& f : book.Evaluate(s.market, nullptr)) {
      onceFired += f.alert.alertId == once;
      againFired += f.alert.alertId == again;
    }
  }
  EXPECT_EQ(onceFired, 1);
  EXPECT_GE(againFired, 2);
  EXPECT_EQ(book.Find(again)->hostNumber, againFired);
}

TEST(AlertBook, ChangeRearmsAndRemoveDeletes) {
  AlertMarket s;
  AlertBook book;
  auto a = s.Alert("BID", ">=", 0.0001);
  const auto id = book.Create(a);
  book.Evaluate(s.market, nullptr);
  ASSERT_EQ(book.Find(id)->status, "Triggered");
  a.alertId = id;
  a.triggerValue = 0.0002;
  EXPECT_TRUE(book.Update(a));
  EXPECT_EQ(book.Find(id)->status, "Active");
  EXPECT_EQ(book.Evaluate(s.market, nullptr).size(), 1u);
  a.alertId = 999;
  EXPECT_FALSE(book.Update(a));
  EXPECT_EQ(book.Remove({id, 999}), 1);
  EXPECT_EQ(book.Find(id), nullptr);
  // Ids keep growing after a reload.
  book.Load({a});
  EXPECT_EQ(book.Create(a), 1000);
}
