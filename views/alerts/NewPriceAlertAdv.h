#pragma once
// The new-price-alert form. This is the view's frame on the shared base; the
// form itself is built on top of it.
#include "addon/AddonView.h"

class CNewPriceAlertAdv : public CAddonView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CNewPriceAlertAdv)
 public:
  CNewPriceAlertAdv();
  ~CNewPriceAlertAdv() override;

  bool IsFirstActiveView() const { return m_activeViews.IsFirst(); }

 protected:
  void OnActivate() override;
  void OnDeactivate() override;

 private:
  addon::Membership m_activeViews{addon::ActiveViews};
};
