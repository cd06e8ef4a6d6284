// Ingest and read paths of the market-data and reference stores, each against
// a plain baseline doing the same essential work in the simplest way.
//
//   cmake --build build --target bench_stores && build/bin/bench_stores
// (a RelWithDebInfo or Release build). Each benchmark runs three times; the
// summary after the table uses the fastest CPU time of each and ends with one
// line "RATIO <name> <store/baseline>" per comparison.
// bench-links: mv_data
#include <benchmark/benchmark.h>
#include <malloc.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdio>
#include <map>
#include <memory>
#include <random>
#include <string>
#include <unordered_map>
#include <vector>

#include "data/MarketStores.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "data/TradeTape.h"
#include "hostview/Text.h"

namespace {

constexpr int kQuoteInstruments = 10000;
constexpr int kListInstruments = 200000;
constexpr int kUpdates = 1 << 16;
constexpr int kPages = 1000;

std::string Code(int i) {
  char buf[32];
  std::snprintf(buf, sizeof buf, "INS%06d.XS", i);
  return buf;
}

std::vector<JInstrumentUnderlying> MakeInstruments(int n) {
  std::vector<JInstrumentUnderlying> v(static_cast<std::size_t>(n));
  for (int i = 0; i < n; ++i) {
    auto& r = v[static_cast<std::size_t>(i)];
    r.productId = 1 + i % 7;
    r.instrumentCode = Code(i);
    r.exchangeCode = "XSES";
    r.symbol = "SYM" + std::to_string(i);
    r.instrumentName = "Instrument number " + std::to_string(i);
    r.displayCode = r.instrumentCode;
    r.decimals = 2 + i % 3;
    r.sector = "Industrials";
  }
  return v;
}

// ---- quote update ---------------------------------------------------------

struct UpdateItem {
  int ins;
  int field;
  std::string value;   // as the terminal sends it
  std::wstring wvalue; // as the view hands it to the store (widened)
  // The same widened code and value laid out one update after the other, as a
  // stream of terminal messages would be read.
  std::size_t codeAt = 0, codeLen = 0, valueAt = 0, valueLen = 0;
};

struct QuoteFixture {
  std::vector<JInstrumentUnderlying> list = MakeInstruments(kQuoteInstruments);
  std::vector<InstrumentKey> keys;
  std::vector<std::wstring> fieldNames;
  std::vector<UpdateItem> updates;
  std::wstring stream;  // widened codes and values of `updates`, in order

