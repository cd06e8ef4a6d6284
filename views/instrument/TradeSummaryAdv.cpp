#include "views/instrument/TradeSummaryAdv.h"

ADDON_IMPLEMENT_VIEW(CTradeSummaryAdv)

const addon::ViewClassInfo& CTradeSummaryAdv::Info() {
  static const addon::ViewClassInfo info{
      "CTradeSummaryAdv",
      "TradeSummaryAdv.cpp",
      10,
      L"Trade Summary",
      {},
      {addon::RefStore::Products, addon::RefStore::Instruments},
  };
  return info;
}

CTradeSummaryAdv::CTradeSummaryAdv() : CSingleInstrumentView(Info()) {}
CTradeSummaryAdv::~CTradeSummaryAdv() = default;
