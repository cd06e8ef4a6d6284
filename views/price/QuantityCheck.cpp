#include "views/price/QuantityCheck.h"

#include <limits>
#include <optional>

#include "hostconfig/UserSettings.h"

namespace qtycheck {

namespace {

Verdict Refused(const std::string& code, const JInstrumentUnderlying& instrument, const TextLookup& lookup) {
  Verdict v;
  v.code = code;
  if (lookup) v.text = lookup(code, instrument.productId);
  return v;
}

}  // namespace

Verdict Check(const JInstrumentUnderlying& instrument, int mode, std::int64_t quantity, const TextLookup& lookup) {
  if (instrument.productId == -1) return {};
  if (quantity == 0) return mode == kBuy || mode == kSell ? Refused(kZeroCode, instrument, lookup) : Verdict{};
  const std::int64_t lot = instrument.lotSize;
  if (quantity < lot) return Refused(kBelowLotCode, instrument, lookup);
  if (lot < 1) return {};
  if (quantity % lot != 0) {
    Verdict v;
    v.text = kNotMultipleText;
    return v;
  }
  const std::int64_t maximum = mode == kBuy ? instrument.maxQty1 : mode == kSell ? instrument.maxQty2 : 0;
  if (maximum > 0 && quantity > maximum) return Refused(kAboveMaximumCode, instrument, lookup);
  const auto limit = GetUserSettings().GetTradeSetting().GetTradingLimit().GetMaxQuantity(
      mode, instrument.exchangeCode, instrument.instrumentCode);
  if (limit && quantity > *limit) return Refused(kAboveLimitCode, instrument, lookup);
  Verdict ok;
  ok.valid = true;
  return ok;
}

std::optional<std::int64_t> ParseQuantity(const std::wstring& text) {
  std::size_t begin = 0, end = text.size();
  while (begin < end && (text[begin] == L' ' || text[begin] == L'\t')) ++begin;
  while (end > begin && (text[end - 1] == L' ' || text[end - 1] == L'\t')) --end;
  std::int64_t value = 0;
  bool digit = false;
  for (std::size_t i = begin; i < end; ++i) {
    const wchar_t c = text[i];
    if (c == L',' && digit) continue;
    if (c < L'0' || c > L'9') return std::nullopt;
    digit = true;
    const int d = int(c - L'0');
    if (value > (std::numeric_limits<std::int64_t>::max() - d) / 10) return std::nullopt;
    value = value * 10 + d;
  }
  return value;
}

}  // namespace qtycheck
