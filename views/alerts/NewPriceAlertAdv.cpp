#include "views/alerts/NewPriceAlertAdv.h"

#include <QKeyEvent>
#include <QLineEdit>
#include <QPainter>
#include <algorithm>
#include <cmath>
#include <set>

#include "addon/Channel.h"
#include "addon/LinkText.h"
#include "addon/TextTables.h"
#include "controls/InstrumentComboBox.h"
#include "addon/Feeds.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostview/Buttons.h"
#include "hostview/Edits.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "skin/Skin.h"
#include "views/alerts/AlertRules.h"

ADDON_IMPLEMENT_VIEW(CNewPriceAlertAdv)

namespace {

constexpr COLORREF kExplorerBack = MakeColorRef(0xCC, 0xCC, 0xCC);
constexpr int kInfoFontId = 20;

// Layout of the form (pixels).
constexpr int kLeft = 12;
constexpr int kControlLeft = 118;
constexpr int kRowHeight = 24;
constexpr int kRowStep = 28;
constexpr int kInfoTop = 40;
constexpr int kInfoHeight = 74;
constexpr int kFirstRow = kInfoTop + kInfoHeight + 8;
constexpr int kNoticeHeight = 70;

// Drawn captions when the terminal has no text for them (714..721).
const wchar_t* const kCaptionFallbacks[8] = {L"Instrument", L"Price Field", L"Condition",  L"Price",
                                             L"Valid Until", L"Trigger Once", L"Alert Via", L"Notice"};

const wchar_t* const kNoticeText =
    L"E-mail and SMS notices go to the contact details registered with your account. "
    L"They are sent once the alert fires and may arrive a little later than the notice in the terminal.";

QString Q(const std::wstring& s) { return QString::fromStdWString(s); }

}  // namespace

const addon::ViewClassInfo& CNewPriceAlertAdv::Info() {
  static const addon::ViewClassInfo info{
      .className = "CNewPriceAlertAdv",
      .titleEntry = 725,
      .defaultTitle = L"New Price Alert",
      .firstSettings = {{hm::SystemParameter, "ALEML"}, {hm::SystemParameter, "ALSMS"}, {hm::SystemParameter, "MAXPA"}},
      .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
      .descriptor = &classCNewPriceAlertAdv,
  };
  return info;
}

CNewPriceAlertAdv::CNewPriceAlertAdv() : CAddonView(Info()) {}
CNewPriceAlertAdv::~CNewPriceAlertAdv() = default;

// ---- Creation ------------------------------------------------------------------------------

int CNewPriceAlertAdv::OnCreate() {
  BuildControls();
  return 0;
}

