#include "addon/AddonView.h"

#include <fmt/format.h>

#include <QKeyEvent>
#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <set>

#include "addon/Channel.h"
#include "addon/Logging.h"
#include "addon/TextTables.h"
#include "data/MarketDelayCache.h"
#include "data/ProcessState.h"
#include "data/ReferenceStores.h"
#include "hostview/HostLists.h"
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

// "Class::Function" out of a compiler's function signature
// ("virtual void CPriceViewAdv::OnActivate()" -> "CPriceViewAdv::OnActivate").
std::string QualifiedName(const char* signature) {
  std::string_view text = signature ? signature : "";
  text = text.substr(0, text.find('('));
  if (const auto space = text.rfind(' '); space != std::string_view::npos) text.remove_prefix(space + 1);
  return std::string(text);
}

}  // namespace

// One question inside SendChildFeedback: the answer numbers it takes.
struct CAddonView::Question {
  std::vector<UINT> answers;
  std::function<void(LPARAM)> take;
  Question* outer = nullptr;
  bool Takes(UINT message) const { return std::find(answers.begin(), answers.end(), message) != answers.end(); }
};

CAddonView::CAddonView(const addon::ViewClassInfo& info, QWidget* parent) : CSuperBaseView(parent), m_info(info) {
  setObjectName(QString::fromUtf8(info.className ? info.className : ""));
}

CAddonView::~CAddonView() = default;

std::wstring CAddonView::ClassNameW() const { return hv::Widen(m_info.className ? m_info.className : ""); }

std::uint32_t CAddonView::OnHostMessage(UINT message, LPARAM data) {
  if (data == 0 && addon::IsPointerMessage(message)) return 0;
  if (m_question && m_question->Takes(message)) {
    m_question->take(data);
    return 0;
  }
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
      // Outside a question the answer names no key: nothing to file.
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
    case hm::FindByChartCode:
    case hm::FindByCode:
      // Only meaningful as the answer to a question.
      return 0;
    case hm::InstrumentList:
    case hm::ExchangeList:
    case hm::ProductList:
    case hm::MarketInfo:
      FileList(message, data);
      return OnViewMessage(message, data);
    default:
      return OnViewMessage(message, data);
  }
}

void CAddonView::FileList(UINT message, LPARAM data) {
  switch (message) {
    case hm::InstrumentList:
      InstrumentMgr_ReadOnly().Fill(FromLParam<const JInstrumentListMsg>(data)->instruments);
      break;
    case hm::ExchangeList:
      if (const auto* list = FromLParam<const JExchangeListMsg>(data)->exchanges) ExchangeMgr().Fill(*list);
      break;
    case hm::ProductList:
      if (const auto* list = FromLParam<const JProductListMsg>(data)->products) ProductMgr().Fill(*list);
      break;
    case hm::MarketInfo: {
      // The first row is the exchange asked for; an empty list: unknown exchange.
      const auto& rows = *FromLParam<const std::vector<JMarketInfo>>(data);
      if (!rows.empty())
        MarketDelayCache::Instance().SetDelay(rows[0].productId, hv::Widen(rows[0].exchangeCode), rows[0].delay);
      break;
    }
    default:
      break;
  }
}

