#include "terminal/store/Store.h"

#include <json/json.h>
#include <sqlite3.h>

#include <chrono>
#include <cstdlib>
#include <ctime>
#include <iterator>
#include <system_error>

namespace term {

namespace fs = std::filesystem;

namespace {

// "MVTD": marks the file as this terminal's database.
constexpr int kApplicationId = 0x4D565444;

const char* const kSchema = R"sql(
CREATE TABLE settings (
  key   TEXT PRIMARY KEY,
  value TEXT NOT NULL
);
CREATE TABLE watchlists (
  kind     INTEGER NOT NULL,
  id       INTEGER NOT NULL,
  position INTEGER NOT NULL,
  name     TEXT NOT NULL,
  body     TEXT NOT NULL,
  PRIMARY KEY (kind, id)
);
CREATE TABLE alerts (
  id   INTEGER PRIMARY KEY,
  body TEXT NOT NULL
);
CREATE TABLE layout_views (
  position        INTEGER PRIMARY KEY,
  class_name      TEXT NOT NULL,
  object_name     TEXT NOT NULL,
  product_id      INTEGER NOT NULL,
  instrument_code TEXT NOT NULL,
  params          TEXT NOT NULL
);
CREATE TABLE saved_sets (
  name TEXT PRIMARY KEY
);
CREATE TABLE layout_state (
  key   TEXT PRIMARY KEY,
  value BLOB NOT NULL
);
)sql";

// Each step brings a database of format N to N + 1; kSchema plus every step is
// the current format. Steps only add, so an older terminal's data stays.
const char* const kUpgrades[] = {
    // 1 -> 2: the blotter.
    R"sql(
CREATE TABLE orders (
  number          INTEGER PRIMARY KEY,
  session         TEXT NOT NULL,
  time            TEXT NOT NULL,
  side            TEXT NOT NULL,
  product_id      INTEGER NOT NULL,
  instrument_code TEXT NOT NULL,
  quantity        INTEGER NOT NULL,
  price           REAL NOT NULL,
  type            TEXT NOT NULL,
  validity        TEXT NOT NULL,
  trigger_type    TEXT NOT NULL,
  status          TEXT NOT NULL
);
CREATE INDEX orders_by_session ON orders(session, number);
)sql",
    // 2 -> 3: every firing of a price alert with its notice, kept with the alert.
    R"sql(
CREATE TABLE alert_firings (
  seq         INTEGER PRIMARY KEY AUTOINCREMENT,
  alert_id    INTEGER NOT NULL,
  fired_at    TEXT NOT NULL,
  price_field TEXT NOT NULL,
  comparator  TEXT NOT NULL,
  threshold   REAL NOT NULL,
  value       REAL NOT NULL,
  value_text  TEXT NOT NULL,
  notice      TEXT NOT NULL
);
CREATE INDEX alert_firings_by_alert ON alert_firings(alert_id, seq);
)sql",
};
static_assert(std::size(kUpgrades) == Store::kSchemaVersion - 1, "one upgrade step per format");

// RAII prepared statement. Connections close with sqlite3_close_v2, which
// waits for statements still alive instead of leaking the connection.
class Stmt {
 public:
  Stmt(sqlite3* db, const char* sql) { m_rc = sqlite3_prepare_v2(db, sql, -1, &m_stmt, nullptr); }
  ~Stmt() { sqlite3_finalize(m_stmt); }
  bool ok() const { return m_rc == SQLITE_OK && m_stmt; }
  Stmt& Bind(int i, std::int64_t v) { sqlite3_bind_int64(m_stmt, i, v); return *this; }
  Stmt& BindReal(int i, double v) { sqlite3_bind_double(m_stmt, i, v); return *this; }
  Stmt& Bind(int i, const std::string& v) {
    sqlite3_bind_text(m_stmt, i, v.data(), static_cast<int>(v.size()), SQLITE_TRANSIENT);
    return *this;
  }
  Stmt& BindBlob(int i, const std::string& v) {
    sqlite3_bind_blob(m_stmt, i, v.data(), static_cast<int>(v.size()), SQLITE_TRANSIENT);
    return *this;
  }
  int Step() { return sqlite3_step(m_stmt); }
  // Runs a write statement to completion and makes it reusable.
  bool Run() {
    const int rc = sqlite3_step(m_stmt);
    sqlite3_reset(m_stmt);
    sqlite3_clear_bindings(m_stmt);
    return rc == SQLITE_DONE;
  }
  std::int64_t Int(int col) const { return sqlite3_column_int64(m_stmt, col); }
  double Real(int col) const { return sqlite3_column_double(m_stmt, col); }
  std::string Text(int col) const {
    const void* p = sqlite3_column_blob(m_stmt, col);
    const int n = sqlite3_column_bytes(m_stmt, col);
    return p ? std::string(static_cast<const char*>(p), static_cast<std::size_t>(n)) : std::string();
  }