  QuoteFixture() {
    InstrumentMgr_ReadOnly().Fill(&list);
    for (const auto& r : list) keys.push_back(InstrumentKeyOf(r));
    for (const auto& c : QuoteLayout::kCells) fieldNames.emplace_back(c.name);
    std::mt19937 rng(7);
    std::uniform_int_distribution<int> ins(0, kQuoteInstruments - 1), field(0, 17);
    std::uniform_real_distribution<double> price(1.0, 5000.0);
    const char* texts[] = {"", "SUSP", "CUM DIV", "X", "Y", "2026", "12"};
    for (int i = 0; i < kUpdates; ++i) {
      UpdateItem u{ins(rng), field(rng), {}, {}};
      const auto& spec = QuoteLayout::kCells[static_cast<std::size_t>(u.field)];
      if (spec.kind == CellKind::Text) {
        u.value = texts[rng() % 7];
      } else {
        char buf[64];
        const double v = spec.kind == CellKind::Fixed && spec.decimals == 2 ? price(rng) * 1000 : price(rng);
        std::snprintf(buf, sizeof buf, "%.3f", v);
        u.value = buf;
        if (i % 2 == 0 && v >= 1000) {  // thousands separators
          std::string s = u.value;
          const auto dot = s.find('.');
          for (auto p = static_cast<long>(dot) - 3; p > 0; p -= 3) s.insert(static_cast<std::size_t>(p), ",");
          u.value = s;
        }
      }
      u.wvalue = hv::Widen(u.value);
      const std::wstring code = hv::Widen(list[static_cast<std::size_t>(u.ins)].instrumentCode);
      u.codeAt = stream.size();
      u.codeLen = code.size();
      stream += code;
      u.valueAt = stream.size();
      u.valueLen = u.wvalue.size();
      stream += u.wvalue;
      updates.push_back(std::move(u));
    }
  }
};

QuoteFixture& Quotes() {
  static QuoteFixture f;
  return f;
}

void BM_QuoteUpdate_Store(benchmark::State& state) {
  auto& f = Quotes();
  QuoteStore store;
  for (const auto& k : f.keys) store.Get(k, 0);
  std::uint32_t now = 0;
  for (const auto& u : f.updates) store.Update(f.keys[static_cast<std::size_t>(u.ins)], f.fieldNames[static_cast<std::size_t>(u.field)], u.wvalue, ++now);
  std::size_t i = 0;
  InstrumentKey key;  // the view's key, refilled per message
  const std::wstring_view stream = f.stream;
  for (auto _ : state) {
    const auto& u = f.updates[i];
    key.ProductID = f.list[static_cast<std::size_t>(u.ins)].productId;
    key.InstrumentCode.assign(stream.substr(u.codeAt, u.codeLen));
    benchmark::DoNotOptimize(store.Update(key, f.fieldNames[static_cast<std::size_t>(u.field)], stream.substr(u.valueAt, u.valueLen), ++now));
    i = (i + 1) & (kUpdates - 1);
  }
  state.SetItemsProcessed(state.iterations());
}

// The whole path from a terminal update: widen code, field and value, update.
void BM_QuoteUpdate_FromTerminal(benchmark::State& state) {
  auto& f = Quotes();
  QuoteStore store;
  for (const auto& k : f.keys) store.Get(k, 0);
  std::vector<FieldUpdate> msgs;
  for (const auto& u : f.updates) {
    FieldUpdate m;
    m.productId = f.list[static_cast<std::size_t>(u.ins)].productId;
    m.instrumentCode = f.list[static_cast<std::size_t>(u.ins)].instrumentCode;
    m.fieldName = hv::Narrow(f.fieldNames[static_cast<std::size_t>(u.field)]);
    m.value = u.value;
    msgs.push_back(std::move(m));
  }
  std::uint32_t now = 0;
  std::size_t i = 0;
  for (auto _ : state) {
    const auto& m = msgs[i];
    const InstrumentKey key{m.productId, hv::Widen(m.instrumentCode)};
    benchmark::DoNotOptimize(store.Update(key, hv::Widen(m.fieldName), hv::Widen(m.value), ++now));
    i = (i + 1) & (kUpdates - 1);
  }
  state.SetItemsProcessed(state.iterations());
}

// Baseline: hash-map lookup, commas dropped, from_chars, compare, to_chars.
struct BaseCell {
  double value = 0;
  std::string text;
  int mark = 0;
};
struct BaseRecord {
  int decimals = 3;
  std::array<BaseCell, 18> cells;
};

void BaselineUpdate(std::unordered_map<std::string, BaseRecord>& map, const std::string& code, int field, const std::string& value) {
  const auto it = map.find(code);
  if (it == map.end()) return;
  BaseCell& c = it->second.cells[static_cast<std::size_t>(field)];
  if (QuoteLayout::kCells[static_cast<std::size_t>(field)].kind == CellKind::Text) {
    c.mark = c.text != value;
    c.text = value;
    return;
  }
  char buf[64];
  std::size_t n = 0;
  for (char ch : value)
    if (ch != ',' && n < sizeof buf) buf[n++] = ch;
  double v = 0;
  if (std::from_chars(buf, buf + n, v).ec != std::errc{}) return;
  c.mark = v > c.value ? 2 : v < c.value ? 3 : 0;
  c.value = v;
  char out[64];
  const auto r = std::to_chars(out, out + sizeof out, v, std::chars_format::fixed, it->second.decimals);
  c.text.assign(out, r.ptr);
}

void BM_QuoteUpdate_Baseline(benchmark::State& state) {
  auto& f = Quotes();
  std::unordered_map<std::string, BaseRecord> map;
  for (const auto& r : f.list) map[r.instrumentCode].decimals = r.decimals;
  for (const auto& u : f.updates) BaselineUpdate(map, f.list[static_cast<std::size_t>(u.ins)].instrumentCode, u.field, u.value);
  std::size_t i = 0;
  for (auto _ : state) {
    const auto& u = f.updates[i];
    BaselineUpdate(map, f.list[static_cast<std::size_t>(u.ins)].instrumentCode, u.field, u.value);
    benchmark::ClobberMemory();
    i = (i + 1) & (kUpdates - 1);
  }
  state.SetItemsProcessed(state.iterations());
}

// ---- quote get ----------------------------------------------------------

void BM_QuoteGet_Store(benchmark::State& state) {
  auto& f = Quotes();
  QuoteStore store;
  for (const auto& k : f.keys) store.Get(k, 0);
  for (const auto& u : f.updates) store.Update(f.keys[static_cast<std::size_t>(u.ins)], f.fieldNames[static_cast<std::size_t>(u.field)], u.wvalue, 1);
  std::size_t i = 0;
  for (auto _ : state) {
    benchmark::DoNotOptimize(store.Get(f.keys[i], 2));
    i = (i + 7919) % kQuoteInstruments;
  }
  state.SetItemsProcessed(state.iterations());
}

void BM_QuoteGet_Baseline(benchmark::State& state) {
  auto& f = Quotes();
  std::unordered_map<InstrumentKey, QuoteRecord> map;
  {
    QuoteStore store;
    for (const auto& k : f.keys) store.Get(k, 0);
    for (const auto& u : f.updates) store.Update(f.keys[static_cast<std::size_t>(u.ins)], f.fieldNames[static_cast<std::size_t>(u.field)], u.wvalue, 1);
    for (const auto& k : f.keys) map.emplace(k, store.Get(k, 0));
  }
  std::size_t i = 0;
  for (auto _ : state) {
    QuoteRecord copy = map.find(f.keys[i])->second;
    benchmark::DoNotOptimize(copy);
    i = (i + 7919) % kQuoteInstruments;
  }
  state.SetItemsProcessed(state.iterations());
}

// ---- instrument list ----------------------------------------------------

std::vector<JInstrumentUnderlying>& BigList() {
  static auto list = MakeInstruments(kListInstruments);
  return list;
}
std::vector<InstrumentKey>& BigKeys() {
  static std::vector<InstrumentKey> keys = [] {
    std::vector<InstrumentKey> k;
    for (const auto& r : BigList()) k.push_back(InstrumentKeyOf(r));
    std::shuffle(k.begin(), k.end(), std::mt19937(3));
    return k;
  }();
  return keys;
}

void BM_InstrumentFill_Store(benchmark::State& state) {
  auto& list = BigList();
  for (auto _ : state) {
    InstrumentStore_ReadOnly store;
    store.Fill(&list);
    benchmark::DoNotOptimize(store.Version());
  }
  state.SetItemsProcessed(state.iterations() * kListInstruments);
}

void BM_InstrumentFill_Baseline(benchmark::State& state) {
  auto& list = BigList();
  for (auto _ : state) {
    std::unordered_map<InstrumentKey, int> index;
    index.reserve(list.size());
    for (std::size_t p = 0; p < list.size(); ++p) index[InstrumentKey{list[p].productId, hv::Widen(list[p].instrumentCode)}] = static_cast<int>(p);
    benchmark::DoNotOptimize(index.size());
  }
  state.SetItemsProcessed(state.iterations() * kListInstruments);
}

void BM_InstrumentFindAll_Store(benchmark::State& state) {
  InstrumentStore_ReadOnly store;
  store.Fill(&BigList());
  JInstrumentUnderlying out;
  for (auto _ : state) {
    int found = 0;
    for (const auto& k : BigKeys()) found += store.Find(k, out);
    benchmark::DoNotOptimize(found);
  }
  state.SetItemsProcessed(state.iterations() * kListInstruments);
}

// The same without a copy of each record (what views should use to read).
void BM_InstrumentFindAll_Pointer(benchmark::State& state) {
  InstrumentStore_ReadOnly store;
  store.Fill(&BigList());
  for (auto _ : state) {
    int found = 0;
    for (const auto& k : BigKeys()) found += store.FindPtr(k) != nullptr;
    benchmark::DoNotOptimize(found);
  }
  state.SetItemsProcessed(state.iterations() * kListInstruments);
}

void BM_InstrumentFindAll_Baseline(benchmark::State& state) {
  auto& list = BigList();
  std::unordered_map<InstrumentKey, int> index;
  for (std::size_t p = 0; p < list.size(); ++p) index[InstrumentKeyOf(list[p])] = static_cast<int>(p);
  JInstrumentUnderlying out;
  for (auto _ : state) {
    int found = 0;
    for (const auto& k : BigKeys()) {
      const auto it = index.find(k);
      if (it != index.end()) {
        out = list[static_cast<std::size_t>(it->second)];
        ++found;
      }
    }
    benchmark::DoNotOptimize(found);
  }
  state.SetItemsProcessed(state.iterations() * kListInstruments);
}

// ---- tape recount -------------------------------------------------------

std::wstring PageText(int page) {
  std::wstring s;
  for (int t = 40; t > 0; --t) s += L"20261206 09:30:01|12.345|1000|1|x|" + std::to_wstring(page * 40 + t) + L";";
  return s;
}

struct TapeFixture {
  SalesPageStore store;
  std::wstring code = L"INS000042.XS";
  TapeFixture() {
    for (int i = 0; i < kPages; ++i) {
      const PageKey k{3, code, i == 0 ? 99998 : i};
      store.Get(k, 0);
      store.Update(k, SalesPageLayout::TradeData, PageText(i), 1);
    }
  }
};
TapeFixture& Tape() {
  static TapeFixture f;
  return f;
}

struct RecountResult {
  int lastFilled = -1;
  std::uint64_t newest = 0;
};

// The recount a time-and-sales view runs every 200 ms: every page of the tape,
// one lock, no copies.
void BM_TapeRecount_Store(benchmark::State& state) {
  auto& f = Tape();
  for (auto _ : state) {
    RecountResult res = f.store.Read([&](const SalesPageStore::Reader& rd) {
      RecountResult r;
      PageKey k{3, f.code, 0};
      for (int i = 0; i < kPages; ++i) {
        k.Page = i == 0 ? 99998 : i;
        const auto* rec = rd.Find(k);
        if (rec && !rec->cells[0].text.empty()) {
          r.lastFilled = i;
          r.newest = std::max(r.newest, rec->version);
        }
      }
      return r;
    });
    benchmark::DoNotOptimize(res);
  }
  state.SetItemsProcessed(state.iterations() * kPages);
}

void BM_TapeRecount_Baseline(benchmark::State& state) {
  auto& f = Tape();
  std::unordered_map<PageKey, SalesPageRecord> map;
  for (int i = 0; i < kPages; ++i) {
    const PageKey k{3, f.code, i == 0 ? 99998 : i};
    SalesPageRecord r;
    f.store.Peek(k, r);
    map.emplace(k, r);
  }
  for (auto _ : state) {
    RecountResult r;
    PageKey k{3, f.code, 0};
    for (int i = 0; i < kPages; ++i) {
      k.Page = i == 0 ? 99998 : i;
      const auto it = map.find(k);
      if (it != map.end() && !it->second.cells[0].text.empty()) {
        r.lastFilled = i;
        r.newest = std::max(r.newest, it->second.version);
      }
    }
    benchmark::DoNotOptimize(r);
  }
  state.SetItemsProcessed(state.iterations() * kPages);
}

// The same recount done with a copy of every page (what Get-per-page would cost).
void BM_TapeRecount_Copies(benchmark::State& state) {
  auto& f = Tape();
  for (auto _ : state) {
    RecountResult r;
    SalesPageRecord rec;
    for (int i = 0; i < kPages; ++i) {
      if (f.store.Peek(PageKey{3, f.code, i == 0 ? 99998 : i}, rec) && !rec.cells[0].text.empty()) {
        r.lastFilled = i;
        r.newest = std::max(r.newest, rec.version);
      }
    }
    benchmark::DoNotOptimize(r);
  }
  state.SetItemsProcessed(state.iterations() * kPages);
}

// Nothing changed since the last tick: one atomic read.
void BM_TapeRecount_Unchanged(benchmark::State& state) {
  auto& f = Tape();
  const std::uint64_t seen = f.store.Version();
  for (auto _ : state) benchmark::DoNotOptimize(f.store.Version() == seen);
}

BENCHMARK(BM_QuoteUpdate_Store);
BENCHMARK(BM_QuoteUpdate_Baseline);
BENCHMARK(BM_QuoteUpdate_FromTerminal);
BENCHMARK(BM_QuoteGet_Store);
BENCHMARK(BM_QuoteGet_Baseline);
BENCHMARK(BM_InstrumentFill_Store)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_InstrumentFill_Baseline)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_InstrumentFindAll_Store)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_InstrumentFindAll_Baseline)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_InstrumentFindAll_Pointer)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_TapeRecount_Store)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_TapeRecount_Baseline)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_TapeRecount_Copies)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_TapeRecount_Unchanged);

