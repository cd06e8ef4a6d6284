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
}

void InstrumentSearchIndex::Build(const std::vector<JInstrumentUnderlying>& list) {
  m_count = list.size();
  BuildColumn(m_names, list, &JInstrumentUnderlying::instrumentName);
  BuildColumn(m_symbols, list, &JInstrumentUnderlying::symbol);
  BuildColumn(m_exchanges, list, &JInstrumentUnderlying::exchangeCode);
  m_built = true;
}

void InstrumentSearchIndex::Clear() {
  m_built = false;
  m_count = 0;
  m_names = m_symbols = m_exchanges = Column{};
}

template <class F>
void InstrumentSearchIndex::Scan(const Column& col, std::string_view key, const std::vector<char>* skip,
                                 F&& hit) const {
  const std::string_view text(col.text);
  const auto& start = col.start;
  std::size_t at = 0;
  std::size_t idx = 0;
  // One search over all entries at once: entries end in '\0', which no key
  // contains, so a match never runs across two entries.
  while ((at = text.find(key, at)) != std::string_view::npos) {
    // The entry holding `at`: usually close by, so walk before bisecting.
    if (start[idx + 1] <= at) {
      std::size_t steps = 0;
      while (start[idx + 1] <= at && ++steps < 8) ++idx;
      if (start[idx + 1] <= at)
        idx = std::size_t(std::upper_bound(start.begin() + std::ptrdiff_t(idx), start.end(), std::uint32_t(at)) -
                          start.begin()) - 1;
    }
    if (!skip || !(*skip)[idx]) hit(int(idx), std::uint32_t(at - start[idx]));
    at = start[idx + 1];
  }
}

std::vector<int> InstrumentSearchIndex::Search(std::string_view key) const {
  std::vector<int> out;
  if (key.empty()) {
    out.resize(m_count);
    std::iota(out.begin(), out.end(), 0);
    return out;
  }
  if (!m_built || key.find('\0') != std::string_view::npos) return out;

  std::vector<Hit> nameStart, nameIn, symStart, symIn;
  std::vector<int> exch;
  std::vector<char> matched(m_count, 0);
  Scan(m_names, key, nullptr, [&](int pos, std::uint32_t off) {
    (off == 0 ? nameStart : nameIn).push_back({pos, off});
    matched[std::size_t(pos)] = 1;
  });
  Scan(m_symbols, key, &matched, [&](int pos, std::uint32_t off) {
    (off == 0 ? symStart : symIn).push_back({pos, off});
    matched[std::size_t(pos)] = 1;
  });
  Scan(m_exchanges, key, &matched, [&](int pos, std::uint32_t) { exch.push_back(pos); });

  if (key.size() > 1) {
    const auto order = [](const Column& col) {
      return [&col](const Hit& a, const Hit& b) {
        if (a.offset != b.offset) return a.offset < b.offset;
        return col.Entry(std::size_t(a.pos)) < col.Entry(std::size_t(b.pos));
      };
    };
    // Group A all start at 0: by name; stable so equal names keep list order.
    std::stable_sort(nameStart.begin(), nameStart.end(), order(m_names));
    std::stable_sort(nameIn.begin(), nameIn.end(), order(m_names));
    std::stable_sort(symStart.begin(), symStart.end(), order(m_symbols));
    std::stable_sort(symIn.begin(), symIn.end(), order(m_symbols));
  }
  out.reserve(nameStart.size() + nameIn.size() + symStart.size() + symIn.size() + exch.size());
  for (const auto* g : {&nameStart, &symStart, &nameIn, &symIn})
    for (const Hit& h : *g) out.push_back(h.pos);
  out.insert(out.end(), exch.begin(), exch.end());
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
