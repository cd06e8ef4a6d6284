#include "controls/InstrumentSearch.h"

#include <algorithm>
#include <array>
#include <limits>
#include <numeric>
#include <system_error>

// A build on the worker thread: it reads only the copied texts, and hands its
// tables over through `done`.
struct InstrumentSearchIndex::Job {
  std::shared_ptr<const Texts> texts;
  std::atomic<bool> cancel{false};
  std::atomic<bool> done{false};
  std::unique_ptr<Tables> result;  // written before `done`, read after it
};

namespace {

// One bit per letter, digit and blank; everything else shares bit 37. A key
// can only occur in an entry that has every bit of the key.
std::uint64_t CharBit(unsigned char c) {
  if (c >= 'a' && c <= 'z') return std::uint64_t{1} << (c - 'a');
  if (c >= '0' && c <= '9') return std::uint64_t{1} << (26 + c - '0');
  if (c == ' ') return std::uint64_t{1} << 36;
  return std::uint64_t{1} << 37;
}
constexpr std::uint64_t kOtherBit = std::uint64_t{1} << 37;

// Character classes of the three-character sequences: 0 marks the end of a
// text, letters, digits and the blank have a class each, other bytes share 26.
constexpr std::uint32_t kEndClass = 0;
constexpr std::uint32_t kCodeCount = 1u << 18;
std::uint32_t ClassOf(unsigned char c) {
  if (c >= 'a' && c <= 'z') return 1 + (c - 'a');
  if (c >= '0' && c <= '9') return 27 + (c - '0');
  if (c == ' ') return 37;
  return 38 + c % 26;
}
std::uint32_t CodeOf(std::uint32_t a, std::uint32_t b, std::uint32_t c) { return a << 12 | b << 6 | c; }

// Every sequence of an entry: each character with the next one and the one
// after (or the end), so that a key of two characters finds its sequences too.
template <class F>
void ForEachSequence(std::string_view e, F&& f) {
  if (e.size() < 2) return;
  std::uint32_t a = ClassOf(static_cast<unsigned char>(e[0]));
  std::uint32_t b = ClassOf(static_cast<unsigned char>(e[1]));
  for (std::size_t j = 0; j + 1 < e.size(); ++j) {
    const std::uint32_t c = j + 2 < e.size() ? ClassOf(static_cast<unsigned char>(e[j + 2])) : kEndClass;
    f(CodeOf(a, b, c));
    a = b;
    b = c;
  }
}

std::uint32_t GapBytes(std::uint32_t g) { return g < (1u << 7) ? 1 : g < (1u << 14) ? 2 : g < (1u << 21) ? 3 : g < (1u << 28) ? 4 : 5; }

std::uint64_t PrefixOf(std::string_view s) {
  std::uint64_t v = 0;
  for (std::size_t i = 0; i < 8; ++i) v = (v << 8) | (i < s.size() ? std::uint8_t(s[i]) : 0u);
  return v;
}

bool Cancelled(const std::atomic<bool>* cancel) { return cancel && cancel->load(std::memory_order_relaxed); }

}  // namespace

std::string InstrumentSearchIndex::LowerAscii(std::string_view s) {
  std::string out(s);
  for (char& c : out)
    if (c >= 'A' && c <= 'Z') c = char(c - 'A' + 'a');
  return out;
}

std::uint64_t InstrumentSearchIndex::MaskOf(std::string_view s) {
  std::uint64_t m = 0;
  for (char c : s) m |= CharBit(static_cast<unsigned char>(c));
  return m;
}

// ---- Building ---------------------------------------------------------------------

namespace {
// Per byte: the lowered byte (a stray NUL becomes 1, so that it cannot end an
// entry early) and its mask bit.
struct Fold {
  char lower;
  std::uint64_t bit;
};
const std::array<Fold, 256> kFold = [] {
  std::array<Fold, 256> t{};
  for (int c = 0; c < 256; ++c) {
    unsigned char l = static_cast<unsigned char>(c);
    if (l >= 'A' && l <= 'Z') l = static_cast<unsigned char>(l - 'A' + 'a');
    else if (l == 0) l = 1;
    t[std::size_t(c)] = {static_cast<char>(l), CharBit(l)};
  }
  return t;
}();
}  // namespace

