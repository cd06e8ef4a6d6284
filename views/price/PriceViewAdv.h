#pragma once
// CPriceViewAdv: the price view. The user's watchlists and the ready-made lists
// (TOP30 lists, brand lists, world indices) in family tabs, shown in the quote
// table (list mode) or, once it exists, the quote board; watchlist editing;
// the quote subscriptions of what is shown; legends for remark and long/short
// codes.
//
// Shared state: the watchlist stores (Watchlists.h), the quote store and the
// reference stores are process-wide. Of several open price views the first in
// the open-price-view registry (the leading one) applies store-wide replies
// (520, 521, 522, 610, 611, 414) and runs the per-second shared work. Quote
// values (410/412, kind 0) are written by one view only, the quote applier:
// the first active view when that is a price view, else the leading price
// view (in this terminal only the focused view is active, and the quotes must
// not stop while the user works in another view). The applier also sends the
// subscriptions of every open price view, so that a terminal that pushes a
// value only to the view that asked for it reaches the view that writes it.
//
// Trade tickets, "open view X on instrument Y", the trade keys and the access
// rules are the shared ones of the base (CAddonView::Actions(), WatchTradeKeys).
//
// UI thread only. Synchronous answers (515/518, 2310, 2814, 519, 601)
// re-enter OnHostMessage while a request is inside SendChildFeedback.
#include <QPointer>
#include <cstdint>
#include <map>
#include <optional>
#include <memory>
#include <string>
#include <vector>

#include "addon/AddonView.h"
#include "data/Keys.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"

class BoardGrid;
class CAdvanceFilter;
class CBranticButton;
class CCustomTabCtrl;
class CImageButton;
class CInstrumentComboBox;
class CLSTipDlg;
class CRemTipDlg;
class IQuoteGrid;
class PriceGrid;
struct CTCNotify;

