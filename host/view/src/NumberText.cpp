#include "hostview/NumberText.h"

#include <charconv>
#include <climits>
#include <cmath>
#include <string_view>

namespace {

// Inserts "," every three digits of a plain digit run.
void AppendGrouped(std::string& out, std::string_view digits) {
  const std::size_t n = digits.size();
  for (std::size_t i = 0; i < n; ++i) {
    if (i > 0 && (n - i) % 3 == 0) out.push_back(',');
    out.push_back(digits[i]);
  }
}

}  // namespace

std::string Integer2Str(std::int64_t value) {
  // Work on the unsigned magnitude so that INT64_MIN has no overflow.
  const bool negative = value < 0;
  std::uint64_t magnitude = negative ? 0 - static_cast<std::uint64_t>(value) : static_cast<std::uint64_t>(value);
  char buf[24];
  auto res = std::to_chars(buf, buf + sizeof buf, magnitude);
  std::string out;
  out.reserve(32);
  if (negative) out.push_back('-');
  AppendGrouped(out, std::string_view(buf, static_cast<std::size_t>(res.ptr - buf)));
  return out;
}

std::string Double2Str(double value, int decimals) {
  if (!std::isfinite(value)) return {};
  if (decimals < 0) decimals = 0;
  if (decimals > 15) decimals = 15;
  const bool negative = std::signbit(value);
  const double magnitude = std::fabs(value);

  // Shortest decimal form that reads back as the same double, in fixed notation.
  char buf[400];
  auto res = std::to_chars(buf, buf + sizeof buf, magnitude, std::chars_format::fixed);
  std::string_view text(buf, static_cast<std::size_t>(res.ptr - buf));
  const std::size_t dot = text.find('.');
  std::string intPart(text.substr(0, dot));
  std::string fracPart = dot == std::string_view::npos ? std::string() : std::string(text.substr(dot + 1));

  // Round half away from zero in decimal.
  bool roundUp = fracPart.size() > static_cast<std::size_t>(decimals) && fracPart[decimals] >= '5';
  fracPart.resize(static_cast<std::size_t>(decimals), '0');
  if (roundUp) {
    int i = decimals - 1;
    for (; i >= 0; --i) {
      if (fracPart[i] == '9') { fracPart[i] = '0'; continue; }
      ++fracPart[i];
      break;
    }
    if (i < 0) {  // carry into the integer part
      int j = static_cast<int>(intPart.size()) - 1;
      for (; j >= 0; --j) {
        if (intPart[j] == '9') { intPart[j] = '0'; continue; }
        ++intPart[j];
        break;
      }
      if (j < 0) intPart.insert(intPart.begin(), '1');
    }
  }

  const bool isZero = intPart.find_first_not_of('0') == std::string::npos &&
                      fracPart.find_first_not_of('0') == std::string::npos;
  std::string out;
  out.reserve(intPart.size() + intPart.size() / 3 + fracPart.size() + 2);
  if (negative && !isZero) out.push_back('-');
  AppendGrouped(out, intPart);
  if (decimals > 0) {
    out.push_back('.');
    out += fracPart;
  }
  return out;
}

std::vector<int> GenerateQtyList(int lotSize, int count) {
  std::vector<int> out;
  if (lotSize < 1 || count < 1) return out;
  static constexpr int kSteps[] = {1, 2, 3, 4, 5};
  std::int64_t decade = 1;
  while (static_cast<int>(out.size()) < count) {
    for (int step : kSteps) {
      const std::int64_t q = static_cast<std::int64_t>(lotSize) * step * decade;
      if (q > INT_MAX) return out;
      out.push_back(static_cast<int>(q));
      if (static_cast<int>(out.size()) == count) return out;
    }
    decade *= 10;
  }
  return out;
}
