#include "terminal/sim/Market.h"

namespace sim {

struct Market::Impl {
  MarketConfig config;
  std::vector<JProduct> products;
  std::vector<JExchangeList> exchanges;
  std::vector<JInstrumentUnderlying> instruments;
  std::vector<TickBand> bands;
  std::vector<JSector> sectors;
  std::vector<JRemarkMessage> remarks;
  std::vector<BrandWatchlist> brands;
  std::vector<StarterWatchlist> starters;
  std::vector<Trade> noTrades;
  Quote quote;
  std::uint32_t now = 0;
};

Market::Market(const MarketConfig& config) : d(std::make_unique<Impl>()) { d->config = config; d->now = config.startTick; }
Market::~Market() = default;
const MarketConfig& Market::Config() const { return d->config; }
const std::vector<JProduct>& Market::Products() const { return d->products; }
const std::vector<JExchangeList>& Market::Exchanges() const { return d->exchanges; }
const std::vector<JInstrumentUnderlying>& Market::Instruments() const { return d->instruments; }
const std::vector<TickBand>& Market::TickBands() const { return d->bands; }
const std::vector<JSector>& Market::Sectors() const { return d->sectors; }
const std::vector<JRemarkMessage>& Market::RemarkMessages() const { return d->remarks; }
int Market::Find(std::int64_t, std::string_view) const { return -1; }
int Market::FindByCode(std::string_view) const { return -1; }
int Market::FindByChartCode(std::string_view) const { return -1; }
const JExchangeList* Market::FindExchange(std::string_view) const { return nullptr; }
const JProduct* Market::FindProduct(std::int64_t) const { return nullptr; }
JMarketInfo Market::MarketInfo(std::string_view) const { return {}; }
double Market::StepAt(std::int32_t, double, bool) const { return 0.01; }
void Market::AdvanceTo(std::uint32_t now) { d->now = now; }
std::uint32_t Market::Now() const { return d->now; }
std::string Market::DateText() const { return d->config.sessionDate; }
std::string Market::TimeText() const { return {}; }
std::uint32_t Market::TimeOfDayMs() const { return 0; }
void Market::AddInterest(int) {}
void Market::RemoveInterest(int) {}
int Market::InterestCount() const { return 0; }
std::vector<int> Market::TakeChanged() { return {}; }
const Quote& Market::QuoteOf(int) { return d->quote; }
DepthLevel Market::Depth(int, int) { return {}; }
const std::vector<Trade>& Market::Trades(int) { return d->noTrades; }
std::vector<SummaryLine> Market::Summary(int) { return {}; }
std::string Market::FieldValue(int, std::string_view, int, int) { return {}; }
std::string Market::TradePageText(int, int) { return {}; }
int Market::TradePageCount(int) { return 0; }
std::string Market::SummaryPageText(int, int) { return {}; }
int Market::SummaryPageCount(int) { return 0; }
std::string Market::FormatPrice(int, double) const { return {}; }
std::vector<JTop30Group> Market::Top30() { return {}; }
const std::vector<BrandWatchlist>& Market::BrandWatchlists() const { return d->brands; }
std::vector<int> Market::WorldIndices() const { return {}; }
const std::vector<StarterWatchlist>& Market::StarterWatchlists() const { return d->starters; }

void AlertBook::Load(std::vector<PriceAlertItem> alerts) { alerts_ = std::move(alerts); }
std::int32_t AlertBook::Create(PriceAlertItem item) { item.alertId = nextId_++; alerts_.push_back(item); return item.alertId; }
bool AlertBook::Update(const PriceAlertItem&) { return false; }
int AlertBook::Remove(const std::vector<std::int32_t>&) { return 0; }
const PriceAlertItem* AlertBook::Find(std::int32_t) const { return nullptr; }
std::vector<AlertBook::Fired> AlertBook::Evaluate(Market&, bool* changed) { if (changed) *changed = false; return {}; }

}  // namespace sim
