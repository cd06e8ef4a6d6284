#include "views/alerts/PriceAlertList.h"

#include <QPainter>
#include <set>

#include "addon/Channel.h"
#include "addon/Feeds.h"
#include "addon/TextTables.h"
#include "data/MarketDelayCache.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/Buttons.h"
#include "hostview/HostLists.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/alerts/AlertGrid.h"
#include "views/alerts/AlertRules.h"

ADDON_IMPLEMENT_VIEW(CPriceAlertList)

namespace {

constexpr int kButtonWidth = 72;
constexpr int kButtonHeight = 22;
constexpr int kMargin = 4;
constexpr int kBarHeight = kButtonHeight + 2 * kMargin;

}  // namespace

const addon::ViewClassInfo& CPriceAlertList::Info() {
  static const addon::ViewClassInfo info{
      .className = "CPriceAlertList",
      .titleEntry = 9,
      .defaultTitle = L"Price Alerts",
      .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
      .descriptor = &classCPriceAlertList,
  };
  return info;
}

CPriceAlertList::CPriceAlertList() : CAddonView(Info()) {}
CPriceAlertList::~CPriceAlertList() = default;

// ---- Creation ------------------------------------------------------------------------

int CPriceAlertList::OnCreate() {
  m_alertLists.Join(this);
  BuildControls();
  return 0;
}

void CPriceAlertList::BuildControls() {
  auto make = [this](int id, const char* name) {
    auto* b = new CBranticButton(this, id);
    b->setObjectName(QString::fromLatin1(name));
    b->SetWindowText(L"slable");
    b->SetFlat(true);
    b->SetStyleManager(m_pStyleManager);
    connect(b, &CHostButton::commandClicked, this, [this](int command) {
      if (command == kNewId) OnNew();
      else if (command == kModifyId) OnModify();
      else if (command == kDeleteId) OnDelete();
    });
    return b;
  };
  m_new = make(kNewId, "NewButton");
  m_modify = make(kModifyId, "ModifyButton");
  m_delete = make(kDeleteId, "DeleteButton");
  m_grid = new AlertGrid(this);
  m_grid->setObjectName(QStringLiteral("AlertGrid"));
  m_grid->SetStyleManager(m_pStyleManager);
  m_grid->SetAppCaption(m_appTitle);
  m_grid->SetTickCallback([this] { UpdateButtons(); });
  m_grid->show();
  UpdateButtons();
  Relayout();
}

CBranticButton* CPriceAlertList::Button(int id) const {
  switch (id) {
    case kNewId: return m_new;
    case kModifyId: return m_modify;
    case kDeleteId: return m_delete;
    default: return nullptr;
  }
}

// ---- Contract ------------------------------------------------------------------------

void CPriceAlertList::SetAppTitle(std::wstring title) {
  CAddonView::SetAppTitle(std::move(title));
  if (m_grid) {
    m_grid->SetAppCaption(m_appTitle);
    m_grid->Redraw();
  }
}

void CPriceAlertList::ApplyLanguage() {
  alerts::LoadTexts(m_pLanguage);
  if (m_grid) m_grid->ApplyLanguage(m_pLanguage);
  auto caption = [](CBranticButton* b, int id, const wchar_t* fallback) {
    if (!b) return;
    std::wstring text = alerts::CachedText(id);
    b->SetWindowText(text.empty() ? std::wstring(fallback) : text);
    b->repaint();
  };
  caption(m_new, alerts::text::kNew, L"New");
  caption(m_modify, alerts::text::kModify, L"Modify");
  caption(m_delete, alerts::text::kDelete, L"Delete");
  CAddonView::ApplyLanguage();  // the title, text 9
}

void CPriceAlertList::ChangeStyle(int styleId) {
  CAddonView::ChangeStyle(styleId);
  if (m_grid) m_grid->ChangeStyle(styleId);
  SetStyleManager(m_pStyleManager);
}

void CPriceAlertList::SetStyleManager(IStyleManager* styleManager) {
  CAddonView::SetStyleManager(styleManager);
  if (m_grid) m_grid->SetStyleManager(styleManager);
  for (CBranticButton* b : {m_new, m_modify, m_delete})
    if (b) b->SetStyleManager(styleManager);
  update();
}

// ---- Host notifications --------------------------------------------------------------

