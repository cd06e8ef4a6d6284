#pragma once
// The simulated market's current quote values of the instruments the views
// show, as a table next to the views' own dumps (--dump): the headings
// "product_id", "code" and the eighteen quote field names as the views receive
// them; one line per instrument, each value exactly as the market sends it.
#include <string>
#include <vector>

namespace sim {
class Market;
}

namespace term {

// The quote fields, in the order the price view asks for them.
const std::vector<std::string>& QuoteFieldNames();

// The table of `instruments` (market indexes; repeated ones once, in the
// order given). Tabs and line breaks inside a value become blanks.
std::string MarketQuotesTsv(sim::Market& market, const std::vector<int>& instruments);

// Writes the table to `path`; false with `error` set when it cannot.
bool WriteMarketQuotes(const std::string& path, sim::Market& market, const std::vector<int>& instruments,
                       std::string& error);

}  // namespace term
