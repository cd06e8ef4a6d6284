#include "addon/RegisteredMessages.h"

#include "platform/Platform.h"

namespace addon {

const std::vector<std::string>& RegisteredMessageNames() {
  static const std::vector<std::string> names = {
      "MSG_WLOPENTRADE",   "MSG_WLOPENCHART",        "MSG_WLOPENDEPTH",         "MSG_WLOPENSALES",
      "MSG_WLOPENSUMMARY", "MSG_WLOPENSTOCKANALYTICS", "MSG_WLOPENPRICEALERT",   "MSG_RELATEDNEWS",
      "MSG_WLADDINSLIST",  "MSG_WLREMOVEINSLIST",    "MSG_KELDOWLADDINSLIST",   "MSG_KELDOWLREMOVEINSLIST",
      "MSG_WLMOVEINS",     "MSG_WLSTARTDRAG",        "MSG_PVCOLUMNUPDATE",      "MSG_MDCOLUMNUPDATE",
      "MSG_MDCOLUMNCHANGE", "MSG_REFRESHTRADELINK",  "MSG_FRAMENOTIFY",         "MSG_CHILDFEEDBACK"};
  return names;
}

const RegisteredMessages& Msg() {
  static const RegisteredMessages msg = [] {
    auto r = [](const char* name) { return platform::RegisterWindowMessage(name); };
    RegisteredMessages m{};
    m.wlOpenTrade = r("MSG_WLOPENTRADE");
    m.wlOpenChart = r("MSG_WLOPENCHART");
    m.wlOpenDepth = r("MSG_WLOPENDEPTH");
    m.wlOpenSales = r("MSG_WLOPENSALES");
    m.wlOpenSummary = r("MSG_WLOPENSUMMARY");
    m.wlOpenStockAnalytics = r("MSG_WLOPENSTOCKANALYTICS");
    m.wlOpenPriceAlert = r("MSG_WLOPENPRICEALERT");
    m.relatedNews = r("MSG_RELATEDNEWS");
    m.wlAddInsList = r("MSG_WLADDINSLIST");
    m.wlRemoveInsList = r("MSG_WLREMOVEINSLIST");
    m.keldoWlAddInsList = r("MSG_KELDOWLADDINSLIST");
    m.keldoWlRemoveInsList = r("MSG_KELDOWLREMOVEINSLIST");
    m.wlMoveIns = r("MSG_WLMOVEINS");
    m.wlStartDrag = r("MSG_WLSTARTDRAG");
    m.pvColumnUpdate = r("MSG_PVCOLUMNUPDATE");
    m.mdColumnUpdate = r("MSG_MDCOLUMNUPDATE");
    m.mdColumnChange = r("MSG_MDCOLUMNCHANGE");
    m.refreshTradeLink = r("MSG_REFRESHTRADELINK");
    m.frameNotify = r("MSG_FRAMENOTIFY");
    m.childFeedback = r("MSG_CHILDFEEDBACK");
    return m;
  }();
  return msg;
}

namespace {
// Registers every name when the library is loaded.
[[maybe_unused]] const RegisteredMessages& g_registeredAtLoad = Msg();
}  // namespace

}  // namespace addon