void CNewPriceAlertAdv::BuildControls() {
  m_combo = new CInstrumentComboBox(this);
  m_combo->setObjectName(QStringLiteral("InstrumentCombo"));
  m_combo->SetLanguage(m_pLanguage);
  connect(m_combo, &CInstrumentComboBox::InstrumentChosen, this, [this] {
    const JInstrumentUnderlying chosen = m_combo->GetChosenInstrument();
    if (chosen.productId == -1 && chosen.instrumentCode.empty()) return;
    ChooseInstrument(chosen);
  });

  m_explorer = new CImageButton(this, kExplorerId);
  m_explorer->setObjectName(QStringLiteral("InstrumentExplorerButton"));
  m_explorer->SetBkColor(kExplorerBack);
  m_explorer->SetTooltipText(L"Instrument Explorer");
  m_explorer->setFocusPolicy(Qt::NoFocus);
  connect(m_explorer, &CHostButton::commandClicked, this, [this](int) { Actions().OpenInstrumentExplorer(); });

  auto list = [this](int id, const char* name) {
    auto* c = new CSkinComboBox(this);
    c->setObjectName(QString::fromLatin1(name));
    c->setEditable(false);
    c->setMaxVisibleItems(kListItems);
    c->setProperty("controlId", id);
    return c;
  };
  m_field = list(kFieldId, "FieldList");
  m_comparator = list(kComparatorId, "ComparatorList");
  m_trigger = list(kTriggerId, "TriggerList");

  m_price = new CFloatEdit(this, 2);
  m_price->setObjectName(QStringLiteral("PriceEdit"));
  m_spin = new CBranticSpinBt(this, kSpinId);
  m_spin->setObjectName(QStringLiteral("PriceSpin"));
  m_spin->SetBuddy(m_price);
  connect(m_spin, &CBranticSpinBt::positionChanging, this, [this](int delta) { OnSpinChanging(delta); });
  connect(m_spin, &CBranticSpinBt::scrolled, this, [this](int position) { OnSpinScrolled(position); });

  m_date = new CptDatetimeCtrl(this);
  m_date->setObjectName(QStringLiteral("ValidityDate"));
  m_date->SetFormat(L"dd MMM yyyy");

  auto box = [this](int id, const wchar_t* caption, const char* name) {
    auto* b = new CButtonEx(this, id);
    b->setObjectName(QString::fromLatin1(name));
    b->SetCheckBox(true);
    b->SetWindowText(caption);
    connect(b, &CHostButton::commandClicked, this, [this](int command) { OnChannelClicked(command); });
    return b;
  };
  m_app = box(kAppId, m_appTitle.c_str(), "AppChannel");
  m_email = box(kEmailId, L"Email", "EmailChannel");
  m_sms = box(kSmsId, L"SMS", "SmsChannel");
  m_app->SetCheck(m_viaApp);
  m_email->SetCheck(m_viaEmail);
  m_sms->SetCheck(m_viaSms);
  m_email->hide();
  m_sms->hide();

  m_notice = new CBranticEdit(this, true);
  m_notice->setObjectName(QStringLiteral("NoticeBox"));
  m_notice->SetReadOnly(true);
  m_notice->SetWindowText(kNoticeText);
  m_notice->hide();

  m_submit = new CBranticButton(this, kSubmitId);
  m_submit->setObjectName(QStringLiteral("SubmitButton"));
  m_submit->SetWindowText(L"slable");
  connect(m_submit, &CHostButton::commandClicked, this, [this](int) { SubmitAlert(); });

  for (QWidget* w : TabOrder()) WatchTab(w);
  WatchTab(m_notice);
  if (m_notice->Editor()) WatchTab(m_notice->Editor());

  FillList(m_field, alerts::text::kFieldAsk, {L"Ask", L"Bid", L"Last Done"});
  FillList(m_comparator, alerts::text::kComparatorLess, {L"<=", L">="});
  FillList(m_trigger, alerts::text::kYes, {L"Yes", L"No"});
  SetDateRange(true);
  SetStyleManager(m_pStyleManager);
  ReloadComboList(false);
  Relayout();
}

void CNewPriceAlertAdv::WatchTab(QWidget* widget) {
  if (!widget) return;
  widget->installEventFilter(this);
  for (QObject* child : widget->children())
    if (auto* w = qobject_cast<QWidget*>(child)) w->installEventFilter(this);
}

CButtonEx* CNewPriceAlertAdv::ChannelBox(int id) const {
  switch (id) {
    case kAppId: return m_app;
    case kEmailId: return m_email;
    case kSmsId: return m_sms;
    default: return nullptr;
  }
}

std::vector<QWidget*> CNewPriceAlertAdv::TabOrder() const {
  return {m_combo, m_field, m_comparator, m_price, m_date, m_trigger, m_app, m_email, m_sms, m_submit};
}

// ---- Contract ------------------------------------------------------------------------------

std::uint32_t CNewPriceAlertAdv::OnHostMessage(UINT message, LPARAM data) {
  // A pointer-carrying message without its record changes nothing.
  if (data == 0 && (addon::IsPointerMessage(message) || message == hm::Alert705 || message == hm::AlertBoardRequest))
    return 0;
  if (message == hm::SystemParameter) {
    const std::wstring answer = hv::Widen(*FromLParam<const std::string>(data));
    alerts::AlertSettingsCache::Instance().Set(m_settingKey, answer);
    m_exchangeList = answer;
  } else if (message == hm::MessageText) {
    m_noExchangeText = *FromLParam<const std::wstring>(data);
  }
  const std::uint32_t result = CAddonView::OnHostMessage(message, data);
  switch (message) {
    case hm::Deactivate:
    case hm::Activate:
    case hm::SystemParameter:
    case hm::MessageText:
    case hm::AltStatus:
      return 1;  // handled by the base, answered as this view's own
    default:
      return result;
  }
}

void CNewPriceAlertAdv::SendChildFeedback(UINT message, LPARAM data) {
  if (message == hm::SystemParameter && data) m_settingKey = *FromLParam<const std::string>(data);
  CAddonView::SendChildFeedback(message, data);
}

void CNewPriceAlertAdv::SetAppTitle(std::wstring title) {
  CAddonView::SetAppTitle(std::move(title));
  if (m_app) m_app->SetWindowText(m_appTitle);
}

