// The stores' decoding of field values: every layout (quote, depth, time and
// sales header and pages, trade summary header and lines) gets a run of
// updates by field name or index with any value text, at moving times, with
// the mark expiry in between. A numeric cell never holds or shows a
// non-finite number, marks stay 0..3, and a whole-number cell shows digits.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>

#include "data/MarketStores.h"
#include "data/QuoteStore.h"
#include "hostview/MessageTrace.h"
#include "hostview/Text.h"

namespace {

int g_decimals = 3;
int Decimals(const InstrumentKey&) { return g_decimals; }

bool ShowsNonFinite(const std::wstring& text) {
  for (const wchar_t* bad : {L"nan", L"NAN", L"inf", L"INF"})
    if (text.find(bad) != std::wstring::npos) return true;
  return false;
}

template <class L>
void Check(const CellRecord<L>& r) {
  for (std::size_t i = 0; i < L::kCells.size(); ++i) {
    const QuoteCell& c = r.cells[i];
    if (c.mark < kMarkNone || c.mark > kMarkDown) __builtin_trap();
    const CellKind kind = L::kCells[i].kind;
    if (kind == CellKind::Text) continue;
    if (!std::isfinite(c.value) || ShowsNonFinite(c.text)) __builtin_trap();
    if (kind == CellKind::Whole)
      for (std::size_t k = 0; k < c.text.size(); ++k)
        if (!((c.text[k] >= L'0' && c.text[k] <= L'9') || (k == 0 && c.text[k] == L'-'))) __builtin_trap();
  }
}

template <class L>
void Drive(hv::trace::Reader& in, const typename L::Key& key) {
  CellStore<L> store(&Decimals);
  std::uint32_t now = 1000;
  store.Get(key, now);
  for (int n = 0; n < 64 && !in.AtEnd(); ++n) {
    const std::uint8_t op = in.Byte();
    const std::wstring value = hv::Widen(in.Narrow());
    now += static_cast<std::uint32_t>(in.Byte()) * 16;
    if (op & 1) {
      const int index = static_cast<int>(in.Byte() % (L::kCells.size() + 2)) - 1;  // -1 and one past the end too
      store.Update(key, index, value, now);
    } else {
      store.Update(key, hv::Widen(in.Narrow()), value, now);
    }
    if (op & 2) store.ExpireMarks(now);
    if (op & 4) store.ClearChanged();
    Check(store.Get(key, now));
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  hv::trace::Reader in(std::string_view(reinterpret_cast<const char*>(data), size));
  const std::uint8_t which = in.Byte();
  g_decimals = static_cast<int>(in.Signed());
  const InstrumentKey key{5, L"BN4"};
  switch (which % 6) {
    case 0: Drive<QuoteLayout>(in, key); break;
    case 1: Drive<DepthLayout>(in, DepthKey{5, L"BN4", static_cast<std::int32_t>(in.Signed())}); break;
    case 2: Drive<SalesSummaryLayout>(in, key); break;
    case 3: Drive<SalesPageLayout>(in, PageKey{5, L"BN4", static_cast<std::int32_t>(in.Signed())}); break;
    case 4: Drive<SummaryHeaderLayout>(in, key); break;
    default: Drive<SummaryLineLayout>(in, LineKey{5, L"BN4", static_cast<std::int32_t>(in.Signed())}); break;
  }
  return 0;
}
