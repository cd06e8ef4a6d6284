#include "views/instrument/TradeSummaryAdv.h"

ADDON_IMPLEMENT_VIEW(CTradeSummaryAdv)

const addon::ViewClassInfo& CTradeSummaryAdv::Info() {
  static const addon::ViewClassInfo info{
      .className = "CTradeSummaryAdv",
      .titleEntry = 10,
      .defaultTitle = L"Trade Summary",
      .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
      .refusalKey = "17003",
      .dropSources = addon::kInstrumentViewSources,
      .descriptor = &classCTradeSummaryAdv,
  };
  return info;
}

CTradeSummaryAdv::CTradeSummaryAdv() : CSingleInstrumentView(Info()) {}
CTradeSummaryAdv::~CTradeSummaryAdv() = default;

void CTradeSummaryAdv::OnActivate() { ActivateInstrumentView(); }
void CTradeSummaryAdv::OnDeactivate() { DeactivateInstrumentView(); }
