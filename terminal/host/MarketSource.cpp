#include "terminal/host/MarketSource.h"

#include <cstdio>

#include "terminal/host/SimSource.h"

namespace term {

const JProduct* MarketSource::FindProduct(std::int64_t productId) const {
  for (const JProduct& p : Products())
    if (p.productId == productId) return &p;
  return nullptr;
}

const JExchangeList* MarketSource::FindExchange(std::string_view code) const {
  for (const JExchangeList& e : Exchanges())
    if (e.exchangeCode == code) return &e;
  return nullptr;
}

std::uint32_t MarketSource::TimeOfDayMs() const {
  const std::uint64_t start = std::uint64_t(Session().startSeconds) * 1000u;
  return std::uint32_t((start + ElapsedMs()) % 86400000u);
}

std::string MarketSource::TimeText() const { return ClockText(TimeOfDayMs()); }

std::string ClockText(std::uint32_t msOfDay) {
  char buf[16];
  const unsigned s = (msOfDay / 1000) % 86400;
  std::snprintf(buf, sizeof buf, "%02u:%02u:%02u", s / 3600, (s / 60) % 60, s % 60);
  return buf;
}

// ---- SimSource ------------------------------------------------------------------

SimSource::SimSource(sim::Market& market) : market_(market) {
  const sim::MarketConfig& c = market.Config();
  session_.startSeconds = c.sessionStartSeconds;
  session_.seed = c.seed;
  session_.instruments = int(market.Instruments().size());
  session_.fieldUpdatesPerSecond = c.fieldUpdatesPerSecond;
  // The simulator falls back to its own day for a date it cannot read.
  session_.date = market.DateText();
}

const std::vector<JProduct>& SimSource::Products() const { return market_.Products(); }
const std::vector<JExchangeList>& SimSource::Exchanges() const { return market_.Exchanges(); }
const std::vector<JInstrumentUnderlying>& SimSource::Instruments() const { return market_.Instruments(); }
int SimSource::Find(std::int64_t productId, std::string_view code) const { return market_.Find(productId, code); }
int SimSource::FindByCode(std::string_view code) const { return market_.FindByCode(code); }
int SimSource::FindByChartCode(std::string_view chartCode) const { return market_.FindByChartCode(chartCode); }

void SimSource::AdvanceTo(std::uint32_t now) {
  const std::uint32_t before = market_.Now();
  market_.AdvanceTo(now);
  if (market_.Now() != before) bookIndex_ = -1;
}

std::uint64_t SimSource::ElapsedMs() const { return std::uint32_t(market_.Now() - market_.Config().startTick); }

void SimSource::AddInterest(int index) { market_.AddInterest(index); }
void SimSource::RemoveInterest(int index) { market_.RemoveInterest(index); }
std::vector<std::pair<int, std::uint32_t>> SimSource::TakeChangedWithBits() { return market_.TakeChangedWithBits(); }

std::string SimSource::FieldValue(int index, std::string_view field, int param, int kind) {
  return market_.FieldValue(index, field, param, kind);
}

void SimSource::DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) {
  if (levels < 0) levels = 0;
  if (index != bookIndex_ || int(book_.size()) < levels) {
    book_ = market_.Book(index, levels);
    bookIndex_ = index;
  }
  out.resize(std::size_t(levels));
  for (int level = 1; level <= levels; ++level)
    out[std::size_t(level - 1)] =
        std::size_t(level) <= book_.size() ? market_.DepthFieldValue(index, book_[std::size_t(level - 1)], field)
                                           : std::string();
}

}  // namespace term
