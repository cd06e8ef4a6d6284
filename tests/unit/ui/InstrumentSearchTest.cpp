// The instrument search on its own: the groups and their order, with the
// lookup lists and without them (the scan used until they are ready), and
// both against a one-by-one reference over the simulated market's list.
#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <string>
#include <tuple>
#include <vector>

#include "controls/InstrumentSearch.h"
#include "terminal/sim/Market.h"

namespace {

JInstrumentUnderlying Ins(std::string name, std::string symbol, std::string exchange = "HKEX", std::string code = {}) {
  JInstrumentUnderlying i;
  i.instrumentName = std::move(name);
  i.symbol = std::move(symbol);
  i.exchangeCode = std::move(exchange);
  i.productId = 1;
  i.instrumentCode = code.empty() ? i.symbol : std::move(code);
  return i;
}

std::vector<std::string> Names(const std::vector<JInstrumentUnderlying>& list, const std::vector<int>& positions) {
  std::vector<std::string> out;
  for (int p : positions) out.push_back(list[std::size_t(p)].instrumentName);
  return out;
}

// How the index is made: texts only (the scan until the lists are ready), the
// lists built here, or built on the worker thread.
enum class Way { Scan, Lists, Background };
const Way kWays[] = {Way::Scan, Way::Lists, Way::Background};
const char* NameOf(Way w) { return w == Way::Scan ? "scan" : w == Way::Lists ? "lists" : "background"; }

void Make(InstrumentSearchIndex& index, const std::vector<JInstrumentUnderlying>& list, Way way) {
  switch (way) {
    case Way::Scan: index.Load(list); break;
    case Way::Lists: index.Build(list); break;
    case Way::Background:
      index.StartBuild(list);
      index.WaitIndexed();
      break;
  }
  ASSERT_EQ(index.IsIndexed(), way != Way::Scan);
}

// The rules applied one instrument at a time, the slow and obvious way.
std::vector<int> Reference(const std::vector<JInstrumentUnderlying>& list, const std::string& key) {
  using Entry = std::tuple<std::size_t, std::string, int>;  // offset, lowered text, position
  std::vector<Entry> groups[6];
  for (int i = 0; i < int(list.size()); ++i) {
    const auto g = InstrumentSearchIndex::Classify(list[std::size_t(i)], key);
    if (g == InstrumentSearchIndex::kNone) continue;
    std::string text;
    if (g <= InstrumentSearchIndex::kNameContains) text = InstrumentSearchIndex::LowerAscii(list[std::size_t(i)].instrumentName);
    else if (g <= InstrumentSearchIndex::kSymbolContains) text = InstrumentSearchIndex::LowerAscii(list[std::size_t(i)].symbol);
    const std::size_t at = text.empty() ? 0 : text.find(key);
    groups[g].emplace_back(key.size() > 1 ? at : 0, key.size() > 1 ? text : std::string(), i);
  }
  for (int g = 0; g < 4; ++g) std::sort(groups[g].begin(), groups[g].end());
  std::vector<int> out;
  for (int g : {0, 2, 1, 3, 4, 5})
    for (const Entry& e : groups[g]) out.push_back(std::get<2>(e));
  return out;
}

TEST(InstrumentSearch, Groups_NamePrefixSymbolPrefixNameSymbolExchangeThenCode) {
  const std::vector<JInstrumentUnderlying> list{
      Ins("Code Only", "C9", "SSE", "XAB7"), Ins("Zed Symbol Contains", "ZAB"), Ins("Xab", "X1"), Ins("Nothing", "N1"),
      Ins("Prefix Symbol", "AB1"), Ins("Abc", "C1"), Ins("Exchange Only", "E1", "XABX")};
  for (Way way : kWays) {
    SCOPED_TRACE(NameOf(way));
    InstrumentSearchIndex index;
    Make(index, list, way);
    EXPECT_EQ(Names(list, index.Search("ab")), (std::vector<std::string>{"Abc", "Prefix Symbol", "Xab",
                                                                         "Zed Symbol Contains", "Exchange Only",
                                                                         "Code Only"}));
    // One character: "contains" catches more names, in list order.
    EXPECT_EQ(Names(list, index.Search("a")), (std::vector<std::string>{"Abc", "Prefix Symbol",
                                                                        "Zed Symbol Contains", "Xab",
                                                                        "Exchange Only", "Code Only"}));
  }
}

// Traders type the code they know: a stock code or a ticker that is neither in
// the name nor in the symbol still finds the instrument, last and in list order.
TEST(InstrumentSearch, Codes_FoundAfterEveryOtherGroupInListOrder) {
  const std::vector<JInstrumentUnderlying> list{
      Ins("Harbour Bank", "HBANK", "HKEX", "00332"), Ins("Pacific 00332 Fund", "PF", "HKEX", "01111"),
      Ins("Lotus Energy", "LOTUS", "HKEX", "A00332"), Ins("Apple Inc", "AAPL", "NASDAQ", "US0378331005"),
      Ins("Ocean Telecom", "OCT", "SGX", "O39")};
  for (Way way : kWays) {
    SCOPED_TRACE(NameOf(way));
    InstrumentSearchIndex index;
    Make(index, list, way);
    EXPECT_EQ(Names(list, index.Search("00332")),
              (std::vector<std::string>{"Pacific 00332 Fund", "Harbour Bank", "Lotus Energy"}));
    EXPECT_EQ(Names(list, index.Search("o39")), (std::vector<std::string>{"Ocean Telecom"}));
    EXPECT_EQ(Names(list, index.Search("us03")), (std::vector<std::string>{"Apple Inc"}));
    EXPECT_EQ(InstrumentSearchIndex::Classify(list[0], "00332"), InstrumentSearchIndex::kCode);
  }
}

TEST(InstrumentSearch, Order_OffsetFirstThenTextThenListOrder) {
  // Offset and text order disagree: "zab" matches at 1, "b ab" at 2.
  const std::vector<JInstrumentUnderlying> list{Ins("b ab", "S1"),   Ins("zab", "S2"),  Ins("Abz", "S3"),
                                                Ins("Aba", "S4"),    Ins("zab", "S5"),  Ins("Other", "QQAB"),
                                                Ins("Second", "QAB"), Ins("Third", "QAA")};
  for (Way way : kWays) {
    SCOPED_TRACE(NameOf(way));
    InstrumentSearchIndex index;
    Make(index, list, way);
    // Name prefix by text; name contains by offset, then text, then list order
    // (the two "zab"); symbol contains by offset ("QAB" at 1 before "QQAB" at 2).
    const std::vector<int> expected{3, 2, 1, 4, 0, 6, 5};
    EXPECT_EQ(index.Search("ab"), expected);
    // One character: list order inside each group.
    EXPECT_EQ(Names(list, index.Search("b")),
              (std::vector<std::string>{"b ab", "zab", "Abz", "Aba", "zab", "Other", "Second"}));
  }
}

TEST(InstrumentSearch, Lowering_EveryLetterOfTheAlphabetAndNothingElse) {
  const std::vector<JInstrumentUnderlying> list{Ins("ABCDEFGHIJKLMNOPQRSTUVWXYZ", "S1"), Ins("x@[`{y", "S2"),
                                                Ins("caf\xc3\x89", "S3")};
  EXPECT_EQ(InstrumentSearchIndex::LowerAscii("AZaz@[`{\xc3\x89"), "azaz@[`{\xc3\x89");
  const std::string alphabet = "abcdefghijklmnopqrstuvwxyz";
  for (Way way : kWays) {
    SCOPED_TRACE(NameOf(way));
    InstrumentSearchIndex index;
    Make(index, list, way);
    for (std::size_t n : {1u, 2u, 3u, 26u})
      for (std::size_t at = 0; at + n <= alphabet.size(); ++at) {
        const std::string key = alphabet.substr(at, n);
        const auto found = index.Search(key);
        EXPECT_NE(std::find(found.begin(), found.end(), 0), found.end()) << key;
      }
    // The bytes around the letters are not folded.
    EXPECT_EQ(index.Search("@[`{").size(), 1u);
    EXPECT_TRUE(index.Search("caf\xc3\xa9").empty()) << "only A to Z are lowered";
    EXPECT_EQ(index.Search("caf\xc3\x89").size(), 1u);
  }
}

TEST(InstrumentSearch, Edges_EmptyKeyNulAndShortEntries) {
  const std::vector<JInstrumentUnderlying> list{Ins("ab", "s1"), Ins("cd", "s2"), Ins("", ""), Ins("bc", "s3"),
                                                Ins(std::string("n\0ul", 4), "s4")};
  for (Way way : kWays) {
    SCOPED_TRACE(NameOf(way));
    InstrumentSearchIndex index;
    Make(index, list, way);
    EXPECT_EQ(index.Search("bc"), (std::vector<int>{3}));
    EXPECT_TRUE(index.Search("abc").empty()) << "matches never span two instruments";
    EXPECT_TRUE(index.Search(std::string("a\0", 2)).empty());
    EXPECT_TRUE(index.Search(std::string("n\0", 2)).empty());
    EXPECT_TRUE(index.Search("ABC").empty()) << "the key arrives lowered";
    EXPECT_EQ(index.Search("").size(), list.size());
    EXPECT_TRUE(index.Search("zzz").empty());
  }
  InstrumentSearchIndex none;
  EXPECT_TRUE(none.Search("ab").empty());
  EXPECT_TRUE(none.Search("").empty());
  none.StartBuild({});
  EXPECT_TRUE(none.Search("ab").empty());
}

// A list replaced while its lists are being built: the old build is dropped,
// the new list is searched, and a build still running when the index goes
// away is stopped.
TEST(InstrumentSearch, Background_ReplacedAndAbandonedBuilds) {
  sim::MarketConfig config;
  config.instruments = 3000;
  const sim::Market market(config);
  const auto& big = market.Instruments();
  const std::vector<JInstrumentUnderlying> small{Ins("Alpha Holdings", "AH"), Ins("Beta", "BH")};
  InstrumentSearchIndex index;
  index.StartBuild(big);
  index.StartBuild(small);
  EXPECT_EQ(index.Size(), 2u);
  EXPECT_EQ(index.Search("ho"), (std::vector<int>{0}));
  index.WaitIndexed();
  EXPECT_TRUE(index.IsIndexed());
  EXPECT_EQ(index.Search("ho"), (std::vector<int>{0}));
  {
    InstrumentSearchIndex abandoned;
    abandoned.StartBuild(big);
  }
  index.StartBuild(big);
  index.Clear();
  EXPECT_FALSE(index.IsBuilt());
  EXPECT_TRUE(index.Search("ho").empty());
}

// The index gives exactly what the rules give one instrument at a time, for
// keys taken from the market's own texts and a few that match nothing.
TEST(InstrumentSearch, SimulatedMarket_SameResultsAsTheOneByOneRules) {
  sim::MarketConfig config;
  config.instruments = 4000;
  const sim::Market market(config);
  const auto& list = market.Instruments();
  std::set<std::string> keys{"a", "e", "0", " ", "'", "&", "o'", "ho", "ng", " l", "00", "ltd", "hold", "nasdaq",
                             "qqq", "zzzz", "x", "1", "hk", "[keldo]", "cfd", ".", "-"};
  for (std::size_t i = 0; i < list.size(); i += 97) {
    const auto& ins = list[i];
    for (const std::string* text : {&ins.instrumentName, &ins.symbol, &ins.exchangeCode, &ins.instrumentCode}) {
      const std::string lowered = InstrumentSearchIndex::LowerAscii(*text);
      for (std::size_t n : {1u, 2u, 3u, 5u})
        if (lowered.size() >= n) keys.insert(lowered.substr((i / 97) % (lowered.size() - n + 1), n));
    }
  }
  ASSERT_GT(keys.size(), 200u);
  InstrumentSearchIndex scan, lists;
  scan.Load(list);
  lists.Build(list);
  std::size_t matched = 0;
  for (const std::string& key : keys) {
    const std::vector<int> expected = Reference(list, key);
    EXPECT_EQ(lists.Search(key), expected) << '"' << key << '"';
    EXPECT_EQ(scan.Search(key), expected) << '"' << key << '"';
    matched += !expected.empty();
  }
  EXPECT_GT(matched, keys.size() * 3 / 4) << "the keys mostly find something";
}

}  // namespace
