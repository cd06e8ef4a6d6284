#pragma once
// Reading the watchlist texts the price view hands over for saving (611, 612,
// 618). A text that is not well-formed, has another root or lacks a required
// attribute is refused as a whole with a reason, so that a broken save never
// replaces what is stored.
#include <cstdint>
#include <string>
#include <vector>

namespace term {

// One entry of the watchlist-names text (611).
struct NameEntry {
  std::int32_t id = 0;
  std::string name;  // UTF-8
  std::int32_t seq = 0;
};

// One item of a user item text (612) or of a brand item text (618).
struct ItemEntry {
  std::int64_t productId = 0;
  std::string instrumentCode;  // as written: brand items without their "[KELDO]" prefix
  std::string symbol, market, exchange;  // brand items only
  std::int32_t seq = 0;
};

// Entries are returned in SeqID order (ties keep text order).
bool ParseWatchlistNames(const std::wstring& text, std::vector<NameEntry>& out, std::string& error);
bool ParseUserItems(const std::wstring& text, std::vector<ItemEntry>& out, std::string& error);
bool ParseBrandItems(const std::wstring& text, std::vector<ItemEntry>& out, std::string& error);

// The texts as the price view writes them (attribute values escaped), for tests
// and tools.
std::wstring WriteWatchlistNames(const std::vector<NameEntry>& entries);
std::wstring WriteUserItems(const std::vector<ItemEntry>& items);

}  // namespace term
