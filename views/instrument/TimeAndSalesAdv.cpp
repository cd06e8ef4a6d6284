#include "views/instrument/TimeAndSalesAdv.h"

ADDON_IMPLEMENT_VIEW(CTimeAndSalesAdv)

const addon::ViewClassInfo& CTimeAndSalesAdv::Info() {
  static const addon::ViewClassInfo info =
      InstrumentClassInfo("CTimeAndSalesAdv", &classCTimeAndSalesAdv, 8, L"Time and Sales", "17002");
  return info;
}

CTimeAndSalesAdv::CTimeAndSalesAdv() : CSingleInstrumentView(Info()) {}
CTimeAndSalesAdv::~CTimeAndSalesAdv() = default;

void CTimeAndSalesAdv::OnActivate() { ActivateInstrumentView(); }
void CTimeAndSalesAdv::OnDeactivate() { DeactivateInstrumentView(); }
