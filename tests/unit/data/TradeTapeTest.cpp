// The trade tape: "TRADEDATA" items into trades by number, malformed items
// dropped without losing the rest, a trade never held twice.
#include <gtest/gtest.h>

#include "data/TradeTape.h"

namespace {

const InstrumentKey kKey{7, L"D05"};

std::wstring Item(int number, const std::wstring& price = L"1.50", const std::wstring& side = L"1") {
  return L"2026120710:30:0" + std::to_wstring(number % 10) + L"|" + price + L"|100|" + side + L"||" + std::to_wstring(number);
}

TEST(TradeTape, PageWithAOneFieldMiddleItemKeepsTheOtherTwo) {
  TradeTape tape;
  const std::wstring text = Item(3) + L";garbage;" + Item(1);
  EXPECT_EQ(tape.StorePage(kKey, text), 2);
  TradeRecord t;
  ASSERT_TRUE(tape.Get(kKey, 3, t));
  EXPECT_EQ(t.number, 3);
  EXPECT_EQ(t.time, L"2026120710:30:03");
  EXPECT_EQ(t.price, L"1.50");
  EXPECT_EQ(t.volume, L"100");
  EXPECT_EQ(t.side, L"1");
  EXPECT_TRUE(tape.Has(kKey, 1));
  EXPECT_FALSE(tape.Has(kKey, 2));
  EXPECT_EQ(tape.Count(kKey), 2u);
  // Another instrument's tape is another tape.
  EXPECT_FALSE(tape.Has(InstrumentKey{8, L"D05"}, 1));
}

TEST(TradeTape, MalformedItemsAreDroppedAndTheRestStored) {
  TradeTape tape;
  const std::wstring text = L";"                                  // empty item
                            L"t|1|2|1||0;"                        // number 0
                            L"t|1|2|1||-4;"                       // negative
                            L"t|1|2|1||x9;"                       // not a number
                            L"t|1|2|1||99999999999;"              // beyond 32 bits
                            L"t|1|2|1|||5;"                       // seven fields
                            L"t|1|2|1|5;"                         // five fields
                            L"t|1.25|300|2|| 12 ;";               // blanks around the number are fine
  EXPECT_EQ(tape.StorePage(kKey, text), 1);
  EXPECT_EQ(tape.Count(kKey), 1u);
  TradeRecord t;
  ASSERT_TRUE(tape.Get(kKey, 12, t));
  EXPECT_EQ(t.price, L"1.25");
  EXPECT_EQ(tape.StorePage(kKey, L""), 0);
  EXPECT_EQ(mvd::FirstTradeNumber(L"a|b;t|1|2|1||0;" + Item(40) + L";" + Item(41)), 40);
  EXPECT_EQ(mvd::NewestTradeNumber(Item(40) + L";" + Item(41) + L";" + Item(39)), 41);
  EXPECT_EQ(mvd::FirstTradeNumber(L"nothing here"), 0);
}

TEST(TradeTape, ALaterItemReplacesTheEarlierTradeOfTheSameNumber) {
  TradeTape tape;
  tape.StorePage(kKey, Item(5, L"1.00"));
  const auto before = tape.Version();
  tape.StorePage(kKey, Item(5, L"1.10", L"2") + L";" + Item(5, L"1.20", L"2"));
  EXPECT_GT(tape.Version(), before);
  TradeRecord t;
  ASSERT_TRUE(tape.Get(kKey, 5, t));
  EXPECT_EQ(t.price, L"1.20");
  EXPECT_EQ(t.side, L"2");
  EXPECT_EQ(tape.Count(kKey), 1u) << "one trade, however often it arrives";
  EXPECT_EQ(tape.CountInPage(kKey, 1), 1);
}

TEST(TradeTape, PagesAreCountedByTheirHundredTrades) {
  TradeTape tape;
  std::wstring page2, live;
  for (int n = 200; n >= 101; --n) page2 += (page2.empty() ? L"" : L";") + Item(n);
  for (int n = 250; n >= 151; --n) live += (live.empty() ? L"" : L";") + Item(n);
  EXPECT_EQ(tape.StorePage(kKey, live), 100);
  EXPECT_EQ(tape.CountInPage(kKey, 2), 50);
  EXPECT_EQ(tape.CountInPage(kKey, 3), 50);
  tape.StorePage(kKey, page2);
  EXPECT_EQ(tape.CountInPage(kKey, 2), 100);
  EXPECT_EQ(tape.Count(kKey), 150u);
  EXPECT_EQ(tape.CountInPage(kKey, 1), 0);
  EXPECT_EQ(mvd::PageOfTrade(100), 1);
  EXPECT_EQ(mvd::PageOfTrade(101), 2);
  EXPECT_EQ(mvd::FirstTradeOfPage(5), 401);
}

}  // namespace
