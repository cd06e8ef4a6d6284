#include "views/instrument/MarketDepthAdv.h"

ADDON_IMPLEMENT_VIEW(CMarketDepthAdv)

const addon::ViewClassInfo& CMarketDepthAdv::Info() {
  static const addon::ViewClassInfo info{
      "CMarketDepthAdv",
      "MarketDepthAdv.cpp",
      7,
      L"Market Depth",
      {},
      {addon::RefStore::Products, addon::RefStore::Instruments},
  };
  return info;
}

CMarketDepthAdv::CMarketDepthAdv() : CSingleInstrumentView(Info()) {}
CMarketDepthAdv::~CMarketDepthAdv() = default;