// One pass over the list for all four texts: the records are large, reading
// them is most of the cost.
std::shared_ptr<const InstrumentSearchIndex::Texts> InstrumentSearchIndex::CopyTexts(
    const std::vector<JInstrumentUnderlying>& list) {
  static constexpr std::string JInstrumentUnderlying::*kFields[kColumns] = {
      &JInstrumentUnderlying::instrumentName, &JInstrumentUnderlying::symbol, &JInstrumentUnderlying::exchangeCode,
      &JInstrumentUnderlying::instrumentCode};
  auto texts = std::make_shared<Texts>();
  const std::size_t n = list.size();
  texts->count = n;
  for (int c = 0; c < kColumns; ++c) {
    Column& col = texts->col[c];
    col.text.reserve(n * (c == kName ? 24 : 8));
    col.start.reserve(n + 1);
    col.mask.resize(n);
  }
  for (std::size_t i = 0; i < n; ++i) {
    for (int c = 0; c < kColumns; ++c) {
      Column& col = texts->col[c];
      const std::string& s = list[i].*kFields[c];
      const std::size_t at = col.text.size();
      col.start.push_back(std::uint32_t(at));
      col.text.append(s);
      col.text.push_back('\0');
      std::uint64_t mask = 0;
      char* p = col.text.data() + at;
      for (std::size_t k = 0; k < s.size(); ++k) {
        const auto& f = kFold[static_cast<unsigned char>(p[k])];
        p[k] = f.lower;
        mask |= f.bit;
      }
      col.mask[i] = mask;
    }
  }
  for (Column& col : texts->col) col.start.push_back(std::uint32_t(col.text.size()));
  return texts;
}

// Two passes: count each sequence's instruments and list size, then write the
// lists. An instrument is listed once per sequence, in list order. The counts
// live in blocks of 64 sequences made on first use, so a short list costs
// little.
bool InstrumentSearchIndex::BuildPostings(const Column& col, std::size_t n, Postings& out,
                                          const std::atomic<bool>* cancel) {
  constexpr std::uint32_t kNone = std::numeric_limits<std::uint32_t>::max();
  struct Slot {
    std::uint32_t last = kNone;  // last instrument counted
    std::uint32_t count = 0;
    std::uint64_t size = 0;  // bytes of the list; in the second pass where its next gap goes
  };
  std::vector<std::int32_t> blockOf(kCodeCount / 64, -1);
  std::vector<std::array<Slot, 64>> blocks;
  const auto slot = [&](std::uint32_t code) -> Slot& {
    std::int32_t& b = blockOf[code >> 6];
    if (b < 0) {
      b = std::int32_t(blocks.size());
      blocks.emplace_back();
    }
    return blocks[std::size_t(b)][code & 63];
  };
  for (std::uint32_t i = 0; i < n; ++i) {
    if ((i & 4095) == 0 && Cancelled(cancel)) return false;
    ForEachSequence(col.Entry(i), [&](std::uint32_t code) {
      Slot& s = slot(code);
      if (s.last == i) return;
      s.size += GapBytes(i - s.last);  // the first gap is i + 1 (wraps from kNone)
      ++s.count;
      s.last = i;
    });
  }
  out = Postings{};
  std::uint64_t total = 0;
  for (std::uint32_t hi = 0; hi < kCodeCount / 64; ++hi) {
    if (blockOf[hi] < 0) continue;
    for (std::uint32_t lo = 0; lo < 64; ++lo) {
      Slot& s = blocks[std::size_t(blockOf[hi])][lo];
      if (!s.count) continue;
      if (total > std::numeric_limits<std::uint32_t>::max()) return false;
      out.codes.push_back(hi << 6 | lo);
      out.offset.push_back(std::uint32_t(total));
      out.count.push_back(s.count);
      const std::uint64_t bytes = s.size;
      s.size = total;
      s.last = kNone;
      total += bytes;
    }
  }
  if (total > std::numeric_limits<std::uint32_t>::max()) return false;
  out.offset.push_back(std::uint32_t(total));
  out.bytes.resize(total);
  for (std::uint32_t i = 0; i < n; ++i) {
    if ((i & 4095) == 0 && Cancelled(cancel)) return false;
    ForEachSequence(col.Entry(i), [&](std::uint32_t code) {
      Slot& s = slot(code);
      if (s.last == i) return;
      std::uint32_t g = i - s.last;
      std::uint8_t* p = out.bytes.data() + s.size;
      while (g >= 0x80) {
        *p++ = std::uint8_t(g | 0x80);
        g >>= 7;
      }
      *p++ = std::uint8_t(g);
      s.size = std::uint64_t(p - out.bytes.data());
      s.last = i;
    });
  }
  return true;
}

