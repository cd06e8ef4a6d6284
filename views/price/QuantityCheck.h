#pragma once
// The order-quantity check of the price view (the board's buy and sell parts
// and its re-check after a settings change). The checks run in a fixed order
// and the first that fails decides:
//   1. product id -1                          invalid, no message
//   2. quantity 0                             modes 1 and 2: "11007"; mode 0: no message
//   3. below the lot size                     "11014"
//   4. lot size below 1                       invalid, no message
//   5. not a multiple of the lot size         "Shares enter is invalid"
//   6. above the instrument's maximum of the mode (1: first, 2: second;
//      a maximum of 0 means none)             "11013"
//   7. above the user's trading limit of the mode   "11015"
// Codes become texts through the terminal's message-text lookup, keyed by
// the code and the instrument's product id.
#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "hostview/Records.h"

namespace qtycheck {

// Modes: 0 any order (the silent re-check), 1 buy, 2 sell.
enum Mode : int { kAnyOrder = 0, kBuy = 1, kSell = 2 };

inline constexpr const char* kZeroCode = "11007";
inline constexpr const char* kAboveMaximumCode = "11013";
inline constexpr const char* kBelowLotCode = "11014";
inline constexpr const char* kAboveLimitCode = "11015";
inline constexpr const wchar_t* kNotMultipleText = L"Shares enter is invalid";

struct Verdict {
  bool valid = false;
  std::string code;   // the message code, empty when the text is built in or there is none
  std::wstring text;  // what the user is told; empty: nothing
};

// Turns a message code into its text for a product id.
using TextLookup = std::function<std::wstring(const std::string& code, std::int64_t productId)>;

// The checks above. Without `lookup` (the silent re-check) the verdict
// carries the code but no looked-up text.
Verdict Check(const JInstrumentUnderlying& instrument, int mode, std::int64_t quantity,
              const TextLookup& lookup = nullptr);

// The quantity a user typed: digits, optionally grouped with commas; blanks
// around are ignored. Empty means 0. nullopt for anything else (letters,
// signs, a number too large to hold).
std::optional<std::int64_t> ParseQuantity(const std::wstring& text);

}  // namespace qtycheck
