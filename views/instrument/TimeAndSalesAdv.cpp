#include "views/instrument/TimeAndSalesAdv.h"

ADDON_IMPLEMENT_VIEW(CTimeAndSalesAdv)

const addon::ViewClassInfo& CTimeAndSalesAdv::Info() {
  static const addon::ViewClassInfo info{
      .className = "CTimeAndSalesAdv",
      .titleEntry = 8,
      .defaultTitle = L"Time and Sales",
      .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
      .refusalKey = "17002",
      .dropSources = addon::kInstrumentViewSources,
      .descriptor = &classCTimeAndSalesAdv,
  };
  return info;
}

CTimeAndSalesAdv::CTimeAndSalesAdv() : CSingleInstrumentView(Info()) {}
CTimeAndSalesAdv::~CTimeAndSalesAdv() = default;

void CTimeAndSalesAdv::OnActivate() { ActivateInstrumentView(); }
void CTimeAndSalesAdv::OnDeactivate() { DeactivateInstrumentView(); }
