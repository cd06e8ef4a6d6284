#pragma once
// The market depth of one instrument: up to 99 price levels of buy and sell
// orders, read from the process-wide DepthStore that every depth view shares.
//
// A selection asks for 5 levels; each refresh that finds every asked level
// filled asks for 16 more (5, 21, 37, ... 99). The interest goes through the
// depth feed (addon::DepthFeed); by the rule of the single-instrument base,
// updates (410/412, kind 1, level 1..99) are applied by the depth view whose
// registration value is current only, so that an update relayed to every
// depth view lands once, and that view sends the subscriptions of all depth
// views, so that a terminal that answers only the asking view still reaches it.
#include <cstdint>
#include <string>

#include "views/instrument/SingleInstrumentView.h"

class DepthGrid;

class CMarketDepthAdv : public CSingleInstrumentView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CMarketDepthAdv)
 public:
  static constexpr int kFirstLevels = 5;
  static constexpr int kLevelStep = 16;
  static constexpr int kMaxLevels = 99;
  static constexpr const char* kEmptyStateKey = "17005";

  CMarketDepthAdv();
  ~CMarketDepthAdv() override;

  int LevelCount() const { return m_levelCount; }
  std::uint64_t LastStamp() const { return m_lastStamp; }
  DepthGrid* GetDepthGrid() const { return m_depthGrid; }
  // "111111" for an instrument of "SGX" while the general setting shows order
  // counts; "011110" otherwise.
  static std::wstring MaskFor(const std::string& exchangeCode);

 protected:
  CInstrumentGrid* CreateGrid() override;
  void OnActivate() override;
  void OnDeactivate() override;
  void OnInstrumentSelected(const JInstrumentUnderlying& instrument) override;
  void RegisterShownInterest() override;
  void SendPendingInterest() override;
  void ExpireMarks(std::uint32_t now) override;
  void OnRefreshTick() override;
  std::wstring EmptyStateText() override;
  void ShowRefusedColumns() override;
  std::optional<std::wstring> SavedColumnMask() const override;
  void RestoreColumnMask(const std::wstring& mask) override;
  std::uint32_t OnInstrumentViewMessage(UINT message, LPARAM data) override;

 private:
  void ApplyFieldUpdate(const FieldUpdate& update);
  void OnSettingsChanged();

  DepthGrid* m_depthGrid = nullptr;
  int m_levelCount = kFirstLevels;
  std::uint64_t m_lastStamp = 0;
  std::wstring m_emptyText;     // the host's "17005" text, asked once
  bool m_maskRestored = false;  // a saved mask waits for the restored instrument
};
