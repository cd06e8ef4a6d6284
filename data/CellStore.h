#pragma once
// The mechanics shared by the quote store and the depth, time-and-sales and
// trade-summary stores: a map from a key to a record of cells, a pending list
// of keys asked for before any value arrived, and one lock taken by every
// operation. What differs between stores (the cells, how each decodes and
// marks, the default texts) is a layout table; see QuoteStore.h and
// MarketStores.h.
//
// Time is the terminal's millisecond tick count, passed in by the caller
// (views pass platform::TickCount()); ages are unsigned differences, so the
// wrap of the tick counter is harmless.
#include <array>
#include <atomic>
#include <cmath>
#include <cstdint>
#include <deque>
#include <mutex>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

#include "data/Keys.h"
#include "data/NumberText.h"
#include "data/ProcessState.h"

// Change marks.
enum : std::int32_t { kMarkNone = 0, kMarkChanged = 1, kMarkUp = 2, kMarkDown = 3 };

// How long a mark stays (milliseconds).
inline constexpr std::uint32_t kMarkLifetimeMs = 1500;
// Numbers closer than this are equal.
inline constexpr double kValueTolerance = 1e-8;

struct QuoteCell {
  std::int32_t mark = kMarkNone;
  std::wstring raw;   // text as received (kept for cells that ask for it)
  std::wstring text;  // display text
  double value = 0.0;
  std::uint32_t changedAt = 0;
  bool filled = false;  // a value has arrived since the record was created
};

enum class CellKind : std::uint8_t {
  Price,  // number, printed with the record's number format (instrument decimals)
  Fixed,  // number, printed with the cell's own decimals
  Whole,  // number truncated to a whole number, printed in decimal
  Text,   // text as received
};
enum class MarkRule : std::uint8_t {
  Direction,  // 2 up, 3 down, 0 equal
  Change,     // 1 changed, 0 equal
};

struct CellSpec {
  std::wstring_view name;
  CellKind kind = CellKind::Text;
  MarkRule rule = MarkRule::Change;
  std::int8_t decimals = 3;      // for CellKind::Fixed
  bool keepRaw = false;          // keep the received text in QuoteCell::raw
  bool clearOnEmpty = false;     // stores with the empty-value rule: blank the text
  std::wstring_view defaultText; // text of a fresh default record
};

// One record of a store with layout L.
template <class L>
struct CellRecord {
  static constexpr std::size_t kCellCount = L::kCells.size();

  std::array<QuoteCell, kCellCount> cells{};
  bool changed = false;           // set by any change, reset by ClearChanged
  std::uint32_t updatedAt = 0;    // tick of the last change
  std::uint32_t readAt = 0;       // tick of the last Get
  std::int32_t decimals = 3;      // the record's number format is "%.<decimals>f"
  bool instrumentKnown = false;   // decimals came from the instrument stores
  std::uint64_t version = 0;      // store version of the last change: a cheap "changed since"
  bool expiring = false;          // store bookkeeping: some cell carries a mark

  QuoteCell& operator[](std::size_t i) { return cells[i]; }
  const QuoteCell& operator[](std::size_t i) const { return cells[i]; }
  // The cell of a field name, or null.
  const QuoteCell* Cell(std::wstring_view name) const {
    for (std::size_t i = 0; i < kCellCount; ++i)
      if (L::kCells[i].name == name) return &cells[i];
    return nullptr;
  }
  std::wstring NumberFormat() const { return mvd::NumberFormat(decimals); }
};

template <class L>
class CellStore {
 public:
  using Layout = L;
  using Key = typename L::Key;
  using Record = CellRecord<L>;
  static constexpr std::size_t kCellCount = Record::kCellCount;
  // Instrument decimals for a record's number format (-1: unknown).
  using DecimalsLookup = int (*)(const InstrumentKey&);

  // The process-wide store, created on first use.
  static CellStore& Instance();

  // A separate store (tests, tools). `lookup` defaults to the instrument stores.
  explicit CellStore(DecimalsLookup lookup = nullptr);
  CellStore(const CellStore&) = delete;
  CellStore& operator=(const CellStore&) = delete;

