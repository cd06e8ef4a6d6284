#include "views/instrument/SingleInstrumentView.h"

#include <QLineEdit>
#include <QPainter>
#include <algorithm>

#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "controls/InstrumentComboBox.h"
#include "data/ReferenceStores.h"
#include "hostview/Buttons.h"
#include "hostview/CustomTabCtrl.h"
#include "hostview/HostLists.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "views/instrument/InstrumentGrid.h"

namespace {

constexpr int kSecondButtonId = 2016;
constexpr int kButtonSize = 18;
constexpr COLORREF kButtonBack = MakeColorRef(0xCC, 0xCC, 0xCC);

}  // namespace

CSingleInstrumentView::CSingleInstrumentView(const addon::ViewClassInfo& info) : CAddonView(info) {}

CSingleInstrumentView::~CSingleInstrumentView() = default;

addon::ViewClassInfo CSingleInstrumentView::InstrumentClassInfo(const char* className,
                                                                const CRuntimeClass* descriptor, int titleEntry,
                                                                const wchar_t* defaultTitle, const char* refusalKey) {
  return addon::ViewClassInfo{
      .className = className,
      .titleEntry = titleEntry,
      .defaultTitle = defaultTitle,
      .firstStores = {addon::RefStore::Products, addon::RefStore::Instruments},
      .refusalKey = refusalKey,
      .dropSources = addon::kInstrumentViewSources,
      .descriptor = descriptor,
  };
}

bool CSingleInstrumentView::IsCurrentRegistration() const {
  if (!m_user.IsMember()) return false;
  for (CSuperBaseView* view : addon::UserViews().Views())
    if (view->GetRuntimeClass() == GetRuntimeClass()) return view == this;
  return false;
}

// ---- Creation and controls --------------------------------------------------------

int CSingleInstrumentView::OnCreate() {
  m_user.Join(this);
  BuildControls();
  return 0;
}

void CSingleInstrumentView::BuildControls() {
  m_combo = new CInstrumentComboBox(this);
  m_combo->setObjectName(QStringLiteral("InstrumentCombo"));
  m_combo->SetLanguage(m_pLanguage);
  m_combo->SetStyleManager(m_pStyleManager);
  connect(m_combo, &CInstrumentComboBox::InstrumentChosen, this, [this] { OnComboChosen(); });

  m_explorer = new CImageButton(this, kExplorerButtonId);
  m_explorer->setObjectName(QStringLiteral("InstrumentExplorerButton"));
  m_explorer->SetBkColor(kButtonBack);
  m_explorer->SetTooltipText(L"Instrument Explorer");
  m_explorer->setFocusPolicy(Qt::NoFocus);
  connect(m_explorer, &CHostButton::commandClicked, this, [this](int) { Actions().OpenInstrumentExplorer(); });

  m_second = new CImageButton(this, kSecondButtonId);
  m_second->SetBkColor(kButtonBack);
  m_second->setFocusPolicy(Qt::NoFocus);
  m_second->hide();

  m_grid = CreateGrid();
  if (m_grid) {
    m_grid->setParent(this);
    m_grid->SetStyleManager(m_pStyleManager);
    m_grid->ApplyLanguage(m_pLanguage);
    m_grid->show();
  }
  // The trade keys work wherever the focus is; the search box keeps the
  // main-keyboard plus and minus as text.
  WatchTradeKeys(this);
  WatchTradeKeys(m_combo, /*textEntry*/ true);
  if (m_combo->lineEdit()) WatchTradeKeys(m_combo->lineEdit(), /*textEntry*/ true);
  if (m_grid) {
    WatchTradeKeys(m_grid);
    WatchTradeKeys(m_grid->viewport());
  }

  SetStyleManager(m_pStyleManager);
  ReloadImages();
  ReloadComboList();
  Relayout();
}

void CSingleInstrumentView::ReloadComboList() {
  if (!m_combo) return;
  const auto* list = InstrumentMgr_ReadOnly().Source();
  if (!list) return;
  if (list != m_instrumentList) {
    m_instrumentList = list;
    m_combo->AttachList(list, CInstrumentComboBox::ProductMapFromStore());
    if (m_combo->IsPlaceholderShown() || !m_current) m_combo->ShowPlaceholder();
  }
  SyncCombo();
}

void CSingleInstrumentView::SyncCombo() {
  if (!m_combo || !m_current || !m_instrumentList) return;
  m_combo->SelectByKey(*m_current);
}

void CSingleInstrumentView::OnComboChosen() {
  const JInstrumentUnderlying chosen = m_combo->GetChosenInstrument();
  if (chosen.productId == -1 && chosen.instrumentCode.empty()) return;
  SelectInstrument(chosen);
}

