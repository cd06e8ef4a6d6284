// What --record costs: a session at the default feed (3,000 instruments,
// 4,000 field updates per second) with the views a trader keeps open — a
// 60-instrument watchlist, and on three busy shares a 20-level book, the
// live trade page with its header and the trade summary — pumped through the
// host runtime every 50 ms, once plain and once recording to a file.
//
//   cmake --build build --target bench_record && build/bin/bench_record
//
// BM_Session/0  one simulated second, plain
// BM_Session/1  the same second, recorded (compression and writes included)
// Ends with "RATIO record_overhead <recorded/plain>" and the file's growth.
// bench-links: term_host term_sim HostView platform Qt6::Widgets
#include <benchmark/benchmark.h>

#include <QApplication>
#include <QDir>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "hostview/MessageIds.h"
#include "hostview/Records.h"
#include "hostview/SuperBaseView.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/host/MarketRecording.h"
#include "terminal/host/MarketSource.h"
#include "terminal/sim/Market.h"

namespace {

constexpr std::uint32_t kPumpMs = 50;
constexpr int kWatchlist = 60;
constexpr int kBusy = 3;
constexpr int kIterations = 60;
const char* const kQuoteFields[] = {"BID", "ASK", "BVOL", "SVOL", "LAST", "CHANGE", "PCHANGE", "OPEN", "HIGH",
                                    "LOW", "CLOSE", "VOL", "REMARKS", "CFD_STATUS", "DMA_STATUS", "MONTH", "YEAR", "TAC"};

double ThreadCpuNs() {
  timespec ts{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &ts);
  return double(ts.tv_sec) * 1e9 + double(ts.tv_nsec);
}

class CountingView : public CSuperBaseView {
 public:
  std::uint32_t OnHostMessage(UINT msg, LPARAM) override {
    if (msg == hm::FieldValue || msg == hm::RequestField) ++received;
    return 0;
  }
  void Ask(const JInstrumentUnderlying& ins, const char* field, int param, int kind) {
    FieldRequest r;
    r.productId = ins.productId;
    r.instrumentCode = ins.instrumentCode;
    r.fieldName = field;
    r.param = param;
    r.kind = kind;
    SendChildFeedback(hm::RequestField, ToLParam(&r));
  }
  std::uint64_t received = 0;
};

void EnsureApp() {
  static int argc = 1;
  static char name[] = "bench_record";
  static char* argv[] = {name, nullptr};
  if (!QApplication::instance()) {
    qputenv("QT_QPA_PLATFORM", "offscreen");
    new QApplication(argc, argv);
  }
}

std::string RecordPath() { return QDir::tempPath().toStdString() + "/bench_record.mvrec"; }

struct Session {
  std::unique_ptr<term::HostRuntime> runtime;
  CountingView prices, depth, tape, summary;
  std::uint32_t now = 0;

