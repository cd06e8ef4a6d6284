#include "views/price/PriceViewAdv.h"

#include <json/json.h>

#include <QCursor>
#include <QKeyEvent>
#include <QLineEdit>
#include <QPainter>
#include <QWheelEvent>
#include <algorithm>
#include <set>
#include <unordered_map>
#include <unordered_set>

#include "addon/Channel.h"
#include "addon/Feeds.h"
#include "addon/Logging.h"
#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "addon/TextTables.h"
#include "controls/InstrumentComboBox.h"
#include "data/MarketDelayCache.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/Buttons.h"
#include "hostview/CustomTabCtrl.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/price/AdvanceFilter.h"
#include "views/price/BoardGrid.h"
#include "views/price/PriceColumns.h"
#include "views/price/PriceGrid.h"
#include "views/price/TipDialogs.h"
#include "views/price/Watchlists.h"

ADDON_IMPLEMENT_VIEW(CPriceViewAdv)

namespace {

constexpr int kRowHeight = 24;       // family buttons, instrument box
constexpr int kTabHeight = 22;
constexpr int kButtonGap = 2;
constexpr int kComboWidth = 220;
constexpr int kIconButton = 20;
constexpr COLORREF kButtonBack = MakeColorRef(0xCC, 0xCC, 0xCC);

constexpr const wchar_t* kListImage = L".\\images\\QuickBar\\[styleID]\\toList.bmp";
constexpr const wchar_t* kBoardImage = L".\\images\\QuickBar\\[styleID]\\tradeboard.bmp";
constexpr const wchar_t* kExplorerImage = L".\\images\\Toolbar\\[styleID]\\InstrumentExplorer.bmp";
constexpr const wchar_t* kHelpImage = L".\\images\\Bitmaps\\[styleID]\\help.bmp";

// Texts the view reads from the language table (section 13).
constexpr int kLanguageIds[] = {7, 8, 10, 12, 22, 401, 402, 403, 404, 407, 408, 409, 410, 411,
                                413, 414, 415, 416, 417, 418, 419};

std::wstring Format(const wchar_t* format, int value) {
  std::wstring text = format;
  const std::size_t at = text.find(L"%d");
  if (at != std::wstring::npos) text.replace(at, 2, std::to_wstring(value));
  return text;
}

std::wstring FormatText(std::wstring format, const std::wstring& value) {
  const std::size_t at = format.find(L"%s");
  if (at != std::wstring::npos) format.replace(at, 2, value);
  return format;
}

std::wstring Lang(int id, const wchar_t* fallback) {
  std::wstring text = addon::LanguageTextTable::Instance().Get(id);
  return text.empty() ? std::wstring(fallback) : text;
}

// A field update of the leading price view's instrument records.
constexpr UINT kInstrumentFieldUpdate = hm::InstrumentFieldUpdate;

// Process-wide: how often a silent instrument was asked again.
std::map<InstrumentKey, int>& RetryCounters() {
  static std::map<InstrumentKey, int> counters;
  return counters;
}

// Process-wide second counter of the leading price view.
int& SharedTicks() {
  static int ticks = 0;
  return ticks;
}

CPriceViewAdv* AsPriceView(CSuperBaseView* view) { return dynamic_cast<CPriceViewAdv*>(view); }

bool SameLists(const std::vector<WatchListDetail>& a, const std::vector<WatchListDetail>& b) {
  if (a.size() != b.size()) return false;
  for (std::size_t i = 0; i < a.size(); ++i)
    if (a[i].WatchlistID != b[i].WatchlistID || a[i].name != b[i].name || a[i].items != b[i].items) return false;
  return true;
}

}  // namespace

const addon::ViewClassInfo& CPriceViewAdv::Info() {
  static const addon::ViewClassInfo info{
      .className = "CPriceViewAdv",
      .titleEntry = 0,  // the language table has no title entry for this view
      .defaultTitle = L"Price View",
      .firstSettings = {{hm::SystemParameter, "ADVFT"},
                        {hm::SystemParameter, "MAXWL"},
                        {hm::SystemParameter, "MAXWT"},
                        {hm::NoticeParameter, "OLDWL"},
                        {hm::NoticeParameter, "WLNOT"},
                        {hm::SystemParameter, "MKTEX"}},
      .firstStores = {addon::RefStore::Products, addon::RefStore::Exchanges, addon::RefStore::Instruments,
                      addon::RefStore::UserWatchlists, addon::RefStore::KeldoWatchlists,
                      addon::RefStore::Top30Watchlists},
      // Refused on the user and KELDO pages; its own rows travel as "price view".
      .dropSources = {"COrderStatusViewNew", "COpenPositionView", "CMarketDepthAdv", "CTimeAndSalesAdv",
                      "CTradeSummaryAdv", addon::kPriceViewSource},
      .descriptor = &classCPriceViewAdv,
  };
  return info;
}

CPriceViewAdv::CPriceViewAdv() : CAddonView(Info()) { watchlist::InstallStoreProbes(); }

CPriceViewAdv::~CPriceViewAdv() {
  for (UINT id : {kRefreshTimer, kSecondTimer, kRemarkTipTimer, kLongShortTipTimer}) platform::KillTimer(this, id);
}

void CPriceViewAdv::ResetProcessState() {
  RetryCounters().clear();
  SharedTicks() = 0;
}

bool CPriceViewAdv::IsQuoteApplier() const {
  if (!m_priceViews.IsMember()) return false;
  CSuperBaseView* first = addon::ActiveViews().FirstView();
  if (first && AsPriceView(first)) return first == this;
  return IsLeadingPriceView();
}

const std::wstring& CPriceViewAdv::CurrentName(int listKind) const {
  static const std::wstring kNone;
  switch (listKind) {
    case kUserWatchlists: return m_currentUser;
    case kTop30Watchlists: return m_currentTop30;
    case kKeldoWatchlists: return m_currentKeldo;
    default: return kNone;
  }
}

IQuoteGrid* CPriceViewAdv::VisibleGrid() const {
  IQuoteGrid* grid = m_grids[m_displayMode == kBoardMode ? 1 : 0];
  return grid ? grid : m_grids[0];
}

CCustomTabCtrl* CPriceViewAdv::Tabs(int listKind) const {
  switch (listKind) {
    case kUserWatchlists: return m_userTabs;
    case kTop30Watchlists: return m_top30Tabs;
    case kKeldoWatchlists: return m_keldoTabs;
    default: return nullptr;
  }
}

QWidget* CPriceViewAdv::Control(int id) const {
  switch (id) {
    case kUserTabsId: return m_userTabs;
    case kTop30TabsId: return m_top30Tabs;
    case kKeldoTabsId: return m_keldoTabs;
    case kUserButtonId: return m_familyButtons[kUserWatchlists];
    case kTop30ButtonId: return m_familyButtons[kTop30Watchlists];
    case kKeldoButtonId: return m_familyButtons[kKeldoWatchlists];
    case kWorldButtonId: return m_familyButtons[kWorldIndices];
    case kFilterButtonId: return m_familyButtons[kAdvanceFilter];
    case kInstrumentBoxId: return m_combo;
    case kListModeButtonId: return m_listModeButton;
    case kBoardModeButtonId: return m_boardModeButton;
    case kExplorerButtonId: return m_explorerButton;
    case kTop30MenuButtonId: return m_top30MenuButton;
    case kHelpButtonId: return m_helpButton;
    case CAdvanceFilter::kProductListId:
    case CAdvanceFilter::kExchangeListId:
    case CAdvanceFilter::kSectorListId:
    case CAdvanceFilter::kLetterListId:
      return m_filter ? static_cast<QWidget*>(m_filter->List(id)) : nullptr;
    default: return nullptr;
  }
}

// ---- Creation ----------------------------------------------------------------------------

int CPriceViewAdv::OnCreate() {
  m_priceViews.Join(this);
  BuildControls();
  m_listKind = kUserWatchlists;
  PressFamilyButton();
  return 0;
}

