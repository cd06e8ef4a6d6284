#pragma once
// The terminal's side of the view channel: it creates views, answers their
// numbered requests (synchronously where they need an answer), keeps their
// field subscriptions and pushes value changes, stores watchlists and alerts,
// and relays notifications between views. The market behind it is the
// simulated one (terminal/sim) or a replayed recording.
//
// Threading: everything runs on the UI thread. A view may re-enter the runtime
// from inside OnHostMessage (a synchronous answer that triggers another
// request); the runtime copes with that and with a view destroying another.
//
// Time: the runtime never reads the wall clock. Pump(now) moves the market to
// tick `now` (platform::TickCount() in the application, the virtual clock in
// tests) and pushes what changed since the previous Pump, one 410 per
// subscription and field at most.
//
// Market: what the views receive (reference lists and field values) comes
// from a MarketSource (terminal/host/MarketSource.h): the simulator, or a
// recording being replayed; a recorder can sit in front of either.
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"
#include "hostview/Services.h"
#include "hostview/SuperBaseView.h"
#include "terminal/host/HostStore.h"

class QWidget;

namespace sim {
class Market;
struct MarketConfig;
}  // namespace sim

namespace term {

class HostSettings;
class MarketSource;
class ReplaySource;
namespace rec {
struct Summary;
class Writer;
}  // namespace rec

// Implemented by the terminal application (main window, docks). Every call is
// made from inside a view's request; the defaults do nothing, so a test shell
// overrides only what it watches.
class IHostShell {
 public:
  virtual ~IHostShell() = default;

  // 200: open or bring up a view of `className` for `requester`. Return the view
  // that must receive the link of the 310 the requester sends next, or null
  // when the class is not one the terminal hosts (a trade ticket, a chart...):
  // the runtime then hands that link to ForeignLink. The usual implementation
  // resolves the class with GetBaseViewPointer and calls HostRuntime::CreateView.
  virtual CSuperBaseView* OpenView(const std::wstring& className, CSuperBaseView* requester) { return nullptr; }
  // 310 for a class the terminal has no view for: `linkText` is the JSON link text.
  virtual void ForeignLink(const std::wstring& className, const std::wstring& linkText, CSuperBaseView* requester) {}
  // A view changed the linked instrument (`linkText`: its JSON link text); the
  // add-on's single-instrument views have had it. The terminal's own views
  // that follow links take it from here.
  virtual void InstrumentLinked(const std::wstring& linkText, CSuperBaseView* requester) {}
  // An in-terminal notice (an alert triggered, a save failed).
  virtual void ShowNotice(const std::wstring& title, const std::wstring& text) {}
  // 101: the view's title changed.
  virtual void ViewTitleChanged(CSuperBaseView* view, const std::wstring& title) {}
  // 102 (preferred size), 103 and 110 (frame size of the new-alert form).
  virtual void ViewSizeRequested(CSuperBaseView* view, int width, int height) {}
  // 112: the next OpenView of `className` should get a frame of this size.
  virtual void OpenSizeRequested(const std::wstring& className, int width, int height) {}
  // 202: the new-alert form was submitted (the shell may close its frame).
  virtual void AlertFormSubmitted(CSuperBaseView* view) {}
  // 206: keyboard-shortcut context text ("OPEN_TRADE_SHORTCUT").
  virtual void ShortcutContext(CSuperBaseView* view, const std::wstring& context) {}
  // 529: compact layout switched by a view.
  virtual void CompactLayoutChanged(CSuperBaseView* view, bool compact) {}
  // 2700, 2701: a tab view moved between frames.
  virtual void TabMoved(CSuperBaseView* view, UINT message, LPARAM data) {}
};

// Construction options. Everything has a default fit for `./run`.
struct HostOptions {
  std::uint64_t seed = 20261207;
  int instruments = 3000;               // 50 .. 500000
  int fieldUpdatesPerSecond = 4000;     // over subscribed instruments
  double pace = 1.0;                    // the simulator's pace (MarketConfig::pace)
  std::string sessionDate = "2026-12-07";  // trading day the market plays ("%Y-%m-%d")
  int sessionStartSeconds = 10 * 3600 + 30 * 60;  // time of day at the first Pump
  std::string configFile;               // "KEY=VALUE" lines overriding the settings; optional
  std::string logFile;                  // rotating log file; empty: stderr only
  bool logToStderr = true;              // info level and above
  std::string imageDir;                 // where the style images are drawn; empty: a temp folder
  std::wstring appTitle = L"Brantic Terminal";
  int styleId = 1;                      // 1 light, 2 dark
  int displayMode = 1;                  // answer to 519: 1 or 101
  int linkMode = 0;                     // 528 flag sent after activation
  // Replay: the views receive this recording (checked with rec::Scan) instead
  // of the simulated market, played at `replaySpeed`. The simulator then runs
  // on the recording's seed and day for the terminal's own extras.
  std::shared_ptr<const rec::Summary> replay;
  double replaySpeed = 1.0;
  // Record: what the views receive is also written here (opened, not begun).
  std::shared_ptr<rec::Writer> record;
};

// Counters for tests, the benchmark and the status bar.
struct HostStats {
  std::uint64_t pushes = 0;        // 410 delivered
  std::uint64_t answers = 0;       // 412 delivered
  std::uint64_t requests = 0;      // requests received
  std::uint64_t subscriptions = 0; // live subscriptions
  std::uint64_t malformedTexts = 0;  // watchlist texts refused
  std::uint64_t alertsFired = 0;
};

class HostRuntime : public IViewHost {
 public:
  // `store` may be null (an in-memory store is used); it must outlive the runtime.
  explicit HostRuntime(const HostOptions& options, IHostShell* shell = nullptr, IHostStore* store = nullptr);
  ~HostRuntime() override;
  HostRuntime(const HostRuntime&) = delete;
  HostRuntime& operator=(const HostRuntime&) = delete;