void CNewPriceAlertAdv::ApplyLanguage() {
  alerts::LoadTexts(m_pLanguage);
  if (m_combo) m_combo->SetLanguage(m_pLanguage);
  auto caption = [](CHostButton* b, int id, const wchar_t* fallback) {
    if (!b) return;
    const std::wstring text = id ? alerts::CachedText(id) : std::wstring();
    b->SetWindowText(text.empty() ? std::wstring(fallback) : text);
  };
  if (m_app) m_app->SetWindowText(m_appTitle);
  caption(m_email, alerts::text::kEmail, L"Email");
  caption(m_sms, alerts::text::kSms, L"SMS");
  caption(m_submit, alerts::text::kSubmit, L"Submit");
  if (m_combo) m_combo->repaint();
  if (m_submit) m_submit->repaint();
  FillList(m_field, alerts::text::kFieldAsk, {L"Ask", L"Bid", L"Last Done"});
  FillList(m_comparator, alerts::text::kComparatorLess, {L"<=", L">="});
  FillList(m_trigger, alerts::text::kYes, {L"Yes", L"No"});
  SendTitle();
  update();
}

void CNewPriceAlertAdv::SendTitle() {
  const int id = m_editingId == -1 ? alerts::text::kTitleNew : alerts::text::kTitleModify;
  std::wstring title = alerts::CachedText(id);
  if (title.empty()) title = m_editingId == -1 ? L"New Price Alert" : L"Modify Price Alert";
  CAddonView::SendTitle(title);
}

void CNewPriceAlertAdv::FillList(CSkinComboBox* list, int firstText, const std::vector<const wchar_t*>& fallbacks) {
  if (!list) return;
  int selection = list->currentIndex();
  list->blockSignals(true);
  list->clear();
  for (int i = 0; i < int(fallbacks.size()); ++i) {
    const std::wstring text = alerts::CachedText(firstText + i);
    list->addItem(Q(text.empty() ? std::wstring(fallbacks[std::size_t(i)]) : text));
  }
  if (selection < 0 || selection >= list->count()) selection = 0;
  list->setCurrentIndex(selection);
  list->blockSignals(false);
}

void CNewPriceAlertAdv::ChangeStyle(int styleId) {
  CAddonView::ChangeStyle(styleId);
  if (m_explorer) m_explorer->LoadBitmap(StyleImagePath(kExplorerImage));
  SetStyleManager(m_pStyleManager);
}

void CNewPriceAlertAdv::SetStyleManager(IStyleManager* styleManager) {
  CAddonView::SetStyleManager(styleManager);
  if (m_combo) m_combo->SetStyleManager(styleManager);
  for (CSkinComboBox* c : {m_field, m_comparator, m_trigger})
    if (c) c->SetStyleManager(styleManager);
  if (m_price) m_price->SetStyleManager(styleManager);
  if (m_spin) m_spin->SetStyleManager(styleManager);
  if (m_date) m_date->SetStyleManager(styleManager);
  if (m_notice) m_notice->SetStyleManager(styleManager);
  for (CHostButton* b : std::initializer_list<CHostButton*>{m_explorer, m_submit, m_app, m_email, m_sms})
    if (b) b->SetStyleManager(styleManager);
  if (m_explorer) m_explorer->LoadBitmap(StyleImagePath(kExplorerImage));
  update();
}

// ---- Host notifications ------------------------------------------------------------------------

void CNewPriceAlertAdv::OnActivate() {
  m_activeViews.Join(this);
  platform::SetTimer(this, kRefreshTimer, kRefreshMs);
  // The first time, PrepareBasicData asks for whatever list is missing.
  const bool firstTime = !HasPreparedClass(ClassInfo().className);
  PrepareBasicData();
  ShowChannelChoices();
  ReloadComboList(false);
  if (!firstTime && !InstrumentMgr_ReadOnly().Source()) {
    SendChildFeedback(hm::ProductList, 0);
    SendChildFeedback(hm::InstrumentList, 0);
  }
  // The day is chosen once: by the first activation or by a loaded alert.
  SetDateRange(!m_dayChosen);
  m_dayChosen = true;
  SendChildFeedback(hm::PriceBands, 0);
  // The frame may have been made after the title was first sent.
  SendTitle();
  SetActiveFlag(true);
}

void CNewPriceAlertAdv::OnDeactivate() {
  PrepareBasicData();
  // The terminal deactivates a view when another takes the focus; the form
  // stays on screen, so its panel keeps following the quotes.
  m_activeViews.Leave();
  SetActiveFlag(false);
}

