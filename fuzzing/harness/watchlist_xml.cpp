// The terminal's watchlist XML reader: names, user items and brand items.
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "terminal/host/WatchlistXml.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::wstring text;
  for (std::size_t i = 0; i + 1 < size; i += 2) text.push_back(static_cast<wchar_t>(data[i] | (data[i + 1] << 8)));
  std::string error;
  std::vector<term::NameEntry> names;
  std::vector<term::ItemEntry> items;
  if (term::ParseWatchlistNames(text, names, error)) (void)term::WriteWatchlistNames(names);
  if (term::ParseUserItems(text, items, error)) (void)term::WriteUserItems(items);
  items.clear();
  (void)term::ParseBrandItems(text, items, error);
  return 0;
}