 private:
  sqlite3_stmt* m_stmt = nullptr;
  int m_rc = SQLITE_ERROR;
};

std::string Stamp() {
  const std::time_t t = std::time(nullptr);
  std::tm tm{};
  localtime_r(&t, &tm);
  char buf[32];
  std::strftime(buf, sizeof buf, "%Y%m%d-%H%M%S", &tm);
  return buf;
}

// Moves the database and its companions to "<db>.<tag>-<stamp>[-k]" and returns the new path.
fs::path SetAside(const fs::path& db, const std::string& tag, std::string& error) {
  const std::string base = db.string() + "." + tag + "-" + Stamp();
  fs::path target = base;
  for (int k = 2; fs::exists(target) || fs::exists(target.string() + "-wal"); ++k)
    target = base + "-" + std::to_string(k);
  std::error_code ec;
  fs::rename(db, target, ec);
  if (ec) {
    error = "cannot move " + db.string() + " aside: " + ec.message();
    return {};
  }
  for (const char* suffix : {"-wal", "-shm", "-journal"}) {
    const fs::path companion = db.string() + suffix;
    if (fs::exists(companion)) fs::rename(companion, target.string() + suffix, ec);
  }
  return target;
}

// What an existing file holds.
enum class Probe { Ours, Empty, Corrupt, Newer, Busy };

// Locked by another program: nothing says the file is damaged.
bool IsBusy(int code) {
  code &= 0xFF;
  return code == SQLITE_BUSY || code == SQLITE_LOCKED;
}

Probe ProbeFile(const fs::path& path, int busyWaitMs, int& version, std::string& detail) {
  sqlite3* db = nullptr;
  // Read-write so that a hot WAL left by a killed terminal is recovered, as it must be.
  int rc = sqlite3_open_v2(path.c_str(), &db, SQLITE_OPEN_READWRITE, nullptr);
  auto close = [&] { sqlite3_close_v2(db); };
  if (rc != SQLITE_OK) {
    detail = sqlite3_errstr(rc);
    close();
    return IsBusy(rc) ? Probe::Busy : Probe::Corrupt;
  }
  // Another program's write or checkpoint holds the lock for a moment: wait
  // for it as every later statement does, rather than take the file for damaged.
  sqlite3_busy_timeout(db, busyWaitMs);
  auto failed = [&] {
    const bool busy = IsBusy(sqlite3_extended_errcode(db));
    close();
    return busy ? Probe::Busy : Probe::Corrupt;
  };
  auto scalar = [&](const char* sql, std::int64_t& out) -> bool {
    Stmt s(db, sql);
    if (!s.ok()) { detail = sqlite3_errmsg(db); return false; }
    const int r = s.Step();
    if (r != SQLITE_ROW) { detail = r == SQLITE_DONE ? "no answer" : sqlite3_errmsg(db); return false; }
    out = s.Int(0);
    return true;
  };
  std::int64_t appId = 0, userVersion = 0, tables = 0;
  if (!scalar("PRAGMA application_id", appId) || !scalar("PRAGMA user_version", userVersion) ||
      !scalar("SELECT count(*) FROM sqlite_schema", tables))
    return failed();
  version = static_cast<int>(userVersion);
  if (appId == 0 && userVersion == 0 && tables == 0) { close(); return Probe::Empty; }
  if (appId != kApplicationId) {
    detail = "not a terminal database";
    close();
    return Probe::Corrupt;
  }
  if (userVersion > Store::kSchemaVersion) { close(); return Probe::Newer; }
  {
    Stmt check(db, "PRAGMA quick_check");
    if (!check.ok() || check.Step() != SQLITE_ROW || check.Text(0) != "ok") {
      detail = check.ok() ? check.Text(0) : sqlite3_errmsg(db);
      if (detail.empty()) detail = sqlite3_errmsg(db);
      return failed();
    }
  }
  close();
  return Probe::Ours;
}

}  // namespace