void CSingleInstrumentView::ReloadImages() {
  const std::wstring path = StyleImagePath(kExplorerImage);
  if (m_explorer) m_explorer->LoadBitmap(path);
}

void CSingleInstrumentView::UpdateExplorerVisibility() {
  if (!m_explorer) return;
  m_explorer->setVisible(m_saveSpace == 0 && DisplayModeValue() != 101);
}

// ---- Contract --------------------------------------------------------------------

bool CSingleInstrumentView::EnableDropIn(const char* sourceClassName) {
  const std::string_view source = sourceClassName ? sourceClassName : "";
  if (source == addon::kPriceViewSource) return true;
  if (IsPopview()) return false;
  return addon::IsDropSource(ClassInfo(), source);
}

void CSingleInstrumentView::ChangeStyle(int styleId) {
  CAddonView::ChangeStyle(styleId);
  ReloadImages();
  SetStyleManager(m_pStyleManager);
  update();
}

void CSingleInstrumentView::SetStyleManager(IStyleManager* styleManager) {
  CAddonView::SetStyleManager(styleManager);
  if (m_grid) m_grid->SetStyleManager(styleManager);
  if (m_combo) m_combo->SetStyleManager(styleManager);
  if (m_tabs) m_tabs->SetStyleManager(styleManager);
  for (CImageButton* b : {m_explorer, m_second})
    if (b) b->SetStyleManager(styleManager);
  update();
}

void CSingleInstrumentView::SetStyleID(int styleId) { m_styleId = styleId; }

void CSingleInstrumentView::ApplyLanguage() {
  if (m_grid) m_grid->ApplyLanguage(m_pLanguage);
  if (m_tabs) {
    for (int i = 0; i < m_tabs->GetItemCount(); ++i)
      m_tabs->SetItemText(i, KindTitle(FromLParam<CSuperBaseView>(m_tabs->GetItemData(i))));
  }
  UpdateTitle();
  RefreshEmptyState();
}

std::wstring CSingleInstrumentView::BuildTitle() const {
  std::wstring title = LanguageText(ClassInfo().titleEntry);
  if (title.empty() && ClassInfo().defaultTitle) title = ClassInfo().defaultTitle;
  if (!m_current) return title;
  if (addon::ProductTypeOf(*m_current) == L"DMA") title = L"Cash " + title;
  title += L" - ";
  title += hv::Widen(m_current->instrumentName);
  return title;
}

void CSingleInstrumentView::UpdateTitle() { SendTitle(BuildTitle()); }

const JInstrumentUnderlying* CSingleInstrumentView::FindInstrument(std::int64_t productId,
                                                                   const std::wstring& code) const {
  return InstrumentMgr_ReadOnly().FindPtr(InstrumentKey{productId, code});
}

// ---- Host notifications ---------------------------------------------------------------

void CSingleInstrumentView::StartTimers(bool) { platform::SetTimer(this, kRefreshTimer, kRefreshMs); }

void CSingleInstrumentView::ActivateInstrumentView(std::source_location where) {
  SendViewSize(kPreferredWidth, kPreferredHeight);
  StartTimers(true);
  PrepareBasicData(where);
  QueryDisplayMode();
  ReloadComboList();
  ApplyColumns();
  ApplyLanguage();
  RefreshEmptyState();
  UpdateExplorerVisibility();
  Relayout();
  SetActiveFlag(true);
}

void CSingleInstrumentView::DeactivateInstrumentView(std::source_location where) {
  PrepareBasicData(where);
  StartTimers(false);
  SetActiveFlag(false);
}

std::uint32_t CSingleInstrumentView::OnViewMessage(UINT message, LPARAM data) {
  switch (message) {
    case hm::LinkData: {
      const auto* link = FromLParam<const ViewLink>(data);
      if (link->link) ApplyStartParams(*link->link);
      return 0;
    }
    case hm::InstrumentList:  // filed by the base: attach the new list
    case hm::ProductList:     // the combo box keeps a copy of the product map
      m_instrumentList = nullptr;
      ReloadComboList();
      return 0;
    case hm::CompactLayout:
      m_saveSpace = data == 1 ? 1 : 0;
      Relayout();
      repaint();
      return 0;
    case hm::ExchangeEnabled:
      // Outside a question: about the shown instrument's exchange.
      if (m_current) Actions().NoteExchangeAnswer(m_current->exchangeCode, data != 0);
      return 0;
    case hm::LinkedInstrument:
      if (LinkMode()) ApplyLinkUpdate(*FromLParam<const std::wstring>(data));
      return 0;
    default:
      return OnInstrumentViewMessage(message, data);
  }
}

