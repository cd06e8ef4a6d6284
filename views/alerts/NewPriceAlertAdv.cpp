#include "views/alerts/NewPriceAlertAdv.h"

ADDON_IMPLEMENT_VIEW(CNewPriceAlertAdv)

const addon::ViewClassInfo& CNewPriceAlertAdv::Info() {
  static const addon::ViewClassInfo info{
      .className = "CNewPriceAlertAdv",
      .titleEntry = 725,
      .defaultTitle = L"New Price Alert",
      .firstSettings = {{hm::SystemParameter, "ALEML"}, {hm::SystemParameter, "ALSMS"}, {hm::SystemParameter, "MAXPA"}},
      .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
      .descriptor = &classCNewPriceAlertAdv,
  };
  return info;
}

CNewPriceAlertAdv::CNewPriceAlertAdv() : CAddonView(Info()) {}
CNewPriceAlertAdv::~CNewPriceAlertAdv() = default;

void CNewPriceAlertAdv::OnActivate() {
  m_activeViews.Join(this);
  PrepareBasicData();
  SetActiveFlag(true);
}

void CNewPriceAlertAdv::OnDeactivate() {
  PrepareBasicData();
  m_activeViews.Leave();
  SetActiveFlag(false);
}
