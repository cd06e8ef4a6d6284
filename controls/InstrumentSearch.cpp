#include "controls/InstrumentSearch.h"

#include <algorithm>
#include <numeric>

std::string InstrumentSearchIndex::LowerAscii(std::string_view s) {
  std::string out(s);
  for (char& c : out)
    if (c >= 'A' && c <= 'Z') c = char(c - 'A' + 'a');
  return out;
}

void InstrumentSearchIndex::BuildColumn(Column& col, const std::vector<JInstrumentUnderlying>& list,
                                        std::string JInstrumentUnderlying::*field) {
  std::size_t total = 0;
  for (const auto& ins : list) total += (ins.*field).size() + 1;
  col.text.clear();
  col.text.reserve(total);
  col.start.clear();
  col.start.reserve(list.size() + 1);
  for (const auto& ins : list) {
    col.start.push_back(std::uint32_t(col.text.size()));
    const std::string& s = ins.*field;
    const std::size_t at = col.text.size();
    col.text.append(s);
    for (std::size_t i = at; i < col.text.size(); ++i) {
      char& c = col.text[i];
      if (c >= 'A' && c <= 'Z') c = char(c - 'A' + 'a');
      else if (c == '\0') c = '\x01';  // a stray NUL must not end the entry early
    }
    col.text.push_back('\0');
  }
  col.start.push_back(std::uint32_t(col.text.size()));
  col.mask.resize(list.size());
  for (std::size_t i = 0; i < list.size(); ++i) col.mask[i] = MaskOf(col.Entry(i));
}

namespace {
// One bit per letter, digit and blank; everything else shares bit 37. A key
// can only occur in an entry that has every bit of the key.
std::uint64_t CharBit(unsigned char c) {
  if (c >= 'a' && c <= 'z') return std::uint64_t{1} << (c - 'a');
  if (c >= '0' && c <= '9') return std::uint64_t{1} << (26 + c - '0');
  if (c == ' ') return std::uint64_t{1} << 36;
  return std::uint64_t{1} << 37;
}
std::uint64_t PrefixOf(std::string_view s) {
  std::uint64_t v = 0;
  for (std::size_t i = 0; i < 8; ++i) v = (v << 8) | (i < s.size() ? std::uint8_t(s[i]) : 0u);
  return v;
}
}  // namespace

std::uint64_t InstrumentSearchIndex::MaskOf(std::string_view s) {
  std::uint64_t m = 0;
  for (char c : s) m |= CharBit(static_cast<unsigned char>(c));
  return m;
}

void InstrumentSearchIndex::RankColumn(Column& col) {
  const std::size_t n = col.start.size() - 1;
  // Byte order by eight-byte chunks: sort by the first chunk, then sort every
  // run of equal chunks by the next one, until the texts end. Integer sorts
  // only, which keeps the first search of a long list short.
  const auto chunk = [&col](std::uint32_t i, std::size_t depth) {
    const std::string_view e = col.Entry(i);
    return depth * 8 < e.size() ? PrefixOf(e.substr(depth * 8)) : 0;
  };
  std::vector<std::pair<std::uint64_t, std::uint32_t>> keys(n);
  for (std::size_t i = 0; i < n; ++i) keys[i] = {chunk(std::uint32_t(i), 0), std::uint32_t(i)};
  struct Run { std::size_t a, b, depth; };
  std::vector<Run> todo{{0, n, 0}};
  std::vector<char> tieWithPrev(n, 0);  // keys[i] equals keys[i-1] as a whole text
  while (!todo.empty()) {
    const Run run = todo.back();
    todo.pop_back();
    if (run.depth > 0)
      for (std::size_t i = run.a; i < run.b; ++i) keys[i].first = chunk(keys[i].second, run.depth);
    std::sort(keys.begin() + std::ptrdiff_t(run.a), keys.begin() + std::ptrdiff_t(run.b));
    for (std::size_t x = run.a; x < run.b;) {
      std::size_t y = x + 1;
      while (y < run.b && keys[y].first == keys[x].first) ++y;
      if (y - x > 1) {
        // A chunk with a zero byte ends the text: the run holds equal texts.
        const std::uint64_t c = keys[x].first;
        bool ended = false;
        for (int k = 0; k < 8; ++k) ended |= ((c >> (8 * k)) & 0xFF) == 0;
        if (ended) for (std::size_t i = x + 1; i < y; ++i) tieWithPrev[i] = 1;
        else todo.push_back({x, y, run.depth + 1});
      }
      x = y;
    }
  }
  col.rank.assign(n, 0);
  std::uint32_t r = 0;
  for (std::size_t i = 0; i < n; ++i) {
    if (i > 0 && !tieWithPrev[i]) ++r;
    col.rank[keys[i].second] = r;
  }
}

