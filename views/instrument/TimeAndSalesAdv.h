#pragma once
// The time and sales of one instrument: the trade tape, newest trade first,
// under an information panel with the day's figures.
//
// Selecting an instrument asks for its header (99999) and its live page
// (99998); the live page shows at once and sizes the tape. Every 10 s the
// view fetches missing history pages in the background, at most seven per
// batch and one batch per instrument (SalesPaging.h). Updates (410, kind 2)
// are applied by the current view of the class only; answers (412) by every
// view, and an empty answer is asked again once with 400.
//
// Timers: 3101 every 200 ms (requests, marks, redraw) and 3102 every 10 s
// (background pages); both run from activation on and keep running when the
// view loses activation, so an unfocused tape still moves and fills.
#include <cstdint>
#include <string>

#include "views/instrument/SingleInstrumentView.h"

class TimeASGrid;
struct FieldUpdate;

class CTimeAndSalesAdv : public CSingleInstrumentView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CTimeAndSalesAdv)
 public:
  static constexpr UINT kPagingTimer = 3102;
  static constexpr UINT kPagingMs = 10000;
  static constexpr int kEmptyStateTextId = 613;
  static constexpr int kPanelFontId = 20;
  static constexpr int kPanelLineHeight = 20;
  static constexpr int kPanelLines = 4;
  static constexpr int kPanelTop = 3;
  static constexpr int kPanelHeight = kPanelTop + kPanelLines * kPanelLineHeight + 4;

  CTimeAndSalesAdv();
  ~CTimeAndSalesAdv() override;

  TimeASGrid* GetSalesGrid() const { return m_salesGrid; }
  std::uint64_t LastStamp() const { return m_lastStamp; }
  // The information panel as drawn: one text per label and value, in
  // reading order (line 1: time label and "DTIME"; lines 2 to 4: left label,
  // left value, right label, right value).
  Q_INVOKABLE QStringList panelTexts() const;
  // The panel's rectangle in the view (empty while hidden).
  QRect PanelRect() const { return m_panel; }

  // Timer 3102 for the shown instrument (also reachable for tests).
  void BackgroundPaging();

 protected:
  void OnActivate() override;
  void OnDeactivate() override;
  CInstrumentGrid* CreateGrid() override;
  void OnInstrumentSelected(const JInstrumentUnderlying& instrument) override;
  void RegisterShownInterest() override;
  void SendPendingInterest() override;
  void ExpireMarks(std::uint32_t now) override;
  void OnRefreshTick() override;
  void OnOtherTimer(UINT id) override;
  std::wstring EmptyStateText() override;
  void StartTimers(bool activation) override;
  std::uint32_t OnInstrumentViewMessage(UINT message, LPARAM data) override;
  void LayoutBody(const QRect& area) override;
  void paintEvent(QPaintEvent* e) override;

 private:
  void ApplyFieldUpdate(UINT message, const FieldUpdate& update);
  // The view that sends the class's requests (the current one), else this.
  CTimeAndSalesAdv* RequestSender();

  TimeASGrid* m_salesGrid = nullptr;
  std::uint64_t m_lastStamp = 0;
  QRect m_panel;
  bool m_timersStarted = false;
};
