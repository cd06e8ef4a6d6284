#pragma once
// The price view: the user's watchlists and the ready-made lists as a quote
// table or a quote board. This is the view's frame on the shared base; the
// watchlist content is built on top of it.
//
// Already wired to the shared instrument actions:
//   - MSG_WLOPENTRADE: the shared ticket path (origin -1 shows "17007" and
//     opens nothing; 99 sends 206 first; then 200 and 310 "CTradeView"), with
//     no access check of its own;
//   - MSG_WLOPENDEPTH, MSG_WLOPENSALES, MSG_WLOPENSUMMARY, MSG_WLOPENCHART,
//     MSG_WLOPENSTOCKANALYTICS, MSG_RELATEDNEWS: 200 then 310 for the class;
//     MSG_REFRESHTRADELINK: 615 only; MSG_PVCOLUMNUPDATE: answered with 0;
//   - the six trade keys while the host's shortcut setting is on, for the
//     selected row (SelectedTradeRow: none until the grids exist);
//   - the drop rule: pages 0 and 2 refuse the class's drop sources, pages 1,
//     3 and 4 refuse every drop.
#include <optional>
#include <string>

#include "addon/AddonView.h"

class CPriceViewAdv : public CAddonView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CPriceViewAdv)
 public:
  CPriceViewAdv();
  ~CPriceViewAdv() override;

  // Whether this view is the leading price view (first of the open price views).
  bool IsLeadingPriceView() const { return m_priceViews.IsFirst(); }
  bool IsFirstActiveView() const { return m_activeViews.IsFirst(); }
  // The family on screen: 0 user, 1 TOP30, 2 KELDO, 3 world indices, 4 advance filter.
  int ListKind() const { return m_listKind; }

  void vRecvMsg(UINT message, LPARAM data) override {}
  void vChangeSymbol() override { repaint(); }
  bool EnableDragOut() override { return true; }
  bool EnableDropIn() override { return true; }
  bool EnableDropIn(const char* sourceClassName) override;
  LRESULT OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) override;

 protected:
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;
  std::optional<std::wstring> ShortcutTicket(addon::TradeSide side) override;

  // The row a shortcut ticket is for: the visible grid's selected row, with
  // its price as shown (sent only when the price is above 0).
  struct TradeRow {
    std::string instrumentCode;
    std::int64_t productId = 0;
    double price = 0.0;
    std::wstring priceText;
  };
  std::optional<TradeRow> SelectedTradeRow() const { return std::nullopt; }

 private:
  addon::Membership m_priceViews{addon::OpenPriceViews};
  addon::Membership m_activeViews{addon::ActiveViews};
  int m_listKind = 0;
};