void InstrumentSearchIndex::SortColumn(const Column& col, Sorted& out) {
  const std::size_t n = col.start.size() - 1;
  // Byte order by eight-byte chunks: sort by the first chunk, then sort every
  // run of equal chunks by the next one, until the texts end. Integer sorts
  // only; equal texts keep list order (the position is the second key).
  const auto chunk = [&col](std::uint32_t i, std::size_t depth) {
    const std::string_view e = col.Entry(i);
    return depth * 8 < e.size() ? PrefixOf(e.substr(depth * 8)) : 0;
  };
  std::vector<std::pair<std::uint64_t, std::uint32_t>> keys(n);
  for (std::size_t i = 0; i < n; ++i) keys[i] = {chunk(std::uint32_t(i), 0), std::uint32_t(i)};
  struct Run { std::size_t a, b, depth; };
  std::vector<Run> todo{{0, n, 0}};
  while (!todo.empty()) {
    const Run run = todo.back();
    todo.pop_back();
    if (run.depth > 0)
      for (std::size_t i = run.a; i < run.b; ++i) keys[i].first = chunk(keys[i].second, run.depth);
    std::sort(keys.begin() + std::ptrdiff_t(run.a), keys.begin() + std::ptrdiff_t(run.b));
    for (std::size_t x = run.a; x < run.b;) {
      std::size_t y = x + 1;
      while (y < run.b && keys[y].first == keys[x].first) ++y;
      // A chunk with a zero byte ends the text: such a run holds equal texts.
      const std::uint64_t c = keys[x].first;
      bool ended = false;
      for (int k = 0; k < 8; ++k) ended |= ((c >> (8 * k)) & 0xFF) == 0;
      if (y - x > 1 && !ended) todo.push_back({x, y, run.depth + 1});
      x = y;
    }
  }
  out.pos.resize(n);
  out.col.text.clear();
  out.col.text.reserve(col.text.size());
  out.col.start.clear();
  out.col.start.reserve(n + 1);
  for (std::size_t k = 0; k < n; ++k) {
    out.pos[k] = keys[k].second;
    out.col.start.push_back(std::uint32_t(out.col.text.size()));
    out.col.text.append(col.Entry(keys[k].second));
    out.col.text.push_back('\0');
  }
  out.col.start.push_back(std::uint32_t(out.col.text.size()));
}

std::unique_ptr<InstrumentSearchIndex::Tables> InstrumentSearchIndex::BuildTables(const Texts& texts,
                                                                                 const std::atomic<bool>* cancel) {
  auto tables = std::make_unique<Tables>();
  for (int c = 0; c < kColumns; ++c) {
    const Column* col = &texts.col[c];
    if (c == kName || c == kSymbol) {
      SortColumn(*col, tables->sorted[c]);
      if (Cancelled(cancel)) return nullptr;
      col = &tables->sorted[c].col;
    }
    if (!BuildPostings(*col, texts.count, tables->post[c], cancel)) return nullptr;
  }
  return tables;
}

