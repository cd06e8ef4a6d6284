#include "terminal/app/RunFigures.h"

#include <malloc.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <sstream>

namespace term {

namespace {

std::string Ms(std::int64_t us) {
  char buf[32];
  std::snprintf(buf, sizeof buf, "%.1f", static_cast<double>(us) / 1000.0);
  return buf;
}

}  // namespace

void DurationStats::Add(std::int64_t us) {
  if (us < 0) us = 0;
  if (m_buckets.empty()) m_buckets.assign(static_cast<std::size_t>(kRangeUs / kBucketUs) + 1, 0);
  const auto k = static_cast<std::size_t>(std::min(us / kBucketUs, kRangeUs / kBucketUs));
  ++m_buckets[k];
  ++m_count;
  m_worst = std::max(m_worst, us);
}

std::int64_t DurationStats::PercentileUs(double p) const {
  if (m_count == 0) return 0;
  const auto rank = static_cast<std::uint64_t>(std::ceil(std::clamp(p, 0.0, 1.0) * static_cast<double>(m_count)));
  std::uint64_t seen = 0;
  for (std::size_t k = 0; k < m_buckets.size(); ++k) {
    seen += m_buckets[k];
    if (seen >= std::max<std::uint64_t>(rank, 1)) {
      if (k + 1 == m_buckets.size()) return m_worst;  // the overflow bucket
      return std::min(static_cast<std::int64_t>(k + 1) * kBucketUs, m_worst);
    }
  }
  return m_worst;
}

void LatencyRecorder::AddView(const void* key, const std::string& className) {
  auto [it, added] = m_views.try_emplace(key);
  if (!added) return;
  it->second.className = className;
  ++m_classes[className].views;
}

void LatencyRecorder::RemoveView(const void* key) {
  auto it = m_views.find(key);
  if (it == m_views.end()) return;
  m_classes[it->second.className].unpainted += it->second.open.size();
  m_views.erase(it);
}

void LatencyRecorder::Pushed(const void* key, std::int64_t nowUs) {
  auto it = m_views.find(key);
  if (it != m_views.end()) it->second.open.push_back(nowUs);
}

void LatencyRecorder::Painted(const void* key, std::int64_t nowUs) {
  auto it = m_views.find(key);
  if (it == m_views.end() || it->second.open.empty()) return;
  DurationStats& stats = m_classes[it->second.className].latency;
  for (std::int64_t stamp : it->second.open) stats.Add(nowUs - stamp);
  it->second.open.clear();
}

std::map<std::string, LatencyRecorder::ClassFigures> LatencyRecorder::Figures() const {
  auto out = m_classes;
  for (const auto& [key, view] : m_views) out[view.className].unpainted += view.open.size();
  return out;
}

std::string LatencyRecorder::Report(const std::string& title) const {
  std::ostringstream out;
  out << "# " << title << "\n";
  out << "class\tviews\tpushes\tp50_ms\tp99_ms\tworst_ms\tunpainted\n";
  for (const auto& [cls, f] : Figures())
    out << cls << '\t' << f.views << '\t' << f.latency.Count() << '\t' << Ms(f.latency.PercentileUs(0.5)) << '\t'
        << Ms(f.latency.PercentileUs(0.99)) << '\t' << Ms(f.latency.WorstUs()) << '\t' << f.unpainted << '\n';
  return out.str();
}

void SoakFigures::SampleRss(double simulatedSeconds, std::int64_t rssKb, std::int64_t marketKb, std::int64_t heapKb) {
  m_samples.emplace_back(simulatedSeconds, rssKb);
  m_market.emplace_back(simulatedSeconds, marketKb);
  if (heapKb >= 0) m_heap.emplace_back(simulatedSeconds, heapKb);
}

void SoakFigures::Turn(std::int64_t wallUs, std::int64_t cpuUs) {
  m_wall.Add(wallUs);
  m_cpu.Add(cpuUs);
}

double SoakFigures::RssGrowthMbPerHour(double warmupSeconds) const { return Slope(m_samples, warmupSeconds); }
double SoakFigures::MarketGrowthMbPerHour(double warmupSeconds) const { return Slope(m_market, warmupSeconds); }
double SoakFigures::HeapGrowthMbPerHour(double warmupSeconds) const { return Slope(m_heap, warmupSeconds); }

double SoakFigures::Slope(const std::vector<std::pair<double, std::int64_t>>& samples, double warmupSeconds) {
  double n = 0, sx = 0, sy = 0, sxx = 0, sxy = 0;
  for (const auto& [t, kb] : samples) {
    if (t < warmupSeconds) continue;
    const double x = t / 3600.0, y = static_cast<double>(kb) / 1024.0;
    n += 1;
    sx += x;
    sy += y;
    sxx += x * x;
    sxy += x * y;
  }
  const double den = n * sxx - sx * sx;
  if (n < 2 || den <= 0) return 0;
  return (n * sxy - sx * sy) / den;
}

std::string SoakFigures::Report(double warmupSeconds, double stepMs) const {
  std::ostringstream out;
  char line[160];
  std::int64_t first = 0, last = 0, peak = 0;
  bool any = false;
  for (const auto& [t, kb] : m_samples) {
    if (t < warmupSeconds) continue;
    if (!any) first = kb;
    any = true;
    last = kb;
    peak = std::max(peak, kb);
  }
  std::snprintf(line, sizeof line, "rss_growth_mb_per_hour\t%.2f\t(least squares over the samples from %.0f s on)\n",
                RssGrowthMbPerHour(warmupSeconds), warmupSeconds);
  out << line;
  const double market = MarketGrowthMbPerHour(warmupSeconds);
  std::snprintf(line, sizeof line,
                "market_tapes_growth_mb_per_hour\t%.2f\t(the simulated exchange's day tapes)\n"
                "rss_growth_without_market_tapes_mb_per_hour\t%.2f\n",
                market, RssGrowthMbPerHour(warmupSeconds) - market);
  out << line;
  if (!m_heap.empty()) {
    // The heap shows what the process holds; resident memory adds what the
    // allocator keeps free between the tapes' chunks.
    std::snprintf(line, sizeof line,
                  "heap_growth_mb_per_hour\t%.2f\t(in use)\n"
                  "heap_growth_without_market_tapes_mb_per_hour\t%.2f\n",
                  HeapGrowthMbPerHour(warmupSeconds), HeapGrowthMbPerHour(warmupSeconds) - market);
    out << line;
  }
  std::snprintf(line, sizeof line, "rss_mb_after_warmup\t%.1f\nrss_mb_at_end\t%.1f\nrss_mb_peak\t%.1f\n",
                static_cast<double>(first) / 1024.0, static_cast<double>(last) / 1024.0,
                static_cast<double>(peak) / 1024.0);
  out << line;
  std::snprintf(line, sizeof line, "pushes\t%llu\t(%.0f a second)\n", static_cast<unsigned long long>(m_pushes),
                m_seconds > 0 ? static_cast<double>(m_pushes) / m_seconds : 0.0);
  out << line;
  std::snprintf(line, sizeof line, "subscriptions_at_end\t%llu\n", static_cast<unsigned long long>(m_subscriptions));
  out << line;
  std::snprintf(line, sizeof line, "turns\t%llu\t(one turn: %.0f ms of simulated time)\n",
                static_cast<unsigned long long>(m_wall.Count()), stepMs);
  out << line;
  out << "turn_wall_ms_p50\t" << Ms(m_wall.PercentileUs(0.5)) << "\n";
  out << "turn_wall_ms_p99\t" << Ms(m_wall.PercentileUs(0.99)) << "\n";
  out << "turn_wall_ms_worst\t" << Ms(m_wall.WorstUs()) << "\n";
  out << "turn_cpu_ms_p99\t" << Ms(m_cpu.PercentileUs(0.99)) << "\n";
  out << "turn_cpu_ms_worst\t" << Ms(m_cpu.WorstUs()) << "\n";
  out << "# rss_kb samples: simulated seconds, resident kB, kB in the simulated exchange's tapes\n";
  for (std::size_t k = 0; k < m_samples.size(); ++k) {
    std::snprintf(line, sizeof line, "rss_kb\t%.0f\t%lld\t%lld\n", m_samples[k].first,
                  static_cast<long long>(m_samples[k].second), static_cast<long long>(m_market[k].second));
    out << line;
  }
  return out.str();
}

std::int64_t ReadHeapKb() {
  const struct mallinfo2 m = mallinfo2();
  return static_cast<std::int64_t>((m.uordblks + m.hblkhd) / 1024);
}

std::int64_t ReadRssKb() {
  std::ifstream f("/proc/self/status");
  std::string key;
  while (f >> key) {
    if (key == "VmRSS:") {
      std::int64_t kb = -1;
      f >> kb;
      return kb;
    }
    std::string rest;
    std::getline(f, rest);
  }
  return -1;
}

}  // namespace term
