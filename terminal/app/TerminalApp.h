#pragma once
// Wires the terminal together: the add-on, the host runtime and its simulated
// market, the SQLite store, the main window with its docks, and (headless) the
// virtual-clock run with its snapshots and dumps.
#include <QObject>
#include <QPointer>
#include <QTimer>
#include <memory>
#include <string>

#include "terminal/app/MainWindow.h"
#include "terminal/app/Options.h"
#include "terminal/host/HostRuntime.h"

class CSuperBaseView;
class QEventLoop;
struct CRuntimeClass;

namespace term {

class AddonLoader;
class MainWindow;
class PlaybackBar;
namespace views {
class Blotter;
}
class SqliteHostStore;
class Store;
class ViewDock;
class LatencyRecorder;
class SoakFigures;
struct SavedLayout;

class TerminalApp : public QObject, public IHostShell {
  Q_OBJECT
 public:
  // `store` may be null (nothing persists). Both must outlive the application.
  TerminalApp(const Options& options, AddonLoader& addon, Store* store);
  ~TerminalApp() override;

  // Builds the runtime and the window, restores the layout and opens --open.
  // False with `error` when the terminal cannot run; StartExitCode() says how
  // to end (2: the command line named something that does not exist).
  bool Start(std::string& error);
  int StartExitCode() const { return m_startExitCode; }
  // A problem the user must hear of without the terminal stopping: a line in
  // the log and on standard error, the status bar, and with `dialog` (and a
  // window to show it in) a message box.
  void ReportProblem(const QString& text, bool dialog);
  // Headless or --seconds: runs the simulated seconds, writes dumps and
  // snapshots, saves. Returns the process exit code.
  int RunTimed();
  // Moves the market to `now`, delivers what changed and fills working orders.
  void Pump(std::uint32_t now);
  // Shows an instrument in the linked views: the add-on's single-instrument
  // views (615) and the terminal's chart, analytics and news (not `from`).
  void LinkInstrument(std::int64_t productId, const std::string& code, CSuperBaseView* from);
  // Saves the layout and closes every view (idempotent).
  void Shutdown();
  // Ends a timed run early (after the current step) or the event loop (SIGINT, SIGTERM).
  void RequestStop();

  MainWindow& Window() { return *m_window; }
  HostRuntime& Runtime() { return *m_runtime; }

  // The descriptor for a class name: the add-on's, else the terminal's own.
  const CRuntimeClass* FindClass(const std::string& className) const;
  // Creates a view in a new dock; null with `error` when the class is unknown or
  // creates nothing. `objectName` restores a saved dock.
  CSuperBaseView* OpenView(const std::string& className, std::int64_t productId, const std::string& code,
                           const StartParamMap& params, const QString& objectName, std::string& error);
  bool SaveLayout();
  // The layout as it stands: the docks, their views' start parameters, the window.
  SavedLayout CurrentLayout() const;
  // The user's watchlists to and from a text file (File menu). Export: false
  // with `error` when the file cannot be written. Import: the problems (the
  // file is refused as a whole), or an empty list when the lists were added.
  bool ExportWatchlists(const QString& path, QString* error);
  QStringList ImportWatchlists(const QString& path);
  // Restores the saved layout; returns the number of views reopened.
  int RestoreLayout();

  // Writes <dir>/<Class>-<n>.tsv for every view; returns the number of files.
  int DumpGrids(const std::string& dir, std::string& error);
  // Runs the views' timers for a moment with the market standing still, so
  // that what they show has caught up with it.
  void SettleViews();
  // Writes <dir>/terminal.png and <dir>/<Class>-<n>.png; returns the number of files.
  int Snapshot(const std::string& dir, std::string& error);

  // ---- IHostShell ----
  CSuperBaseView* OpenView(const std::wstring& className, CSuperBaseView* requester) override;
  void ForeignLink(const std::wstring& className, const std::wstring& linkText, CSuperBaseView* requester) override;
  void InstrumentLinked(const std::wstring& linkText, CSuperBaseView* requester) override;
  void ShowNotice(const std::wstring& title, const std::wstring& text) override;
  void ViewTitleChanged(CSuperBaseView* view, const std::wstring& title) override;
  void ViewSizeRequested(CSuperBaseView* view, int width, int height) override;

 private:
  void OnActivation(CSuperBaseView* view, bool active);
  void OnDrop(CSuperBaseView* target, const QString& source, const QString& link);
  void OpenFromMenu(const QString& className);
  void ShowSettings();
  void ExportWatchlistsFromMenu();
  void ImportWatchlistsFromMenu();
  void ShowFontSize();
  void ChangeStyle(int styleId);
  // The whole application (menus, docks, status bar, dialogs) in the style's colours.
  void ApplyStyleToApplication();
  void Progress(const std::string& line) const;
  // Headless or --seconds: nobody at the window; the virtual clock unless --real-time.
  bool timed() const { return m_options.headless || m_options.seconds.has_value(); }
  bool virtualClock() const { return timed() && !m_options.realTime; }
  // --real-time: the event loop on the real clock for the run's seconds.
  int RunRealTime(double seconds);
  // The end of a timed run: recording, layout, dumps, snapshots. The exit code.
  int FinishTimedRun();
  // --save-churn: one generation of watchlists, alerts, settings and layout.
  bool ChurnStep();
  // --latency-report: stamps pushes and paints from here on.
  void StartLatency();
  bool WriteLatencyReport();
  bool WriteSoakReport(double warmupSeconds);
  // Writes `text` to `path`; says so, or why not.
  bool WriteReport(const std::string& path, const std::string& text, const char* kind);
  void OpenDefaultLayout();
  void DeliverLink(CSuperBaseView* view, std::int64_t productId, const std::string& code);
  // Ends the recording, if any, and says how it went. False when it failed.
  bool FinishRecording();
  // The add-on's (or the terminal's own) classes with their names for a person.
  std::vector<MainWindow::ViewClass> ViewClasses(bool addon) const;

  Options m_options;
  AddonLoader& m_addon;
  Store* m_store;
  std::unique_ptr<SqliteHostStore> m_hostStore;
  std::unique_ptr<HostRuntime> m_runtime;
  std::unique_ptr<views::Blotter> m_blotter;
  std::unique_ptr<MainWindow> m_window;
  PlaybackBar* m_playback = nullptr;  // owned by the window; replays only
  std::string m_recordFile;
  double m_replaySeconds = 0;
  QTimer m_pump;
  QTimer m_autosave;
  bool m_shutDown = false;
  bool m_stopRequested = false;
  int m_styleId = 1;
  int m_startExitCode = 1;
  ILogger* m_log = nullptr;
  bool m_saveFailed = false;             // a save reported an error since the flag was cleared
  std::int64_t m_churnGeneration = -1;   // --save-churn: the next generation to save
  std::unique_ptr<LatencyRecorder> m_latency;
  std::unique_ptr<SoakFigures> m_soak;
  QEventLoop* m_realTimeLoop = nullptr;  // --real-time: the loop running the timed seconds
};

}  // namespace term
