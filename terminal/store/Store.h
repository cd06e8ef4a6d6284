#pragma once
// The terminal's persistence: one SQLite database in the user's data folder,
// in WAL mode. Every Save* call is one transaction, so a process killed between
// two saves keeps everything the first one wrote.
//
// A database that is damaged, or that was written by a newer terminal, is never
// touched: Open() renames it (with its -wal and -shm companions) next to itself
// and starts a fresh one, and says so in the report.
//
// Not thread-safe; the terminal uses it from the UI thread only.
#include <cstdint>
#include <filesystem>
#include <map>
#include <memory>
#include <string>
#include <vector>

struct sqlite3;

namespace term {

struct StoreOpenReport {
  enum class Outcome {
    Opened,           // an existing database, in use (brought up to this terminal's format when older)
    Created,          // no database yet; a new one was made
    ReplacedCorrupt,  // the old one was unreadable; set aside, new one made
    ReplacedNewer,    // the old one came from a newer terminal; set aside, new one made
  };
  Outcome outcome = Outcome::Opened;
  std::filesystem::path path;          // the database in use
  std::filesystem::path setAsidePath;  // where the old database went (Replaced*)
  std::string message;                 // one line for the user (empty when Opened/Created)
  int upgradedFrom = 0;                // format of an older database brought up to date (0: none)
};

// One watchlist as the terminal keeps it. `body` is the terminal's own text
// (the watchlist XML); the store does not look inside.
struct WatchlistRow {
  std::int32_t kind = 0;  // 0 user, 2 brand
  std::int64_t id = 0;
  std::string name;
  std::string body;
};

// One price alert; `body` is the terminal's own serialised record.
struct AlertRow {
  std::int64_t id = 0;
  std::string body;
};

// One firing of a price alert, kept with the alert (the notice the terminal
// showed, and the price and time that met the condition).
struct AlertFiringRow {
  std::int64_t alertId = 0;
  std::string firedAt;     // "YYYY-MM-DD HH:MM:SS"
  std::string priceField;
  std::string comparator;
  double threshold = 0.0;
  double value = 0.0;
  std::string valueText;
  std::string notice;
};

// One open view of the saved layout, in opening order.
struct SavedView {
  std::string className;
  std::string objectName;  // the dock's name; the main window state refers to it
  std::int64_t productId = -1;
  std::string instrumentCode;
  std::map<std::string, std::string> params;  // start parameters, UTF-8
};

// One order of the blotter. `number` is the order number the user reads (unique).
struct OrderRow {
  std::int64_t number = 0;
  std::string session;  // trading day "YYYY-MM-DD" it was placed on
  std::string time;     // "HH:MM:SS" market time
  std::string side;     // "Buy", "Sell"
  std::int64_t productId = 0;
  std::string instrumentCode;
  std::int64_t quantity = 0;
  double price = 0;
  std::string type, validity, trigger, status;
};

struct SavedLayout {
  std::vector<SavedView> views;
  std::string windowGeometry;  // opaque bytes from the main window
  std::string windowState;     // opaque bytes from the main window (docks, tabs, floating)
  std::string activeView;      // object name of the active view's dock
  bool empty() const { return views.empty() && windowGeometry.empty() && windowState.empty(); }
};

class Store {
 public:
  // 1: settings, watchlists, alerts, layout. 2: the blotter's orders. 3: alert firings.
  static constexpr int kSchemaVersion = 3;
  static constexpr const char* kFileName = "terminal.db";

  // $XDG_DATA_HOME/marketviews-terminal, or ~/.local/share/marketviews-terminal.
  static std::filesystem::path DefaultDataDir();

  // Opens (creating the folder and database as needed) <dir>/terminal.db.
  // Null with `error` set when the folder or a fresh database cannot be made,
  // or when another program keeps the database locked past `busyWaitMs`.
  static std::unique_ptr<Store> Open(const std::filesystem::path& dir, StoreOpenReport& report,
                                     std::string& error, int busyWaitMs = 5000);
  ~Store();
  Store(const Store&) = delete;
  Store& operator=(const Store&) = delete;

  const std::filesystem::path& Path() const { return m_path; }
  // The text of the last failure of a Save*/Load* call.
  const std::string& LastError() const { return m_error; }

  // Settings: flat key/value texts. SaveSettings replaces them all.
  std::map<std::string, std::string> LoadSettings();
  bool SaveSettings(const std::map<std::string, std::string>& settings);
  // Sets one key (an empty value removes it), leaving the others.
  bool SaveSetting(const std::string& key, const std::string& value);
  // Settings whose key starts with `prefix`, with the prefix removed.
  std::map<std::string, std::string> LoadSettings(const std::string& prefix);

  // Watchlists of one kind, in their saved order. Save replaces that kind.
  std::vector<WatchlistRow> LoadWatchlists(std::int32_t kind);
  bool SaveWatchlists(std::int32_t kind, const std::vector<WatchlistRow>& lists);

  // Whether SaveWatchlists(kind) / SaveAlerts ever ran (an empty saved set is
  // not the same as nothing saved yet).
  bool HasSavedWatchlists(std::int32_t kind);
  bool HasSavedAlerts();

  // Alerts in id order. Save replaces them all; the firings of alerts that
  // are no longer there go with them.
  std::vector<AlertRow> LoadAlerts();
  bool SaveAlerts(const std::vector<AlertRow>& alerts);
  // Appends one firing to an alert's history; its firings oldest first.
  bool AddAlertFiring(const AlertFiringRow& firing);
  std::vector<AlertFiringRow> LoadAlertFirings(std::int64_t alertId);

  SavedLayout LoadLayout();
  bool SaveLayout(const SavedLayout& layout);

  // The orders of one trading day, by number. Save adds or replaces one order.
  std::vector<OrderRow> LoadOrders(const std::string& session);
  bool SaveOrder(const OrderRow& order);
  // The highest order number ever saved (0 when none): numbers are never reused.
  std::int64_t LastOrderNumber();

 private:
  explicit Store(sqlite3* db, std::filesystem::path path) : m_db(db), m_path(std::move(path)) {}
  bool Exec(const char* sql);
  int UserVersion();
  bool Fail(const char* what);
  bool MarkSaved(const std::string& set);
  bool HasSaved(const std::string& set);
  class Transaction;

  sqlite3* m_db = nullptr;
  std::filesystem::path m_path;
  std::string m_error;
};

// Start parameters travel as one JSON object text in the layout table.
std::string EncodeParams(const std::map<std::string, std::string>& params);
// Malformed text gives an empty map.
std::map<std::string, std::string> DecodeParams(const std::string& text);

}  // namespace term
