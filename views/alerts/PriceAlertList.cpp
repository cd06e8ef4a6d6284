#include "views/alerts/PriceAlertList.h"

ADDON_IMPLEMENT_VIEW(CPriceAlertList)

const addon::ViewClassInfo& CPriceAlertList::Info() {
  static const addon::ViewClassInfo info{
      "CPriceAlertList",
      "PriceAlertList.cpp",
      9,
      L"Price Alerts",
      {},
      {addon::RefStore::Products, addon::RefStore::Instruments},
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
