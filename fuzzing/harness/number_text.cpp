// Number texts of the stores: parsing, the non-finite check and printing.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>

#include "data/NumberText.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view narrow(reinterpret_cast<const char*>(data), size);
  std::wstring wide(narrow.begin(), narrow.end());
  double a = 0, b = 0;
  const bool na = mvd::ParseNumber(narrow, a);
  const bool wa = mvd::ParseNumber(wide, b);
  if (na != wa || (na && a != b)) __builtin_trap();
  if (na && (!std::isfinite(a) || mvd::IsNonFiniteText(wide))) __builtin_trap();
  (void)mvd::IsBlank(wide);
  if (na) {
    const std::wstring shown = mvd::FixedText(a, static_cast<int>(size % 20) - 1);
    if (shown.empty() || shown.find(L"nan") != std::wstring::npos || shown.find(L"inf") != std::wstring::npos)
      __builtin_trap();
  }
  return 0;
}
