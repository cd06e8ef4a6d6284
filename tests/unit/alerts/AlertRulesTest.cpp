// The rules both alert views share: codes, settings, texts, filter and price steps.
#include <gtest/gtest.h>

#include "addon/TextTables.h"
#include "views/alerts/AlertRules.h"

namespace {

struct Rules : ::testing::Test {
  void SetUp() override {
    alerts::AlertSettingsCache::Instance().Clear();
    addon::LanguageTextTable::Instance().Clear();
    alerts::SetTodayForTests([] { return QDate(2027, 2, 20); });
  }
  void TearDown() override { alerts::SetTodayForTests(nullptr); }
  static void Answer(const char* key, const wchar_t* value) { alerts::AlertSettingsCache::Instance().Set(key, value); }
};

TEST_F(Rules, CodeTables_UnknownStoredValuesReadAsLastDoneAndAtLeast) {
  EXPECT_EQ(alerts::FieldIndex("ASK"), 0);
  EXPECT_EQ(alerts::FieldIndex("BID"), 1);
  EXPECT_EQ(alerts::FieldIndex("LDONE"), 2);
  EXPECT_EQ(alerts::FieldIndex("LAST"), 2);
  EXPECT_EQ(alerts::FieldIndex("ask"), 2) << "exact, case-sensitive";
  EXPECT_STREQ(alerts::FieldCode(alerts::FieldIndex("LAST")), "LDONE");
  EXPECT_STREQ(alerts::FieldCode(0), "ASK");
  EXPECT_STREQ(alerts::FieldCode(1), "BID");
  EXPECT_EQ(alerts::ComparatorIndex("<="), 0);
  EXPECT_EQ(alerts::ComparatorIndex("=<"), 1);
  EXPECT_EQ(alerts::ComparatorIndex(""), 1);
  EXPECT_STREQ(alerts::ComparatorCode(0), "<=");
  EXPECT_STREQ(alerts::ComparatorCode(1), ">=");
  EXPECT_EQ(alerts::TriggerOnceIndex(true), 0);
  EXPECT_FALSE(alerts::TriggerOnceOf(1));
}

TEST_F(Rules, SettingsCache_AnEmptyAnswerKeepsWhatWasThere) {
  auto& cache = alerts::AlertSettingsCache::Instance();
  EXPECT_EQ(cache.Get("MAXPA"), L"");
  cache.Set("MAXPA", L"20");
  cache.Set("MAXPA", L"");
  EXPECT_EQ(cache.Get("MAXPA"), L"20");
  cache.Set("MAXPA", L"25");
  EXPECT_EQ(cache.Get("MAXPA"), L"25");
}

TEST_F(Rules, Validity_MaxpaZeroTextOrMissingGivesFifteenDays) {
  EXPECT_EQ(alerts::MaxValidityDays(), 15);  // missing
  for (const wchar_t* bad : {L"0", L"abc", L"-5", L"12x", L"1 5"}) {
    alerts::AlertSettingsCache::Instance().Clear();
    Answer("MAXPA", bad);
    EXPECT_EQ(alerts::MaxValidityDays(), 15) << QString::fromWCharArray(bad).toStdString();
  }
  Answer("MAXPA", L" 30 ");
  const alerts::DateRange range = alerts::ValidityRange();
  EXPECT_EQ(range.first, QDate(2027, 2, 20));
  EXPECT_EQ(range.last, QDate(2027, 3, 22));
}

TEST_F(Rules, Channels_OfferedOnlyForExactlyOne) {
  EXPECT_FALSE(alerts::ChannelOffered("ALEML"));
  for (const wchar_t* no : {L" 1", L"true", L"11", L"1 "}) {
    alerts::AlertSettingsCache::Instance().Clear();
    Answer("ALEML", no);
    EXPECT_FALSE(alerts::ChannelOffered("ALEML")) << QString::fromWCharArray(no).toStdString();
  }
  Answer("ALEML", L"1");
  EXPECT_TRUE(alerts::ChannelOffered("ALEML"));
  EXPECT_FALSE(alerts::ChannelOffered("ALSMS")) << "each channel has its own key";
}

TEST_F(Rules, Exchanges_ASubstringOfTheAnswerPermits) {
  EXPECT_TRUE(alerts::ExchangePermitted("SGX", L"SGX,NYSE"));
  EXPECT_TRUE(alerts::ExchangePermitted("NYSE", L"SGX;NYSE"));
  EXPECT_FALSE(alerts::ExchangePermitted("HKEX", L"SGX,NYSE"));
  EXPECT_FALSE(alerts::ExchangePermitted("SGX", L""));
  EXPECT_FALSE(alerts::ExchangePermitted("", L"SGX,NYSE")) << "an instrument without an exchange is never permitted";
}

TEST_F(Rules, Texts_ConditionAlertViaAndValidity) {
  auto& texts = addon::LanguageTextTable::Instance();
  texts.Set(728, L"Ask");
  texts.Set(729, L"Bid");
  texts.Set(730, L"Last Done");
  texts.Set(723, L"E-mail");
  texts.Set(724, L"SMS");
  PriceAlertItem a;
  a.priceField = "LAST";
  a.comparator = "<=";
  a.triggerValue = 10.126;
  EXPECT_EQ(alerts::ConditionText(a, 2), L"Last Done <= 10.13");
  EXPECT_EQ(alerts::ConditionText(a, -1), L"Last Done <= 10.126") << "%.3f without decimals";
  a.priceField = "BID";
  a.comparator = "?";  // shown as stored
  EXPECT_EQ(alerts::ConditionText(a, 0), L"Bid ? 10");

  a.viaApp = a.viaEmail = a.viaSms = true;
  EXPECT_EQ(alerts::AlertViaText(a, L"Brantic"), L"Brantic, E-mail, SMS");
  a.viaApp = false;
  EXPECT_EQ(alerts::AlertViaText(a, L"Brantic"), L"E-mail, SMS");
  a.viaEmail = a.viaSms = false;
  EXPECT_EQ(alerts::AlertViaText(a, L"Brantic"), L"");

  EXPECT_EQ(alerts::ValidityText("2027-01-05"), L"05 Jan 2027");
  EXPECT_EQ(alerts::ValidityText("2026-12-31"), L"31 Dec 2026");
  EXPECT_EQ(alerts::ValidityText("someday"), L"someday") << "shown as stored when it is not a date";
  EXPECT_EQ(alerts::DayText(QDate(2027, 3, 9)), "2027-03-09");
  EXPECT_FALSE(alerts::ParseDay("2027-02-30").isValid());
}

TEST_F(Rules, Filter_OptionsPickTheirStatusAndOtherStatusesNeverShow) {
  struct Case {
    const char* status;
    bool shown[4];
  };
  for (const Case& c : {Case{"Active", {true, false, true, false}}, Case{"Triggered", {true, true, false, false}},
                        Case{"Expired", {true, false, false, true}}, Case{"active", {false, false, false, false}},
                        Case{"", {false, false, false, false}}})
    for (int option = 0; option < 4; ++option)
      EXPECT_EQ(alerts::PassesFilter(c.status, option), c.shown[option]) << c.status << " option " << option;
}

TEST_F(Rules, PriceSteps_UpFromTheBandAboveDownFromTheBandBelow) {
  const std::vector<TickBand> bands{{0, 0.0, 10.0, 0.01}, {0, 10.0, 50.0, 0.05}, {3, 0.0, 100.0, 0.5}};
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 0, 10.0, true), 0.05);
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 0, 10.0, false), 0.01);
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 0, 10.0 + 1e-9, false), 0.01) << "equality within 1e-6";
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 0, 25.0, false), 0.05);
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 3, 10.0, true), 0.5) << "the instrument's own table first";
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 9, 10.0, true), 0.05) << "a table without bands falls back to table 0";
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 3, 200.0, true), 0.0) << "table 0 has nothing there either";
  EXPECT_DOUBLE_EQ(alerts::PriceStep(bands, 0, 0.0, false), 0.0) << "nothing below zero";
  EXPECT_DOUBLE_EQ(alerts::PriceStep({}, 0, 10.0, true), 0.0);
}

}  // namespace
