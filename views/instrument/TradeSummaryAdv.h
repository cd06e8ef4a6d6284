#pragma once
// The trade summary of one instrument: the day's traded volume by price, as a
// table (TradeSGrid) and as a bar chart of ten prices at a time that follows
// the table's scroll position.
//
// The terminal sends the summary in pages of 40 price lines (kind 3, param =
// page) with the header fields; the view asks for page 1 on selection and for
// further pages once the header's page count grows (timer 3102, every
// second). Values land in the process-wide SummaryHeaderStore and
// SummaryLineStore that all trade-summary views share. A 410 is applied by
// the current trade-summary view only (the first of its class in the user
// registry), a 412 by every view; an empty 412 is asked again with 400.
// Page requests go through SummaryFeed under the base's current-view rule.
//
// Timer 3101 (200 ms): pending page requests and mark expiry (current view,
// by the base), then a redraw when the table's newest stamp moved, and a
// chart rebuild on the first rows or when a line in the chart's window changed.
#include <cstdint>
#include <string>

#include "chart/BarChart.h"
#include "data/MarketStores.h"
#include "views/instrument/SingleInstrumentView.h"

class TradeSGrid;

class CTradeSummaryAdv : public CSingleInstrumentView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CTradeSummaryAdv)
 public:
  static constexpr UINT kPageCountTimer = 3102;
  static constexpr UINT kPageCountMs = 1000;
  static constexpr int kEmptyStateEntry = 663;
  static constexpr const wchar_t* kEmptyStateFallback = L"No trades yet.";
  // The chart: series in this order, ten lines at a time, range set-up 0 and 20.
  static constexpr COLORREF kAskColor = 0x7373FF;
  static constexpr COLORREF kBidColor = 0x50D092;
  static constexpr COLORREF kBlocksColor = 0xBD814F;
  static constexpr int kChartLines = 10;
  static constexpr double kRangeMinimum = 0;
  static constexpr double kRangeHeadroom = 20;

  CTradeSummaryAdv();
  ~CTradeSummaryAdv() override;

  TradeSGrid* GetSummaryGrid() const { return m_summaryGrid; }
  CBarChart* GetChart() const { return m_chart; }
  std::uint64_t LastStamp() const { return m_lastStamp; }
  // The chart from the stores: every filled line, the window at the table's
  // scroll position.
  void BuildChart();
  // The chart group of one line (label, ask, bid, trades, tooltip).
  static CBarChart::Group ChartGroupOf(const SummaryLineRecord& line);

  void SetStyleManager(IStyleManager* styleManager) override;

 protected:
  void OnActivate() override;
  void OnDeactivate() override;
  int OnCreate() override;
  CInstrumentGrid* CreateGrid() override;
  void OnInstrumentSelected(const JInstrumentUnderlying& instrument) override;
  void RegisterShownInterest() override;
  void SendPendingInterest() override;
  void ExpireMarks(std::uint32_t now) override;
  void OnRefreshTick() override;
  void OnOtherTimer(UINT id) override;
  std::wstring EmptyStateText() override;
  void StartTimers(bool activation) override;
  void ShowRefusedColumns() override;
  std::uint32_t OnInstrumentViewMessage(UINT message, LPARAM data) override;
  void LayoutBody(const QRect& area) override;

 private:
  void ApplyFieldUpdate(const FieldUpdate& update, UINT message);
  void CheckPageCount();
  bool ChartWindowChanged() const;
  void FollowGrid(int topRow);
  void FollowChart(int first);
  void ApplyChartStyle();

  TradeSGrid* m_summaryGrid = nullptr;
  CBarChart* m_chart = nullptr;
  std::uint64_t m_lastStamp = 0;
  int m_lastFilled = 0;
  bool m_rowsShown = false;         // rows appeared for this instrument (one-shot)
  std::uint64_t m_chartVersion = 0; // newest line version in the chart's window when built
  bool m_following = false;         // grid and chart are being lined up
};
