#include "views/instrument/SummaryFeed.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <set>

#include "data/NumberText.h"
#include "hostview/Text.h"

namespace summary {
namespace {

// Splits at `sep`, keeping empty parts ("a||b" has three).
std::vector<std::wstring_view> Split(std::wstring_view text, wchar_t sep) {
  std::vector<std::wstring_view> parts;
  std::size_t start = 0;
  for (;;) {
    const std::size_t at = text.find(sep, start);
    parts.push_back(text.substr(start, at == std::wstring_view::npos ? std::wstring_view::npos : at - start));
    if (at == std::wstring_view::npos) break;
    start = at + 1;
  }
  return parts;
}

bool HasPrice(const SummaryLineRecord& r) { return !r[SummaryLineLayout::Price].text.empty(); }

bool HeaderExists(const InstrumentKey& key) {
  SummaryHeaderRecord probe;
  return addon::SummaryPageFeed::Instance().Read(key, probe);
}

}  // namespace

LineRange::LineRange(const InstrumentKey& key, int first, int last)
    : m_first{key.ProductID, key.InstrumentCode, std::max(first, 1)}, m_end(std::max(m_first.Line, last + 1)) {}

LineRange::iterator LineRange::end() const { return iterator(LineKey{0, {}, m_end}); }

void RegisterPage(const InstrumentKey& key, int page, std::uint32_t now) {
  if (key.InstrumentCode.empty() || page < kFirstPage || page > kLastPage) return;
  addon::SummaryPageFeed::Instance().Register(key, page, now);
}

std::vector<PageItem> ParsePage(std::wstring_view text, int page) {
  std::vector<PageItem> items;
  if (text.empty()) return items;
  const auto parts = Split(text, L';');
  for (std::size_t i = 0; i < parts.size(); ++i) {
    const auto f = Split(parts[i], L'|');
    if (f.size() < 6) continue;
    PageItem item;
    const bool totals = f[0].empty() || f[0] == L"TOTALS:";
    item.line = totals ? kTotalsLine : (page - 1) * kLinesPerPage + 1 + int(i);
    // A page longer than its 40 lines reaches past the last line shown, and
    // far enough even onto the totals' number: no such line exists.
    if (!totals && item.line > kMaxLines) continue;
    if (!totals) item.price.assign(f[0]);
    item.trades.assign(f[1]);
    item.volume.assign(f[2]);
    item.bid.assign(f[3]);
    item.ask.assign(f[5]);
    items.push_back(std::move(item));
  }
  return items;
}

Applied ApplyUpdate(const FieldUpdate& update, std::uint32_t now) {
  const InstrumentKey key{update.productId, hv::Widen(update.instrumentCode)};
  if (key.InstrumentCode.empty() || !HeaderExists(key)) return Applied::Nothing;
  if (update.fieldName != "TRADEDATA") {
    SummaryHeaderStore& header = addon::SummaryPageFeed::Instance().GetStore();
    const int field = SummaryHeaderStore::FieldIndex(hv::Widen(update.fieldName));
    if (field < 0) return Applied::Nothing;  // "QUOTE_LIST" and anything unknown
    return header.Update(key, field, hv::Widen(update.value), now) ? Applied::Header : Applied::Nothing;
  }
  if (update.param < kFirstPage || update.param > kLastPage) return Applied::Nothing;
  const std::vector<PageItem> items = ParsePage(hv::Widen(update.value), update.param);
  if (items.empty()) return Applied::Nothing;
  SummaryLineStore& lines = addon::SummaryLineFeed::Instance().GetStore();
  // Lines get their record when their first value arrives; they are answers,
  // not requests, so they leave the store's pending list again.
  std::set<LineKey> created;
  for (const PageItem& item : items) {
    LineKey k{key.ProductID, key.InstrumentCode, item.line};
    SummaryLineRecord probe;
    if (lines.Peek(k, probe)) continue;
    lines.Get(k, now);
    created.insert(std::move(k));
  }
  if (!created.empty()) lines.TakePending(created);
  bool changed = false;
  for (const PageItem& item : items) {
    const LineKey k{key.ProductID, key.InstrumentCode, item.line};
    SummaryLineRecord current;
    lines.Peek(k, current);
    // Every page carries the totals, so most lines of a page arrive unchanged:
    // those keep their cells (and their marks) as they are.
    auto put = [&](int field, const std::wstring& value) {
      const QuoteCell& c = current[std::size_t(field)];
      double v = 0.0;
      if (c.filled && !c.text.empty() && mvd::ParseNumber(value, v) && std::abs(v - c.value) <= kValueTolerance) return;
      changed |= lines.Update(k, field, value, now);
    };
    if (item.line != kTotalsLine) put(SummaryLineLayout::Price, item.price);
    put(SummaryLineLayout::Tradable, item.trades);
    put(SummaryLineLayout::Vol, item.volume);
    put(SummaryLineLayout::Bid, item.bid);
    put(SummaryLineLayout::Ask, item.ask);
  }
  return changed ? Applied::Lines : Applied::Nothing;
}

int PageCount(const InstrumentKey& key) {
  if (key.InstrumentCode.empty()) return 0;
  QuoteCell c;
  if (!addon::SummaryPageFeed::Instance().ReadCell(key, SummaryHeaderLayout::PageCount, c)) return 0;
  if (c.text.empty() || !(c.value > 0.0)) return 0;
  return c.value >= double(kLastPage) ? kLastPage : int(c.value);
}

int LineLimit(const InstrumentKey& key) {
  const int pages = PageCount(key);
  return pages == 0 ? kMaxLines : std::min(kMaxLines, pages * kLinesPerPage);
}

Extent Recount(const InstrumentKey& key) {
  Extent extent;
  if (key.InstrumentCode.empty()) return extent;
  const addon::SummaryLineFeed& lines = addon::SummaryLineFeed::Instance();
  const auto run = lines.LeadingRun(LineRange(key, 1, LineLimit(key)), HasPrice);
  extent.filled = run.count;
  const std::uint64_t header = addon::SummaryPageFeed::Instance().NewestStamp(std::array{key});
  const std::uint64_t totals = lines.NewestStamp(std::array{LineKey{key.ProductID, key.InstrumentCode, kTotalsLine}});
  extent.newestStamp = header + std::max(run.newestStamp, totals);
  return extent;
}

bool ReadLine(const InstrumentKey& key, int line, SummaryLineRecord& out) {
  if (key.InstrumentCode.empty()) return false;
  return addon::SummaryLineFeed::Instance().Read(LineKey{key.ProductID, key.InstrumentCode, line}, out);
}

bool ReadCell(const InstrumentKey& key, int line, int field, QuoteCell& out) {
  if (key.InstrumentCode.empty()) return false;
  return addon::SummaryLineFeed::Instance().ReadCell(LineKey{key.ProductID, key.InstrumentCode, line}, field, out);
}

std::uint64_t NewestVersion(const InstrumentKey& key, int first, int last) {
  if (key.InstrumentCode.empty()) return 0;
  return addon::SummaryLineFeed::Instance().LeadingRun(LineRange(key, first, std::min(last, kMaxLines)), HasPrice).newestStamp;
}

void ExpireMarks(std::uint32_t now) {
  addon::SummaryPageFeed::Instance().ExpireMarks(now);
  addon::SummaryLineFeed::Instance().ExpireMarks(now);
}

}  // namespace summary
