#include "views/instrument/SummaryFeed.h"

#include <algorithm>
#include <cmath>
#include <set>

#include "data/NumberText.h"
#include "hostview/Text.h"

namespace summary {
namespace {

std::vector<PendingPage>& Queue() {
  static std::vector<PendingPage> queue;
  return queue;
}

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

bool HasText(const SummaryLineRecord* r) { return r && !(*r)[SummaryLineLayout::Price].text.empty(); }

}  // namespace

void RegisterPage(const InstrumentKey& key, int page, std::uint32_t now) {
  if (key.InstrumentCode.empty() || page < kFirstPage || page > kLastPage) return;
  SummaryHeaderStore& header = SummaryHeaderStore::Instance();
  SummaryHeaderRecord probe;
  if (!header.Peek(key, probe)) {
    header.Get(key, now);
    // Requests leave through this queue, not through the store's own list.
    header.TakePending(std::set<InstrumentKey>{key});
  }
  PendingPage entry{key, page};
  auto& queue = Queue();
  if (std::find(queue.begin(), queue.end(), entry) == queue.end()) queue.push_back(std::move(entry));
}

std::vector<PendingPage> TakePending() { return std::exchange(Queue(), {}); }

std::size_t PendingCount() { return Queue().size(); }

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
  if (key.InstrumentCode.empty()) return Applied::Nothing;
  if (update.fieldName != "TRADEDATA") {
    SummaryHeaderStore& header = SummaryHeaderStore::Instance();
    const int field = SummaryHeaderStore::FieldIndex(hv::Widen(update.fieldName));
    if (field < 0) return Applied::Nothing;  // "QUOTE_LIST" and anything unknown
    SummaryHeaderRecord probe;
    if (!header.Peek(key, probe)) {
      header.Get(key, now);
      header.TakePending(std::set<InstrumentKey>{key});
    }
    return header.Update(key, field, hv::Widen(update.value), now) ? Applied::Header : Applied::Nothing;
  }
  if (update.param < kFirstPage || update.param > kLastPage) return Applied::Nothing;
  const std::vector<PageItem> items = ParsePage(hv::Widen(update.value), update.param);
  if (items.empty()) return Applied::Nothing;
  SummaryLineStore& lines = SummaryLineStore::Instance();
  // Lines get their record when their first value arrives.
  std::set<LineKey> created;
  for (const PageItem& item : items) {
    LineKey k{key.ProductID, key.InstrumentCode, item.line};
    const bool known = lines.Read([&](const SummaryLineStore::Reader& r) { return r.Find(k) != nullptr; });
    if (known) continue;
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
  return SummaryHeaderStore::Instance().Read([&](const SummaryHeaderStore::Reader& r) {
    const SummaryHeaderRecord* h = r.Find(key);
    if (!h) return 0;
    const QuoteCell& c = (*h)[SummaryHeaderLayout::PageCount];
    if (c.text.empty() || !(c.value > 0.0)) return 0;
    return c.value >= double(kLastPage) ? kLastPage : int(c.value);
  });
}

int LineLimit(const InstrumentKey& key) {
  const int pages = PageCount(key);
  return pages == 0 ? kMaxLines : std::min(kMaxLines, pages * kLinesPerPage);
}

Extent Recount(const InstrumentKey& key) {
  Extent extent;
  if (key.InstrumentCode.empty()) return extent;
  const int limit = LineLimit(key);
  std::uint64_t headerVersion = 0;
  SummaryHeaderStore::Instance().Read([&](const SummaryHeaderStore::Reader& r) {
    if (const SummaryHeaderRecord* h = r.Find(key)) headerVersion = h->version;
  });
  std::uint64_t linesVersion = 0;
  SummaryLineStore::Instance().Read([&](const SummaryLineStore::Reader& r) {
    LineKey k{key.ProductID, key.InstrumentCode, 0};
    for (int line = 1; line <= limit; ++line) {
      k.Line = line;
      const SummaryLineRecord* rec = r.Find(k);
      if (!HasText(rec)) break;
      extent.filled = line;
      linesVersion = std::max(linesVersion, rec->version);
    }
    k.Line = kTotalsLine;
    if (const SummaryLineRecord* totals = r.Find(k)) linesVersion = std::max(linesVersion, totals->version);
  });
  // The two stores count their versions apart; their sum grows whenever
  // either side changes.
  extent.newestStamp = headerVersion + linesVersion;
  return extent;
}

bool ReadLine(const InstrumentKey& key, int line, SummaryLineRecord& out) {
  if (key.InstrumentCode.empty()) return false;
  return SummaryLineStore::Instance().Peek(LineKey{key.ProductID, key.InstrumentCode, line}, out);
}

bool ReadCell(const InstrumentKey& key, int line, int field, QuoteCell& out) {
  if (key.InstrumentCode.empty() || field < 0 || field >= int(SummaryLineRecord::kCellCount)) return false;
  return SummaryLineStore::Instance().Read([&](const SummaryLineStore::Reader& r) {
    const SummaryLineRecord* rec = r.Find(LineKey{key.ProductID, key.InstrumentCode, line});
    if (!rec) return false;
    out = (*rec)[std::size_t(field)];
    return true;
  });
}

std::uint64_t NewestVersion(const InstrumentKey& key, int first, int last) {
  std::uint64_t newest = 0;
  if (key.InstrumentCode.empty()) return newest;
  first = std::max(first, 1);
  last = std::min(last, kMaxLines);
  SummaryLineStore::Instance().Read([&](const SummaryLineStore::Reader& r) {
    LineKey k{key.ProductID, key.InstrumentCode, 0};
    for (int line = first; line <= last; ++line) {
      k.Line = line;
      const SummaryLineRecord* rec = r.Find(k);
      if (!HasText(rec)) break;
      newest = std::max(newest, rec->version);
    }
  });
  return newest;
}

}  // namespace summary
