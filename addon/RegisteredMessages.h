#pragma once
// The registered window messages the add-on's grids and controls send to their
// views. Registered by name when the library loads, so every part of the
// add-on (and any other module registering the same name) sees one number.
#include <string>
#include <vector>

#include "hostview/Types.h"

namespace addon {

struct RegisteredMessages {
  UINT wlOpenTrade;           // "MSG_WLOPENTRADE"
  UINT wlOpenChart;           // "MSG_WLOPENCHART"
  UINT wlOpenDepth;           // "MSG_WLOPENDEPTH"
  UINT wlOpenSales;           // "MSG_WLOPENSALES"
  UINT wlOpenSummary;         // "MSG_WLOPENSUMMARY"
  UINT wlOpenStockAnalytics;  // "MSG_WLOPENSTOCKANALYTICS"
  UINT wlOpenPriceAlert;      // "MSG_WLOPENPRICEALERT"
  UINT relatedNews;           // "MSG_RELATEDNEWS"
  UINT wlAddInsList;          // "MSG_WLADDINSLIST"
  UINT wlRemoveInsList;       // "MSG_WLREMOVEINSLIST"
  UINT keldoWlAddInsList;     // "MSG_KELDOWLADDINSLIST"
  UINT keldoWlRemoveInsList;  // "MSG_KELDOWLREMOVEINSLIST"
  UINT wlMoveIns;             // "MSG_WLMOVEINS"
  UINT wlStartDrag;           // "MSG_WLSTARTDRAG"
  UINT pvColumnUpdate;        // "MSG_PVCOLUMNUPDATE"
  UINT mdColumnUpdate;        // "MSG_MDCOLUMNUPDATE"
  UINT mdColumnChange;        // "MSG_MDCOLUMNCHANGE"
  UINT refreshTradeLink;      // "MSG_REFRESHTRADELINK"
  UINT frameNotify;           // "MSG_FRAMENOTIFY"
  UINT childFeedback;         // "MSG_CHILDFEEDBACK"
};

// The numbers (registered on first use; the library does that at load).
const RegisteredMessages& Msg();
// Every name, in the order of the members above.
const std::vector<std::string>& RegisteredMessageNames();

}  // namespace addon