  // Index of a field name (exact, case-sensitive), or -1.
  static int FieldIndex(std::wstring_view name) noexcept {
    for (std::size_t i = 0; i < kCellCount; ++i) {
      const auto& n = L::kCells[i].name;
      if (n.size() == name.size() && n[0] == name[0] && n == name) return static_cast<int>(i);
    }
    return -1;
  }

  // Decodes one field value into the record of `key`. Records are created only
  // by Get: an update for an unknown key is dropped. Returns whether the record
  // changed. An empty (or blank) numeric value reads as 0: the terminal sends it
  // when it withdraws a price. Any other text that is not a finite number
  // leaves the cell as it was.
  bool Update(const Key& key, std::wstring_view field, std::wstring_view value, std::uint32_t now);
  bool Update(const Key& key, int fieldIndex, std::wstring_view value, std::uint32_t now);

  // Copy of the record of `key`, stamping its read time. An unknown key is
  // queued as pending and answered with a fresh default record.
  Record Get(const Key& key, std::uint32_t now);
  // Copy without creating, queuing or stamping. False for an unknown key.
  bool Peek(const Key& key, Record& out) const;

  // Runs f(const Reader&) under the lock, for scans that would otherwise take
  // many copies (a recount over a tape). Do not call the store from f.
  class Reader {
   public:
    const Record* Find(const Key& key) const {
      const auto it = map_->find(key);
      return it == map_->end() ? nullptr : it->second;
    }
    std::size_t Size() const { return map_->size(); }
    template <class F>
    void ForEach(F&& f) const {
      for (const auto& [k, r] : *map_) f(k, *r);
    }

   private:
    friend class CellStore;
    explicit Reader(const std::unordered_map<Key, Record*>* m) : map_(m) {}
    const std::unordered_map<Key, Record*>* map_;
  };
  template <class F>
  decltype(auto) Read(F&& f) const {
    std::lock_guard lock(mu_);
    return f(Reader(&map_));
  }

  // Removes and returns pending keys in the order asked: up to `limit`, all
  // when `limit` < 1.
  std::vector<Key> TakePending(int limit = 0);
  // Removes and returns the pending keys that are in `shown` (anything with
  // count(key)); the others stay pending.
  template <class Set>
  std::vector<Key> TakePending(const Set& shown) {
    std::lock_guard lock(mu_);
    std::vector<Key> taken;
    std::vector<Key> kept;
    for (auto& k : pending_) (shown.count(k) ? taken : kept).push_back(std::move(k));
    pending_ = std::move(kept);
    return taken;
  }
  std::size_t PendingCount() const;
  // Forgets every record and the pending list (tests; a store's version keeps
  // growing, so a view never mistakes a new record for one it has seen).
  void Clear();

  // Clears marks that are kMarkLifetimeMs old or older.
  void ExpireMarks(std::uint32_t now);
  // Resets the changed flag of every record.
  void ClearChanged();

  // Bumped by every change of any record (not by reads); lock-free, so a view
  // can skip its recount when nothing moved.
  std::uint64_t Version() const noexcept { return version_.load(std::memory_order_acquire); }
  std::size_t Size() const;
  // Every key as " [<product id> | <code>]".
  std::wstring Dump() const;

  // Empty, as when first made (tests; see data/ProcessState.h).
  void ResetForTests();

 private:
  Record MakeDefault(const Key& key, std::uint32_t now) const;
  void Touch(Record& r, std::uint32_t now);
  void LearnDecimals(const Key& key, Record& r, std::uint32_t now);
  // Writers hold the lock, so a plain load and store suffice.
  std::uint64_t BumpVersion() {
    const std::uint64_t v = version_.load(std::memory_order_relaxed) + 1;
    version_.store(v, std::memory_order_release);
    return v;
  }
  bool Decode(Record& r, int idx, std::wstring_view value, std::uint32_t now);

  mutable std::mutex mu_;
  // Records live out of line so that the index stays small and cache-friendly;
  // records are never removed, so their addresses are stable.
  std::unordered_map<Key, Record*> map_;
  std::deque<Record> records_;
  std::vector<Key> pending_;
  std::vector<Record*> marked_;   // records with a live mark (nodes are stable)
  std::vector<Record*> changed_;  // records whose changed flag is set
  std::atomic<std::uint64_t> version_{0};
  DecimalsLookup lookup_;
};

