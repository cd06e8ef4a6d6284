// The new-price-alert form through the scripted host: what it asks the
// terminal, what it sends on submit, and how its controls behave.
#include "AlertFixture.h"

#include <QLineEdit>

#include "controls/InstrumentComboBox.h"
#include "hostview/Buttons.h"
#include "hostview/Edits.h"

namespace alerttest {
namespace {

using NewAlertForm = AlertFixture;

// Asks a setting as the form does and lets the host answer it.
void AskSetting(CNewPriceAlertAdv* form, const char* key) { form->RequestSetting(hm::SystemParameter, key); }

std::vector<ViewSize> FrameSizes(const mvtest::ScriptedHost& host) {
  std::vector<ViewSize> out;
  std::vector<UINT> order;
  for (const auto& f : host.Requests()) {
    if (f.message != hm::ViewSizeRequest && f.message != hm::AlertFrameSize && f.message != hm::AlertFrameSize2)
      continue;
    order.push_back(f.message);
    out.push_back(f.message == hm::ViewSizeRequest ? *f.size : std::any_cast<ViewSize>(f.extra));
  }
  // Every size goes out as 102, 110, 103 in that order.
  for (std::size_t i = 0; i + 2 < order.size(); i += 3)
    EXPECT_EQ((std::vector<UINT>{order[i], order[i + 1], order[i + 2]}),
              (std::vector<UINT>{hm::ViewSizeRequest, hm::AlertFrameSize2, hm::AlertFrameSize}));
  return out;
}

TEST_F(NewAlertForm, PriceSteps_FollowTheTickBandsAndNeverGoBelowZero) {
  CNewPriceAlertAdv* form = MakeForm();
  form->ChooseInstrument(instruments[0]);
  CFloatEdit* price = form->PriceEdit();
  price->SetValue(10.00);
  form->StepPrice(+1);
  EXPECT_EQ(price->text(), "10.05") << "up from the band above";
  price->SetValue(10.00);
  form->StepPrice(-1);
  EXPECT_EQ(price->text(), "9.99") << "down from the band below";
  // The Down key in the price edit steps like the arrow.
  QKeyEvent down(QEvent::KeyPress, Qt::Key_Down, Qt::NoModifier);
  QApplication::sendEvent(price, &down);
  EXPECT_EQ(price->text(), "9.98");

  bands = {{0, 0.0, 10.0, 0.05}};
  JTickBandList list{1, &bands};
  host.Send(form, hm::PriceBands, ToLParam(&list));
  price->SetValue(0.01);
  form->StepPrice(-1);
  EXPECT_EQ(price->text(), "0.00") << "0, not a negative price";

  // An instrument whose table has no bands steps with table 0's.
  form->ChooseInstrument(instruments[4]);
  price->SetValue(1.00);
  form->StepPrice(+1);
  EXPECT_EQ(price->text(), "1.05");

  // No bands at all: the price stays.
  bands.clear();
  JTickBandList none{0, &bands};
  host.Send(form, hm::PriceBands, ToLParam(&none));
  price->SetValue(3.00);
  form->StepPrice(+1);
  form->StepPrice(-1);
  EXPECT_EQ(price->text(), "3.00");
  EXPECT_DOUBLE_EQ(form->LastStep(), 0.0);
}

TEST_F(NewAlertForm, Notice_FrameGrowsOnceAndShrinksOnceTheLastChannelIsCleared) {
  host.AnswerSetting(hm::SystemParameter, "ALEML", "1");
  host.AnswerSetting(hm::SystemParameter, "ALSMS", "1");
  CNewPriceAlertAdv* form = MakeForm();
  AskSetting(form, "ALEML");
  AskSetting(form, "ALSMS");
  host.Send(form, hm::Activate);
  EXPECT_TRUE(form->ChannelBox(CNewPriceAlertAdv::kEmailId)->isVisible());
  EXPECT_TRUE(form->ChannelBox(CNewPriceAlertAdv::kSmsId)->isVisible());
  Load(form, -1);
  auto sizes = FrameSizes(host);
  ASSERT_EQ(sizes.size(), 3u) << "a loaded form asks for its size";
  EXPECT_EQ(sizes[0].height, CNewPriceAlertAdv::kCompactHeight);
  EXPECT_FALSE(form->NoticeBox()->isVisible());

  host.ClearRequests();
  form->ToggleChannel(CNewPriceAlertAdv::kEmailId);
  form->ToggleChannel(CNewPriceAlertAdv::kSmsId);
  sizes = FrameSizes(host);
  ASSERT_EQ(sizes.size(), 3u) << "grows once";
  EXPECT_EQ(sizes[0].width, 470);
  EXPECT_EQ(sizes[0].height, 430);
  EXPECT_TRUE(form->NoticeShown());
  EXPECT_TRUE(form->NoticeBox()->isVisible());

  host.ClearRequests();
  form->ToggleChannel(CNewPriceAlertAdv::kEmailId);
  EXPECT_TRUE(FrameSizes(host).empty()) << "SMS still needs the notice";
  form->ToggleChannel(CNewPriceAlertAdv::kSmsId);
  sizes = FrameSizes(host);
  ASSERT_EQ(sizes.size(), 3u) << "shrinks once";
  EXPECT_EQ(sizes[0].height, 350);
  EXPECT_FALSE(form->NoticeBox()->isVisible());
  // The terminal channel has no effect on the frame.
  host.ClearRequests();
  form->ToggleChannel(CNewPriceAlertAdv::kAppId);
  EXPECT_FALSE(form->ViaApp());
  EXPECT_TRUE(FrameSizes(host).empty());
}

TEST_F(NewAlertForm, Settings_TheFirstFormAsksThemOnceAndFilesEachUnderItsKey) {
  host.AnswerSetting(hm::SystemParameter, "ALEML", "1");
  host.AnswerSetting(hm::SystemParameter, "MAXPA", "30");
  CNewPriceAlertAdv* form = MakeForm();
  std::vector<std::string> asked;
  for (const auto& f : host.RequestsOf(hm::SystemParameter)) asked.push_back(f.text);
  EXPECT_EQ(asked, (std::vector<std::string>{"ALEML", "ALSMS", "MAXPA"}));
  auto& cache = alerts::AlertSettingsCache::Instance();
  EXPECT_EQ(cache.Get("ALEML"), L"1");
  EXPECT_EQ(cache.Get("ALSMS"), L"") << "not answered";
  EXPECT_EQ(cache.Get("MAXPA"), L"30");
  EXPECT_TRUE(form->ChannelBox(CNewPriceAlertAdv::kEmailId)->isVisible());
  EXPECT_FALSE(form->ChannelBox(CNewPriceAlertAdv::kSmsId)->isVisible());
  QDate first, last;
  form->DateControl()->GetRange(first, last);
  EXPECT_EQ(last, kToday.addDays(30));
  EXPECT_EQ(form->DateControl()->GetTime(), last);
  host.ClearRequests();
  MakeForm();
  EXPECT_TRUE(host.RequestsOf(hm::SystemParameter).empty()) << "once per process";
}

TEST_F(NewAlertForm, Channels_EmailAndSmsShowOnlyForAnswersOfExactlyOne) {
  struct Case {
    const char* answer;
    bool shown;
  };
  for (const Case& c : {Case{"1", true}, Case{" 1", false}, Case{"true", false}}) {
    alerts::AlertSettingsCache::Instance().Clear();
    host.AnswerSetting(hm::SystemParameter, "ALEML", c.answer);
    CNewPriceAlertAdv* form = MakeForm();
    AskSetting(form, "ALEML");
    host.Send(form, hm::Activate);
    EXPECT_EQ(form->ChannelBox(CNewPriceAlertAdv::kEmailId)->isVisible(), c.shown) << c.answer;
    EXPECT_FALSE(form->ChannelBox(CNewPriceAlertAdv::kSmsId)->isVisible()) << "not answered: hidden";
    EXPECT_EQ(form->ChannelBox(CNewPriceAlertAdv::kEmailId)->GetWindowText(), L"E-mail");
    EXPECT_EQ(form->ChannelBox(CNewPriceAlertAdv::kAppId)->GetWindowText(), L"Brantic");
    host.Destroy(form);
  }
}

TEST_F(NewAlertForm, Validity_RangeFromMaxpaAnswers) {
  struct Case {
    const char* answer;  // null: not answered
    int days;
  };
  for (const Case& c : {Case{"0", 15}, Case{"abc", 15}, Case{nullptr, 15}, Case{"30", 30}}) {
    alerts::AlertSettingsCache::Instance().Clear();
    host.ClearAnswers();
    if (c.answer) host.AnswerSetting(hm::SystemParameter, "MAXPA", c.answer);
    CNewPriceAlertAdv* form = MakeForm();
    AskSetting(form, "MAXPA");
    Load(form, -1);
    QDate first, last;
    form->DateControl()->GetRange(first, last);
    EXPECT_EQ(first, kToday) << (c.answer ? c.answer : "missing");
    EXPECT_EQ(last, kToday.addDays(c.days)) << (c.answer ? c.answer : "missing");
    EXPECT_EQ(form->DateControl()->GetTime(), last) << "a new alert lasts as long as allowed";
    host.Destroy(form);
  }
}

TEST_F(NewAlertForm, Submit_RefusalsSendNothing) {
  CNewPriceAlertAdv* form = MakeForm();
  Load(form, -1);
  host.ClearRequests();
  form->SubmitAlert();
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, "Choose an instrument first.");
  EXPECT_EQ(host.dialogs.shown[0].caption, "Brantic");
  EXPECT_EQ(host.dialogs.shown[0].icon, platform::Icon::Exclamation);
  EXPECT_TRUE(host.Requests().empty());