// A busy stock's day as the live page brings it: "TRADEDATA" items of trades
// numbered `from`..`to`, newest first.
std::wstring TradeItems(int from, int to) {
  std::wstring text;
  for (int n = to; n >= from; --n) {
    if (!text.empty()) text += L';';
    const int second = n / 3;
    wchar_t time[32];
    std::swprintf(time, 32, L"20261207%02d:%02d:%02d", 9 + second / 3600 % 8, second / 60 % 60, second % 60);
    text += time + (L"|" + std::to_wstring(7 + n % 30 / 100.0).substr(0, 5) + L"|" + std::to_wstring(100 * (1 + n % 37)) +
                    L"|" + std::to_wstring(n % 4) + L"||" + std::to_wstring(n));
  }
  return text;
}

// The live page arrives with every push and holds the newest hundred trades,
// nearly all of them held already: what storing it costs.
void BM_TradeTapeLivePage(benchmark::State& state) {
  TradeTape tape;
  const InstrumentKey key{3, L"LIVE"};
  tape.StorePage(key, TradeItems(1, 20000));
  const std::wstring live = TradeItems(19901, 20000);
  for (auto _ : state) benchmark::DoNotOptimize(tape.StorePage(key, live));
  state.SetItemsProcessed(state.iterations() * 100);
}
BENCHMARK(BM_TradeTapeLivePage);

