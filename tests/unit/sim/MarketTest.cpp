#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <set>

#include "TapeParsing.h"
#include "terminal/sim/Market.h"

using sim::Market;
using sim::MarketConfig;

namespace {

MarketConfig Config(std::uint64_t seed = 7, int instruments = 1500) {
  MarketConfig c;
  c.seed = seed;
  c.instruments = instruments;
  return c;
}

// The busiest equity: most trades at the start.
int BusyEquity(Market& m) {
  int best = -1, trades = -1;
  for (int i = 0; i < int(m.Instruments().size()); ++i) {
    if (m.Instruments()[i].productType != "ES" || m.Instruments()[i].exchangeCode == "WIDX") continue;
    const int t = m.QuoteOf(i).trades;
    if (t > trades) { trades = t; best = i; }
  }
  return best;
}

std::string Snapshot(Market& m, const std::vector<int>& sample) {
  std::string s;
  for (int i : sample) {
    for (const char* f : {"BID", "ASK", "LAST", "HIGH", "LOW", "VOL", "BVOL", "SVOL", "CHANGE", "PCHANGE"})
      s += m.FieldValue(i, f, 0, 0) + ",";
    s += m.TradePageText(i, Market::kLivePage) + "\n";
    s += m.FieldValue(i, "BUY", 5, 1) + m.FieldValue(i, "SVOL", 7, 1) + "\n";
  }
  return s;
}

}  // namespace

TEST(Market, SameSeedAndClockGiveTheSameMarketWhateverTheStrides) {
  Market a(Config()), b(Config()), c(Config()), other(Config(8));
  std::vector<int> sample;
  for (int i = 0; i < int(a.Instruments().size()); i += 97) sample.push_back(i);
  for (int i : sample) { a.AddInterest(i); b.AddInterest(i); c.AddInterest(i); other.AddInterest(i); }
  // Strides that are not whole steps (an early or late timer) lose no time:
  // the part of a step left over counts towards the next call.
  a.AdvanceTo(30000);
  for (std::uint32_t t = 30; t <= 30000; t += 30) b.AdvanceTo(t);
  for (std::uint32_t t = 75; t <= 30000; t += 75) c.AdvanceTo(t);
  other.AdvanceTo(30000);
  ASSERT_EQ(a.Instruments().size(), b.Instruments().size());
  for (std::size_t k = 0; k < a.Instruments().size(); k += 50) {
    EXPECT_EQ(a.Instruments()[k].instrumentCode, b.Instruments()[k].instrumentCode);
    EXPECT_EQ(a.Instruments()[k].instrumentName, b.Instruments()[k].instrumentName);
  }
  EXPECT_EQ(a.TimeText(), "10:30:30");
  EXPECT_EQ(b.TimeText(), a.TimeText());
  EXPECT_EQ(c.TimeText(), a.TimeText());
  EXPECT_EQ(Snapshot(a, sample), Snapshot(b, sample));
  EXPECT_EQ(Snapshot(a, sample), Snapshot(c, sample));
  EXPECT_EQ(a.TakeChanged(), b.TakeChanged());
  EXPECT_NE(Snapshot(a, sample), Snapshot(other, sample));

  // A tick behind the market's plays nothing and loses nothing.
  a.AdvanceTo(29000);
  EXPECT_EQ(a.TimeText(), "10:30:30");
  a.AdvanceTo(31000);
  EXPECT_EQ(a.TimeText(), "10:30:31");
}