class Store::Transaction {
 public:
  explicit Transaction(Store& s) : m_s(s) { m_open = s.Exec("BEGIN IMMEDIATE"); }
  ~Transaction() {
    if (m_open) sqlite3_exec(m_s.m_db, "ROLLBACK", nullptr, nullptr, nullptr);
  }
  bool open() const { return m_open; }
  bool Commit() {
    if (!m_open) return false;
    m_open = false;
    if (m_s.Exec("COMMIT")) return true;
    sqlite3_exec(m_s.m_db, "ROLLBACK", nullptr, nullptr, nullptr);
    return false;
  }

 private:
  Store& m_s;
  bool m_open = false;
};

fs::path Store::DefaultDataDir() {
  const char* xdg = std::getenv("XDG_DATA_HOME");
  if (xdg && *xdg && fs::path(xdg).is_absolute()) return fs::path(xdg) / "marketviews-terminal";
  const char* home = std::getenv("HOME");
  return fs::path(home && *home ? home : ".") / ".local" / "share" / "marketviews-terminal";
}

std::unique_ptr<Store> Store::Open(const fs::path& dir, StoreOpenReport& report, std::string& error, int busyWaitMs) {
  report = {};
  std::error_code ec;
  fs::create_directories(dir, ec);
  if (ec || !fs::is_directory(dir)) {
    error = "cannot use data folder " + dir.string() + ": " + (ec ? ec.message() : "not a folder");
    return nullptr;
  }
  const fs::path path = dir / kFileName;
  report.path = path;
  report.outcome = StoreOpenReport::Outcome::Created;
  int version = 0;
  if (fs::exists(path)) {
    std::string detail;
    switch (ProbeFile(path, busyWaitMs, version, detail)) {
      case Probe::Ours:
        report.outcome = StoreOpenReport::Outcome::Opened;
        break;
      case Probe::Empty:
        break;
      case Probe::Busy:
        error = "the terminal database " + path.string() + " is locked by another program (" + detail +
                "); nothing was changed. Close the other program and start the terminal again.";
        return nullptr;
      case Probe::Corrupt: {
        report.setAsidePath = SetAside(path, "corrupt", error);
        if (report.setAsidePath.empty()) return nullptr;
        report.outcome = StoreOpenReport::Outcome::ReplacedCorrupt;
        report.message = "The terminal database " + path.string() + " cannot be read (" + detail +
                         "). It was kept as " + report.setAsidePath.string() +
                         " and a new database was started.";
        break;
      }
      case Probe::Newer: {
        report.setAsidePath = SetAside(path, "newer-v" + std::to_string(version), error);
        if (report.setAsidePath.empty()) return nullptr;
        report.outcome = StoreOpenReport::Outcome::ReplacedNewer;
        report.message = "The terminal database " + path.string() + " was written by a newer terminal (format " +
                         std::to_string(version) + ", this terminal reads up to " +
                         std::to_string(kSchemaVersion) + "). It was kept as " + report.setAsidePath.string() +
                         " and a new database was started.";
        break;
      }
    }
  }

  sqlite3* db = nullptr;
  const int rc = sqlite3_open_v2(path.c_str(), &db, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, nullptr);
  if (rc != SQLITE_OK) {
    error = "cannot open " + path.string() + ": " + (db ? sqlite3_errmsg(db) : sqlite3_errstr(rc));
    sqlite3_close_v2(db);
    return nullptr;
  }
  std::unique_ptr<Store> store(new Store(db, path));
  // FULL: a commit is on disk before the save returns.
  if (!store->Exec("PRAGMA journal_mode=WAL") || !store->Exec("PRAGMA synchronous=FULL") ||
      !store->Exec(("PRAGMA busy_timeout=" + std::to_string(busyWaitMs)).c_str())) {
    error = "cannot prepare " + path.string() + ": " + store->m_error;
    return nullptr;
  }
  const bool fresh = report.outcome != StoreOpenReport::Outcome::Opened;
  const int from = fresh ? 1 : std::max(1, version);
  if (fresh || from < kSchemaVersion) {
    // One transaction: a database is either upgraded whole or left as it was.
    Transaction tx(*store);
    bool ok = tx.open() && (!fresh || store->Exec(kSchema));
    for (int v = from; ok && v < kSchemaVersion; ++v) ok = store->Exec(kUpgrades[v - 1]);
    ok = ok && store->Exec(("PRAGMA application_id=" + std::to_string(kApplicationId)).c_str()) &&
         store->Exec(("PRAGMA user_version=" + std::to_string(kSchemaVersion)).c_str()) && tx.Commit();
    if (!ok) {
      error = std::string(fresh ? "cannot create " : "cannot bring up to date ") + path.string() + ": " +
              store->m_error;
      return nullptr;
    }
    if (!fresh) report.upgradedFrom = from;
  }
  return store;
}

