#include "views/instrument/TimeAndSalesAdv.h"

ADDON_IMPLEMENT_VIEW(CTimeAndSalesAdv)

const addon::ViewClassInfo& CTimeAndSalesAdv::Info() {
  static const addon::ViewClassInfo info{
      "CTimeAndSalesAdv",
      "TimeAndSalesAdv.cpp",
      8,
      L"Time and Sales",
      {},
      {addon::RefStore::Products, addon::RefStore::Instruments},
  };
  return info;
}

CTimeAndSalesAdv::CTimeAndSalesAdv() : CSingleInstrumentView(Info()) {}
CTimeAndSalesAdv::~CTimeAndSalesAdv() = default;