TEST(Market, ReferenceDataCoversProductsExchangesAndAccess) {
  Market m(Config(11, 4000));
  EXPECT_EQ(m.Instruments().size(), 4000u);
  std::set<std::string> types, exchanges;
  for (const auto& p : m.Products()) types.insert(p.productType);
  EXPECT_EQ(types, (std::set<std::string>{"ES", "CS", "CFD", "FUT", "FX", "DMA", "IDX"}));
  for (const auto& e : m.Exchanges()) exchanges.insert(e.exchangeCode);
  for (const char* e : {"SGX", "SEHK", "TSE", "WIDX"}) EXPECT_TRUE(exchanges.count(e)) << e;

  std::set<std::pair<std::int64_t, std::string>> keys;
  int keldo = 0, hidden = 0, viewOnly = 0, futures = 0;
  for (int i = 0; i < int(m.Instruments().size()); ++i) {
    const auto& r = m.Instruments()[i];
    EXPECT_TRUE(keys.insert({r.productId, r.instrumentCode}).second) << "duplicate " << r.instrumentCode;
    EXPECT_TRUE(types.count(r.productType));
    EXPECT_TRUE(exchanges.count(r.exchangeCode)) << r.exchangeCode;
    EXPECT_FALSE(r.instrumentName.empty());
    EXPECT_GE(r.decimals, 0);
    EXPECT_LE(r.decimals, 4);
    EXPECT_GT(r.lotSize, 0);
    EXPECT_EQ(m.Find(r.productId, r.instrumentCode), i);
    if (r.instrumentCode.rfind("[KELDO]", 0) == 0) {
      ++keldo;
      EXPECT_EQ(r.displayCode, r.instrumentCode.substr(7));
    }
    hidden += r.accessStatus == 0 || r.accessStatus == 2;
    viewOnly += r.accessStatus == 1;
    if (r.productType == "FUT") {
      ++futures;
      EXPECT_FALSE(m.QuoteOf(i).month.empty());
      EXPECT_EQ(m.QuoteOf(i).year.size(), 4u);
    }
  }
  // An exchange and a code find the first listing in market order, twins included.
  std::map<std::pair<std::string, std::string>, int> firstOn;
  for (int i = 0; i < int(m.Instruments().size()); ++i)
    firstOn.emplace(std::make_pair(m.Instruments()[i].exchangeCode, m.Instruments()[i].instrumentCode), i);
  for (const auto& [key, i] : firstOn) EXPECT_EQ(m.FindOnExchange(key.first, key.second), i) << key.first << ":" << key.second;
  const auto& first = m.Instruments()[0];
  EXPECT_EQ(m.FindOnExchange(first.exchangeCode, first.instrumentCode + "X"), -1);
  EXPECT_EQ(m.FindOnExchange(" " + first.exchangeCode, first.instrumentCode), -1) << "the caller trims";
  EXPECT_EQ(m.FindOnExchange("NOSUCH", first.instrumentCode), -1);
  EXPECT_GT(keldo, 0);
  EXPECT_GT(hidden, 0);
  EXPECT_GT(viewOnly, 0);
  EXPECT_GT(futures, 0);
  EXPECT_GE(m.WorldIndices().size(), 10u);
  for (int i : m.WorldIndices()) {
    EXPECT_EQ(m.Instruments()[i].exchangeCode, "WIDX");
    EXPECT_EQ(m.Instruments()[i].productType, "IDX") << "an index is typed as one";
  }
  EXPECT_FALSE(m.Sectors().empty());
  for (const auto& b : m.BrandWatchlists()) {
    EXPECT_FALSE(b.instruments.empty());
    for (int i : b.instruments) EXPECT_EQ(m.Instruments()[i].instrumentCode.rfind("[KELDO]", 0), 0u);
  }
}

TEST(Market, QuotesStayCoherentWithTheTape) {
  Market m(Config());
  const int i = BusyEquity(m);
  m.AddInterest(i);
  m.AdvanceTo(120000);
  const sim::Quote q = m.QuoteOf(i);
  ASSERT_GT(q.trades, 0);
  EXPECT_LT(q.bid, q.ask);
  EXPECT_LE(q.low, q.last);
  EXPECT_LE(q.last, q.high);
  EXPECT_LE(q.low, q.open);
  EXPECT_LE(q.open, q.high);
  const auto& tape = m.Trades(i);
  ASSERT_EQ(int(tape.size()), q.trades);
  std::int64_t vol = 0;
  double hi = 0, lo = 1e18;
  for (const auto& t : tape) { vol += t.volume; hi = std::max(hi, t.price); lo = std::min(lo, t.price); }
  EXPECT_EQ(vol, q.volume);
  EXPECT_DOUBLE_EQ(hi, q.high);
  EXPECT_DOUBLE_EQ(lo, q.low);
  EXPECT_DOUBLE_EQ(tape.back().price, q.last);
  EXPECT_EQ(tape.front().side, 3) << "the day opens with the auction";
  EXPECT_EQ(m.FieldValue(i, "CHANGE", 0, 0), m.FormatPrice(i, q.last - q.close));
  EXPECT_EQ(m.FieldValue(i, "VOL", 0, 0), std::to_string(q.volume));
  // A twin (CFD, DMA, brand) shows its underlying's market.
  for (int k = 0; k < int(m.Instruments().size()); ++k) {
    const auto& r = m.Instruments()[k];
    if (k != i && r.exchangeCode == m.Instruments()[i].exchangeCode && r.instrumentCode.find(m.Instruments()[i].instrumentCode) != std::string::npos) {
      EXPECT_EQ(m.FieldValue(k, "LAST", 0, 0), m.FieldValue(i, "LAST", 0, 0)) << r.instrumentCode;
    }
  }
}

