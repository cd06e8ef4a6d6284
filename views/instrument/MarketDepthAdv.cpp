#include "views/instrument/MarketDepthAdv.h"

#include <algorithm>

#include "addon/Channel.h"
#include "addon/Registries.h"
#include "data/MarketStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/instrument/DepthFeed.h"
#include "views/instrument/DepthGrid.h"

ADDON_IMPLEMENT_VIEW(CMarketDepthAdv)

const addon::ViewClassInfo& CMarketDepthAdv::Info() {
  static const addon::ViewClassInfo info{
      "CMarketDepthAdv",
      "MarketDepthAdv.cpp",
      7,
      L"Market Depth",
      {},
      {addon::RefStore::Products, addon::RefStore::Instruments},
  };
  return info;
}

CMarketDepthAdv::CMarketDepthAdv() : CSingleInstrumentView(Info()) {}
CMarketDepthAdv::~CMarketDepthAdv() = default;

CInstrumentGrid* CMarketDepthAdv::CreateGrid() {
  m_depthGrid = new DepthGrid(this);
  m_depthGrid->setObjectName(QStringLiteral("DepthGrid"));
  return m_depthGrid;
}

std::wstring CMarketDepthAdv::MaskFor(const std::string& exchangeCode) {
  if (exchangeCode == "SGX" && GetUserSettings().GetGeneralSetting().GetEnableONDisplay()) return DepthGrid::kFullMask;
  return DepthGrid::kDefaultMask;
}

void CMarketDepthAdv::OnInstrumentSelected(const JInstrumentUnderlying& instrument) {
  m_levelCount = kFirstLevels;
  m_lastStamp = 0;
  // A mask saved with the layout stays for the instrument restored with it.
  const bool keepMask = m_maskRestored && SelectingFromStartParams();
  m_maskRestored = false;
  if (!m_depthGrid) return;
  m_depthGrid->SetInstrument(InstrumentKey{instrument.productId, hv::Widen(instrument.instrumentCode)}, m_levelCount);
  if (!keepMask) m_depthGrid->SetColumnMask(MaskFor(instrument.exchangeCode));
}

std::wstring CMarketDepthAdv::EmptyStateText() {
  if (m_emptyText.empty()) m_emptyText = RequestTextByKey(kEmptyStateKey);
  return m_emptyText;
}

void CMarketDepthAdv::ShowRefusedColumns() {
  if (m_depthGrid) m_depthGrid->SetColumnMask(DepthGrid::kDefaultMask);
}

std::optional<std::wstring> CMarketDepthAdv::SavedColumnMask() const {
  return m_depthGrid ? m_depthGrid->ColumnMask() : std::wstring(DepthGrid::kDefaultMask);
}

void CMarketDepthAdv::RestoreColumnMask(const std::wstring& mask) {
  if (!m_depthGrid) return;
  m_depthGrid->SetColumnMask(mask);
  m_maskRestored = true;
}

std::uint32_t CMarketDepthAdv::OnInstrumentViewMessage(UINT message, LPARAM data) {
  switch (message) {
    case hm::FieldValue:
    case hm::RequestField:
      ApplyFieldUpdate(*FromLParam<const FieldUpdate>(data));
      return 0;
    case hm::SettingsChanged:
      OnSettingsChanged();
      return 0;
    default:
      return 0;
  }
}

void CMarketDepthAdv::ApplyFieldUpdate(const FieldUpdate& update) {
  if (update.kind != 1 || update.param < depth::kMinLevels || update.param > depth::kMaxLevels) return;
  // Every depth view may be handed the same update: one of them applies it.
  if (!IsCurrentRegistration()) return;
  ::ApplyFieldUpdate(DepthStore::Instance(), update, platform::TickCount());
}

void CMarketDepthAdv::OnSettingsChanged() {
  m_maskRestored = false;
  if (!m_depthGrid) return;
  const JInstrumentUnderlying* instrument = CurrentInstrument();
  const std::wstring mask = MaskFor(instrument ? instrument->exchangeCode : std::string());
  if (mask == m_depthGrid->ColumnMask()) return;
  m_depthGrid->SetColumnMask(mask);
  m_depthGrid->Redraw();
}

void CMarketDepthAdv::ResubscribeAll() {
  for (CSuperBaseView* view : addon::UserViews().Views()) {
    auto* other = dynamic_cast<CMarketDepthAdv*>(view);
    if (!other || !other->m_depthGrid || other->m_depthGrid->Instrument().InstrumentCode.empty()) continue;
    depth::Register(other->m_depthGrid->Instrument(), other->m_levelCount, platform::TickCount());
  }
}

void CMarketDepthAdv::OnRefreshTick() {
  const bool current = IsCurrentRegistration();
  // A terminal may hand a subscription's values to the view that asked for it
  // only. So the current view, the one that applies them, asks for every
  // depth view; when it closes, its successor asks again for what is shown.
  if (current && m_tickedBefore && !m_wasCurrent) ResubscribeAll();
  m_wasCurrent = current;
  m_tickedBefore = true;
  // 1. Subscriptions wanted since the last tick.
  if (current) {
    const addon::FeedbackSender send = [this](UINT message, LPARAM data) { SendChildFeedback(message, data); };
    for (const depth::PendingDepth& pending : depth::TakePending()) {
      const addon::FieldTarget target{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)};
      addon::SendInterestBatches(send, target, addon::DepthInterest(pending.levelCount));
    }
  }
  // 2. Marks age once, by the current view.
  if (current) DepthStore::Instance().ExpireMarks(platform::TickCount());
  // 3. Redraw when something newer than what is drawn arrived; grow the book
  //    while every asked level is filled.
  if (!m_depthGrid) return;
  const std::uint64_t stamp = m_depthGrid->NewestStamp();
  if (stamp == 0 || stamp <= m_lastStamp) return;
  m_lastStamp = stamp;
  const int rows = m_depthGrid->GetNumberRows();
  if (rows > 0) {
    m_depthGrid->SetMessage({});
    if (rows >= m_levelCount && m_levelCount < kMaxLevels) {
      m_levelCount = std::min(m_levelCount + kLevelStep, kMaxLevels);
      m_depthGrid->SetLevelCount(m_levelCount);
    }
  }
  m_depthGrid->Redraw();
}
