#include "data/TradeTape.h"

#include <algorithm>
#include <limits>
#include <utility>
#include <vector>

#include "data/ProcessState.h"

namespace mvd {
namespace {

constexpr bool IsBlank(wchar_t c) { return c == L' ' || c == L'\t' || c == L'\r' || c == L'\n'; }

// A whole number above 0 that fits 32 bits (surrounding blanks allowed); 0 otherwise.
std::int32_t ReadTradeNumber(std::wstring_view s) {
  std::size_t b = 0;
  std::size_t e = s.size();
  while (b < e && IsBlank(s[b])) ++b;
  while (e > b && IsBlank(s[e - 1])) --e;
  if (b < e && s[b] == L'+') ++b;
  if (b == e) return 0;
  std::int64_t v = 0;
  for (std::size_t i = b; i < e; ++i) {
    if (s[i] < L'0' || s[i] > L'9') return 0;
    v = v * 10 + (s[i] - L'0');
    if (v > std::numeric_limits<std::int32_t>::max()) return 0;
  }
  return static_cast<std::int32_t>(v);
}

// Splits one item into its six fields; false for any other count.
bool SplitItem(std::wstring_view item, std::array<std::wstring_view, 6>& fields) {
  std::size_t n = 0;
  std::size_t start = 0;
  for (;;) {
    const std::size_t bar = item.find(L'|', start);
    if (n == fields.size()) return false;
    fields[n++] = item.substr(start, bar == std::wstring_view::npos ? std::wstring_view::npos : bar - start);
    if (bar == std::wstring_view::npos) break;
    start = bar + 1;
  }
  return n == fields.size();
}

// Calls f(fields, number) for every valid item; stops when f returns false.
template <class F>
int ForEachItem(std::wstring_view text, F&& f) {
  int valid = 0;
  std::size_t start = 0;
  std::array<std::wstring_view, 6> fields;
  while (start <= text.size()) {
    const std::size_t semi = text.find(L';', start);
    const std::wstring_view item =
        text.substr(start, semi == std::wstring_view::npos ? std::wstring_view::npos : semi - start);
    if (SplitItem(item, fields)) {
      if (const std::int32_t number = ReadTradeNumber(fields[5]); number > 0) {
        ++valid;
        if (!f(fields, number)) break;
      }
    }
    if (semi == std::wstring_view::npos) break;
    start = semi + 1;
  }
  return valid;
}

}  // namespace

int ParseTradeData(std::wstring_view text, const std::function<void(TradeRecord&&)>& f) {
  return ForEachItem(text, [&](const std::array<std::wstring_view, 6>& fields, std::int32_t number) {
    TradeRecord r;
    r.number = number;
    r.time.assign(fields[0]);
    r.price.assign(fields[1]);
    r.volume.assign(fields[2]);
    r.side.assign(fields[3]);
    f(std::move(r));
    return true;
  });
}

std::int32_t FirstTradeNumber(std::wstring_view text) {
  std::int32_t first = 0;
  ForEachItem(text, [&](const auto&, std::int32_t number) {
    first = number;
    return false;
  });
  return first;
}

std::int32_t NewestTradeNumber(std::wstring_view text) {
  std::int32_t newest = 0;
  ForEachItem(text, [&](const auto&, std::int32_t number) {
    if (number > newest) newest = number;
    return true;
  });
  return newest;
}

}  // namespace mvd

TradeTape& TradeTape::Instance() {
  static TradeTape tape;
  static const bool hook = mvd::OnResetForTests([] { tape.ResetForTests(); });
  (void)hook;
  return tape;
}

void TradeTape::ResetForTests() {
  std::lock_guard lock(mu_);
  tapes_.clear();
  scratch_ = TradeRecord{};
  version_.store(0, std::memory_order_release);
}

namespace {

constexpr std::size_t kFields = 4;

std::array<const std::wstring*, kFields> FieldsOf(const TradeRecord& t) { return {&t.time, &t.price, &t.volume, &t.side}; }
std::array<std::wstring*, kFields> FieldsOf(TradeRecord& t) { return {&t.time, &t.price, &t.volume, &t.side}; }

// Whether `text` starts with the ASCII `prefix`.
bool StartsWith(std::wstring_view text, const std::string& prefix) {
  return text.size() >= prefix.size() &&
         std::equal(prefix.begin(), prefix.end(), text.begin(), [](char a, wchar_t b) { return static_cast<wchar_t>(a) == b; });
}

}  // namespace

