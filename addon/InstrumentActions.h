#pragma once
// What every view does the same way with an instrument, once:
//   - trade tickets (MSG_WLOPENTRADE): origin -1 shows the text of "17007"
//     and opens nothing; origin 99 (a keyboard shortcut) sends 206
//     "OPEN_TRADE_SHORTCUT" first; then 200 and 310 with a ViewLink of class
//     "CTradeView" carrying the JSON link text;
//   - "open view X on instrument Y": 200 then 310 with a ViewLink of class X;
//     the instrument explorer (200 with the bare name "CInsExpViewEx"); the
//     trade-link refresh (615 for "CTradeView");
//   - the six trade shortcut keys and the host's shortcut setting;
//   - access rules: the status word (primary, or alternate when the answer to
//     2310 says so), viewable unless 0 or 2, tradeable unless 0 or 1;
//   - the exchange check (604), remembered per view while enabled, with the
//     refusal text of a message key.
//
// Which of these a view applies is its own business: the single-instrument
// views refuse tickets of an instrument that is not tradeable before they
// call OpenTradeTicket; the price view does not. Nothing here checks on its
// own.
//
// Every CAddonView owns one (CAddonView::Actions()). UI thread only; the
// questions (2310, 604, 2814) are answered before SendChildFeedback returns.
#include <Qt>
#include <cstdint>
#include <optional>
#include <set>
#include <string>
#include <string_view>

#include "addon/LinkText.h"
#include "hostview/Records.h"
#include "hostview/Types.h"

class CAddonView;

namespace addon {

// ---- The system's own texts and values ----
inline constexpr const wchar_t* kNotViewableText = L"Counter is not Viewable.";
inline constexpr const wchar_t* kNotTradeableText = L"Counter is not Tradeable.";
inline constexpr const wchar_t* kTradeViewClass = L"CTradeView";
inline constexpr const wchar_t* kInstrumentExplorerClass = L"CInsExpViewEx";
inline constexpr const wchar_t* kShortcutContext = L"OPEN_TRADE_SHORTCUT";
// The trade ticket's origin (lParam of MSG_WLOPENTRADE).
inline constexpr LPARAM kRefusedTradeOrigin = -1;  // the grid refused: show "17007"
inline constexpr LPARAM kShortcutTradeOrigin = 99;  // opened from a keyboard shortcut
inline constexpr const char* kRefusedTradeCode = "17007";
// Refusal of a CFD product in the single-instrument views.
inline constexpr const char* kCfdRefusalKey = "14009";

// ---- Access status of an instrument record ----
inline bool IsViewableStatus(int status) { return status != 0 && status != 2; }
inline bool IsTradeableStatus(int status) { return status != 0 && status != 1; }

// The type text of the instrument's product ("CFD", "DMA", ...): from the
// product store, else the copy the instrument carries.
std::wstring ProductTypeOf(const JInstrumentUnderlying& instrument);

// ---- Trade shortcut keys ----
enum class TradeSide { None, Buy, Sell };
struct TradeKey {
  TradeSide side = TradeSide::None;
  // A main-keyboard key (plus, equals, minus) that also types text.
  bool typesText = false;
  explicit operator bool() const { return side != TradeSide::None; }
};
// Keypad plus, F5 and the plus/equals key buy; keypad minus, F9 and the minus key sell.
TradeKey TradeKeyOf(int key, Qt::KeyboardModifiers modifiers);
// The host's keyboard-shortcut setting.
bool TradeShortcutsEnabled();
// The JSON text of a shortcut ticket: type "price view" with the instrument
// code, the product id ("%I64d"), "Field_side" "buy"/"sell" and
// "Field_Fill_price" "ASK"/"BID". Callers may add pairs (the price view's price).
LinkTextBuilder ShortcutTicketText(std::string_view instrumentCode, std::int64_t productId, TradeSide side);

// The class opened by one of the price view's "open" window messages
// (MSG_WLOPENCHART "CBranticChartView", MSG_WLOPENDEPTH "CMarketDepthAdv",
// MSG_WLOPENSALES, MSG_WLOPENSUMMARY, MSG_WLOPENSTOCKANALYTICS,
// MSG_RELATEDNEWS "CFNews"); nullopt for any other message.
std::optional<std::wstring_view> OpenedClassOf(UINT registeredMessage);

class InstrumentActions {
 public:
  explicit InstrumentActions(CAddonView& view) : m_view(view) {}
  InstrumentActions(const InstrumentActions&) = delete;
  InstrumentActions& operator=(const InstrumentActions&) = delete;

  // ---- Requests ----
  // The ticket path of MSG_WLOPENTRADE (see the file comment). `linkText`
  // may be null (the ViewLink then carries no link). No access check.
  void OpenTradeTicket(const std::wstring* linkText, LPARAM origin);
  // 200 then 310 with ViewLink{className, 1, 0, linkText}.
  void OpenViewOn(std::wstring_view className, const std::wstring* linkText);
  // 200 with the bare name "CInsExpViewEx".
  void OpenInstrumentExplorer();
  // 615 with ViewLink{"CTradeView", 1, 0, linkText} (MSG_REFRESHTRADELINK).
  void RefreshTradeLink(const std::wstring* linkText);

  // ---- Questions ----
  // The status word that applies: asks 2310 (the view's UsesAltStatus() then
  // tells the answer) and takes the alternate word when it says so.
  int AccessStatusOf(const JInstrumentUnderlying& instrument);
  // Whether the instrument's exchange is enabled: remembered once enabled,
  // else asked with 604 (a disabled exchange is asked again next time).
  bool IsExchangeEnabled(const JInstrumentUnderlying& instrument);
  bool IsExchangeKnownEnabled(const std::string& exchangeCode) const { return m_enabled.count(exchangeCode) != 0; }
  // An answer to 604 that came outside a question, about `exchangeCode`.
  void NoteExchangeAnswer(const std::string& exchangeCode, bool enabled);
  // The refusal text of a message key for the instrument's product
  // ("%s, %I64d" through the view's message-text lookup).
  std::wstring RefusalText(const char* key, std::int64_t productId);

 private:
  CAddonView& m_view;
  std::set<std::string> m_enabled;  // exchange codes known to be enabled
};

}  // namespace addon
