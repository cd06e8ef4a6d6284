// The library entry: the one exported function and the registry of the six
// view classes.
#include <cstring>

#include "hostview/SuperBaseView.h"
#include "views/alerts/NewPriceAlertAdv.h"
#include "views/alerts/PriceAlertList.h"
#include "views/instrument/MarketDepthAdv.h"
#include "views/instrument/TimeAndSalesAdv.h"
#include "views/instrument/TradeSummaryAdv.h"
#include "views/price/PriceViewAdv.h"

namespace {

struct ViewClassEntry {
  const char* name;
  const CRuntimeClass* descriptor;
};

// Matched exactly (case-sensitive), in this order.
const ViewClassEntry kViewClasses[] = {
    {"CPriceViewAdv", &CPriceViewAdv::classCPriceViewAdv},
    {"CMarketDepthAdv", &CMarketDepthAdv::classCMarketDepthAdv},
    {"CTimeAndSalesAdv", &CTimeAndSalesAdv::classCTimeAndSalesAdv},
    {"CTradeSummaryAdv", &CTradeSummaryAdv::classCTradeSummaryAdv},
    {"CPriceAlertList", &CPriceAlertList::classCPriceAlertList},
    {"CNewPriceAlertAdv", &CNewPriceAlertAdv::classCNewPriceAlertAdv},
};

}  // namespace

// The descriptor of the view class `className`; null for a null, empty or
// unknown name. The descriptors live as long as the library.
extern "C" __attribute__((visibility("default"))) const CRuntimeClass* GetBaseViewPointer(const char* className) {
  if (!className || !*className) return nullptr;
  for (const auto& entry : kViewClasses)
    if (std::strcmp(entry.name, className) == 0) return entry.descriptor;
  return nullptr;
}