InstrumentSearchIndex::~InstrumentSearchIndex() { StopBuild(); }

void InstrumentSearchIndex::StopBuild() {
  if (!m_job) return;
  m_job->cancel.store(true, std::memory_order_relaxed);
  if (m_worker.joinable()) m_worker.join();
  m_job.reset();
}

void InstrumentSearchIndex::Load(const std::vector<JInstrumentUnderlying>& list) {
  StopBuild();
  m_tables.reset();
  m_texts = CopyTexts(list);
}

void InstrumentSearchIndex::Build(const std::vector<JInstrumentUnderlying>& list) {
  StopBuild();
  m_tables.reset();
  m_texts = CopyTexts(list);
  m_tables = BuildTables(*m_texts, nullptr);
}

void InstrumentSearchIndex::StartBuild(const std::vector<JInstrumentUnderlying>& list) {
  StopBuild();
  m_tables.reset();
  m_texts = CopyTexts(list);
  auto job = std::make_shared<Job>();
  job->texts = m_texts;
  try {
    m_worker = std::thread([job] {
      try {
        job->result = BuildTables(*job->texts, &job->cancel);
      } catch (...) {
        job->result.reset();  // out of memory: searches keep scanning the texts
      }
      job->done.store(true, std::memory_order_release);
    });
    m_job = std::move(job);
  } catch (const std::system_error&) {
    m_tables = BuildTables(*m_texts, nullptr);  // no thread to be had: build here
  }
}

void InstrumentSearchIndex::Clear() {
  StopBuild();
  m_tables.reset();
  m_texts.reset();
}

void InstrumentSearchIndex::TakeOverFinishedBuild() const {
  if (!m_job || !m_job->done.load(std::memory_order_acquire)) return;
  m_worker.join();
  m_tables = std::move(m_job->result);
  m_job.reset();
}

bool InstrumentSearchIndex::IsIndexed() const {
  TakeOverFinishedBuild();
  return m_tables != nullptr;
}

void InstrumentSearchIndex::WaitIndexed() {
  if (!m_job) return;
  m_worker.join();
  m_tables = std::move(m_job->result);
  m_job.reset();
}

std::size_t InstrumentSearchIndex::Size() const { return m_texts ? m_texts->count : 0; }

// ---- Searching ---------------------------------------------------------------------

std::vector<int> InstrumentSearchIndex::SearchOneChar(char c) const {
  // The masks answer "contains", the first byte "begins with"; list order throughout.
  const std::uint64_t km = CharBit(static_cast<unsigned char>(c));
  const bool exact = km != kOtherBit;
  const Texts& t = *m_texts;
  const Column& name = t.col[kName];
  const Column& symbol = t.col[kSymbol];
  // m_one: name start, symbol start, name contains, symbol contains, exchange, code.
  for (auto& v : m_one) v.clear();
  const auto contains = [&](const Column& col, std::size_t i) {
    if ((col.mask[i] & km) == 0) return false;
    return exact || col.Entry(i).find(c) != std::string_view::npos;
  };
  for (std::size_t i = 0; i < t.count; ++i) {
    if (contains(name, i)) m_one[name.text[name.start[i]] == c ? 0 : 2].push_back(int(i));
    else if (contains(symbol, i)) m_one[symbol.text[symbol.start[i]] == c ? 1 : 3].push_back(int(i));
    else if (contains(t.col[kExchangeCol], i)) m_one[4].push_back(int(i));
    else if (contains(t.col[kCodeCol], i)) m_one[5].push_back(int(i));
  }
  std::vector<int> out;
  std::size_t total = 0;
  for (const auto& v : m_one) total += v.size();
  out.reserve(total);
  for (const auto& v : m_one) out.insert(out.end(), v.begin(), v.end());
  return out;
}