TEST(Market, BookHas99OrderedLevelsAroundTheBestPrices) {
  Market m(Config());
  const int i = BusyEquity(m);
  const sim::Quote q = m.QuoteOf(i);
  const auto book = m.Book(i, 99);
  ASSERT_EQ(book.size(), 99u);
  EXPECT_DOUBLE_EQ(book[0].bid, q.bid);
  EXPECT_DOUBLE_EQ(book[0].ask, q.ask);
  EXPECT_EQ(book[0].bidVolume, q.bidVolume);
  for (std::size_t k = 1; k < book.size(); ++k) {
    EXPECT_GT(book[k].ask, book[k - 1].ask);
    if (book[k].bid > 0) { EXPECT_LT(book[k].bid, book[k - 1].bid); }
    if (book[k].bidVolume > 0) {
      EXPECT_GE(book[k].bidOrders, 1);
      EXPECT_LE(book[k].bidOrders, book[k].bidVolume);
    }
  }
  EXPECT_EQ(m.Depth(i, 42).ask, book[41].ask);
  EXPECT_EQ(m.FieldValue(i, "SELL", 42, 1), m.FormatPrice(i, book[41].ask));
  EXPECT_EQ(m.FieldValue(i, "BUY", 0, 1), "") << "level 0 does not exist";
  EXPECT_EQ(m.FieldValue(i, "BUY", 100, 1), "") << "nor does level 100";
}

TEST(Market, TradePagesReadBackIntoTheSameTrades) {
  Market m(Config());
  const int i = BusyEquity(m);
  m.AddInterest(i);
  m.AdvanceTo(60000);
  const auto& tape = m.Trades(i);
  const int n = int(tape.size());
  ASSERT_GT(n, 150) << "needs more than one page";
  const int pages = std::atoi(m.FieldValue(i, "PAGECOUNT", Market::kHeaderParam, 2).c_str());
  EXPECT_EQ(pages, (n + 99) / 100);
  std::map<int, tape::ParsedTrade> all;
  for (int p = 1; p <= pages; ++p) {
    const auto page = tape::ParseTradePage(m.FieldValue(i, "TRADEDATA", p, 2));
    ASSERT_FALSE(page.empty());
    EXPECT_EQ(page.begin()->first, (p - 1) * 100 + 1);
    EXPECT_EQ(page.rbegin()->first, std::min(n, p * 100));
    all.insert(page.begin(), page.end());
  }
  ASSERT_EQ(int(all.size()), n);
  for (int num = 1; num <= n; ++num) {
    const auto& t = tape[std::size_t(num - 1)];
    const auto& p = all.at(num);
    EXPECT_EQ(p.price, m.FormatPrice(i, t.price));
    EXPECT_EQ(p.volume, std::to_string(t.volume));
    EXPECT_EQ(p.side, std::to_string(int(t.side)));
    ASSERT_EQ(p.time.size(), 16u) << "date then time";
    EXPECT_EQ(p.time.substr(0, 8), "20261207");
  }
  // The live page starts with the newest trade: its number is the row count.
  int first = 0;
  const auto live = tape::ParseTradePage(m.TradePageText(i, Market::kLivePage), &first);
  EXPECT_EQ(first, n);
  EXPECT_EQ(int(live.size()), 100);
  EXPECT_EQ(m.TradePageText(i, pages + 1), "");
}