// ---- implementation -------------------------------------------------------

int InstrumentDecimals(const InstrumentKey& key);  // ReferenceStores.cpp

template <class L>
CellStore<L>& CellStore<L>::Instance() {
  static CellStore store;
  static const bool hook = mvd::OnResetForTests([] { store.ResetForTests(); });
  (void)hook;
  return store;
}

template <class L>
void CellStore<L>::ResetForTests() {
  std::lock_guard lock(mu_);
  map_.clear();
  records_.clear();
  pending_.clear();
  marked_.clear();
  changed_.clear();
  version_.store(0, std::memory_order_release);
}

template <class L>
CellStore<L>::CellStore(DecimalsLookup lookup) : lookup_(lookup ? lookup : &InstrumentDecimals) {}

template <class L>
bool CellStore<L>::Update(const Key& key, std::wstring_view field, std::wstring_view value, std::uint32_t now) {
  if (field.empty()) return false;
  const int idx = FieldIndex(field);
  if (idx < 0 && !(L::kEmptyValueTouches && mvd::IsBlank(value))) return false;
  return Update(key, idx, value, now);
}

template <class L>
bool CellStore<L>::Update(const Key& key, int idx, std::wstring_view value, std::uint32_t now) {
  if (idx >= static_cast<int>(kCellCount)) return false;
  std::lock_guard lock(mu_);
  const auto it = map_.find(key);
  if (it == map_.end()) return false;
  Record& r = *it->second;
  if constexpr (L::kEmptyValueTouches) {
    // An empty value withdraws the level's price text and tells the view to repaint.
    if (mvd::IsBlank(value)) {
      if (idx >= 0 && L::kCells[idx].clearOnEmpty) r.cells[idx].text.clear();
      r.readAt = now;
      Touch(r, now);
      return true;
    }
  }
  if (idx < 0) return false;
  return Decode(r, idx, value, now);
}

template <class L>
bool CellStore<L>::Decode(Record& r, int idx, std::wstring_view value, std::uint32_t now) {
  const CellSpec& spec = L::kCells[idx];
  QuoteCell& c = r.cells[idx];
  const bool first = !c.filled || c.text.empty();
  int cmp = 0;  // sign of new - old
  if (spec.kind == CellKind::Text) {
    if (!first && c.text != value) cmp = 1;
    c.text.assign(value);
  } else {
    double v = 0.0;
    if (!mvd::IsBlank(value) && !mvd::ParseNumber(value, v)) return false;
    if (spec.kind == CellKind::Whole) {
      v = std::trunc(v);
      // Beyond the 64-bit range there is no whole number to show.
      if (!(v >= -9.2e18 && v <= 9.2e18)) return false;
    }
    if (!first) {
      const double d = v - c.value;
      cmp = d > kValueTolerance ? 1 : d < -kValueTolerance ? -1 : 0;
    }
    switch (spec.kind) {
      case CellKind::Price: mvd::FormatFixed(v, r.decimals, c.text); break;
      case CellKind::Fixed: mvd::FormatFixed(v, spec.decimals, c.text); break;
      default: mvd::FormatWhole(static_cast<std::int64_t>(v), c.text); break;
    }
    c.value = v;
  }
  if (spec.keepRaw) c.raw.assign(value);
  c.mark = cmp == 0 ? kMarkNone : spec.rule == MarkRule::Change ? kMarkChanged : cmp > 0 ? kMarkUp : kMarkDown;
  c.filled = true;
  c.changedAt = now;
  if (c.mark != kMarkNone && !r.expiring) {
    r.expiring = true;
    marked_.push_back(&r);
  }
  Touch(r, now);
  return true;
}

template <class L>
void CellStore<L>::Touch(Record& r, std::uint32_t now) {
  r.updatedAt = now;
  if (!r.changed) {
    r.changed = true;
    changed_.push_back(&r);
  }
  r.version = BumpVersion();
}

template <class L>
typename CellStore<L>::Record CellStore<L>::MakeDefault(const Key& key, std::uint32_t now) const {
  Record r;
  if constexpr (L::kInstrumentDecimals) {
    const int d = lookup_(L::InstrumentOf(key));
    r.decimals = mvd::RecordDecimals(d);
    r.instrumentKnown = d >= 0;
  }
  for (std::size_t i = 0; i < kCellCount; ++i) {
    r.cells[i].text.assign(L::kCells[i].defaultText);
    r.cells[i].changedAt = now;
  }
  r.updatedAt = now;
  r.readAt = now;
  return r;
}

