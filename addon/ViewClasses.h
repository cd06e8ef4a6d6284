#pragma once
// The registry of the add-on's six view classes: one table that
// GetBaseViewPointer and every per-class question read ("which title entry
// has CTimeAndSalesAdv?", "which refusal key?", "which drop sources?").
//
// Each view class defines one static ViewClassInfo (its Info()); the table
// lists them in the order GetBaseViewPointer matches names. Lives for the
// process; UI thread only.
#include <string>
#include <string_view>
#include <vector>

#include "addon/StoreStatus.h"
#include "hostview/MessageIds.h"

class CSuperBaseView;
struct CRuntimeClass;

namespace addon {

// One parameter request of a first PrepareBasicData: 515 or 518 with a key.
struct SettingRequest {
  UINT message = hm::SystemParameter;
  std::string key;
};

// What distinguishes one view class in the shared behaviour. A static object
// per class, built with designated initialisers:
//   static const addon::ViewClassInfo info{
//       .className = "CMarketDepthAdv", .titleEntry = 7, .defaultTitle = L"Market Depth",
//       .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
//       .refusalKey = "17001", .dropSources = addon::kInstrumentViewSources,
//       .descriptor = &CMarketDepthAdv::classCMarketDepthAdv};
struct ViewClassInfo {
  const char* className = "";          // as registered ("CMarketDepthAdv"), exact case
  int titleEntry = 0;                  // language entry (section 13) of the title; 0: none
  const wchar_t* defaultTitle = L"";   // the title when the language gives no text
  // Sent the first time a view of the class prepares its data, in this order:
  std::vector<SettingRequest> firstSettings;
  std::vector<RefStore> firstStores;   // each only when not loaded
  // Message key shown when the instrument's exchange is not enabled (the
  // single-instrument views: "17001", "17002", "17003"); null: no such check.
  const char* refusalKey = nullptr;
  // Source class names the class's drop rule names: accepted by the
  // single-instrument views outside a pop-up frame, refused by the price view.
  std::vector<std::string> dropSources;
  // The class descriptor handed to the host; null for classes outside the table (tests).
  const CRuntimeClass* descriptor = nullptr;
};

// The drag source name of the price view's rows.
inline constexpr const char* kPriceViewSource = "price view";
// The views of one instrument accept each other's drops (outside pop-ups).
extern const std::vector<std::string> kInstrumentViewSources;

// The six classes in the order GetBaseViewPointer compares them.
const std::vector<const ViewClassInfo*>& ViewClasses();
// The class registered under `className` (exact, case-sensitive); null when
// none, for an empty name too.
const ViewClassInfo* FindViewClass(std::string_view className);
// The class of a view object (through its run-time class); null for views of
// other modules.
const ViewClassInfo* FindViewClass(const CSuperBaseView* view);
// Whether `source` is one of the class's drop sources (exact comparison).
bool IsDropSource(const ViewClassInfo& info, std::string_view source);

}  // namespace addon
