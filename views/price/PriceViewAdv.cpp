#include "views/price/PriceViewAdv.h"

ADDON_IMPLEMENT_VIEW(CPriceViewAdv)

const addon::ViewClassInfo& CPriceViewAdv::Info() {
  static const addon::ViewClassInfo info{
      "CPriceViewAdv",
      "PriceViewAdv.cpp",
      0,  // the language table has no title entry for this view
      L"Price View",
      {{hm::SystemParameter, "ADVFT"},
       {hm::SystemParameter, "MAXWL"},
       {hm::SystemParameter, "MAXWT"},
       {hm::NoticeParameter, "OLDWL"},
       {hm::NoticeParameter, "WLNOT"},
       {hm::SystemParameter, "MKTEX"}},
      {addon::RefStore::Products, addon::RefStore::Exchanges, addon::RefStore::Instruments,
       addon::RefStore::UserWatchlists, addon::RefStore::KeldoWatchlists, addon::RefStore::Top30Watchlists},
  };
  return info;
}

CPriceViewAdv::CPriceViewAdv() : CAddonView(Info()) {}
CPriceViewAdv::~CPriceViewAdv() = default;

int CPriceViewAdv::OnCreate() {
  m_priceViews.Join(this);
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
