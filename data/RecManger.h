#pragma once
// Keyed record stores: a list of records in delivery order plus an index from
// key to position. Used on the UI thread only; no lock.
#include <cstdint>
#include <functional>
#include <unordered_map>
#include <utility>
#include <vector>

// Owning store. Concrete stores say how to key a record.
template <class K, class R, class Hash = std::hash<K>>
class RecManger {
 public:
  using Key = K;
  using Record = R;

  // The key of a record.
  virtual K KeyOf(const R& record) const = 0;
  virtual ~RecManger() = default;

  // Replaces the records with a copy of `list` and rebuilds the index; a later
  // duplicate key wins the index, both records stay in the list.
  void Fill(const std::vector<R>& list) {
    records_ = list;
    Reindex();
  }
  void Fill(std::vector<R>&& list) {
    records_ = std::move(list);
    Reindex();
  }

  // Appends a record with a new key (true) or overwrites the record of an
  // existing key in place (false). Neither loads the store nor bumps the version.
  bool Put(const R& record) {
    K key = KeyOf(record);
    const auto it = index_.find(key);
    if (it != index_.end() && InRange(it->second)) {
      records_[static_cast<std::size_t>(it->second)] = record;
      return false;
    }
    index_.insert_or_assign(std::move(key), static_cast<std::int32_t>(records_.size()));
    records_.push_back(record);
    return true;
  }

  // Copies the record of `key` to `out`.
  bool Find(const K& key, R& out) const {
    const R* r = FindPtr(key);
    if (!r) return false;
    out = *r;
    return true;
  }
  // The record of `key` without a copy; valid until the next Fill, Put or Erase.
  const R* FindPtr(const K& key) const {
    const int i = IndexOf(key);
    return i < 0 ? nullptr : &records_[static_cast<std::size_t>(i)];
  }
  // Position of `key` in Records(), or -1.
  int IndexOf(const K& key) const {
    const auto it = index_.find(key);
    return it != index_.end() && InRange(it->second) ? it->second : -1;
  }

  // Removes the record of `key`, keeping the others in order (watchlist deletion).
  bool Erase(const K& key) {
    const int i = IndexOf(key);
    if (i < 0) return false;
    records_.erase(records_.begin() + i);
    index_.clear();
    for (std::size_t p = 0; p < records_.size(); ++p) index_.insert_or_assign(KeyOf(records_[p]), static_cast<std::int32_t>(p));
    return true;
  }

  const std::vector<R>& Records() const { return records_; }
  bool IsLoaded() const { return loaded_; }
  std::int32_t Version() const { return version_; }

  // Empty, not loaded, version 0: as when first made (tests; see
  // data/ProcessState.h). What keeps a version seen must be reset with it.
  void ResetForTests() {
    records_.clear();
    index_.clear();
    loaded_ = false;
    version_ = 0;
  }

 private:
  bool InRange(std::int32_t i) const { return i >= 0 && static_cast<std::size_t>(i) < records_.size(); }
  void Reindex() {
    index_.clear();
    index_.reserve(records_.size());
    for (std::size_t p = 0; p < records_.size(); ++p) index_.insert_or_assign(KeyOf(records_[p]), static_cast<std::int32_t>(p));
    loaded_ = true;
    ++version_;
  }

  bool loaded_ = false;
  std::vector<R> records_;
  std::unordered_map<K, std::int32_t, Hash> index_;
  std::int32_t version_ = 0;
};

// Read-only store: indexes a list owned by someone else (the terminal's
// instrument list, alive and unchanged until it delivers the next one).
template <class K, class R, class Hash = std::hash<K>>
class RecManger_ReadOnly {
 public:
  using Key = K;
  using Record = R;

  virtual K KeyOf(const R& record) const = 0;
  virtual ~RecManger_ReadOnly() = default;

  // Keeps the pointer (no copy) and rebuilds the index. A null list reads as empty.
  void Fill(const std::vector<R>* list) {
    list_ = list;
    index_.clear();
    const auto& recs = Records();
    index_.reserve(recs.size());
    for (std::size_t p = 0; p < recs.size(); ++p) index_.insert_or_assign(KeyOf(recs[p]), static_cast<std::int32_t>(p));
    loaded_ = true;
    ++version_;
  }

  bool Find(const K& key, R& out) const {
    const R* r = FindPtr(key);
    if (!r) return false;
    out = *r;
    return true;
  }
  const R* FindPtr(const K& key) const {
    const int i = IndexOf(key);
    return i < 0 ? nullptr : &Records()[static_cast<std::size_t>(i)];
  }
  int IndexOf(const K& key) const {
    const auto it = index_.find(key);
    if (it == index_.end() || it->second < 0 || static_cast<std::size_t>(it->second) >= Records().size()) return -1;
    return it->second;
  }

  // The indexed list (the owner's), or an empty list.
  const std::vector<R>& Records() const {
    static const std::vector<R> kEmpty;
    return list_ ? *list_ : kEmpty;
  }
  // The list as handed to Fill (null before the first fill).
  const std::vector<R>* Source() const { return list_; }
  bool IsLoaded() const { return loaded_; }
  std::int32_t Version() const { return version_; }

  // No list, not loaded, version 0: as when first made (tests).
  void ResetForTests() {
    list_ = nullptr;
    index_.clear();
    loaded_ = false;
    version_ = 0;
  }

 private:
  bool loaded_ = false;
  const std::vector<R>* list_ = nullptr;
  std::unordered_map<K, std::int32_t, Hash> index_;
  std::int32_t version_ = 0;
};

// A store keyed by a function object: KeyFn{}(record) -> K.
template <class K, class R, class KeyFn, class Hash = std::hash<K>>
class KeyedRecManger final : public RecManger<K, R, Hash> {
 public:
  K KeyOf(const R& record) const override { return KeyFn{}(record); }
};

template <class K, class R, class KeyFn, class Hash = std::hash<K>>
class KeyedRecManger_ReadOnly final : public RecManger_ReadOnly<K, R, Hash> {
 public:
  K KeyOf(const R& record) const override { return KeyFn{}(record); }
};