// ---- Selection -----------------------------------------------------------------------

bool CSingleInstrumentView::SelectInstrument(const JInstrumentUnderlying& instrument) {
  // The record may live in a list the host replaces while we ask it things.
  const JInstrumentUnderlying chosen = instrument;
  m_accessStatus = Actions().AccessStatusOf(chosen);
  if (!addon::IsViewableStatus(m_accessStatus)) {
    RecordStartParams(chosen.productId, chosen.instrumentCode);
    ClearWithMessage(addon::kNotViewableText);
    return false;
  }
  if (DisplayModeValue() != 101 && addon::ProductTypeOf(chosen) == L"CFD") {
    RecordStartParams(chosen.productId, chosen.instrumentCode);
    ClearWithMessage(Actions().RefusalText(addon::kCfdRefusalKey, chosen.productId));
    return false;
  }
  if (ClassInfo().refusalKey && !Actions().IsExchangeEnabled(chosen)) {
    RecordStartParams(chosen.productId, chosen.instrumentCode);
    ClearWithMessage(Actions().RefusalText(ClassInfo().refusalKey, chosen.productId));
    return false;
  }

  m_current = chosen;
  if (m_grid) {
    m_grid->Reset();
    m_grid->SetMessage({});
    m_grid->setFocus();
  }
  OnInstrumentSelected(chosen);
  ApplyColumns();
  // Recorded once the columns are chosen, so that the saved mask is the one shown.
  RecordStartParams(chosen.productId, chosen.instrumentCode);
  if (m_grid) {
    if (m_grid->GetNumberRows() == 0) m_grid->SetMessage(EmptyStateText());
    m_grid->Redraw();
  }
  UpdateTitle();
  SyncCombo();
  update();
  if (m_grid) m_grid->setFocus();
  return true;
}

void CSingleInstrumentView::ClearWithMessage(const std::wstring& text) {
  m_current.reset();
  if (m_grid) m_grid->Reset();
  ShowRefusedColumns();
  if (m_grid) {
    m_grid->SetMessage(text);
    m_grid->Redraw();
  }
  update();
}

void CSingleInstrumentView::ClearInstrument() {
  m_current.reset();
  m_accessStatus = 0;
  if (m_grid) {
    m_grid->Reset();
    m_grid->SetMessage({});
    m_grid->Redraw();
  }
  RecordStartParams(-1, std::string());
  UpdateTitle();
  if (m_combo && m_instrumentList) m_combo->ShowPlaceholder();
  update();
}

void CSingleInstrumentView::RefreshEmptyState() {
  // Only an instrument that is shown has an empty state; a refusal keeps its text.
  if (!m_grid || !m_current) return;
  if (m_grid->GetNumberRows() == 0) m_grid->SetMessage(EmptyStateText());
  else m_grid->SetMessage({});
}

void CSingleInstrumentView::RecordStartParams(std::int64_t productId, const std::string& instrumentCode) {
  StartParamMap params;
  if (const auto mask = SavedColumnMask()) params[addon::linkkey::kUserProductId] = *mask;
  params[addon::linkkey::kUserSaveSpace] = std::to_wstring(m_saveSpace);
  SetStartParam(productId, instrumentCode, params);
}

bool CSingleInstrumentView::ApplyStartParams(const std::wstring& linkText) {
  const auto link = addon::ReadLinkText(linkText);
  if (!link) return false;
  const std::string code = link->Get(addon::linkkey::kInstrumentCode);
  const std::int64_t productId = link->GetInt64(addon::linkkey::kProductId).value_or(0);
  if (link->Get(addon::linkkey::kUserSaveSpace) == "1") {
    m_saveSpace = 1;
    SendChildFeedback(hm::CompactLayout, 1);
  } else {
    m_saveSpace = 0;
  }
  Relayout();
  if (SavedColumnMask()) {
    const std::string mask = link->Get(addon::linkkey::kUserProductId);
    if (!mask.empty()) RestoreColumnMask(hv::Widen(mask));
  }
  if (const JInstrumentUnderlying* found = FindInstrument(productId, hv::Widen(code))) {
    m_fromStartParams = true;
    SelectInstrument(*found);
    m_fromStartParams = false;
  } else {
    // The old instrument must not go on showing (and updating) under
    // parameters that name another one.
    ClearInstrument();
  }
  return true;
}