Store::~Store() { sqlite3_close_v2(m_db); }

int Store::UserVersion() {
  Stmt s(m_db, "PRAGMA user_version");
  return s.ok() && s.Step() == SQLITE_ROW ? static_cast<int>(s.Int(0)) : -1;
}

bool Store::Exec(const char* sql) {
  char* msg = nullptr;
  if (sqlite3_exec(m_db, sql, nullptr, nullptr, &msg) == SQLITE_OK) return true;
  m_error = msg ? msg : sqlite3_errmsg(m_db);
  sqlite3_free(msg);
  return false;
}

bool Store::Fail(const char* what) {
  m_error = std::string(what) + ": " + sqlite3_errmsg(m_db);
  return false;
}

std::map<std::string, std::string> Store::LoadSettings() {
  std::map<std::string, std::string> out;
  Stmt s(m_db, "SELECT key, value FROM settings");
  if (!s.ok()) { Fail("load settings"); return out; }
  while (s.Step() == SQLITE_ROW) out[s.Text(0)] = s.Text(1);
  return out;
}

bool Store::SaveSettings(const std::map<std::string, std::string>& settings) {
  Transaction tx(*this);
  if (!tx.open() || !Exec("DELETE FROM settings")) return false;
  Stmt ins(m_db, "INSERT INTO settings(key, value) VALUES(?, ?)");
  if (!ins.ok()) return Fail("save settings");
  for (const auto& [k, v] : settings)
    if (!ins.Bind(1, k).Bind(2, v).Run()) return Fail("save settings");
  return tx.Commit();
}

bool Store::SaveSetting(const std::string& key, const std::string& value) {
  Transaction tx(*this);
  if (!tx.open()) return false;
  if (value.empty()) {
    Stmt del(m_db, "DELETE FROM settings WHERE key = ?");
    if (!del.ok() || !del.Bind(1, key).Run()) return Fail("save setting");
  } else {
    Stmt up(m_db, "INSERT INTO settings(key, value) VALUES(?, ?) ON CONFLICT(key) DO UPDATE SET value = excluded.value");
    if (!up.ok() || !up.Bind(1, key).Bind(2, value).Run()) return Fail("save setting");
  }
  return tx.Commit();
}

std::map<std::string, std::string> Store::LoadSettings(const std::string& prefix) {
  std::map<std::string, std::string> out;
  for (auto& [k, v] : LoadSettings())
    if (k.size() > prefix.size() && k.compare(0, prefix.size(), prefix) == 0) out[k.substr(prefix.size())] = v;
  return out;
}

bool Store::MarkSaved(const std::string& set) {
  Stmt s(m_db, "INSERT OR IGNORE INTO saved_sets(name) VALUES(?)");
  return s.ok() && s.Bind(1, set).Run();
}

bool Store::HasSaved(const std::string& set) {
  Stmt s(m_db, "SELECT 1 FROM saved_sets WHERE name = ?");
  if (!s.ok()) return false;
  s.Bind(1, set);
  return s.Step() == SQLITE_ROW;
}

bool Store::HasSavedWatchlists(std::int32_t kind) { return HasSaved("watchlists." + std::to_string(kind)); }
bool Store::HasSavedAlerts() { return HasSaved("alerts"); }

