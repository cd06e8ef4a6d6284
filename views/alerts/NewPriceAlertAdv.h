#pragma once
// The new-price-alert form: instrument, watched field, comparator, threshold
// price with steps from the instrument's tick bands, validity date, trigger
// once, notification channels and a submit button. The terminal fills it with
// 705 (a new alert, or an existing one to change) and receives the alert with
// 702 or 703, followed by 202.
//
// The alert settings the terminal answers by key ("ALEML", "ALSMS", "MAXPA",
// "EXCPA") are filed in the process-wide AlertSettingsCache under the key of
// the request in flight.
// UI thread only; 515, 2814 and 2310 are answered inside SendChildFeedback.
#include <QPointer>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "addon/AddonView.h"
#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"

class CBranticButton;
class CBranticEdit;
class CBranticSpinBt;
class CButtonEx;
class CFloatEdit;
class CImageButton;
class CInstrumentComboBox;
class CSkinComboBox;
class CptDatetimeCtrl;

class CNewPriceAlertAdv : public CAddonView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CNewPriceAlertAdv)
 public:
  // Control ids.
  static constexpr int kComboId = 2110;
  static constexpr int kExplorerId = 2015;
  static constexpr int kSubmitId = 2016;
  static constexpr int kAppId = 2017;
  static constexpr int kEmailId = 2018;
  static constexpr int kSmsId = 2019;
  static constexpr int kFieldId = 2020;
  static constexpr int kComparatorId = 2021;
  static constexpr int kTriggerId = 2022;
  static constexpr int kDateId = 2023;
  static constexpr int kPriceId = 2024;
  static constexpr int kSpinId = 2025;
  static constexpr int kNoticeId = 2026;
  static constexpr UINT kRefreshTimer = 3001;
  static constexpr UINT kRefreshMs = 200;
  // Frame sizes: compact, and tall while the notice box shows.
  static constexpr int kWidth = 470;
  static constexpr int kCompactHeight = 350;
  static constexpr int kTallHeight = 430;
  static constexpr int kListItems = 17;
  static constexpr const wchar_t* kExplorerImage = L".\\images\\Toolbar\\[styleID]\\InstrumentExplorer.bmp";

  CNewPriceAlertAdv();
  ~CNewPriceAlertAdv() override;

  bool IsFirstActiveView() const { return m_activeViews.IsFirst(); }

  // ---- Contract ----
  std::uint32_t OnHostMessage(UINT message, LPARAM data) override;
  void SendChildFeedback(UINT message, LPARAM data) override;
  void SetAppTitle(std::wstring title) override;
  void ApplyLanguage() override;
  void ChangeStyle(int styleId) override;
  void SetStyleManager(IStyleManager* styleManager) override;
  void OnTimer(UINT id) override;

  // ---- State ----
  std::int32_t EditingId() const { return m_editingId; }
  bool ViaApp() const { return m_viaApp; }
  bool ViaEmail() const { return m_viaEmail; }
  bool ViaSms() const { return m_viaSms; }
  bool NoticeShown() const { return m_noticeShown; }
  const JInstrumentUnderlying* CurrentInstrument() const { return m_current ? &*m_current : nullptr; }
  const std::vector<TickBand>& TickBands() const { return m_tickBands; }
  double LastStep() const { return m_lastStep; }
  const JPriceInformation& PriceInformation() const { return m_priceInfo; }
  const std::wstring& ExchangeList() const { return m_exchangeList; }

  // ---- Controls ----
  CInstrumentComboBox* Combo() const { return m_combo; }
  CSkinComboBox* FieldList() const { return m_field; }
  CSkinComboBox* ComparatorList() const { return m_comparator; }
  CSkinComboBox* TriggerList() const { return m_trigger; }
  CptDatetimeCtrl* DateControl() const { return m_date; }
  CFloatEdit* PriceEdit() const { return m_price; }
  CBranticSpinBt* Spin() const { return m_spin; }
  CButtonEx* ChannelBox(int id) const;
  CBranticButton* SubmitButton() const { return m_submit; }
  CBranticEdit* NoticeBox() const { return m_notice; }
  // The controls the Tab key walks through, in order (hidden ones included).
  std::vector<QWidget*> TabOrder() const;

  // ---- Actions (also reached through the controls) ----
  // -1 resets the form to a new alert; any other id loads that alert from the
  // store (an unknown id leaves the form as it was).
  void LoadAlert(std::int32_t id);
  // The combo box's choice: viewability check, then the instrument becomes current.
  void ChooseInstrument(const JInstrumentUnderlying& instrument);
  // One spin step: +1 up, -1 down.
  void StepPrice(int delta);
  // A click on a channel check box (2017, 2018, 2019).
  void ToggleChannel(int id);
  void SubmitAlert();

 protected:
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;
  std::uint32_t OnViewMessage(UINT message, LPARAM data) override;
  void paintEvent(QPaintEvent* e) override;
  void resizeEvent(QResizeEvent* e) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  void BuildControls();
  void Relayout();
  void FillList(CSkinComboBox* list, int firstText, const std::vector<const wchar_t*>& fallbacks);
  void ReloadComboList(bool force);
  void ShowChannelChoices();
  void SetDateRange(bool setDay);
  // Shows or hides the notice box and asks for the matching frame size; only
  // on a change unless `always`.
  void ApplyNoticeRule(bool always);
  void SendFrameSize(int height);
  void MakeCurrent(const JInstrumentUnderlying& instrument);
  void ApplyLink(const ViewLink* link);
  void SendPriceInfoRequest();
  void SendTitle();
  void OnChannelClicked(int id);
  void OnSpinChanging(int delta);
  void OnSpinScrolled(int position);
  // Whether this view writes quote values into the shared store and sends
  // the subscriptions (see CPriceAlertList::HandlesQuotes).
  bool HandlesQuotes() const;
  void ApplyQuote(const FieldUpdate& update);
  void FlushSubscriptions();
  std::uint64_t QuoteRecordVersion() const;
  void MoveFocus(QObject* from, bool forward);
  void WatchTab(QWidget* widget);
  void DrawInfoPanel(QPainter& p, const QRect& area);

  addon::Membership m_activeViews{addon::ActiveViews};

  CInstrumentComboBox* m_combo = nullptr;
  CImageButton* m_explorer = nullptr;
  CBranticButton* m_submit = nullptr;
  CButtonEx* m_app = nullptr;
  CButtonEx* m_email = nullptr;
  CButtonEx* m_sms = nullptr;
  CSkinComboBox* m_field = nullptr;
  CSkinComboBox* m_comparator = nullptr;
  CSkinComboBox* m_trigger = nullptr;
  CptDatetimeCtrl* m_date = nullptr;
  CFloatEdit* m_price = nullptr;
  CBranticSpinBt* m_spin = nullptr;
  CBranticEdit* m_notice = nullptr;

  std::int32_t m_editingId = -1;
  bool m_viaApp = true;
  bool m_viaEmail = false;
  bool m_viaSms = false;
  bool m_noticeShown = false;
  bool m_sizeSent = false;  // a frame size has been asked for
  bool m_dayChosen = false; // the validity day was set once (activation or alert)
  std::optional<JInstrumentUnderlying> m_current;
  const std::vector<JInstrumentUnderlying>* m_instrumentList = nullptr;
  std::vector<TickBand> m_tickBands;
  double m_lastStep = 0.1;
  JPriceInformation m_priceInfo;
  std::string m_settingKey;      // key of the 515 in flight
  std::wstring m_exchangeList;   // the last setting answer
  std::wstring m_noExchangeText; // the text of "17008"
  std::uint64_t m_redrawVersion = 0;
};