template <class F>
void InstrumentSearchIndex::ForEachCandidate(int c, std::string_view key, std::uint64_t keyMask, F&& f) const {
  const Column& col = m_texts->col[c];
  const std::size_t n = m_texts->count;
  if (!m_tables) {
    for (std::size_t i = 0; i < n; ++i)
      if ((col.mask[i] & keyMask) == keyMask) f(std::uint32_t(i));
    return;
  }
  const Postings& p = m_tables->post[c];
  const auto decode = [&p](std::size_t k, auto&& each) {
    const std::uint8_t* b = p.bytes.data() + p.offset[k];
    const std::uint8_t* e = p.bytes.data() + p.offset[k + 1];
    std::uint32_t pos = std::numeric_limits<std::uint32_t>::max();
    while (b < e) {
      std::uint32_t g = 0;
      int shift = 0;
      std::uint8_t byte;
      do {
        byte = *b++;
        g |= std::uint32_t(byte & 0x7F) << shift;
        shift += 7;
      } while (byte & 0x80);
      pos += g;
      each(pos);
    }
  };
  const auto cls = [&key](std::size_t j) { return ClassOf(static_cast<unsigned char>(key[j])); };
  if (key.size() == 2) {
    // Every sequence that starts with the two characters, whatever follows.
    const std::uint32_t lo = CodeOf(cls(0), cls(1), 0);
    const auto first = std::lower_bound(p.codes.begin(), p.codes.end(), lo);
    const auto last = std::lower_bound(first, p.codes.end(), lo + 64);
    if (first == last) return;
    if (last - first == 1) {
      decode(std::size_t(first - p.codes.begin()), f);
      return;
    }
    m_union.assign((n + 63) / 64, 0);
    for (auto it = first; it != last; ++it)
      decode(std::size_t(it - p.codes.begin()), [this](std::uint32_t i) { m_union[i >> 6] |= std::uint64_t{1} << (i & 63); });
    for (std::size_t w = 0; w < m_union.size(); ++w) {
      for (std::uint64_t bits = m_union[w]; bits; bits &= bits - 1)
        f(std::uint32_t(w * 64 + std::size_t(__builtin_ctzll(bits))));
    }
    return;
  }
  // The key's rarest sequence; every instrument containing the key is in its list.
  std::size_t best = 0;
  std::uint32_t bestCount = std::numeric_limits<std::uint32_t>::max();
  for (std::size_t j = 0; j + 2 < key.size(); ++j) {
    const std::uint32_t code = CodeOf(cls(j), cls(j + 1), cls(j + 2));
    const auto it = std::lower_bound(p.codes.begin(), p.codes.end(), code);
    if (it == p.codes.end() || *it != code) return;
    const std::size_t k = std::size_t(it - p.codes.begin());
    if (p.count[k] < bestCount) {
      bestCount = p.count[k];
      best = k;
    }
  }
  decode(best, f);
}

// With the index the hits come in text order (equal texts in list order), so
// a stable count by offset finishes the order; without it they come in list
// order and are sorted.
void InstrumentSearchIndex::OrderHits(std::vector<Hit>& hits, int c) const {
  if (hits.size() < 2) return;
  if (m_tables) {
    std::uint32_t most = 0;
    for (const Hit& h : hits) most = std::max(most, h.offset);
    if (most == hits.front().offset) {
      bool same = true;
      for (const Hit& h : hits) same &= h.offset == most;
      if (same) return;
    }
    m_offsetCount.assign(std::size_t(most) + 2, 0);
    for (const Hit& h : hits) ++m_offsetCount[h.offset + 1];
    for (std::size_t k = 1; k < m_offsetCount.size(); ++k) m_offsetCount[k] += m_offsetCount[k - 1];
    m_sortScratch.resize(hits.size());
    for (const Hit& h : hits) m_sortScratch[m_offsetCount[h.offset]++] = h;
    hits.swap(m_sortScratch);
    return;
  }
  const Column& col = m_texts->col[c];
  std::sort(hits.begin(), hits.end(), [&col](const Hit& a, const Hit& b) {
    if (a.offset != b.offset) return a.offset < b.offset;
    const int t = col.Entry(std::size_t(a.pos)).compare(col.Entry(std::size_t(b.pos)));
    return t != 0 ? t < 0 : a.pos < b.pos;
  });
}