void CPriceViewAdv::BuildControls() {
  auto tabs = [this](unsigned style, int id, int kind) {
    auto* t = new CCustomTabCtrl(this, style, id);
    t->SetStyleManager(m_pStyleManager);
    t->SetNotifyHandler([this, kind](CTCNotify& n) { OnTabNotify(kind, n); });
    t->hide();
    return t;
  };
  m_userTabs = tabs(CTCS_ADDBUTTON | CTCS_DRAGMOVE | CTCS_EDITLABELS | CTCS_CLOSEBUTTON, kUserTabsId, kUserWatchlists);
  m_userTabs->setObjectName(QStringLiteral("UserWatchlistTabs"));
  m_top30Tabs = tabs(0, kTop30TabsId, kTop30Watchlists);
  m_top30Tabs->setObjectName(QStringLiteral("Top30Tabs"));
  m_keldoTabs = tabs(CTCS_EDITLABELS, kKeldoTabsId, kKeldoWatchlists);
  m_keldoTabs->setObjectName(QStringLiteral("KeldoTabs"));

  struct FamilyButton {
    int kind, id;
    const wchar_t* text;
  };
  const FamilyButton families[] = {
      {kUserWatchlists, kUserButtonId, L"Tirvane"},     {kTop30Watchlists, kTop30ButtonId, L"TOP30"},
      {kKeldoWatchlists, kKeldoButtonId, L"KELDOtest"}, {kWorldIndices, kWorldButtonId, L"World Indices"},
      {kAdvanceFilter, kFilterButtonId, L"Advance Filter"},
  };
  for (const auto& f : families) {
    auto* b = new CBranticButton(this, f.id);
    b->SetWindowText(f.text);
    b->SetStyleManager(m_pStyleManager);
    b->setFocusPolicy(Qt::NoFocus);
    connect(b, &CHostButton::commandClicked, this, [this](int id) { OnCommand(id); });
    m_familyButtons[f.kind] = b;
  }
  m_filter = new CAdvanceFilter(this);
  m_filter->SetStyleManager(m_pStyleManager);
  m_filter->onResult = [this](const std::vector<InstrumentKey>& result) { OnFilterResult(result); };
  m_filter->hide();

  m_combo = new CInstrumentComboBox(this);
  m_combo->setObjectName(QStringLiteral("InstrumentBox"));
  m_combo->SetLanguage(m_pLanguage);
  m_combo->SetStyleManager(m_pStyleManager);
  connect(m_combo, &CInstrumentComboBox::InstrumentChosen, this,
          [this] { AddChosenInstrument(m_combo->GetChosenInstrument()); });

  auto imageButton = [this](int id, const wchar_t* tip) {
    auto* b = new CImageButton(this, id);
    b->SetBkColor(kButtonBack);
    b->SetStyleManager(m_pStyleManager);
    if (tip) b->SetTooltipText(tip);
    b->setFocusPolicy(Qt::NoFocus);
    connect(b, &CHostButton::commandClicked, this, [this](int cmd) { OnCommand(cmd); });
    return b;
  };
  m_listModeButton = imageButton(kListModeButtonId, L"Table View");
  m_boardModeButton = imageButton(kBoardModeButtonId, L"Grid View");
  m_explorerButton = imageButton(kExplorerButtonId, L"Instrument Explorer");
  m_helpButton = imageButton(kHelpButtonId, kHelpTip);
  m_helpButton->SetWindowText(L"?");
  m_top30MenuButton = new CBranticButton(this, kTop30MenuButtonId);
  m_top30MenuButton->SetWindowText(L"\u25BE");
  m_top30MenuButton->SetStyleManager(m_pStyleManager);
  m_top30MenuButton->setFocusPolicy(Qt::NoFocus);
  connect(m_top30MenuButton, &CHostButton::commandClicked, this, [this](int id) { OnCommand(id); });

  m_priceGrid = new PriceGrid(this);
  m_priceGrid->setObjectName(QStringLiteral("PriceGrid"));
  m_priceGrid->SetOwner(this);
  m_priceGrid->SetStyleManager(m_pStyleManager);
  m_priceGrid->hide();
  m_grids[kListMode] = m_priceGrid;
  m_boardGrid = new BoardGrid(this);
  m_boardGrid->setObjectName(QStringLiteral("BoardGrid"));
  m_boardGrid->SetOwner(this);
  m_boardGrid->SetStyleManager(m_pStyleManager);
  m_boardGrid->hide();
  m_grids[kBoardMode] = m_boardGrid;

  m_lsTip = new CLSTipDlg(this);
  m_remTip = new CRemTipDlg(this);
  for (CTipDialogBase* tip : {static_cast<CTipDialogBase*>(m_lsTip), static_cast<CTipDialogBase*>(m_remTip)}) {
    tip->SetLanguage(m_pLanguage);
    tip->SetStyleManager(m_pStyleManager);
    tip->Create();
    tip->ApplyStyle(m_styleId);
    tip->hide();
  }

  // The six trade keys, wherever the focus is; in the search box the
  // main-keyboard plus, equals and minus stay text.
  WatchTradeKeys(this);
  WatchTradeKeys(m_priceGrid);
  WatchTradeKeys(m_priceGrid->viewport());
  WatchTradeKeys(m_boardGrid);
  WatchTradeKeys(m_boardGrid->viewport());
  WatchTradeKeys(m_combo, true);
  if (m_combo->lineEdit()) WatchTradeKeys(m_combo->lineEdit(), true);
  // The wheel gives the focus to the grid first.
  for (QWidget* w : {static_cast<QWidget*>(m_combo), static_cast<QWidget*>(m_userTabs),
                     static_cast<QWidget*>(m_top30Tabs), static_cast<QWidget*>(m_keldoTabs)})
    w->installEventFilter(this);
  ReloadImages();
  ReloadComboList();
  Relayout();
}

void CPriceViewAdv::ReloadImages() {
  auto load = [this](CImageButton* b, const wchar_t* path) {
    if (b) b->LoadBitmap(CStyleImage::ForStyle(path, m_styleId));
  };
  load(m_listModeButton, kListImage);
  load(m_boardModeButton, kBoardImage);
  load(m_explorerButton, kExplorerImage);
  load(m_helpButton, kHelpImage);
}

void CPriceViewAdv::ReloadComboList() {
  if (!m_combo) return;
  const auto* list = InstrumentMgr_ReadOnly().Source();
  if (!list || list == m_comboList) return;
  m_comboList = list;
  m_combo->AttachList(list, CInstrumentComboBox::ProductMapFromStore());
}

// ---- Style and language --------------------------------------------------------------------

void CPriceViewAdv::SetStyleManager(IStyleManager* styleManager) {
  CAddonView::SetStyleManager(styleManager);
  for (CCustomTabCtrl* t : {m_userTabs, m_top30Tabs, m_keldoTabs})
    if (t) t->SetStyleManager(styleManager);
  for (CBranticButton* b : m_familyButtons)
    if (b) b->SetStyleManager(styleManager);
  if (m_combo) m_combo->SetStyleManager(styleManager);
  if (m_filter) m_filter->SetStyleManager(styleManager);
  for (CHostButton* b : std::initializer_list<CHostButton*>{m_listModeButton, m_boardModeButton, m_explorerButton,
                                                           m_helpButton, m_top30MenuButton})
    if (b) b->SetStyleManager(styleManager);
  for (IQuoteGrid* g : m_grids)
    if (g) g->SetStyleManager(styleManager);
  if (m_lsTip) m_lsTip->SetStyleManager(styleManager);
  if (m_remTip) m_remTip->SetStyleManager(styleManager);
}

void CPriceViewAdv::SetStyleID(int styleId) {
  CAddonView::SetStyleID(styleId);
  ReloadImages();
}

void CPriceViewAdv::ChangeStyle(int styleId) {
  CAddonView::ChangeStyle(styleId);
  SetStyleManager(m_pStyleManager);
  ReloadImages();
  if (m_lsTip) m_lsTip->ApplyStyle(styleId);
  if (m_remTip) m_remTip->ApplyStyle(styleId);
  update();
}

