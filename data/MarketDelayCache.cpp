#include "data/MarketDelayCache.h"

#include "data/ProcessState.h"

MarketDelayCache& MarketDelayCache::Instance() {
  static MarketDelayCache cache;
  static const bool hook = mvd::OnResetForTests([] { cache.Clear(); });
  (void)hook;
  return cache;
}

std::wstring MarketDelayCache::Lookup(std::int64_t productId, std::wstring_view exchangeCode) const {
  std::wstring text;
  Find(productId, exchangeCode, text);
  return text;
}

bool MarketDelayCache::Find(std::int64_t productId, std::wstring_view exchangeCode, std::wstring& text) const {
  const InstrumentKey key{productId, std::wstring(exchangeCode)};
  std::lock_guard lock(mu_);
  const auto it = map_.find(key);
  if (it == map_.end()) {
    text.clear();
    return false;
  }
  text = it->second;
  return true;
}

void MarketDelayCache::Set(std::int64_t productId, std::wstring_view exchangeCode, std::wstring text) {
  InstrumentKey key{productId, std::wstring(exchangeCode)};
  std::lock_guard lock(mu_);
  map_.insert_or_assign(std::move(key), std::move(text));
}

void MarketDelayCache::SetDelay(std::int64_t productId, std::wstring_view exchangeCode, std::int32_t delay) {
  Set(productId, exchangeCode, delay == 0 ? std::wstring() : std::to_wstring(delay));
}

void MarketDelayCache::Clear() {
  std::lock_guard lock(mu_);
  map_.clear();
}
