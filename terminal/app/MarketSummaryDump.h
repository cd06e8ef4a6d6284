#pragma once
// The simulated market's own trade summary, written beside the views' dumps
// so that a run can be checked against what the trade-summary views show.
//
// market-summary-<code>.tsv: a heading line "price", "ask_volume",
// "bid_volume", "block_volume", "total_volume", then one line per traded
// price, highest first, as the terminal pages it to the views. Ask volume is
// traded at the ask, bid volume at the bid, block volume off the book sides
// (married deals and auction trades), so the three add up to the total.
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace sim {
class Market;
}

namespace term {

class HostRuntime;
class MainWindow;

// The files of the instruments the window's trade-summary views show.
// Returns the number of files written, or -1 with `error` set.
int WriteMarketSummaryDumps(MainWindow& window, HostRuntime& runtime, const std::string& dir, std::string& error);

// The table of one instrument (market index); the heading line alone when it
// has not traded or is unknown.
std::string MarketSummaryTsv(sim::Market& market, int index);

// Writes the file of each {product id, code} (each once) into `dir`, which
// must exist. Instruments the market does not know are skipped. Returns the
// number of files written, or -1 with `error` set.
int WriteMarketSummaryDumps(const std::string& dir, sim::Market& market,
                            const std::vector<std::pair<std::int64_t, std::string>>& instruments, std::string& error);

// "market-summary-<code>.tsv" with every character outside letters, digits,
// '.', '_' and '-' replaced by '_'.
std::string MarketSummaryFileName(const std::string& code);

}  // namespace term