bool TradeTape::Packs(const Block& block, const TradeRecord& trade) {
  std::size_t length = 0;
  for (const std::wstring* field : FieldsOf(trade)) {
    if (field->size() > 255) return false;
    for (const wchar_t c : *field)
      if (c < 0 || c > 0x7F) return false;
    length += field->size();
  }
  return block.text.size() + length <= 0xFFFF;
}

bool TradeTape::SameAsPacked(const Block& block, int slot, const TradeRecord& trade) {
  const Slot& s = block.places[std::size_t(slot)];
  std::size_t at = s.at;
  const auto fields = FieldsOf(trade);
  for (std::size_t f = 0; f < kFields; ++f) {
    std::wstring_view field = *fields[f];
    if (f == 0 && block.prefixed[std::size_t(slot)]) {
      if (!StartsWith(field, block.timePrefix)) return false;
      field.remove_prefix(block.timePrefix.size());
    }
    if (field.size() != s.length[f]) return false;
    for (const wchar_t c : field)
      if (static_cast<unsigned char>(block.text[at++]) != static_cast<unsigned>(c)) return false;
  }
  return true;
}

// Keeps only the text of the held packed trades.
void TradeTape::Repack(Block& block) {
  std::string text;
  text.reserve(block.text.size());
  for (int i = 0; i < mvd::kTradesPerPage; ++i) {
    Slot& s = block.places[std::size_t(i)];
    if (!block.held[std::size_t(i)] || block.unpacked.count(i)) continue;
    std::size_t length = 0;
    for (const std::uint8_t l : s.length) length += l;
    const std::size_t at = text.size();
    text.append(block.text, s.at, length);
    s.at = static_cast<std::uint16_t>(at);
  }
  block.text = std::move(text);
}

bool TradeTape::StoreLocked(Tape& tape, TradeRecord&& trade) {
  if (trade.number <= 0) return false;
  const int page = mvd::PageOfTrade(trade.number);
  std::unique_ptr<Block>& owned = tape.blocks[page];
  if (!owned) owned = std::make_unique<Block>();
  Block& block = *owned;
  const int slot = (trade.number - 1) % mvd::kTradesPerPage;
  version_.fetch_add(1, std::memory_order_release);

  const bool held = block.held[std::size_t(slot)];
  const auto unpacked = block.unpacked.find(slot);
  const bool wasPacked = held && unpacked == block.unpacked.end();
  // The live page brings the same trades again and again: keep the text as it is.
  if (wasPacked && SameAsPacked(block, slot, trade)) return true;
  if (!held) {
    block.held[std::size_t(slot)] = true;
    ++block.count;
    ++tape.count;
  }
  Slot& s = block.places[std::size_t(slot)];
  if (wasPacked) {
    // A replaced trade's text goes at once, so the block's text only holds live trades.
    block.held[std::size_t(slot)] = false;
    Repack(block);
    block.held[std::size_t(slot)] = true;
  }

  if (!Packs(block, trade)) {
    block.unpacked[slot] = std::move(trade);
  } else {
    if (unpacked != block.unpacked.end()) block.unpacked.erase(unpacked);
    // Times start with the date and hour: the block writes them once.
    constexpr std::size_t kPrefix = 10;
    if (block.timePrefix.empty() && trade.time.size() >= kPrefix)
      block.timePrefix.assign(trade.time.begin(), trade.time.begin() + kPrefix);
    const std::string& prefix = block.timePrefix;
    const bool prefixed = !prefix.empty() && StartsWith(trade.time, prefix);
    block.prefixed[std::size_t(slot)] = prefixed;
    s.at = static_cast<std::uint16_t>(block.text.size());
    const auto fields = FieldsOf(trade);
    for (std::size_t f = 0; f < kFields; ++f) {
      const std::size_t skip = f == 0 && prefixed ? prefix.size() : 0;
      s.length[f] = static_cast<std::uint8_t>(fields[f]->size() - skip);
      for (std::size_t k = skip; k < fields[f]->size(); ++k) block.text.push_back(static_cast<char>((*fields[f])[k]));
    }
  }
  // A whole page seldom changes again: give back what growing the text reserved.
  if (block.count == mvd::kTradesPerPage && block.text.capacity() > block.text.size() + 64) block.text.shrink_to_fit();
  return true;
}