std::vector<WatchlistRow> Store::LoadWatchlists(std::int32_t kind) {
  std::vector<WatchlistRow> out;
  Stmt s(m_db, "SELECT id, name, body FROM watchlists WHERE kind = ? ORDER BY position");
  if (!s.ok()) { Fail("load watchlists"); return out; }
  s.Bind(1, kind);
  while (s.Step() == SQLITE_ROW) out.push_back({kind, s.Int(0), s.Text(1), s.Text(2)});
  return out;
}

bool Store::SaveWatchlists(std::int32_t kind, const std::vector<WatchlistRow>& lists) {
  Transaction tx(*this);
  if (!tx.open()) return false;
  {
    Stmt del(m_db, "DELETE FROM watchlists WHERE kind = ?");
    if (!del.ok() || !del.Bind(1, kind).Run()) return Fail("save watchlists");
  }
  Stmt ins(m_db, "INSERT INTO watchlists(kind, id, position, name, body) VALUES(?, ?, ?, ?, ?)");
  if (!ins.ok()) return Fail("save watchlists");
  std::int64_t position = 0;
  for (const auto& w : lists)
    if (!ins.Bind(1, kind).Bind(2, w.id).Bind(3, position++).Bind(4, w.name).Bind(5, w.body).Run())
      return Fail("save watchlists");
  if (!MarkSaved("watchlists." + std::to_string(kind))) return Fail("save watchlists");
  return tx.Commit();
}

std::vector<AlertRow> Store::LoadAlerts() {
  std::vector<AlertRow> out;
  Stmt s(m_db, "SELECT id, body FROM alerts ORDER BY id");
  if (!s.ok()) { Fail("load alerts"); return out; }
  while (s.Step() == SQLITE_ROW) out.push_back({s.Int(0), s.Text(1)});
  return out;
}

bool Store::SaveAlerts(const std::vector<AlertRow>& alerts) {
  Transaction tx(*this);
  if (!tx.open() || !Exec("DELETE FROM alerts")) return false;
  Stmt ins(m_db, "INSERT INTO alerts(id, body) VALUES(?, ?)");
  if (!ins.ok()) return Fail("save alerts");
  for (const auto& a : alerts)
    if (!ins.Bind(1, a.id).Bind(2, a.body).Run()) return Fail("save alerts");
  if (!Exec("DELETE FROM alert_firings WHERE alert_id NOT IN (SELECT id FROM alerts)")) return false;
  if (!MarkSaved("alerts")) return Fail("save alerts");
  return tx.Commit();
}

bool Store::AddAlertFiring(const AlertFiringRow& f) {
  Transaction tx(*this);
  if (!tx.open()) return false;
  Stmt ins(m_db,
           "INSERT INTO alert_firings(alert_id, fired_at, price_field, comparator, threshold, value, value_text, notice) "
           "VALUES(?, ?, ?, ?, ?, ?, ?, ?)");
  if (!ins.ok() || !ins.Bind(1, f.alertId).Bind(2, f.firedAt).Bind(3, f.priceField).Bind(4, f.comparator)
                        .BindReal(5, f.threshold).BindReal(6, f.value).Bind(7, f.valueText).Bind(8, f.notice).Run())
    return Fail("save an alert firing");
  return tx.Commit();
}

std::vector<AlertFiringRow> Store::LoadAlertFirings(std::int64_t alertId) {
  std::vector<AlertFiringRow> out;
  Stmt s(m_db,
         "SELECT alert_id, fired_at, price_field, comparator, threshold, value, value_text, notice FROM alert_firings "
         "WHERE alert_id = ? ORDER BY seq");
  if (!s.ok()) { Fail("load alert firings"); return out; }
  s.Bind(1, alertId);
  while (s.Step() == SQLITE_ROW)
    out.push_back({s.Int(0), s.Text(1), s.Text(2), s.Text(3), s.Real(4), s.Real(5), s.Text(6), s.Text(7)});
  return out;
}

SavedLayout Store::LoadLayout() {
  SavedLayout out;
  {
    Stmt s(m_db,
           "SELECT class_name, object_name, product_id, instrument_code, params FROM layout_views ORDER BY position");
    if (!s.ok()) { Fail("load layout"); return out; }
    while (s.Step() == SQLITE_ROW)
      out.views.push_back({s.Text(0), s.Text(1), s.Int(2), s.Text(3), DecodeParams(s.Text(4))});
  }
  Stmt st(m_db, "SELECT key, value FROM layout_state");
  if (!st.ok()) { Fail("load layout"); return out; }
  while (st.Step() == SQLITE_ROW) {
    const std::string key = st.Text(0);
    if (key == "geometry") out.windowGeometry = st.Text(1);
    else if (key == "state") out.windowState = st.Text(1);
    else if (key == "active") out.activeView = st.Text(1);
  }
  return out;
}

