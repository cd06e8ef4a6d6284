#include "terminal/host/AlertDesk.h"

#include <algorithm>

#include "terminal/sim/Market.h"

namespace term {

namespace {

constexpr double kTolerance = 1e-9;

bool Holds(const PriceAlertItem& a, double value) {
  return a.comparator == "<=" ? value <= a.triggerValue + kTolerance : value >= a.triggerValue - kTolerance;
}

double FieldValue(const sim::Quote& q, const std::string& priceField) {
  if (priceField == "ASK") return q.ask;
  if (priceField == "BID") return q.bid;
  return q.last;
}

}  // namespace

AlertDesk::AlertDesk(sim::Market& market) : m_market(market) {
  m_market.SetPriceListener([this](int base) { OnPriceChange(base); });
}

AlertDesk::~AlertDesk() {
  m_market.SetPriceListener(nullptr);
  for (Entry& e : m_entries) SetWatching(e, false);
}

bool AlertDesk::IsLive(const PriceAlertItem& a) {
  return a.status == "Active" || (a.status == "Triggered" && !a.triggerOnce);
}

void AlertDesk::Bind(Entry& e) {
  e.index = m_market.Find(e.alert.productId, e.alert.instrumentCode);
  e.base = e.index >= 0 ? m_market.BaseOf(e.index) : -1;
  SetWatching(e, IsLive(e.alert));
}

void AlertDesk::SetWatching(Entry& e, bool on) {
  on = on && e.index >= 0;
  if (on == e.watching) return;
  e.watching = on;
  if (on) {
    m_market.WatchPrices(e.index);
    m_market.AddInterest(e.index);
  } else {
    m_market.UnwatchPrices(e.index);
    m_market.RemoveInterest(e.index);
  }
}

void AlertDesk::Load(std::vector<PriceAlertItem> alerts) {
  for (Entry& e : m_entries) SetWatching(e, false);
  m_entries.clear();
  m_nextId = 1;
  for (PriceAlertItem& a : alerts) {
    m_nextId = std::max(m_nextId, a.alertId + 1);
    Entry e;
    e.alert = std::move(a);
    m_entries.push_back(std::move(e));
  }
  for (Entry& e : m_entries) Bind(e);
}

std::int32_t AlertDesk::Create(PriceAlertItem item) {
  item.alertId = m_nextId++;
  item.status = "Active";
  item.hostTextA.clear();
  item.hostTextB.clear();
  item.hostNumber = 0;
  Entry e;
  e.alert = std::move(item);
  m_entries.push_back(std::move(e));
  Bind(m_entries.back());
  return m_entries.back().alert.alertId;
}

bool AlertDesk::Update(const PriceAlertItem& item) {
  for (Entry& e : m_entries) {
    if (e.alert.alertId != item.alertId) continue;
    SetWatching(e, false);
    PriceAlertItem kept = item;
    // A changed alert watches again from now on; its history stays.
    kept.status = "Active";
    kept.hostTextA = e.alert.hostTextA;
    kept.hostTextB = e.alert.hostTextB;
    kept.hostNumber = e.alert.hostNumber;
    e.alert = std::move(kept);
    e.wasTrue = false;
    e.armed = true;
    Bind(e);
    return true;
  }
  return false;
}

int AlertDesk::Remove(const std::vector<std::int32_t>& ids) {
  int removed = 0;
  for (std::size_t k = m_entries.size(); k-- > 0;) {
    if (std::find(ids.begin(), ids.end(), m_entries[k].alert.alertId) == ids.end()) continue;
    SetWatching(m_entries[k], false);
    m_entries.erase(m_entries.begin() + long(k));
    ++removed;
  }
  return removed;
}

std::vector<PriceAlertItem> AlertDesk::All() const {
  std::vector<PriceAlertItem> out;
  out.reserve(m_entries.size());
  for (const Entry& e : m_entries) out.push_back(e.alert);
  return out;
}

const PriceAlertItem* AlertDesk::Find(std::int32_t id) const {
  for (const Entry& e : m_entries)
    if (e.alert.alertId == id) return &e.alert;
  return nullptr;
}

void AlertDesk::OnPriceChange(int base) {
  for (Entry& e : m_entries)
    if (e.base == base && e.watching) Check(e);
}

void AlertDesk::Check(Entry& e) {
  e.armed = false;
  if (!IsLive(e.alert) || e.index < 0) return;
  const double value = FieldValue(m_market.QuoteOf(e.index), e.alert.priceField);
  if (value <= 0) return;  // no price yet
  const bool holds = Holds(e.alert, value);
  if (holds && !e.wasTrue) Fire(e, value);
  e.wasTrue = holds;
}

void AlertDesk::Fire(Entry& e, double value) {
  PriceAlertItem& a = e.alert;
  const std::string firedAt = m_market.DateText() + " " + m_market.TimeText();
  const std::string valueText = m_market.FormatPrice(e.index, value);
  a.status = "Triggered";
  a.hostNumber += 1;
  a.hostTextA = firedAt;
  a.hostTextB = valueText;
  m_changed = true;

  AlertFiring f;
  f.alertId = a.alertId;
  f.firedAt = firedAt;
  f.priceField = a.priceField;
  f.comparator = a.comparator == "<=" ? "<=" : ">=";
  f.threshold = a.triggerValue;
  f.value = value;
  f.valueText = valueText;
  const auto& instrument = m_market.Instruments()[std::size_t(e.index)];
  f.notice = NoticeText(a, instrument.instrumentName, valueText, m_market.FormatPrice(e.index, a.triggerValue), firedAt);
  m_fired.push_back(std::move(f));
  // A one-time alert has done its work: its instrument need not move faster for it.
  if (!IsLive(a)) SetWatching(e, false);
}

std::vector<AlertFiring> AlertDesk::Collect(bool* changed) {
  const std::string today = m_market.DateText();
  for (Entry& e : m_entries) {
    if (!IsLive(e.alert)) continue;
    if (!e.alert.validUntil.empty() && e.alert.validUntil < today) {
      e.alert.status = "Expired";
      SetWatching(e, false);
      m_changed = true;
      continue;
    }
    if (e.armed) Check(e);
  }
  if (changed) *changed = m_changed;
  m_changed = false;
  std::vector<AlertFiring> out;
  out.swap(m_fired);
  return out;
}

const char* AlertDesk::FieldName(const std::string& priceField) {
  if (priceField == "ASK") return "ask";
  if (priceField == "BID") return "bid";
  return "last done";
}

std::string AlertDesk::NoticeText(const PriceAlertItem& alert, const std::string& instrumentName,
                                  const std::string& valueText, const std::string& thresholdText,
                                  const std::string& firedAt) {
  const std::string comparator = alert.comparator == "<=" ? "<=" : ">=";
  std::string name = instrumentName.empty() ? alert.instrumentCode : instrumentName;
  return "Price alert " + std::to_string(alert.alertId) + " fired: " + name + " (" + alert.instrumentCode +
         (alert.exchangeCode.empty() ? std::string() : ", " + alert.exchangeCode) + ") " + FieldName(alert.priceField) +
         " " + valueText + " met the condition " + comparator + " " + thresholdText + " at " + firedAt + ".";
}

}  // namespace term
