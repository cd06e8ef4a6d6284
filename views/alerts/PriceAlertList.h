#pragma once
// The list of the user's price alerts: New, Modify and Delete buttons over an
// AlertGrid showing the alert store, filtered by the user's alert option.
//
// The terminal keeps the alerts. The first alert list view of the process
// stores each complete list the terminal delivers (701) and asks for a fresh
// one whenever an alert was created, changed or deleted (702, 703, 704); the
// other alert lists follow the store's version on their timer. New and Modify
// open the new-alert form (112, 200, 705); Delete asks the terminal (704).
//
// Quote values of the alerts' instruments go into the process-wide quote
// store; the list subscribes to the instruments it shows (timer 3001).
// UI thread only.
#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "addon/AddonView.h"
#include "hostview/AlertRecords.h"

class AlertGrid;
class CBranticButton;

class CPriceAlertList : public CAddonView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CPriceAlertList)
 public:
  static constexpr int kNewId = 2010;
  static constexpr int kModifyId = 2011;
  static constexpr int kDeleteId = 2012;
  static constexpr UINT kRefreshTimer = 3001;
  static constexpr UINT kRefreshMs = 200;
  static constexpr UINT kRefitTimer = 3003;
  static constexpr UINT kRefitMs = 1000;
  static constexpr int kPreferredWidth = 370;
  static constexpr int kPreferredHeight = 250;
  // The frame of the new-alert form: compact, and tall for an alert that
  // notifies by e-mail or SMS.
  static constexpr int kFormWidth = 470;
  static constexpr int kFormHeight = 350;
  static constexpr int kFormTallHeight = 430;
  static constexpr const wchar_t* kFormClass = L"CNewPriceAlertAdv";

  CPriceAlertList();
  ~CPriceAlertList() override;

  bool IsFirstAlertList() const { return m_alertLists.IsFirst(); }
  bool IsFirstActiveView() const { return m_activeViews.IsFirst(); }
  AlertGrid* Grid() const { return m_grid; }
  CBranticButton* Button(int id) const;

  // ---- Contract ----
  void SetAppTitle(std::wstring title) override;
  void ApplyLanguage() override;
  void ChangeStyle(int styleId) override;
  void SetStyleManager(IStyleManager* styleManager) override;
  void OnTimer(UINT id) override;

  // ---- Actions (also reached through the buttons) ----
  void OnNew();
  void OnModify();
  void OnDelete();
  // Rebuilds the rows from the store with the current filter option.
  void Rebuild();
  void UpdateButtons();

 protected:
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;
  std::uint32_t OnViewMessage(UINT message, LPARAM data) override;
  void resizeEvent(QResizeEvent* e) override;
  void paintEvent(QPaintEvent* e) override;

 private:
  void BuildControls();
  void Relayout();
  // A complete list from the terminal (701).
  void ReplaceList(const std::vector<PriceAlertItem>& list);
  void ApplyQuote(UINT message, const FieldUpdate& update);
  // Whether this view writes quote values into the shared store and sends
  // the subscriptions: the first active view, or a view that is not active
  // (the terminal hands a subscription's values to the view that asked).
  bool HandlesQuotes() const;
  void FlushSubscriptions();
  void OpenForm(const PriceAlertItem& request, int height);

  addon::Membership m_alertLists{addon::AlertListViews};
  addon::Membership m_activeViews{addon::ActiveViews};
  AlertGrid* m_grid = nullptr;
  CBranticButton* m_new = nullptr;
  CBranticButton* m_modify = nullptr;
  CBranticButton* m_delete = nullptr;
  std::int32_t m_shownVersion = -1;  // alert store version shown
  std::uint64_t m_quoteVersion = 0;  // grid quote version drawn
};