void CAddonView::AskHost(UINT message, LPARAM data, std::initializer_list<UINT> answers,
                         std::function<void(LPARAM)> take) {
  Question question;
  question.answers.assign(answers.begin(), answers.end());
  if (question.answers.empty()) question.answers.push_back(message);
  question.take = std::move(take);
  question.outer = m_question;
  m_question = &question;
  SendChildFeedback(message, data);
  m_question = question.outer;
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

// ---- Questions ---------------------------------------------------------------

std::wstring CAddonView::LookupMessageText(const std::string& code, std::int64_t number) {
  const std::string key = fmt::format("{}, {}", code, number);
  if (auto it = m_messageTexts.find(key); it != m_messageTexts.end()) return it->second;
  m_lastMessageText = Ask<std::wstring>(hm::MessageText, ToLParam(&key), {hm::TextByKey, hm::MessageText})
                          .value_or(std::wstring());
  if (m_lastMessageText.empty()) return hv::Widen(key);
  m_messageTexts[key] = m_lastMessageText;
  return m_lastMessageText;
}

std::wstring CAddonView::RequestTextByKey(const std::string& key) {
  m_lastMessageText =
      Ask<std::wstring>(hm::TextByKey, ToLParam(&key), {hm::TextByKey, hm::MessageText}).value_or(std::wstring());
  return m_lastMessageText;
}

bool CAddonView::RequestSetting(UINT message, const std::string& key) {
  if (key.empty()) return false;
  const auto answer = Ask<std::string>(message, ToLParam(&key));
  if (!answer) return false;
  addon::SettingTextTable::Instance().Set(key, hv::Widen(*answer));
  return true;
}

int CAddonView::QueryDisplayMode() {
  if (ProcessDisplayMode() == 0) {
    const auto answer = Ask<LPARAM>(hm::DisplayMode, 1);
    if (answer && IsDisplayMode(*answer)) {
      m_displayMode = static_cast<int>(*answer);
      ProcessDisplayMode() = m_displayMode;
    }
  }
  if (m_displayMode == 0) m_displayMode = ProcessDisplayMode();
  return m_displayMode;
}

bool CAddonView::QueryAltStatus() {
  const auto answer = Ask<LPARAM>(hm::AltStatus, 0);
  m_useAltStatus = answer && (*answer == 1 || *answer == 2);
  return m_useAltStatus;
}

// ---- Trade tickets and keys ------------------------------------------------------

LRESULT CAddonView::OpenTradeTicket(const std::wstring* linkText, LPARAM origin) {
  m_actions.OpenTradeTicket(linkText, origin);
  return 0;
}

void CAddonView::WatchTradeKeys(QWidget* widget, bool textEntry) {
  if (!widget) return;
  m_tradeKeyWidgets[widget] = textEntry;
  if (widget != this) widget->installEventFilter(this);
}

bool CAddonView::HandleTradeKey(int key, Qt::KeyboardModifiers modifiers, bool inTextEntry) {
  const addon::TradeKey trade = addon::TradeKeyOf(key, modifiers);
  if (!trade) return false;
  // In a search box the main-keyboard plus, equals and minus type text
  // (codes contain them); the keypad and function keys still trade.
  if (inTextEntry && trade.typesText) return false;
  if (!addon::TradeShortcutsEnabled()) return true;
  if (const auto text = ShortcutTicket(trade.side)) OpenTradeTicket(&*text, addon::kShortcutTradeOrigin);
  return true;
}

bool CAddonView::eventFilter(QObject* watched, QEvent* event) {
  const auto watchedWidget = m_tradeKeyWidgets.find(watched);
  if (watchedWidget != m_tradeKeyWidgets.end() &&
      (event->type() == QEvent::KeyPress || event->type() == QEvent::ShortcutOverride)) {
    auto* key = static_cast<QKeyEvent*>(event);
    const bool inText = watchedWidget->second;
    const addon::TradeKey trade = addon::TradeKeyOf(key->key(), key->modifiers());
    if (trade && inText && trade.typesText) {
      // Text for the search box; should the box not take it, it must not come
      // back to the view as a shortcut.
      if (event->type() == QEvent::KeyPress) m_textKeyEvent = event;
    } else if (trade) {
      // Taken before any other shortcut of the terminal; acted on when pressed.
      if (event->type() == QEvent::KeyPress) HandleTradeKey(key->key(), key->modifiers(), inText);
      event->accept();
      return true;
    }
  }
  return CSuperBaseView::eventFilter(watched, event);
}

void CAddonView::keyPressEvent(QKeyEvent* e) {
  const bool fromText = e == m_textKeyEvent;
  m_textKeyEvent = nullptr;
  if (m_tradeKeyWidgets.count(this) && HandleTradeKey(e->key(), e->modifiers(), fromText)) {
    e->accept();
    return;
  }
  CSuperBaseView::keyPressEvent(e);
}

// ---- Texts, titles, messages, logs ---------------------------------------------------

std::wstring CAddonView::StyleImagePath(std::wstring path) const {
  static const std::wstring kPlaceholder = L"[styleID]";
  const std::wstring id = std::to_wstring(m_styleId);
  for (std::size_t at = path.find(kPlaceholder); at != std::wstring::npos; at = path.find(kPlaceholder, at + id.size()))
    path.replace(at, kPlaceholder.size(), id);
  return path;
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

void CAddonView::LogHere(std::source_location where) const {
  LogInfo(QualifiedName(where.function_name()).c_str(), addon::SourceFileName(where.file_name()),
          static_cast<int>(where.line()));
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

void CAddonView::PrepareBasicData(std::source_location where) {
  RegisterLogger();
  const std::string className = m_info.className ? m_info.className : "";
  const std::string function = className + "::PrepareBasicData";
  const char* file = addon::SourceFileName(where.file_name());
  const int line = static_cast<int>(where.line());
  LogInfo(function.c_str(), file, line);
  if (PreparedClasses().insert(className).second) {
    for (const auto& request : m_info.firstSettings) RequestSetting(request.message, request.key);
    for (const auto store : m_info.firstStores)
      if (!addon::IsStoreLoaded(store)) SendChildFeedback(addon::RequestFor(store), 0);
  }
  LogInfo(function.c_str(), file, line);
}

bool CAddonView::HasPreparedClass(const std::string& className) { return PreparedClasses().count(className) != 0; }

void CAddonView::ResetProcessState() {
  PreparedClasses().clear();
  ProcessDisplayMode() = 0;
}

void CAddonView::SendViewSize(int width, int height) {
  ViewSize size;
  size.width = width;
  size.height = height;
  SendChildFeedback(hm::ViewSizeRequest, ToLParam(&size));
}