bool Store::SaveLayout(const SavedLayout& layout) {
  Transaction tx(*this);
  if (!tx.open() || !Exec("DELETE FROM layout_views") || !Exec("DELETE FROM layout_state")) return false;
  Stmt ins(m_db,
           "INSERT INTO layout_views(position, class_name, object_name, product_id, instrument_code, params) "
           "VALUES(?, ?, ?, ?, ?, ?)");
  if (!ins.ok()) return Fail("save layout");
  std::int64_t position = 0;
  for (const auto& v : layout.views)
    if (!ins.Bind(1, position++).Bind(2, v.className).Bind(3, v.objectName).Bind(4, v.productId)
             .Bind(5, v.instrumentCode).Bind(6, EncodeParams(v.params)).Run())
      return Fail("save layout");
  Stmt st(m_db, "INSERT INTO layout_state(key, value) VALUES(?, ?)");
  if (!st.ok()) return Fail("save layout");
  if (!st.Bind(1, std::string("geometry")).BindBlob(2, layout.windowGeometry).Run() ||
      !st.Bind(1, std::string("state")).BindBlob(2, layout.windowState).Run() ||
      !st.Bind(1, std::string("active")).BindBlob(2, layout.activeView).Run())
    return Fail("save layout");
  return tx.Commit();
}

std::vector<OrderRow> Store::LoadOrders(const std::string& session) {
  std::vector<OrderRow> out;
  Stmt s(m_db,
         "SELECT number, session, time, side, product_id, instrument_code, quantity, price, type, validity, "
         "trigger_type, status FROM orders WHERE session = ? ORDER BY number");
  if (!s.ok()) { Fail("load orders"); return out; }
  s.Bind(1, session);
  while (s.Step() == SQLITE_ROW)
    out.push_back({s.Int(0), s.Text(1), s.Text(2), s.Text(3), s.Int(4), s.Text(5), s.Int(6), s.Real(7), s.Text(8),
                   s.Text(9), s.Text(10), s.Text(11)});
  return out;
}

bool Store::SaveOrder(const OrderRow& o) {
  Transaction tx(*this);
  if (!tx.open()) return false;
  Stmt up(m_db,
          "INSERT OR REPLACE INTO orders(number, session, time, side, product_id, instrument_code, quantity, price, "
          "type, validity, trigger_type, status) VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)");
  if (!up.ok() || !up.Bind(1, o.number).Bind(2, o.session).Bind(3, o.time).Bind(4, o.side).Bind(5, o.productId)
                       .Bind(6, o.instrumentCode).Bind(7, o.quantity).BindReal(8, o.price).Bind(9, o.type)
                       .Bind(10, o.validity).Bind(11, o.trigger).Bind(12, o.status).Run())
    return Fail("save order");
  return tx.Commit();
}

std::int64_t Store::LastOrderNumber() {
  Stmt s(m_db, "SELECT coalesce(max(number), 0) FROM orders");
  if (!s.ok() || s.Step() != SQLITE_ROW) { Fail("load orders"); return 0; }
  return s.Int(0);
}

std::string EncodeParams(const std::map<std::string, std::string>& params) {
  Json::Value obj(Json::objectValue);
  for (const auto& [k, v] : params) obj[k] = v;
  Json::StreamWriterBuilder w;
  w["indentation"] = "";
  return Json::writeString(w, obj);
}

std::map<std::string, std::string> DecodeParams(const std::string& text) {
  std::map<std::string, std::string> out;
  Json::CharReaderBuilder b;
  std::unique_ptr<Json::CharReader> reader(b.newCharReader());
  Json::Value root;
  std::string errors;
  if (!reader->parse(text.data(), text.data() + text.size(), &root, &errors) || !root.isObject()) return out;
  for (const auto& name : root.getMemberNames())
    if (root[name].isString()) out[name] = root[name].asString();
  return out;
}

}  // namespace term