void CSingleInstrumentView::ApplyLinkUpdate(const std::wstring& linkText) {
  const auto link = addon::ReadLinkText(linkText);
  if (!link) return;
  const std::string code = link->Get(addon::linkkey::kInstrumentCode);
  const std::string chartCode = link->Get(addon::linkkey::kChartCode);
  const std::int64_t productId = link->GetInt64(addon::linkkey::kProductId).value_or(0);
  // The instrument already shown needs nothing.
  if (m_current && m_current->productId == productId && m_current->instrumentCode == code) return;

  JInstrumentLink record;
  record.productId = productId;
  record.number = static_cast<std::int32_t>(link->GetInt64(addon::linkkey::kRelatedOrderType).value_or(0));
  const bool byChart = !chartCode.empty();
  record.text = byChart ? chartCode : code;
  const auto found =
      Ask<JInstrumentUnderlying>(byChart ? hm::FindByChartCode : hm::FindByCode, ToLParam(&record));
  if (found) SelectInstrument(*found);
}

// ---- Trade tickets and shortcuts ---------------------------------------------------------

LRESULT CSingleInstrumentView::OpenTradeTicket(const std::wstring* linkText, LPARAM origin) {
  if (origin != addon::kRefusedTradeOrigin && !IsTradeable()) {
    ShowMessage(addon::kNotTradeableText, platform::Icon::Exclamation);
    return 0;
  }
  return CAddonView::OpenTradeTicket(linkText, origin);
}

std::optional<std::wstring> CSingleInstrumentView::ShortcutTicket(addon::TradeSide side) {
  if (!m_current) return std::nullopt;
  const JInstrumentUnderlying* found = FindInstrument(m_current->productId, hv::Widen(m_current->instrumentCode));
  if (!found) return std::nullopt;
  return addon::ShortcutTicketText(found->instrumentCode, found->productId, side).Wide();
}

// ---- Window messages and timers ---------------------------------------------------------

LRESULT CSingleInstrumentView::OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) {
  const auto& msg = addon::Msg();
  if (message == msg.wlOpenTrade) return OpenTradeTicket(FromLParam<const std::wstring>(LPARAM(wParam)), lParam);
  if (message == msg.mdColumnUpdate) {
    if (m_grid) m_grid->ApplyLanguage(m_pLanguage);
    const JInstrumentUnderlying* found =
        m_current ? FindInstrument(m_current->productId, hv::Widen(m_current->instrumentCode)) : nullptr;
    if (found) RecordStartParams(found->productId, found->instrumentCode);
    else RecordStartParams(-1, std::string());
    return 0;
  }
  if (message == msg.mdColumnChange) return 0;
  return 0;
}

void CSingleInstrumentView::OnTimer(UINT id) {
  if (id == kRefreshTimer) RefreshTick();
  else OnOtherTimer(id);
}

void CSingleInstrumentView::RefreshTick() {
  const bool current = IsCurrentRegistration();
  // A terminal may hand a subscription's values to the view that asked for
  // it only. So the current view, the one that applies them, asks for every
  // view of its class; when it closes, its successor asks again for what is shown.
  if (current && m_tickedBefore && !m_wasCurrent) {
    for (CSuperBaseView* view : addon::UserViews().Views()) {
      if (view->GetRuntimeClass() != GetRuntimeClass()) continue;
      if (auto* same = dynamic_cast<CSingleInstrumentView*>(view)) same->RegisterShownInterest();
    }
  }
  m_wasCurrent = current;
  m_tickedBefore = true;
  if (current) {
    SendPendingInterest();
    ExpireMarks(platform::TickCount());
  }
  OnRefreshTick();
}

// ---- Drops and tabs ------------------------------------------------------------------------

LRESULT CSingleInstrumentView::DoDragDrop(UINT message, LPARAM data) {
  const LRESULT result = DragDrop(message, data, m_tabs);
  if (message == hm::LinkData && data) {
    const auto* link = FromLParam<const ViewLink>(data);
    if (link->link) {
      if (const auto text = addon::ReadLinkText(*link->link)) {
        const std::int64_t productId = text->GetInt64(addon::linkkey::kProductId).value_or(0);
        if (const JInstrumentUnderlying* found =
                FindInstrument(productId, text->GetWide(addon::linkkey::kInstrumentCode)))
          SelectInstrument(*found);
      }
    }
  }
  return result;
}

std::wstring CSingleInstrumentView::KindTitle(const CSuperBaseView* view) const {
  const addon::ViewClassInfo* info = addon::FindViewClass(view);
  if (!info) return {};
  std::wstring text = info->titleEntry ? LanguageText(info->titleEntry) : std::wstring();
  if (text.empty() && info->defaultTitle) text = info->defaultTitle;
  return text;
}