  // An exchange missing from "EXCPA": the text of "17008", nothing sent.
  form->ChooseInstrument(instruments[2]);
  form->PriceEdit()->SetValue(55.0);
  host.ClearRequests();
  form->SubmitAlert();
  ASSERT_EQ(host.dialogs.shown.size(), 2u);
  EXPECT_EQ(host.dialogs.shown[1].text, "No price alerts on this exchange.");
  EXPECT_TRUE(host.RequestsOf(hm::Alert702).empty());
  EXPECT_TRUE(host.RequestsOf(hm::AlertSubmitted).empty());
  ASSERT_EQ(host.RequestsOf(hm::SystemParameter).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::SystemParameter)[0].text, "EXCPA");

  // "EXCPA" not answered at all: refused too.
  host.ClearAnswers();
  host.AnswerText("17008, 0", L"No price alerts on this exchange.");
  form->ChooseInstrument(instruments[0]);
  host.ClearRequests();
  form->SubmitAlert();
  EXPECT_TRUE(host.RequestsOf(hm::Alert702).empty());
  EXPECT_EQ(host.dialogs.shown.size(), 3u);
}

TEST_F(NewAlertForm, Submit_SendsTheRecordThen202AndKeepsTheForm) {
  CNewPriceAlertAdv* form = MakeForm();
  Load(form, -1);
  form->ChooseInstrument(instruments[0]);
  form->FieldList()->setCurrentIndex(1);
  form->ComparatorList()->setCurrentIndex(0);
  form->TriggerList()->setCurrentIndex(1);
  form->DateControl()->SetTime(kToday.addDays(3));
  form->PriceEdit()->setText("9.87");
  form->ToggleChannel(CNewPriceAlertAdv::kEmailId);
  host.ClearRequests();
  Click(form->SubmitButton(), form->SubmitButton()->rect().center());

  const auto created = Sent<PriceAlertItem>(hm::Alert702);
  ASSERT_EQ(created.size(), 1u);
  const PriceAlertItem& a = created[0];
  EXPECT_EQ(a.alertId, -1);
  EXPECT_EQ(a.productId, 1);
  EXPECT_EQ(a.exchangeCode, "SGX");
  EXPECT_EQ(a.instrumentCode, "D05");
  EXPECT_FALSE(a.triggerOnce);
  EXPECT_EQ(a.validUntil, "2027-01-13");
  EXPECT_EQ(a.priceField, "BID");
  EXPECT_EQ(a.comparator, "<=");
  EXPECT_DOUBLE_EQ(a.triggerValue, 9.87);
  EXPECT_TRUE(a.viaApp);
  EXPECT_TRUE(a.viaEmail);
  EXPECT_FALSE(a.viaSms);
  EXPECT_EQ(a.status, "Active");
  EXPECT_TRUE(a.hostTextA.empty());
  const auto messages = host.Messages();
  ASSERT_GE(messages.size(), 2u);
  EXPECT_EQ(messages.back(), hm::AlertSubmitted);
  EXPECT_EQ(messages[messages.size() - 2], hm::Alert702);
  // The form keeps what it holds.
  EXPECT_EQ(form->PriceEdit()->text(), "9.87");
  EXPECT_EQ(form->CurrentInstrument()->instrumentCode, "D05");
}

