#include "data/Keys.h"

#include "hostview/Text.h"

namespace mvd {
std::wstring TrimmedWide(std::string_view s) {
  constexpr std::string_view kBlanks = " \t\r\n";
  const auto b = s.find_first_not_of(kBlanks);
  if (b == std::string_view::npos) return {};
  const auto e = s.find_last_not_of(kBlanks);
  return hv::Widen(s.substr(b, e - b + 1));
}
}  // namespace mvd

InstrumentKey InstrumentKeyOf(const JInstrumentUnderlying& ins) {
  return InstrumentKey{ins.productId, hv::Widen(ins.instrumentCode)};
}

SymbolKey SymbolKeyOf(const JInstrumentUnderlying& ins) {
  return SymbolKey{ins.productId, hv::Widen(ins.symbol), hv::Widen(ins.exchangeCode)};
}

std::wstring DisplayName(const JInstrumentUnderlying& ins) {
  std::wstring s = mvd::TrimmedWide(ins.instrumentName);
  s += L" [";
  s += mvd::TrimmedWide(ins.exchangeCode);
  s += L" : ";
  s += mvd::TrimmedWide(ins.symbol);
  s += L"]";
  return s;
}
