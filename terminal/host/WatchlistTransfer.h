#pragma once
// The user's watchlists as a plain text file (File menu: export and import).
//
//   Banks                 one block per watchlist: its name on the first line,
//   SGX:D05               then one instrument a line as "<exchange>:<code>";
//   SGX:O39               blocks are separated by a blank line.
//
//   Asia
//   HKEX:0005
//
// An import adds new watchlists (a name that is taken gets " (2)", " (3)"
// ...) and applies the rules of adding from the instrument box: a known and
// viewable instrument, no instrument twice in one list, at most "MAXWL"
// instruments a list and "MAXWT" lists in all. A file that breaks a rule is
// refused as a whole, with every problem named by its line.
#include <string>
#include <vector>

#include "terminal/host/HostStore.h"

namespace sim {
class Market;
}

namespace term {

class HostSettings;

// The text of `lists` (instruments the market does not know are left out).
std::string WatchlistsText(const std::vector<StoredWatchlist>& lists, const sim::Market& market);

struct WatchlistImport {
  std::vector<StoredWatchlist> lists;  // the new watchlists (ids 0), when there is no problem
  std::vector<std::string> problems;   // "line 4: ..." and limits; empty: the file can be imported
  bool Ok() const { return problems.empty(); }
};

// Reads `text` against the existing user lists, the market and the limits.
WatchlistImport ReadWatchlistsText(const std::string& text, const std::vector<StoredWatchlist>& existing,
                                   const sim::Market& market, const HostSettings& settings);

}  // namespace term
