#pragma once
// A stand-in for an add-on view: records every notification the terminal
// delivers, decoding the records while they are valid, and sends requests the
// way the views do.
#include <QApplication>
#include <QDir>
#include <deque>
#include <memory>
#include <functional>
#include <string>
#include <vector>

#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"
#include "hostview/MessageIds.h"
#include "hostview/Records.h"
#include "hostview/SuperBaseView.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"

inline void EnsureApp() {
  static int argc = 1;
  static char name[] = "host_runtime_tests";
  static char* argv[] = {name, nullptr};
  if (!QApplication::instance()) new QApplication(argc, argv);
  platform::UseVirtualClock();
}

class RecordingView : public CSuperBaseView {
 public:
  explicit RecordingView(const char* className) {
    rc_.m_lpszClassName = className;
    rc_.m_pBaseClass = &CSuperBaseView::classCSuperBaseView;
  }
  const CRuntimeClass* GetRuntimeClass() const override { return &rc_; }

  struct Note {
    UINT msg = 0;
    LPARAM word = 0;
    FieldUpdate update;
    std::wstring wtext;
    std::string text;
    std::vector<JWatchlistRow> rows610;
    std::vector<JWatchlistIdRow> rows611;
    std::vector<JKeldoWatchlistRow> rows522;
    std::vector<JTop30Group> groups;
    std::vector<PriceAlertItem> alerts;
    std::vector<JMarketInfo> info;
    std::vector<JSector> sectors;
    PriceAlertItem alert;
    JPriceInformation price;
    const JInstrumentUnderlying* instrument = nullptr;
    std::size_t count = 0;
  };

  std::uint32_t OnHostMessage(UINT msg, LPARAM data) override {
    Note n;
    n.msg = msg;
    n.word = data;
    switch (msg) {
      case hm::FieldValue: case hm::RequestField: case hm::InstrumentFieldUpdate:
        n.update = *FromLParam<FieldUpdate>(data);
        break;
      case hm::TextByKey: case hm::MessageText: case hm::LinkedInstrument: n.wtext = *FromLParam<std::wstring>(data); break;
      case hm::SystemParameter: case hm::NoticeParameter: n.text = *FromLParam<std::string>(data); break;
      case hm::LinkData: {
        auto* l = FromLParam<ViewLink>(data);
        n.wtext = l->link ? *l->link : std::wstring();
        n.text = std::string(l->className.begin(), l->className.end());
        break;
      }
      case hm::WatchlistList: n.rows610 = *FromLParam<std::vector<JWatchlistRow>>(data); break;
      case hm::SaveWatchlistNames: n.rows611 = *FromLParam<std::vector<JWatchlistIdRow>>(data); break;
      case hm::WatchlistRows522: n.rows522 = *FromLParam<std::vector<JKeldoWatchlistRow>>(data); break;
      case hm::WatchlistGroups520: case hm::WatchlistGroups521: n.groups = *FromLParam<std::vector<JTop30Group>>(data); break;
      case hm::Alert701: n.alerts = *FromLParam<std::vector<PriceAlertItem>>(data); break;
      case hm::Alert705: n.alert = *FromLParam<PriceAlertItem>(data); break;
      case hm::MarketInfo: n.info = *FromLParam<std::vector<JMarketInfo>>(data); break;
      case hm::Sectors: n.sectors = *FromLParam<std::vector<JSector>>(data); break;
      case hm::AlertBoardRequest: n.price = *FromLParam<JPriceInformation>(data); break;
      case hm::FindByChartCode: case hm::FindByCode: n.instrument = FromLParam<JInstrumentUnderlying>(data); break;
      case hm::InstrumentList: n.count = std::size_t(FromLParam<JInstrumentListMsg>(data)->count); break;
      case hm::ExchangeList: n.count = std::size_t(FromLParam<JExchangeListMsg>(data)->count); break;
      case hm::ProductList: n.count = std::size_t(FromLParam<JProductListMsg>(data)->count); break;
      case hm::PriceBands: n.count = std::size_t(FromLParam<JTickBandList>(data)->count); break;
      case hm::RemarkMessages: n.count = FromLParam<std::vector<JRemarkMessage>>(data)->size(); break;
      default: break;
    }
    notes.push_back(std::move(n));
    if (onNote) onNote(notes.back());
    return 1;
  }