void CPriceAlertList::OnActivate() {
  SendViewSize(kPreferredWidth, kPreferredHeight);
  m_activeViews.Join(this);
  platform::SetTimer(this, kRefreshTimer, kRefreshMs);
  platform::SetTimer(this, kRefitTimer, kRefitMs);
  PrepareBasicData();
  if (m_grid) m_grid->SetVisibility(AlertGrid::kDefaultVisibility);
  ApplyLanguage();
  SendChildFeedback(hm::Alert701, 0);
  SetActiveFlag(true);
}

void CPriceAlertList::OnDeactivate() {
  PrepareBasicData();
  // The terminal deactivates a view when another takes the focus; the list
  // stays on screen, so the 200 ms refresh keeps running.
  platform::SetTimer(this, kRefreshTimer, kRefreshMs);
  platform::SetTimer(this, kRefitTimer, kRefitMs);
  m_activeViews.Leave();
  SetActiveFlag(false);
}

std::uint32_t CPriceAlertList::OnViewMessage(UINT message, LPARAM data) {
  switch (message) {
    case hm::FieldValue:
    case hm::RequestField:
      if (data) ApplyQuote(message, *FromLParam<const FieldUpdate>(data));
      return 0;
    case hm::InstrumentList:  // the base filed the lists; names and delays may be new
    case hm::ProductList:
    case hm::MarketInfo:
      if (m_grid) m_grid->Redraw();
      return 0;
    case hm::Alert701:
      if (data && IsFirstAlertList()) ReplaceList(*FromLParam<const std::vector<PriceAlertItem>>(data));
      return 0;
    case hm::Alert702:
    case hm::Alert703:
    case hm::Alert704:
      if (IsFirstAlertList()) SendChildFeedback(hm::Alert701, 0);
      return 0;
    case hm::SettingsChanged:
      Rebuild();
      return 0;
    default:
      return 0;
  }
}

bool CPriceAlertList::HandlesQuotes() const { return m_activeViews.IsFirst() || !m_activeViews.IsMember(); }

void CPriceAlertList::ApplyQuote(UINT message, const FieldUpdate& update) {
  if (update.param != 0 || update.kind != 0 || !HandlesQuotes()) return;
  if (message == hm::RequestField && update.value.empty()) {
    // No value yet: ask the terminal to fetch it.
    FieldRequest again;
    again.productId = update.productId;
    again.instrumentCode = update.instrumentCode;
    again.fieldName = update.fieldName;
    SendChildFeedback(hm::FetchFields, ToLParam(&again));
    return;
  }
  ApplyFieldUpdate(QuoteStore::Instance(), update, platform::TickCount());
}

// ---- The list ------------------------------------------------------------------------

void CPriceAlertList::ReplaceList(const std::vector<PriceAlertItem>& list) {
  // The tick marks are the user's, not the terminal's: they stay on the
  // alerts that are still there.
  std::set<std::int32_t> ticked;
  for (const PriceAlertItem& a : alerts::Store().Records())
    if (a.ticked) ticked.insert(a.alertId);
  std::vector<PriceAlertItem> records = list;
  for (PriceAlertItem& a : records) a.ticked = ticked.count(a.alertId) != 0;
  alerts::Store().Fill(std::move(records));

  // The delay of each market, asked once per product and exchange.
  std::set<std::pair<std::int64_t, std::string>> asked;
  for (const PriceAlertItem& a : alerts::Store().Records()) {
    std::wstring delay;
    if (MarketDelayCache::Instance().Find(a.productId, hv::Widen(a.exchangeCode), delay)) continue;
    if (!asked.insert({a.productId, a.exchangeCode}).second) continue;
    JMarketInfoRequest request;
    request.productId = a.productId;
    request.exchangeCode = a.exchangeCode;
    SendChildFeedback(hm::MarketInfo, ToLParam(&request));
  }
  Rebuild();
}

void CPriceAlertList::Rebuild() {
  if (!m_grid) return;
  const int option = GetUserSettings().GetAlertSetting().GetPriceAlertOption();
  std::vector<PriceAlertItem> rows;
  for (const PriceAlertItem& a : alerts::Store().Records())
    if (alerts::PassesFilter(a.status, option)) rows.push_back(a);
  m_shownVersion = alerts::Store().Version();
  m_grid->SetRows(std::move(rows));
  // The current values, subscribed on the next tick.
  for (const InstrumentKey& key : m_grid->InstrumentKeys())
    addon::QuoteFeed::Instance().Register(key, {}, platform::TickCount());
  UpdateButtons();
}

