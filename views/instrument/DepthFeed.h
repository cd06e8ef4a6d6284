#pragma once
// The depth views' side of the process-wide DepthStore: which instruments are
// wanted with how many levels, and reading levels without creating records.
//
// DepthStore keeps one record per {product id, code, level}; an update for a
// level without a record is dropped. A registration makes sure levels
// 1..levelCount have records and queues {instrument, levelCount} for the next
// refresh tick of any depth view, which sends the subscription batches for it.
// Reading a level never creates or queues anything, so drawing a grid does not
// turn into requests.
//
// UI thread only (the store itself takes its lock on every call).
#include <cstdint>
#include <string>
#include <vector>

#include "data/Keys.h"
#include "data/MarketStores.h"

namespace depth {

// Levels a depth subscription may ask for.
inline constexpr int kMinLevels = 1;
inline constexpr int kMaxLevels = 99;

// One queued subscription: the instrument and the number of levels wanted.
struct PendingDepth {
  InstrumentKey key;
  int levelCount = 0;

  friend bool operator==(const PendingDepth&, const PendingDepth&) = default;
};

// Registers {key, levelCount} (clamped to 1..99). The same pair queued twice
// before it is taken leaves once. An empty code is ignored.
void Register(const InstrumentKey& key, int levelCount, std::uint32_t now);

// The queued subscriptions in the order registered; the queue is emptied.
std::vector<PendingDepth> TakePending();
std::size_t PendingCount();

// Level `level` of `key` (1..99) as last stored; false when the level has no
// record (never registered).
bool ReadLevel(const InstrumentKey& key, int level, DepthRecord& out);
// One cell (DepthLayout::Field) of a level, without copying the others; the
// grid reads cells this way while painting.
bool ReadCell(const InstrumentKey& key, int level, int field, QuoteCell& out);

// Filled levels from level 1 up to the first level whose buy and sell prices
// are both zero or without text (levels without a record end the count too),
// with the newest change stamp among them (store version; 0 when none).
struct BookExtent {
  int filled = 0;
  std::uint64_t newestStamp = 0;
};
BookExtent Extent(const InstrumentKey& key);

// Whether a price cell counts as "a price" for the filled-level rule.
inline bool HasPrice(const QuoteCell& cell) { return cell.value != 0.0 && !cell.text.empty(); }

}  // namespace depth
