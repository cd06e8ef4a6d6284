#include "views/alerts/PriceAlertList.h"

ADDON_IMPLEMENT_VIEW(CPriceAlertList)

const addon::ViewClassInfo& CPriceAlertList::Info() {
  static const addon::ViewClassInfo info{
      .className = "CPriceAlertList",
      .titleEntry = 9,
      .defaultTitle = L"Price Alerts",
      .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
      .descriptor = &classCPriceAlertList,
  };
  return info;
}

CPriceAlertList::CPriceAlertList() : CAddonView(Info()) {}
CPriceAlertList::~CPriceAlertList() = default;

int CPriceAlertList::OnCreate() {
  m_alertLists.Join(this);
  return 0;
}

void CPriceAlertList::OnActivate() {
  SendViewSize(370, 250);
  m_activeViews.Join(this);
  PrepareBasicData();
  ApplyLanguage();
  SetActiveFlag(true);
}

void CPriceAlertList::OnDeactivate() {
  PrepareBasicData();
  m_activeViews.Leave();
  SetActiveFlag(false);
}