TEST_F(NewAlertForm, Modify_StoredLastIsEditedAsLastDoneAndWrittenBackAsLdone) {
  PriceAlertItem stored = Alert(42, instruments[0]);
  stored.priceField = "LAST";
  stored.comparator = "<=";
  stored.triggerOnce = false;
  stored.viaSms = true;
  stored.triggerValue = 9.5;
  stored.validUntil = "2027-01-12";
  alerts::Store().Fill(std::vector<PriceAlertItem>{stored});
  CNewPriceAlertAdv* form = MakeForm();
  host.ClearRequests();
  Load(form, 42, 1, "D05");
  EXPECT_EQ(form->EditingId(), 42);
  EXPECT_EQ(form->FieldList()->currentIndex(), 2);
  EXPECT_EQ(form->FieldList()->currentText(), "Last Done");
  EXPECT_EQ(form->ComparatorList()->currentIndex(), 0);
  EXPECT_EQ(form->TriggerList()->currentIndex(), 1);
  EXPECT_EQ(form->PriceEdit()->text(), "9.50");
  EXPECT_EQ(form->DateControl()->GetTime(), QDate(2027, 1, 12));
  EXPECT_TRUE(form->ViaSms());
  EXPECT_TRUE(form->NoticeShown());
  ASSERT_FALSE(host.RequestsOf(hm::Title).empty());
  EXPECT_EQ(host.RequestsOf(hm::Title).back().wtext, L"Change Alert");
  const auto info = Sent<JPriceInfoRequest>(hm::AlertBoardRequest);
  ASSERT_FALSE(info.empty());
  EXPECT_DOUBLE_EQ(info.back().referencePrice, 10.0);

  host.ClearRequests();
  form->SubmitAlert();
  const auto changed = Sent<PriceAlertItem>(hm::Alert703);
  ASSERT_EQ(changed.size(), 1u);
  EXPECT_EQ(changed[0].alertId, 42);
  EXPECT_EQ(changed[0].priceField, "LDONE");
  EXPECT_TRUE(host.RequestsOf(hm::Alert702).empty());

  // An unknown id leaves the form as it was; the title still follows the form.
  Load(form, 77);
  EXPECT_EQ(form->EditingId(), 42);
  // Reset to a new alert.
  Load(form, -1);
  EXPECT_EQ(form->EditingId(), -1);
  EXPECT_EQ(form->CurrentInstrument(), nullptr);
  EXPECT_EQ(form->FieldList()->currentIndex(), 0);
  EXPECT_TRUE(form->PriceEdit()->text().isEmpty());
  EXPECT_TRUE(form->ViaApp());
  EXPECT_FALSE(form->ViaSms());
  EXPECT_EQ(host.RequestsOf(hm::Title).back().wtext, L"New Alert");
}

