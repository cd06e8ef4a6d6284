// The terminal's plain-text watchlist import (File menu) against the default
// simulated market: any text is either refused with its problems named or
// gives watchlists that keep the rules (known instruments, none twice in a
// list, the limits, free names); an accepted import exported again and read
// back gives the same lists.
#include <cstddef>
#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "terminal/host/HostRuntime.h"
#include "terminal/host/WatchlistTransfer.h"
#include "terminal/sim/Market.h"

namespace {

const sim::Market& TheMarket() {
  static const sim::Market* market = new sim::Market(sim::MarketConfig{});
  return *market;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size < 1) return 0;
  const sim::Market& market = TheMarket();
  term::HostSettings settings;
  // The limits: defaults, small ones, or nonsense (falls back to the defaults).
  switch (data[0] % 4) {
    case 1: settings.Set("MAXWL", "3"), settings.Set("MAXWT", "4"); break;
    case 2: settings.Set("MAXWL", "-1"), settings.Set("MAXWT", "x"); break;
    case 3: settings.Set("ALTST", "1"); break;
    default: break;
  }
  std::vector<term::StoredWatchlist> existing(data[0] / 4 % 3);
  for (std::size_t i = 0; i < existing.size(); ++i) existing[i].name = i ? "Banks" : "Asia";
  const std::string text(reinterpret_cast<const char*>(data) + 1, size - 1);

  const term::WatchlistImport got = term::ReadWatchlistsText(text, existing, market, settings);
  if (got.Ok() && got.lists.empty()) __builtin_trap();  // accepted means something to add
  if (!got.Ok()) return 0;
  const int maxItems = settings.GetInt("MAXWL", 500) > 0 ? settings.GetInt("MAXWL", 500) : 500;
  const int maxLists = settings.GetInt("MAXWT", 50) > 0 ? settings.GetInt("MAXWT", 50) : 50;
  if (int(existing.size() + got.lists.size()) > maxLists) __builtin_trap();
  std::set<std::string> names;
  for (const auto& w : existing) names.insert(w.name);
  for (const auto& w : got.lists) {
    if (!names.insert(w.name).second || int(w.items.size()) > maxItems) __builtin_trap();
    std::set<std::pair<std::int64_t, std::string>> seen;
    for (const auto& item : w.items)
      if (market.Find(item.productId, item.instrumentCode) < 0 || !seen.insert({item.productId, item.instrumentCode}).second)
        __builtin_trap();
  }
  // Export and import again (no lists kept): the same lists.
  const term::WatchlistImport again = term::ReadWatchlistsText(term::WatchlistsText(got.lists, market), {}, market, settings);
  if (!again.Ok() || again.lists.size() != got.lists.size()) __builtin_trap();
  for (std::size_t i = 0; i < got.lists.size(); ++i) {
    if (again.lists[i].name != got.lists[i].name || again.lists[i].items.size() != got.lists[i].items.size())
      __builtin_trap();
    for (std::size_t k = 0; k < got.lists[i].items.size(); ++k)
      if (again.lists[i].items[k].productId != got.lists[i].items[k].productId ||
          again.lists[i].items[k].instrumentCode != got.lists[i].items[k].instrumentCode)
        __builtin_trap();
  }
  return 0;
}
