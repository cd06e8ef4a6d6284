#pragma once
// Number-to-text helpers for quantities, volumes and prices shown in grids and
// tooltips. Qt-free. All results are narrow (ASCII) text.
//
// Grouping rule (both functions): the integer part is grouped in threes from
// the right with "," ("1,234,567"); the decimal point is "."; the fractional
// part is never grouped. A negative value carries a leading "-" before the
// first digit ("-1,234"). This is the fixed trading-screen convention and does
// not follow the machine's locale.
#include <cstdint>
#include <string>
#include <vector>

#include "hostview/Types.h"

// `value` with thousands separators: 1234567 -> "1,234,567", -1000 -> "-1,000",
// INT64_MIN -> "-9,223,372,036,854,775,808".
HV_API std::string Integer2Str(std::int64_t value);

// `value` rounded to `decimals` places (clamped to 0..15) and grouped as above:
// (1234.5, 2) -> "1,234.50". Rounding is half away from zero on the shortest
// decimal form of the value, so 2.675 and 1.005 round up the way a trader reads
// them ("2.68", "1.01") although their binary forms lie just below. A result
// that rounds to zero has no sign ("0.00", never "-0.00"). NaN and infinities
// give an empty text.
HV_API std::string Double2Str(double value, int decimals);

// Quantities offered for quick entry, as multiples of `lotSize`: lot x 1, 2, 3,
// 4, 5, 10, 20, 30, 40, 50, 100, ... (1-2-3-4-5 in every decade), the first
// `count` of them. Empty when lotSize < 1 or count < 1. The list stops early
// rather than exceed INT32_MAX.
HV_API std::vector<int> GenerateQtyList(int lotSize, int count);