void CPriceViewAdv::ApplyLanguage() {
  CAddonView::ApplyLanguage();
  auto& texts = addon::LanguageTextTable::Instance();
  for (int id : kLanguageIds) texts.Load(m_pLanguage, id, id);
  texts.Load(m_pLanguage, 101, 128);
  CWatchlistSetting setting = GetUserSettings().GetWatchlistSetting();
  setting.RefreshLanguage(m_pLanguage);
  // The headings follow the language; nothing else of the setting changes.
  if (!(setting == GetUserSettings().GetWatchlistSetting())) GetUserSettings().SetWatchlistSetting(setting);
  if (m_combo) m_combo->SetLanguage(m_pLanguage);
  if (m_lsTip) m_lsTip->SetLanguage(m_pLanguage);
  if (m_remTip) m_remTip->SetLanguage(m_pLanguage);
  LayoutFamilyButtons();
  for (IQuoteGrid* g : m_grids)
    if (g) g->ApplyColumns();
  UpdateEmptyText();
}

// ---- Activation --------------------------------------------------------------------------------

void CPriceViewAdv::StartTimers() {
  platform::SetTimer(this, kRefreshTimer, kRefreshMs);
  platform::SetTimer(this, kSecondTimer, kSecondMs);
}

void CPriceViewAdv::OnActivate() {
  PrepareBasicData();
  SendViewSize(300, 150);
  m_activeViews.Join(this);
  StartTimers();
  QueryDisplayMode();
  LayoutFamilyButtons();
  if (m_firstActivation) {
    m_firstActivation = false;
    LoadWatchlistTabs();
    LoadTOP30WatchlistTabs();
    LoadKELDOWatchlistTabs();
    for (bool& stale : m_tabsStale) stale = false;
    if (m_listKind == kUserWatchlists) ShowWatchlist(kUserWatchlists, m_currentUser);
    RestorePendingFilter();
  } else {
    // Lists that changed while another view had the focus.
    for (int family = 0; family < 3; ++family)
      if (m_tabsStale[family]) ReloadFamily(family);
  }
  ApplyLanguage();
  SetActiveFlag(true);
  SendChildFeedback(hm::RemarkMessages, 0);
  RequestSetting(hm::SystemParameter, "MODSA");
}

void CPriceViewAdv::OnDeactivate() {
  PrepareBasicData();
  StartTimers();
  m_activeViews.Leave();
  SetActiveFlag(false);
}

// ---- Layout ---------------------------------------------------------------------------------------

void CPriceViewAdv::LayoutFamilyButtons() {
  const bool compactMode = DisplayModeValue() == 101;
  CBranticButton* user = m_familyButtons[kUserWatchlists];
  if (!user) return;
  if (compactMode) {
    user->SetWindowText(L"Watchlist");
    user->SetTooltipText(L"Watchlist");
  } else {
    user->SetWindowText(L"Tirvane");
    user->SetTooltipText(LanguageText(22));
  }
  const std::wstring brandCaption = addon::SettingTextTable::Instance().Get("OLDWL");
  m_familyButtons[kKeldoWatchlists]->SetWindowText(brandCaption.empty() ? L"KELDOtest" : brandCaption);
  const std::size_t keldoCount = compactMode ? 0 : KeldoWatchlistStore().Records().size();
  m_familyButtons[kTop30Watchlists]->setVisible(!Top30WatchlistStore().Records().empty());
  m_familyButtons[kKeldoWatchlists]->setVisible(keldoCount > 0);
  m_familyButtons[kWorldIndices]->setVisible(!WorldIndexStore().Records().empty());
  Relayout();
}

void CPriceViewAdv::PressFamilyButton() {
  for (int kind = 0; kind < 5; ++kind)
    if (m_familyButtons[kind]) m_familyButtons[kind]->setDown(kind == m_listKind);
}

void CPriceViewAdv::Relayout() {
  const int w = width(), h = height();
  int x = 2;
  const QFontMetrics fm(m_familyButtons[0] ? m_familyButtons[0]->font() : font());
  for (CBranticButton* b : m_familyButtons) {
    if (!b || b->isHidden()) continue;
    const int bw = std::max(60, fm.horizontalAdvance(b->text()) + 16);
    b->setGeometry(x, 2, bw, kRowHeight - 2);
    x += bw + kButtonGap;
  }
  // Right end: help, mode, explorer, instrument box.
  int right = w - 2;
  auto place = [&](QWidget* widget, int width) {
    if (!widget || widget->isHidden()) return;
    right -= width;
    widget->setGeometry(right, 3, width, kRowHeight - 4);
    right -= kButtonGap;
  };
  m_helpButton->show();
  place(m_helpButton, kIconButton);
  m_listModeButton->setVisible(m_displayMode == kBoardMode);
  m_boardModeButton->setVisible(m_displayMode == kListMode && m_grids[kBoardMode] != nullptr);
  place(m_listModeButton, kIconButton);
  place(m_boardModeButton, kIconButton);
  place(m_explorerButton, kIconButton);
  const bool editable = m_listKind == kUserWatchlists || m_listKind == kKeldoWatchlists;
  m_combo->setVisible(editable);
  if (editable) {
    const int cw = std::max(80, std::min(kComboWidth, right - x - 4));
    right -= cw;
    m_combo->setGeometry(right, 1, cw, kRowHeight);
  }

  int top = kRowHeight + 2;
  CCustomTabCtrl* shown = Tabs(m_listKind);
  for (CCustomTabCtrl* t : {m_userTabs, m_top30Tabs, m_keldoTabs}) t->setVisible(t == shown);
  const bool top30 = m_listKind == kTop30Watchlists;
  m_top30MenuButton->setVisible(top30);
  if (shown) {
    const int menuWidth = top30 ? kTabHeight : 0;
    shown->setGeometry(0, top, w - menuWidth, kTabHeight);
    if (top30) m_top30MenuButton->setGeometry(w - menuWidth, top, menuWidth, kTabHeight);
    top += kTabHeight;
  }
  if (m_filter) m_filter->setVisible(m_listKind == kAdvanceFilter);
  if (m_filter && m_listKind == kAdvanceFilter) {
    m_filter->setGeometry(0, top, w, CAdvanceFilter::BarHeight());
    top += CAdvanceFilter::BarHeight();
  }
  for (int mode = 0; mode < 2; ++mode) {
    IQuoteGrid* g = m_grids[mode];
    if (!g) continue;
    g->Widget()->setGeometry(0, top, w, std::max(0, h - top));
  }
  update();
}

void CPriceViewAdv::resizeEvent(QResizeEvent* e) {
  CAddonView::resizeEvent(e);
  Relayout();
}

void CPriceViewAdv::paintEvent(QPaintEvent* e) {
  CAddonView::paintEvent(e);
  QPainter p(this);
  const QColor back =
      m_pStyleManager ? m_pStyleManager->Color(hv::style::kWindowBackground) : palette().window().color();
  p.fillRect(rect(), back);
}

// ---- Host notifications ----------------------------------------------------------------------------