TEST(Market, SummaryPagesHoldFortyLinesAndTotals) {
  Market m(Config());
  const int i = BusyEquity(m);
  m.AddInterest(i);
  m.AdvanceTo(60000);
  const auto lines = m.Summary(i);
  const int count = std::atoi(m.FieldValue(i, "COUNT", 1, 3).c_str());
  const int pages = std::atoi(m.FieldValue(i, "PAGECOUNT", 1, 3).c_str());
  ASSERT_EQ(count, int(lines.size()));
  EXPECT_EQ(pages, (count + 39) / 40);
  std::map<int, tape::ParsedLine> all;
  for (int p = 1; p <= pages; ++p) {
    const auto page = tape::ParseSummaryPage(m.FieldValue(i, "TRADEDATA", p, 3), p);
    EXPECT_TRUE(page.count(99999)) << "every page carries the totals";
    for (const auto& [line, v] : page) all[line] = v;
  }
  std::int64_t vol = 0, trades = 0;
  for (int line = 1; line <= count; ++line) {
    ASSERT_TRUE(all.count(line)) << line;
    const auto& l = lines[std::size_t(line - 1)];
    EXPECT_EQ(all[line].price, m.FormatPrice(i, l.price));
    EXPECT_EQ(all[line].volume, std::to_string(l.volume));
    EXPECT_EQ(std::stoll(all[line].bid) + std::stoll(all[line].ask) <= l.volume, true);
    if (line > 1) { EXPECT_LT(l.price, lines[std::size_t(line - 2)].price) << "highest price first"; }
    vol += l.volume;
    trades += l.trades;
  }
  EXPECT_EQ(all[99999].volume, std::to_string(m.QuoteOf(i).volume));
  EXPECT_EQ(all[99999].trades, std::to_string(m.QuoteOf(i).trades));
  EXPECT_EQ(vol, m.QuoteOf(i).volume);
  EXPECT_EQ(trades, m.QuoteOf(i).trades);
}

TEST(Market, WatchedInstrumentsMoveAndReportChanges) {
  Market m(Config());
  const int i = BusyEquity(m);
  m.TakeChanged();
  const std::string before = m.TradePageText(i, Market::kLivePage) + m.FieldValue(i, "BID", 0, 0) + m.FieldValue(i, "BVOL", 0, 0);
  m.AddInterest(i);
  m.AdvanceTo(10000);
  const auto changed = m.TakeChanged();
  EXPECT_TRUE(std::binary_search(changed.begin(), changed.end(), i));
  EXPECT_TRUE(std::is_sorted(changed.begin(), changed.end()));
  EXPECT_NE(before, m.TradePageText(i, Market::kLivePage) + m.FieldValue(i, "BID", 0, 0) + m.FieldValue(i, "BVOL", 0, 0));
  EXPECT_TRUE(m.TakeChanged().empty()) << "taken once";
  m.RemoveInterest(i);
  EXPECT_EQ(m.InterestCount(), 0);
}

TEST(Market, Top30ListsRankTheSimulation) {
  Market m(Config(3, 3000));
  const auto groups = m.Top30();
  ASSERT_FALSE(groups.empty());
  for (const auto& g : groups) {
    ASSERT_EQ(g.lists.size(), 4u);
    EXPECT_EQ(g.lists[0].listName, "TOPGAIN");
    EXPECT_EQ(g.lists[1].listName, "TOPLOSE");
    EXPECT_EQ(g.lists[2].listName, "TOPVOL");
    for (const auto& l : g.lists) EXPECT_LE(l.instruments.size(), 30u);
    double prev = 1e9;
    for (const auto& it : g.lists[0].instruments) {
      const int i = m.Find(it.productId, it.instrumentCode);
      ASSERT_GE(i, 0);
      const auto q = m.QuoteOf(i);
      const double pct = (q.last - q.close) / q.close;
      EXPECT_GT(pct, 0);
      EXPECT_LE(pct, prev);
      prev = pct;
    }
  }
}

TEST(Market, SessionClockFollowsTheTicksAcrossMidnight) {
  MarketConfig c = Config();
  c.sessionStartSeconds = 23 * 3600 + 59 * 60 + 30;
  Market m(c);
  EXPECT_EQ(m.DateText(), "2026-12-07");
  EXPECT_EQ(m.TimeText(), "23:59:30");
  m.AdvanceTo(45000);
  EXPECT_EQ(m.DateText(), "2026-12-08");
  EXPECT_EQ(m.TimeText(), "00:00:15");
}

TEST(Market, StepTablesFallBackToTheDefaultTable) {
  Market m(Config());
  EXPECT_DOUBLE_EQ(m.StepAt(0, 0.5), 0.005);
  EXPECT_DOUBLE_EQ(m.StepAt(0, 1.0, true), 0.01);
  EXPECT_DOUBLE_EQ(m.StepAt(0, 1.0, false), 0.005) << "downwards at a boundary the band below applies";
  EXPECT_DOUBLE_EQ(m.StepAt(2, 3500), 5);
  EXPECT_DOUBLE_EQ(m.StepAt(77, 0.5), 0.005) << "unknown table";
}