std::uint32_t CNewPriceAlertAdv::OnViewMessage(UINT message, LPARAM data) {
  switch (message) {
    case hm::InstrumentList:  // the base filed it in the instrument store
      ReloadComboList(true);
      return 1;
    case hm::ProductList:  // the combo box keeps a copy of the product map
      ReloadComboList(true);
      return 1;
    case hm::FieldValue:
    case hm::RequestField:
      ApplyQuote(*FromLParam<const FieldUpdate>(data));
      return 1;
    case hm::AlertBoardRequest:
      if (data) m_priceInfo = *FromLParam<const JPriceInformation>(data);
      return 1;
    case hm::Alert705: {
      if (!data) return 1;
      const PriceAlertItem request = *FromLParam<const PriceAlertItem>(data);
      LoadAlert(request.alertId);
      if (request.productId != -1) {
        const auto* found =
            InstrumentMgr_ReadOnly().FindPtr(InstrumentKey{request.productId, hv::Widen(request.instrumentCode)});
        if (found) {
          MakeCurrent(*found);
          update();
        }
      }
      SendTitle();
      return 1;
    }
    case hm::LinkData:
      ApplyLink(FromLParam<const ViewLink>(data));
      return 1;
    case hm::PriceBands: {
      const auto* msg = FromLParam<const JTickBandList>(data);
      m_tickBands = msg->bands ? *msg->bands : std::vector<TickBand>();
      return 1;
    }
    default:
      return 0;
  }
}

void CNewPriceAlertAdv::ShowChannelChoices() {
  if (m_email) m_email->setVisible(alerts::ChannelOffered(alerts::kEmailKey));
  if (m_sms) m_sms->setVisible(alerts::ChannelOffered(alerts::kSmsKey));
}

void CNewPriceAlertAdv::ReloadComboList(bool force) {
  if (!m_combo) return;
  const auto* list = InstrumentMgr_ReadOnly().Source();
  if (!list) return;
  if (force || list != m_instrumentList) {
    m_instrumentList = list;
    m_combo->AttachList(list, CInstrumentComboBox::ProductMapFromStore());
    m_combo->ShowPlaceholder();
  }
  if (m_current) m_combo->SelectByKey(*m_current);
}

void CNewPriceAlertAdv::SetDateRange(bool setDay) {
  if (!m_date) return;
  const alerts::DateRange range = alerts::ValidityRange();
  m_date->SetRange(range.first, range.last);
  // A new alert lasts as long as the terminal allows unless the user says otherwise.
  if (setDay) m_date->SetTime(range.last);
}

// ---- Loading an alert ------------------------------------------------------------------------------

void CNewPriceAlertAdv::LoadAlert(std::int32_t id) {
  if (id == -1) {
    m_editingId = -1;
    m_current.reset();
    for (CSkinComboBox* c : {m_field, m_comparator, m_trigger})
      if (c) c->setCurrentIndex(0);
    if (m_combo) {
      ReloadComboList(false);
      m_combo->ShowPlaceholder();
    }
    if (m_price) {
      m_price->SetDecimals(2);
      m_price->Clear();
    }
    m_viaApp = true;
    m_viaEmail = false;
    m_viaSms = false;
    SetDateRange(true);
    m_dayChosen = true;
    if (m_app) m_app->SetCheck(m_viaApp);
    if (m_email) m_email->SetCheck(m_viaEmail);
    if (m_sms) m_sms->SetCheck(m_viaSms);
    ApplyNoticeRule(true);
    update();
    return;
  }
  PriceAlertItem alert;
  if (!alerts::Store().Find(id, alert)) return;
  m_editingId = id;
  if (m_field) m_field->setCurrentIndex(alerts::FieldIndex(alert.priceField));
  if (m_comparator) m_comparator->setCurrentIndex(alerts::ComparatorIndex(alert.comparator));
  if (m_trigger) m_trigger->setCurrentIndex(alerts::TriggerOnceIndex(alert.triggerOnce));
  const auto* instrument = InstrumentMgr_ReadOnly().FindPtr(InstrumentKey{alert.productId, hv::Widen(alert.instrumentCode)});
  if (instrument) {
    m_current = *instrument;
    if (m_combo && m_instrumentList) m_combo->SelectByKey(*instrument);
    addon::QuoteFeed::Instance().Register(InstrumentKey{instrument->productId, hv::Widen(instrument->instrumentCode)},
                                          {}, platform::TickCount());
  }
  m_viaApp = alert.viaApp;
  m_viaEmail = alert.viaEmail;
  m_viaSms = alert.viaSms;
  if (m_app) m_app->SetCheck(m_viaApp);
  if (m_email) m_email->SetCheck(m_viaEmail);
  if (m_sms) m_sms->SetCheck(m_viaSms);
  ApplyNoticeRule(true);
  SetDateRange(false);
  const QDate day = alerts::ParseDay(alert.validUntil);
  if (m_date && day.isValid()) m_date->SetTime(day);
  m_dayChosen = true;
  if (m_price) {
    m_price->SetDecimals(instrument ? std::clamp(instrument->decimals, 0, 10) : 3);
    m_price->SetValue(alert.triggerValue);
  }
  if (instrument) SendPriceInfoRequest();
  update();
}