std::uint32_t CPriceViewAdv::OnViewMessage(UINT message, LPARAM data) {
  switch (message) {
    case hm::WatchlistsLoaded:
      if (data >= 0 && data <= 2) OnWatchlistsChanged(int(data));
      return 0;
    case hm::FieldValue:
    case hm::RequestField:
      if (data) OnFieldUpdate(*FromLParam<const FieldUpdate>(data));
      return 0;
    case kInstrumentFieldUpdate:
      if (data && IsLeadingPriceView()) OnInstrumentFieldUpdate(*FromLParam<const FieldUpdate>(data));
      return 0;
    case hm::InstrumentList:
      if (data) OnInstrumentList(*FromLParam<const JInstrumentListMsg>(data));
      return 0;
    case hm::ProductList:
      // Filed by the base; the box keeps a copy of the product map.
      m_comboList = nullptr;
      ReloadComboList();
      return 0;
    case hm::WatchlistList:
      if (data && IsLeadingPriceView()) OnUserWatchlists(*FromLParam<const std::vector<JWatchlistRow>>(data));
      return 0;
    case hm::SaveWatchlistNames:
      if (data && IsLeadingPriceView()) {
        watchlist::ApplyAcknowledgedIds(*FromLParam<const std::vector<JWatchlistIdRow>>(data));
        // The tabs carry the ids as their data.
        for (CSuperBaseView* v : addon::OpenPriceViews().Views())
          if (auto* pv = AsPriceView(v); pv && pv->m_userTabs)
            for (int i = 0; i < pv->m_userTabs->GetItemCount(); ++i)
              if (const auto* w = UserWatchlistStore().FindPtr(pv->m_userTabs->GetItemText(i)))
                pv->m_userTabs->SetItemData(i, w->WatchlistID);
      }
      return 0;
    case hm::WatchlistGroups520:
    case hm::WatchlistGroups521:
      if (data && IsLeadingPriceView()) OnTop30(*FromLParam<const std::vector<JTop30Group>>(data));
      return 0;
    case hm::WatchlistRows522:
      if (data && IsLeadingPriceView()) {
        watchlist::ApplyKeldoRows(*FromLParam<const std::vector<JKeldoWatchlistRow>>(data));
        LayoutFamilyButtons();
      }
      return 0;
    case hm::RemarkMessages:
      if (data) {
        m_remarkRows.clear();
        std::set<std::wstring> seen;
        const auto& rows = *FromLParam<const std::vector<JRemarkMessage>>(data);
        // The legend explains the codes of its exchange; any exchange's when it has none.
        bool anySgx = std::any_of(rows.begin(), rows.end(), [](const auto& r) { return r.exchangeCode == "SGX"; });
        for (const JRemarkMessage& r : rows) {
          if (anySgx && r.exchangeCode != "SGX") continue;
          if (!seen.insert(hv::Widen(r.remarkCode)).second) continue;
          m_remarkRows.emplace_back(hv::Widen(r.remarkCode), hv::Widen(r.text));
        }
        if (m_remTip && m_remTip->Board()) m_remTip->Board()->SetPairs(m_remarkRows);
      }
      return 0;
    case hm::LinkData:
      if (const auto* link = FromLParam<const ViewLink>(data); link && link->link) ApplyStartParams(*link->link);
      return 0;
    case hm::FontSizeMenu:
      ShowFontSizeMenu();
      return 0;
    case hm::Sectors:
      if (data && m_filter) {
        m_filter->SetSectors(*FromLParam<const std::vector<JSector>>(data));
        RestorePendingFilter();
      }
      return 0;
    case hm::SettingsChanged:
      for (IQuoteGrid* g : m_grids)
        if (g) g->ApplyColumns();
      return 0;
    default:
      return 0;
  }
}

void CPriceViewAdv::OnFieldUpdate(const FieldUpdate& update) {
  if (update.kind != 0 || update.param != 0) return;
  if (!IsQuoteApplier()) return;
  ApplyFieldUpdate(QuoteStore::Instance(), update, platform::TickCount());
}

void CPriceViewAdv::OnInstrumentFieldUpdate(const FieldUpdate& update) {
  const InstrumentKey key{update.productId, hv::Widen(update.instrumentCode)};
  const JInstrumentUnderlying* known = InstrumentMgr().FindPtr(key);
  if (!known) known = InstrumentMgr_ReadOnly().FindPtr(key);
  if (update.fieldName == "INSTRNAME" || update.fieldName == "REMARKS") {
    if (!known) return;
    if (update.fieldName == "INSTRNAME") {
      // The price view's own store holds the changed record; it wins over the host's list.
      JInstrumentUnderlying record = *known;
      record.instrumentName = update.value;
      InstrumentMgr().Put(record);
      for (CSuperBaseView* v : addon::OpenPriceViews().Views())
        if (auto* pv = AsPriceView(v))
          for (IQuoteGrid* g : pv->m_grids)
            if (g) g->RejoinInstruments();
      return;
    }
    ApplyFieldUpdate(QuoteStore::Instance(), update, platform::TickCount());
    return;
  }
  ApplyFieldUpdate(QuoteStore::Instance(), update, platform::TickCount());
}

void CPriceViewAdv::OnInstrumentList(const JInstrumentListMsg& msg) {
  // The base filed the list in the read-only instrument store.
  m_instrumentList = msg.instruments;
  if (msg.instruments) watchlist::BuildWorldIndexList(*msg.instruments);
  ReloadComboList();
  for (IQuoteGrid* g : m_grids)
    if (g) g->RejoinInstruments();
  LayoutFamilyButtons();
}

void CPriceViewAdv::OnUserWatchlists(const std::vector<JWatchlistRow>& rows) {
  watchlist::ApplyUserRows(rows, addon::SettingTextTable::Instance().MaxWatchlistItems());
  SendChildFeedback(hm::WatchlistsLoaded, 0);
}

void CPriceViewAdv::OnTop30(const std::vector<JTop30Group>& groups) {
  const std::vector<WatchListDetail> before = Top30WatchlistStore().Records();
  watchlist::ApplyTop30Groups(groups);
  if (SameLists(before, Top30WatchlistStore().Records())) return;
  // The rankings moved: every price view shows the new lists.
  for (CSuperBaseView* v : addon::OpenPriceViews().Views())
    if (auto* pv = AsPriceView(v)) pv->LayoutFamilyButtons();
  SendChildFeedback(hm::WatchlistsLoaded, 1);
}

void CPriceViewAdv::OnWatchlistsChanged(int family) {
  if (!IsActive()) {
    m_tabsStale[family] = true;
    return;
  }
  ReloadFamily(family);
}

void CPriceViewAdv::ReloadFamily(int family) {
  m_tabsStale[family] = false;
  LoadTabs(family);
  LayoutFamilyButtons();
  if (m_listKind == family && !CurrentName(family).empty()) ShowWatchlist(family, CurrentName(family));
}

void CPriceViewAdv::ApplyStartParams(const std::wstring& linkText) {
  const auto link = addon::ReadLinkText(linkText);
  if (!link) return;
  const std::string mode = link->Get(addon::linkkey::kUserDisplayMode);
  if (mode == "Board" && m_grids[kBoardMode]) SetDisplayMode(kBoardMode);
  else if (mode == "List") SetDisplayMode(kListMode);
  m_pendingFilter = link->Get(kAdvanceFilterParam);
  if (!m_firstActivation) RestorePendingFilter();
}

void CPriceViewAdv::StoreStartParams() {
  StartParamMap params = GetStartParams();
  params[addon::linkkey::kUserDisplayMode] = m_displayMode == kBoardMode ? L"Board" : L"List";
  const auto choice = m_filter && m_listKind == kAdvanceFilter ? m_filter->CurrentChoice() : std::nullopt;
  if (choice) params[kAdvanceFilterParam] = hv::Widen(CAdvanceFilter::ChoiceText(*choice));
  else params.erase(kAdvanceFilterParam);
  SetStartParam(-1, std::string(), params);
}

// ---- Advance filter ----------------------------------------------------------------------------------

void CPriceViewAdv::OpenAdvanceFilter() {
  m_filter->Reset();
  // The sectors come with 2800; the terminal answers at once.
  if (!m_filter->HasSectors()) SendChildFeedback(hm::Sectors, 0);
}

void CPriceViewAdv::OnFilterResult(const std::vector<InstrumentKey>& result) {
  if (m_listKind != kAdvanceFilter) return;
  if (IQuoteGrid* grid = VisibleGrid()) grid->LoadItems(kAdvanceFilter, std::wstring(), result);
  UpdateEmptyText();
  StoreStartParams();
}

void CPriceViewAdv::RestorePendingFilter() {
  if (m_pendingFilter.empty() || !m_filter || m_firstActivation) return;
  const auto choice = CAdvanceFilter::ParseChoice(m_pendingFilter);
  if (!choice) {
    m_pendingFilter.clear();
    return;
  }
  if (m_listKind != kAdvanceFilter) SwitchFamily(kAdvanceFilter);
  // A sector other than "ALL" waits for the terminal's sectors.
  if (!m_filter->HasSectors() && choice->sector != CAdvanceFilter::kAllSectorsValue) return;
  m_pendingFilter.clear();
  if (m_filter->Restore(*choice)) return;
  // A choice the lists no longer offer: an empty filter to choose again.
  for (IQuoteGrid* g : m_grids)
    if (g) g->LoadItems(kAdvanceFilter, std::wstring(), {});
  UpdateEmptyText();
  StoreStartParams();
}

// ---- Tabs ----------------------------------------------------------------------------------------------

