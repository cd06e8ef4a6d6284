#include "terminal/views/TerminalView.h"

#include <json/json.h>

#include <QPalette>

#include "hostview/MessageIds.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/host/Services.h"
#include "terminal/sim/Market.h"
#include "terminal/views/OwnViews.h"

namespace term::views {

namespace {
HostRuntime* g_runtime = nullptr;
LinkHandler g_linkHandler;
constexpr UINT kRefreshTimer = 1;

template <typename T>
CSuperBaseView* Make() { return new T(); }

const CRuntimeClass kClasses[] = {
    {"CTradeView", sizeof(CTradeView), 0xFFFF, &Make<CTradeView>, &CSuperBaseView::classCSuperBaseView},
    {"CBranticChartView", sizeof(CChartView), 0xFFFF, &Make<CChartView>, &CSuperBaseView::classCSuperBaseView},
    {"CInsExpViewEx", sizeof(CExplorerView), 0xFFFF, &Make<CExplorerView>, &CSuperBaseView::classCSuperBaseView},
    {"CStockAnalytics", sizeof(CAnalyticsView), 0xFFFF, &Make<CAnalyticsView>, &CSuperBaseView::classCSuperBaseView},
    {"CFNews", sizeof(CNewsView), 0xFFFF, &Make<CNewsView>, &CSuperBaseView::classCSuperBaseView},
};
}  // namespace

void SetRuntime(HostRuntime* runtime) { g_runtime = runtime; }
void SetLinkHandler(LinkHandler handler) { g_linkHandler = std::move(handler); }
void LinkInstrument(std::int64_t productId, const std::string& code, CSuperBaseView* from) {
  if (g_linkHandler) g_linkHandler(productId, code, from);
}
HostRuntime* Runtime() { return g_runtime; }

QStringList ClassNames() {
  QStringList out;
  for (const auto& c : kClasses) out << c.m_lpszClassName;
  return out;
}

const CRuntimeClass* FindClass(const std::string& className) {
  for (const auto& c : kClasses)
    if (className == c.m_lpszClassName) return &c;
  return nullptr;
}

std::map<std::string, std::string> ParseLink(const std::wstring& text) {
  std::map<std::string, std::string> out;
  const std::string narrow = hv::Narrow(text);
  Json::CharReaderBuilder b;
  std::unique_ptr<Json::CharReader> reader(b.newCharReader());
  Json::Value root;
  std::string errors;
  if (!reader->parse(narrow.data(), narrow.data() + narrow.size(), &root, &errors) || !root.isObject()) return out;
  const Json::Value& data = root["data"];
  if (!data.isArray() || data.empty() || !data[0].isObject()) return out;
  for (const auto& name : data[0].getMemberNames())
    if (data[0][name].isString()) out[name] = data[0][name].asString();
  return out;
}

CTerminalView::CTerminalView() = default;

CTerminalView::~CTerminalView() {
  if (m_watched >= 0 && Runtime()) Runtime()->Market().RemoveInterest(m_watched);
}

int CTerminalView::OnCreate() {
  Build();
  // A restored view starts on the instrument of its start parameters.
  if (Runtime() && GetStartProductId() >= 0 && !GetStartInstrumentCode().empty()) {
    m_instrument = Runtime()->Market().Find(GetStartProductId(), GetStartInstrumentCode());
    if (m_instrument >= 0 && WatchesInstrument()) Runtime()->Market().AddInterest(m_watched = m_instrument);
  }
  ChangeStyle(GetStyleID());
  return 0;
}

std::uint32_t CTerminalView::OnHostMessage(UINT message, LPARAM data) {
  switch (message) {
    case hm::Activate:
    case hm::Deactivate:
      if (!m_started) {
        m_started = true;
        if (RefreshInterval()) platform::SetTimer(this, kRefreshTimer, RefreshInterval());
        InstrumentChanged();
        SendTitle();
        Refresh();
      }
      return 0;
    case hm::LinkData: {
      const auto* link = FromLParam<const ViewLink>(data);
      if (!link || !link->link) return 0;
      const auto fields = ParseLink(*link->link);
      if (fields.empty()) return 0;  // not a link text: ignored
      TakeLink(fields);
      const auto pid = fields.find("Field_product_id");
      const auto code = fields.find("Field_instrument_code");
      if (Runtime() && pid != fields.end() && code != fields.end()) {
        try {
          ShowInstrument(Runtime()->Market().Find(std::stoll(pid->second), code->second));
        } catch (const std::exception&) {
          ShowInstrument(-1);
        }
      }
      return 0;
    }
    case hm::LinkedInstrument: {
      const auto* text = FromLParam<const std::wstring>(data);
      if (text) ShowLinked(*text);
      return 0;
    }
    default:
      return 0;
  }
}

bool CTerminalView::ShowLinked(const std::wstring& linkText) {
  if (!Runtime()) return false;
  const auto fields = ParseLink(linkText);
  const auto pid = fields.find("Field_product_id");
  const auto code = fields.find("Field_instrument_code");
  if (pid == fields.end() || code == fields.end()) return false;
  try {
    const int index = Runtime()->Market().Find(std::stoll(pid->second), code->second);
    if (index < 0) return false;
    ShowInstrument(index);
    return true;
  } catch (const std::exception&) {
    return false;
  }
}

LRESULT CTerminalView::DoDragDrop(UINT message, LPARAM data) {
  // A drop arrives as a ViewLink naming the source; the first instrument of its link counts.
  const auto* link = message == hm::LinkData ? FromLParam<const ViewLink>(data) : nullptr;
  if (!TakesInstrumentDrops() || !link || !link->link) return 0;
  return ShowLinked(*link->link) ? 1 : 0;
}

void CTerminalView::ShowInstrument(int index) {
  m_instrument = index;
  const int watch = WatchesInstrument() ? index : -1;
  if (Runtime() && watch != m_watched) {
    if (m_watched >= 0) Runtime()->Market().RemoveInterest(m_watched);
    if (watch >= 0) Runtime()->Market().AddInterest(watch);
    m_watched = watch;
  }
  if (Runtime() && index >= 0) {
    const auto& ins = Runtime()->Market().Instruments()[static_cast<std::size_t>(index)];
    SetStartParam(ins.productId, ins.instrumentCode, GetStartParams());
  } else {
    SetStartParam(-1, {}, GetStartParams());
  }
  InstrumentChanged();
  SendTitle();
  Refresh();
}

void CTerminalView::ChangeStyle(int styleId) {
  CSuperBaseView::ChangeStyle(styleId);
  if (!m_pStyleManager) return;
  QPalette pal = palette();
  pal.setColor(QPalette::Window, m_pStyleManager->Color(hv::style::kWindowBackground));
  pal.setColor(QPalette::WindowText, m_pStyleManager->Color(hv::style::kWindowText));
  pal.setColor(QPalette::Base, m_pStyleManager->Color(hv::style::kEditBackground));
  pal.setColor(QPalette::Text, m_pStyleManager->Color(hv::style::kEditText));
  pal.setColor(QPalette::Button, m_pStyleManager->Color(hv::style::kButtonFace));
  pal.setColor(QPalette::ButtonText, m_pStyleManager->Color(hv::style::kButtonText));
  pal.setColor(QPalette::PlaceholderText, m_pStyleManager->Color(hv::style::kMutedText));
  pal.setColor(QPalette::AlternateBase, m_pStyleManager->Color(107));
  pal.setColor(QPalette::Highlight, m_pStyleManager->Color(hv::style::kSelection));
  pal.setColor(QPalette::HighlightedText, m_pStyleManager->Color(hv::style::kSelectionText));
  setPalette(pal);
  setAutoFillBackground(true);
  update();
}

void CTerminalView::ApplyLanguage() { SendTitle(); }

void CTerminalView::OnTimer(UINT id) {
  if (id == kRefreshTimer) Refresh();
}

QString CTerminalView::NameFor(const char* className) const {
  return QString::fromStdWString(ViewName(GetLanguage(), className));
}

QString CTerminalView::InstrumentLabel() const {
  if (!Runtime() || m_instrument < 0) return {};
  const auto& ins = Runtime()->Market().Instruments()[static_cast<std::size_t>(m_instrument)];
  return QString::fromStdString(ins.displayCode.empty() ? ins.instrumentCode : ins.displayCode) + " " +
         QString::fromStdString(Runtime()->Market().NameOf(m_instrument));
}

void CTerminalView::SendTitle() {
  QString title = Caption();
  if (const QString ins = InstrumentLabel(); !ins.isEmpty()) title += " - " + ins;
  m_title = title.toStdWString();
  const std::wstring copy = m_title;
  SendChildFeedback(hm::Title, ToLParam(&copy));
}

}  // namespace term::views