TEST(Market, EveryInstrumentReadsApartByItsTicker) {
  Market m(Config(11, 6000));
  std::set<std::string> symbols, labels;
  for (const auto& r : m.Instruments()) {
    // What the instrument box lists: name [exchange : symbol], the display code for CFDs and DMA.
    const std::string shown = r.productType == "CFD" || r.productType == "DMA" ? r.displayCode : r.symbol;
    EXPECT_TRUE(labels.insert(r.instrumentName + " [" + r.exchangeCode + " : " + shown + "]").second)
        << "listed twice: " << r.instrumentName << " " << r.exchangeCode << " " << shown;
    ASSERT_FALSE(r.symbol.empty()) << r.instrumentCode;
    EXPECT_LE(r.symbol.size(), 7u) << r.symbol;
    EXPECT_EQ(r.symbol.find(' '), std::string::npos) << r.symbol;
    EXPECT_EQ(r.symbol, r.displayCode) << "the symbol is the code traders type: " << r.instrumentCode;
    const bool ownMarket = r.instrumentCode.rfind("[KELDO]", 0) != 0 &&
                           (r.productType == "ES" || r.productType == "FUT" || r.productType == "FX" ||
                            r.productType == "IDX");
    if (ownMarket) {
      EXPECT_TRUE(symbols.insert(r.symbol).second) << "two instruments share " << r.symbol;
    }
    if (r.productType == "ES" && (r.exchangeCode == "NYSE" || r.exchangeCode == "NASDAQ" ||
                                  r.exchangeCode == "ASX" || r.exchangeCode == "LSE")) {
      // A ticker made from the company's name.
      EXPECT_GE(r.symbol.size(), 3u) << r.symbol;
      for (char c : r.symbol) EXPECT_TRUE(c >= 'A' && c <= 'Z') << r.symbol;
      const std::string name = r.instrumentName.rfind("O'", 0) == 0 ? r.instrumentName.substr(2) : r.instrumentName;
      EXPECT_EQ(r.symbol[0], std::toupper(static_cast<unsigned char>(name[0]))) << r.symbol << " " << r.instrumentName;
    }
  }
}

namespace {
// Best prices and top levels of a book, for comparing two moments.
struct Top {
  std::vector<sim::DepthLevel> levels;
  bool SameBest(const Top& o) const {
    return levels[0].bid == o.levels[0].bid && levels[0].ask == o.levels[0].ask;
  }
  int ChangedLevels(const Top& o) const {
    int n = 0;
    for (std::size_t k = 0; k < levels.size(); ++k) {
      const auto &a = levels[k], &b = o.levels[k];
      n += a.bid != b.bid || a.bidVolume != b.bidVolume || a.bidOrders != b.bidOrders;
      n += a.ask != b.ask || a.askVolume != b.askVolume || a.askOrders != b.askOrders;
    }
    return n;
  }
};
}  // namespace