void CPriceViewAdv::LoadWatchlistTabs() { LoadTabs(kUserWatchlists); }
void CPriceViewAdv::LoadTOP30WatchlistTabs() { LoadTabs(kTop30Watchlists); }
void CPriceViewAdv::LoadKELDOWatchlistTabs() { LoadTabs(kKeldoWatchlists); }

void CPriceViewAdv::LoadTabs(int listKind) {
  static const char* const kLoaders[] = {"CPriceViewAdv::LoadWatchlistTabs", "CPriceViewAdv::LoadTOP30WatchlistTabs",
                                         "CPriceViewAdv::LoadKELDOWatchlistTabs"};
  CCustomTabCtrl* tabs = Tabs(listKind);
  WatchlistStoreT* store = StoreOfKind(listKind);
  if (!tabs || !store) return;
  LogInfo(kLoaders[listKind], addon::SourceFileName(__FILE__), __LINE__);
  tabs->DeleteAllItems();
  for (const WatchListDetail& w : store->Records()) tabs->AddItem(w.name, w.WatchlistID);
  std::wstring& current = listKind == kUserWatchlists    ? m_currentUser
                          : listKind == kTop30Watchlists ? m_currentTop30
                                                         : m_currentKeldo;
  // A current list that is gone gives way to the first.
  if (!current.empty() && store->IndexOf(current) < 0) current.clear();
  if (current.empty() && !store->Records().empty()) {
    current = store->Records().front().name;
    tabs->SetCurSel(0);
  } else if (!current.empty()) {
    tabs->SetCurSel(store->IndexOf(current));
  }
  LogInfo(kLoaders[listKind], addon::SourceFileName(__FILE__), __LINE__);
}

void CPriceViewAdv::OnTabNotify(int listKind, CTCNotify& n) {
  CCustomTabCtrl* tabs = Tabs(listKind);
  if (!tabs) return;
  switch (n.code) {
    case CTCN_SELCHANGE:
      if (n.item >= 0) ShowWatchlist(listKind, tabs->GetItemText(n.item));
      return;
    case CTCN_RCLICK:
      if (n.item >= 0) ShowTabMenu(listKind, n.item, n.globalPos);
      return;
    case CTCN_ADDREQUEST:
      if (listKind == kUserWatchlists) CreateWatchlist();
      return;
    case CTCN_DELETEREQUEST:
      if (listKind != kUserWatchlists || !DeleteFromTabStrip(n.item)) n.refuse = true;
      return;
    case CTCN_LABELUPDATE:
      if (!RenameWatchlist(listKind, n.item, n.oldText)) n.refuse = true;
      return;
    case CTCN_ITEMMOVED:
      if (listKind == kUserWatchlists) ReorderUserWatchlists();
      return;
    default:
      return;
  }
}

void CPriceViewAdv::ShowTabMenu(int listKind, int index, const QPoint& globalPos) {
  if (listKind != kUserWatchlists && listKind != kKeldoWatchlists) return;
  m_clickedTab = index;
  std::vector<platform::MenuItem> items;
  platform::MenuItem rename;
  rename.id = listKind == kUserWatchlists ? kCmdRenameUser : kCmdRenameKeldo;
  rename.text = QString::fromStdWString(Lang(410, L"Rename"));
  items.push_back(rename);
  if (listKind == kUserWatchlists) {
    platform::MenuItem remove;
    remove.id = kCmdDeleteUser;
    remove.text = QString::fromStdWString(Lang(411, L"Delete"));
    items.push_back(remove);
  }
  const int chosen = platform::Dialogs().PopupMenu(this, items, globalPos);
  if (chosen) OnCommand(chosen);
}

// ---- Commands ------------------------------------------------------------------------------------------

void CPriceViewAdv::OnCommand(int id) {
  switch (id) {
    case kUserButtonId: SwitchFamily(kUserWatchlists); return;
    case kTop30ButtonId: SwitchFamily(kTop30Watchlists); return;
    case kKeldoButtonId: SwitchFamily(kKeldoWatchlists); return;
    case kWorldButtonId: SwitchFamily(kWorldIndices); return;
    case kFilterButtonId: SwitchFamily(kAdvanceFilter); return;
    case kListModeButtonId: SetDisplayMode(kListMode); return;
    case kBoardModeButtonId: SetDisplayMode(kBoardMode); return;
    case kExplorerButtonId:
      Actions().OpenInstrumentExplorer();
      return;
    case kCmdRenameUser:
      if (m_clickedTab >= 0) m_userTabs->EditLabel(m_clickedTab);
      return;
    case kCmdRenameKeldo:
      if (m_clickedTab >= 0) m_keldoTabs->EditLabel(m_clickedTab);
      return;
    case kCmdDeleteUser:
      if (m_clickedTab >= 0) DeleteFromMenu(m_clickedTab);
      return;
    case kTop30MenuButtonId: {
      std::vector<platform::MenuItem> items;
      const auto& lists = Top30WatchlistStore().Records();
      for (std::size_t i = 0; i < lists.size() && kCmdTop30First + int(i) <= kCmdTop30Last; ++i) {
        platform::MenuItem item;
        item.id = kCmdTop30First + int(i);
        item.text = QString::fromStdWString(lists[i].name);
        item.checked = lists[i].name == m_currentTop30;
        items.push_back(std::move(item));
      }
      const QPoint at = m_top30MenuButton->mapToGlobal(QPoint(0, m_top30MenuButton->height()));
      const int chosen = platform::Dialogs().PopupMenu(this, items, at);
      if (chosen) OnCommand(chosen);
      return;
    }
    default:
      break;
  }
  if (id >= kCmdTop30First && id <= kCmdTop30Last) {
    const auto& lists = Top30WatchlistStore().Records();
    const std::size_t i = std::size_t(id - kCmdTop30First);
    if (i < lists.size()) ShowWatchlist(kTop30Watchlists, lists[i].name);
    return;
  }
  if (id >= kCmdFontFirst && id <= kCmdFontLast) {
    if (!pricecol::SetFontSizeIndex(id - kCmdFontFirst)) return;
    SendChildFeedback(hm::SettingsChanged, 0);
    // The terminal tells the other price views; this one re-reads now.
    for (IQuoteGrid* g : m_grids)
      if (g) g->ApplyColumns();
  }
}

void CPriceViewAdv::SwitchFamily(int listKind) {
  if (listKind < kUserWatchlists || listKind > kAdvanceFilter) return;
  const bool leavingFilter = m_listKind == kAdvanceFilter && listKind != kAdvanceFilter;
  m_listKind = listKind;
  PressFamilyButton();
  if (leavingFilter) StoreStartParams();
  Relayout();
  switch (listKind) {
    case kUserWatchlists:
    case kTop30Watchlists:
    case kKeldoWatchlists:
      if (!ShowWatchlist(listKind, CurrentName(listKind))) {
        // An empty family shows an empty grid with its text.
        for (IQuoteGrid* g : m_grids)
          if (g) g->LoadItems(listKind, std::wstring(), {});
        UpdateEmptyText();
      }
      return;
    case kWorldIndices:
      if (!ShowWatchlist(kWorldIndices, watchlist::kWorldIndexName)) {
        for (IQuoteGrid* g : m_grids)
          if (g) g->LoadItems(kWorldIndices, std::wstring(), {});
        UpdateEmptyText();
      }
      return;
    default:
      for (IQuoteGrid* g : m_grids)
        if (g) g->LoadItems(kAdvanceFilter, std::wstring(), {});
      OpenAdvanceFilter();
      UpdateEmptyText();
      StoreStartParams();
      return;
  }
}

void CPriceViewAdv::SetDisplayMode(int mode) {
  if (mode != kListMode && mode != kBoardMode) return;
  if (mode == kBoardMode && !m_grids[kBoardMode]) return;
  m_displayMode = mode;
  IQuoteGrid* shown = m_grids[mode];
  IQuoteGrid* other = m_grids[mode == kListMode ? kBoardMode : kListMode];
  if (other) other->Widget()->hide();
  if (shown) {
    const std::vector<InstrumentKey> selected = other ? other->SelectedKeys() : std::vector<InstrumentKey>{};
    const std::wstring& name = m_listKind == kWorldIndices ? std::wstring(watchlist::kWorldIndexName) : CurrentName(m_listKind);
    // A list without a store (the advance filter's) goes over as it is.
    if (StoreOfKind(m_listKind)) shown->LoadWatchlist(m_listKind, name);
    else shown->LoadItems(m_listKind, name, other ? other->Rows() : std::vector<InstrumentKey>{});
    shown->SelectKeys(selected);
    shown->Widget()->show();
  }
  UpdateEmptyText();
  StoreStartParams();
  Relayout();
}

