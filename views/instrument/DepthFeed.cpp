#include "views/instrument/DepthFeed.h"

#include <algorithm>
#include <set>

#include "data/ProcessState.h"

namespace depth {
namespace {

std::vector<PendingDepth>& Queue() {
  static std::vector<PendingDepth> queue;
  static const bool hook = mvd::OnResetForTests([] { queue.clear(); });
  (void)hook;
  return queue;
}

}  // namespace

void Register(const InstrumentKey& key, int levelCount, std::uint32_t now) {
  if (key.InstrumentCode.empty()) return;
  levelCount = std::clamp(levelCount, kMinLevels, kMaxLevels);
  DepthStore& store = DepthStore::Instance();
  // Records for every wanted level, so that the answers land. The store's own
  // pending list is not how depth is requested: drop what Get queued.
  std::set<DepthKey> created;
  for (int level = 1; level <= levelCount; ++level) {
    DepthKey k{key.ProductID, key.InstrumentCode, level};
    DepthRecord probe;
    if (store.Peek(k, probe)) continue;
    store.Get(k, now);
    created.insert(std::move(k));
  }
  if (!created.empty()) store.TakePending(created);

  PendingDepth entry{key, levelCount};
  auto& queue = Queue();
  if (std::find(queue.begin(), queue.end(), entry) == queue.end()) queue.push_back(std::move(entry));
}

std::vector<PendingDepth> TakePending() { return std::exchange(Queue(), {}); }

std::size_t PendingCount() { return Queue().size(); }

bool ReadLevel(const InstrumentKey& key, int level, DepthRecord& out) {
  if (level < kMinLevels || level > kMaxLevels) return false;
  return DepthStore::Instance().Peek(DepthKey{key.ProductID, key.InstrumentCode, level}, out);
}

bool ReadCell(const InstrumentKey& key, int level, int field, QuoteCell& out) {
  if (level < kMinLevels || level > kMaxLevels || field < 0 || field >= int(DepthRecord::kCellCount)) return false;
  return DepthStore::Instance().Read([&](const DepthStore::Reader& reader) {
    const DepthRecord* r = reader.Find(DepthKey{key.ProductID, key.InstrumentCode, level});
    if (!r) return false;
    out = (*r)[std::size_t(field)];
    return true;
  });
}

BookExtent Extent(const InstrumentKey& key) {
  BookExtent extent;
  if (key.InstrumentCode.empty()) return extent;
  DepthStore::Instance().Read([&](const DepthStore::Reader& reader) {
    DepthKey k{key.ProductID, key.InstrumentCode, 0};
    for (int level = kMinLevels; level <= kMaxLevels; ++level) {
      k.Level = level;
      const DepthRecord* r = reader.Find(k);
      if (!r) break;
      if (!HasPrice((*r)[DepthLayout::Buy]) && !HasPrice((*r)[DepthLayout::Sell])) break;
      extent.filled = level;
      extent.newestStamp = std::max(extent.newestStamp, r->version);
    }
  });
  return extent;
}

}  // namespace depth
