#include "terminal/host/HostRuntime.h"

#include "terminal/sim/Market.h"

namespace term {

struct HostRuntime::Impl {
  HostOptions options;
  IHostShell* shell = nullptr;
  MemoryHostStore memoryStore;
  IHostStore* store = nullptr;
  HostSettings settings;
  std::unique_ptr<sim::Market> market;
};

HostRuntime::HostRuntime(const HostOptions& options, IHostShell* shell, IHostStore* store) : d(std::make_unique<Impl>()) {
  d->options = options;
  d->shell = shell;
  d->store = store ? store : &d->memoryStore;
  sim::MarketConfig config;
  d->market = std::make_unique<sim::Market>(config);
}
HostRuntime::~HostRuntime() = default;
void HostRuntime::SetShell(IHostShell* shell) { d->shell = shell; }
CSuperBaseView* HostRuntime::CreateView(const CRuntimeClass*, QWidget*, std::int64_t, const std::string&, const StartParamMap&) { return nullptr; }
void HostRuntime::AttachView(CSuperBaseView* view) { if (view) view->SetHost(this); }
void HostRuntime::DestroyView(CSuperBaseView* view, bool deleteIt) { if (deleteIt) delete view; }
void HostRuntime::Activate(CSuperBaseView* view) { if (view) view->OnHostMessage(2, 0); }
void HostRuntime::Deactivate(CSuperBaseView* view) { if (view) view->OnHostMessage(1, 0); }
void HostRuntime::DeliverStartLink(CSuperBaseView*) {}
std::vector<CSuperBaseView*> HostRuntime::Views() const { return {}; }
std::string HostRuntime::ClassNameOf(const CSuperBaseView*) const { return {}; }
void HostRuntime::Pump(std::uint32_t now) { d->market->AdvanceTo(now); }
void HostRuntime::PumpNow() {}
void HostRuntime::ChangeStyle(int) {}
void HostRuntime::ApplyLanguage() {}
void HostRuntime::BroadcastSettingsChanged(CSuperBaseView*) {}
void HostRuntime::SetLinkMode(bool) {}
void HostRuntime::LinkInstrument(std::int64_t, const std::string&) {}
void HostRuntime::ShowFontSizeMenu(CSuperBaseView*) {}
HostSettings& HostRuntime::Settings() { return d->settings; }
sim::Market& HostRuntime::Market() { return *d->market; }
std::wstring HostRuntime::MessageText(const std::string&) const { return {}; }
void HostRuntime::LogInfo(const std::string&) {}
std::string HostRuntime::ImageDir() const { return {}; }
std::vector<StoredWatchlist> HostRuntime::Watchlists(StoredWatchlist::Kind) const { return {}; }
std::vector<PriceAlertItem> HostRuntime::Alerts() const { return {}; }
HostStats HostRuntime::Stats() const { return {}; }
void HostRuntime::OnChildFeedback(CSuperBaseView*, UINT, LPARAM) {}

HostSettings::HostSettings() = default;
bool HostSettings::LoadFile(const std::string&, std::string*) { return false; }
void HostSettings::Set(const std::string& key, const std::string& value) { values_[key] = value; }
std::string HostSettings::Get(const std::string& key) const { auto it = values_.find(key); return it == values_.end() ? std::string() : it->second; }
bool HostSettings::Has(const std::string& key) const { return values_.count(key) != 0; }
int HostSettings::GetInt(const std::string& key, int fallback) const { try { return std::stoi(Get(key)); } catch (...) { return fallback; } }

bool MemoryHostStore::LoadWatchlists(std::vector<StoredWatchlist>& out) { out = watchlists; return watchlistsSaved; }
void MemoryHostStore::SaveWatchlists(StoredWatchlist::Kind kind, const std::vector<StoredWatchlist>& lists) {
  std::vector<StoredWatchlist> kept;
  for (auto& w : watchlists) if (w.kind != kind) kept.push_back(w);
  for (auto& w : lists) kept.push_back(w);
  watchlists = std::move(kept);
  watchlistsSaved = true;
  ++saveCount;
}
bool MemoryHostStore::LoadAlerts(std::vector<PriceAlertItem>& out) { out = alerts; return alertsSaved; }
void MemoryHostStore::SaveAlerts(const std::vector<PriceAlertItem>& a) { alerts = a; alertsSaved = true; ++saveCount; }
std::map<std::string, std::string> MemoryHostStore::LoadSettings() { return settings; }
void MemoryHostStore::SaveSetting(const std::string& key, const std::string& value) { settings[key] = value; ++saveCount; }

}  // namespace term

namespace term {
namespace {
class StubLanguage : public ILanguage { public: std::wstring GetText(int, int) const override { return {}; } };
class StubStyles : public IStyleManager {
 public:
  int GetStyleID() const override { return 1; }
  COLORREF GetColor(int) const override { return MakeColorRef(128, 128, 128); }
  QFont GetFont(int) const override { return QFont(); }
  std::wstring ResolveImagePath(const std::wstring&, int) const override { return {}; }
};
class StubLogger : public ILogger { public: void Log(int, const char*, ...) override {} };
class StubLogFactory : public ILogFactory { public: ILogger* CreateLogger() override { static StubLogger l; return &l; } };
class StubMenus : public IMenuManager { public: int MenuCount() const override { return 0; } };
}  // namespace
ILanguage& HostRuntime::Language() { static StubLanguage s; return s; }
IStyleManager& HostRuntime::Styles() { static StubStyles s; return s; }
ILogFactory& HostRuntime::LogFactory() { static StubLogFactory s; return s; }
IMenuManager& HostRuntime::Menus() { static StubMenus s; return s; }
}  // namespace term