bool CPriceViewAdv::ShowWatchlist(int listKind, const std::wstring& name) {
  WatchlistStoreT* store = StoreOfKind(listKind);
  if (!store || name.empty() || !store->FindPtr(name)) return false;
  platform::KillTimer(this, kRefreshTimer);
  if (CCustomTabCtrl* tabs = Tabs(listKind)) {
    for (int i = 0; i < tabs->GetItemCount(); ++i)
      if (tabs->GetItemText(i) == name) {
        tabs->SetCurSel(i);
        break;
      }
  }
  if (listKind == kUserWatchlists) m_currentUser = name;
  else if (listKind == kTop30Watchlists) m_currentTop30 = name;
  else if (listKind == kKeldoWatchlists) m_currentKeldo = name;
  for (IQuoteGrid* g : m_grids)
    if (g) g->LoadWatchlist(listKind, name);
  for (int mode = 0; mode < 2; ++mode)
    if (m_grids[mode]) m_grids[mode]->Widget()->setVisible(mode == m_displayMode);
  ApplyLanguage();
  platform::SetTimer(this, kRefreshTimer, kRefreshMs);
  return true;
}

void CPriceViewAdv::UpdateEmptyText() {
  for (IQuoteGrid* g : m_grids) {
    if (!g) continue;
    std::wstring text;
    if (g->RowCount() == 0) {
      switch (m_listKind) {
        case kUserWatchlists: text = addon::LanguageTextTable::Instance().Get(413); break;
        case kTop30Watchlists:
          text = FormatText(addon::LanguageTextTable::Instance().Get(416), m_currentTop30);
          break;
        case kKeldoWatchlists: text = addon::LanguageTextTable::Instance().Get(417); break;
        case kAdvanceFilter:
          text = m_filter && m_filter->CurrentChoice() ? kFilterNoMatchText : kFilterChooseText;
          break;
        default: break;
      }
    }
    g->SetEmptyText(text);
  }
}

// ---- Watchlist editing ----------------------------------------------------------------------------------

void CPriceViewAdv::SendNames() {
  WatchlistFeedback feedback;
  feedback.text = watchlist::WatchlistNamesText(UserWatchlistStore());
  SendChildFeedback(hm::SaveWatchlistNames, ToLParam(&feedback));
}

void CPriceViewAdv::SaveItems(int listKind, const std::wstring& name) {
  WatchlistStoreT* store = StoreOfKind(listKind);
  const WatchListDetail* w = store ? store->FindPtr(name) : nullptr;
  if (!w) return;
  WatchlistFeedback feedback;
  feedback.WatchlistID = w->WatchlistID;
  if (listKind == kUserWatchlists) {
    feedback.text = watchlist::UserItemText(w->items);
    SendChildFeedback(hm::SaveUserWatchlist, ToLParam(&feedback));
  } else if (listKind == kKeldoWatchlists) {
    feedback.text = watchlist::KeldoItemText(w->items);
    SendChildFeedback(hm::SaveKeldoWatchlist, ToLParam(&feedback));
  }
}

void CPriceViewAdv::CreateWatchlist() {
  const int limit = addon::SettingTextTable::Instance().MaxWatchlists();
  if (m_userTabs->GetItemCount() >= limit) {
    ShowMessage(Format(kTooManyWatchlists, limit));
    return;
  }
  WatchListDetail w;
  w.name = watchlist::NextNewWatchlistName(UserWatchlistStore());
  UserWatchlistStore().Put(w);
  const int index = m_userTabs->AddItem(w.name, 0);
  m_userTabs->SetCurSel(index);
  ShowWatchlist(kUserWatchlists, w.name);
  UpdateEmptyText();
  SendNames();
}

bool CPriceViewAdv::RenameWatchlist(int listKind, int index, const std::wstring& oldText) {
  CCustomTabCtrl* tabs = Tabs(listKind);
  WatchlistStoreT* store = StoreOfKind(listKind);
  if (!tabs || !store || (listKind != kUserWatchlists && listKind != kKeldoWatchlists)) return false;
  const std::wstring name = watchlist::Trim(tabs->GetItemText(index));
  // The store's position of the tab: tabs follow the store's order.
  int position = store->IndexOf(oldText);
  if (position < 0) position = index;
  switch (watchlist::CheckRename(*store, position, name)) {
    case watchlist::RenameCheck::Empty:
      ShowMessage(Lang(408, L"The watchlist name cannot be empty."));
      return false;
    case watchlist::RenameCheck::Duplicate:
      ShowMessage(name + L" " + addon::LanguageTextTable::Instance().Get(409));
      return false;
    case watchlist::RenameCheck::Unchanged:
      tabs->SetItemText(index, name);
      return true;
    case watchlist::RenameCheck::Accepted:
      break;
  }
  watchlist::RenameAt(*store, position, name);
  tabs->SetItemText(index, name);
  std::wstring& current = listKind == kUserWatchlists ? m_currentUser : m_currentKeldo;
  if (current == oldText) current = name;
  if (m_listKind == listKind)
    for (IQuoteGrid* g : m_grids)
      if (g) g->LoadWatchlist(listKind, current);
  if (listKind == kUserWatchlists) {
    SendNames();
  } else {
    WatchlistFeedback feedback;
    feedback.WatchlistID = store->Records()[std::size_t(position)].WatchlistID;
    feedback.text = name;
    SendChildFeedback(hm::RenameWatchlist, ToLParam(&feedback));
  }
  return true;
}

bool CPriceViewAdv::DeleteFromTabStrip(int index) {
  if (m_userTabs->GetItemCount() <= 1) return false;
  if (index < 0 || index >= int(UserWatchlistStore().Records().size())) return false;
  const int answer = ShowMessage(Lang(407, L"Delete this watchlist?"), platform::Icon::Question, platform::Buttons::YesNo);
  if (answer != platform::IdYes) return false;
  const std::wstring removed = UserWatchlistStore().Records()[std::size_t(index)].name;
  watchlist::RemoveAt(UserWatchlistStore(), index);
  if (m_currentUser == removed) m_currentUser.clear();
  SendNames();
  // The strip removes the tab and reports the new selection, which shows its list.
  return true;
}

void CPriceViewAdv::DeleteFromMenu(int index) {
  if (index < 0 || index >= int(UserWatchlistStore().Records().size())) return;
  const std::wstring removed = UserWatchlistStore().Records()[std::size_t(index)].name;
  watchlist::RemoveAt(UserWatchlistStore(), index);
  SendNames();
  m_userTabs->DeleteItem(index);
  const int selected = m_userTabs->GetCurSel();
  const std::wstring next = selected >= 0 ? m_userTabs->GetItemText(selected) : std::wstring();
  if (m_currentUser == removed) m_currentUser.clear();
  if (next != removed && !next.empty()) {
    if (m_listKind == kUserWatchlists) ShowWatchlist(kUserWatchlists, next);
    else m_currentUser = next;
  } else if (m_listKind == kUserWatchlists) {
    for (IQuoteGrid* g : m_grids)
      if (g) g->LoadItems(kUserWatchlists, std::wstring(), {});
  }
  UpdateEmptyText();
}

void CPriceViewAdv::ReorderUserWatchlists() {
  std::vector<std::wstring> names;
  for (int i = 0; i < m_userTabs->GetItemCount(); ++i) names.push_back(m_userTabs->GetItemText(i));
  watchlist::Reorder(UserWatchlistStore(), names);
  SendNames();
}

std::wstring CPriceViewAdv::AlreadyInListText() const {
  if (m_pLanguage) {
    std::wstring text = LanguageText(12);
    if (!text.empty()) return text;
  }
  return kAlreadyInList;
}