class CPriceViewAdv : public CAddonView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CPriceViewAdv)
 public:
  // ---- Child controls ----
  enum ControlId : int {
    kUserTabsId = 2001, kKeldoTabsId = 2020, kTop30TabsId = 2022,
    kUserButtonId = 2018, kKeldoButtonId = 2019, kTop30ButtonId = 2021, kWorldButtonId = 2024,
    kFilterButtonId = 2027, kInstrumentBoxId = 2010, kListModeButtonId = 2013, kBoardModeButtonId = 2014,
    kExplorerButtonId = 2015, kTop30MenuButtonId = 2023, kHelpButtonId = 2025,
  };
  // ---- Commands ----
  enum Command : int {
    kCmdRenameUser = 2016, kCmdDeleteUser = 2017, kCmdRenameKeldo = 2026,
    kCmdTop30First = 10000, kCmdTop30Last = 10999, kCmdFontFirst = 190, kCmdFontLast = 199,
  };
  // ---- Timers ----
  static constexpr UINT kRefreshTimer = 3001;
  static constexpr UINT kRefreshMs = 200;
  static constexpr UINT kSecondTimer = 3003;
  static constexpr UINT kSecondMs = 1000;
  static constexpr UINT kRemarkTipTimer = 2899;
  static constexpr UINT kLongShortTipTimer = 2900;
  static constexpr UINT kTipDelayMs = 500;
  // Silent instruments are asked again every 10th second, at most this often.
  static constexpr int kMaxRetries = 5;
  // Display modes.
  static constexpr int kListMode = 0;
  static constexpr int kBoardMode = 1;

  // The system's own texts.
  static constexpr const wchar_t* kTooManyWatchlists = L"Number of watchlist is limited to %d";
  static constexpr const wchar_t* kTooManyItems = L"Number of priceview items is limited to %d";
  static constexpr const wchar_t* kAlreadyInList = L"Instrument already exist in the list.";
  static constexpr const wchar_t* kRemoved = L"Instrument successfully removed from the list.";
  static constexpr const wchar_t* kHelpTip = L"Price delayed 15-30mins for counters with *.";
  // The advance filter's empty-list texts (before a full choice / no match).
  static constexpr const wchar_t* kFilterChooseText = L"Choose a product, an exchange, a sector and a letter.";
  static constexpr const wchar_t* kFilterNoMatchText = L"No instrument matches the filter.";
  // Start parameter: the advance filter's choices while it is on screen.
  static constexpr const char* kAdvanceFilterParam = "User_field_advance_filter";

  CPriceViewAdv();
  ~CPriceViewAdv() override;
  // Forgets the process-wide retry counters and the shared second count (tests).
  static void ResetProcessState();

  // ---- Registries ----
  bool IsLeadingPriceView() const { return m_priceViews.IsFirst(); }
  bool IsFirstActiveView() const { return m_activeViews.IsFirst(); }
  // The one view that writes quote values into the store (see the file comment).
  bool IsQuoteApplier() const;

  // ---- State ----
  int GetListKind() const { return m_listKind; }
  int GetDisplayMode() const { return m_displayMode; }
  // The list last shown in a family (0 user, 1 TOP30, 2 brand); empty when none.
  const std::wstring& CurrentName(int listKind) const;
  IQuoteGrid* VisibleGrid() const;
  PriceGrid* GetPriceGrid() const { return m_priceGrid; }
  BoardGrid* GetBoardGrid() const { return m_boardGrid; }
  CAdvanceFilter* AdvanceFilter() const { return m_filter; }
  CCustomTabCtrl* Tabs(int listKind) const;
  CInstrumentComboBox* InstrumentBox() const { return m_combo; }
  CLSTipDlg* LongShortLegend() const { return m_lsTip; }
  CRemTipDlg* RemarkLegend() const { return m_remTip; }
  QWidget* Control(int id) const;
  int SecondTicks() const { return m_tickCounter; }

  // ---- Contract ----
  void vRecvMsg(UINT message, LPARAM data) override {}
  void vChangeSymbol() override { update(); }
  void ChangeStyle(int styleId) override;
  void SetStyleManager(IStyleManager* styleManager) override;
  void SetStyleID(int styleId) override;
  void ApplyLanguage() override;
  bool EnableDragOut() override { return true; }
  bool EnableDropIn() override;
  bool EnableDropIn(const char* sourceClassName) override;
  LRESULT DoDragDrop(UINT message, LPARAM data) override;
  void OnTimer(UINT id) override;
  LRESULT OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) override;

  // ---- Actions (the controls call these; tests may too) ----
  // Button and menu commands (family buttons, 2013..2017, 2026, 10000+, 190+).
  void OnCommand(int id);
  // The six steps of showing a watchlist; false when the family's store has no such list.
  bool ShowWatchlist(int listKind, const std::wstring& name);
  void SwitchFamily(int listKind);
  void SetDisplayMode(int mode);
  // The tab strip's add button.
  void CreateWatchlist();
  // A tab label was edited (user or brand family): the checks; false refuses.
  bool RenameWatchlist(int listKind, int index, const std::wstring& oldText);
  // The tab strip's delete request (asks first); false refuses.
  bool DeleteFromTabStrip(int index);
  // The tab menu's delete item (asks nothing).
  void DeleteFromMenu(int index);
  // The tabs were dragged into a new order.
  void ReorderUserWatchlists();
  // The instrument box chose `chosen`: the checks, then the row.
  void AddChosenInstrument(const JInstrumentUnderlying& chosen);
  // The font-size menu (616) at its place; runs the chosen command.
  void ShowFontSizeMenu();
  // The tab menu of a right click on tab `index` of a family.
  void ShowTabMenu(int listKind, int index, const QPoint& globalPos);

  // Tab loaders (also run on 300).
  void LoadWatchlistTabs();
  void LoadTOP30WatchlistTabs();
  void LoadKELDOWatchlistTabs();

 protected:
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;
  std::uint32_t OnViewMessage(UINT message, LPARAM data) override;
  void resizeEvent(QResizeEvent* e) override;
  void paintEvent(QPaintEvent* e) override;
  std::optional<std::wstring> ShortcutTicket(addon::TradeSide side) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  void BuildControls();
  void Relayout();
  void LayoutFamilyButtons();
  void PressFamilyButton();
  void ReloadImages();
  void ReloadComboList();
  void StartTimers();
  void LoadTabs(int listKind);
  void OnTabNotify(int listKind, CTCNotify& notify);
  void UpdateEmptyText();
  void StoreStartParams();
  void ApplyStartParams(const std::wstring& linkText);
  // The advance filter: the family button, a result, a choice to restore.
  void OpenAdvanceFilter();
  void OnFilterResult(const std::vector<InstrumentKey>& result);
  void RestorePendingFilter();

  // Host replies.
  void OnFieldUpdate(const FieldUpdate& update);
  void OnInstrumentFieldUpdate(const FieldUpdate& update);
  void OnInstrumentList(const JInstrumentListMsg& msg);
  void OnUserWatchlists(const std::vector<JWatchlistRow>& rows);
  void OnTop30(const std::vector<JTop30Group>& groups);
  void OnWatchlistsChanged(int family);
  // Tabs of the family again, and its list when it is on screen.
  void ReloadFamily(int family);

  // Timers.
  void OnRefreshTick();
  void OnSecondTick();
  void SubscribePending();
  void RetrySilentInstruments();
  void LeadingSecondWork();

  // Watchlist editing helpers.
  // The checks of the instrument box for one instrument; empty text: accepted.
  std::wstring CheckAddable(const JInstrumentUnderlying& instrument);
  void SaveItems(int listKind, const std::wstring& name);
  void SendNames();
  void AddInstrumentsByMessage(const std::vector<InstrumentKey>* keys, int position);
  void RemoveInstrumentsByMessage(int listKind, const std::vector<InstrumentKey>* keys, int position);
  std::wstring AlreadyInListText() const;

  void ShowLegend(bool remark);

  addon::Membership m_priceViews{addon::OpenPriceViews};
  addon::Membership m_activeViews{addon::ActiveViews};

  int m_listKind = 0;
  int m_displayMode = kListMode;
  std::wstring m_currentUser, m_currentTop30, m_currentKeldo;
  int m_clickedTab = -1;
  bool m_firstActivation = true;
  bool m_tabsStale[3] = {false, false, false};  // a 300 came while inactive
  const std::vector<JInstrumentUnderlying>* m_instrumentList = nullptr;
  const std::vector<JInstrumentUnderlying>* m_comboList = nullptr;
  std::uint64_t m_gridMarks[2] = {0, 0};
  int m_tickCounter = 1;
  bool m_wasApplier = false;
  std::vector<std::pair<std::wstring, std::wstring>> m_remarkRows;

  // Controls (children; they die with the view).
  CCustomTabCtrl* m_userTabs = nullptr;
  CCustomTabCtrl* m_top30Tabs = nullptr;
  CCustomTabCtrl* m_keldoTabs = nullptr;
  CBranticButton* m_familyButtons[5] = {};
  CInstrumentComboBox* m_combo = nullptr;
  CImageButton* m_listModeButton = nullptr;
  CImageButton* m_boardModeButton = nullptr;
  CImageButton* m_explorerButton = nullptr;
  CBranticButton* m_top30MenuButton = nullptr;
  CImageButton* m_helpButton = nullptr;
  PriceGrid* m_priceGrid = nullptr;
  BoardGrid* m_boardGrid = nullptr;
  CAdvanceFilter* m_filter = nullptr;
  std::string m_pendingFilter;  // choices of a start parameter, made once the view can
  IQuoteGrid* m_grids[2] = {nullptr, nullptr};  // by display mode; the board slots in at 1
  CLSTipDlg* m_lsTip = nullptr;
  CRemTipDlg* m_remTip = nullptr;
};
