// The terminal's push path: 2,000 subscribed instruments (18 quote fields each)
// moving in the simulated market, pushed through the host runtime to a view
// that only counts what it receives.
//
//   cmake --build build --target bench_host && build/bin/bench_host
//
// BM_Host_PushEndToEnd  market steps + change detection + 410 delivery
// BM_Host_MarketOnly    the same market steps alone (subtracted to get the host's share)
// BM_Host_Baseline      the same number of ready-made updates handed straight to the view
// The summary prints updates per second and "RATIO host_push <host/baseline>"
// (host cost per update over a bare virtual call with the record).
// bench-links: term_host term_sim HostView platform Qt6::Widgets
#include <benchmark/benchmark.h>

#include <QApplication>
#include <ctime>
#include <cstdio>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "hostview/MessageIds.h"
#include "hostview/Records.h"
#include "hostview/SuperBaseView.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"

namespace {

constexpr int kSubscribed = 2000;
constexpr std::uint32_t kPumpMs = 100;
const char* const kFields[] = {"BID", "ASK", "BVOL", "SVOL", "LAST", "CHANGE", "PCHANGE", "OPEN", "HIGH",
                               "LOW", "CLOSE", "VOL", "REMARKS", "CFD_STATUS", "DMA_STATUS", "MONTH", "YEAR", "TAC"};

// CPU time of this thread: the machine is shared, wall time is noise.
double ThreadCpuNs() {
  timespec ts{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &ts);
  return double(ts.tv_sec) * 1e9 + double(ts.tv_nsec);
}

class CountingView : public CSuperBaseView {
 public:
  std::uint32_t OnHostMessage(UINT msg, LPARAM data) override {
    if (msg == hm::FieldValue) {
      ++pushes;
      bytes += FromLParam<const FieldUpdate>(data)->value.size();
    } else if (msg == hm::RequestField) {
      ++answers;
    }
    return 0;
  }
  std::uint64_t pushes = 0, answers = 0, bytes = 0;
};

void EnsureApp() {
  static int argc = 1;
  static char name[] = "bench_host";
  static char* argv[] = {name, nullptr};
  if (!QApplication::instance()) {
    qputenv("QT_QPA_PLATFORM", "offscreen");
    new QApplication(argc, argv);
  }
}

term::HostOptions Options() {
  term::HostOptions o;
  o.seed = 99;
  o.instruments = 3000;
  o.fieldUpdatesPerSecond = 1000000;  // let every subscribed instrument move at its own pace
  o.logToStderr = false;
  return o;
}

// Subscribes `view` to the first 2,000 non-index instruments, in the views' batches.
std::vector<int> SubscribeAll(CountingView& view, const sim::Market& market) {
  std::vector<int> chosen;
  for (int i = 0; i < int(market.Instruments().size()) && int(chosen.size()) < kSubscribed; ++i)
    if (market.Instruments()[std::size_t(i)].exchangeCode != "WIDX") chosen.push_back(i);
  for (int i : chosen) {
    const auto& ins = market.Instruments()[std::size_t(i)];
    FieldRequest r;
    r.productId = ins.productId;
    r.instrumentCode = ins.instrumentCode;
    for (const char* f : kFields) {
      r.fieldName = f;
      view.SendChildFeedback(hm::RequestField, ToLParam(&r));
    }
    r.fieldName = "PMP_Submit";
    view.SendChildFeedback(hm::RequestField, ToLParam(&r));
  }
  return chosen;
}

void BM_Host_PushEndToEnd(benchmark::State& state) {
  EnsureApp();
  term::HostRuntime runtime(Options());
  CountingView view;
  runtime.AttachView(&view);
  SubscribeAll(view, runtime.Market());
  std::uint32_t now = runtime.Market().Now();
  runtime.Pump(now);
  view.pushes = 0;
  double marketNs = 0, hostNs = 0;
  for (auto _ : state) {
    now += kPumpMs;
    // The market moves first, so that the pump's own work can be timed apart.
    const double t0 = ThreadCpuNs();
    runtime.Market().AdvanceTo(now);
    const double t1 = ThreadCpuNs();
    runtime.Pump(now);
    const double t2 = ThreadCpuNs();
    marketNs += t1 - t0;
    hostNs += t2 - t1;
  }
  state.counters["updates"] = benchmark::Counter(double(view.pushes), benchmark::Counter::kIsRate);
  state.counters["per_pump"] = double(view.pushes) / double(state.iterations());
  state.counters["host_ns_per_update"] = hostNs / std::max(1.0, double(view.pushes));
  state.counters["market_share"] = marketNs / std::max(1.0, marketNs + hostNs);
  runtime.DestroyView(&view);
}

void BM_Host_MarketOnly(benchmark::State& state) {
  sim::MarketConfig c;
  c.seed = Options().seed;
  c.instruments = Options().instruments;
  c.fieldUpdatesPerSecond = Options().fieldUpdatesPerSecond;
  sim::Market market(c);
  int n = 0;
  for (int i = 0; i < int(market.Instruments().size()) && n < kSubscribed; ++i)
    if (market.Instruments()[std::size_t(i)].exchangeCode != "WIDX") {
      for (std::size_t f = 0; f < std::size(kFields); ++f) market.AddInterest(i);
      ++n;
    }
  std::uint32_t now = market.Now();
  std::size_t changed = 0;
  for (auto _ : state) {
    now += kPumpMs;
    market.AdvanceTo(now);
    changed += market.TakeChanged().size();
  }
  state.counters["changed_per_pump"] = double(changed) / double(state.iterations());
}

// The same volume of updates, built beforehand, handed straight to the view.
void BM_Host_Baseline(benchmark::State& state) {
  EnsureApp();
  CountingView view;
  std::vector<FieldUpdate> updates;
  const std::size_t perPump = std::size_t(state.range(0));
  for (std::size_t k = 0; k < perPump; ++k) {
    FieldUpdate u;
    u.productId = 101;
    u.instrumentCode = "C" + std::to_string(k % kSubscribed);
    u.fieldName = kFields[k % std::size(kFields)];
    u.value = std::to_string(10.0 + double(k % 997) / 100.0);
    updates.push_back(std::move(u));
  }
  for (auto _ : state) {
    for (auto& u : updates) {
      // A push builds its record for the call, as the host does.
      FieldUpdate copy = u;
      view.OnHostMessage(hm::FieldValue, ToLParam(&copy));
    }
  }
  state.counters["updates"] = benchmark::Counter(double(view.pushes), benchmark::Counter::kIsRate);
}

class Collector : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override {
    ConsoleReporter::ReportRuns(runs);
    for (const Run& r : runs) {
      if (r.run_type != Run::RT_Iteration || r.iterations == 0) continue;
      const std::string name = r.benchmark_name().substr(0, r.benchmark_name().find('/'));
      const double ns = r.cpu_accumulated_time / double(r.iterations) * 1e9;
      if (!best.count(name) || ns < best[name].first) {
        double extra = 0;
        if (auto it = r.counters.find("per_pump"); it != r.counters.end()) extra = it->second;
        if (auto it = r.counters.find("changed_per_pump"); it != r.counters.end()) extra = it->second;
        best[name] = {ns, extra};
        if (auto it = r.counters.find("host_ns_per_update"); it != r.counters.end()) hostNsPerUpdate = it->second;
        if (auto it = r.counters.find("market_share"); it != r.counters.end()) marketShare = it->second;
      }
    }
  }
  std::map<std::string, std::pair<double, double>> best;  // ns per iteration, counter
  double hostNsPerUpdate = 0, marketShare = 0;
};

}  // namespace