std::vector<int> InstrumentSearchIndex::Search(std::string_view key) const {
  std::vector<int> out;
  const std::size_t n = Size();
  if (key.empty()) {
    out.resize(n);
    std::iota(out.begin(), out.end(), 0);
    return out;
  }
  if (!m_texts || key.find('\0') != std::string_view::npos) return out;
  TakeOverFinishedBuild();
  if (key.size() == 1) return SearchOneChar(key[0]);

  const std::uint64_t km = MaskOf(key);
  m_claimed.assign((n + 63) / 64, 0);
  const auto claimed = [this](std::uint32_t i) { return (m_claimed[i >> 6] >> (i & 63)) & 1; };
  const auto claim = [this](std::uint32_t i) { m_claimed[i >> 6] |= std::uint64_t{1} << (i & 63); };
  for (auto& v : m_hits) v.clear();
  for (auto& v : m_listed) v.clear();

  // Name, then symbol (m_hits: name start, symbol start, name contains,
  // symbol contains).
  for (int c : {int(kName), int(kSymbol)}) {
    const Sorted* sorted = m_tables ? &m_tables->sorted[c] : nullptr;
    const Column& col = sorted ? sorted->col : m_texts->col[c];
    auto& starts = m_hits[c == kName ? 0 : 1];
    auto& inside = m_hits[c == kName ? 2 : 3];
    ForEachCandidate(c, key, km, [&](std::uint32_t k) {
      const std::uint32_t i = sorted ? sorted->pos[k] : k;
      if (c != kName && claimed(i)) return;
      const std::size_t at = col.Entry(k).find(key);
      if (at == std::string_view::npos) return;
      claim(i);
      (at == 0 ? starts : inside).push_back(Hit{std::uint32_t(at), int(i)});
    });
  }
  // Exchange code, then instrument code: list order.
  for (int c : {int(kExchangeCol), int(kCodeCol)}) {
    const Column& col = m_texts->col[c];
    auto& listed = m_listed[c == kExchangeCol ? 0 : 1];
    ForEachCandidate(c, key, km, [&](std::uint32_t i) {
      if (claimed(i) || col.Entry(i).find(key) == std::string_view::npos) return;
      claim(i);
      listed.push_back(int(i));
    });
  }
  OrderHits(m_hits[0], kName);
  OrderHits(m_hits[1], kSymbol);
  OrderHits(m_hits[2], kName);
  OrderHits(m_hits[3], kSymbol);
  std::size_t total = m_listed[0].size() + m_listed[1].size();
  for (const auto& v : m_hits) total += v.size();
  out.reserve(total);
  for (const auto& v : m_hits)
    for (const Hit& h : v) out.push_back(h.pos);
  for (const auto& v : m_listed) out.insert(out.end(), v.begin(), v.end());
  return out;
}

InstrumentSearchIndex::Group InstrumentSearchIndex::Classify(const JInstrumentUnderlying& ins, std::string_view key) {
  if (key.empty()) return kNone;
  const std::string name = LowerAscii(ins.instrumentName);
  if (auto at = name.find(key); at != std::string::npos) return at == 0 ? kNameStart : kNameContains;
  const std::string symbol = LowerAscii(ins.symbol);
  if (auto at = symbol.find(key); at != std::string::npos) return at == 0 ? kSymbolStart : kSymbolContains;
  if (LowerAscii(ins.exchangeCode).find(key) != std::string::npos) return kExchange;
  if (LowerAscii(ins.instrumentCode).find(key) != std::string::npos) return kCode;
  return kNone;
}