TEST_F(NewAlertForm, Instrument_ANotViewableChoiceKeepsTheCurrentInstrument) {
  CNewPriceAlertAdv* form = MakeForm();
  form->ChooseInstrument(instruments[0]);
  form->ChooseInstrument(instruments[1]);
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, "Counter is not Viewable.");
  EXPECT_EQ(form->CurrentInstrument()->instrumentCode, "D05");
  EXPECT_TRUE(form->Combo()->IsPlaceholderShown());
  // Under the alternate status the same rule reads the other word.
  host.AnswerValue(hm::AltStatus, 1);
  form->ChooseInstrument(instruments[3]);
  EXPECT_EQ(form->CurrentInstrument()->instrumentCode, "O39");
  EXPECT_EQ(host.dialogs.shown.size(), 1u);
}

TEST_F(NewAlertForm, Instrument_AChoiceAsksPriceInformationAndTheQuotes) {
  CNewPriceAlertAdv* form = MakeForm();
  instruments[0].priceStepTableId = 4;
  host.ClearRequests();
  form->ChooseInstrument(instruments[0]);
  const auto info = Sent<JPriceInfoRequest>(hm::AlertBoardRequest);
  ASSERT_EQ(info.size(), 1u);
  EXPECT_EQ(info[0].priceStepTableId, 4);
  EXPECT_DOUBLE_EQ(info[0].referencePrice, 10.0);
  std::vector<std::string> sent;
  for (const auto& f : host.Requests())
    if (f.field) sent.push_back(std::to_string(f.message) + " " + f.field->fieldName);
  const std::vector<std::string> expected{
      "401 BID", "401 ASK", "401 OPEN", "401 LAST", "401 CHANGE", "401 PCHANGE", "401 PMP_Submit",
      "412 BID", "412 ASK", "412 OPEN", "412 LAST", "412 CLOSE", "412 CHANGE", "412 PCHANGE", "412 REMARKS",
      "400 BID,ASK,OPEN,LAST,CLOSE,CHANGE,PCHANGE,REMARKS",
      "412 BID", "412 ASK", "412 OPEN", "412 LAST", "412 CLOSE", "412 CHANGE", "412 PCHANGE", "412 REMARKS",
      "412 PMP_Submit"};
  EXPECT_EQ(sent, expected);
  // Asked once: the next tick has nothing left to subscribe.
  host.ClearRequests();
  host.Advance(200);
  for (const auto& f : host.Requests()) EXPECT_FALSE(f.field.has_value());

  // The answers reach the drawn panel through the quote store.
  FieldUpdate u{1, "D05", "BID", "9.95", 0, 0};
  host.SendField(form, hm::RequestField, u);
  QuoteRecord quote;
  ASSERT_TRUE(addon::QuoteFeed::Instance().Read(InstrumentKey{1, L"D05"}, quote));
  EXPECT_EQ(quote[QuoteLayout::Bid].text, L"9.95");
}