std::size_t HeapInUse() {
  const struct mallinfo2 m = mallinfo2();
  return m.uordblks + m.hblkhd;
}

// The heap a day of trades takes in the tape, and as records of four wide
// strings each (how the tape kept them before it packed them).
std::pair<double, double> TradeTapeBytesPerTrade() {
  constexpr int kTrades = 50000;
  const std::wstring day = TradeItems(1, kTrades);
  std::vector<TradeRecord> parsed;
  mvd::ParseTradeData(day, [&](TradeRecord&& r) { parsed.push_back(std::move(r)); });
  std::size_t before = HeapInUse();
  auto tape = std::make_unique<TradeTape>();
  for (const TradeRecord& r : parsed) tape->Store(InstrumentKey{3, L"DAY"}, r);
  const double packed = double(HeapInUse() - before) / kTrades;
  before = HeapInUse();
  auto records = std::make_unique<std::vector<TradeRecord>>(parsed);
  const double plain = double(HeapInUse() - before) / kTrades;
  return {packed, plain};
}

// Keeps each benchmark's CPU time per iteration (in nanoseconds) for the summary:
// on a shared machine CPU time is steadier than wall time.
class Collector : public benchmark::ConsoleReporter {
 public:
  std::map<std::string, double> ns;
  std::map<std::string, double> rate;
  void ReportRuns(const std::vector<Run>& runs) override {
    for (const auto& r : runs) {
      if (r.run_type != Run::RT_Iteration || r.error_occurred) continue;
      // With repetitions, the fastest run is the one least disturbed by others.
      const std::string name = r.run_name.function_name;
      const double t = r.GetAdjustedCPUTime() * benchmark::GetTimeUnitMultiplier(benchmark::kNanosecond) /
                       benchmark::GetTimeUnitMultiplier(r.time_unit);
      const auto old = ns.find(name);
      if (old == ns.end() || t < old->second) {
        ns[name] = t;
        const auto it = r.counters.find("items_per_second");
        if (it != r.counters.end()) rate[name] = it->second;
      }
    }
    ConsoleReporter::ReportRuns(runs);
  }
};

}  // namespace

