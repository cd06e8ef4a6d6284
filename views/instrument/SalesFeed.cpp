#include "views/instrument/SalesFeed.h"

#include <algorithm>
#include <utility>

#include "hostview/Text.h"
#include "views/instrument/SalesPaging.h"

namespace sales {
namespace {

std::vector<InstrumentKey>& HeaderQueue() {
  static std::vector<InstrumentKey> queue;
  return queue;
}
std::vector<PageKey>& PageQueue() {
  static std::vector<PageKey> queue;
  return queue;
}

// Creates the record when absent; the store's own pending list is not how
// these are requested, so what Get queued is taken back.
template <class Store>
void EnsureRecord(Store& store, const typename Store::Key& key, std::uint32_t now) {
  typename Store::Record probe;
  if (store.Peek(key, probe)) return;
  store.Get(key, now);
  struct One {
    const typename Store::Key* key;
    std::size_t count(const typename Store::Key& k) const { return k == *key ? 1 : 0; }
  };
  store.TakePending(One{&key});
}

template <class K>
void Enqueue(std::vector<K>& queue, K key) {
  if (std::find(queue.begin(), queue.end(), key) == queue.end()) queue.push_back(std::move(key));
}

}  // namespace

void RegisterHeader(const InstrumentKey& key, std::uint32_t now) {
  if (key.InstrumentCode.empty()) return;
  EnsureRecord(SalesSummaryStore::Instance(), key, now);
  Enqueue(HeaderQueue(), key);
}

void RegisterPage(const InstrumentKey& key, std::int32_t page, std::uint32_t now) {
  if (key.InstrumentCode.empty() || !IsPage(page)) return;
  PageKey k{key.ProductID, key.InstrumentCode, page};
  EnsureRecord(SalesPageStore::Instance(), k, now);
  Enqueue(PageQueue(), std::move(k));
}

std::vector<InstrumentKey> TakePendingHeaders() { return std::exchange(HeaderQueue(), {}); }
std::vector<PageKey> TakePendingPages() { return std::exchange(PageQueue(), {}); }
std::size_t PendingCount() { return HeaderQueue().size() + PageQueue().size(); }

void ClearPending() {
  HeaderQueue().clear();
  PageQueue().clear();
}

bool ReadHeader(const InstrumentKey& key, SalesSummaryRecord& out) {
  return SalesSummaryStore::Instance().Peek(key, out);
}

Applied ApplyUpdate(const FieldUpdate& u, std::uint32_t now) {
  if (u.kind != kKind) return Applied::Ignored;
  if (IsHeader(u.param)) {
    SalesSummaryStore::Instance().Update(InstrumentKey{u.productId, hv::Widen(u.instrumentCode)},
                                         hv::Widen(u.fieldName), hv::Widen(u.value), now);
    return Applied::Header;
  }
  if (!IsPage(u.param)) return Applied::Ignored;
  const std::wstring code = hv::Widen(u.instrumentCode);
  const std::wstring field = hv::Widen(u.fieldName);
  const std::wstring value = hv::Widen(u.value);
  SalesPageStore::Instance().Update(PageKey{u.productId, code, u.param}, field, value, now);
  // Trades are kept whether or not the page had a record: nothing received is lost.
  if (field == L"TRADEDATA") {
    const InstrumentKey key{u.productId, code};
    TradeTape::Instance().StorePage(key, value);
    if (u.param != kLivePage) PageBatches::Instance().NoteAnswer(key, u.param);
  }
  return Applied::Page;
}

}  // namespace sales
