#include "addon/ViewClasses.h"

#include <algorithm>

#include "hostview/SuperBaseView.h"
#include "views/alerts/NewPriceAlertAdv.h"
#include "views/alerts/PriceAlertList.h"
#include "views/instrument/MarketDepthAdv.h"
#include "views/instrument/TimeAndSalesAdv.h"
#include "views/instrument/TradeSummaryAdv.h"
#include "views/price/PriceViewAdv.h"

namespace addon {

const std::vector<std::string> kInstrumentViewSources = {"CTimeAndSalesAdv", "CTradeSummaryAdv", "CMarketDepthAdv"};

const std::vector<const ViewClassInfo*>& ViewClasses() {
  static const std::vector<const ViewClassInfo*> classes{
      &CPriceViewAdv::Info(),   &CMarketDepthAdv::Info(), &CTimeAndSalesAdv::Info(),
      &CTradeSummaryAdv::Info(), &CPriceAlertList::Info(), &CNewPriceAlertAdv::Info(),
  };
  return classes;
}

const ViewClassInfo* FindViewClass(std::string_view className) {
  if (className.empty()) return nullptr;
  for (const ViewClassInfo* info : ViewClasses())
    if (className == info->className) return info;
  return nullptr;
}

const ViewClassInfo* FindViewClass(const CSuperBaseView* view) {
  const CRuntimeClass* runtime = view ? view->GetRuntimeClass() : nullptr;
  if (!runtime) return nullptr;
  for (const ViewClassInfo* info : ViewClasses())
    if (info->descriptor == runtime) return info;
  return nullptr;
}

bool IsDropSource(const ViewClassInfo& info, std::string_view source) {
  return std::find(info.dropSources.begin(), info.dropSources.end(), source) != info.dropSources.end();
}

}  // namespace addon
