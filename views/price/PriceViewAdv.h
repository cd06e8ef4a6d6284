#pragma once
// The price view: the user's watchlists and the ready-made lists as a quote
// table or a quote board. This is the view's frame on the shared base; the
// watchlist content is built on top of it.
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

  void vRecvMsg(UINT message, LPARAM data) override {}
  void vChangeSymbol() override { repaint(); }

 protected:
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;

 private:
  addon::Membership m_priceViews{addon::OpenPriceViews};
  addon::Membership m_activeViews{addon::ActiveViews};
};
