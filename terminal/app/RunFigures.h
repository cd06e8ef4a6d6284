#pragma once
// Figures of a measured run: the feed-to-pixel latency per view class
// (--latency-report) and the memory and event-loop figures of a soak
// (--soak-report). Plain bookkeeping: the caller supplies every time, so the
// figures do not depend on which clock drives the run.
#include <cstdint>
#include <map>
#include <string>
#include <unordered_map>
#include <vector>

namespace term {

// Durations in microseconds, kept in 0.1 ms buckets up to 10 s (the worst is
// kept exactly). A percentile is the upper edge of the bucket holding the
// nearest-rank sample, so it never reads better than the truth.
class DurationStats {
 public:
  static constexpr std::int64_t kBucketUs = 100;
  static constexpr std::int64_t kRangeUs = 10'000'000;

  void Add(std::int64_t us);
  std::uint64_t Count() const { return m_count; }
  // p in (0, 1]; 0 when empty. Beyond the range: the worst.
  std::int64_t PercentileUs(double p) const;
  std::int64_t WorstUs() const { return m_worst; }

 private:
  std::vector<std::uint64_t> m_buckets;
  std::uint64_t m_count = 0;
  std::int64_t m_worst = 0;
};

// Feed-to-pixel latency: every 410 pushed to a view is stamped; the end of the
// next paint of that view's window closes every stamp of the view.
class LatencyRecorder {
 public:
  // A view to watch; `key` identifies it (its window), `className` groups it.
  void AddView(const void* key, const std::string& className);
  void RemoveView(const void* key);
  bool Watches(const void* key) const { return m_views.count(key) != 0; }
  void Pushed(const void* key, std::int64_t nowUs);
  void Painted(const void* key, std::int64_t nowUs);

  struct ClassFigures {
    DurationStats latency;
    std::uint64_t views = 0;
    std::uint64_t unpainted = 0;  // stamps still open at the end (a view never painted after them)
  };
  // By class name; the stamps still open count as unpainted.
  std::map<std::string, ClassFigures> Figures() const;
  // "class<TAB>views<TAB>pushes<TAB>p50_ms<TAB>p99_ms<TAB>worst_ms<TAB>unpainted" lines
  // after a heading line, one per class in name order.
  std::string Report(const std::string& title) const;

 private:
  struct View {
    std::string className;
    std::vector<std::int64_t> open;  // stamps waiting for a paint
  };
  std::unordered_map<const void*, View> m_views;
  std::map<std::string, ClassFigures> m_classes;
};

// A soak: resident memory sampled at simulated times, and the wall time of
// every turn of the event loop.
class SoakFigures {
 public:
  // `marketKb`: what the simulated exchange's own day tapes hold then;
  // `heapKb`: the bytes the allocator has handed out and not had back (-1: unknown).
  void SampleRss(double simulatedSeconds, std::int64_t rssKb, std::int64_t marketKb = 0, std::int64_t heapKb = -1);
  // One turn: everything the event loop ran for one step of simulated time.
  void Turn(std::int64_t wallUs, std::int64_t cpuUs);
  // The values pushed to the views over the run (410s), for the report.
  void SetPushes(std::uint64_t pushes, double simulatedSeconds) { m_pushes = pushes; m_seconds = simulatedSeconds; }
  // The field subscriptions the host keeps at the end (each holds the last text sent).
  void SetSubscriptions(std::uint64_t count) { m_subscriptions = count; }

  // Least-squares slope of the samples taken at or after `warmupSeconds`, in
  // MB (1024 kB) per simulated hour; 0 with fewer than two samples.
  double RssGrowthMbPerHour(double warmupSeconds) const;
  // The same for the simulated exchange's tapes, and for the heap in use.
  double MarketGrowthMbPerHour(double warmupSeconds) const;
  double HeapGrowthMbPerHour(double warmupSeconds) const;
  const DurationStats& TurnWall() const { return m_wall; }
  const DurationStats& TurnCpu() const { return m_cpu; }
  const std::vector<std::pair<double, std::int64_t>>& Samples() const { return m_samples; }
  std::string Report(double warmupSeconds, double stepMs) const;
  static double Slope(const std::vector<std::pair<double, std::int64_t>>& samples, double warmupSeconds);

 private:
  std::vector<std::pair<double, std::int64_t>> m_samples;
  std::vector<std::pair<double, std::int64_t>> m_market;
  std::vector<std::pair<double, std::int64_t>> m_heap;
  DurationStats m_wall, m_cpu;
  std::uint64_t m_pushes = 0;
  std::uint64_t m_subscriptions = 0;
  double m_seconds = 0;
};

// The resident set size of this process in kB (VmRSS); -1 when unknown.
std::int64_t ReadRssKb();
// The heap this process uses in kB: what malloc has handed out and not had
// back, without the free memory it keeps.
std::int64_t ReadHeapKb();

}  // namespace term
