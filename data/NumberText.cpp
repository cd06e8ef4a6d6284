#include "data/NumberText.h"

#include <algorithm>
#include <charconv>
#include <cmath>

namespace mvd {
namespace {

constexpr bool IsBlank(unsigned c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

// Copies the number's characters to a narrow buffer: commas dropped, blanks
// trimmed. False when a character cannot belong to a number or it is too long.
template <class Char>
bool ToAscii(std::basic_string_view<Char> text, char* buf, std::size_t cap, std::size_t& n) {
  std::size_t b = 0;
  std::size_t e = text.size();
  while (b < e && IsBlank(static_cast<unsigned>(text[b]))) ++b;
  while (e > b && IsBlank(static_cast<unsigned>(text[e - 1]))) --e;
  n = 0;
  for (std::size_t i = b; i < e; ++i) {
    const auto c = static_cast<std::make_unsigned_t<Char>>(text[i]);
    if (c == ',') continue;
    if (c > 0x7F || n == cap) return false;
    buf[n++] = static_cast<char>(c);
  }
  return n > 0;
}

bool ParseAscii(const char* buf, std::size_t n, double& out) {
  const char* p = buf;
  const char* end = buf + n;
  if (*p == '+') {
    ++p;
    if (p == end || *p == '-' || *p == '+') return false;
  }
  double v = 0.0;
  const auto [ptr, ec] = std::from_chars(p, end, v);
  if (ec != std::errc{} || ptr != end || !std::isfinite(v)) return false;
  out = v;
  return true;
}

template <class Char>
bool Parse(std::basic_string_view<Char> text, double& out) {
  char buf[128];
  std::size_t n = 0;
  if (!ToAscii(text, buf, sizeof buf, n)) return false;
  return ParseAscii(buf, n, out);
}

}  // namespace

bool ParseNumber(std::wstring_view text, double& out) noexcept { return Parse(text, out); }

bool IsBlank(std::wstring_view text) noexcept {
  for (wchar_t c : text)
    if (!IsBlank(static_cast<unsigned>(c))) return false;
  return true;
}
bool ParseNumber(std::string_view text, double& out) noexcept { return Parse(text, out); }

bool IsNonFiniteText(std::wstring_view text) noexcept {
  char buf[128];
  std::size_t n = 0;
  if (!ToAscii(text, buf, sizeof buf, n)) return false;
  const char* p = buf;
  const char* end = buf + n;
  if (*p == '+' || *p == '-') ++p;
  if (p == end) return false;
  double v = 0.0;
  const auto [ptr, ec] = std::from_chars(p, end, v);
  if (ptr != end) return false;
  if (ec == std::errc::result_out_of_range) {  // too large, unless it only underflows
    const std::string_view digits(p, std::size_t(end - p));
    return digits.find("e-") == std::string_view::npos && digits.find("E-") == std::string_view::npos;
  }
  return ec == std::errc{} && !std::isfinite(v);
}

std::wstring NumberFormat(int decimals) { return L"%." + std::to_wstring(decimals) + L"f"; }

void FormatFixed(double value, int decimals, std::wstring& out) {
  // Large enough for the widest finite double with 17 decimals.
  char buf[352];
  decimals = std::clamp(decimals, 0, 17);
  const auto res = std::to_chars(buf, buf + sizeof buf, value, std::chars_format::fixed, decimals);
  if (res.ec != std::errc{}) {  // not finite; callers never store such values
    out.clear();
    return;
  }
  out.assign(buf, res.ptr);
}

std::wstring FixedText(double value, int decimals) {
  std::wstring s;
  FormatFixed(value, decimals, s);
  return s;
}

void FormatWhole(std::int64_t value, std::wstring& out) {
  char buf[24];
  const auto res = std::to_chars(buf, buf + sizeof buf, value);
  out.assign(buf, res.ptr);
}

}  // namespace mvd
