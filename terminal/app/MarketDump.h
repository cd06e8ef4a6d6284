#pragma once
// The market's side of "--dump": the simulated trade tape of every instrument
// a view shows, as <dir>/market-trades-<code>.tsv, so that a view's dump can
// be checked against what the market traded.
#include <string>

namespace term {

class HostRuntime;
class MainWindow;

// Returns the number of files written, or -1 with `error` set.
int WriteMarketTradeDumps(MainWindow& window, HostRuntime& runtime, const std::string& dir, std::string& error);

}  // namespace term
