#pragma once
// CSingleInstrumentView: the shape of the views that show one instrument at
// a time (market depth, time and sales, trade summary). What all views share
// (questions, trade tickets, shortcut keys, access and exchange checks,
// opening views) lives in CAddonView and addon::InstrumentActions; this class
// adds what only these three views have:
//   - child controls: the instrument combo box, the instrument-explorer
//     button (2015) and a second, hidden button, the view's grid (made by the
//     derived view), and a tab strip (notification id 2009) once views are
//     stacked on it; the layout with and without `saveSpace`;
//   - the registration value from the user registry (UserViews) and the
//     store-feed rule: only the current view of the class (the first
//     registered view of its class) applies updates of the shared stores,
//     sends the pending requests of the class's feed and expires the marks;
//     when it closes, its successor first has every view of the class
//     register again what it shows (the terminal forgot the closed view's
//     subscriptions);
//   - host notifications 1, 2, 310, 500/505 (combo list), 529, 604, 615;
//   - the selection path: access status (2310), "Counter is not Viewable.",
//     CFD refusal ("14009"), exchange check (604) with the class's refusal key,
//     then the view's data interest; start parameters in and out, link
//     updates (550/551), drops;
//   - trade tickets refused with "Counter is not Tradeable." unless the
//     instrument is tradeable; shortcut tickets for the shown instrument;
//     MSG_MDCOLUMNUPDATE; the 200 ms refresh timer (3101).
//
// A derived view supplies (all hooks have harmless defaults):
//   CreateGrid()              its grid, a CInstrumentGrid, made once at creation;
//   OnActivate/OnDeactivate   call ActivateInstrumentView()/DeactivateInstrumentView()
//                             from the view's own file (its log lines name it);
//   OnInstrumentSelected()    register the data interest of the new instrument
//                             in the class's feed (the grid is already reset);
//   RegisterShownInterest()   register again what the view shows (successor rule);
//   SendPendingInterest()     take the feed's pending interests, send their requests;
//   ExpireMarks(now)          expire the marks of the class's stores;
//   OnRefreshTick()           every view, every 200 ms: redraw from the newest stamp;
//   OnOtherTimer(id)          the view's own timers;
//   EmptyStateText()          the grid's text while an instrument has no rows;
//   StartTimers(activation)   timers on host code 2 (true) and 1 (false);
//   column-mask hooks         only the depth view keeps a column mask in its
//                             start parameters;
//   LayoutBody(area)          the area below the header: all of it for the grid
//                             by default (the trade summary adds its chart).
// The class-specific data (title entry 7, 8, 10; refusal key "17001",
// "17002", "17003"; the drop sources) come from addon::ViewClassInfo.
//
// UI thread only. Requests with synchronous answers go through CAddonView::Ask.
#include <QPointer>
#include <cstdint>
#include <optional>
#include <source_location>
#include <string>
#include <vector>

#include "addon/AddonView.h"
#include "hostview/Records.h"

class CImageButton;
class CInstrumentComboBox;
class CInstrumentGrid;
class CCustomTabCtrl;
struct CTCNotify;

class CSingleInstrumentView : public CAddonView {
  Q_OBJECT
 public:
  // Control and timer ids.
  static constexpr int kExplorerButtonId = 2015;
  static constexpr int kTabNotifyId = 2009;
  static constexpr UINT kRefreshTimer = 3101;
  static constexpr UINT kRefreshMs = 200;
  // The size asked for with 102 on activation.
  static constexpr int kPreferredWidth = 270;
  static constexpr int kPreferredHeight = 150;
  // Layout.
  static constexpr int kTabStripHeight = 20;
  static constexpr int kHeaderHeight = 36;
  static constexpr int kComboLeft = 85;
  static constexpr const wchar_t* kExplorerImage = L".\\images\\Toolbar\\[styleID]\\InstrumentExplorer.bmp";

