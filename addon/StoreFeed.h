#pragma once
// StoreFeed: a view class's side of one process-wide market-data store
// (data/): which instruments its views want, with which parameters, and
// reading what arrived. One vocabulary for every store:
//
//   feed.Register(key, params, now)  want `key` with `params`: the records the
//                                    answers land in are made to exist (an update
//                                    for a record that does not exist is dropped),
//                                    and {key, params} is queued once until taken.
//   feed.TakePending()               the queued interests in the order registered;
//                                    the queue empties. The view sends their requests.
//   feed.TakePending(shown)          only those whose key is in `shown` (anything
//                                    with count(InstrumentKey)); the others stay queued.
//   feed.Read(recordKey, out)        a record as stored; never creates or queues,
//   feed.ReadCell(recordKey, f, out) so drawing a grid never turns into requests.
//   feed.NewestStamp(recordKeys)     the newest change stamp (record version) among
//   feed.LeadingRun(recordKeys, ok)  records: a view redraws only when it grew.
//   feed.ExpireMarks(now)            ages the change marks (the current view only).
//
// A feed is described by a traits type:
//   struct DepthFeedTraits {
//     using Store = DepthStore;          // a CellStore (data/CellStore.h)
//     using Params = int;                // wanted besides the instrument (equality-comparable)
//     static Params Normalise(Params p); // clamps what may be asked
//     static std::vector<Store::Key> RecordKeys(const InstrumentKey&, const Params&);
//   };
//   using DepthFeed = addon::StoreFeed<DepthFeedTraits>;
//   DepthFeed::Instance().Register(key, 5, platform::TickCount());
//
// The feed keeps its own queue: records it creates are taken out of the
// store's pending list again, so the store's list and the feed never both ask.
// UI thread only (the store itself takes its lock on every call).
#include <cstdint>
#include <utility>
#include <vector>

#include "data/CellStore.h"
#include "data/Keys.h"
#include "data/ProcessState.h"

namespace addon {

// Params of a feed that wants nothing besides the instrument (quotes).
struct NoParams {
  friend bool operator==(const NoParams&, const NoParams&) = default;
};

template <class Traits>
class StoreFeed {
 public:
  using Store = typename Traits::Store;
  using Key = typename Store::Key;
  using Record = typename Store::Record;
  using Params = typename Traits::Params;

  // One queued interest.
  struct Pending {
    InstrumentKey key;
    Params params{};
    friend bool operator==(const Pending&, const Pending&) = default;
  };
  // A run of records from the first of a key list (LeadingRun).
  struct Run {
    int count = 0;                 // records walked before the first absent or refused one
    std::uint64_t newestStamp = 0; // newest version among them; 0: none
  };

  // The process-wide feed over the process-wide store.
  static StoreFeed& Instance() {
    static StoreFeed feed(Store::Instance());
    static const bool hook = mvd::OnResetForTests([] { feed.Reset(); });
    (void)hook;
    return feed;
  }
  explicit StoreFeed(Store& store) : m_store(store) {}
  StoreFeed(const StoreFeed&) = delete;
  StoreFeed& operator=(const StoreFeed&) = delete;

  // See the file comment. An empty instrument code is ignored.
  void Register(const InstrumentKey& key, Params params, std::uint32_t now) {
    if (key.InstrumentCode.empty()) return;
    if constexpr (requires { Traits::Normalise(params); }) params = Traits::Normalise(params);
    std::vector<Key> created;
    for (Key& k : Traits::RecordKeys(key, params)) {
      Record probe;
      if (m_store.Peek(k, probe)) continue;
      m_store.Get(k, now);
      created.push_back(std::move(k));
    }
    if (!created.empty()) m_store.TakePending(KeySet{&created});
    Pending entry{key, std::move(params)};
    for (const Pending& queued : m_pending)
      if (queued == entry) return;
    m_pending.push_back(std::move(entry));
  }

  std::vector<Pending> TakePending() { return std::exchange(m_pending, {}); }
  template <class Set>
  std::vector<Pending> TakePending(const Set& shown) {
    std::vector<Pending> taken;
    std::vector<Pending> kept;
    for (Pending& p : m_pending) (shown.count(p.key) ? taken : kept).push_back(std::move(p));
    m_pending = std::move(kept);
    return taken;
  }
  std::size_t PendingCount() const { return m_pending.size(); }
  // Forgets what is queued (tests start from an empty queue).
  void Reset() { m_pending.clear(); }

  bool Read(const Key& key, Record& out) const { return m_store.Peek(key, out); }
  // One cell without copying the record; false when the record does not exist.
  bool ReadCell(const Key& key, int field, QuoteCell& out) const {
    if (field < 0 || field >= static_cast<int>(Record::kCellCount)) return false;
    return m_store.Read([&](const typename Store::Reader& reader) {
      const Record* r = reader.Find(key);
      if (!r) return false;
      out = (*r)[static_cast<std::size_t>(field)];
      return true;
    });
  }
  // The newest version among the records of `keys` that exist; 0 when none.
  template <class Keys>
  std::uint64_t NewestStamp(const Keys& keys) const {
    std::uint64_t newest = 0;
    m_store.Read([&](const typename Store::Reader& reader) {
      for (const Key& k : keys)
        if (const Record* r = reader.Find(k); r && r->version > newest) newest = r->version;
    });
    return newest;
  }
  // Walks `keys` in order, under one lock, while the record exists and
  // `keep(record)` holds.
  template <class Keys, class Keep>
  Run LeadingRun(const Keys& keys, Keep keep) const {
    Run run;
    m_store.Read([&](const typename Store::Reader& reader) {
      for (const Key& k : keys) {
        const Record* r = reader.Find(k);
        if (!r || !keep(*r)) break;
        ++run.count;
        if (r->version > run.newestStamp) run.newestStamp = r->version;
      }
    });
    return run;
  }

  void ExpireMarks(std::uint32_t now) { m_store.ExpireMarks(now); }
  std::uint64_t Version() const { return m_store.Version(); }
  Store& GetStore() const { return m_store; }

 private:
  // The created keys as a set for the store's TakePending(set).
  struct KeySet {
    const std::vector<Key>* keys;
    std::size_t count(const Key& k) const {
      for (const Key& mine : *keys)
        if (mine == k) return 1;
      return 0;
    }
  };

  Store& m_store;
  std::vector<Pending> m_pending;
};

}  // namespace addon
