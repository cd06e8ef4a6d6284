#include "terminal/sim/Market.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cmath>
#include <cstdio>
#include <limits>
#include <map>
#include <memory>
#include <numeric>
#include <unordered_map>
#include <unordered_set>

namespace sim {
namespace {

// Without surrounding blanks (space, tab, CR, LF).
std::string TrimBlanks(std::string_view s) {
  const auto blank = [](char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; };
  std::size_t b = 0, e = s.size();
  while (b < e && blank(s[b])) ++b;
  while (e > b && blank(s[e - 1])) --e;
  return std::string(s.substr(b, e - b));
}

// splitmix64: a tiny, well-mixed generator whose output depends only on the
// seed, so streams can be re-created (the tape of an instrument is generated
// twice: once as a summary at start, once in full when someone asks).
std::uint64_t Mix(std::uint64_t x) {
  x += 0x9E3779B97F4A7C15ull;
  x = (x ^ (x >> 30)) * 0xBF58476D1CE4E5B9ull;
  x = (x ^ (x >> 27)) * 0x94D049BB133111EBull;
  return x ^ (x >> 31);
}

struct Rng {
  std::uint64_t s;
  explicit Rng(std::uint64_t seed) : s(seed) {}
  std::uint64_t Next() { return Mix(s += 0x9E3779B97F4A7C15ull); }
  double Uniform() { return double(Next() >> 11) * (1.0 / 9007199254740992.0); }
  int Range(int lo, int hi) { return lo + int(Next() % std::uint64_t(hi - lo + 1)); }
  bool Chance(double p) { return Uniform() < p; }
  // Sum of four uniforms: close enough to a normal and identical on every platform.
  double Normal() { return (Uniform() + Uniform() + Uniform() + Uniform() - 2.0) * 1.7320508; }
};

std::uint64_t StreamSeed(std::uint64_t seed, std::uint64_t index, std::uint64_t salt) {
  return Mix(seed ^ Mix(index * 0x100000001B3ull + salt));
}

// Days since 1970-01-01 for a civil date and back (proleptic Gregorian).
long DaysFromCivil(int y, unsigned m, unsigned d) {
  y -= m <= 2;
  const long era = (y >= 0 ? y : y - 399) / 400;
  const unsigned yoe = unsigned(y - era * 400);
  const unsigned doy = (153 * (m + (m > 2 ? -3 : 9)) + 2) / 5 + d - 1;
  const unsigned doe = yoe * 365 + yoe / 4 - yoe / 100 + doy;
  return era * 146097 + long(doe) - 719468;
}
void CivilFromDays(long z, int& y, unsigned& m, unsigned& d) {
  z += 719468;
  const long era = (z >= 0 ? z : z - 146096) / 146097;
  const unsigned doe = unsigned(z - era * 146097);
  const unsigned yoe = (doe - doe / 1460 + doe / 36524 - doe / 146096) / 365;
  y = int(yoe) + int(era) * 400;
  const unsigned doy = doe - (365 * yoe + yoe / 4 - yoe / 100);
  const unsigned mp = (5 * doy + 2) / 153;
  d = doy - (153 * mp + 2) / 5 + 1;
  m = mp < 10 ? mp + 3 : mp - 9;
  y += m <= 2;
}

std::string Fixed(double v, int decimals) {
  char buf[64];
  std::snprintf(buf, sizeof buf, "%.*f", decimals, v);
  // "-0.000" reads oddly in a change column.
  if (buf[0] == '-') {
    bool zero = true;
    for (const char* p = buf + 1; *p; ++p) if (*p >= '1' && *p <= '9') { zero = false; break; }
    if (zero) return std::string(buf + 1);
  }
  return buf;
}

std::string Clock(std::uint32_t ms) {
  char buf[16];
  const unsigned s = (ms / 1000) % 86400;
  std::snprintf(buf, sizeof buf, "%02u:%02u:%02u", s / 3600, (s / 60) % 60, s % 60);
  return buf;
}

// Codes from a counter through a bijective scramble, so that neighbours do not
// look sequential and no two instruments of an exchange share a code.
std::uint64_t Scramble(std::uint64_t n, std::uint64_t space) { return (n * 7919 + 331) % space; }

std::string Letters(const std::string& text) {
  std::string out;
  for (char c : text)
    if (std::isalpha(static_cast<unsigned char>(c))) out.push_back(char(std::toupper(static_cast<unsigned char>(c))));
  return out;
}

// A ticker made from a company's name ("Marwick Engineering" -> "MARW",
// "MARE", "MRWC", ...): the first free one of a few readable shapes, then one
// of them with letters added. `taken` holds every code already in use.
std::string Ticker(const std::string& stem, const std::string& word, std::unordered_set<std::string>& taken) {
  const std::string s = Letters(stem), w = Letters(word.substr(0, word.find(' ')));
  std::string skeleton = s.substr(0, 1);
  for (std::size_t k = 1; k < s.size(); ++k)
    if (std::string("AEIOU").find(s[k]) == std::string::npos) skeleton.push_back(s[k]);
  const std::string shapes[] = {s.substr(0, 4), s.substr(0, 3) + w.substr(0, 1), skeleton.substr(0, 4),
                                s.substr(0, 2) + w.substr(0, 2), skeleton.substr(0, 3) + w.substr(0, 1),
                                s.substr(0, 3)};
  for (const std::string& t : shapes)
    if (t.size() >= 3 && taken.insert(t).second) return t;
  const std::string stemOf = s.substr(0, 3);
  for (int len = 1; len <= 3; ++len) {
    std::uint64_t space = 1;
    for (int k = 0; k < len; ++k) space *= 26;
    for (std::uint64_t v = 0; v < space; ++v) {
      std::string t = stemOf;
      for (std::uint64_t x = v, k = 0; k < std::uint64_t(len); ++k, x /= 26) t.push_back(char('A' + x % 26));
      if (taken.insert(t).second) return t;
    }
  }
  for (int k = 2;; ++k)  // not reached below 18,000 names per stem
    if (taken.insert(stemOf + std::to_string(k)).second) return stemOf + std::to_string(k);
}

// Company names are unique; a repeated one becomes another company of the group.
std::string UniqueName(const std::string& name, const std::string& code, std::unordered_set<std::string>& taken) {
  for (const char* suffix : {"", " Holdings", " Group", " International", " Partners", " Corporation"})
    if (taken.insert(name + suffix).second) return name + suffix;
  const std::string fallback = name + " (" + code + ")";
  taken.insert(fallback);
  return fallback;
}

// Letter, digit, letter-or-digit: never all letters, so never another
// exchange's code.
std::string SgxCode(std::uint64_t n) {
  static const char* alnum = "0123456789ABCDEFGHIJKLMNOPQRSTUVWXYZ";
  std::uint64_t space = 26 * 10 * 36;
  int len = 3;
  while (n >= space) { n -= space; space *= 36; ++len; }
  std::uint64_t v = Scramble(n, space);
  std::string s(len, '0');
  for (int i = len - 1; i >= 2; --i) { s[i] = alnum[v % 36]; v /= 36; }
  s[1] = char('0' + v % 10);
  v /= 10;
  s[0] = char('A' + v % 26);
  return s;
}

std::string DigitCode(std::uint64_t n, std::uint64_t first, std::uint64_t last, int width) {
  const std::uint64_t space = last - first + 1;
  char buf[24];
  if (n < space) {
    std::snprintf(buf, sizeof buf, "%0*llu", width, static_cast<unsigned long long>(first + Scramble(n, space)));
  } else {
    std::snprintf(buf, sizeof buf, "%0*llu", width + 2, static_cast<unsigned long long>(n - space));
  }
  return buf;
}

const char* kSyllA[] = {"Mar", "Kel", "Vor", "Sin", "Tai", "Lum", "Or", "Bel", "Cas", "Dra", "Ever", "Fal", "Gran",
                        "Hal", "Jin", "Kor", "Lin", "Nor", "Pac", "Quin", "Ros", "Sol", "Tor", "Ul", "Ver", "Wes",
                        "Yan", "Zen", "Ar", "Bri", "Cor", "Del", "Est", "Fen", "Gal", "Hor", "Ith", "Jar"};
const char* kSyllB[] = {"ton", "ex", "ia", "ar", "on", "is", "ova", "ent", "ark", "um", "ella", "ion", "ford", "wick",
                        "mere", "gate", "ridge", "stone", "field", "ley"};

struct SectorDef { const char* code; const char* name; const char* words[3]; };
const SectorDef kSectors[] = {
    {"FIN", "Finance", {"Bank", "Capital", "Financial Group"}},
    {"TEC", "Technology", {"Technologies", "Systems", "Digital"}},
    {"IND", "Industrials", {"Industries", "Engineering", "Logistics"}},
    {"CON", "Consumer", {"Retail", "Foods", "Brands"}},
    {"ENE", "Energy", {"Energy", "Oil & Gas", "Power"}},
    {"HLT", "Healthcare", {"Healthcare", "Pharma", "Medical"}},
    {"PRP", "Property", {"Properties", "Land", "REIT"}},
    {"UTL", "Utilities", {"Utilities", "Water", "Gas"}},
    {"TEL", "Telecommunications", {"Telecom", "Networks", "Communications"}},
    {"MAT", "Materials", {"Resources", "Mining", "Chemicals"}},
};

struct ExchangeDef {
  const char* code; const char* market; const char* name; std::int64_t product; int delay;
  int table; int decimals; double refLo, refHi; const char* currency; double weight;
};
// Equity exchanges first (their order is the order of the TOP30 groups).
const ExchangeDef kExchanges[] = {
    {"SGX", "SGX", "Singapore Exchange", 101, 0, 0, 3, 0.05, 40.0, "SGD", 0.25},
    {"SEHK", "HKEX", "Stock Exchange of Hong Kong", 101, 15, 1, 3, 0.3, 600.0, "HKD", 0.25},
    {"TSE", "TSE", "Tokyo Stock Exchange", 101, 20, 2, 0, 150.0, 25000.0, "JPY", 0.15},
    {"ASX", "ASX", "Australian Securities Exchange", 101, 20, 4, 3, 0.08, 120.0, "AUD", 0.10},
    {"NYSE", "NYSE", "New York Stock Exchange", 101, 15, 3, 2, 3.0, 600.0, "USD", 0.10},
    {"NASDAQ", "NASDAQ", "Nasdaq Stock Market", 101, 15, 3, 2, 2.0, 900.0, "USD", 0.10},
    {"LSE", "LSE", "London Stock Exchange", 101, 15, 5, 2, 20.0, 6000.0, "GBP", 0.05},
    {"SGXDT", "SGX-DT", "SGX Derivatives Trading", 104, 0, 9, 0, 0, 0, "USD", 0},
    {"HKFE", "HKFE", "Hong Kong Futures Exchange", 104, 15, 9, 0, 0, 0, "HKD", 0},
    {"FXM", "FX", "Foreign Exchange Market", 105, 0, 6, 4, 0, 0, "USD", 0},
    {"WIDX", "World Indices", "World Indices", 107, 15, 8, 2, 0, 0, "", 0},
};
constexpr int kEquityExchanges = 7;

struct FixedDef { const char* code; const char* name; double price; int decimals; int table; };
const FixedDef kIndices[] = {
    {"STI", "Straits Times Index", 3520.15, 2, 8},      {"HSI", "Hang Seng Index", 19875.40, 2, 8},
    {"N225", "Nikkei 225", 39120.55, 2, 8},             {"TOPIX", "TOPIX", 2735.20, 2, 8},
    {"SPX", "S&P 500", 6015.30, 2, 8},                  {"DJI", "Dow Jones Industrial Average", 44210.75, 2, 8},
    {"IXIC", "Nasdaq Composite", 19680.10, 2, 8},       {"FTSE", "FTSE 100", 8290.45, 2, 8},
    {"DAX", "DAX 40", 20105.60, 2, 8},                  {"CAC", "CAC 40", 7390.25, 2, 8},
    {"KOSPI", "KOSPI Composite", 2455.80, 2, 8},        {"AXJO", "S&P/ASX 200", 8420.35, 2, 8},
    {"TWII", "Taiwan Weighted", 22950.10, 2, 8},        {"SSEC", "Shanghai Composite", 3390.65, 2, 8},
};
const FixedDef kFx[] = {
    {"EURUSD", "Euro / US Dollar", 1.0825, 4, 6},       {"GBPUSD", "Pound Sterling / US Dollar", 1.2710, 4, 6},
    {"USDJPY", "US Dollar / Japanese Yen", 151.42, 2, 7}, {"AUDUSD", "Australian Dollar / US Dollar", 0.6535, 4, 6},
    {"USDSGD", "US Dollar / Singapore Dollar", 1.3420, 4, 6}, {"USDHKD", "US Dollar / Hong Kong Dollar", 7.7820, 4, 6},
    {"USDCHF", "US Dollar / Swiss Franc", 0.8845, 4, 6}, {"USDCAD", "US Dollar / Canadian Dollar", 1.3990, 4, 6},
    {"NZDUSD", "New Zealand Dollar / US Dollar", 0.5905, 4, 6}, {"EURJPY", "Euro / Japanese Yen", 163.95, 2, 7},
    {"EURGBP", "Euro / Pound Sterling", 0.8515, 4, 6},  {"SGDJPY", "Singapore Dollar / Japanese Yen", 112.80, 2, 7},
    {"USDCNH", "US Dollar / Offshore Yuan", 7.2530, 4, 6}, {"XAUUSD", "Gold / US Dollar", 2655.40, 2, 11},
};
struct FutureDef { const char* root; const char* name; const char* exchange; double price; int decimals; int table; };
const FutureDef kFutures[] = {
    {"SGP", "SGX FTSE Singapore Index Futures", "SGXDT", 352.0, 2, 11},
    {"NK", "SGX Nikkei 225 Index Futures", "SGXDT", 39100.0, 0, 9},
    {"CN", "SGX FTSE China A50 Futures", "SGXDT", 13150.0, 0, 9},
    {"IN", "SGX Nifty 50 Index Futures", "SGXDT", 24300.0, 1, 10},
    {"HSI", "Hang Seng Index Futures", "HKFE", 19860.0, 0, 9},
    {"HHI", "Hang Seng China Enterprises Futures", "HKFE", 7150.0, 0, 9},
    {"FEF", "SGX Iron Ore CFR China Futures", "SGXDT", 104.5, 2, 11},
    {"RT", "SGX SICOM Rubber Futures", "SGXDT", 182.3, 1, 10},
};
const char* kMonths[] = {"JAN", "FEB", "MAR", "APR", "MAY", "JUN", "JUL", "AUG", "SEP", "OCT", "NOV", "DEC"};
const char kMonthCodes[] = "FGHJKMNQUVXZ";

const char* kRemarks[] = {"", "CD", "XD", "XR", "SUSP", "NEW", "CA"};
const char* kRemarkTexts[] = {"", "Cum dividend", "Ex dividend", "Ex rights", "Suspended", "Newly listed",
                              "Corporate action"};
const char* kLsStatus[] = {"L/S", "L/-", "-/S", "-/-", "Call"};

}  // namespace

// Static facts about one instrument beyond its reference record.
struct InstInfo {
  int alias = -1;          // instruments sharing another's market (CFD, DMA, brand twins)
  float activity = 1.0f;   // events per second when watched
  std::int32_t table = 0;
  std::int32_t decimals = 2;
  std::int32_t spread = 1; // usual spread in steps
  std::int32_t lot = 100;
  double ref = 1.0;
  std::int8_t month = -1;  // futures: contract month 0..11
  std::int16_t year = 0;
  std::int8_t cfd = 0, dma = 0;
  bool equity = false;     // ranked in the TOP30 lists
  bool index = false;      // a computed value: ticks, no book
  std::uint8_t exchange = 0;
};

// The market state of a base instrument (aliases read their base's).
struct State {
  double bid = 0, ask = 0, last = 0, open = 0, high = 0, low = 0, close = 0, turnover = 0;
  std::int64_t bidVol = 0, askVol = 0, volume = 0;
  std::int32_t trades = 0;
  std::uint32_t version = 0;
  std::uint32_t lastTradeMs = 0;
  std::int8_t remark = 0;
  bool materialized = false;
};

struct Market::Impl {
  MarketConfig config;
  std::vector<JProduct> products;
  std::vector<JExchangeList> exchanges;
  std::vector<JInstrumentUnderlying> instruments;
  std::vector<InstInfo> info;
  std::vector<State> state;
  // The tapes' chunks come from large blocks of their own, so a day of trades
  // leaves no free gaps between the heap's other allocations.
  std::pmr::unsynchronized_pool_resource tapeMemory{std::pmr::pool_options{4096, 512}};
  std::vector<std::unique_ptr<Tape>> tapes;  // made when an instrument is first watched
  std::vector<TickBand> bands;
  std::vector<JSector> sectors;
  std::vector<JRemarkMessage> remarks;
  std::vector<BrandWatchlist> brands;
  std::vector<StarterWatchlist> starters;
  std::map<std::pair<std::int64_t, std::string>, int, std::less<>> byKey;
  std::unordered_map<std::string, int> byCode, byChart;
  std::unordered_map<int, std::vector<int>> aliasesOf;
  // The products listed on each exchange (by its code without blanks): a
  // handful each, so an exchange and a code find an instrument through byKey.
  std::map<std::string, std::vector<std::int64_t>, std::less<>> productsOn;
  std::vector<int> bases;  // instruments with their own market
  std::vector<int> interest;
  std::vector<int> hot;    // sorted base indices with interest
  bool hotDirty = false;
  int interestTotal = 0;
  std::vector<std::uint8_t> dirty;
  std::vector<int> dirtyList;
  std::vector<int> priceWatch;  // per base index: watchers of its prices
  PriceListener priceListener;
  Rng rng{0};
  std::uint32_t now = 0;
  std::uint64_t elapsedMs = 0;  // since the start of the session
  long startDay = 0;
  std::uint32_t startMs = 0;
  std::uint32_t openMs = 9 * 3600 * 1000;
  double historyScale = 1.0;
  float maxActivity = 1.0f;
  // TOP30 cache.
  std::vector<JTop30Group> top30;
  std::uint64_t top30At = ~0ull;
  // Summary cache per instrument: trade count it was built from.
  std::unordered_map<int, std::pair<std::int32_t, std::vector<SummaryLine>>> summaries;