  explicit CSingleInstrumentView(const addon::ViewClassInfo& info);
  ~CSingleInstrumentView() override;

  // The class data every single-instrument view shares: products and
  // instruments asked for first, the instrument views as drop sources; the
  // title entry, default title and exchange refusal key are the class's own.
  static addon::ViewClassInfo InstrumentClassInfo(const char* className, const CRuntimeClass* descriptor,
                                                  int titleEntry, const wchar_t* defaultTitle,
                                                  const char* refusalKey);

  // ---- Registration ----
  // Handed out by the user registry at creation, returned at destruction.
  int RegistrationValue() const { return m_user.Id(); }
  // Whether this view applies updates of the shared stores (its value is
  // current): the first registered view of its own class, so that a
  // time-and-sales view opened first does not silence the depth views.
  bool IsCurrentRegistration() const;

  // ---- Contract ----
  bool EnableDragOut() override { return true; }
  bool EnableDropIn() override { return true; }
  bool EnableDropIn(const char* sourceClassName) override;
  void ChangeStyle(int styleId) override;
  void SetStyleManager(IStyleManager* styleManager) override;
  void SetStyleID(int styleId) override;
  void ApplyLanguage() override;
  LRESULT DoDragDrop(UINT message, LPARAM data) override;
  CCustomTabCtrl* GetTabWnd() override { return m_tabs; }
  void AddTabView(CSuperBaseView* view) override;
  void CopyTabViews(CSuperBaseView* other) override;
  void SetCurTabView(int index) override;
  int GetTabCount() override;
  void RestoreView(CSuperBaseView* view, QPoint point, int flags) override;
  void OnTimer(UINT id) override;
  LRESULT OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) override;

  // ---- State ----
  // The shown instrument; null when none.
  const JInstrumentUnderlying* CurrentInstrument() const { return m_current ? &*m_current : nullptr; }
  int AccessStatus() const { return m_accessStatus; }
  bool IsViewable() const { return addon::IsViewableStatus(m_accessStatus); }
  bool IsTradeable() const { return addon::IsTradeableStatus(m_accessStatus); }
  int SaveSpace() const { return m_saveSpace; }
  bool OrderNumberMode() const { return LinkMode(); }
  CInstrumentGrid* Grid() const { return m_grid; }
  CInstrumentComboBox* Combo() const { return m_combo; }
  CImageButton* ExplorerButton() const { return m_explorer; }

  // ---- Actions (also reachable from the controls) ----
  // The selection path: access checks, refusals, then the view's data interest.
  // Returns whether the instrument is now shown.
  bool SelectInstrument(const JInstrumentUnderlying& instrument);
  // Applies the start parameters of a 310 (a JSON link text); false when it
  // does not parse. An instrument the store does not know clears the view.
  bool ApplyStartParams(const std::wstring& linkText);
  // A linked-instrument change (615).
  void ApplyLinkUpdate(const std::wstring& linkText);
  // MSG_WLOPENTRADE: "17007" for origin -1; refused with "Counter is not
  // Tradeable." when the instrument is not tradeable; else the shared path.
  LRESULT OpenTradeTicket(const std::wstring* linkText, LPARAM origin) override;
  // Records the start parameters for the given instrument (-1, "" for none).
  void RecordStartParams(std::int64_t productId, const std::string& instrumentCode);
  // The title: language text of the class, "Cash " before it for products of
  // type "DMA", then " - " and the instrument's name.
  std::wstring BuildTitle() const;
  // Lays the controls out again (size, saveSpace, tab strip).
  void Relayout();

 protected:
  int OnCreate() override;
  // Default: the shared sequences, logged under this file; views override
  // them to call the sequences from their own file.
  void OnActivate() override { ActivateInstrumentView(); }
  void OnDeactivate() override { DeactivateInstrumentView(); }
  std::uint32_t OnViewMessage(UINT message, LPARAM data) override;
  std::optional<std::wstring> ShortcutTicket(addon::TradeSide side) override;

  // Host code 2: 102 with the preferred size, StartTimers(true),
  // PrepareBasicData (logged at `where`), the display mode (519), the combo
  // list, the columns, the language, the empty-state text, the explorer button.
  void ActivateInstrumentView(std::source_location where = std::source_location::current());
  // Host code 1: PrepareBasicData (logged at `where`), StartTimers(false).
  void DeactivateInstrumentView(std::source_location where = std::source_location::current());

  // ---- Hooks for the derived view ----
  virtual CInstrumentGrid* CreateGrid() { return nullptr; }
  virtual void OnInstrumentSelected(const JInstrumentUnderlying& instrument) {}
  virtual void RegisterShownInterest() {}
  virtual void SendPendingInterest() {}
  virtual void ExpireMarks(std::uint32_t now) {}
  virtual void OnRefreshTick() {}
  virtual void OnOtherTimer(UINT id) {}
  virtual std::wstring EmptyStateText() { return {}; }
  // Timers on 2 (activation = true) and 1. Default: the refresh timer both times.
  virtual void StartTimers(bool activation);
  // Grid columns after activation and selection (depth: the column mask).
  virtual void ApplyColumns() {}
  // Refused or not viewable: the columns shown without an instrument.
  virtual void ShowRefusedColumns() {}
  // Column mask kept in the start parameters ("User_field_product_id");
  // nullopt for views that keep none.
  virtual std::optional<std::wstring> SavedColumnMask() const { return std::nullopt; }
  // A mask found in the start parameters (depth only).
  virtual void RestoreColumnMask(const std::wstring& mask) {}
  // The view's own data notifications (410/412, 2600, ...).
  virtual std::uint32_t OnInstrumentViewMessage(UINT message, LPARAM data) { return 0; }
  // Places what lies below the header (the grid, and what a view draws above
  // it) in `area`. Default: the grid takes all of it.
  virtual void LayoutBody(const QRect& area);

  // True while the instrument of a 310 (start parameters) is being selected.
  bool SelectingFromStartParams() const { return m_fromStartParams; }
  // Shows `text` over the empty grid after clearing the view (refusals).
  void ClearWithMessage(const std::wstring& text);
  // No instrument: nothing shown, no message, the class title, the combo
  // box's placeholder, start parameters -1 and "".
  void ClearInstrument();
  // The empty-state text while the grid has no rows, else nothing.
  void RefreshEmptyState();
  // Sends the title built by BuildTitle (101).
  void UpdateTitle();
  // The instrument as the instrument store holds it; null when absent.
  const JInstrumentUnderlying* FindInstrument(std::int64_t productId, const std::wstring& code) const;

  void paintEvent(QPaintEvent* e) override;
  void resizeEvent(QResizeEvent* e) override;

 private:
  void BuildControls();
  void ReloadComboList();
  void SyncCombo();
  void OnComboChosen();
  void OnTabNotify(CTCNotify& notify);
  void EnsureTabs();
  void ReloadImages();
  void UpdateExplorerVisibility();
  std::wstring KindTitle(const CSuperBaseView* view) const;
  // Timer 3101: the store-feed rule, then OnRefreshTick.
  void RefreshTick();

  addon::Membership m_user{addon::UserViews};
  CInstrumentComboBox* m_combo = nullptr;
  CImageButton* m_explorer = nullptr;
  CImageButton* m_second = nullptr;
  CInstrumentGrid* m_grid = nullptr;
  CCustomTabCtrl* m_tabs = nullptr;
  std::optional<JInstrumentUnderlying> m_current;
  const std::vector<JInstrumentUnderlying>* m_instrumentList = nullptr;
  int m_accessStatus = 0;
  int m_saveSpace = 0;
  bool m_fromStartParams = false;
  bool m_wasCurrent = false;    // current at the last refresh tick
  bool m_tickedBefore = false;  // a refresh tick has run
};
