#pragma once
// The host runtime's parts, shared by HostRuntime.cpp and the request handlers
// in terminal/host/requests/ (see RequestTable.h for adding one). Internal to
// the terminal's host side: the application and the tests use HostRuntime.h.
#include <memory>
#include <string>

#include "terminal/host/HostRuntime.h"
#include "terminal/host/InstrumentNotices.h"
#include "terminal/host/MarketSource.h"
#include "terminal/host/RecordingSource.h"
#include "terminal/host/ReplaySource.h"
#include "terminal/host/RequestTable.h"
#include "terminal/host/Services.h"
#include "terminal/host/SubscriptionBook.h"
#include "terminal/host/UserData.h"
#include "terminal/host/ViewDirectory.h"
#include "terminal/sim/Market.h"

namespace term {

inline constexpr const char* kPriceView = "CPriceViewAdv";
inline constexpr const char* kNewAlertView = "CNewPriceAlertAdv";
// The views that follow the linked instrument (615).
inline bool IsSingleInstrumentView(const std::string& cls) {
  return cls == "CMarketDepthAdv" || cls == "CTimeAndSalesAdv" || cls == "CTradeSummaryAdv";
}

struct HostCore {
  HostRuntime* self = nullptr;
  HostOptions options;
  IHostShell* shell = nullptr;  // never null
  IHostShell noShell;
  MemoryHostStore memoryStore;
  IHostStore* store = nullptr;  // never null
  HostStats stats;
  std::unique_ptr<LogFactory> log;
  std::unique_ptr<sim::Market> market;  // the simulator: also the terminal's own extras
  // What the views receive: `source` is the recorder when recording, else
  // `marketSource` (the simulator's, or the replay `replay` points at).
  std::unique_ptr<MarketSource> marketSource;
  ReplaySource* replay = nullptr;
  std::unique_ptr<RecordingSource> recorder;
  MarketSource* source = nullptr;
  bool recordingProblemShown = false, replayProblemShown = false;
  std::unique_ptr<LanguageTable> language;
  std::unique_ptr<StyleManager> styles;
  MenuManager menus;
  MessageTexts messages;

  ViewDirectory views;
  std::unique_ptr<UserData> user;
  std::unique_ptr<SubscriptionBook> subscriptions;
  std::unique_ptr<InstrumentNotices> instrumentNotices;  // 414 to the leading price view
  RequestTable requests;

  bool relaying300 = false;

  // 300 to every price view but `except` (never from inside a 300 relay).
  void NotifyWatchlists(int family, CSuperBaseView* except);
  // Saves the alerts and tells every view but `except` with `message`.
  void AlertsChanged(UINT message, CSuperBaseView* except = nullptr);
  // Tells the user what fired since the last pump (notice, log, store) and
  // announces status changes.
  void CheckAlerts();
  void DropView(CSuperBaseView* view);
};

}  // namespace term