// ---- Notice and frame size ------------------------------------------------------------------------

void CNewPriceAlertAdv::ApplyNoticeRule(bool always) {
  const bool show = m_viaEmail || m_viaSms;
  const bool changed = show != m_noticeShown || !m_sizeSent;
  m_noticeShown = show;
  if (m_notice) m_notice->setVisible(show);
  if (changed || always) SendFrameSize(show ? kTallHeight : kCompactHeight);
  Relayout();
}

void CNewPriceAlertAdv::SendFrameSize(int height) {
  m_sizeSent = true;
  ViewSize size;
  size.width = kWidth;
  size.height = height;
  CAddonView::SendChildFeedback(hm::ViewSizeRequest, ToLParam(&size));
  CAddonView::SendChildFeedback(hm::AlertFrameSize2, ToLParam(&size));
  CAddonView::SendChildFeedback(hm::AlertFrameSize, ToLParam(&size));
}

void CNewPriceAlertAdv::OnChannelClicked(int id) {
  CButtonEx* box = ChannelBox(id);
  if (!box) return;
  const bool on = box->GetCheck();
  switch (id) {
    case kAppId:
      m_viaApp = on;
      return;
    case kEmailId:
      m_viaEmail = on;
      break;
    case kSmsId:
      m_viaSms = on;
      break;
    default:
      return;
  }
  ApplyNoticeRule(false);
}

void CNewPriceAlertAdv::ToggleChannel(int id) {
  CButtonEx* box = ChannelBox(id);
  if (!box) return;
  box->SetCheck(!box->GetCheck());
  OnChannelClicked(id);
}

// ---- Instrument ---------------------------------------------------------------------------------

void CNewPriceAlertAdv::ChooseInstrument(const JInstrumentUnderlying& instrument) {
  // The record may live in a list the terminal replaces while we ask it things.
  const JInstrumentUnderlying chosen = instrument;
  if (chosen.productId != -1) {
    if (!addon::IsViewableStatus(Actions().AccessStatusOf(chosen))) {
      ShowMessage(addon::kNotViewableText);
      if (m_combo && m_instrumentList) {
        m_combo->AttachList(m_instrumentList, CInstrumentComboBox::ProductMapFromStore());
        m_combo->ShowPlaceholder();
      }
      update();
      return;
    }
  }
  MakeCurrent(chosen);
  if (m_price) m_price->Clear();
  update();
  // The quotes of the panel, asked now: withdraw, fetch once, then subscribe.
  const InstrumentKey key{chosen.productId, hv::Widen(chosen.instrumentCode)};
  addon::QuoteFeed::Instance().TakePending(std::set<InstrumentKey>{key});
  addon::SendInterestBatches(Sender(), addon::FieldTarget{chosen.productId, chosen.instrumentCode},
                             addon::AlertInterest());
}

void CNewPriceAlertAdv::ApplyLink(const ViewLink* link) {
  // An instrument handed over by link (a view opened on an instrument, a
  // restored layout) is preselected as 705 would.
  const auto text = addon::ReadLinkText(link);
  if (!text) return;
  const std::int64_t productId = text->GetInt64(addon::linkkey::kProductId).value_or(-1);
  const std::string code = text->Get(addon::linkkey::kInstrumentCode);
  if (productId == -1 || code.empty()) return;
  if (const auto* found = InstrumentMgr_ReadOnly().FindPtr(InstrumentKey{productId, hv::Widen(code)})) {
    MakeCurrent(*found);
    update();
  }
}

void CNewPriceAlertAdv::MakeCurrent(const JInstrumentUnderlying& instrument) {
  m_current = instrument;
  if (m_price) m_price->SetDecimals(std::clamp(instrument.decimals, 0, 10));
  if (m_combo && m_instrumentList) m_combo->SelectByKey(instrument);
  SendPriceInfoRequest();
  m_redrawVersion = 0;
  // The panel's quotes, subscribed on the next tick.
  addon::QuoteFeed::Instance().Register(InstrumentKey{instrument.productId, hv::Widen(instrument.instrumentCode)}, {},
                                        platform::TickCount());
}