  int Base(int i) const { return info[i].alias >= 0 ? info[i].alias : i; }
  std::uint32_t TimeOfDay() const { return std::uint32_t((startMs + elapsedMs) % 86400000ull); }
  long Day() const { return startDay + long((startMs + elapsedMs) / 86400000ull); }

  // Bands grouped by table, for the lookups of the walk.
  std::vector<std::vector<TickBand>> bandsByTable;
  std::array<double, 11> pow10{};

  double StepIn(const std::vector<TickBand>& list, double price, bool up) const {
    const double eps = 1e-9;
    for (const TickBand& b : list)
      if (up ? (b.lower <= price + eps && b.upper > price + eps) : (b.lower < price - eps && b.upper >= price - eps))
        return b.step;
    return 0;
  }
  double Step(std::int32_t table, double price, bool up) const {
    if (table > 0 && table < std::int32_t(bandsByTable.size())) {
      const double st = StepIn(bandsByTable[std::size_t(table)], price, up);
      if (st > 0) return st;
    }
    const double st = bandsByTable.empty() ? 0 : StepIn(bandsByTable[0], price, up);
    return st > 0 ? st : 0.01;
  }
  double Snap(int i, double price) const {
    const double step = Step(info[i].table, price, true);
    double p = std::round(price / step) * step;
    if (p < step) p = step;
    const double scale = pow10[std::size_t(std::clamp(info[i].decimals, 0, 10))];
    return std::round(p * scale) / scale;
  }