template <class L>
typename CellStore<L>::Record CellStore<L>::Get(const Key& key, std::uint32_t now) {
  std::lock_guard lock(mu_);
  const auto it = map_.find(key);
  if (it != map_.end()) {
    Record& r = *it->second;
    r.readAt = now;
    if constexpr (L::kInstrumentDecimals) {
      if (!r.instrumentKnown) LearnDecimals(key, r, now);
    }
    return r;
  }
  pending_.push_back(key);
  Record& r = records_.emplace_back(MakeDefault(key, now));
  map_.emplace(key, &r);
  r.version = BumpVersion();
  return r;
}

// A record made before its instrument was known (the instrument list came
// later) takes the instrument's format once it is, and reprints its prices.
template <class L>
void CellStore<L>::LearnDecimals(const Key& key, Record& r, std::uint32_t now) {
  const int d = lookup_(L::InstrumentOf(key));
  if (d < 0) return;
  r.instrumentKnown = true;
  const int dec = mvd::RecordDecimals(d);
  if (dec == r.decimals) return;
  r.decimals = dec;
  for (std::size_t i = 0; i < kCellCount; ++i) {
    QuoteCell& c = r.cells[i];
    if (L::kCells[i].kind == CellKind::Price && c.filled && !c.text.empty()) mvd::FormatFixed(c.value, dec, c.text);
  }
  Touch(r, now);
}

template <class L>
bool CellStore<L>::Peek(const Key& key, Record& out) const {
  std::lock_guard lock(mu_);
  const auto it = map_.find(key);
  if (it == map_.end()) return false;
  out = *it->second;
  return true;
}

template <class L>
std::vector<typename CellStore<L>::Key> CellStore<L>::TakePending(int limit) {
  std::lock_guard lock(mu_);
  if (limit < 1 || static_cast<std::size_t>(limit) >= pending_.size()) return std::exchange(pending_, {});
  std::vector<Key> taken(std::make_move_iterator(pending_.begin()), std::make_move_iterator(pending_.begin() + limit));
  pending_.erase(pending_.begin(), pending_.begin() + limit);
  return taken;
}

template <class L>
std::size_t CellStore<L>::PendingCount() const {
  std::lock_guard lock(mu_);
  return pending_.size();
}

template <class L>
void CellStore<L>::ExpireMarks(std::uint32_t now) {
  std::lock_guard lock(mu_);
  for (std::size_t i = 0; i < marked_.size();) {
    Record& r = *marked_[i];
    bool live = false;
    bool cleared = false;
    for (auto& c : r.cells) {
      if (c.mark == kMarkNone) continue;
      if (static_cast<std::uint32_t>(now - c.changedAt) > kMarkLifetimeMs - 1) {
        c.mark = kMarkNone;
        c.changedAt = now;
        cleared = true;
      } else {
        live = true;
      }
    }
    if (cleared) {
      r.readAt = now;
      Touch(r, now);
    }
    if (live) {
      ++i;
    } else {
      r.expiring = false;
      marked_[i] = marked_.back();
      marked_.pop_back();
    }
  }
}

template <class L>
void CellStore<L>::Clear() {
  std::lock_guard lock(mu_);
  map_.clear();
  records_.clear();
  pending_.clear();
  marked_.clear();
  changed_.clear();
  BumpVersion();
}

template <class L>
void CellStore<L>::ClearChanged() {
  std::lock_guard lock(mu_);
  for (Record* r : changed_) r->changed = false;
  changed_.clear();
}

template <class L>
std::size_t CellStore<L>::Size() const {
  std::lock_guard lock(mu_);
  return map_.size();
}

template <class L>
std::wstring CellStore<L>::Dump() const {
  std::lock_guard lock(mu_);
  std::wstring out;
  for (const auto& [k, r] : map_) {
    out += L" [";
    out += std::to_wstring(k.ProductID);
    out += L" | ";
    out += k.InstrumentCode;
    out += L"]";
  }
  return out;
}