void CSingleInstrumentView::EnsureTabs() {
  if (m_tabs) return;
  m_tabs = new CCustomTabCtrl(this, CTCS_DRAGOUT, kTabNotifyId);
  m_tabs->setObjectName(QStringLiteral("ViewTabs"));
  m_tabs->SetStyleManager(m_pStyleManager);
  m_tabs->SetNotifyHandler([this](CTCNotify& n) { OnTabNotify(n); });
  m_tabs->show();
  Relayout();
}

void CSingleInstrumentView::OnTabNotify(CTCNotify& notify) {
  if (!m_tabs || notify.idFrom != kTabNotifyId) return;
  const LPARAM view = notify.item >= 0 ? m_tabs->GetItemData(notify.item) : 0;
  switch (notify.code) {
    case CTCN_BEGINDRAG:
      SetDragDrop(L"drag1");
      SendChildFeedback(hm::TabMoved2700, view);
      break;
    case CTCN_SELCHANGE:
      if (view) SendChildFeedback(hm::TabMoved2701, view);
      break;
    default:
      break;
  }
}

void CSingleInstrumentView::AddTabView(CSuperBaseView* view) {
  if (!view) return;
  EnsureTabs();
  int index = m_tabs->FindItemData(ToLParam(view));
  if (index < 0) index = m_tabs->AddItem(KindTitle(view), ToLParam(view));
  m_tabs->SetCurSel(index);
}

void CSingleInstrumentView::CopyTabViews(CSuperBaseView* other) {
  auto* target = dynamic_cast<CSingleInstrumentView*>(other);
  if (!target || target == this) return;
  target->EnsureTabs();
  CCustomTabCtrl* tabs = target->m_tabs;
  tabs->DeleteAllItems();
  if (!m_tabs) return;
  for (int i = 0; i < m_tabs->GetItemCount(); ++i) tabs->AddItem(m_tabs->GetItemText(i), m_tabs->GetItemData(i));
  const int current = m_tabs->GetCurSel();
  if (current >= 0) tabs->SetCurSel(tabs->FindItemData(m_tabs->GetItemData(current)));
}

void CSingleInstrumentView::SetCurTabView(int index) {
  if (m_tabs) m_tabs->SetCurSel(index);
}

int CSingleInstrumentView::GetTabCount() { return m_tabs ? m_tabs->GetItemCount() : 0; }

void CSingleInstrumentView::RestoreView(CSuperBaseView* view, QPoint point, int flags) {
  ReRestoreView(view, point, flags, m_tabs, ClassInfo().className);
}

// ---- Layout and painting ----------------------------------------------------------------------

void CSingleInstrumentView::Relayout() {
  const int w = width();
  const int h = height();
  int top = 0;
  if (m_tabs) {
    m_tabs->setGeometry(0, 0, w, kTabStripHeight);
    top = kTabStripHeight;
  }
  const bool header = m_saveSpace == 0;
  if (m_combo) {
    m_combo->setVisible(header);
    if (header) m_combo->setGeometry(kComboLeft, top + 6, std::max(40, w - 28 - kComboLeft), 24);
  }
  if (m_explorer) {
    m_explorer->setGeometry(w - 4 - kButtonSize, top + 8, kButtonSize, kButtonSize);
    UpdateExplorerVisibility();
  }
  if (m_second) m_second->hide();
  if (header) top += kHeaderHeight;
  LayoutBody(QRect(0, top, w, std::max(0, h - top)));
  update();
}

void CSingleInstrumentView::LayoutBody(const QRect& area) {
  if (m_grid) m_grid->setGeometry(area);
}

void CSingleInstrumentView::resizeEvent(QResizeEvent* e) {
  CAddonView::resizeEvent(e);
  Relayout();
}

void CSingleInstrumentView::paintEvent(QPaintEvent* e) {
  CAddonView::paintEvent(e);
  QPainter p(this);
  const QColor back = m_pStyleManager ? m_pStyleManager->Color(hv::style::kWindowBackground) : palette().window().color();
  p.fillRect(rect(), back);
  if (m_saveSpace != 0) return;
  const int top = m_tabs ? kTabStripHeight : 0;
  const QColor text = m_pStyleManager ? m_pStyleManager->Color(hv::style::kWindowText) : palette().windowText().color();
  p.setPen(text);
  if (m_pStyleManager) p.setFont(m_pStyleManager->GetFont(hv::style::kFontControl));
  p.drawText(QRect(8, top + 6, kComboLeft - 12, 24), Qt::AlignLeft | Qt::AlignVCenter, QStringLiteral("Instrument"));
}
