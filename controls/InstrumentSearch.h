#pragma once
// The instrument combo box's search over the terminal's instrument list.
// Plain C++ (no Qt) so that it can be measured on its own.
//
// A key matches an instrument in one of five groups, tried in this order:
// A name begins with the key, B name contains it, C symbol begins with it,
// D symbol contains it, E exchange code contains it. Results come in the group
// order A, C, B, D, E. With a key of two or more characters, entries of A to D
// are ordered by match offset, then by the lowered text (byte order); with one
// character, and always in E, they keep list order. Matching lowers A to Z only.
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "hostview/Records.h"

class InstrumentSearchIndex {
 public:
  enum Group : int { kNameStart = 0, kNameContains, kSymbolStart, kSymbolContains, kExchange, kNone };

  // Indexes `list` (not owned; it must stay unchanged while the index is used).
  void Build(const std::vector<JInstrumentUnderlying>& list);
  void Clear();
  bool IsBuilt() const { return m_built; }
  std::size_t Size() const { return m_count; }

  // List positions matching `key` (already lowered), best first. An empty key
  // gives every position in list order. Keeps scratch buffers between calls:
  // one thread at a time.
  std::vector<int> Search(std::string_view key) const;
  // The group an instrument falls in for `key` (kNone: no match); a check
  // of single entries against the rules above.
  static Group Classify(const JInstrumentUnderlying& ins, std::string_view key);

  // Letters A to Z lowered, every other byte kept.
  static std::string LowerAscii(std::string_view s);

 private:
  struct Column {
    std::string text;                 // lowered texts, each followed by '\0'
    std::vector<std::uint32_t> start;  // start[i]: offset of entry i; start[n] = text.size()
    std::vector<std::uint64_t> mask;   // characters present in entry i (see CharBit)
    std::vector<std::uint32_t> rank;   // entry i's place in byte order (equal texts, equal rank)
    std::string_view Entry(std::size_t i) const {
      return std::string_view(text).substr(start[i], start[i + 1] - start[i] - 1);
    }
  };
  // A match to be ordered: by offset, then the entry's rank, then the list position.
  struct Hit {
    std::uint64_t order;  // offset << 32 | rank
    int pos;
  };
  static void SortHits(std::vector<Hit>& hits);
  static void RankColumn(Column& col);
  static std::uint64_t MaskOf(std::string_view s);
  static void BuildColumn(Column& col, const std::vector<JInstrumentUnderlying>& list,
                          std::string JInstrumentUnderlying::*field);
  mutable std::vector<int> m_nameStart1, m_nameIn1, m_symStart1, m_symIn1, m_exch;
  mutable std::vector<Hit> m_nameStart, m_nameIn, m_symStart, m_symIn;
  bool m_built = false;
  std::size_t m_count = 0;
  Column m_names, m_symbols, m_exchanges;
};