  void MarkDirty(int base, std::uint8_t bits) {
    auto mark = [&](int k) {
      if (!dirty[k]) dirtyList.push_back(k);
      dirty[k] |= bits;
    };
    mark(base);
    auto it = aliasesOf.find(base);
    if (it != aliasesOf.end()) for (int a : it->second) mark(a);
  }

  void Build();
  void AddInstrument(JInstrumentUnderlying rec, InstInfo inf);
  // One trade move of the walk: the new price and side from the current state.
  Trade NextTrade(int i, State& s, Rng& r, std::uint32_t timeMs) const;
  void ApplyTrade(int i, State& s, const Trade& t, Rng& r) const;
  void History(int i, State& s, Tape* tape) const;
  void Materialize(int i) {
    State& s = state[i];
    if (s.materialized) return;
    State scratch;
    if (!tapes[i]) tapes[i] = std::make_unique<Tape>(&tapeMemory);
    History(i, scratch, tapes[i].get());
    s.materialized = true;
  }
  void Event(int i, Rng& r);
  void StepOnce();

  // Name and remark changes, from their own stream.
  Rng eventRng{0};
  std::unordered_map<int, std::string> names;  // current names that differ from the reference records
  std::unordered_set<std::string> takenNames;  // every name in use; made on the first rename
  int corporateEvents = 0;
  const std::string& CurrentName(int i) const {
    auto it = names.find(i);
    return it == names.end() ? instruments[std::size_t(i)].instrumentName : it->second;
  }
  void CorporateEvent();
  void Rename(int b);
  void ChangeRemark(int b);