int main(int argc, char** argv) {
  // Three repetitions unless asked otherwise; the summary takes the fastest.
  std::vector<char*> args(argv, argv + argc);
  bool reps = false;
  for (int i = 1; i < argc; ++i) reps = reps || std::string(argv[i]).rfind("--benchmark_repetitions", 0) == 0;
  static char kReps[] = "--benchmark_repetitions=3";
  static char kAggr[] = "--benchmark_report_aggregates_only=false";
  if (!reps) {
    args.push_back(kReps);
    args.push_back(kAggr);
  }
  argc = static_cast<int>(args.size());
  args.push_back(nullptr);
  argv = args.data();
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  Collector rep;
  benchmark::RunSpecifiedBenchmarks(&rep);
  benchmark::Shutdown();

  auto get = [&](const char* n) {
    const auto it = rep.ns.find(n);
    return it == rep.ns.end() ? 0.0 : it->second;
  };
  auto rate = [&](const char* n) {
    const auto it = rep.rate.find(n);
    return it == rep.rate.end() ? 0.0 : it->second;
  };
  std::printf("\nquote update: store %.0f updates/s, baseline %.0f updates/s, from terminal text %.0f updates/s\n",
              rate("BM_QuoteUpdate_Store"), rate("BM_QuoteUpdate_Baseline"), rate("BM_QuoteUpdate_FromTerminal"));
  std::printf("instrument list of %d: fill %.2f ms, find of every key %.2f ms (without copies %.2f ms)\n",
              kListInstruments, get("BM_InstrumentFill_Store") / 1e6, get("BM_InstrumentFindAll_Store") / 1e6,
              get("BM_InstrumentFindAll_Pointer") / 1e6);
  std::printf("quote record copy (Get): %.0f ns; recount over %d pages: %.1f us (with a copy per page %.1f us)\n",
              get("BM_QuoteGet_Store"), kPages, get("BM_TapeRecount_Store") / 1e3, get("BM_TapeRecount_Copies") / 1e3);
  const auto [packed, plain] = TradeTapeBytesPerTrade();
  std::printf("trade tape: %.0f bytes a trade (as records of four wide strings: %.0f); live page of 100 stored in %.1f us\n",
              packed, plain, get("BM_TradeTapeLivePage") / 1e3);
  const std::pair<const char*, const char*> pairs[] = {
      {"quote_update", "BM_QuoteUpdate"}, {"quote_get", "BM_QuoteGet"}, {"instrument_fill", "BM_InstrumentFill"},
      {"instrument_find", "BM_InstrumentFindAll"}, {"tape_recount", "BM_TapeRecount"}};
  for (const auto& [name, stem] : pairs) {
    const double s = get((std::string(stem) + "_Store").c_str());
    const double b = get((std::string(stem) + "_Baseline").c_str());
    if (s > 0 && b > 0) std::printf("RATIO %s %.2f\n", name, s / b);
  }
  return 0;
}
