#pragma once
// The terminal's side of the trade-summary fields (kind 3) on the simulated
// trades. The texts come from sim::Market (FieldValue): the header fields, and
// "TRADEDATA" of page p, the traded volume by price (highest price first, 40
// prices a page: price|trades|volume|bid volume||ask volume) followed by a
// "TOTALS:" item. A view asks for every field with param = page.
//
// Every one of these values is made from the trades alone, so only a new trade
// can move a subscribed value: a quote or book move does not format the pages
// again.
#include <cstdint>
#include <string>

namespace term::summary {

inline constexpr std::int32_t kKind = 3;

// The market change bits (sim::Market::ChangeBits) that can move a kind-3 field.
std::uint32_t ChangesThatMove(const std::string& field);

}  // namespace term::summary
