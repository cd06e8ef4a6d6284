#include "views/alerts/AlertRules.h"

#include <fmt/format.h>

#include <cmath>
#include <cstdio>

#include "addon/TextTables.h"
#include "hostview/Text.h"

namespace alerts {

namespace {

constexpr double kTolerance = 1e-6;
constexpr const char* kMonths[12] = {"Jan", "Feb", "Mar", "Apr", "May", "Jun",
                                     "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};

std::function<QDate()>& TodaySource() {
  static std::function<QDate()> source;
  return source;
}

// The first band of `tableId` that holds `price` for the direction.
const TickBand* FindBand(const std::vector<TickBand>& bands, std::int32_t tableId, double price, bool up) {
  for (const TickBand& b : bands) {
    if (b.tableId != tableId) continue;
    const bool inside = up ? (b.lower <= price + kTolerance && b.upper > price + kTolerance)
                           : (b.lower < price - kTolerance && b.upper >= price - kTolerance);
    if (inside) return &b;
  }
  return nullptr;
}

}  // namespace

// ---- Language texts ----------------------------------------------------------------

void LoadTexts(const ILanguage* language) {
  addon::LanguageTextTable::Instance().Load(language, text::kFirstCached, text::kLastCached);
}

std::wstring CachedText(int id) { return addon::LanguageTextTable::Instance().Get(id); }

// ---- Code tables ---------------------------------------------------------------------

int FieldIndex(const std::string& priceField) {
  if (priceField == "ASK") return 0;
  if (priceField == "BID") return 1;
  return 2;
}

const char* FieldCode(int index) {
  switch (index) {
    case 0: return "ASK";
    case 1: return "BID";
    default: return "LDONE";
  }
}

int ComparatorIndex(const std::string& comparator) { return comparator == "<=" ? 0 : 1; }

const char* ComparatorCode(int index) { return index == 0 ? "<=" : ">="; }

// ---- Settings ----------------------------------------------------------------------

AlertSettingsCache& AlertSettingsCache::Instance() {
  static AlertSettingsCache cache;
  return cache;
}

std::wstring AlertSettingsCache::Get(const std::string& key) const {
  const auto it = m_values.find(key);
  return it == m_values.end() ? std::wstring() : it->second;
}

void AlertSettingsCache::Set(const std::string& key, const std::wstring& value) {
  if (!value.empty()) m_values[key] = value;
}

int MaxValidityDays() {
  std::wstring text = AlertSettingsCache::Instance().Get(kMaxValidityKey);
  // Blanks around the number are allowed, as for the other parameters.
  while (!text.empty() && (text.back() == L' ' || text.back() == L'\t')) text.pop_back();
  while (!text.empty() && (text.front() == L' ' || text.front() == L'\t')) text.erase(text.begin());
  if (text.empty()) return kDefaultValidityDays;
  long days = 0;
  for (wchar_t c : text) {
    if (c < L'0' || c > L'9') return kDefaultValidityDays;
    days = days * 10 + (c - L'0');
    if (days > 100000) return kDefaultValidityDays;  // not a day count a calendar can hold
  }
  return days > 0 ? int(days) : kDefaultValidityDays;
}

bool ChannelOffered(const char* key) { return AlertSettingsCache::Instance().Get(key) == L"1"; }

bool ExchangePermitted(const std::string& exchangeCode, const std::wstring& exchangeList) {
  if (exchangeCode.empty()) return false;
  return exchangeList.find(hv::Widen(exchangeCode)) != std::wstring::npos;
}

QDate Today() {
  if (TodaySource()) return TodaySource()();
  return QDate::currentDate();
}

void SetTodayForTests(std::function<QDate()> today) { TodaySource() = std::move(today); }

DateRange ValidityRange() {
  const QDate today = Today();
  return {today, today.addDays(MaxValidityDays())};
}

// ---- Texts -------------------------------------------------------------------------

std::string PriceFormat(int decimals) {
  if (decimals < 0 || decimals > 10) return "%.3f";
  return "%." + std::to_string(decimals) + "f";
}

std::wstring FormatPrice(double value, int decimals) {
  if (!std::isfinite(value)) value = 0.0;
  char buf[64];
  std::snprintf(buf, sizeof buf, PriceFormat(decimals).c_str(), value);
  return hv::Widen(buf);
}

std::wstring ConditionText(const PriceAlertItem& alert, int decimals) {
  const std::wstring field = CachedText(text::kFieldAsk + FieldIndex(alert.priceField));
  return field + L" " + hv::Widen(alert.comparator) + L" " + FormatPrice(alert.triggerValue, decimals);
}

std::wstring AlertViaText(const PriceAlertItem& alert, const std::wstring& appCaption) {
  std::wstring out;
  auto add = [&](const std::wstring& name) {
    if (!out.empty()) out += L", ";
    out += name;
  };
  if (alert.viaApp) add(appCaption);
  if (alert.viaEmail) add(CachedText(text::kEmail));
  if (alert.viaSms) add(CachedText(text::kSms));
  return out;
}

QDate ParseDay(const std::string& text) {
  int y = 0, m = 0, d = 0;
  char tail = 0;
  if (std::sscanf(text.c_str(), "%d-%d-%d%c", &y, &m, &d, &tail) != 3) return {};
  return QDate(y, m, d);
}

std::string DayText(const QDate& day) {
  if (!day.isValid()) return {};
  return fmt::format("{:04d}-{:02d}-{:02d}", day.year(), day.month(), day.day());
}

std::wstring ValidityText(const std::string& validUntil) {
  const QDate day = ParseDay(validUntil);
  if (!day.isValid()) return hv::Widen(validUntil);
  return hv::Widen(fmt::format("{:02d} {} {:04d}", day.day(), kMonths[day.month() - 1], day.year()));
}

// ---- Filter ------------------------------------------------------------------------

bool PassesFilter(const std::string& status, int option) {
  if (status == kActive) return option == 0 || option == 2;
  if (status == kTriggered) return option == 0 || option == 1;
  if (status == kExpired) return option == 0 || option == 3;
  return false;
}

// ---- Price steps -------------------------------------------------------------------

double PriceStep(const std::vector<TickBand>& bands, std::int32_t tableId, double price, bool up) {
  const TickBand* band = FindBand(bands, tableId, price, up);
  if (!band && tableId != 0) band = FindBand(bands, 0, price, up);
  return band ? band->step : 0.0;
}

// ---- Store -------------------------------------------------------------------------

AlertStore& Store() { return PriceAlertMgr<PriceAlertItem>(); }

}  // namespace alerts