std::wstring CPriceViewAdv::CheckAddable(const JInstrumentUnderlying& instrument) {
  const int limit = addon::SettingTextTable::Instance().MaxWatchlistItems();
  IQuoteGrid* grid = VisibleGrid();
  const int rows = grid ? grid->RowCount() : 0;
  if (m_listKind == kUserWatchlists) {
    if (rows >= limit) return Format(kTooManyItems, limit);
    const JInstrumentUnderlying copy = instrument;  // the host may replace its list while we ask
    if (!addon::IsViewableStatus(Actions().AccessStatusOf(copy))) return addon::kNotViewableText;
    return {};
  }
  if (m_listKind == kKeldoWatchlists) {
    std::wstring refusal;
    if (watchlist::IsKeldoRefused(addon::SettingTextTable::Instance().Get("WLNOT"), hv::Widen(instrument.exchangeCode),
                                  &refusal))
      return refusal.empty() ? std::wstring(L" ") : refusal;
    if (rows >= limit) return Format(kTooManyItems, limit);
    return {};
  }
  return L" ";
}

void CPriceViewAdv::AddChosenInstrument(const JInstrumentUnderlying& chosen) {
  const JInstrumentUnderlying picked = chosen;
  if (picked.productId == -1) return;
  const InstrumentKey key = InstrumentKeyOf(picked);
  const JInstrumentUnderlying* found = InstrumentMgr_ReadOnly().FindPtr(key);
  if (!found || (m_listKind != kUserWatchlists && m_listKind != kKeldoWatchlists)) return;
  const JInstrumentUnderlying instrument = *found;
  const std::wstring refusal = CheckAddable(instrument);
  IQuoteGrid* grid = VisibleGrid();
  if (!refusal.empty()) {
    ShowMessage(refusal);
  } else if (grid && !grid->AddRow(key)) {
    ShowMessage(AlreadyInListText());
  } else if (grid) {
    const std::wstring& name = CurrentName(m_listKind);
    watchlist::SetItems(*StoreOfKind(m_listKind), name, grid->Rows());
    // The other grid shows the same list.
    for (IQuoteGrid* g : m_grids)
      if (g && g != grid) g->LoadWatchlist(m_listKind, name);
    SaveItems(m_listKind, name);
    UpdateEmptyText();
  }
  if (m_combo) m_combo->ShowPlaceholder();
}

void CPriceViewAdv::AddInstrumentsByMessage(const std::vector<InstrumentKey>* keys, int position) {
  WatchlistStoreT& store = UserWatchlistStore();
  if (!keys || position < 0 || position >= int(store.Records().size())) return;
  const WatchListDetail target = store.Records()[std::size_t(position)];
  std::vector<InstrumentKey> added;
  bool duplicate = false;
  for (const InstrumentKey& k : *keys) {
    const bool present = std::find(target.items.begin(), target.items.end(), k) != target.items.end() ||
                         std::find(added.begin(), added.end(), k) != added.end();
    if (present) duplicate = true;
    else added.push_back(k);
  }
  if (!added.empty()) {
    std::vector<InstrumentKey> items = added;
    items.insert(items.end(), target.items.begin(), target.items.end());
    watchlist::SetItems(store, target.name, std::move(items));
    SaveItems(kUserWatchlists, target.name);
    if (m_listKind == kUserWatchlists && m_currentUser == target.name)
      for (IQuoteGrid* g : m_grids)
        if (g) g->LoadWatchlist(kUserWatchlists, target.name);
    UpdateEmptyText();
  }
  if (duplicate) ShowMessage(AlreadyInListText());
}

void CPriceViewAdv::RemoveInstrumentsByMessage(int listKind, const std::vector<InstrumentKey>* keys, int position) {
  WatchlistStoreT* store = StoreOfKind(listKind);
  if (!store || !keys || position < 0 || position >= int(store->Records().size())) return;
  const WatchListDetail target = store->Records()[std::size_t(position)];
  std::vector<InstrumentKey> items;
  for (const InstrumentKey& k : target.items)
    if (std::find(keys->begin(), keys->end(), k) == keys->end()) items.push_back(k);
  watchlist::SetItems(*store, target.name, std::move(items));
  SaveItems(listKind, target.name);
  ShowMessage(kRemoved);
  if (m_listKind == listKind && CurrentName(listKind) == target.name)
    for (IQuoteGrid* g : m_grids)
      if (g) g->LoadWatchlist(listKind, target.name);
  UpdateEmptyText();
}

// ---- Drag and drop ------------------------------------------------------------------------------------------

bool CPriceViewAdv::EnableDropIn() { return m_listKind == kUserWatchlists || m_listKind == kKeldoWatchlists; }

bool CPriceViewAdv::EnableDropIn(const char* sourceClassName) {
  if (!EnableDropIn()) return false;
  return !addon::IsDropSource(ClassInfo(), sourceClassName ? sourceClassName : "");
}

LRESULT CPriceViewAdv::DoDragDrop(UINT message, LPARAM data) {
  if (message != hm::LinkData || !data) return 0;
  const auto* link = FromLParam<const ViewLink>(data);
  if (!link->link || !EnableDropIn(hv::Narrow(link->className).c_str())) return 0;
  // Every object of the link's "data" names one instrument.
  Json::Value root;
  Json::CharReaderBuilder builder;
  std::string errors;
  const std::string text = hv::Narrow(*link->link);
  std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
  if (!reader->parse(text.data(), text.data() + text.size(), &root, &errors) || !root.isObject()) return 0;
  const Json::Value& objects = root["data"];
  if (!objects.isArray()) return 0;
  std::set<std::wstring> shown;
  for (const Json::Value& o : objects) {
    if (!o.isObject()) continue;
    const Json::Value& pid = o[addon::linkkey::kProductId];
    const Json::Value& code = o[addon::linkkey::kInstrumentCode];
    if (!code.isString()) continue;
    std::int64_t productId = 0;
    try {
      productId = pid.isString() ? std::stoll(pid.asString()) : pid.isIntegral() ? pid.asInt64() : 0;
    } catch (...) {
      continue;
    }
    const InstrumentKey key{productId, hv::Widen(code.asString())};
    const JInstrumentUnderlying* found = InstrumentMgr_ReadOnly().FindPtr(key);
    if (!found) continue;
    const JInstrumentUnderlying instrument = *found;
    std::wstring refusal = CheckAddable(instrument);
    IQuoteGrid* grid = VisibleGrid();
    if (refusal.empty() && grid && !grid->AddRow(key)) refusal = AlreadyInListText();
    if (!refusal.empty()) {
      // One box per kind of refusal.
      if (shown.insert(refusal).second) ShowMessage(refusal);
      continue;
    }
    watchlist::SetItems(*StoreOfKind(m_listKind), CurrentName(m_listKind), grid->Rows());
    SaveItems(m_listKind, CurrentName(m_listKind));
  }
  UpdateEmptyText();
  return 0;
}

// ---- Window messages ------------------------------------------------------------------------------------------

LRESULT CPriceViewAdv::OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) {
  const auto& msg = addon::Msg();
  const auto* text = FromLParam<const std::wstring>(LPARAM(wParam));
  const auto* keys = FromLParam<const std::vector<InstrumentKey>>(LPARAM(wParam));
  if (message == PriceGrid::kRemarkLegendMsg) {
    platform::SetTimer(this, kRemarkTipTimer, kTipDelayMs);
    return 0;
  }
  if (message == PriceGrid::kLongShortLegendMsg) {
    platform::SetTimer(this, kLongShortTipTimer, kTipDelayMs);
    return 0;
  }
  if (message == msg.wlOpenTrade) return OpenTradeTicket(text, lParam);
  if (const auto className = addon::OpenedClassOf(message)) {
    Actions().OpenViewOn(*className, text);
    return 0;
  }
  if (message == msg.wlOpenPriceAlert) {
    Actions().OpenViewOn(L"CNewPriceAlertAdv", text);
    return 0;
  }
  if (message == msg.refreshTradeLink) {
    Actions().RefreshTradeLink(text);
    return 0;
  }
  if (message == msg.wlAddInsList) return AddInstrumentsByMessage(keys, int(lParam)), 0;
  if (message == msg.keldoWlAddInsList) return 0;
  if (message == msg.wlRemoveInsList) return RemoveInstrumentsByMessage(kUserWatchlists, keys, int(lParam)), 0;
  if (message == msg.keldoWlRemoveInsList) return RemoveInstrumentsByMessage(kKeldoWatchlists, keys, int(lParam)), 0;
  if (message == msg.wlMoveIns) {
    IQuoteGrid* grid = VisibleGrid();
    const std::wstring& name = CurrentName(m_listKind);
    if (grid && (m_listKind == kUserWatchlists || m_listKind == kKeldoWatchlists) &&
        watchlist::SetItems(*StoreOfKind(m_listKind), name, grid->Rows()))
      SaveItems(m_listKind, name);
    return 0;
  }
  if (message == msg.wlStartDrag) {
    // The grid drags its rows out under this view's source name; nonzero lets it.
    if (!EnableDragOut() || !keys || keys->empty()) return 0;
    SetDragDrop(hv::Widen(addon::kPriceViewSource));
    return 1;
  }
  if (message == msg.pvColumnUpdate) return 0;
  return 0;
}

