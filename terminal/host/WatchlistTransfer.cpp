#include "terminal/host/WatchlistTransfer.h"

#include <set>
#include <sstream>

#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"

namespace term {
namespace {

std::string Trim(const std::string& s) {
  std::size_t b = 0, e = s.size();
  while (b < e && (s[b] == ' ' || s[b] == '\t' || s[b] == '\r' || s[b] == '\n')) ++b;
  while (e > b && (s[e - 1] == ' ' || s[e - 1] == '\t' || s[e - 1] == '\r' || s[e - 1] == '\n')) --e;
  return s.substr(b, e - b);
}

// A limit of the settings; its default when missing or not above 0.
int Limit(const HostSettings& settings, const char* key, int fallback) {
  const int n = settings.GetInt(key, fallback);
  return n > 0 ? n : fallback;
}

struct Line {
  int number;
  std::string text;
};

}  // namespace

std::string WatchlistsText(const std::vector<StoredWatchlist>& lists, const sim::Market& market) {
  std::string out;
  for (const StoredWatchlist& w : lists) {
    if (!out.empty()) out += "\n";
    out += w.name + "\n";
    for (const StoredWatchItem& item : w.items) {
      const int idx = market.Find(item.productId, item.instrumentCode);
      if (idx < 0) continue;
      out += Trim(market.Instruments()[std::size_t(idx)].exchangeCode) + ":" + item.instrumentCode + "\n";
    }
  }
  return out;
}

WatchlistImport ReadWatchlistsText(const std::string& text, const std::vector<StoredWatchlist>& existing,
                                   const sim::Market& market, const HostSettings& settings) {
  WatchlistImport result;
  // Blocks of non-blank lines.
  std::vector<std::vector<Line>> blocks;
  {
    std::istringstream in(text);
    std::string raw;
    int number = 0;
    bool inBlock = false;
    while (std::getline(in, raw)) {
      ++number;
      const std::string line = Trim(raw);
      if (line.empty()) {
        inBlock = false;
        continue;
      }
      if (!inBlock) blocks.emplace_back();
      inBlock = true;
      blocks.back().push_back({number, line});
    }
  }
  if (blocks.empty()) {
    result.problems.push_back("the file holds no watchlist");
    return result;
  }
  const int maxItems = Limit(settings, "MAXWL", 500);
  const int maxLists = Limit(settings, "MAXWT", 50);
  const std::string alt = settings.Get("ALTST");
  const bool altStatus = alt == "1" || alt == "2";
  std::set<std::string> names;
  for (const StoredWatchlist& w : existing) names.insert(w.name);

  std::vector<StoredWatchlist> lists;
  for (const auto& block : blocks) {
    StoredWatchlist w;
    w.kind = StoredWatchlist::User;
    const std::string& name = block.front().text;
    // A free name: the file's, else with a number after it.
    w.name = name;
    for (int n = 2; names.count(w.name); ++n) w.name = name + " (" + std::to_string(n) + ")";
    names.insert(w.name);
    std::set<std::pair<std::int64_t, std::string>> seen;
    for (std::size_t k = 1; k < block.size(); ++k) {
      const Line& line = block[k];
      const std::string where = "line " + std::to_string(line.number) + ": ";
      const std::size_t colon = line.text.find(':');
      if (colon == std::string::npos || colon == 0 || colon + 1 == line.text.size()) {
        result.problems.push_back(where + "\"" + line.text + "\" is not <exchange>:<code>");
        continue;
      }
      const std::string exchange = Trim(line.text.substr(0, colon));
      const std::string code = Trim(line.text.substr(colon + 1));
      const int idx = market.FindOnExchange(exchange, code);
      if (idx < 0) {
        result.problems.push_back(where + exchange + ":" + code + " is not a known instrument");
        continue;
      }
      const JInstrumentUnderlying& ins = market.Instruments()[std::size_t(idx)];
      const int status = altStatus ? ins.altAccessStatus : ins.accessStatus;
      if (status == 0 || status == 2) {
        result.problems.push_back(where + exchange + ":" + code + ": Counter is not Viewable.");
        continue;
      }
      if (!seen.insert({ins.productId, ins.instrumentCode}).second) {
        result.problems.push_back(where + exchange + ":" + code + ": Instrument already exist in the list.");
        continue;
      }
      w.items.push_back({ins.productId, ins.instrumentCode});
    }
    if (int(w.items.size()) > maxItems)
      result.problems.push_back("line " + std::to_string(block.front().number) + ": \"" + name +
                                "\": Number of priceview items is limited to " + std::to_string(maxItems));
    lists.push_back(std::move(w));
  }
  if (int(existing.size() + lists.size()) > maxLists)
    result.problems.push_back("Number of watchlist is limited to " + std::to_string(maxLists) + " (" +
                              std::to_string(existing.size()) + " kept, " + std::to_string(lists.size()) +
                              " in the file)");
  if (result.problems.empty()) result.lists = std::move(lists);
  return result;
}

}  // namespace term
