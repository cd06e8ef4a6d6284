#pragma once
// CSingleInstrumentView: the shared shape of the views that show one
// instrument at a time (market depth, time and sales, trade summary).
//
// What it does for every such view:
//   - child controls: the instrument combo box (2110), the instrument-explorer
//     button (2015) and a second, hidden button, the view's grid (made by the
//     derived view), and a tab strip (notification id 2009) once views are
//     stacked on it;
//   - the registration value from the user registry (UserViews): only the view
//     whose value is current applies updates of the shared stores and expires
//     their marks (IsCurrentRegistration);
//   - host notifications 1, 2, 310, 500, 505, 529, 550/551, 604, 615 (plus the
//     answers CAddonView keeps: 514/2814, 519, 528, 2310);
//   - the selection path with its access checks and refusal texts, start
//     parameters in and out, link updates, drops, trade tickets
//     (MSG_WLOPENTRADE), keyboard shortcuts, MSG_MDCOLUMNUPDATE, the layout
//     with and without `saveSpace`, the 200 ms refresh timer (3101).
//
// A derived view supplies (all hooks have harmless defaults):
//   CreateGrid()              its grid, a CInstrumentGrid, made once at creation;
//   OnInstrumentSelected()    register the data interest of the new instrument
//                             (the grid is already reset);
//   OnRefreshTick()           timer 3101: send pending requests, expire marks
//                             when current, redraw from the newest stamp;
//   RefusalKey()              message key shown when the exchange is disabled
//                             ("17001" depth, "17002" time and sales, "17003" summary);
//   EmptyStateText()          the grid's text while an instrument has no rows;
//   StartTimers(activation)   timers on host code 2 (true) and 1 (false);
//   column-mask hooks         only the depth view keeps a column mask in its
//                             start parameters.
// The class-specific texts come from addon::ViewClassInfo (title entry 7, 8, 10).
//
// UI thread only. Requests with synchronous answers (514/2814, 519, 550/551,
// 604, 2310) re-enter OnHostMessage before SendChildFeedback returns.
#include <QPointer>
#include <cstdint>
#include <optional>
#include <set>
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
  static constexpr int kComboId = 2110;
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
  // Trade tickets opened from a keyboard shortcut carry this origin.
  static constexpr LPARAM kShortcutOrigin = 99;
  // Texts of the common refusals (the system's own wording).
  static constexpr const wchar_t* kNotViewableText = L"Counter is not Viewable.";
  static constexpr const wchar_t* kNotTradeableText = L"Counter is not Tradeable.";
  static constexpr const char* kCfdRefusalKey = "14009";
  static constexpr const wchar_t* kExplorerImage = L".\\images\\Toolbar\\[styleID]\\InstrumentExplorer.bmp";

  explicit CSingleInstrumentView(const addon::ViewClassInfo& info);
  ~CSingleInstrumentView() override;

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
  bool IsViewable() const { return IsViewableStatus(m_accessStatus); }
  bool IsTradeable() const { return IsTradeableStatus(m_accessStatus); }
  int SaveSpace() const { return m_saveSpace; }
  bool OrderNumberMode() const { return LinkMode(); }
  bool IsExchangeEnabled(const std::string& exchangeCode) const { return m_enabledExchanges.count(exchangeCode) != 0; }
  CInstrumentGrid* Grid() const { return m_grid; }
  CInstrumentComboBox* Combo() const { return m_combo; }
  CImageButton* ExplorerButton() const { return m_explorer; }

  static bool IsViewableStatus(int status) { return status != 0 && status != 2; }
  static bool IsTradeableStatus(int status) { return status != 0 && status != 1; }

  // ---- Actions (also reachable from the controls) ----
  // The selection path: access checks, refusals, then the view's data interest.
  // Returns whether the instrument is now shown.
  bool SelectInstrument(const JInstrumentUnderlying& instrument);
  // Applies the start parameters of a 310 (a JSON link text); false when it
  // does not parse.
  bool ApplyStartParams(const std::wstring& linkText);
  // A linked-instrument change (615).
  void ApplyLinkUpdate(const std::wstring& linkText);
  // MSG_WLOPENTRADE: refuses when the instrument is not tradeable, else 206
  // (origin 99 only), 200 and 310 with class "CTradeView".
  LRESULT OpenTradeTicket(const std::wstring* linkText, LPARAM origin);
  // A shortcut key; true when it is one of the six (consumed whether or not a
  // ticket opens).
  bool HandleShortcutKey(int key, Qt::KeyboardModifiers modifiers, bool inTextEntry = false);
  // Records the start parameters for the given instrument (-1, "" for none).
  void RecordStartParams(std::int64_t productId, const std::string& instrumentCode);
  // The title: language text of the class, "Cash " before it for products of
  // type "DMA", then " - " and the instrument's name.
  std::wstring BuildTitle() const;
  // Lays the controls out again (size, saveSpace, tab strip).
  void Relayout();

 protected:
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;
  std::uint32_t OnViewMessage(UINT message, LPARAM data) override;

  // ---- Hooks for the derived view ----
  virtual CInstrumentGrid* CreateGrid() { return nullptr; }
  virtual void OnInstrumentSelected(const JInstrumentUnderlying& instrument) {}
  virtual void OnRefreshTick() {}
  virtual const char* RefusalKey() const { return "17001"; }
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
  // The area below the header (and the tab strip). Default: all of it for the grid.
  virtual void LayoutBody(const QRect& area);

  // True while the instrument of a 310 (start parameters) is being selected.
  bool SelectingFromStartParams() const { return m_fromStartParams; }
  // Shows `text` over the empty grid after clearing the view (refusals).
  void ClearWithMessage(const std::wstring& text);
  // The empty-state text while the grid has no rows, else nothing.
  void RefreshEmptyState();
  // Sends the title built by BuildTitle (101).
  void UpdateTitle();
  // The instrument as the instrument store holds it; null when absent.
  const JInstrumentUnderlying* FindInstrument(std::int64_t productId, const std::wstring& code) const;

  void paintEvent(QPaintEvent* e) override;
  void resizeEvent(QResizeEvent* e) override;
  void keyPressEvent(QKeyEvent* e) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  void BuildControls();
  void WatchKeys(QWidget* widget);
  void ReloadComboList();
  void SyncCombo();
  void OnComboChosen();
  void OnExplorerClicked();
  void OnTabNotify(CTCNotify& notify);
  void EnsureTabs();
  void ReloadImages();
  void UpdateExplorerVisibility();
  std::wstring KindTitle(const CSuperBaseView* view) const;
  std::wstring ProductTypeOf(const JInstrumentUnderlying& instrument) const;
  bool CheckExchange(const JInstrumentUnderlying& instrument);

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
  std::set<std::string> m_enabledExchanges;
  std::string m_checkingExchange;  // the exchange of the pending 604
  const JInstrumentUnderlying* m_linkAnswer = nullptr;  // answer to 550/551
  bool m_fromStartParams = false;
  const QEvent* m_textKeyEvent = nullptr;  // a key typed into the search box
};