// ---- Keys and the mouse wheel -----------------------------------------------------------------------------------

std::optional<std::wstring> CPriceViewAdv::ShortcutTicket(addon::TradeSide side) {
  IQuoteGrid* grid = VisibleGrid();
  const std::vector<InstrumentKey> selected = grid ? grid->SelectedKeys() : std::vector<InstrumentKey>{};
  if (selected.empty()) return std::nullopt;
  const InstrumentKey& k = selected.front();
  addon::LinkTextBuilder text = addon::ShortcutTicketText(hv::Narrow(k.InstrumentCode), k.ProductID, side);
  // On the board the tile's quantity goes with the ticket, once it passes its check.
  if (grid == m_boardGrid) {
    const auto quantity =
        m_boardGrid->CheckQuantity(m_boardGrid->SelectedTile(), side == addon::TradeSide::Buy ? 1 : 2);
    if (!quantity) return std::nullopt;
    text.Add(addon::linkkey::kQty, std::to_string(*quantity));
  }
  // The row's price goes with the ticket only when it is above 0.
  QuoteRecord quote;
  if (QuoteStore::Instance().Peek(k, quote)) {
    const QuoteCell& cell = quote[side == addon::TradeSide::Buy ? QuoteLayout::Ask : QuoteLayout::Bid];
    if (cell.filled && cell.value > 0) text.Add(addon::linkkey::kTradePrice, cell.text);
  }
  return text.Wide();
}

bool CPriceViewAdv::eventFilter(QObject* watched, QEvent* event) {
  if (event->type() == QEvent::Wheel) {
    // The wheel scrolls the grid whatever has the focus.
    if (IQuoteGrid* grid = VisibleGrid(); grid && !grid->Widget()->hasFocus()) grid->Widget()->setFocus();
  }
  return CAddonView::eventFilter(watched, event);
}

// ---- Font size ------------------------------------------------------------------------------------------------------

void CPriceViewAdv::ShowFontSizeMenu() {
  std::vector<platform::MenuItem> items;
  const std::vector<std::wstring> sizes = pricecol::FontSizeItems();
  const int current = pricecol::FontSizeIndex();
  for (std::size_t n = 0; n < sizes.size() && kCmdFontFirst + int(n) <= kCmdFontLast; ++n) {
    platform::MenuItem item;
    item.id = kCmdFontFirst + int(n);
    item.text = QString::fromStdWString(sizes[n]);
    item.checked = int(n) == current;
    items.push_back(std::move(item));
  }
  const QPoint at = mapToGlobal(QPoint(width() - 150, 20));
  const int chosen = platform::Dialogs().PopupMenu(this, items, at);
  if (chosen) OnCommand(chosen);
}

// ---- Timers -----------------------------------------------------------------------------------------------------------

void CPriceViewAdv::OnTimer(UINT id) {
  switch (id) {
    case kRefreshTimer: OnRefreshTick(); return;
    case kSecondTimer: OnSecondTick(); return;
    case kRemarkTipTimer:
      platform::KillTimer(this, kRemarkTipTimer);
      ShowLegend(true);
      return;
    case kLongShortTipTimer:
      platform::KillTimer(this, kLongShortTipTimer);
      ShowLegend(false);
      return;
    default: return;
  }
}

void CPriceViewAdv::ShowLegend(bool remark) {
  CTipDialogBase* tip = remark ? static_cast<CTipDialogBase*>(m_remTip) : static_cast<CTipDialogBase*>(m_lsTip);
  if (!tip) return;
  if (remark && m_remTip->Board()) m_remTip->Board()->SetPairs(m_remarkRows);
  QPoint at = QCursor::pos() + QPoint(12, 12);
  tip->move(at);
  tip->show();
  tip->raise();
}

void CPriceViewAdv::OnRefreshTick() {
  // One view ages the marks: the first active one, or the quote applier when
  // no price view is active.
  if (IsFirstActiveView() || IsQuoteApplier()) addon::QuoteFeed::Instance().ExpireMarks(platform::TickCount());
  for (int mode = 0; mode < 2; ++mode) {
    IQuoteGrid* g = m_grids[mode];
    if (!g) continue;
    const std::uint64_t counter = g->UpdateCounter();
    if (counter == m_gridMarks[mode]) continue;
    m_gridMarks[mode] = counter;
    if (mode == kListMode) g->ApplySort();
    g->Redraw();
  }
}

void CPriceViewAdv::OnSecondTick() {
  SubscribePending();
  ++m_tickCounter;
  if (m_tickCounter % 10 == 0) RetrySilentInstruments();
  if (IsLeadingPriceView()) LeadingSecondWork();
}

void CPriceViewAdv::SubscribePending() {
  const bool applier = IsQuoteApplier();
  const bool becameApplier = applier && !m_wasApplier;
  m_wasApplier = applier;
  if (!applier) return;
  // What every open price view shows.
  std::unordered_set<InstrumentKey> shown;
  for (CSuperBaseView* v : addon::OpenPriceViews().Views()) {
    auto* pv = AsPriceView(v);
    IQuoteGrid* grid = pv ? pv->VisibleGrid() : nullptr;
    if (!grid) continue;
    for (InstrumentKey& k : grid->Rows()) shown.insert(std::move(k));
  }
  addon::QuoteFeed& feed = addon::QuoteFeed::Instance();
  // A view that takes over the quotes asks again for everything shown: the
  // terminal may push values only to the view that asked for them.
  if (becameApplier && addon::OpenPriceViews().Count() > 1)
    for (const InstrumentKey& k : shown) feed.Register(k, {}, platform::TickCount());
  for (const auto& pending : feed.TakePending(shown))
    addon::SendInterestBatches(Sender(), addon::FieldTarget{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)},
                               addon::QuoteInterest());
}

void CPriceViewAdv::RetrySilentInstruments() {
  IQuoteGrid* grid = VisibleGrid();
  if (!grid) return;
  QuoteStore& store = QuoteStore::Instance();
  for (const InstrumentKey& k : grid->Rows()) {
    const bool silent = store.Read([&](const QuoteStore::Reader& r) {
      const QuoteRecord* rec = r.Find(k);
      return rec && !rec->changed;
    });
    if (!silent) continue;
    auto& counters = RetryCounters();
    auto it = counters.find(k);
    if (it == counters.end()) {
      counters.emplace(k, 1);
    } else if (it->second < kMaxRetries) {
      ++it->second;
    } else {
      continue;
    }
    // Registering a shown instrument again asks for it again.
    addon::QuoteFeed::Instance().Register(k, {}, platform::TickCount());
  }
}

void CPriceViewAdv::LeadingSecondWork() {
  int& ticks = SharedTicks();
  ++ticks;
  if (ticks % 10 == 0 && Top30WatchlistStore().Records().empty()) SendChildFeedback(hm::WatchlistGroups521, 0);
  // The symbol store is indexed on first use after each instrument list.
  if (!SymbolMgr_ReadOnly().IsLoaded()) return;
  SendChildFeedback(hm::WatchlistGroups520, 0);
}