void CNewPriceAlertAdv::SendPriceInfoRequest() {
  if (!m_current) return;
  JPriceInfoRequest request;
  request.priceStepTableId = m_current->priceStepTableId;
  request.referencePrice = m_current->referencePrice;
  CAddonView::SendChildFeedback(hm::AlertBoardRequest, ToLParam(&request));
}

// ---- Price steps ----------------------------------------------------------------------------------

void CNewPriceAlertAdv::OnSpinChanging(int delta) {
  if (delta == 0) return;
  const double price = m_price ? m_price->GetValue() : 0.0;
  const std::int32_t table = m_current ? m_current->priceStepTableId : 0;
  const double step = alerts::PriceStep(m_tickBands, table, price, delta > 0);
  m_lastStep = delta > 0 ? step : -step;
}

void CNewPriceAlertAdv::OnSpinScrolled(int) {
  if (!m_spin || m_spin->GetCtrlId() < kSpinId || !m_price) return;
  double next = m_price->GetValue() + m_lastStep;
  if (next < 0.0) next = 0.0;
  m_price->SetValue(next);
}

void CNewPriceAlertAdv::StepPrice(int delta) {
  if (m_spin) m_spin->Step(delta);
}

// ---- Submit -------------------------------------------------------------------------------------

void CNewPriceAlertAdv::SubmitAlert() {
  if (!m_current) {
    const std::wstring text = LanguageText(alerts::text::kNoInstrument);
    ShowMessage(text.empty() || m_appTitle.empty() ? alerts::kNoInstrumentText : text);
    return;
  }
  m_noExchangeText = LookupMessageText(alerts::kNoExchangeCode);
  m_exchangeList.clear();
  RequestSetting(hm::SystemParameter, alerts::kExchangesKey);
  if (!alerts::ExchangePermitted(m_current->exchangeCode, m_exchangeList)) {
    ShowMessage(m_noExchangeText);
    return;
  }
  PriceAlertItem item;
  item.alertId = m_editingId;
  item.productId = m_current->productId;
  item.exchangeCode = m_current->exchangeCode;
  item.instrumentCode = m_current->instrumentCode;
  item.triggerOnce = alerts::TriggerOnceOf(m_trigger ? m_trigger->currentIndex() : 0);
  item.validUntil = m_date ? alerts::DayText(m_date->GetTime()) : std::string();
  item.priceField = alerts::FieldCode(m_field ? m_field->currentIndex() : 0);
  item.comparator = alerts::ComparatorCode(m_comparator ? m_comparator->currentIndex() : 0);
  item.triggerValue = m_price ? m_price->GetValue() : 0.0;
  item.viaApp = m_viaApp;
  item.viaEmail = m_viaEmail;
  item.viaSms = m_viaSms;
  item.status = alerts::kActive;
  item.hostTextA.clear();
  CAddonView::SendChildFeedback(m_editingId == -1 ? hm::Alert702 : hm::Alert703, ToLParam(&item));
  CAddonView::SendChildFeedback(hm::AlertSubmitted, 0);
}

// ---- Quotes and timer -------------------------------------------------------------------------------

bool CNewPriceAlertAdv::HandlesQuotes() const { return m_activeViews.IsFirst() || !m_activeViews.IsMember(); }

void CNewPriceAlertAdv::ApplyQuote(const FieldUpdate& update) {
  if (update.param != 0 || update.kind != 0 || !HandlesQuotes()) return;
  ApplyFieldUpdate(QuoteStore::Instance(), update, platform::TickCount());
}

void CNewPriceAlertAdv::FlushSubscriptions() {
  if (!m_current) return;
  auto& feed = addon::QuoteFeed::Instance();
  const InstrumentKey key{m_current->productId, hv::Widen(m_current->instrumentCode)};
  for (const auto& pending : feed.TakePending(std::set<InstrumentKey>{key}))
    addon::SendInterestBatches(Sender(), addon::FieldTarget{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)},
                               addon::AlertInterest());
  feed.ExpireMarks(platform::TickCount());
}

std::uint64_t CNewPriceAlertAdv::QuoteRecordVersion() const {
  if (!m_current) return 0;
  return addon::QuoteFeed::Instance().NewestStamp(
      std::vector<InstrumentKey>{InstrumentKey{m_current->productId, hv::Widen(m_current->instrumentCode)}});
}