TEST_F(NewAlertForm, Language_ListsKeepTheirSelectionAndTheTitleFollowsTheForm) {
  CNewPriceAlertAdv* form = MakeForm();
  Load(form, -1);
  form->FieldList()->setCurrentIndex(2);
  form->ComparatorList()->setCurrentIndex(1);
  host.language.Set(13, 730, L"Last");
  host.language.Set(13, 727, L"Send");
  host.ClearRequests();
  form->ApplyLanguage();
  EXPECT_EQ(form->FieldList()->currentIndex(), 2);
  EXPECT_EQ(form->FieldList()->currentText(), "Last");
  EXPECT_EQ(form->ComparatorList()->currentText(), "at least");
  EXPECT_EQ(form->TriggerList()->currentText(), "Yes");
  EXPECT_EQ(form->SubmitButton()->GetWindowText(), L"Send");
  ASSERT_EQ(host.RequestsOf(hm::Title).size(), 1u);
  EXPECT_EQ(host.RequestsOf(hm::Title)[0].wtext, L"New Alert");
  EXPECT_EQ(form->FieldList()->maxVisibleItems(), 17);
}

TEST_F(NewAlertForm, Keyboard_TabWalksTheFormInOrder) {
  host.AnswerSetting(hm::SystemParameter, "ALEML", "1");
  CNewPriceAlertAdv* form = MakeForm();
  AskSetting(form, "ALEML");
  host.Send(form, hm::Activate);
  form->activateWindow();
  auto tab = [&](QWidget* from) {
    QKeyEvent key(QEvent::KeyPress, Qt::Key_Tab, Qt::NoModifier);
    return QApplication::sendEvent(from, &key);
  };
  form->PriceEdit()->setFocus();
  EXPECT_TRUE(tab(form->PriceEdit()));
  EXPECT_EQ(form->focusWidget(), form->DateControl());
  // From the date's own edit field the key still leaves the date.
  tab(form->DateControl()->findChild<QLineEdit*>());
  EXPECT_EQ(form->focusWidget(), form->TriggerList());
  // The hidden SMS box is skipped; from the submit button back to the instrument.
  form->ChannelBox(CNewPriceAlertAdv::kEmailId)->setFocus();
  tab(form->ChannelBox(CNewPriceAlertAdv::kEmailId));
  EXPECT_EQ(form->focusWidget(), form->SubmitButton());
  tab(form->SubmitButton());
  EXPECT_TRUE(form->focusWidget() == form->Combo() || form->Combo()->isAncestorOf(form->focusWidget()));
}

TEST_F(NewAlertForm, Messages_NullRecordsAndUnknownNumbersChangeNothing) {
  CNewPriceAlertAdv* form = MakeForm();
  form->ChooseInstrument(instruments[0]);
  host.ClearRequests();
  for (UINT message : {hm::Alert705, hm::AlertBoardRequest, hm::PriceBands, hm::SystemParameter, 4242u})
    EXPECT_EQ(host.Send(form, message, 0), 0u) << message;
  EXPECT_TRUE(host.Requests().empty());
  EXPECT_EQ(form->CurrentInstrument()->instrumentCode, "D05");
  EXPECT_EQ(form->TickBands().size(), bands.size());
}

}  // namespace
}  // namespace alerttest
