#include "addon/AddonView.h"

#include <fmt/format.h>

#include <cstdarg>
#include <cstdio>
#include <set>

#include "addon/Channel.h"
#include "addon/Logging.h"
#include "addon/TextTables.h"
#include "data/ProcessState.h"
#include "hostview/Records.h"
#include "hostview/Text.h"

namespace {

// Classes that have run their first PrepareBasicData in this process.
std::set<std::string>& PreparedClasses() {
  static std::set<std::string> classes;
  static const bool hook = mvd::OnResetForTests([] { classes.clear(); });
  (void)hook;
  return classes;
}

// The display mode of the first accepted 519 answer in the process.
int& ProcessDisplayMode() {
  static int mode = 0;
  static const bool hook = mvd::OnResetForTests([] { mode = 0; });
  (void)hook;
  return mode;
}

bool IsDisplayMode(LPARAM value) { return value == 1 || value == 101; }

}  // namespace

CAddonView::CAddonView(const addon::ViewClassInfo& info, QWidget* parent) : CSuperBaseView(parent), m_info(info) {
  setObjectName(QString::fromUtf8(info.className));
}

CAddonView::~CAddonView() = default;

std::wstring CAddonView::ClassNameW() const { return hv::Widen(m_info.className ? m_info.className : ""); }

std::uint32_t CAddonView::OnHostMessage(UINT message, LPARAM data) {
  if (data == 0 && addon::IsPointerMessage(message)) return 0;
  switch (message) {
    case hm::Deactivate:
      OnDeactivate();
      return 0;
    case hm::Activate:
      OnActivate();
      return 0;
    case hm::TextByKey:
    case hm::MessageText:
      m_lastMessageText = *FromLParam<const std::wstring>(data);
      return 0;
    case hm::SystemParameter:
    case hm::NoticeParameter:
      // An answer with no request of ours pending names no key: nothing to file.
      if (!m_pendingSettingKey.empty()) {
        addon::SettingTextTable::Instance().Set(m_pendingSettingKey,
                                                hv::Widen(*FromLParam<const std::string>(data)));
        m_settingAnswered = true;
      }
      return 0;
    case hm::DisplayMode:
      if (IsDisplayMode(data)) {
        m_displayMode = static_cast<int>(data);
        if (ProcessDisplayMode() == 0) ProcessDisplayMode() = m_displayMode;
      }
      return 0;
    case hm::LinkModeFlag:
      if (data == 0 || data == 1) {
        m_linkMode = data == 1;
        SendChildFeedback(hm::LinkModeFlag, data);
      }
      return 0;
    case hm::AltStatus:
      m_useAltStatus = data == 1 || data == 2;
      return 0;
    default:
      return OnViewMessage(message, data);
  }
}

void CAddonView::SetAppTitle(std::wstring title) { CSuperBaseView::SetAppTitle(std::move(title)); }

void CAddonView::ApplyLanguage() {
  std::wstring title = m_info.titleEntry ? LanguageText(m_info.titleEntry) : std::wstring();
  if (title.empty()) title = m_info.defaultTitle ? m_info.defaultTitle : L"";
  SendTitle(title);
}

void CAddonView::OnActivate() {
  PrepareBasicData();
  m_active = true;
}

void CAddonView::OnDeactivate() {
  PrepareBasicData();
  m_active = false;
}

std::wstring CAddonView::LookupMessageText(const std::string& code, std::int64_t number) {
  const std::string key = fmt::format("{}, {}", code, number);
  if (auto it = m_messageTexts.find(key); it != m_messageTexts.end()) return it->second;
  m_lastMessageText.clear();
  SendChildFeedback(hm::MessageText, ToLParam(&key));
  if (m_lastMessageText.empty()) return hv::Widen(key);
  m_messageTexts[key] = m_lastMessageText;
  return m_lastMessageText;
}

std::wstring CAddonView::RequestTextByKey(const std::string& key) {
  m_lastMessageText.clear();
  SendChildFeedback(hm::TextByKey, ToLParam(&key));
  return m_lastMessageText;
}

bool CAddonView::RequestSetting(UINT message, const std::string& key) {
  if (key.empty()) return false;
  m_pendingSettingKey = key;
  m_settingAnswered = false;
  SendChildFeedback(message, ToLParam(&key));
  m_pendingSettingKey.clear();
  return m_settingAnswered;
}

int CAddonView::QueryDisplayMode() {
  if (ProcessDisplayMode() == 0) SendChildFeedback(hm::DisplayMode, 1);
  if (m_displayMode == 0) m_displayMode = ProcessDisplayMode();
  return m_displayMode;
}

bool CAddonView::QueryAltStatus() {
  m_useAltStatus = false;
  SendChildFeedback(hm::AltStatus, 0);
  return m_useAltStatus;
}

std::wstring CAddonView::LanguageText(int entry) const {
  return m_pLanguage ? m_pLanguage->GetText(addon::kLanguageSection, entry) : std::wstring();
}

void CAddonView::SendTitle(const std::wstring& title) {
  m_title = title;
  SendChildFeedback(hm::Title, ToLParam(&m_title));
}

int CAddonView::ShowMessage(const std::wstring& text, platform::Icon icon, platform::Buttons buttons) {
  return platform::Dialogs().MessageBox(this, QString::fromStdWString(m_appTitle), QString::fromStdWString(text),
                                        icon, buttons);
}

int CAddonView::ShowMessageText(const std::string& code, std::int64_t number) {
  return ShowMessage(LookupMessageText(code, number));
}

void CAddonView::LogInfo(const char* function, const char* file, int line) const {
  addon::LogInfo(ClassNameW(), function, file, line);
}

void CAddonView::LogLine(const char* format, ...) const {
  if (!format || !addon::FindLogger(ClassNameW())) return;
  va_list args;
  va_start(args, format);
  const std::string text = hv::FormatV(format, args);
  va_end(args);
  addon::LogLine(ClassNameW(), "%s", text.c_str());
}

void CAddonView::RegisterLogger() {
  if (m_loggerRegistered || !m_pLogFactory) return;
  if (ILogger* logger = m_pLogFactory->CreateLogger()) {
    addon::RegisterLogger(ClassNameW(), logger);
    m_loggerRegistered = true;
  }
}

void CAddonView::PrepareBasicData() {
  RegisterLogger();
  const std::string function = std::string(m_info.className) + "::PrepareBasicData";
  LogInfo(function.c_str(), m_info.sourceFile, __LINE__);
  const std::string className = m_info.className ? m_info.className : "";
  if (PreparedClasses().insert(className).second) {
    for (const auto& request : m_info.firstSettings) RequestSetting(request.message, request.key);
    for (const auto store : m_info.firstStores)
      if (!addon::IsStoreLoaded(store)) SendChildFeedback(addon::RequestFor(store), 0);
  }
  LogInfo(function.c_str(), m_info.sourceFile, __LINE__);
}

bool CAddonView::HasPreparedClass(const std::string& className) { return PreparedClasses().count(className) != 0; }

void CAddonView::SendViewSize(int width, int height) {
  ViewSize size;
  size.width = width;
  size.height = height;
  SendChildFeedback(hm::ViewSizeRequest, ToLParam(&size));
}
