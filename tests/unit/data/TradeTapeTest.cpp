// The trade tape: "TRADEDATA" items into trades by number, malformed items
// dropped without losing the rest, a trade never held twice.
#include <gtest/gtest.h>

#include <vector>

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

namespace {

TradeRecord Trade(int number, std::wstring time, std::wstring price, std::wstring volume, std::wstring side) {
  return TradeRecord{number, std::move(time), std::move(price), std::move(volume), std::move(side)};
}

void ExpectHeld(const TradeTape& tape, const TradeRecord& want) {
  TradeRecord got;
  ASSERT_TRUE(tape.Get(kKey, want.number, got)) << want.number;
  EXPECT_EQ(got.number, want.number);
  EXPECT_EQ(got.time, want.time) << want.number;
  EXPECT_EQ(got.price, want.price) << want.number;
  EXPECT_EQ(got.volume, want.volume) << want.number;
  EXPECT_EQ(got.side, want.side) << want.number;
}

TEST(TradeTape_Text, EveryTextComesBackAsItArrivedWhateverItHolds) {
  TradeTape tape;
  const std::vector<TradeRecord> trades = {
      Trade(1, L"2026120710:30:01", L"12.345", L"1500", L"1"),
      Trade(2, L"", L"", L"", L""),
      Trade(3, L"2026120710:30:03", L"\u00A512.5", L"\u4E00\u767E", L"\u00E9"),   // beyond ASCII
      Trade(4, std::wstring(256, L'9'), L"1", L"2", L"3"),                         // a field over 255
      Trade(5, std::wstring(255, L'8'), std::wstring(255, L'7'), L"x", L"\x7F"),   // the longest that packs
      Trade(6, L"t", std::wstring(1, wchar_t(0x10FFFF)), std::wstring(1, wchar_t(-1)), L"0"),
      Trade(100, L"last of the page", L"0.001", L"1", L"2"),
  };
  for (const TradeRecord& t : trades) ASSERT_TRUE(tape.Store(kKey, t));
  for (const TradeRecord& t : trades) ExpectHeld(tape, t);
  EXPECT_EQ(tape.Count(kKey), trades.size());
  EXPECT_EQ(tape.CountRange(kKey, 1, 100), int(trades.size()));
  EXPECT_EQ(tape.CountRange(kKey, 3, 6), 4);
  EXPECT_FALSE(tape.Has(kKey, 7));
  // What one Read hands out does not leak into the next.
  std::wstring first, second;
  tape.Read(kKey, 4, [&](const TradeRecord& t) { first = t.time; });
  tape.Read(kKey, 1, [&](const TradeRecord& t) { second = t.time; });
  EXPECT_EQ(first, std::wstring(256, L'9'));
  EXPECT_EQ(second, L"2026120710:30:01");
}

TEST(TradeTape_Text, ReplacedTradesKeepTheirNeighboursWhicheverWayTheyAreKept) {
  TradeTape tape;
  for (int n = 1; n <= 100; ++n) tape.Store(kKey, Trade(n, L"2026120710:30:00", std::to_wstring(n) + L".5", L"100", L"1"));
  // One trade replaced many times over, going between packed and kept-as-it-came text.
  for (int round = 0; round < 500; ++round) {
    const std::wstring price = (round % 3 == 0 ? L"\u00A5" : L"") + std::to_wstring(round);
    tape.Store(kKey, Trade(50, L"2026120710:31:00", price, std::to_wstring(round), L"2"));
  }
  // The same trade again, as the live page repeats it, changes nothing.
  for (int round = 0; round < 100; ++round)
    tape.StorePage(kKey, L"2026120710:30:00|7.5|100|1||7;2026120710:30:00|8.5|100|1||8");
  ExpectHeld(tape, Trade(50, L"2026120710:31:00", L"499", L"499", L"2"));
  for (int n = 1; n <= 100; ++n)
    if (n != 50) ExpectHeld(tape, Trade(n, L"2026120710:30:00", std::to_wstring(n) + L".5", L"100", L"1"));
  EXPECT_EQ(tape.Count(kKey), 100u);
  EXPECT_EQ(tape.CountInPage(kKey, 1), 100);
}

TEST(TradeTape_Text, TimesOfOtherDaysAndHoursAndFullBlocksComeBackWhole) {
  TradeTape tape;
  std::vector<TradeRecord> trades = {
      Trade(1, L"09:59:59", L"1", L"1", L"1"),                    // shorter than a date and hour
      Trade(2, L"2026120710:00:00", L"1", L"1", L"1"),            // sets the block's date and hour
      Trade(3, L"2026120710", L"1", L"1", L"1"),                  // only the date and hour
      Trade(4, L"2026120711:00:00", L"1", L"1", L"1"),            // the next hour
      Trade(5, L"2026120810:00:00", L"1", L"1", L"1"),            // the next day
      Trade(6, L"2026120710:00:01", L"1", L"1", L"1"),
      Trade(7, L"202612071", L"1", L"1", L"1"),                   // a prefix of the prefix
  };
  for (const TradeRecord& t : trades) tape.Store(kKey, t);
  for (const TradeRecord& t : trades) ExpectHeld(tape, t);
  // Re-sent as the live page does, and replaced with other days' times.
  for (const TradeRecord& t : trades) tape.Store(kKey, t);
  tape.Store(kKey, Trade(2, L"2026120909:00:00", L"2", L"2", L"2"));
  trades[1] = Trade(2, L"2026120909:00:00", L"2", L"2", L"2");
  for (const TradeRecord& t : trades) ExpectHeld(tape, t);

  // A page of the longest fields packs what fits and keeps the rest as it came.
  TradeTape full;
  std::vector<TradeRecord> longest;
  for (int n = 101; n <= 200; ++n)
    longest.push_back(Trade(n, std::wstring(255, wchar_t(L'a' + n % 26)), std::wstring(255, L'1'),
                            std::wstring(255, L'2'), std::to_wstring(n)));
  for (const TradeRecord& t : longest) full.Store(kKey, t);
  for (const TradeRecord& t : longest) {
    TradeRecord got;
    ASSERT_TRUE(full.Get(kKey, t.number, got));
    EXPECT_EQ(got.time, t.time);
    EXPECT_EQ(got.side, t.side);
  }
  EXPECT_EQ(full.CountInPage(kKey, 2), 100);
}

}  // namespace
