#pragma once
// The instrument combo box's search over the terminal's instrument list.
// Plain C++ (no Qt) so that it can be measured on its own.
//
// A key matches an instrument in one of six groups, tried in this order:
// A name begins with the key, B name contains it, C symbol begins with it,
// D symbol contains it, E exchange code contains it, F instrument code
// contains it. Results come in the group order A, C, B, D, E, F. With a key of
// two or more characters, entries of A to D are ordered by match offset, then
// by the lowered text (byte order), then list order; with one character, and
// always in E and F, they keep list order. Matching lowers A to Z only.
//
// How: the index keeps lowered copies of the four texts (so the list itself
// may change or go away afterwards) and, per text, the instruments that
// contain each sequence of three characters. A key of two or more characters
// takes its candidates from those lists and checks each one; a key of one
// character scans the copies. The lists take a while at 500,000 instruments,
// so StartBuild builds them on a worker thread from the copies; until they are
// ready Search scans the copies, with the same results.
//
//   index.StartBuild(list);              // texts copied now, lists in the background
//   auto positions = index.Search("hol"); // list positions, best first
#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "hostview/Records.h"

class InstrumentSearchIndex {
 public:
  enum Group : int { kNameStart = 0, kNameContains, kSymbolStart, kSymbolContains, kExchange, kCode, kNone };

  InstrumentSearchIndex() = default;
  ~InstrumentSearchIndex();
  InstrumentSearchIndex(const InstrumentSearchIndex&) = delete;
  InstrumentSearchIndex& operator=(const InstrumentSearchIndex&) = delete;

  // Copies the texts of `list` without lookup lists: searches scan the copies.
  void Load(const std::vector<JInstrumentUnderlying>& list);
  // Copies the texts of `list` and builds the lookup lists, all on this thread.
  void Build(const std::vector<JInstrumentUnderlying>& list);
  // Copies the texts now and builds the lookup lists on a worker thread. Search
  // answers at once and uses the lists once they are ready.
  void StartBuild(const std::vector<JInstrumentUnderlying>& list);
  // Forgets the list; a build still running is stopped first.
  void Clear();
  // The texts are copied: Search answers.
  bool IsBuilt() const { return m_texts != nullptr; }
  // The lookup lists are in use (a finished background build is taken over).
  bool IsIndexed() const;
  // Blocks until a background build has finished and takes it over.
  void WaitIndexed();
  std::size_t Size() const;

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
  // One text of every instrument, lowered, with the characters present in each.
  struct Column {
    std::string text;                  // lowered texts, each followed by '\0'
    std::vector<std::uint32_t> start;  // start[i]: offset of entry i; start[n] = text.size()
    std::vector<std::uint64_t> mask;   // characters present in entry i (see CharBit)
    std::string_view Entry(std::size_t i) const {
      return std::string_view(text).substr(start[i], start[i + 1] - start[i] - 1);
    }
  };
  enum : int { kName, kSymbol, kExchangeCol, kCodeCol, kColumns };
  struct Texts {
    std::size_t count = 0;
    Column col[kColumns];
  };
  // The instruments containing each sequence of three characters of one text.
  // Characters are folded into 63 classes (letters and digits have their own),
  // so a list may hold a few instruments without the sequence: candidates are
  // always checked.
  struct Postings {
    std::vector<std::uint32_t> codes;   // sequence codes present, ascending
    std::vector<std::uint32_t> offset;  // list of codes[k] at bytes[offset[k] .. offset[k + 1])
    std::vector<std::uint32_t> count;   // instruments in the list of codes[k]
    std::vector<std::uint8_t> bytes;    // gaps between ascending positions, 7 bits a byte
  };
  // One text of every instrument in byte order (equal texts in list order):
  // candidates taken in this order need no sorting by text.
  struct Sorted {
    Column col;                      // the texts in that order (no masks)
    std::vector<std::uint32_t> pos;  // list position of each
  };
  struct Tables {
    // Name and symbol lists hold places in `sorted`, the others list positions.
    Postings post[kColumns];
    Sorted sorted[2];  // name, symbol
  };
  struct Job;
  // A match of groups A to D.
  struct Hit {
    std::uint32_t offset;
    int pos;
  };

  static std::shared_ptr<const Texts> CopyTexts(const std::vector<JInstrumentUnderlying>& list);
  static std::unique_ptr<Tables> BuildTables(const Texts& texts, const std::atomic<bool>* cancel);
  static bool BuildPostings(const Column& col, std::size_t n, Postings& out, const std::atomic<bool>* cancel);
  static void SortColumn(const Column& col, Sorted& out);
  static std::uint64_t MaskOf(std::string_view s);
  void TakeOverFinishedBuild() const;
  void StopBuild();

  std::vector<int> SearchOneChar(char c) const;
  // Calls f(position) for every instrument that may contain `key` (two or
  // more characters) in column `c`, in list order.
  template <class F>
  void ForEachCandidate(int c, std::string_view key, std::uint64_t keyMask, F&& f) const;
  void OrderHits(std::vector<Hit>& hits, int c) const;

  std::shared_ptr<const Texts> m_texts;
  mutable std::unique_ptr<Tables> m_tables;
  mutable std::shared_ptr<Job> m_job;
  mutable std::thread m_worker;
  // Scratch, kept between searches.
  mutable std::vector<int> m_one[kColumns + 2];
  mutable std::vector<Hit> m_hits[4], m_sortScratch;
  mutable std::vector<std::uint32_t> m_offsetCount;
  mutable std::vector<int> m_listed[2];
  mutable std::vector<std::uint64_t> m_claimed, m_union;
};