void CNewPriceAlertAdv::OnTimer(UINT id) {
  if (id != kRefreshTimer) return;
  if (HandlesQuotes()) FlushSubscriptions();
  const std::uint64_t version = QuoteRecordVersion();
  if (version > m_redrawVersion) {
    m_redrawVersion = version;
    repaint();
  }
}

// ---- Keyboard --------------------------------------------------------------------------------------

bool CNewPriceAlertAdv::eventFilter(QObject* watched, QEvent* event) {
  if (event->type() == QEvent::KeyPress) {
    auto* key = static_cast<QKeyEvent*>(event);
    if (key->key() == Qt::Key_Tab || key->key() == Qt::Key_Backtab) {
      MoveFocus(watched, key->key() == Qt::Key_Tab && !(key->modifiers() & Qt::ShiftModifier));
      return true;
    }
  }
  return CAddonView::eventFilter(watched, event);
}

void CNewPriceAlertAdv::MoveFocus(QObject* from, bool forward) {
  const std::vector<QWidget*> order = TabOrder();
  const int n = int(order.size());
  int at = -1;
  for (int i = 0; i < n && at < 0; ++i) {
    for (QObject* o = from; o; o = o->parent()) {
      if (o == order[std::size_t(i)]) { at = i; break; }
      if (o == this) break;
    }
  }
  for (int k = 1; k <= n; ++k) {
    const int next = ((at < 0 ? (forward ? -1 : 0) : at) + (forward ? k : -k) + n) % n;
    QWidget* w = order[std::size_t(next)];
    if (w && w->isVisible() && w->isEnabled()) {
      w->setFocus(Qt::TabFocusReason);
      return;
    }
  }
}

// ---- Layout and drawing --------------------------------------------------------------------------

void CNewPriceAlertAdv::Relayout() {
  const int w = width();
  const int right = std::max(kControlLeft + 200, w - kLeft);
  if (m_combo) m_combo->setGeometry(kControlLeft, 8, right - kControlLeft - 24, kRowHeight);
  if (m_explorer) m_explorer->setGeometry(right - 18, 11, 18, 18);
  int y = kFirstRow;
  if (m_field) m_field->setGeometry(kControlLeft, y, 160, kRowHeight);
  y += kRowStep;
  if (m_comparator) m_comparator->setGeometry(kControlLeft, y, 160, kRowHeight);
  y += kRowStep;
  if (m_price) m_price->setGeometry(kControlLeft, y, 140, kRowHeight);
  if (m_spin) m_spin->setGeometry(kControlLeft + 142, y, 18, kRowHeight);
  y += kRowStep;
  if (m_date) m_date->setGeometry(kControlLeft, y, 160, kRowHeight);
  y += kRowStep;
  if (m_trigger) m_trigger->setGeometry(kControlLeft, y, 160, kRowHeight);
  y += kRowStep;
  if (m_app) m_app->setGeometry(kControlLeft, y, 170, kRowHeight);
  if (m_email) m_email->setGeometry(kControlLeft + 176, y, 80, kRowHeight);
  if (m_sms) m_sms->setGeometry(kControlLeft + 262, y, 70, kRowHeight);
  y += kRowStep;
  // A frame shorter than asked for takes from the notice first, so that the
  // submit button, right under the last row in use, stays in view.
  const int noticeHeight = std::clamp(height() - y - kRowHeight - 14, 36, kNoticeHeight);
  if (m_notice) m_notice->setGeometry(kControlLeft, y, right - kControlLeft, noticeHeight);
  const int submitTop = y + (m_noticeShown ? noticeHeight + 10 : 4);
  if (m_submit) m_submit->setGeometry(right - 96, submitTop, 96, kRowHeight);
  update();
}

void CNewPriceAlertAdv::resizeEvent(QResizeEvent* e) {
  CAddonView::resizeEvent(e);
  Relayout();
}

void CNewPriceAlertAdv::paintEvent(QPaintEvent* e) {
  CAddonView::paintEvent(e);
  QPainter p(this);
  const QColor back = m_pStyleManager ? m_pStyleManager->Color(hv::style::kWindowBackground) : palette().window().color();
  const QColor text = m_pStyleManager ? m_pStyleManager->Color(hv::style::kWindowText) : palette().windowText().color();
  p.fillRect(rect(), back);
  if (m_pStyleManager) p.setFont(m_pStyleManager->GetFont(hv::style::kFontControl));
  p.setPen(text);
  // The captions beside their controls, in drawing order.
  const QWidget* rows[8] = {m_combo, m_field, m_comparator, m_price, m_date, m_trigger, m_app, m_notice};
  for (int i = 0; i < 8; ++i) {
    const QWidget* w = rows[i];
    if (!w || (i == 7 && !m_noticeShown)) continue;
    std::wstring caption = alerts::CachedText(alerts::text::kFirstCaption + i);
    if (caption.empty()) caption = kCaptionFallbacks[i];
    p.drawText(QRect(kLeft, w->y(), kControlLeft - kLeft - 6, kRowHeight), Qt::AlignLeft | Qt::AlignVCenter,
               Q(caption));
  }
  DrawInfoPanel(p, QRect(kLeft, kInfoTop, std::max(100, width() - 2 * kLeft), kInfoHeight));
}

