#include "views/instrument/TradeSummaryAdv.h"

ADDON_IMPLEMENT_VIEW(CTradeSummaryAdv)

const addon::ViewClassInfo& CTradeSummaryAdv::Info() {
  static const addon::ViewClassInfo info =
      InstrumentClassInfo("CTradeSummaryAdv", &classCTradeSummaryAdv, 10, L"Trade Summary", "17003");
  return info;
}

CTradeSummaryAdv::CTradeSummaryAdv() : CSingleInstrumentView(Info()) {}
CTradeSummaryAdv::~CTradeSummaryAdv() = default;

void CTradeSummaryAdv::OnActivate() { ActivateInstrumentView(); }
void CTradeSummaryAdv::OnDeactivate() { DeactivateInstrumentView(); }
