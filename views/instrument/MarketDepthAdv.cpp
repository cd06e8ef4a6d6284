#include "views/instrument/MarketDepthAdv.h"

#include <algorithm>

#include "addon/Channel.h"
#include "addon/Feeds.h"
#include "addon/Registries.h"
#include "data/MarketStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/instrument/DepthGrid.h"

ADDON_IMPLEMENT_VIEW(CMarketDepthAdv)

const addon::ViewClassInfo& CMarketDepthAdv::Info() {
  static const addon::ViewClassInfo info =
      InstrumentClassInfo("CMarketDepthAdv", &classCMarketDepthAdv, 7, L"Market Depth", "17001");
  return info;
}

CMarketDepthAdv::CMarketDepthAdv() : CSingleInstrumentView(Info()) {}
CMarketDepthAdv::~CMarketDepthAdv() = default;

void CMarketDepthAdv::OnActivate() { ActivateInstrumentView(); }
void CMarketDepthAdv::OnDeactivate() { DeactivateInstrumentView(); }

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
  if (update.kind != 1 || update.param < addon::DepthFeedTraits::kMinLevels ||
      update.param > addon::DepthFeedTraits::kMaxLevels)
    return;
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

void CMarketDepthAdv::RegisterShownInterest() {
  if (!m_depthGrid || m_depthGrid->Instrument().InstrumentCode.empty()) return;
  addon::DepthFeed::Instance().Register(m_depthGrid->Instrument(), m_levelCount, platform::TickCount());
}

void CMarketDepthAdv::SendPendingInterest() {
  for (const auto& pending : addon::DepthFeed::Instance().TakePending()) {
    const addon::FieldTarget target{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)};
    addon::SendInterestBatches(Sender(), target, addon::DepthInterest(pending.params));
  }
}

void CMarketDepthAdv::ExpireMarks(std::uint32_t now) { addon::DepthFeed::Instance().ExpireMarks(now); }

void CMarketDepthAdv::OnRefreshTick() {
  // Redraw when something newer than what is drawn arrived; grow the book
  // while every asked level is filled.
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