  void SetShell(IHostShell* shell);

  // ---- Views -----------------------------------------------------------------
  // Creates a view from its class descriptor (the caller resolved it with
  // GetBaseViewPointer), wires the services, the host, the style and title, the
  // start parameters (`startParams` may be empty; product id -1 when none) and
  // creates its window under `parent`. Null when the descriptor creates nothing.
  // The runtime owns nothing: the caller owns the view (Qt parent or delete) and
  // must call DestroyView before deleting it.
  CSuperBaseView* CreateView(const CRuntimeClass* descriptor, QWidget* parent = nullptr,
                             std::int64_t startProductId = -1, const std::string& startCode = {},
                             const StartParamMap& startParams = {});
  // Adopts a view created elsewhere (tests' fake views): wires host and services.
  void AttachView(CSuperBaseView* view);
  // Forgets the view: drops its subscriptions and pending links. Call before
  // deleting it; `deleteIt` deletes it too.
  void DestroyView(CSuperBaseView* view, bool deleteIt = false);
  // 2 and 1. Activate also sends the 528 flag when linkMode is set.
  void Activate(CSuperBaseView* view);
  void Deactivate(CSuperBaseView* view);
  // 310 with the view's start parameters as a JSON link text (restored layouts).
  void DeliverStartLink(CSuperBaseView* view);
  // OnHostMessage of a hosted view (0 for a view the runtime does not host).
  std::uint32_t Deliver(CSuperBaseView* view, UINT message, LPARAM data);
  // Writes every later message to a view into `path` (see ViewDirectory::TraceTo);
  // false with `error` when the file cannot be written.
  bool TraceMessages(const std::string& path, std::string& error);
  std::vector<CSuperBaseView*> Views() const;
  std::string ClassNameOf(const CSuperBaseView* view) const;

  // ---- Time --------------------------------------------------------------------
  // Moves the market to tick `now`, evaluates alerts and pushes changes.
  void Pump(std::uint32_t now);
  // Pump(platform::TickCount()).
  void PumpNow();

  // ---- Notifications the terminal starts ------------------------------------
  void ChangeStyle(int styleId);                 // ChangeStyle on every view
  void ApplyLanguage();                          // ApplyLanguage on every view
  void BroadcastSettingsChanged(CSuperBaseView* except = nullptr);  // 2600
  void SetLinkMode(bool on);                     // 528 to every view
  void LinkInstrument(std::int64_t productId, const std::string& code);  // 615 to every view
  void ShowFontSizeMenu(CSuperBaseView* view);   // 616

  // ---- Services ----------------------------------------------------------------
  ILanguage& Language();
  IStyleManager& Styles();
  ILogFactory& LogFactory();
  IMenuManager& Menus();
  HostSettings& Settings();
  // Changes a setting, saves it in the store and tells every view (2600).
  void SaveSetting(const std::string& key, const std::string& value);
  sim::Market& Market();
  // The market the views receive: the simulator, or the replayed recording;
  // with --record, the recorder in front of it.
  MarketSource& Source();
  // The replay's playback controls; null when the market is the simulator.
  ReplaySource* Replay();
  // Writes the recording's end line and closes it; later values are not
  // recorded. False with `error` when the recording failed at any point.
  // True (and nothing to do) without a recording.
  bool FinishRecording(std::string* error = nullptr);
  // Text of a message code ("17001"); empty when unknown.
  std::wstring MessageText(const std::string& code) const;
  // Writes one line to the terminal's own log (info level).
  void LogInfo(const std::string& line);
  // Folder holding the drawn style images.
  std::string ImageDir() const;

  // ---- User data -----------------------------------------------------------------
  // Current user and brand watchlists and alerts, as stored.
  std::vector<StoredWatchlist> Watchlists(StoredWatchlist::Kind kind) const;
  std::vector<PriceAlertItem> Alerts() const;
  // The user's watchlists as text (see WatchlistTransfer.h).
  std::string ExportWatchlists() const;
  // Adds the watchlists of `text` and has every price view show them; the
  // problems when the text is refused (then nothing changes).
  std::vector<std::string> ImportWatchlists(const std::string& text);

  HostStats Stats() const;
  // Hears of every 410 just before it reaches its view (latency measurement);
  // an empty function stops it.
  void SetPushObserver(std::function<void(CSuperBaseView*)> observer);
  // The market indexes of the instruments some view holds a quote
  // subscription for (kind 0, param 0), in subscription order.
  std::vector<int> QuoteInstruments() const;

  // ---- IViewHost -----------------------------------------------------------------
  void OnChildFeedback(CSuperBaseView* view, UINT message, LPARAM data) override;

  struct Impl;

 private:
  std::unique_ptr<Impl> d;
};

// The settings the views ask for by five-letter key (515 and 518): built-in
// values, then a config file of "KEY=VALUE" lines, then the store's overrides.
class HostSettings {
 public:
  HostSettings();
  // Reads "KEY=VALUE" lines ('#' starts a comment); false when the file cannot
  // be read. Unknown keys are kept too.
  bool LoadFile(const std::string& path, std::string* error = nullptr);
  void Set(const std::string& key, const std::string& value);
  // Empty when unknown.
  std::string Get(const std::string& key) const;
  bool Has(const std::string& key) const;
  int GetInt(const std::string& key, int fallback) const;
  const std::map<std::string, std::string>& All() const { return values_; }

 private:
  std::map<std::string, std::string> values_;
};

}  // namespace term
