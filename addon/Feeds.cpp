#include "addon/Feeds.h"

#include <algorithm>

namespace addon {

int DepthFeedTraits::Normalise(int levels) { return std::clamp(levels, kMinLevels, kMaxLevels); }

std::vector<DepthKey> DepthFeedTraits::RecordKeys(const InstrumentKey& key, int levels) {
  return DepthLevels(key, kMinLevels, levels);
}

std::vector<DepthKey> DepthLevels(const InstrumentKey& key, int first, int last) {
  first = std::max(first, DepthFeedTraits::kMinLevels);
  last = std::min(last, DepthFeedTraits::kMaxLevels);
  std::vector<DepthKey> keys;
  if (last >= first) keys.reserve(static_cast<std::size_t>(last - first + 1));
  for (int level = first; level <= last; ++level) keys.push_back(DepthKey{key.ProductID, key.InstrumentCode, level});
  return keys;
}

std::vector<PageKey> SalesPageFeedTraits::RecordKeys(const InstrumentKey& key, std::int32_t page) {
  if (!IsPage(page)) return {};
  return {PageKey{key.ProductID, key.InstrumentCode, page}};
}

}  // namespace addon
