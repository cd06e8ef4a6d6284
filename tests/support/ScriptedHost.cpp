#include "mvtest/ScriptedHost.h"

#include <dlfcn.h>
#include <unistd.h>

#include <QApplication>
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <type_traits>

namespace mvtest {
namespace {

// A ViewLink and a bare wide class name can both arrive with 200; the record
// starts with its class name, so the word can be read as a name first.
static_assert(std::is_standard_layout_v<ViewLink>, "ViewLink must start with its class name");

void EnsureApplication() {
  if (QApplication::instance()) return;
  // Tests never open real windows, whoever runs them.
  if (!std::getenv("QT_QPA_PLATFORM")) setenv("QT_QPA_PLATFORM", "offscreen", 1);
  static int argc = 1;
  static char name[] = "mv-tests";
  static char* argv[] = {name, nullptr};
  static QApplication* app = new QApplication(argc, argv);  // lives for the process
  (void)app;
}

platform::RecordingDialogService& InstallDialogs() {
  auto service = std::make_unique<platform::RecordingDialogService>();
  auto* raw = service.get();
  platform::SetDialogService(std::move(service));
  return *raw;
}

FakeLogFactory& SharedLogFactory() {
  static FakeLogFactory* factory = new FakeLogFactory;  // never freed: loggers stay valid
  factory->lines.clear();
  factory->created = 0;
  return *factory;
}

}  // namespace

// ---- AddonLibrary ------------------------------------------------------------

namespace {
bool& FreshCopyWanted() {
  static bool wanted = false;
  return wanted;
}
}  // namespace

AddonLibrary& AddonLibrary::Get() {
  static std::vector<std::unique_ptr<AddonLibrary>> copies;  // never unloaded
  if (copies.empty() || FreshCopyWanted()) {
    copies.push_back(std::unique_ptr<AddonLibrary>(new AddonLibrary(int(copies.size()))));
    FreshCopyWanted() = false;
  }
  return *copies.back();
}

void AddonLibrary::StartFresh() { FreshCopyWanted() = true; }

// MV_ADDON, else lib/libmarketviews.so next to the test's folder (<build>/tests/..).
static std::string AddonPath() {
  if (const char* path = std::getenv("MV_ADDON"); path && *path) return path;
  char exe[4096];
  const ssize_t n = readlink("/proc/self/exe", exe, sizeof exe - 1);
  if (n <= 0) return {};
  std::string dir(exe, static_cast<std::size_t>(n));
  dir.erase(dir.find_last_of('/'));
  return dir + "/../lib/libmarketviews.so";
}

// A copy of `path` in the temporary folder; empty on failure.
static std::string CopyOf(const std::string& path, int copy) {
  std::error_code ec;
  const std::filesystem::path dir = std::filesystem::temp_directory_path(ec);
  if (ec) return {};
  const std::string to =
      (dir / ("mvtest-addon-" + std::to_string(getpid()) + "-" + std::to_string(copy) + ".so")).string();
  if (!std::filesystem::copy_file(path, to, std::filesystem::copy_options::overwrite_existing, ec)) return {};
  return to;
}

AddonLibrary::AddonLibrary(int copy) {
  m_path = AddonPath();
  if (m_path.empty()) {
    m_error = "MV_ADDON is not set and the test's own path is unknown";
    return;
  }
  // The first copy is the file itself; later ones are copies of it, removed
  // once loaded.
  const std::string file = copy == 0 ? m_path : CopyOf(m_path, copy);
  if (file.empty()) {
    m_error = "cannot copy " + m_path + " to the temporary folder";
    return;
  }
  const char* path = file.c_str();
  // As the terminal loads it: resolve everything now, keep the symbols private.
  void* handle = dlopen(path, RTLD_NOW | RTLD_LOCAL);
  if (copy != 0) std::remove(path);
  if (!handle) {
    const char* err = dlerror();
    m_error = err ? err : "dlopen failed";
    return;
  }
  m_entry = reinterpret_cast<Entry>(dlsym(handle, "GetBaseViewPointer"));
  if (!m_entry) m_error = "GetBaseViewPointer not found";
}

const CRuntimeClass* AddonLibrary::Find(const char* className) const {
  return m_entry ? m_entry(className) : nullptr;
}

// ---- ScriptedHost ------------------------------------------------------------

ScriptedHost::ScriptedHost()
    : logs(SharedLogFactory()), clock((EnsureApplication(), platform::UseVirtualClock())), dialogs(InstallDialogs()) {
  AddonLibrary::StartFresh();
}

ScriptedHost::~ScriptedHost() {
  while (!m_views.empty()) Destroy(m_views.back());
}

void ScriptedHost::Wire(CSuperBaseView* view) {
  view->SetHost(this);
  view->SetStyleManager(&style);
  view->SetStyleID(styleId);
  view->SetAppTitle(appTitle);
  view->SetMenuManager(&menus);
  view->SetLanguage(&language);
  view->SetLog(&logs);
}

CSuperBaseView* ScriptedHost::Create(const std::string& className, std::int64_t productId,
                                     const std::string& instrumentCode, const StartParamMap& params) {
  const CRuntimeClass* descriptor = AddonLibrary::Get().Find(className.c_str());
  if (!descriptor) return nullptr;
  CSuperBaseView* view = descriptor->CreateObject();
  if (!view) return nullptr;
  m_views.push_back(view);
  Wire(view);
  view->SetStartParam(productId, instrumentCode, params);
  view->resize(400, 300);
  view->Create();
  return view;
}

CSuperBaseView* ScriptedHost::Open(const std::string& className) {
  CSuperBaseView* view = Create(className);
  if (view) view->OnHostMessage(hm::Activate, 0);
  return view;
}

CSuperBaseView* ScriptedHost::Adopt(CSuperBaseView* view) {
  if (!view) return nullptr;
  m_views.push_back(view);
  Wire(view);
  view->resize(400, 300);
  view->Create();
  return view;
}

void ScriptedHost::Destroy(CSuperBaseView* view) {
  auto it = std::find(m_views.begin(), m_views.end(), view);
  if (it == m_views.end()) return;
  m_views.erase(it);
  delete view;
}

std::uint32_t ScriptedHost::Send(CSuperBaseView* view, UINT message, LPARAM data) {
  return view ? view->OnHostMessage(message, data) : 0;
}

std::uint32_t ScriptedHost::SendText(CSuperBaseView* view, UINT message, const std::wstring& text) {
  return Send(view, message, ToLParam(&text));
}

std::uint32_t ScriptedHost::SendNarrow(CSuperBaseView* view, UINT message, const std::string& text) {
  return Send(view, message, ToLParam(&text));
}

std::uint32_t ScriptedHost::SendField(CSuperBaseView* view, UINT message, const FieldUpdate& update) {
  return Send(view, message, ToLParam(&update));
}

std::uint32_t ScriptedHost::SendLink(CSuperBaseView* view, const std::wstring& linkText, UINT message) {
  ViewLink link;
  link.className = L"";
  link.flag = 1;
  link.link = &linkText;
  return Send(view, message, ToLParam(&link));
}

std::vector<Feedback> ScriptedHost::RequestsOf(UINT message) const {
  std::vector<Feedback> out;
  for (const auto& f : m_requests)
    if (f.message == message) out.push_back(f);
  return out;
}

std::vector<Feedback> ScriptedHost::RequestsFrom(const CSuperBaseView* view) const {
  std::vector<Feedback> out;
  for (const auto& f : m_requests)
    if (f.view == view) out.push_back(f);
  return out;
}

std::vector<UINT> ScriptedHost::Messages() const {
  std::vector<UINT> out;
  for (const auto& f : m_requests) out.push_back(f.message);
  return out;
}

void ScriptedHost::AnswerText(const std::string& key, std::wstring text, UINT via) {
  m_texts[key] = {std::move(text), via};
}

void ScriptedHost::AnswerSetting(UINT message, const std::string& key, std::string value) {
  m_settings[{message, key}] = std::move(value);
}

void ScriptedHost::AnswerValue(UINT message, LPARAM value) { m_values[message] = value; }

void ScriptedHost::AnswerWith(UINT message, std::function<std::optional<LPARAM>(const Feedback&)> answer) {
  m_answers[message] = std::move(answer);
}

void ScriptedHost::ClearAnswers() {
  m_texts.clear();
  m_settings.clear();
  m_values.clear();
  m_answers.clear();
}

void ScriptedHost::Advance(std::uint32_t ms) {
  clock.Advance(ms);
  platform::ProcessPosted();
}

Feedback ScriptedHost::Decode(CSuperBaseView* view, UINT message, LPARAM data) const {
  Feedback f;
  f.view = view;
  f.message = message;
  f.data = data;
  f.value = data;
  switch (message) {
    case hm::Title:
    case hm::ShortcutContext:
      if (data) f.wtext = *FromLParam<const std::wstring>(data); else f.nullData = true;
      break;
    case hm::TextByKey:
    case hm::SystemParameter:
    case hm::NoticeParameter:
    case hm::MessageText:
      if (data) f.text = *FromLParam<const std::string>(data); else f.nullData = true;
      break;
    case hm::FetchFields:
    case hm::WithdrawField:
    case hm::RequestField:
      if (data) f.field = *FromLParam<const FieldRequest>(data); else f.nullData = true;
      break;
    case hm::ViewSizeRequest:
      if (data) f.size = *FromLParam<const ViewSize>(data); else f.nullData = true;
      break;
    case hm::OpenView:
    case hm::LinkData: {
      if (!data) { f.nullData = true; break; }
      const auto& name = *FromLParam<const std::wstring>(data);
      if (message == hm::OpenView && name == L"CInsExpViewEx") {
        f.wtext = name;
        break;
      }
      const auto& link = *FromLParam<const ViewLink>(data);
      RecordedLink r;
      r.className = link.className;
      r.flag = link.flag;
      r.reserved = link.reserved;
      r.hasLink = link.link != nullptr;
      if (link.link) r.link = *link.link;
      f.link = r;
      break;
    }
    default:
      break;
  }
  if (auto it = m_decoders.find(message); it != m_decoders.end() && data) f.extra = it->second(data);
  return f;
}

void ScriptedHost::OnChildFeedback(CSuperBaseView* view, UINT message, LPARAM data) {
  m_requests.push_back(Decode(view, message, data));
  const Feedback request = m_requests.back();
  if (!view) return;
  switch (message) {
    case hm::TextByKey:
    case hm::MessageText: {
      auto it = m_texts.find(request.text);
      if (it != m_texts.end()) {
        const std::wstring text = it->second.text;
        view->OnHostMessage(it->second.via ? it->second.via : message, ToLParam(&text));
      } else if (m_emptyForMissingText) {
        const std::wstring empty;
        view->OnHostMessage(message, ToLParam(&empty));
      }
      return;
    }
    case hm::SystemParameter:
    case hm::NoticeParameter: {
      auto it = m_settings.find({message, request.text});
      if (it != m_settings.end()) {
        const std::string value = it->second;
        view->OnHostMessage(message, ToLParam(&value));
      }
      return;
    }
    default:
      break;
  }
  if (auto it = m_values.find(message); it != m_values.end()) {
    view->OnHostMessage(message, it->second);
    return;
  }
  if (auto it = m_answers.find(message); it != m_answers.end()) {
    if (auto word = it->second(request)) view->OnHostMessage(message, *word);
  }
}

}  // namespace mvtest
