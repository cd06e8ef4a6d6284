// One instrument search of the combo box over 200,000 and 500,000 instruments,
// for keys of one, two and three letters, against a plain linear
// std::string::find over pre-lowered names collecting the matches. Ends with
// "RATIO search_<n>char_<size>k <r>" lines (search time / baseline time), and
// the first keystroke at 500,000 instruments: what attaching the list costs
// the UI thread, how long the lookup lists take in the background, and the
// first search once they are ready (and before, when the user types at once).
//
//   build-ui/bin/bench_search
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <ctime>
#include <map>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "controls/InstrumentSearch.h"

namespace {

// Names, symbols and exchanges shaped like a real list: a few hundred word
// stems combined, upper-case symbols with digits, a dozen exchanges.
std::vector<JInstrumentUnderlying> MakeList(std::size_t n) {
  static const char* first[] = {"Alpha", "Beacon", "China", "Dragon", "Eastern", "First", "Golden", "Harbour",
                                "Imperial", "Jade", "Kowloon", "Lotus", "Metro", "North", "Ocean", "Pacific",
                                "Quantum", "Royal", "Summit", "Tiger", "United", "Victory", "Western", "Xinhua",
                                "Yangtze", "Zenith"};
  static const char* second[] = {"Holdings", "Bank", "Energy", "Telecom", "Properties", "Pharma", "Motors",
                                 "Securities", "Insurance", "Resources", "Technology", "Logistics", "Foods",
                                 "Airlines", "Mining", "Retail"};
  static const char* tail[] = {"Ltd", "Group", "Corp", "Inc", "Co", "plc", "Intl", "-H", "-R", "Class A"};
  static const char* exchanges[] = {"HKEX", "SSE", "SZSE", "NYSE", "NASDAQ", "LSE", "TSE", "SGX", "ASX", "FWB",
                                    "KRX", "TWSE"};
  std::mt19937 rng(42);
  std::vector<JInstrumentUnderlying> list(n);
  for (std::size_t i = 0; i < n; ++i) {
    auto& ins = list[i];
    ins.instrumentName = std::string(first[rng() % 26]) + " " + second[rng() % 16] + " " + tail[rng() % 10];
    if (rng() % 3 == 0) ins.instrumentName += " " + std::to_string(rng() % 1000);
    std::string sym;
    for (int k = 0; k < 3; ++k) sym += char('A' + rng() % 26);
    ins.symbol = sym + std::to_string(i % 10000);
    ins.exchangeCode = exchanges[rng() % 12];
    ins.instrumentCode = ins.symbol;
    ins.productId = std::int64_t(i % 7);
  }
  return list;
}

struct Data {
  std::vector<JInstrumentUnderlying> list;
  std::vector<std::string> lowered;  // baseline: names lowered once
  InstrumentSearchIndex index;
};

Data& DataFor(std::size_t n) {
  static std::map<std::size_t, std::unique_ptr<Data>> cache;
  auto& d = cache[n];
  if (!d) {
    d = std::make_unique<Data>();
    d->list = MakeList(n);
    d->lowered.reserve(n);
    for (const auto& ins : d->list) d->lowered.push_back(InstrumentSearchIndex::LowerAscii(ins.instrumentName));
    d->index.Build(d->list);
  }
  return *d;
}

const char* KeyFor(int chars) { return chars == 1 ? "a" : chars == 2 ? "ho" : "hol"; }

void BM_Search(benchmark::State& state) {
  auto& d = DataFor(std::size_t(state.range(0)));
  const std::string key = KeyFor(int(state.range(1)));
  std::size_t found = 0;
  for (auto _ : state) {
    auto r = d.index.Search(key);
    found = r.size();
    benchmark::DoNotOptimize(r.data());
  }
  state.counters["matches"] = double(found);
}

void BM_Baseline(benchmark::State& state) {
  auto& d = DataFor(std::size_t(state.range(0)));
  const std::string key = KeyFor(int(state.range(1)));
  std::size_t found = 0;
  for (auto _ : state) {
    std::vector<int> r;
    for (std::size_t i = 0; i < d.lowered.size(); ++i)
      if (d.lowered[i].find(key) != std::string::npos) r.push_back(int(i));
    found = r.size();
    benchmark::DoNotOptimize(r.data());
  }
  state.counters["matches"] = double(found);
}

void BM_BuildIndex(benchmark::State& state) {
  auto& d = DataFor(std::size_t(state.range(0)));
  for (auto _ : state) {
    InstrumentSearchIndex index;
    index.Build(d.list);
    benchmark::DoNotOptimize(&index);
  }
}

void Args(benchmark::internal::Benchmark* b) {
  for (int n : {200000, 500000})
    for (int chars : {1, 2, 3}) b->Args({n, chars});
  b->Unit(benchmark::kMillisecond);
}

BENCHMARK(BM_Search)->Apply(Args);
BENCHMARK(BM_Baseline)->Apply(Args);
BENCHMARK(BM_BuildIndex)->Arg(200000)->Arg(500000)->Unit(benchmark::kMillisecond);

double MsSince(std::chrono::steady_clock::time_point t0) {
  return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - t0).count();
}
// CPU time of this thread (the machine may be shared: wall time says less).
double ThreadCpuMs() {
  timespec t{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t);
  return double(t.tv_sec) * 1e3 + double(t.tv_nsec) / 1e6;
}

