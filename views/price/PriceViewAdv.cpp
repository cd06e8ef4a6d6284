#include "views/price/PriceViewAdv.h"

#include "addon/RegisteredMessages.h"

ADDON_IMPLEMENT_VIEW(CPriceViewAdv)

const addon::ViewClassInfo& CPriceViewAdv::Info() {
  static const addon::ViewClassInfo info{
      .className = "CPriceViewAdv",
      .titleEntry = 0,  // the language table has no title entry for this view
      .defaultTitle = L"Price View",
      .firstSettings = {{hm::SystemParameter, "ADVFT"},
                        {hm::SystemParameter, "MAXWL"},
                        {hm::SystemParameter, "MAXWT"},
                        {hm::NoticeParameter, "OLDWL"},
                        {hm::NoticeParameter, "WLNOT"},
                        {hm::SystemParameter, "MKTEX"}},
      .firstStores = {addon::RefStore::Products, addon::RefStore::Exchanges, addon::RefStore::Instruments,
                      addon::RefStore::UserWatchlists, addon::RefStore::KeldoWatchlists,
                      addon::RefStore::Top30Watchlists},
      // Refused on the user and KELDO pages; its own rows travel as "price view".
      .dropSources = {"COrderStatusViewNew", "COpenPositionView", "CMarketDepthAdv", "CTimeAndSalesAdv",
                      "CTradeSummaryAdv", addon::kPriceViewSource},
      .descriptor = &classCPriceViewAdv,
  };
  return info;
}

CPriceViewAdv::CPriceViewAdv() : CAddonView(Info()) {}
CPriceViewAdv::~CPriceViewAdv() = default;

int CPriceViewAdv::OnCreate() {
  m_priceViews.Join(this);
  WatchTradeKeys(this);
  return 0;
}

void CPriceViewAdv::OnActivate() {
  PrepareBasicData();
  SendViewSize(300, 150);
  m_activeViews.Join(this);
  ApplyLanguage();
  SetActiveFlag(true);
}

void CPriceViewAdv::OnDeactivate() {
  PrepareBasicData();
  m_activeViews.Leave();
  SetActiveFlag(false);
}

bool CPriceViewAdv::EnableDropIn(const char* sourceClassName) {
  if (m_listKind != 0 && m_listKind != 2) return false;
  return !addon::IsDropSource(ClassInfo(), sourceClassName ? sourceClassName : "");
}

LRESULT CPriceViewAdv::OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) {
  const auto& msg = addon::Msg();
  const auto* linkText = FromLParam<const std::wstring>(LPARAM(wParam));
  if (message == msg.wlOpenTrade) return OpenTradeTicket(linkText, lParam);
  if (const auto className = addon::OpenedClassOf(message)) {
    Actions().OpenViewOn(*className, linkText);
    return 0;
  }
  if (message == msg.refreshTradeLink) Actions().RefreshTradeLink(linkText);
  return 0;
}

std::optional<std::wstring> CPriceViewAdv::ShortcutTicket(addon::TradeSide side) {
  const auto row = SelectedTradeRow();
  if (!row) return std::nullopt;
  addon::LinkTextBuilder text = addon::ShortcutTicketText(row->instrumentCode, row->productId, side);
  if (row->price > 0) text.Add(addon::linkkey::kTradePrice, row->priceText);
  return text.Wide();
}
