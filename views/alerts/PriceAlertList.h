#pragma once
// The list of the user's price alerts. This is the view's frame on the shared
// base; the list itself is built on top of it.
#include "addon/AddonView.h"

class CPriceAlertList : public CAddonView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CPriceAlertList)
 public:
  CPriceAlertList();
  ~CPriceAlertList() override;

  bool IsFirstAlertList() const { return m_alertLists.IsFirst(); }
  bool IsFirstActiveView() const { return m_activeViews.IsFirst(); }

 protected:
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;

 private:
  addon::Membership m_alertLists{addon::AlertListViews};
  addon::Membership m_activeViews{addon::ActiveViews};
};