// Attaching starts the build; a user who waits finds the index ready, one who
// types at once gets a scan of the copied texts.
void FirstKeystroke(std::size_t n) {
  auto& d = DataFor(n);
  using Clock = std::chrono::steady_clock;
  InstrumentSearchIndex ready;
  auto t0 = Clock::now();
  double c0 = ThreadCpuMs();
  ready.StartBuild(d.list);
  const double attachCpu = ThreadCpuMs() - c0;
  const double attach = MsSince(t0);
  t0 = Clock::now();
  ready.WaitIndexed();
  const double background = MsSince(t0);
  t0 = Clock::now();
  c0 = ThreadCpuMs();
  const std::size_t found = ready.Search(KeyFor(3)).size();
  const double firstCpu = ThreadCpuMs() - c0;
  const double first = MsSince(t0);

  InstrumentSearchIndex early;
  early.StartBuild(d.list);
  t0 = Clock::now();
  const std::size_t foundEarly = early.Search(KeyFor(3)).size();
  const double beforeReady = MsSince(t0);
  early.WaitIndexed();

  t0 = Clock::now();
  InstrumentSearchIndex onTheSpot;
  onTheSpot.Build(d.list);
  onTheSpot.Search(KeyFor(3));
  const double buildThenSearch = MsSince(t0);

  std::printf("first keystroke %zuk: attach %.1f ms on the UI thread (%.1f ms CPU), lists built in the background "
              "in %.0f ms; first search \"%s\" with the index %.2f ms (%.2f ms CPU, %zu matches), before it is "
              "ready %.1f ms (%zu matches); building on the keystroke would take %.0f ms\n",
              n / 1000, attach, attachCpu, background, KeyFor(3), first, firstCpu, found, beforeReady, foundEarly,
              buildThenSearch);
  std::printf("FIRST_KEYSTROKE search_%zuk %.2f ms\n", n / 1000, first);
}

class RatioReporter : public benchmark::ConsoleReporter {
 public:
  // CPU ns per iteration by "<function>/<args>" (the machine is shared).
  std::map<std::string, double> perIteration;
  void ReportRuns(const std::vector<Run>& runs) override {
    for (const auto& r : runs)
      if (r.run_type == Run::RT_Iteration && r.iterations > 0)
        perIteration[r.run_name.function_name + "/" + r.run_name.args] =
            r.cpu_accumulated_time * 1e9 / double(r.iterations);
    ConsoleReporter::ReportRuns(runs);
  }
};

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  const auto& t = reporter.perIteration;
  for (int n : {200000, 500000})
    for (int chars : {1, 2, 3}) {
      const std::string args = std::to_string(n) + "/" + std::to_string(chars);
      auto s = t.find("BM_Search/" + args);
      auto b = t.find("BM_Baseline/" + args);
      if (s == t.end() || b == t.end() || b->second <= 0) continue;
      std::printf("search %dchar %dk: %.3f ms, baseline %.3f ms\n", chars, n / 1000, s->second / 1e6, b->second / 1e6);
      std::printf("RATIO search_%dchar_%dk %.3f\n", chars, n / 1000, s->second / b->second);
    }
  FirstKeystroke(500000);
  std::fflush(stdout);
  benchmark::Shutdown();
  return 0;
}