void InstrumentSearchIndex::Build(const std::vector<JInstrumentUnderlying>& list) {
  m_count = list.size();
  BuildColumn(m_names, list, &JInstrumentUnderlying::instrumentName);
  BuildColumn(m_symbols, list, &JInstrumentUnderlying::symbol);
  BuildColumn(m_exchanges, list, &JInstrumentUnderlying::exchangeCode);
  RankColumn(m_names);
  RankColumn(m_symbols);
  m_built = true;
}

void InstrumentSearchIndex::Clear() {
  m_built = false;
  m_count = 0;
  m_names = m_symbols = m_exchanges = Column{};
}

void InstrumentSearchIndex::SortHits(std::vector<Hit>& hits) {
  std::sort(hits.begin(), hits.end(),
            [](const Hit& a, const Hit& b) { return a.order != b.order ? a.order < b.order : a.pos < b.pos; });
}

std::vector<int> InstrumentSearchIndex::Search(std::string_view key) const {
  std::vector<int> out;
  if (key.empty()) {
    out.resize(m_count);
    std::iota(out.begin(), out.end(), 0);
    return out;
  }
  if (!m_built || key.find('\0') != std::string_view::npos) return out;
  const std::uint64_t km = MaskOf(key);
  const std::size_t n = m_count;

  if (key.size() == 1) {
    // One character: the masks answer "contains", the first byte "begins
    // with"; list order throughout.
    const char c = key[0];
    const bool exact = (km & (std::uint64_t{1} << 37)) == 0;
    for (auto* v : {&m_nameStart1, &m_nameIn1, &m_symStart1, &m_symIn1, &m_exch}) v->clear();
    const auto contains = [&](const Column& col, std::size_t i) {
      if ((col.mask[i] & km) == 0) return false;
      return exact || col.Entry(i).find(c) != std::string_view::npos;
    };
    for (std::size_t i = 0; i < n; ++i) {
      if (contains(m_names, i)) (m_names.text[m_names.start[i]] == c ? m_nameStart1 : m_nameIn1).push_back(int(i));
      else if (contains(m_symbols, i)) (m_symbols.text[m_symbols.start[i]] == c ? m_symStart1 : m_symIn1).push_back(int(i));
      else if (contains(m_exchanges, i)) m_exch.push_back(int(i));
    }
    out.reserve(m_nameStart1.size() + m_nameIn1.size() + m_symStart1.size() + m_symIn1.size() + m_exch.size());
    for (auto* v : {&m_nameStart1, &m_symStart1, &m_nameIn1, &m_symIn1, &m_exch}) out.insert(out.end(), v->begin(), v->end());
    return out;
  }

  for (auto* v : {&m_nameStart, &m_nameIn, &m_symStart, &m_symIn}) v->clear();
  m_exch.clear();
  const auto find = [&](const Column& col, std::size_t i) -> std::size_t {
    if ((col.mask[i] & km) != km) return std::string_view::npos;
    return col.Entry(i).find(key);
  };
  for (std::size_t i = 0; i < n; ++i) {
    std::size_t at = find(m_names, i);
    if (at != std::string_view::npos) {
      (at == 0 ? m_nameStart : m_nameIn).push_back({std::uint64_t(at) << 32 | m_names.rank[i], int(i)});
      continue;
    }
    at = find(m_symbols, i);
    if (at != std::string_view::npos) {
      (at == 0 ? m_symStart : m_symIn).push_back({std::uint64_t(at) << 32 | m_symbols.rank[i], int(i)});
      continue;
    }
    if (find(m_exchanges, i) != std::string_view::npos) m_exch.push_back(int(i));
  }
  for (auto* v : {&m_nameStart, &m_symStart, &m_nameIn, &m_symIn}) SortHits(*v);
  out.reserve(m_nameStart.size() + m_nameIn.size() + m_symStart.size() + m_symIn.size() + m_exch.size());
  for (auto* v : {&m_nameStart, &m_symStart, &m_nameIn, &m_symIn})
    for (const Hit& h : *v) out.push_back(h.pos);
  out.insert(out.end(), m_exch.begin(), m_exch.end());
  return out;
}

InstrumentSearchIndex::Group InstrumentSearchIndex::Classify(const JInstrumentUnderlying& ins, std::string_view key) {
  if (key.empty()) return kNone;
  const std::string name = LowerAscii(ins.instrumentName);
  if (auto at = name.find(key); at != std::string::npos) return at == 0 ? kNameStart : kNameContains;
  const std::string symbol = LowerAscii(ins.symbol);
  if (auto at = symbol.find(key); at != std::string::npos) return at == 0 ? kSymbolStart : kSymbolContains;
  if (LowerAscii(ins.exchangeCode).find(key) != std::string::npos) return kExchange;
  return kNone;
}
