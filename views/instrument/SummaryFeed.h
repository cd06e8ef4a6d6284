#pragma once
// The trade-summary views' side of the process-wide SummaryHeaderStore and
// SummaryLineStore, on addon::SummaryPageFeed and addon::SummaryLineFeed
// (addon/Feeds.h): pages wanted, the terminal's values into the stores, and
// reading lines back without creating anything.
//
// The terminal sends the summary as pages of up to 40 price lines: page p's
// "TRADEDATA" text holds items separated by ";", each item fields separated
// by "|": price, trades, volume, bid volume, (unused), ask volume. Item i of
// page p (counted from 0 over all items of the text) is line (p-1)*40+1+i;
// an item whose price is "TOTALS:" or empty is the totals line 99999.
//
// UI thread only (the stores themselves take their lock on every call).
#include <cstdint>
#include <iterator>
#include <string>
#include <string_view>
#include <vector>

#include "addon/Feeds.h"
#include "data/Keys.h"
#include "data/MarketStores.h"

namespace summary {

inline constexpr std::int32_t kKind = 3;
inline constexpr int kLinesPerPage = 40;
inline constexpr int kFirstPage = 1;
inline constexpr int kLastPage = 99;
inline constexpr std::int32_t kHeaderParam = 99999;
inline constexpr int kTotalsLine = 99999;
// Lines are counted from 1 up to below 1000.
inline constexpr int kMaxLines = 999;

// Lines first..last of an instrument as store keys, made one at a time (a
// recount walks up to 999 of them every refresh).
class LineRange {
 public:
  class iterator {
   public:
    using value_type = LineKey;
    using difference_type = std::ptrdiff_t;
    using reference = const LineKey&;
    using pointer = const LineKey*;
    using iterator_category = std::input_iterator_tag;
    iterator() = default;
    explicit iterator(LineKey key) : m_key(std::move(key)) {}
    const LineKey& operator*() const { return m_key; }
    iterator& operator++() {
      ++m_key.Line;
      return *this;
    }
    bool operator!=(const iterator& other) const { return m_key.Line != other.m_key.Line; }
    bool operator==(const iterator& other) const { return m_key.Line == other.m_key.Line; }

   private:
    LineKey m_key;
  };
  LineRange(const InstrumentKey& key, int first, int last);
  iterator begin() const { return iterator(m_first); }
  iterator end() const;

 private:
  LineKey m_first;
  int m_end;  // one past the last line
};

// Registers page `page` of `key` in the SummaryPageFeed; pages outside 1..99 and an
// empty code are ignored.
void RegisterPage(const InstrumentKey& key, int page, std::uint32_t now);

// Whether a 410/412 with this kind and param belongs to the summary views.
inline bool IsSummaryParam(std::int32_t kind, std::int32_t param) {
  return kind == kKind && ((param >= kFirstPage && param <= kLastPage) || param == kHeaderParam);
}

// One item of a "TRADEDATA" text, already placed on its line.
struct PageItem {
  int line = 0;  // 1..; kTotalsLine for the totals
  std::wstring price, trades, volume, bid, ask;
};
// The items of page `page`'s text; items with fewer than six fields are left
// out (they still count for the line numbers of the items after them), and so
// is every item after the last line (999) but the totals.
std::vector<PageItem> ParsePage(std::wstring_view text, int page);

// What an update changed.
enum class Applied { Nothing, Header, Lines };
// Writes a terminal value into the stores: "TRADEDATA" becomes lines, any
// other field goes to the header (fields the header does not keep change
// nothing). Values of an instrument no view registered (no header record)
// are dropped, as in every store. The caller checks kind and param first
// (IsSummaryParam).
Applied ApplyUpdate(const FieldUpdate& update, std::uint32_t now);

// The header's page count as a whole number; 0 when not known.
int PageCount(const InstrumentKey& key);
// The lines the header allows: page count x 40, or 999 while it is 0.
int LineLimit(const InstrumentKey& key);

// Lines 1.. up to the first line without a price text or beyond the limit,
// and a change stamp of the header, those lines and the totals (0 when none of
// them exists). The stamp adds the versions of two stores: it differs whenever
// anything shown changed.
struct Extent {
  int filled = 0;
  std::uint64_t newestStamp = 0;
};
Extent Recount(const InstrumentKey& key);

// Line `line` as last stored; false when it has no record.
bool ReadLine(const InstrumentKey& key, int line, SummaryLineRecord& out);
// One cell (SummaryLineLayout::Field) of a line, without copying the others.
bool ReadCell(const InstrumentKey& key, int line, int field, QuoteCell& out);
// The newest store version among lines first..last (stopping at the first
// line without a price text); 0 when none. Tells whether lines changed since
// a version seen before.
std::uint64_t NewestVersion(const InstrumentKey& key, int first, int last);

// Expires the marks of both stores.
void ExpireMarks(std::uint32_t now);

}  // namespace summary
