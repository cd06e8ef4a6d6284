#include "addon/InstrumentActions.h"

#include "addon/AddonView.h"
#include "addon/RegisteredMessages.h"
#include "data/ReferenceStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/MessageIds.h"
#include "hostview/Text.h"

namespace addon {

std::wstring ProductTypeOf(const JInstrumentUnderlying& instrument) {
  if (const JProduct* product = ProductMgr().FindPtr(instrument.productId)) return hv::Widen(product->productType);
  return hv::Widen(instrument.productType);
}

TradeKey TradeKeyOf(int key, Qt::KeyboardModifiers modifiers) {
  const bool keypad = modifiers & Qt::KeypadModifier;
  switch (key) {
    case Qt::Key_F5: return {TradeSide::Buy, false};
    case Qt::Key_F9: return {TradeSide::Sell, false};
    case Qt::Key_Plus:
    case Qt::Key_Equal: return {TradeSide::Buy, !keypad};
    case Qt::Key_Minus: return {TradeSide::Sell, !keypad};
    default: return {};
  }
}

bool TradeShortcutsEnabled() { return GetUserSettings().GetKeyboardShortcutsSetting().GetEnableKeyboardShortcuts(); }

LinkTextBuilder ShortcutTicketText(std::string_view instrumentCode, std::int64_t productId, TradeSide side) {
  const bool buy = side == TradeSide::Buy;
  LinkTextBuilder link(kPriceViewSource);
  link.Add(linkkey::kInstrumentCode, instrumentCode)
      .AddInt64(linkkey::kProductId, productId)
      .Add(linkkey::kSide, buy ? "buy" : "sell")
      .Add(linkkey::kFillPrice, buy ? "ASK" : "BID");
  return link;
}

std::optional<std::wstring_view> OpenedClassOf(UINT registeredMessage) {
  const RegisteredMessages& msg = Msg();
  if (registeredMessage == msg.wlOpenChart) return L"CBranticChartView";
  if (registeredMessage == msg.wlOpenDepth) return L"CMarketDepthAdv";
  if (registeredMessage == msg.wlOpenSales) return L"CTimeAndSalesAdv";
  if (registeredMessage == msg.wlOpenSummary) return L"CTradeSummaryAdv";
  if (registeredMessage == msg.wlOpenStockAnalytics) return L"CStockAnalytics";
  if (registeredMessage == msg.relatedNews) return L"CFNews";
  return std::nullopt;
}

// ---- Requests ----------------------------------------------------------------

void InstrumentActions::OpenTradeTicket(const std::wstring* linkText, LPARAM origin) {
  if (origin == kRefusedTradeOrigin) {
    m_view.ShowMessageText(kRefusedTradeCode);
    return;
  }
  if (origin == kShortcutTradeOrigin) {
    const std::wstring context = kShortcutContext;
    m_view.SendChildFeedback(hm::ShortcutContext, ToLParam(&context));
  }
  OpenViewOn(kTradeViewClass, linkText);
}

void InstrumentActions::OpenViewOn(std::wstring_view className, const std::wstring* linkText) {
  ViewLink link;
  link.className = std::wstring(className);
  link.flag = 1;
  link.reserved = 0;
  link.link = linkText;
  m_view.SendChildFeedback(hm::OpenView, ToLParam(&link));
  m_view.SendChildFeedback(hm::LinkData, ToLParam(&link));
}

void InstrumentActions::OpenInstrumentExplorer() {
  const std::wstring name = kInstrumentExplorerClass;
  m_view.SendChildFeedback(hm::OpenView, ToLParam(&name));
}

void InstrumentActions::RefreshTradeLink(const std::wstring* linkText) {
  ViewLink link;
  link.className = kTradeViewClass;
  link.flag = 1;
  link.reserved = 0;
  link.link = linkText;
  m_view.SendChildFeedback(hm::LinkedInstrument, ToLParam(&link));
}

// ---- Questions ---------------------------------------------------------------

int InstrumentActions::AccessStatusOf(const JInstrumentUnderlying& instrument) {
  // The record may live in a list the host replaces while we ask it things.
  const int primary = instrument.accessStatus;
  const int alternate = instrument.altAccessStatus;
  return m_view.QueryAltStatus() ? alternate : primary;
}

bool InstrumentActions::IsExchangeEnabled(const JInstrumentUnderlying& instrument) {
  if (IsExchangeKnownEnabled(instrument.exchangeCode)) return true;
  const std::string code = instrument.exchangeCode;
  JExchangeList exchange;
  exchange.exchangeCode = code;
  exchange.productId = instrument.productId;
  const auto answer = m_view.Ask<LPARAM>(hm::ExchangeEnabled, ToLParam(&exchange));
  if (answer) NoteExchangeAnswer(code, *answer != 0);
  return IsExchangeKnownEnabled(code);
}

void InstrumentActions::NoteExchangeAnswer(const std::string& exchangeCode, bool enabled) {
  if (enabled) m_enabled.insert(exchangeCode);
  else m_enabled.erase(exchangeCode);
}

std::wstring InstrumentActions::RefusalText(const char* key, std::int64_t productId) {
  return m_view.LookupMessageText(key ? key : "", productId);
}

}  // namespace addon