void CNewPriceAlertAdv::DrawInfoPanel(QPainter& p, const QRect& area) {
  const QColor frame = m_pStyleManager ? m_pStyleManager->Color(hv::style::kBorder) : QColor(190, 196, 206);
  const QColor face = m_pStyleManager ? m_pStyleManager->Color(hv::style::kFace) : QColor(236, 238, 242);
  const QColor text = m_pStyleManager ? m_pStyleManager->Color(hv::style::kText) : QColor(0, 0, 0);
  const QColor muted = m_pStyleManager ? m_pStyleManager->Color(hv::style::kMutedText) : QColor(130, 136, 146);
  p.setPen(frame);
  p.setBrush(face);
  p.drawRect(area.adjusted(0, 0, -1, -1));
  p.setBrush(Qt::NoBrush);
  QFont font = m_pStyleManager ? m_pStyleManager->GetFont(kInfoFontId) : p.font();
  p.setFont(font);

  const int pad = 8;
  const int lineH = (area.height() - 2 * pad) / 3;
  auto pair = [&](int x, int line, int captionWidth, const QString& caption, const QString& value) {
    const QRect c(area.left() + x, area.top() + pad + line * lineH, captionWidth, lineH);
    p.setPen(muted);
    p.drawText(c, Qt::AlignLeft | Qt::AlignVCenter, caption);
    p.setPen(text);
    p.drawText(QRect(c.right() + 4, c.top(), area.width() / 2 - captionWidth - 8, lineH),
               Qt::AlignLeft | Qt::AlignVCenter, value);
  };
  const int half = area.width() / 2;
  QString code, name;
  if (m_current) {
    code = QString::fromUtf8(m_current->instrumentCode) + QStringLiteral(" [") +
           QString::fromUtf8(m_current->exchangeCode) + QStringLiteral("]");
    name = QString::fromUtf8(m_current->instrumentName);
  }
  const int captionWidth = p.fontMetrics().horizontalAdvance(QStringLiteral("Stock Name")) + 6;
  pair(pad, 0, captionWidth, QStringLiteral("Stock"), code);
  pair(half, 0, captionWidth, QStringLiteral("Stock Name"), name);
  QuoteRecord quote;
  const bool known =
      m_current &&
      addon::QuoteFeed::Instance().Read(InstrumentKey{m_current->productId, hv::Widen(m_current->instrumentCode)}, quote);
  // Nothing until the terminal has sent a value.
  auto value = [&](QuoteLayout::Field f) { return known && quote[f].filled ? Q(quote[f].text) : QString(); };
  const int third = area.width() / 3;
  auto cell = [&](int column, int line, const QString& caption, const QString& v) {
    const QRect c(area.left() + pad + column * third, area.top() + pad + line * lineH, captionWidth, lineH);
    p.setPen(muted);
    p.drawText(c, Qt::AlignLeft | Qt::AlignVCenter, caption);
    p.setPen(text);
    p.drawText(QRect(c.right() + 4, c.top(), std::max(0, third - captionWidth - 12), lineH),
               Qt::AlignLeft | Qt::AlignVCenter, v);
  };
  cell(0, 1, QStringLiteral("Bid"), value(QuoteLayout::Bid));
  cell(1, 1, QStringLiteral("Ask"), value(QuoteLayout::Ask));
  cell(2, 1, QStringLiteral("Last"), value(QuoteLayout::Last));
  QString change = value(QuoteLayout::Change);
  if (known && quote[QuoteLayout::PChange].filled && !quote[QuoteLayout::PChange].text.empty())
    change += QStringLiteral(" (") + Q(quote[QuoteLayout::PChange].text) + QStringLiteral("%)");
  cell(0, 2, QStringLiteral("Change"), change);
  cell(1, 2, QStringLiteral("Open"), value(QuoteLayout::Open));
  cell(2, 2, QStringLiteral("Close"), value(QuoteLayout::Close));
}