int TradeTape::StorePage(const InstrumentKey& key, std::wstring_view text) {
  // Parse outside the lock; store in one go.
  std::vector<TradeRecord> trades;
  mvd::ParseTradeData(text, [&](TradeRecord&& r) { trades.push_back(std::move(r)); });
  if (trades.empty()) return 0;
  std::lock_guard lock(mu_);
  Tape& tape = tapes_[key];
  int stored = 0;
  for (TradeRecord& r : trades) stored += StoreLocked(tape, std::move(r));
  return stored;
}

bool TradeTape::Store(const InstrumentKey& key, TradeRecord trade) {
  if (trade.number <= 0) return false;
  std::lock_guard lock(mu_);
  return StoreLocked(tapes_[key], std::move(trade));
}

const TradeTape::Block* TradeTape::BlockLocked(const InstrumentKey& key, std::int32_t number) const {
  if (number <= 0) return nullptr;
  const auto tape = tapes_.find(key);
  if (tape == tapes_.end()) return nullptr;
  const auto block = tape->second.blocks.find(mvd::PageOfTrade(number));
  if (block == tape->second.blocks.end()) return nullptr;
  return block->second->held[std::size_t((number - 1) % mvd::kTradesPerPage)] ? block->second.get() : nullptr;
}

const TradeRecord* TradeTape::FindLocked(const InstrumentKey& key, std::int32_t number) const {
  const Block* block = BlockLocked(key, number);
  if (!block) return nullptr;
  const int slot = (number - 1) % mvd::kTradesPerPage;
  if (const auto unpacked = block->unpacked.find(slot); unpacked != block->unpacked.end()) return &unpacked->second;
  // Unpacked into one record kept for the purpose: assign() reuses its strings' room.
  const Slot& s = block->places[std::size_t(slot)];
  const char* at = block->text.data() + s.at;
  const auto fields = FieldsOf(scratch_);
  for (std::size_t f = 0; f < kFields; ++f) {
    // Widened in place: the record's strings keep their room from one read to the next.
    std::wstring& field = *fields[f];
    const std::size_t prefix = f == 0 && block->prefixed[std::size_t(slot)] ? block->timePrefix.size() : 0;
    field.resize(prefix + s.length[f]);
    for (std::size_t k = 0; k < prefix; ++k) field[k] = static_cast<unsigned char>(block->timePrefix[k]);
    for (std::size_t k = 0; k < s.length[f]; ++k) field[prefix + k] = static_cast<unsigned char>(at[k]);
    at += s.length[f];
  }
  scratch_.number = number;
  return &scratch_;
}

bool TradeTape::Get(const InstrumentKey& key, std::int32_t number, TradeRecord& out) const {
  return Read(key, number, [&](const TradeRecord& r) { out = r; });
}

bool TradeTape::Has(const InstrumentKey& key, std::int32_t number) const {
  std::lock_guard lock(mu_);
  return BlockLocked(key, number) != nullptr;
}

int TradeTape::CountInPage(const InstrumentKey& key, int page) const {
  if (page < 1) return 0;
  std::lock_guard lock(mu_);
  const auto tape = tapes_.find(key);
  if (tape == tapes_.end()) return 0;
  const auto block = tape->second.blocks.find(page);
  return block == tape->second.blocks.end() ? 0 : block->second->count;
}

int TradeTape::CountRange(const InstrumentKey& key, std::int32_t from, std::int32_t to) const {
  from = std::max<std::int32_t>(from, 1);
  if (to < from) return 0;
  std::lock_guard lock(mu_);
  const auto tape = tapes_.find(key);
  if (tape == tapes_.end()) return 0;
  int held = 0;
  for (int page = mvd::PageOfTrade(from), lastPage = mvd::PageOfTrade(to); page <= lastPage; ++page) {
    const auto block = tape->second.blocks.find(page);
    if (block == tape->second.blocks.end()) continue;
    const std::int64_t first = mvd::FirstTradeOfPage(page);
    const std::int64_t end = first + mvd::kTradesPerPage - 1;
    const std::int64_t lo = std::max<std::int64_t>(from, first);
    const std::int64_t hi = std::min<std::int64_t>(to, end);
    if (lo == first && hi == end) {
      held += block->second->count;
      continue;
    }
    for (std::int64_t n = lo; n <= hi; ++n) held += block->second->held[std::size_t(n - first)];
  }
  return held;
}

std::size_t TradeTape::Count(const InstrumentKey& key) const {
  std::lock_guard lock(mu_);
  const auto tape = tapes_.find(key);
  return tape == tapes_.end() ? 0 : tape->second.count;
}

std::uint64_t TradeTape::Version() const noexcept { return version_.load(std::memory_order_acquire); }
