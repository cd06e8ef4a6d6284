// "TRADEDATA" of the trade summary: a page text split into price lines
// (summary::ParsePage), then written through the summary stores as the view
// does on 410/412 and read back line by line. Line numbers stay on the page's
// lines or the totals line; no stored cell holds or shows a non-finite number.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>

#include "data/ProcessState.h"
#include "hostview/Records.h"
#include "hostview/Text.h"
#include "views/instrument/SummaryFeed.h"

namespace {

bool ShowsNonFinite(const std::wstring& text) {
  for (const wchar_t* bad : {L"nan", L"NAN", L"inf", L"INF"})
    if (text.find(bad) != std::wstring::npos) return true;
  return false;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size < 1) return 0;
  const int page = data[0] % 101;  // 0 and 100 are outside the pages
  const std::string narrow(reinterpret_cast<const char*>(data) + 1, size - 1);
  const std::wstring text = hv::Widen(narrow);

  const std::vector<summary::PageItem> items = summary::ParsePage(text, page);
  std::size_t parts = 1;
  for (wchar_t c : text) parts += c == L';';
  if (text.empty() ? !items.empty() : items.size() > parts) __builtin_trap();
  for (const summary::PageItem& item : items) {
    const bool totals = item.line == summary::kTotalsLine;
    if (!totals && (item.line < (page - 1) * summary::kLinesPerPage + 1 ||
                    item.line > (page - 1) * summary::kLinesPerPage + int(parts)))
      __builtin_trap();
    if (!totals && item.price.empty()) __builtin_trap();
  }

  // Through the stores, as a summary view on this instrument receives it.
  mvd::ResetProcessStateForTests();
  const InstrumentKey key{5, L"BN4"};
  summary::RegisterPage(key, page < 1 || page > 99 ? 1 : page, 1000);
  const FieldUpdate update{5, "BN4", "TRADEDATA", narrow, page, summary::kKind};
  summary::ApplyUpdate(update, 2000);
  const summary::Extent extent = summary::Recount(key);
  if (extent.filled < 0 || extent.filled > summary::kMaxLines) __builtin_trap();
  for (int line : {1, extent.filled, summary::kTotalsLine}) {
    SummaryLineRecord r;
    if (!summary::ReadLine(key, line, r)) continue;
    for (const QuoteCell& c : r.cells)
      if (!std::isfinite(c.value) || ShowsNonFinite(c.text)) __builtin_trap();
  }
  summary::ExpireMarks(4000);
  return 0;
}