  // The order book. An instrument someone watches keeps a book of its own
  // from the moment interest first arrives (so the same interest changes give
  // the same market); the others keep only their best prices and sizes, and
  // their deeper levels are drawn from the price, so they stay put while the
  // price does.
  struct Level {
    double price = 0;
    std::int64_t size = 0;
    std::int32_t orders = 0;
  };
  struct LiveBook {
    std::vector<Level> bids, asks;  // best first; prices one step apart
  };
  std::unordered_map<int, LiveBook> books;
  std::int64_t DrawnSize(int b, double price, int level, int side) const;
  std::int32_t DrawnOrders(int b, std::int64_t size, int level, int side) const;
  // Level 1 from the state, the rest drawn; up to `levels` per side.
  LiveBook DrawBook(int b, int levels) const;
  // Tops both sides up to `levels` at their far ends.
  void Refill(int b, LiveBook& book, int levels) const;
  // Where the walk leans: steps up (> 0) or down (< 0) from the middle.
  int Lean(int i, const State& s, Rng& r) const;
  // Last, day range, volume and turnover after a trade.
  static void RecordTrade(State& s, const Trade& t);
};

void Market::Impl::AddInstrument(JInstrumentUnderlying rec, InstInfo inf) {
  const int idx = int(instruments.size());
  byKey.emplace(std::make_pair(rec.productId, rec.instrumentCode), idx);
  byCode.emplace(rec.instrumentCode, idx);
  byChart.emplace(rec.chartCode, idx);
  std::vector<std::int64_t>& products = productsOn[TrimBlanks(rec.exchangeCode)];
  if (std::find(products.begin(), products.end(), rec.productId) == products.end()) products.push_back(rec.productId);
  if (inf.alias >= 0) aliasesOf[inf.alias].push_back(idx);
  instruments.push_back(std::move(rec));
  info.push_back(inf);
}

void Market::Impl::Build() {
  products = {
      {101, "ES", "Equities", ""}, {102, "CS", "Cash Securities", ""}, {103, "CFD", "Contracts for Difference", ""},
      {104, "FUT", "Futures", ""}, {105, "FX", "Foreign Exchange", ""}, {106, "DMA", "Direct Market Access", ""},
      {107, "IDX", "Indices", ""},
  };
  for (JProduct& p : products) p.pictureFile = ".\\images\\Products\\" + p.productType + ".bmp";
  for (const ExchangeDef& e : kExchanges) exchanges.push_back({e.code, e.market, e.name, e.product});
  for (const SectorDef& s : kSectors) sectors.push_back({s.code, s.name});
  for (const ExchangeDef& e : kExchanges) {
    if (std::string(e.code) == "WIDX" || std::string(e.code) == "FXM") continue;
    for (int k = 1; k < int(std::size(kRemarks)); ++k) remarks.push_back({e.code, kRemarks[k], kRemarkTexts[k]});
  }
  // Price-step tables: 0 is the default (and the fallback of every other table).
  const double top = 1e9;
  bands = {
      {0, 0, 0.2, 0.001},   {0, 0.2, 1, 0.005},    {0, 1, top, 0.01},
      {1, 0, 0.25, 0.001},  {1, 0.25, 0.5, 0.005}, {1, 0.5, 10, 0.01},   {1, 10, 20, 0.02},  {1, 20, 100, 0.05},
      {1, 100, 200, 0.1},   {1, 200, 500, 0.2},    {1, 500, 1000, 0.5},  {1, 1000, 2000, 1}, {1, 2000, 5000, 2},
      {1, 5000, top, 5},
      {2, 0, 3000, 1},      {2, 3000, 5000, 5},    {2, 5000, 30000, 10}, {2, 30000, 50000, 50}, {2, 50000, top, 100},
      {3, 0, 1, 0.0001},    {3, 1, top, 0.01},
      {4, 0, 0.1, 0.001},   {4, 0.1, 2, 0.005},    {4, 2, top, 0.01},
      {5, 0, 100, 0.05},    {5, 100, 1000, 0.5},   {5, 1000, top, 1},
      {6, 0, top, 0.0001},  {7, 0, top, 0.01},     {8, 0, top, 0.01},
      {9, 0, top, 1},       {10, 0, top, 0.1},     {11, 0, top, 0.01},
  };
  for (const TickBand& b : bands) {
    if (std::size_t(b.tableId) >= bandsByTable.size()) bandsByTable.resize(std::size_t(b.tableId) + 1);
    bandsByTable[std::size_t(b.tableId)].push_back(b);
  }
  for (std::size_t k = 0; k < pow10.size(); ++k) pow10[k] = std::pow(10.0, double(k));

  Rng r(StreamSeed(config.seed, 0, 0xA11CE));
  const int total = std::clamp(config.instruments, 60, 500000);
  historyScale = std::min(1.0, 20000.0 / double(total));

  auto exIndex = [](const char* code) {
    for (int k = 0; k < int(std::size(kExchanges)); ++k) if (std::string(kExchanges[k].code) == code) return k;
    return 0;
  };
  auto base = [&](const std::string& code, const std::string& name, const std::string& symbol, int ex,
                  std::int64_t product, const char* productType, int decimals, int table, double ref,
                  const std::string& sector) {
    JInstrumentUnderlying rec;
    rec.exchangeCode = kExchanges[ex].code;
    rec.instrumentCode = code;
    rec.productId = product;
    rec.instrumentName = name;
    rec.symbol = symbol;
    rec.decimals = decimals;
    rec.displayCode = code;
    rec.sector = sector;
    rec.priceStepTableId = table;
    rec.referencePrice = ref;
    rec.chartCode = std::string(kExchanges[ex].code) + ":" + code + (product == 101 ? "" : std::string(".") + productType);
    rec.currency = kExchanges[ex].currency;
    rec.productType = productType;
    return rec;
  };

  // World indices.
  for (const FixedDef& f : kIndices) {
    // An index is a computed value: viewable, not tradeable, without an order book.
    JInstrumentUnderlying rec = base(f.code, f.name, f.code, exIndex("WIDX"), 107, "IDX", f.decimals, f.table, f.price, "");
    rec.lotSize = 1;
    rec.accessStatus = 1;
    rec.altAccessStatus = 1;
    InstInfo inf;
    inf.activity = 1.5f; inf.table = f.table; inf.decimals = f.decimals; inf.lot = 1; inf.ref = f.price;
    inf.index = true;
    inf.exchange = std::uint8_t(exIndex("WIDX"));
    AddInstrument(rec, inf);
  }
  // Currencies.
  for (const FixedDef& f : kFx) {
    JInstrumentUnderlying rec = base(f.code, f.name, f.code, exIndex("FXM"), 105, "FX", f.decimals, f.table, f.price, "");
    rec.lotSize = 1000;
    rec.maxQty1 = 10000000;
    rec.maxQty2 = 5000000;
    InstInfo inf;
    inf.activity = 2.5f; inf.table = f.table; inf.decimals = f.decimals; inf.lot = 1000; inf.ref = f.price;
    inf.spread = 2; inf.exchange = std::uint8_t(exIndex("FXM"));
    AddInstrument(rec, inf);
  }
  // Futures: the front three contract months of each root, from the session month on.
  int year = 0; unsigned month = 0, day = 0;
  CivilFromDays(startDay, year, month, day);
  for (const FutureDef& f : kFutures) {
    for (int k = 0; k < 3; ++k) {
      const int m = int(month - 1 + k) % 12;
      const int y = year + int(month - 1 + k) / 12;
      char code[32];
      std::snprintf(code, sizeof code, "%s%c%d", f.root, kMonthCodes[m], y % 10);
      char name[128];
      std::snprintf(name, sizeof name, "%s %s %d", f.name, kMonths[m], y);
      const double ref = f.price * (1.0 + 0.002 * k);
      // Traders type the contract code ("NKZ6"), not the root.
      JInstrumentUnderlying rec = base(code, name, code, exIndex(f.exchange), 104, "FUT", f.decimals, f.table, ref, "");
      rec.lotSize = 1;
      rec.maxQty1 = 500;
      rec.maxQty2 = 200;
      InstInfo inf;
      inf.activity = k == 0 ? 2.5f : 0.6f; inf.table = f.table; inf.decimals = f.decimals; inf.lot = 1;
      inf.ref = ref; inf.month = std::int8_t(m); inf.year = std::int16_t(y);
      inf.exchange = std::uint8_t(exIndex(f.exchange));
      AddInstrument(rec, inf);
    }
  }
  const int fixedCount = int(instruments.size());
  // Equities, with CFD, DMA and cash-security twins of some of them and a few
  // brand-list twins ("[KELDO]" codes).
  const int remaining = std::max(20, total - fixedCount - 24);
  const int equities = std::max(16, int(remaining / 1.35));
  const int twins = remaining - equities;
  std::vector<std::uint64_t> counters(std::size(kExchanges), 0);
  std::unordered_set<std::string> names, codes;
  for (const JInstrumentUnderlying& rec : instruments) {
    names.insert(rec.instrumentName);
    codes.insert(rec.instrumentCode);  // no stock shares a ticker with an index, a currency or a future
  }
  for (int k = 0; k < equities; ++k) {
    double pick = r.Uniform();
    int ex = 0;
    for (int e = 0; e < kEquityExchanges; ++e) {
      pick -= kExchanges[e].weight;
      if (pick < 0) { ex = e; break; }
      ex = e;
    }
    const ExchangeDef& E = kExchanges[ex];
    const std::uint64_t n = counters[ex]++;
    const SectorDef& sec = kSectors[r.Range(0, int(std::size(kSectors)) - 1)];
    const std::string stem = std::string(kSyllA[r.Range(0, int(std::size(kSyllA)) - 1)]) +
                             kSyllB[r.Range(0, int(std::size(kSyllB)) - 1)];
    const std::string word = sec.words[r.Range(0, 2)];
    std::string name = stem + " " + word;
    const double style = r.Uniform();
    if (style < 0.04) name = stem + " & Sons " + sec.words[0];
    else if (style < 0.06) name = "O'" + stem + " " + sec.words[1];
    else if (style < 0.20) name += E.product == 101 && ex >= 4 ? " Inc" : " Ltd";
    // Codes are unique per product (the key of an instrument). The letter-coded
    // exchanges list tickers made from the company's name, as real ones do.
    std::string code;
    if (ex == 0) code = SgxCode(n);
    else if (ex == 1) code = DigitCode(n, 1, 99999, 5);
    else if (ex == 2) code = DigitCode(n, 1300, 9999, 4);
    if (code.empty()) code = Ticker(stem, word, codes);
    else while (!codes.insert(code).second) code += 'X';
    name = UniqueName(name, code, names);
    const double ref = E.refLo * std::pow(E.refHi / E.refLo, std::pow(r.Uniform(), 1.3));
    JInstrumentUnderlying rec = base(code, name, code, ex, 101, "ES", E.decimals, E.table, 0, sec.code);
    InstInfo inf;
    const double u = r.Uniform();
    inf.activity = float(0.05 + 3.0 * u * u * u);
    inf.table = E.table; inf.decimals = E.decimals;
    inf.lot = ex == 2 || ex == 1 ? 100 : (ex >= 4 ? 1 : 100);
    inf.equity = true;
    inf.exchange = std::uint8_t(ex);
    inf.spread = inf.activity > 1.0f ? 1 : r.Range(1, 3);
    inf.ref = ref;
    // Snap the reference to the exchange's step.
    rec.referencePrice = ref;
    rec.lotSize = inf.lot;
    rec.maxQty1 = inf.lot * 5000;
    rec.maxQty2 = inf.lot * 1000;
    rec.isin = std::string(ex == 0 ? "SG" : ex == 1 ? "HK" : ex == 2 ? "JP" : ex == 3 ? "AU" : ex == 6 ? "GB" : "US") +
               DigitCode(n * 31 + 7, 1, 9999, 4) + code;
    const double a = r.Uniform();
    if (a < 0.01) rec.accessStatus = 0;       // neither
    else if (a < 0.03) rec.accessStatus = 2;  // tradeable, not viewable
    else if (a < 0.07) rec.accessStatus = 1;  // view only
    rec.altAccessStatus = r.Chance(0.05) ? 1 : rec.accessStatus;
    inf.cfd = std::int8_t(r.Range(0, 4));
    inf.dma = std::int8_t(r.Chance(0.8) ? 0 : r.Range(1, 3));
    AddInstrument(rec, inf);
  }
  // Snap references now that the tables are known.
  for (int i = 0; i < int(instruments.size()); ++i) {
    info[i].ref = Snap(i, info[i].ref);
    instruments[i].referencePrice = info[i].ref;
  }
  const int firstEquity = fixedCount;
  const int lastEquity = int(instruments.size());
  // CFD, DMA and cash twins share their underlying's market.
  const char* twinTypes[] = {"CFD", "DMA", "CS"};
  const std::int64_t twinProducts[] = {103, 106, 102};
  const int twinTarget = int(instruments.size()) + twins;
  for (int k = 0; int(instruments.size()) < twinTarget && k < twins * 4; ++k) {
    const int t = k % 3;
    const int of = firstEquity + int((std::uint64_t(k) * 2654435761ull) % std::uint64_t(lastEquity - firstEquity));
    if (byKey.count(std::make_pair(twinProducts[t], instruments[of].instrumentCode))) continue;
    JInstrumentUnderlying rec = instruments[of];
    rec.productId = twinProducts[t];
    rec.productType = twinTypes[t];
    rec.chartCode = rec.exchangeCode + ":" + rec.instrumentCode + "." + twinTypes[t];
    // Each twin reads apart from its underlying wherever a list shows them side by side.
    rec.instrumentName += t == 0 ? " CFD" : t == 1 ? " DMA" : " Cash";
    InstInfo inf = info[of];
    inf.alias = of;
    inf.equity = false;
    AddInstrument(rec, inf);
  }
  // Brand-list twins of the most active Singapore, Hong Kong and Australian names.
  std::vector<int> brandPool;
  for (int i = firstEquity; i < lastEquity; ++i)
    if (info[i].exchange == 0 || info[i].exchange == 1 || info[i].exchange == 3) brandPool.push_back(i);
  std::stable_sort(brandPool.begin(), brandPool.end(), [&](int a, int b) { return info[a].activity > info[b].activity; });
  if (brandPool.size() > 24) brandPool.resize(24);
  std::vector<int> brandTwins;
  for (int of : brandPool) {
    JInstrumentUnderlying rec = instruments[of];
    rec.instrumentCode = "[KELDO]" + rec.instrumentCode;
    rec.chartCode = rec.exchangeCode + ":" + instruments[of].instrumentCode + ".KELDO";
    rec.instrumentName += " (Brantic)";
    rec.accessStatus = 3;
    rec.altAccessStatus = 3;
    InstInfo inf = info[of];
    inf.alias = of;
    inf.equity = false;
    brandTwins.push_back(int(instruments.size()));
    AddInstrument(rec, inf);
  }
  const int n = int(instruments.size());
  for (int i = 0; i < n; ++i) {
    if (info[i].alias < 0) bases.push_back(i);
    maxActivity = std::max(maxActivity, info[i].activity);
  }
  state.assign(n, State{});
  tapes.clear();
  tapes.resize(n);
  interest.assign(n, 0);
  dirty.assign(n, 0);
  priceWatch.assign(n, 0);
  for (int i : bases) {
    History(i, state[i], nullptr);
    Rng rr(StreamSeed(config.seed, std::uint64_t(i), 0xBEEF));
    if (rr.Chance(0.06)) state[i].remark = std::int8_t(rr.Range(1, int(std::size(kRemarks)) - 1));
  }

  // Brand watchlists.
  const char* brandNames[] = {"Brantic Blue Chips", "Brantic Dividend Picks", "Brantic Growth & Momentum"};
  for (int b = 0; b < 3; ++b) {
    BrandWatchlist w;
    w.id = 801 + b;
    w.name = brandNames[b];
    for (int k = b; k < int(brandTwins.size()); k += 3) w.instruments.push_back(brandTwins[k]);
    brands.push_back(std::move(w));
  }
  // Starter user watchlists.
  StarterWatchlist mine{"My Watchlist", {}}, asia{"Asia Actives", {}}, macro{"Indices & FX", {}};
  for (int i = firstEquity; i < lastEquity && mine.instruments.size() < 12; ++i)
    if (info[i].exchange == 0 && instruments[i].accessStatus == 3) mine.instruments.push_back(i);
  std::vector<int> actives;
  for (int i = firstEquity; i < lastEquity; ++i)
    if (info[i].exchange <= 3 && instruments[i].accessStatus == 3) actives.push_back(i);
  std::stable_sort(actives.begin(), actives.end(), [&](int a, int b) { return info[a].activity > info[b].activity; });
  for (int k = 0; k < int(actives.size()) && k < 20; ++k) asia.instruments.push_back(actives[k]);
  for (int i = 0; i < fixedCount; ++i)
    if (instruments[i].exchangeCode == "WIDX" || (instruments[i].exchangeCode == "FXM" && macro.instruments.size() < 20))
      macro.instruments.push_back(i);
  starters = {mine, asia, macro};
}

// The pull of the walk back towards the previous close, in standard
// deviations of one move: weak enough that a price wanders through the day
// (about 60% of the daily volatility away from the close at most times),
// strong enough that a long session stays plausible.
static double Pull(double ratioToClose, double sigmaFrac, double daily) {
  const double spread = 0.6 * daily;
  return -0.5 * sigmaFrac * std::log(ratioToClose) / (spread * spread);
}

Trade Market::Impl::NextTrade(int i, State& s, Rng& r, std::uint32_t timeMs) const {
  const InstInfo& inf = info[i];
  const double ref = s.close > 0 ? s.close : inf.ref;
  const double p0 = s.last > 0 ? s.last : ref;
  const double stepUp = Step(inf.table, p0, true);
  // Per-trade volatility from a daily one, so busy and quiet names end the day
  // with similar ranges; the pull back towards the previous close keeps a long
  // session plausible.
  const double daily = inf.equity || inf.alias >= 0 ? 0.014 : 0.006;
  const double sigmaFrac = daily / std::sqrt(std::max(50.0, double(inf.activity) * 8000.0));
  const double sigmaTicks = std::max(sigmaFrac * p0 / stepUp, 0.6);
  const double pull = Pull(p0 / ref, sigmaFrac, daily);
  long ticks = std::lround((r.Normal() + pull) * sigmaTicks);
  double price = p0;
  if (ticks != 0) {
    const bool up = ticks > 0;
    for (long k = 0; k < std::labs(ticks) && k < 50; ++k) price += up ? Step(inf.table, price, true) : -Step(inf.table, price, false);
  }
  price = std::clamp(price, ref * 0.85, ref * 1.15);
  Trade t;
  t.price = Snap(i, price);
  t.timeMs = timeMs;
  if (t.price > p0) t.side = 1;
  else if (t.price < p0) t.side = 2;
  else t.side = r.Chance(0.5) ? 1 : 2;
  if (r.Chance(0.004)) t.side = 0;
  const double size = std::exp(r.Normal() * 1.1) * 6.0;
  t.volume = std::int32_t(inf.lot * std::max(1.0, std::floor(size)));
  return t;
}

void Market::Impl::RecordTrade(State& s, const Trade& t) {
  if (s.trades == 0 || s.open <= 0) { s.open = t.price; s.high = t.price; s.low = t.price; }
  s.high = std::max(s.high, t.price);
  s.low = std::min(s.low, t.price);
  s.last = t.price;
  s.volume += t.volume;
  s.turnover += t.price * t.volume;
  ++s.trades;
  s.lastTradeMs = t.timeMs;
}

void Market::Impl::ApplyTrade(int i, State& s, const Trade& t, Rng& r) const {
  const InstInfo& inf = info[i];
  RecordTrade(s, t);
  ++s.version;
  if (inf.index) return;
  // Before the session: the best prices follow the trade (a buy lifts the
  // offer, a sell hits the bid).
  const int spread = std::max(1, inf.spread + (r.Chance(0.2) ? 1 : 0));
  if (t.side == 1 || (t.side != 2 && r.Chance(0.5))) {
    s.ask = r.Chance(0.3) ? Snap(i, t.price + Step(inf.table, t.price, true)) : t.price;
    double b = s.ask;
    for (int k = 0; k < spread; ++k) b -= Step(inf.table, b, false);
    s.bid = Snap(i, std::max(b, Step(inf.table, 0, true)));
  } else {
    s.bid = r.Chance(0.3) ? Snap(i, t.price - Step(inf.table, t.price, false)) : t.price;
    double a = s.bid;
    for (int k = 0; k < spread; ++k) a += Step(inf.table, a, true);
    s.ask = Snap(i, a);
  }
  if (s.bid >= s.ask) s.ask = Snap(i, s.bid + Step(inf.table, s.bid, true));
  s.bidVol = std::int64_t(inf.lot) * r.Range(1, 300);
  s.askVol = std::int64_t(inf.lot) * r.Range(1, 300);
}

void Market::Impl::History(int i, State& s, Tape* tape) const {
  const InstInfo& inf = info[i];
  Rng r(StreamSeed(config.seed, std::uint64_t(i), 0x7A9E));
  s = State{};
  s.close = inf.ref;
  const double spanMs = startMs > openMs ? double(startMs - openMs) : 0.0;
  int count = int(inf.activity * 0.5 * spanMs / 1000.0 * 0.12 * historyScale);
  if (spanMs > 0 && count < 1 && r.Chance(0.7)) count = 1;
  if (tape) tape->clear();
  if (count > 0) {
    // Opening auction.
    Trade open;
    open.timeMs = openMs;
    open.price = Snap(i, inf.ref * (1.0 + r.Normal() * 0.006));
    open.side = 3;
    open.volume = inf.lot * r.Range(20, 400);
    ApplyTrade(i, s, open, r);
    if (tape) tape->push_back(open);
    for (int k = 1; k < count; ++k) {
      const std::uint32_t t = openMs + std::uint32_t((double(k) + r.Uniform() * 0.9) / count * spanMs);
      Trade tr = NextTrade(i, s, r, std::min<std::uint32_t>(t, startMs));
      ApplyTrade(i, s, tr, r);
      if (tape) tape->push_back(tr);
    }
  } else if (!inf.index) {
    s.bid = Snap(i, inf.ref - Step(inf.table, inf.ref, false) * inf.spread);
    s.ask = Snap(i, inf.ref + Step(inf.table, inf.ref, true));
    s.bidVol = std::int64_t(inf.lot) * r.Range(1, 100);
    s.askVol = std::int64_t(inf.lot) * r.Range(1, 100);
  }
  s.version = 1;
}

std::int64_t Market::Impl::DrawnSize(int b, double price, int level, int side) const {
  if (price <= 0) return 0;
  const std::uint64_t key = std::uint64_t(std::llround(price * 10000.0)) * 4 + std::uint64_t(side);
  const std::uint64_t h = Mix(StreamSeed(config.seed, std::uint64_t(b), key));
  // Resting size is a good many of the usual trades, so most trades leave the best level standing.
  return (8 + std::int64_t(h % std::uint64_t(60 + 12 * level))) * info[b].lot;
}

std::int32_t Market::Impl::DrawnOrders(int b, std::int64_t size, int level, int side) const {
  if (size <= 0) return 0;
  const std::int64_t lots = std::max<std::int64_t>(1, size / std::max(1, info[b].lot));
  const std::uint64_t h = Mix(StreamSeed(config.seed, std::uint64_t(b), std::uint64_t(level) * 8 + std::uint64_t(side)));
  return std::int32_t(std::min<std::int64_t>(lots, 1 + std::int64_t(h % std::uint64_t(1 + lots / 3))));
}

Market::Impl::LiveBook Market::Impl::DrawBook(int b, int levels) const {
  LiveBook book;
  const State& s = state[b];
  if (info[b].index) return book;
  if (s.bid > 0) book.bids.push_back({s.bid, s.bidVol, DrawnOrders(b, s.bidVol, 1, 1)});
  if (s.ask > 0) book.asks.push_back({s.ask, s.askVol, DrawnOrders(b, s.askVol, 1, 2)});
  Refill(b, book, levels);
  return book;
}

void Market::Impl::Refill(int b, LiveBook& book, int levels) const {
  const InstInfo& inf = info[b];
  const double minPrice = Step(inf.table, 0, true);
  auto add = [&](std::vector<Level>& side, double price, int sideCode) {
    const int level = int(side.size()) + 1;
    const std::int64_t size = DrawnSize(b, price, level, sideCode);
    side.push_back({price, size, DrawnOrders(b, size, level, sideCode)});
  };
  while (!book.bids.empty() && int(book.bids.size()) < levels) {
    const double p = book.bids.back().price;
    const double next = p - Step(inf.table, p, false);
    if (next < minPrice - 1e-12) break;
    add(book.bids, Snap(b, next), 1);
  }
  while (!book.asks.empty() && int(book.asks.size()) < levels) {
    const double p = book.asks.back().price;
    add(book.asks, Snap(b, p + Step(inf.table, p, true)), 2);
  }
}

int Market::Impl::Lean(int i, const State& s, Rng& r) const {
  const InstInfo& inf = info[i];
  const double ref = s.close > 0 ? s.close : inf.ref;
  const double mid = s.bid > 0 && s.ask > 0 ? (s.bid + s.ask) / 2 : s.last > 0 ? s.last : ref;
  // The walk of NextTrade, in steps from the middle of the spread.
  const double daily = inf.equity || inf.alias >= 0 ? 0.014 : 0.006;
  const double sigmaFrac = daily / std::sqrt(std::max(50.0, double(inf.activity) * 8000.0));
  const double sigmaTicks = std::max(sigmaFrac * mid / Step(inf.table, mid, true), 0.6);
  const double pull = Pull(mid / ref, sigmaFrac, daily);
  return int(std::clamp<long>(std::lround((r.Normal() + pull) * sigmaTicks), -3, 3));
}

void Market::Impl::Event(int i, Rng& r) {
  Materialize(i);
  State& s = state[i];
  const InstInfo& inf = info[i];
  if (inf.index || s.ask <= 0) {
    // An index ticks: a new value, no book.
    Trade t = NextTrade(i, s, r, TimeOfDay());
    ApplyTrade(i, s, t, r);
    tapes[i]->push_back(t);
    MarkDirty(i, kTradeChanged | (inf.index ? 0u : std::uint32_t(kBookChanged)));
    if (priceWatch[i] > 0 && priceListener) priceListener(i);
    return;
  }
  auto live = books.find(i);
  LiveBook scratch;
  if (live == books.end()) scratch = DrawBook(i, 3);
  LiveBook& book = live != books.end() ? live->second : scratch;
  const int depth = live != books.end() ? kDepthLevels : 3;
  const std::int64_t lot = std::max(1, inf.lot);
  const int lean = Lean(i, s, r);
  const bool leanSide = lean > 0 || (lean == 0 && r.Chance(0.5));  // true: towards the bids
  std::uint32_t bits = kBookChanged;
  // A spread wider than usual does not last: someone steps inside it.
  const double bestBid = book.bids.empty() ? 0 : book.bids.front().price, bestAsk = book.asks.front().price;
  const double step = Step(inf.table, bestBid > 0 ? bestBid : bestAsk, true);
  const bool wide = bestBid > 0 && (bestAsk - bestBid) > step * (std::max(1, inf.spread) + 0.5);
  const double u = wide && r.Chance(0.5) ? 0.37 : r.Uniform();
  auto changeSize = [&](std::vector<Level>& side, int k, bool join) {
    Level& L = side[std::size_t(k)];
    if (join || L.size <= lot) {
      L.size += lot * r.Range(1, 30);
      ++L.orders;
    } else {
      L.size -= lot * r.Range(1, int(std::min<std::int64_t>(30, L.size / lot - 1)));
      L.orders = std::max(1, L.orders - 1);
    }
    L.orders = std::int32_t(std::clamp<std::int64_t>(L.orders, 1, std::max<std::int64_t>(1, L.size / lot)));
  };
  if (u < 0.35 && !book.bids.empty()) {
    // A trade takes liquidity at the best price: a buy from the best offer, a
    // sell from the best bid. A strong lean takes the whole level.
    const bool buy = leanSide;
    std::vector<Level>& side = buy ? book.asks : book.bids;
    Level& best = side.front();
    std::int64_t volume = lot * std::int64_t(std::max(1.0, std::floor(std::exp(r.Normal() * 1.1) * 6.0)));
    if ((std::abs(lean) >= 2 && r.Chance(0.5)) || volume > best.size) volume = best.size;
    Trade t;
    t.timeMs = TimeOfDay();
    t.price = best.price;
    t.volume = std::int32_t(std::min<std::int64_t>(volume, std::numeric_limits<std::int32_t>::max()));
    t.side = buy ? 1 : 2;
    best.size -= t.volume;
    if (best.size <= 0 && r.Chance(0.5)) {
      // Often the taken level is refilled at once (hidden size, a quick new order).
      best.size = lot * r.Range(5, 40);
      best.orders = 1;
    } else if (best.size <= 0) {
      side.erase(side.begin());
    } else {
      best.orders = std::int32_t(std::clamp<std::int64_t>(best.orders - 1, 1, best.size / lot));
    }
    RecordTrade(s, t);
    tapes[i]->push_back(t);
    bits |= kTradeChanged;
  } else if (u < 0.39 && !book.bids.empty()) {
    // A new order inside the spread, on the side the market leans to.
    const double price = leanSide ? Snap(i, bestBid + Step(inf.table, bestBid, true))
                                  : Snap(i, bestAsk - Step(inf.table, bestAsk, false));
    if (price > bestBid + 1e-9 && price < bestAsk - 1e-9) {
      std::vector<Level>& side = leanSide ? book.bids : book.asks;
      const std::int64_t size = lot * r.Range(1, 20);
      side.insert(side.begin(), Level{price, size, 1});
    } else {
      changeSize(leanSide ? book.bids : book.asks, 0, true);
    }
  } else if (u < 0.398) {
    // The best level on the side the market leans away from is withdrawn.
    std::vector<Level>& side = leanSide ? book.asks : book.bids;
    if (side.size() > 1) side.erase(side.begin());
  } else {
    // Most updates: an order joins or leaves one of the top levels.
    std::vector<Level>& side = r.Chance(0.5) || book.bids.empty() ? book.asks : book.bids;
    int k = 0;
    while (k + 1 < int(side.size()) && k < 9 && r.Chance(0.45)) ++k;
    changeSize(side, k, r.Chance(0.55));
  }
  Refill(i, book, depth);
  s.bid = book.bids.empty() ? 0 : book.bids.front().price;
  s.bidVol = book.bids.empty() ? 0 : book.bids.front().size;
  s.ask = book.asks.front().price;
  s.askVol = book.asks.front().size;
  ++s.version;
  MarkDirty(i, bits);
  if (priceWatch[i] > 0 && priceListener) priceListener(i);
}

void Market::Impl::StepOnce() {
  elapsedMs += kStepMs;
  if (hotDirty) {
    hot.clear();
    for (int i = 0; i < int(interest.size()); ++i) if (interest[i] > 0) hot.push_back(i);
    hotDirty = false;
  }
  // Watched instruments: their own pace, scaled down when the total would
  // exceed the configured rate (about five fields change per event).
  if (!hot.empty()) {
    double sum = 0;
    for (int i : hot) sum += 2.0 * info[i].activity * config.pace;
    const double budget = std::max(1.0, config.fieldUpdatesPerSecond / 5.0);
    const double scale = sum > budget ? budget / sum : 1.0;
    for (int i : hot) {
      const double p = std::min(0.9, 2.0 * info[i].activity * config.pace * scale * (kStepMs / 1000.0));
      if (rng.Chance(p)) Event(i, rng);
    }
  }
  // The rest of the market drifts in the background (TOP30 lists move too).
  const int background = std::max(1, int(bases.size() / 1000));
  for (int k = 0; k < background; ++k) {
    const int i = bases[rng.Next() % bases.size()];
    if (rng.Uniform() * maxActivity < info[i].activity) Event(i, rng);
  }
  if (config.corporateEventEveryMs > 0 && eventRng.Chance(double(kStepMs) / double(config.corporateEventEveryMs)))
    CorporateEvent();
}

void Market::Impl::CorporateEvent() {
  // Half the time a company someone watches, so that a user gets to see one.
  std::vector<int> watched;
  for (int i : hot)
    if (info[std::size_t(i)].equity) watched.push_back(i);
  int b = -1;
  if (!watched.empty() && eventRng.Chance(0.5)) {
    b = watched[eventRng.Next() % watched.size()];
  } else {
    for (int tries = 0; tries < 64 && b < 0; ++tries) {
      const int i = bases[eventRng.Next() % bases.size()];
      if (info[std::size_t(i)].equity) b = i;
    }
  }
  if (b < 0) return;
  ++corporateEvents;
  if (eventRng.Chance(0.4)) Rename(b);
  else ChangeRemark(b);
}

void Market::Impl::Rename(int b) {
  if (takenNames.empty())
    for (const JInstrumentUnderlying& rec : instruments) takenNames.insert(rec.instrumentName);
  const SectorDef* sector = &kSectors[0];
  for (const SectorDef& sd : kSectors)
    if (instruments[std::size_t(b)].sector == sd.code) sector = &sd;
  const std::string stem = std::string(kSyllA[eventRng.Range(0, int(std::size(kSyllA)) - 1)]) +
                           kSyllB[eventRng.Range(0, int(std::size(kSyllB)) - 1)];
  // An old name stays taken: no company takes another's former name the same day.
  const std::string name = UniqueName(stem + " " + sector->words[eventRng.Range(0, 2)],
                                      instruments[std::size_t(b)].instrumentCode, takenNames);
  names[b] = name;
  // The twins keep what sets them apart (" CFD", " (Brantic)").
  const std::string& ref = instruments[std::size_t(b)].instrumentName;
  if (auto it = aliasesOf.find(b); it != aliasesOf.end()) {
    for (int a : it->second) {
      const std::string& own = instruments[std::size_t(a)].instrumentName;
      names[a] = name + (own.compare(0, ref.size(), ref) == 0 ? own.substr(ref.size()) : std::string());
    }
  }
  MarkDirty(b, kNameChanged);
}

void Market::Impl::ChangeRemark(int b) {
  State& s = state[std::size_t(b)];
  int remark = s.remark;
  while (remark == s.remark) remark = eventRng.Range(0, int(std::size(kRemarks)) - 1);
  s.remark = std::int8_t(remark);
  MarkDirty(b, kRemarksChanged);
}

// ---------------------------------------------------------------------------

Market::Market(const MarketConfig& config) : d(std::make_unique<Impl>()) {
  d->config = config;
  d->now = config.startTick;
  d->rng = Rng(StreamSeed(config.seed, 1, 0x57E9));
  d->eventRng = Rng(StreamSeed(config.seed, 2, 0xC0E7));
  int y = 2026; unsigned m = 12, dd = 7;
  if (std::sscanf(config.sessionDate.c_str(), "%d-%u-%u", &y, &m, &dd) != 3 || m < 1 || m > 12 || dd < 1 || dd > 31) {
    y = 2026; m = 12; dd = 7;
  }
  d->startDay = DaysFromCivil(y, m, dd);
  d->startMs = std::uint32_t(std::clamp(config.sessionStartSeconds, 0, 86399)) * 1000u;
  d->Build();
}
Market::~Market() = default;

const MarketConfig& Market::Config() const { return d->config; }
const std::vector<JProduct>& Market::Products() const { return d->products; }
const std::vector<JExchangeList>& Market::Exchanges() const { return d->exchanges; }
const std::vector<JInstrumentUnderlying>& Market::Instruments() const { return d->instruments; }
const std::vector<TickBand>& Market::TickBands() const { return d->bands; }
const std::vector<JSector>& Market::Sectors() const { return d->sectors; }
const std::vector<JRemarkMessage>& Market::RemarkMessages() const { return d->remarks; }

int Market::Find(std::int64_t productId, std::string_view code) const {
  auto it = d->byKey.find(std::make_pair(productId, std::string(code)));
  return it == d->byKey.end() ? -1 : it->second;
}
int Market::FindByCode(std::string_view code) const {
  auto it = d->byCode.find(std::string(code));
  return it == d->byCode.end() ? -1 : it->second;
}
int Market::FindOnExchange(std::string_view exchange, std::string_view code) const {
  const auto products = d->productsOn.find(exchange);
  if (products == d->productsOn.end()) return -1;
  int first = -1;
  for (const std::int64_t product : products->second) {
    const int idx = Find(product, code);
    if (idx >= 0 && (first < 0 || idx < first) && TrimBlanks(d->instruments[std::size_t(idx)].exchangeCode) == exchange)
      first = idx;
  }
  return first;
}
int Market::FindByChartCode(std::string_view chartCode) const {
  auto it = d->byChart.find(std::string(chartCode));
  return it == d->byChart.end() ? -1 : it->second;
}
const JExchangeList* Market::FindExchange(std::string_view code) const {
  for (const auto& e : d->exchanges) if (e.exchangeCode == code) return &e;
  return nullptr;
}
const JProduct* Market::FindProduct(std::int64_t productId) const {
  for (const auto& p : d->products) if (p.productId == productId) return &p;
  return nullptr;
}
JMarketInfo Market::MarketInfo(std::string_view exchangeCode) const {
  JMarketInfo mi;
  for (const ExchangeDef& e : kExchanges) {
    if (exchangeCode != e.code) continue;
    mi.productId = e.product;
    mi.exchangeCode = e.code;
    mi.delay = e.delay;
    mi.marketName = e.market;
    mi.openTime = "09:00";
    mi.closeTime = "17:00";
    const std::uint32_t t = d->TimeOfDay();
    mi.marketStatus = t < d->openMs ? "Pre-open" : t >= 17u * 3600u * 1000u ? "Closed" : "Open";
    if (exchangeCode == "FXM" || exchangeCode == "WIDX") { mi.openTime = "00:00"; mi.closeTime = "24:00"; mi.marketStatus = "Open"; }
  }
  return mi;
}
double Market::StepAt(std::int32_t tableId, double price, bool up) const { return d->Step(tableId, price, up); }

int Market::LiquidStock() const {
  int best = -1;
  for (int pass = 0; pass < 2 && best < 0; ++pass)
    for (int i : d->bases) {
      const InstInfo& inf = d->info[i];
      if (!inf.equity || d->instruments[i].accessStatus != 3 || (pass == 0 && inf.exchange != 0)) continue;
      if (best < 0 || inf.activity > d->info[best].activity) best = i;
    }
  return best;
}

void Market::AdvanceTo(std::uint32_t now) {
  // Only whole steps are played; the rest of the stride stays owed to the next
  // call, because `d->now` moves by whole steps only. A tick behind the
  // market's (a clock stepped back) plays nothing.
  if (std::int32_t(now - d->now) <= 0) return;
  std::uint32_t due = (now - d->now) / kStepMs;
  // A clock that jumped hours ahead (a suspended laptop) plays at most an hour.
  const std::uint32_t cap = 3600u * 1000u / kStepMs;
  if (due > cap) {
    d->elapsedMs += std::uint64_t(due - cap) * kStepMs;
    d->now += (due - cap) * kStepMs;
    due = cap;
  }
  for (std::uint32_t k = 0; k < due; ++k) {
    d->now += kStepMs;
    d->StepOnce();
  }
}
std::uint32_t Market::Now() const { return d->now; }
std::string Market::DateText() const {
  int y; unsigned m, dd;
  CivilFromDays(d->Day(), y, m, dd);
  char buf[16];
  std::snprintf(buf, sizeof buf, "%04d-%02u-%02u", y, m, dd);
  return buf;
}
std::string Market::TimeText() const { return Clock(d->TimeOfDay()); }
std::uint32_t Market::TimeOfDayMs() const { return d->TimeOfDay(); }

const std::string& Market::NameOf(int index) const {
  static const std::string none;
  if (index < 0 || index >= int(d->instruments.size())) return none;
  return d->CurrentName(index);
}
int Market::CorporateEvents() const { return d->corporateEvents; }

int Market::BaseOf(int index) const {
  if (index < 0 || index >= int(d->instruments.size())) return -1;
  return d->Base(index);
}
void Market::SetPriceListener(PriceListener listener) { d->priceListener = std::move(listener); }
void Market::WatchPrices(int index) {
  const int b = BaseOf(index);
  if (b >= 0) ++d->priceWatch[b];
}
void Market::UnwatchPrices(int index) {
  const int b = BaseOf(index);
  if (b >= 0 && d->priceWatch[b] > 0) --d->priceWatch[b];
}

void Market::AddInterest(int index) {
  if (index < 0 || index >= int(d->instruments.size())) return;
  const int b = d->Base(index);
  if (d->interest[b]++ == 0) d->hotDirty = true;
  ++d->interestTotal;
  if (!d->info[b].index && !d->books.count(b)) d->books.emplace(b, d->DrawBook(b, kDepthLevels));
}
void Market::RemoveInterest(int index) {
  if (index < 0 || index >= int(d->instruments.size())) return;
  const int b = d->Base(index);
  if (d->interest[b] <= 0) return;
  if (--d->interest[b] == 0) d->hotDirty = true;
  --d->interestTotal;
}
int Market::InterestCount() const {
  int n = 0;
  for (int v : d->interest) n += v > 0;
  return n;
}

std::vector<int> Market::TakeChanged() {
  std::vector<int> out;
  out.swap(d->dirtyList);
  for (int i : out) d->dirty[i] = 0;
  std::sort(out.begin(), out.end());
  return out;
}

std::vector<std::pair<int, std::uint32_t>> Market::TakeChangedWithBits() {
  std::vector<int> list;
  list.swap(d->dirtyList);
  std::sort(list.begin(), list.end());
  std::vector<std::pair<int, std::uint32_t>> out;
  out.reserve(list.size());
  for (int i : list) {
    out.emplace_back(i, d->dirty[i]);
    d->dirty[i] = 0;
  }
  return out;
}

Quote Market::QuoteOf(int index) {
  Quote q;
  if (index < 0 || index >= int(d->instruments.size())) return q;
  const int b = d->Base(index);
  const State& s = d->state[b];
  const InstInfo& inf = d->info[b];
  q.bid = s.bid; q.ask = s.ask; q.last = s.last; q.open = s.open; q.high = s.high; q.low = s.low; q.close = s.close;
  q.bidVolume = s.bidVol; q.askVolume = s.askVol; q.volume = s.volume; q.turnover = s.turnover; q.trades = s.trades;
  q.remarks = kRemarks[s.remark];
  const std::string& type = d->instruments[index].productType;
  if (inf.equity || type == "CFD" || type == "DMA") {
    q.cfdStatus = kLsStatus[inf.cfd];
    q.dmaStatus = inf.dma ? kLsStatus[inf.dma] : "";
  }
  if (inf.month >= 0) { q.month = kMonths[inf.month]; q.year = std::to_string(inf.year); }
  return q;
}

DepthLevel Market::Depth(int index, int level) {
  if (level < 1 || level > kDepthLevels) return {};
  std::vector<DepthLevel> book = Book(index, level);
  return book.size() == std::size_t(level) ? book.back() : DepthLevel{};
}

std::vector<DepthLevel> Market::Book(int index, int levels) {
  std::vector<DepthLevel> out;
  if (index < 0 || index >= int(d->instruments.size())) return out;
  levels = std::clamp(levels, 0, int(kDepthLevels));
  const int b = d->Base(index);
  auto live = d->books.find(b);
  const Impl::LiveBook drawn = live == d->books.end() ? d->DrawBook(b, levels) : Impl::LiveBook{};
  const Impl::LiveBook& book = live == d->books.end() ? drawn : live->second;
  out.resize(std::size_t(levels));
  for (int k = 0; k < levels; ++k) {
    DepthLevel& L = out[std::size_t(k)];
    if (k < int(book.bids.size())) {
      L.bid = book.bids[std::size_t(k)].price;
      L.bidVolume = book.bids[std::size_t(k)].size;
      L.bidOrders = book.bids[std::size_t(k)].orders;
    }
    if (k < int(book.asks.size())) {
      L.ask = book.asks[std::size_t(k)].price;
      L.askVolume = book.asks[std::size_t(k)].size;
      L.askOrders = book.asks[std::size_t(k)].orders;
    }
  }
  return out;
}

std::size_t Market::TapeBytes() const {
  // The chunks the tapes hold (libstdc++ makes them 512 bytes) and their maps.
  constexpr std::size_t kChunk = 512, kPerChunk = kChunk / sizeof(Trade);
  std::size_t bytes = d->tapes.capacity() * sizeof(std::unique_ptr<Tape>);
  for (const auto& tape : d->tapes) {
    if (!tape) continue;
    const std::size_t chunks = tape->size() / kPerChunk + 1;
    bytes += sizeof(Tape) + chunks * kChunk + (chunks + 2) * sizeof(void*);
  }
  return bytes;
}

const Tape& Market::Trades(int index) {
  static const Tape none;
  if (index < 0 || index >= int(d->instruments.size())) return none;
  const int b = d->Base(index);
  d->Materialize(b);
  return *d->tapes[b];
}

std::vector<SummaryLine> Market::Summary(int index) {
  if (index < 0 || index >= int(d->instruments.size())) return {};
  const int b = d->Base(index);
  const Tape& tape = Trades(b);
  auto& cache = d->summaries[b];
  if (cache.first == std::int32_t(tape.size()) && !cache.second.empty()) return cache.second;
  const double scale = std::pow(10.0, d->info[b].decimals);
  std::map<long long, SummaryLine, std::greater<>> byPrice;
  for (const Trade& t : tape) {
    SummaryLine& l = byPrice[std::llround(t.price * scale)];
    l.price = t.price;
    ++l.trades;
    l.volume += t.volume;
    if (t.side == 2) l.bidVolume += t.volume;
    else if (t.side == 1) l.askVolume += t.volume;
  }
  cache.first = std::int32_t(tape.size());
  cache.second.clear();
  for (auto& [k, l] : byPrice) cache.second.push_back(l);
  return cache.second;
}

std::string Market::FormatPrice(int index, double price) const {
  if (index < 0 || index >= int(d->instruments.size())) return Fixed(price, 3);
  return Fixed(price, d->info[d->Base(index)].decimals);
}

int Market::TradePageCount(int index) {
  const int n = int(Trades(index).size());
  return (n + kTradePageSize - 1) / kTradePageSize;
}

std::string Market::TradePageText(int index, int page) {
  const Tape& tape = Trades(index);
  const int n = int(tape.size());
  int first = 0, last = -1;  // trade numbers, inclusive
  if (page == kLivePage) {
    last = n;
    first = std::max(1, n - kTradePageSize + 1);
  } else if (page >= 1 && page <= 999) {
    first = (page - 1) * kTradePageSize + 1;
    last = std::min(n, page * kTradePageSize);
  }
  if (n == 0 || last < first) return {};
  std::string date = DateText();
  date.erase(std::remove(date.begin(), date.end(), '-'), date.end());
  std::string out;
  out.reserve(std::size_t(last - first + 1) * 40);
  // Newest first: the first item of the live page is the newest trade.
  for (int num = last; num >= first; --num) {
    const Trade& t = tape[std::size_t(num - 1)];
    if (!out.empty()) out.push_back(';');
    out += date;
    out += Clock(t.timeMs);
    out.push_back('|');
    out += FormatPrice(index, t.price);
    out.push_back('|');
    out += std::to_string(t.volume);
    out.push_back('|');
    out += std::to_string(int(t.side));
    out += "||";
    out += std::to_string(num);
  }
  return out;
}

int Market::SummaryPageCount(int index) {
  const int n = int(Summary(index).size());
  return (n + kSummaryPageSize - 1) / kSummaryPageSize;
}

std::string Market::SummaryPageText(int index, int page) {
  const std::vector<SummaryLine> lines = Summary(index);
  const int n = int(lines.size());
  if (page < 1 || page > 99 || (page - 1) * kSummaryPageSize >= n) return {};
  auto item = [&](const std::string& head, std::int64_t trades, std::int64_t vol, std::int64_t bidVol, std::int64_t askVol) {
    return head + "|" + std::to_string(trades) + "|" + std::to_string(vol) + "|" + std::to_string(bidVol) + "||" +
           std::to_string(askVol);
  };
  std::string out;
  for (int k = (page - 1) * kSummaryPageSize; k < std::min(n, page * kSummaryPageSize); ++k) {
    const SummaryLine& l = lines[std::size_t(k)];
    if (!out.empty()) out.push_back(';');
    out += item(FormatPrice(index, l.price), l.trades, l.volume, l.bidVolume, l.askVolume);
  }
  // The totals item goes last so that it does not shift the line numbers.
  SummaryLine t;
  for (const SummaryLine& l : lines) { t.trades += l.trades; t.volume += l.volume; t.bidVolume += l.bidVolume; t.askVolume += l.askVolume; }
  out += ";" + item("TOTALS:", t.trades, t.volume, t.bidVolume, t.askVolume);
  return out;
}

std::string Market::DepthFieldValue(int index, const DepthLevel& L, std::string_view f) const {
  if (f == "BUY") return L.bid > 0 ? FormatPrice(index, L.bid) : std::string();
  if (f == "SELL") return L.ask > 0 ? FormatPrice(index, L.ask) : std::string();
  if (f == "BVOL") return L.bid > 0 ? std::to_string(L.bidVolume) : std::string();
  if (f == "SVOL") return L.ask > 0 ? std::to_string(L.askVolume) : std::string();
  if (f == "ORDS_BVOL") return L.bid > 0 ? std::to_string(L.bidOrders) : std::string();
  if (f == "ORDS_SVOL") return L.ask > 0 ? std::to_string(L.askOrders) : std::string();
  return {};
}

std::string Market::FieldValue(int index, std::string_view f, int param, int kind) {
  if (index < 0 || index >= int(d->instruments.size())) return {};
  const int b = d->Base(index);
  const State& s = d->state[b];
  auto price = [&](double v) { return v > 0 ? FormatPrice(index, v) : std::string(); };
  if (kind == 0 || kind == 1) {
    if (kind == 1 || f == "BUY" || f == "SELL" || f == "ORDS_BVOL" || f == "ORDS_SVOL") {
      const int level = kind == 1 ? param : 1;
      if (level < 1 || level > kDepthLevels) return {};
      return DepthFieldValue(index, Depth(index, level), f);
    }
    if (f == "BID") return price(s.bid);
    if (f == "ASK") return price(s.ask);
    if (f == "LAST") return price(s.last);
    if (f == "OPEN") return price(s.open);
    if (f == "HIGH") return price(s.high);
    if (f == "LOW") return price(s.low);
    if (f == "CLOSE") return price(s.close);
    if (f == "TAC") return s.volume > 0 ? FormatPrice(index, s.turnover / double(s.volume)) : std::string();
    if (f == "CHANGE") return s.last > 0 ? FormatPrice(index, s.last - s.close) : std::string();
    if (f == "PCHANGE") return s.last > 0 && s.close > 0 ? Fixed((s.last - s.close) / s.close * 100.0, 3) : std::string();
    if (f == "BVOL") return std::to_string(s.bidVol);
    if (f == "SVOL") return std::to_string(s.askVol);
    if (f == "VOL") return std::to_string(s.volume);
    if (f == "INSTRNAME") return d->CurrentName(index);
    if (f == "REMARKS" || f == "CFD_STATUS" || f == "DMA_STATUS" || f == "MONTH" || f == "YEAR") {
      const Quote q = QuoteOf(index);
      if (f == "REMARKS") return q.remarks;
      if (f == "CFD_STATUS") return q.cfdStatus;
      if (f == "DMA_STATUS") return q.dmaStatus;
      if (f == "MONTH") return q.month;
      return q.year;
    }
    return {};
  }
  if (kind == 2) {
    if (f == "TRADEDATA") return TradePageText(index, param);
    if (param != 0 && param != kHeaderParam) return {};
    if (f == "DTIME") return DateText() + " " + Clock(s.trades > 0 ? s.lastTradeMs : d->TimeOfDay());
    if (f == "HIGH") return price(s.high);
    if (f == "LOW") return price(s.low);
    if (f == "LAST") return price(s.last);
    if (f == "NETCHANGE") return s.last > 0 ? FormatPrice(index, s.last - s.close) : std::string();
    if (f == "TOTALVALUE") return Fixed(s.turnover, 2);
    if (f == "TOTAL_VOLUME") return std::to_string(s.volume);
    if (f == "PAGECOUNT") return std::to_string(TradePageCount(index));
    return {};
  }
  if (kind == 3) {
    if (f == "TRADEDATA") return SummaryPageText(index, param);
    const std::vector<SummaryLine> lines = Summary(index);
    std::int64_t bidVol = 0, askVol = 0;
    for (const SummaryLine& l : lines) { bidVol += l.bidVolume; askVol += l.askVolume; }
    if (f == "TIME") return Clock(s.trades > 0 ? s.lastTradeMs : d->TimeOfDay());
    if (f == "WEIGHTED_AVG") return s.volume > 0 ? Fixed(s.turnover / double(s.volume), 4) : std::string("0.0000");
    if (f == "RATIO") return bidVol > 0 ? Fixed(double(askVol) / double(bidVol), 4) : std::string("0.0000");
    if (f == "LAST") return price(s.last);
    if (f == "AVG_TRADE_SIZE") return s.trades > 0 ? Fixed(double(s.volume) / s.trades, 3) : std::string("0.000");
    if (f == "QUOTE_LIST") return std::to_string(lines.size());
    if (f == "COUNT") return std::to_string(lines.size());
    if (f == "PAGECOUNT") return std::to_string((lines.size() + kSummaryPageSize - 1) / kSummaryPageSize);
    return {};
  }
  return {};
}

std::vector<JTop30Group> Market::Top30() {
  // Rankings are recomputed at most every five seconds of market time.
  const std::uint64_t bucket = d->elapsedMs / 5000;
  if (d->top30At == bucket) return d->top30;
  d->top30At = bucket;
  d->top30.clear();
  for (int e = 0; e < kEquityExchanges; ++e) {
    std::vector<int> members;
    for (int i : d->bases)
      if (d->info[i].equity && d->info[i].exchange == e && d->state[i].last > 0) members.push_back(i);
    if (members.empty()) continue;
    auto pct = [&](int i) { const State& s = d->state[i]; return s.close > 0 ? (s.last - s.close) / s.close : 0.0; };
    auto take = [&](auto better, auto keep) {
      std::vector<int> v;
      for (int i : members) if (keep(i)) v.push_back(i);
      const std::size_t k = std::min<std::size_t>(30, v.size());
      std::partial_sort(v.begin(), v.begin() + long(k), v.end(), [&](int a, int b) {
        return better(a, b) || (!better(b, a) && a < b);
      });
      v.resize(k);
      JTop30List list;
      for (int i : v) list.instruments.push_back({d->instruments[i].productId, d->instruments[i].instrumentCode, d->instruments[i].exchangeCode});
      return list;
    };
    JTop30Group g;
    g.groupName = kExchanges[e].market;
    JTop30List gain = take([&](int a, int b) { return pct(a) > pct(b); }, [&](int i) { return pct(i) > 0; });
    gain.listName = "TOPGAIN";
    JTop30List lose = take([&](int a, int b) { return pct(a) < pct(b); }, [&](int i) { return pct(i) < 0; });
    lose.listName = "TOPLOSE";
    JTop30List vol = take([&](int a, int b) { return d->state[a].volume > d->state[b].volume; },
                          [&](int i) { return d->state[i].volume > 0; });
    vol.listName = "TOPVOL";
    JTop30List val = take([&](int a, int b) { return d->state[a].turnover > d->state[b].turnover; },
                          [&](int i) { return d->state[i].turnover > 0; });
    val.listName = "TOPVAL";
    g.lists = {std::move(gain), std::move(lose), std::move(vol), std::move(val)};
    d->top30.push_back(std::move(g));
  }
  return d->top30;
}

const std::vector<BrandWatchlist>& Market::BrandWatchlists() const { return d->brands; }
std::vector<int> Market::WorldIndices() const {
  std::vector<int> out;
  for (int i = 0; i < int(d->instruments.size()); ++i) if (d->instruments[i].exchangeCode == "WIDX") out.push_back(i);
  return out;
}
const std::vector<StarterWatchlist>& Market::StarterWatchlists() const { return d->starters; }

// ---------------------------------------------------------------------------

}  // namespace sim
