#include "views/instrument/SalesFeed.h"

#include "addon/Channel.h"
#include "hostview/Text.h"
#include "views/instrument/SalesPaging.h"

namespace sales {

void RegisterHeader(const InstrumentKey& key, std::uint32_t now) {
  SalesHeaderFeed::Instance().Register(key, addon::NoParams{}, now);
}

void RegisterPage(const InstrumentKey& key, std::int32_t page, std::uint32_t now) {
  if (!IsPage(page)) return;
  SalesPageFeed::Instance().Register(key, page, now);
}

void SendPending(const addon::FeedbackSender& send) {
  for (const auto& pending : SalesHeaderFeed::Instance().TakePending()) {
    const addon::FieldTarget target{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)};
    addon::SendRequestBatch(send, target, addon::fields::kSalesHeader, addon::BatchTag{kKind, kHeaderParam});
  }
  for (const auto& pending : SalesPageFeed::Instance().TakePending()) {
    const addon::FieldTarget target{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)};
    addon::SendRequestBatch(send, target, {"TRADEDATA"}, addon::BatchTag{kKind, pending.params});
  }
}

void ClearPending() {
  SalesHeaderFeed::Instance().Reset();
  SalesPageFeed::Instance().Reset();
}

bool ReadHeader(const InstrumentKey& key, SalesSummaryRecord& out) { return SalesHeaderFeed::Instance().Read(key, out); }

Applied ApplyUpdate(const FieldUpdate& u, std::uint32_t now) {
  if (u.kind != kKind) return Applied::Ignored;
  if (IsHeader(u.param)) {
    SalesSummaryStore::Instance().Update(InstrumentKey{u.productId, hv::Widen(u.instrumentCode)},
                                         hv::Widen(u.fieldName), hv::Widen(u.value), now);
    return Applied::Header;
  }
  if (!IsPage(u.param)) return Applied::Ignored;
  const std::wstring code = hv::Widen(u.instrumentCode);
  const std::wstring field = hv::Widen(u.fieldName);
  const std::wstring value = hv::Widen(u.value);
  SalesPageStore::Instance().Update(PageKey{u.productId, code, u.param}, field, value, now);
  // Trades are kept whether or not the page had a record: nothing received is lost.
  if (field == L"TRADEDATA") {
    const InstrumentKey key{u.productId, code};
    TradeTape::Instance().StorePage(key, value);
    if (u.param != kLivePage) PageBatches::Instance().NoteAnswer(key, u.param);
  }
  return Applied::Page;
}

}  // namespace sales
