#pragma once
// Reading numbers from terminal texts and printing them the way every view
// shows them. Shared by all stores so that one instrument reads the same
// everywhere.
#include <cstdint>
#include <string>
#include <string_view>

namespace mvd {

// Reads a decimal number. Every "," is removed first (thousands separators),
// surrounding blanks are ignored, a leading "+" is allowed. Returns false, and
// leaves `out` alone, for an empty text, trailing garbage, or anything that is
// not a finite double ("nan", "inf", "1e999").
bool ParseNumber(std::wstring_view text, double& out) noexcept;
bool ParseNumber(std::string_view text, double& out) noexcept;

// True for a text that reads as a number that is not finite ("nan", "-inf",
// "Infinity", "1e999"): a view shows such a value as nothing.
bool IsNonFiniteText(std::wstring_view text) noexcept;

// True for a text of blanks only (or none): a withdrawn value.
bool IsBlank(std::wstring_view text) noexcept;

// The decimals a record's number format uses for an instrument's decimals:
// the same when 0..10, otherwise 3.
constexpr int RecordDecimals(int instrumentDecimals) noexcept {
  return instrumentDecimals >= 0 && instrumentDecimals <= 10 ? instrumentDecimals : 3;
}

// The printf format of a number with `decimals` decimals: L"%.3f".
std::wstring NumberFormat(int decimals);

// Exactly printf("%.<decimals>f", value); `decimals` is clamped to 0..17.
// The first form reuses `out`'s storage.
void FormatFixed(double value, int decimals, std::wstring& out);
std::wstring FixedText(double value, int decimals);

// A whole number in decimal ("%lld").
void FormatWhole(std::int64_t value, std::wstring& out);

}  // namespace mvd