TEST(Market, BookChangesTheWayRealBooksDo) {
  Market m(Config());
  const int i = m.LiquidStock();
  ASSERT_GE(i, 0);
  m.AddInterest(i);
  Top before{m.Book(i, 10)};
  std::size_t tradesBefore = m.Trades(i).size();
  int updates = 0, bestMoves = 0, fewLevels = 0, trades = 0, tradesAtTouch = 0;
  // One simulated minute, looked at after every step.
  for (std::uint32_t t = Market::kStepMs; t <= 60000; t += Market::kStepMs) {
    m.AdvanceTo(t);
    Top now{m.Book(i, 10)};
    const auto& tape = m.Trades(i);
    for (std::size_t k = tradesBefore; k < tape.size(); ++k) {
      ++trades;
      const auto& tr = tape[k];
      // A buy takes the best offer, a sell the best bid, as they stood before.
      if ((tr.side == 1 && tr.price == before.levels[0].ask) || (tr.side == 2 && tr.price == before.levels[0].bid))
        ++tradesAtTouch;
    }
    tradesBefore = tape.size();
    const int changed = now.ChangedLevels(before);
    if (changed > 0) {
      ++updates;
      if (!now.SameBest(before)) ++bestMoves;
      else if (changed <= 2) ++fewLevels;
    }
    before = std::move(now);
  }
  ASSERT_GT(updates, 100) << "a liquid stock updates several times a second";
  EXPECT_LT(bestMoves * 4, updates) << bestMoves << " of " << updates << " updates moved the best price";
  EXPECT_GT(bestMoves, 0) << "the best price moves now and then";
  EXPECT_GT(fewLevels * 2, updates) << "most updates change the size at one or two levels";
  ASSERT_GT(trades, 20);
  EXPECT_GE(tradesAtTouch * 100, trades * 97) << tradesAtTouch << " of " << trades << " trades at the best price";
  // Still a book: ordered, one step apart, sizes and orders that fit.
  const auto book = m.Book(i, 99);
  for (std::size_t k = 1; k < book.size(); ++k) {
    EXPECT_GT(book[k].ask, book[k - 1].ask);
    if (book[k].bid > 0) {
      EXPECT_LT(book[k].bid, book[k - 1].bid);
    }
    EXPECT_GE(book[k].askOrders, 1);
    EXPECT_LE(book[k].askOrders, book[k].askVolume);
  }
  EXPECT_LT(book[0].bid, book[0].ask);
  EXPECT_EQ(book[0].bidVolume, m.QuoteOf(i).bidVolume);
  EXPECT_EQ(book[0].askVolume, m.QuoteOf(i).askVolume);
}

TEST(Market, IndicesTickWithoutABookAndTheFirstStartHasALiquidStock) {
  Market m(Config());
  ASSERT_FALSE(m.WorldIndices().empty());
  const int index = m.WorldIndices().front();
  m.AddInterest(index);
  m.AdvanceTo(30000);
  EXPECT_GT(m.QuoteOf(index).last, 0);
  EXPECT_EQ(m.QuoteOf(index).bid, 0);
  EXPECT_EQ(m.FieldValue(index, "BID", 0, 0), "");
  EXPECT_EQ(m.FieldValue(index, "BUY", 1, 1), "") << "an index has no order book";
  for (const auto& level : m.Book(index, 5)) {
    EXPECT_EQ(level.bid, 0);
    EXPECT_EQ(level.ask, 0);
  }

  const int stock = m.LiquidStock();
  ASSERT_GE(stock, 0);
  const auto& r = m.Instruments()[stock];
  EXPECT_EQ(r.productType, "ES");
  EXPECT_EQ(r.exchangeCode, "SGX");
  EXPECT_EQ(r.accessStatus, 3);
  EXPECT_GT(m.QuoteOf(stock).trades, m.QuoteOf(BusyEquity(m)).trades / 2) << "one of the busiest";
  EXPECT_GT(m.Book(stock, 1)[0].bid, 0);
}

TEST(Market, APacedMarketTradesMoreOftenAndItsTapesHoldEveryTrade) {
  // The same watched instruments for ten simulated minutes at the market's own
  // pace and at ten times it: the paced one trades several times as often.
  std::size_t trades[2] = {0, 0};
  std::size_t bytes[2] = {0, 0};
  for (int k = 0; k < 2; ++k) {
    MarketConfig c = Config();
    c.pace = k == 0 ? 1.0 : 10.0;
    c.fieldUpdatesPerSecond = 40000;
    Market m(c);
    const int i = BusyEquity(m);
    std::vector<int> watched{i};
    for (int j = 0; j < int(m.Instruments().size()) && watched.size() < 10; j += 97)
      if (m.Instruments()[j].productType == "ES" && j != i) watched.push_back(j);
    for (int w : watched) m.AddInterest(w);
    const std::size_t before = m.TapeBytes();
    std::size_t start = 0;
    for (int w : watched) start += m.Trades(w).size();
    m.AdvanceTo(600 * 1000);
    for (int w : watched) trades[k] += m.Trades(w).size();
    trades[k] -= start;
    bytes[k] = m.TapeBytes() - before;
    EXPECT_GE(m.TapeBytes(), (start + trades[k]) * sizeof(sim::Trade));
  }
  EXPECT_GT(trades[0], 0u);
  EXPECT_GT(trades[1], 4 * trades[0]) << trades[0] << " vs " << trades[1];
  EXPECT_GT(bytes[1], bytes[0]);
}