BENCHMARK(BM_Host_PushEndToEnd)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Host_MarketOnly)->Unit(benchmark::kMillisecond);

int main(int argc, char** argv) {
  std::vector<char*> args(argv, argv + argc);
  bool reps = false;
  for (int i = 1; i < argc; ++i) reps = reps || std::string(argv[i]).rfind("--benchmark_repetitions", 0) == 0;
  static char kReps[] = "--benchmark_repetitions=3";
  if (!reps) args.push_back(kReps);
  argc = int(args.size());
  args.push_back(nullptr);
  argv = args.data();
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  // How many updates one pump pushes, so that the baseline hands over as many.
  long estimate = 0;
  {
    EnsureApp();
    term::HostRuntime runtime(Options());
    CountingView view;
    runtime.AttachView(&view);
    SubscribeAll(view, runtime.Market());
    std::uint32_t now = runtime.Market().Now();
    runtime.Pump(now);
    view.pushes = 0;
    for (int k = 0; k < 50; ++k) runtime.Pump(now += kPumpMs);
    estimate = long(view.pushes / 50);
    runtime.DestroyView(&view);
  }
  if (estimate > 0) benchmark::RegisterBenchmark("BM_Host_Baseline", BM_Host_Baseline)->Arg(estimate)->Unit(benchmark::kMillisecond);
  Collector first;
  benchmark::RunSpecifiedBenchmarks(&first);
  benchmark::Shutdown();
  Collector& second = first;
  const double perPump = first.best.count("BM_Host_PushEndToEnd") ? first.best["BM_Host_PushEndToEnd"].second : 0;

  const auto e2e = first.best["BM_Host_PushEndToEnd"];
  const auto market = first.best["BM_Host_MarketOnly"];
  const auto base = second.best["BM_Host_Baseline"];
  if (e2e.first <= 0 || perPump < 1) return 0;
  const double hostNs = first.hostNsPerUpdate * perPump;  // per pump, timed inside the run
  std::printf("\n%d subscribed instruments, %.0f updates per %u ms pump (%.0f instruments changed)\n", kSubscribed,
              perPump, kPumpMs, market.second);
  std::printf("end to end (market + host): %.0f updates/s, market %.0f%% of the time\n", perPump / (e2e.first * 1e-9),
              first.marketShare * 100);
  std::printf("host alone (change detection + 410 delivery): %.0f updates/s, %.0f ns per update\n",
              1e9 / first.hostNsPerUpdate, first.hostNsPerUpdate);
  if (base.first > 0 && estimate > 0) {
    const double baseNs = base.first / double(estimate);
    std::printf("baseline (record + virtual call): %.0f updates/s\n", 1e9 / baseNs);
    std::printf("RATIO host_push %.2f\n", (hostNs / perPump) / baseNs);
  }
  return 0;
}