void CPriceAlertList::UpdateButtons() {
  const int ticked = m_grid ? m_grid->TickedCount() : 0;
  if (m_new) m_new->setEnabled(true);
  if (m_modify) m_modify->setEnabled(ticked == 1);
  if (m_delete) m_delete->setEnabled(ticked >= 1);
  for (CBranticButton* b : {m_new, m_modify, m_delete})
    if (b) b->repaint();
}

// ---- Buttons -------------------------------------------------------------------------

void CPriceAlertList::OpenForm(const PriceAlertItem& request, int height) {
  ViewOpenRequest open;
  open.className = kFormClass;
  open.width = kFormWidth;
  open.height = height;
  SendChildFeedback(hm::OpenAlertForm, ToLParam(&open));
  ViewLink link;
  link.className = kFormClass;
  link.flag = 1;
  SendChildFeedback(hm::OpenView, ToLParam(&link));
  PriceAlertItem item = request;
  SendChildFeedback(hm::Alert705, ToLParam(&item));
}

void CPriceAlertList::OnNew() {
  PriceAlertItem item;
  item.alertId = -1;
  item.productId = -1;
  OpenForm(item, kFormHeight);
}

void CPriceAlertList::OnModify() {
  if (!m_grid) return;
  const std::vector<std::int32_t> ids = m_grid->TickedIds();
  if (ids.size() != 1) return;
  PriceAlertItem alert;
  if (!alerts::Store().Find(ids.front(), alert)) {
    const std::wstring text = LanguageText(alerts::text::kAlertMissing);
    ShowMessage(text.empty() ? alerts::kAlertMissingText : text);
    return;
  }
  const int height = alert.viaEmail || alert.viaSms ? kFormTallHeight : kFormHeight;
  if (!InstrumentMgr_ReadOnly().FindPtr(InstrumentKey{alert.productId, hv::Widen(alert.instrumentCode)})) {
    const std::wstring text = LanguageText(alerts::text::kInstrumentMissing);
    ShowMessage(text.empty() ? alerts::kInstrumentMissingText : text);
    return;
  }
  PriceAlertItem item;
  item.alertId = alert.alertId;
  item.productId = alert.productId;
  item.instrumentCode = alert.instrumentCode;
  item.exchangeCode = alert.exchangeCode;
  OpenForm(item, height);
}

void CPriceAlertList::OnDelete() {
  if (!m_grid) return;
  const std::vector<std::int32_t> ids = m_grid->TickedIds();
  if (ids.empty()) return;
  SendChildFeedback(hm::Alert704, ToLParam(&ids));
}

// ---- Timers ------------------------------------------------------------------------------

void CPriceAlertList::FlushSubscriptions() {
  if (!m_grid) return;
  const std::set<InstrumentKey> shown = m_grid->InstrumentKeys();
  if (shown.empty()) return;
  auto& feed = addon::QuoteFeed::Instance();
  for (const auto& pending : feed.TakePending(shown)) {
    const addon::FieldTarget target{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)};
    addon::SendInterestBatches(Sender(), target, addon::AlertInterest());
  }
  feed.ExpireMarks(platform::TickCount());
}

void CPriceAlertList::OnTimer(UINT id) {
  if (!m_grid) return;
  if (id == kRefreshTimer) {
    if (alerts::Store().Version() > m_shownVersion) Rebuild();
    if (HandlesQuotes()) FlushSubscriptions();
    const std::uint64_t version = m_grid->QuoteVersion();
    if (version > m_quoteVersion) {
      m_quoteVersion = version;
      m_grid->Redraw();
    }
    return;
  }
  if (id == kRefitTimer && m_grid->TakeRefit()) m_grid->RefitColumns();
}

// ---- Layout ----------------------------------------------------------------------------------

void CPriceAlertList::Relayout() {
  int x = kMargin;
  for (CBranticButton* b : {m_new, m_modify, m_delete}) {
    if (!b) continue;
    b->setGeometry(x, kMargin, kButtonWidth, kButtonHeight);
    x += kButtonWidth + kMargin;
  }
  if (m_grid) m_grid->setGeometry(0, kBarHeight, width(), std::max(0, height() - kBarHeight));
}

void CPriceAlertList::resizeEvent(QResizeEvent* e) {
  CAddonView::resizeEvent(e);
  Relayout();
}

void CPriceAlertList::paintEvent(QPaintEvent* e) {
  CAddonView::paintEvent(e);
  QPainter p(this);
  const QColor back = m_pStyleManager ? m_pStyleManager->Color(hv::style::kWindowBackground) : palette().window().color();
  p.fillRect(rect(), back);
}