  explicit Session(bool record) {
    term::HostOptions o;  // the default feed
    o.logToStderr = false;
    if (record) {
      o.record = std::make_shared<term::rec::Writer>();
      std::string error;
      if (!o.record->Open(RecordPath(), error)) std::fprintf(stderr, "%s\n", error.c_str());
    }
    runtime = std::make_unique<term::HostRuntime>(o);
    for (CountingView* v : {&prices, &depth, &tape, &summary}) runtime->AttachView(v);
    const auto& all = runtime->Source().Instruments();
    std::vector<int> shares;
    for (int i = 0; i < int(all.size()); ++i)
      if (all[std::size_t(i)].productType == "ES" && all[std::size_t(i)].exchangeCode != "WIDX") shares.push_back(i);
    for (int k = 0; k < kWatchlist && k < int(shares.size()); ++k) {
      for (const char* f : kQuoteFields) prices.Ask(all[std::size_t(shares[std::size_t(k)])], f, 0, 0);
      prices.Ask(all[std::size_t(shares[std::size_t(k)])], "PMP_Submit", 0, 0);
    }
    for (int k = 0; k < kBusy && k < int(shares.size()); ++k) {
      const auto& ins = all[std::size_t(shares[std::size_t(k)])];
      for (const char* f : {"BUY", "SELL", "BVOL", "SVOL", "ORDS_BVOL", "ORDS_SVOL"}) depth.Ask(ins, f, 20, 1);
      depth.Ask(ins, "PMP_Submit", 20, 1);
      tape.Ask(ins, "TRADEDATA", sim::Market::kLivePage, 2);
      for (const char* f : {"DTIME", "HIGH", "LOW", "LAST", "NETCHANGE", "TOTALVALUE", "TOTAL_VOLUME", "PAGECOUNT"})
        tape.Ask(ins, f, sim::Market::kHeaderParam, 2);
      tape.Ask(ins, "PMP_Submit", sim::Market::kHeaderParam, 2);
      summary.Ask(ins, "TRADEDATA", 1, 3);
      for (const char* f : {"TIME", "WEIGHTED_AVG", "RATIO", "LAST", "AVG_TRADE_SIZE", "COUNT", "PAGECOUNT"})
        summary.Ask(ins, f, 0, 3);
      summary.Ask(ins, "PMP_Submit", 0, 3);
    }
    now = runtime->Market().Now();
  }
  ~Session() {
    for (CountingView* v : {&prices, &depth, &tape, &summary}) runtime->DestroyView(v);
  }
  // One simulated second.
  void Second() {
    for (std::uint32_t t = 0; t < 1000; t += kPumpMs) runtime->Pump(now += kPumpMs);
  }
};

void BM_Session(benchmark::State& state) {
  const bool record = state.range(0) != 0;
  EnsureApp();  // before the views
  Session s(record);
  s.Second();  // past the first answers
  double ns = 0;
  std::uint64_t seconds = 0;
  for (auto _ : state) {
    const double t0 = ThreadCpuNs();
    s.Second();
    ns += ThreadCpuNs() - t0;
    ++seconds;
  }
  state.counters["cpu_ms_per_second"] = ns / 1e6 / double(seconds);
  state.counters["deliveries_per_second"] =
      double(s.prices.received + s.depth.received + s.tape.received + s.summary.received) / double(seconds + 1);
  if (record) {
    std::string error;
    s.runtime->FinishRecording(&error);
    state.counters["file_bytes_per_second"] = double(std::filesystem::file_size(RecordPath())) / double(seconds + 1);
  }
}

class Collector : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override {
    ConsoleReporter::ReportRuns(runs);
    for (const Run& r : runs) {
      if (r.run_type != Run::RT_Iteration || r.iterations == 0) continue;
      const auto cpu = r.counters.find("cpu_ms_per_second");
      if (cpu == r.counters.end()) continue;
      const std::string name = r.benchmark_name();
      if (!best.count(name) || cpu->second < best[name]) best[name] = cpu->second;
      if (auto b = r.counters.find("file_bytes_per_second"); b != r.counters.end()) bytesPerSecond = b->second;
    }
  }
  std::map<std::string, double> best;
  double bytesPerSecond = 0;
};

}  // namespace

BENCHMARK(BM_Session)->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond)->Iterations(kIterations);

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
  Collector c;
  benchmark::RunSpecifiedBenchmarks(&c);
  benchmark::Shutdown();
  if (!std::getenv("BENCH_RECORD_KEEP")) std::filesystem::remove(RecordPath());
  const double plain = c.best["BM_Session/0/iterations:" + std::to_string(kIterations)],
               recorded = c.best["BM_Session/1/iterations:" + std::to_string(kIterations)];
  if (plain <= 0 || recorded <= 0) return 0;
  std::printf("\none simulated second: %.2f ms plain, %.2f ms recorded; the file grows %.0f bytes a second\n", plain,
              recorded, c.bytesPerSecond);
  std::printf("RATIO record_overhead %.3f\n", recorded / plain);
  return 0;
}