  // Requests as the views send them.
  void Send(UINT msg, LPARAM data = 0) { SendChildFeedback(msg, data); }
  void Field(UINT msg, std::int64_t pid, const std::string& code, const std::string& field, int param = 0, int kind = 0) {
    FieldRequest r;
    r.productId = pid;
    r.instrumentCode = code;
    r.fieldName = field;
    r.param = param;
    r.kind = kind;
    SendChildFeedback(msg, ToLParam(&r));
  }
  // The three batches of a newly shown instrument.
  void Subscribe(std::int64_t pid, const std::string& code, const std::vector<std::string>& fields, int kind3 = 0, int param3 = 0) {
    for (const auto& f : fields) Field(hm::WithdrawField, pid, code, f);
    Field(hm::WithdrawField, pid, code, "PMP_Submit");
    std::string joined;
    for (const auto& f : fields) { Field(hm::RequestField, pid, code, f); joined += (joined.empty() ? "" : ",") + f; }
    Field(hm::FetchFields, pid, code, joined);
    for (const auto& f : fields) Field(hm::RequestField, pid, code, f, param3, kind3);
    Field(hm::RequestField, pid, code, "PMP_Submit", param3, kind3);
  }
  std::string Ask(UINT msg, const std::string& key) {
    std::string k = key;
    const std::size_t before = notes.size();
    SendChildFeedback(msg, ToLParam(&k));
    if (notes.size() == before) return "<no answer>";
    const Note& n = notes.back();
    return n.msg == msg ? (n.text.empty() ? std::string(n.wtext.begin(), n.wtext.end()) : n.text) : "<other answer>";
  }

  std::vector<const Note*> Of(UINT msg) const {
    std::vector<const Note*> out;
    for (const auto& n : notes) if (n.msg == msg) out.push_back(&n);
    return out;
  }
  void Clear() { notes.clear(); }

  std::vector<Note> notes;
  std::function<void(const Note&)> onNote;

 private:
  CRuntimeClass rc_;
};

// A shell that records what the terminal asked of it and opens recording views.
class RecordingShell : public term::IHostShell {
 public:
  term::HostRuntime* runtime = nullptr;
  std::vector<std::unique_ptr<RecordingView>> opened;
  std::vector<std::pair<std::wstring, std::wstring>> foreignLinks;
  std::vector<std::wstring> notices;
  std::vector<std::wstring> titles;
  std::vector<std::pair<int, int>> sizes;

  CSuperBaseView* OpenView(const std::wstring& className, CSuperBaseView*) override {
    const std::string cls(className.begin(), className.end());
    if (cls.rfind("CTrade", 0) == 0 && cls != "CTradeSummaryAdv") return nullptr;  // a trade ticket: not an add-on view
    if (cls == "CBranticChartView" || cls == "CInsExpViewEx") return nullptr;
    names.push_back(cls);
    opened.push_back(std::make_unique<RecordingView>(names.back().c_str()));
    runtime->AttachView(opened.back().get());
    return opened.back().get();
  }
  void ForeignLink(const std::wstring& cls, const std::wstring& text, CSuperBaseView*) override { foreignLinks.push_back({cls, text}); }
  void ShowNotice(const std::wstring&, const std::wstring& text) override { notices.push_back(text); }
  void ViewTitleChanged(CSuperBaseView*, const std::wstring& t) override { titles.push_back(t); }
  void ViewSizeRequested(CSuperBaseView*, int w, int h) override { sizes.push_back({w, h}); }

 private:
  std::deque<std::string> names;
};

// A runtime with a small market, a recording shell and an in-memory store.
struct Harness {
  Harness(std::uint64_t seed = 42, term::MemoryHostStore* sharedStore = nullptr) {
    EnsureApp();
    term::HostOptions o;
    o.seed = seed;
    o.instruments = 800;
    o.logToStderr = false;
    o.imageDir = QDir::tempPath().toStdString() + "/host-runtime-tests-images";
    runtime = std::make_unique<term::HostRuntime>(o, &shell, sharedStore ? sharedStore : &store);
    shell.runtime = runtime.get();
    now = platform::UseVirtualClock().Now();
  }
  RecordingView& View(const char* cls) {
    views.push_back(std::make_unique<RecordingView>(cls));
    runtime->AttachView(views.back().get());
    return *views.back();
  }
  void Pump(std::uint32_t ms) {
    for (std::uint32_t k = 0; k < ms; k += 100) {
      now += 100;
      runtime->Pump(now);
    }
  }
  // The most active equity with full access.
  int Busy() {
    sim::Market& m = runtime->Market();
    int best = -1, trades = -1;
    for (int i = 0; i < int(m.Instruments().size()); ++i) {
      const auto& r = m.Instruments()[i];
      if (r.productType != "ES" || r.exchangeCode == "WIDX" || r.accessStatus != 3) continue;
      if (m.QuoteOf(i).trades > trades) { trades = m.QuoteOf(i).trades; best = i; }
    }
    return best;
  }
  const JInstrumentUnderlying& Ins(int i) { return runtime->Market().Instruments()[std::size_t(i)]; }

  term::MemoryHostStore store;
  RecordingShell shell;
  std::unique_ptr<term::HostRuntime> runtime;
  std::vector<std::unique_ptr<RecordingView>> views;
  std::uint32_t now = 0;
};
