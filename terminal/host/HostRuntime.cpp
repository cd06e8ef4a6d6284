#include "terminal/host/HostRuntime.h"
#include "terminal/host/WatchlistTransfer.h"

#include <QDir>
#include <QObject>

#include "hostview/MessageIds.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "terminal/host/HostCore.h"
#include "terminal/host/SimSource.h"
#include "terminal/host/TextUtil.h"

namespace term {

struct HostRuntime::Impl : HostCore {};

// ---- Parts shared by the handlers ----------------------------------------------

void HostCore::NotifyWatchlists(int family, CSuperBaseView* except) {
  if (relaying300) return;
  relaying300 = true;
  views.Broadcast(views.Of(kPriceView), hm::WatchlistsLoaded, family, except);
  relaying300 = false;
}

void HostCore::AlertsChanged(UINT msg, CSuperBaseView* except) {
  user->SaveAlerts();
  views.Broadcast(views.Of(nullptr), msg, 0, except);
}

void HostCore::CheckAlerts() {
  bool changed = false;
  for (const AlertFiring& f : user->alerts->Collect(&changed)) {
    ++stats.alertsFired;
    log->Info(f.notice);
    const PriceAlertItem* a = user->alerts->Find(f.alertId);
    if (a && a->viaApp) shell->ShowNotice(options.appTitle, hv::Widen(f.notice));
    if (a && a->viaEmail) log->Info("alert " + std::to_string(f.alertId) + ": e-mail notice queued");
    if (a && a->viaSms) log->Info("alert " + std::to_string(f.alertId) + ": SMS notice queued");
    try {
      store->SaveAlertFiring(f);
    } catch (const std::exception& e) {
      log->Error(std::string("saving an alert firing failed: ") + e.what());
    }
  }
  if (changed) AlertsChanged(hm::Alert703);
}

void HostCore::DropView(CSuperBaseView* v) {
  subscriptions->Drop(v);
  views.Remove(v);
}

namespace {

std::string StartLinkText(const CSuperBaseView* v) {
  std::string data = "\"Field_instrument_code\":\"" + JsonEscape(v->GetStartInstrumentCode()) + "\",\"Field_product_id\":\"" +
                     std::to_string(v->GetStartProductId()) + "\"";
  for (const auto& [key, value] : v->GetStartParams())
    data += ",\"" + JsonEscape(key) + "\":\"" + JsonEscape(hv::Narrow(value)) + "\"";
  return "{\"type\":\"start\",\"data\":[{" + data + "}]}";
}

}  // namespace

// ---- HostRuntime -------------------------------------------------------------

HostRuntime::HostRuntime(const HostOptions& options, IHostShell* shell, IHostStore* store)
    : d(std::make_unique<Impl>()) {
  d->self = this;
  d->options = options;
  d->shell = shell ? shell : &d->noShell;
  d->store = store ? store : &d->memoryStore;
  d->log = std::make_unique<::term::LogFactory>(options.logFile, options.logToStderr);
  d->user = std::make_unique<UserData>(*d->store, *d->log, d->stats);
  d->user->LoadSettings(options.configFile);
  sim::MarketConfig config;
  config.seed = options.seed;
  config.instruments = options.instruments;
  config.fieldUpdatesPerSecond = options.fieldUpdatesPerSecond;
  config.pace = options.pace;
  config.sessionDate = options.sessionDate;
  config.sessionStartSeconds = options.sessionStartSeconds;
  if (options.replay) {
    // The simulator plays the recorded session's day on its seed.
    const SessionInfo& s = options.replay->session;
    config.seed = s.seed;
    config.instruments = s.instruments;
    config.fieldUpdatesPerSecond = s.fieldUpdatesPerSecond;
    config.sessionDate = s.date;
    config.sessionStartSeconds = s.startSeconds;
  }
  config.startTick = platform::TickCount();
  d->market = std::make_unique<sim::Market>(config);
  if (options.replay) {
    auto replay = std::make_unique<ReplaySource>(*options.replay, config.startTick, options.replaySpeed);
    d->replay = replay.get();
    d->marketSource = std::move(replay);
  } else {
    d->marketSource = std::make_unique<SimSource>(*d->market);
  }
  d->source = d->marketSource.get();
  if (options.record) {
    d->recorder = std::make_unique<RecordingSource>(*d->marketSource, options.record);
    d->source = d->recorder.get();
  }
  d->subscriptions = std::make_unique<SubscriptionBook>(*d->source, d->views, *d->log, d->stats);
  d->instrumentNotices = std::make_unique<InstrumentNotices>(*d->source, d->views);
  d->subscriptions->SetChangeObserver([n = d->instrumentNotices.get()](const auto& changed) { n->Note(changed); });
  RegisterAllRequests(d->requests);
  d->language = std::make_unique<LanguageTable>();
  std::string imageDir = options.imageDir;
  if (imageDir.empty()) imageDir = QDir::tempPath().toStdString() + "/terminal-images";
  d->styles = std::make_unique<StyleManager>(imageDir, options.styleId);
  d->styles->DrawAll(StyleManager::kLight);
  d->styles->DrawAll(StyleManager::kDark);
  d->user->LoadListsAndAlerts(*d->market);
  if (d->replay)
    d->log->Info("market: replay of " + d->replay->Path() + ", " + std::to_string(d->source->Instruments().size()) +
                 " instruments, session " + d->source->Session().date + " " + d->source->TimeText());
  else
    d->log->Info("market: " + std::to_string(d->market->Instruments().size()) + " instruments, seed " +
                 std::to_string(options.seed) + ", session " + d->market->DateText() + " " + d->market->TimeText());
  if (d->recorder) d->log->Info("market: recording to " + d->recorder->Writer().Path());
}

HostRuntime::~HostRuntime() {
  d->views.TraceTo(nullptr);
  d->trace.reset();
  FinishRecording();
  d->views.DisconnectAll();
  d->log->Flush();
}

void HostRuntime::SetShell(IHostShell* shell) { d->shell = shell ? shell : &d->noShell; }

CSuperBaseView* HostRuntime::CreateView(const CRuntimeClass* descriptor, QWidget* parent, std::int64_t startProductId,
                                        const std::string& startCode, const StartParamMap& startParams) {
  if (!descriptor) return nullptr;
  CSuperBaseView* v = descriptor->CreateObject();
  if (!v) {
    d->log->Error(std::string("class ") + (descriptor->m_lpszClassName ? descriptor->m_lpszClassName : "?") +
                  " created no view");
    return nullptr;
  }
  if (parent) v->setParent(parent);
  AttachView(v);
  if (ViewDirectory::Entry* rec = d->views.Find(v); rec && descriptor->m_lpszClassName)
    rec->className = descriptor->m_lpszClassName;
  v->SetStartParam(startProductId, startCode, startParams);
  v->Create();
  // Texts and title come from the language table; a view that only sends its
  // title from ApplyLanguage would otherwise stay untitled until a reload.
  v->ApplyLanguage();
  return v;
}

void HostRuntime::AttachView(CSuperBaseView* v) {
  if (!v || d->views.Live(v)) return;
  const CRuntimeClass* rc = v->GetRuntimeClass();
  // A view deleted without DestroyView must not leave dangling entries.
  d->views.Add(v, rc && rc->m_lpszClassName ? rc->m_lpszClassName : "", [this, v] { d->DropView(v); });
  v->SetHost(this);
  v->SetStyleManager(d->styles.get());
  v->SetStyleID(d->styles->GetStyleID());
  v->SetAppTitle(d->options.appTitle);
  v->SetMenuManager(&d->menus);
  v->SetLanguage(d->language.get());
  v->SetLog(d->log.get());
}

void HostRuntime::DestroyView(CSuperBaseView* view, bool deleteIt) {
  if (!view) return;
  d->DropView(view);
  if (deleteIt) delete view;
}

void HostRuntime::Activate(CSuperBaseView* view) {
  ViewDirectory::Entry* rec = d->views.Find(view);
  if (!rec) return;
  rec->active = true;
  const bool first = !rec->activatedOnce;
  rec->activatedOnce = true;
  d->views.Deliver(view, hm::Activate, 0);
  if (first && d->options.linkMode) d->views.Deliver(view, hm::LinkModeFlag, 1);
}

void HostRuntime::Deactivate(CSuperBaseView* view) {
  ViewDirectory::Entry* rec = d->views.Find(view);
  if (!rec) return;
  rec->active = false;
  d->views.Deliver(view, hm::Deactivate, 0);
}

void HostRuntime::DeliverStartLink(CSuperBaseView* view) {
  if (!view || !d->views.Live(view)) return;
  const std::wstring text = hv::Widen(StartLinkText(view));
  ViewLink link;
  link.className = hv::Widen(ClassNameOf(view));
  link.link = &text;
  d->views.Deliver(view, hm::LinkData, ToLParam(&link));
}

std::uint32_t HostRuntime::Deliver(CSuperBaseView* view, UINT message, LPARAM data) {
  return d->views.Deliver(view, message, data);
}

bool HostRuntime::TraceMessages(const std::string& path, std::string& error) {
  auto out = std::make_unique<std::ofstream>(path, std::ios::binary | std::ios::trunc);
  if (!*out) {
    error = "--trace-messages: cannot write " + path;
    return false;
  }
  d->views.TraceTo(out.get());
  d->trace = std::move(out);
  return true;
}

std::vector<CSuperBaseView*> HostRuntime::Views() const { return d->views.Of(nullptr); }

std::string HostRuntime::ClassNameOf(const CSuperBaseView* view) const { return d->views.ClassNameOf(view); }

void HostRuntime::Pump(std::uint32_t now) {
  d->source->AdvanceTo(now);
  // In a replay the simulator keeps the replay's market time.
  if (d->replay) d->market->AdvanceTo(d->market->Config().startTick + std::uint32_t(d->replay->ElapsedMs()));
  if (d->replay && !d->replay->Problem().empty() && !d->replayProblemShown) {
    // The file changed since it was checked: the market stays as it is.
    d->replayProblemShown = true;
    d->log->Error("the replay stops: " + d->replay->Problem());
    d->shell->ShowNotice(d->options.appTitle, hv::Widen("The replay stopped: " + d->replay->Problem()));
  }
  if (d->recorder && !d->recorder->Writer().Ok() && !d->recordingProblemShown) {
    d->recordingProblemShown = true;
    d->log->Error(d->recorder->Writer().Error() + "; the recording stops here");
    d->shell->ShowNotice(d->options.appTitle, hv::Widen("Recording stopped: " + d->recorder->Writer().Error()));
  }
  d->subscriptions->Pump(d->views.Of(nullptr));
  d->instrumentNotices->Deliver();
  // Alerts: crossings were caught while the market moved; notices and saves now.
  d->CheckAlerts();
}

void HostRuntime::PumpNow() { Pump(platform::TickCount()); }

void HostRuntime::ChangeStyle(int styleId) {
  d->styles->SetStyleID(styleId);
  d->styles->DrawAll(d->styles->GetStyleID());
  for (CSuperBaseView* v : d->views.Of(nullptr)) {
    if (!d->views.Live(v)) continue;
    v->SetStyleID(d->styles->GetStyleID());
    v->ChangeStyle(d->styles->GetStyleID());
  }
}

void HostRuntime::ApplyLanguage() {
  for (CSuperBaseView* v : d->views.Of(nullptr))
    if (d->views.Live(v)) v->ApplyLanguage();
}

void HostRuntime::BroadcastSettingsChanged(CSuperBaseView* except) {
  d->views.Broadcast(d->views.Of(nullptr), hm::SettingsChanged, 0, except);
}

void HostRuntime::SetLinkMode(bool on) {
  d->options.linkMode = on ? 1 : 0;
  d->views.Broadcast(d->views.Of(nullptr), hm::LinkModeFlag, on ? 1 : 0);
}

void HostRuntime::LinkInstrument(std::int64_t productId, const std::string& code) {
  const std::wstring text = hv::Widen("{\"type\":\"trade view\",\"data\":[{\"Field_instrument_code\":\"" + JsonEscape(code) +
                                      "\",\"Field_product_id\":\"" + std::to_string(productId) + "\"}]}");
  for (CSuperBaseView* v : d->views.Of(nullptr))
    if (IsSingleInstrumentView(ClassNameOf(v))) d->views.Deliver(v, hm::LinkedInstrument, ToLParam(&text));
}

void HostRuntime::ShowFontSizeMenu(CSuperBaseView* view) { d->views.Deliver(view, hm::FontSizeMenu, 0); }

ILanguage& HostRuntime::Language() { return *d->language; }
IStyleManager& HostRuntime::Styles() { return *d->styles; }
ILogFactory& HostRuntime::LogFactory() { return *d->log; }
IMenuManager& HostRuntime::Menus() { return d->menus; }
HostSettings& HostRuntime::Settings() { return d->user->settings; }

void HostRuntime::SaveSetting(const std::string& key, const std::string& value) {
  d->user->SaveSetting(key, value);
  BroadcastSettingsChanged();
}

sim::Market& HostRuntime::Market() { return *d->market; }
MarketSource& HostRuntime::Source() { return *d->source; }
ReplaySource* HostRuntime::Replay() { return d->replay; }

bool HostRuntime::FinishRecording(std::string* error) {
  if (!d->recorder) return true;
  if (d->recorder->Finish()) return true;
  if (error) *error = d->recorder->Writer().Error();
  return false;
}

std::wstring HostRuntime::MessageText(const std::string& code) const {
  long long number = 0;
  MessageTexts::CodeOf(code, &number);
  const JProduct* p = d->source->FindProduct(number);
  return d->messages.Lookup(code, p ? hv::Widen(p->productName) : std::wstring());
}

void HostRuntime::LogInfo(const std::string& line) { d->log->Info(line); }
std::string HostRuntime::ImageDir() const { return d->styles->ImageDir(); }

std::vector<StoredWatchlist> HostRuntime::Watchlists(StoredWatchlist::Kind kind) const {
  return kind == StoredWatchlist::Brand ? d->user->brandLists : d->user->userLists;
}
std::vector<PriceAlertItem> HostRuntime::Alerts() const { return d->user->alerts->All(); }

std::string HostRuntime::ExportWatchlists() const { return WatchlistsText(d->user->userLists, *d->market); }

std::vector<std::string> HostRuntime::ImportWatchlists(const std::string& text) {
  WatchlistImport import = ReadWatchlistsText(text, d->user->userLists, *d->market, d->user->settings);
  if (!import.Ok()) {
    d->log->Warn("watchlist import refused: " + std::to_string(import.problems.size()) + " problem(s), first: " +
                 import.problems.front());
    return import.problems;
  }
  const std::size_t added = import.lists.size();
  d->user->AddUserLists(std::move(import.lists));
  d->log->Info("watchlist import: " + std::to_string(added) + " watchlist(s) added");
  // The price views take the lists as a 610 reply; the leading one then tells the others (300).
  const std::vector<JWatchlistRow> rows = d->user->UserRows();
  d->views.Broadcast(d->views.Of(kPriceView), hm::WatchlistList, ToLParam(&rows));
  return {};
}
HostStats HostRuntime::Stats() const { return d->stats; }

void HostRuntime::SetPushObserver(std::function<void(CSuperBaseView*)> observer) {
  d->subscriptions->SetPushObserver(std::move(observer));
}

std::vector<int> HostRuntime::QuoteInstruments() const { return d->subscriptions->QuoteInstruments(); }

// Every request goes through the table (terminal/host/requests/).
void HostRuntime::OnChildFeedback(CSuperBaseView* v, UINT msg, LPARAM data) {
  const ViewDirectory::Entry* rec = d->views.Find(v);
  if (!rec) {
    d->log->Warn("request " + std::to_string(msg) + " from a view the terminal does not know; ignored");
    return;
  }
  ++d->stats.requests;
  const RequestHandler* handler = d->requests.Find(msg);
  if (!handler) {
    d->log->Warn("request " + std::to_string(msg) + " from " + rec->className + " is not one the terminal knows");
    return;
  }
  (*handler)(Request{*d, v, msg, data});
}

}  // namespace term
