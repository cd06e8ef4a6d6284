// The shared view behaviour, on a view built in the test and hosted by the
// scripted host.
#include <gtest/gtest.h>

#include <algorithm>

#include "addon/AddonView.h"
#include "addon/Logging.h"
#include "data/MarketDelayCache.h"
#include "data/ReferenceStores.h"
#include "hostview/HostLists.h"
#include "addon/RegisteredMessages.h"
#include "addon/TextTables.h"
#include "mvtest/ProcessStateReset.h"
#include "mvtest/ScriptedHost.h"

namespace {

class CTestView : public CAddonView {
 public:
  CTestView() : CAddonView(Info()) {}
  static const addon::ViewClassInfo& Info() {
    static const addon::ViewClassInfo info{
        "CTestView", 5, L"Test", {{hm::SystemParameter, "MAXWL"}, {hm::NoticeParameter, "WLNOT"}},
        {addon::RefStore::Products, addon::RefStore::UserWatchlists}};
    return info;
  }
  // Activation as a view writes it: the log names this file and this line.
  static inline int activateLine = 0;
  void OnActivate() override {
    activateLine = __LINE__ + 1;
    PrepareBasicData();
    SetActiveFlag(true);
  }
  std::uint32_t OnViewMessage(UINT message, LPARAM data) override {
    seen.push_back(message);
    return 0;
  }
  std::vector<UINT> seen;
};

struct AddonViewTest : ::testing::Test {
  void SetUp() override { CAddonView::ResetProcessState(); }
  mvtest::ScriptedHost host;
  CTestView* Make() { return static_cast<CTestView*>(host.Adopt(new CTestView)); }
};

TEST_F(AddonViewTest, MessageTextLookup_CachesPerKeyAndFallsBackToTheKey) {
  host.AnswerText("17001, 5", L"Exchange closed");
  host.AnswerText("17001, 6", L"Other exchange", hm::TextByKey);  // either number may answer
  CTestView* view = Make();

  EXPECT_EQ(view->LookupMessageText("17001", 5), L"Exchange closed");
  EXPECT_EQ(view->LookupMessageText("17001", 6), L"Other exchange");
  EXPECT_EQ(view->LookupMessageText("17001", 5), L"Exchange closed");  // served from the cache
  auto asked = host.RequestsOf(hm::MessageText);
  ASSERT_EQ(asked.size(), 2u);
  EXPECT_EQ(asked[0].text, "17001, 5");
  EXPECT_EQ(asked[1].text, "17001, 6");

  // No text: the key itself, and not cached (the host is asked again).
  EXPECT_EQ(view->LookupMessageText("11007"), L"11007, 0");
  host.AnswerMissingTextsEmpty(true);
  EXPECT_EQ(view->LookupMessageText("11007"), L"11007, 0");
  host.AnswerText("11007, 0", L"Quantity is zero");
  EXPECT_EQ(view->LookupMessageText("11007"), L"Quantity is zero");
  EXPECT_EQ(host.RequestsOf(hm::MessageText).size(), 5u);

  // The cache is per view.
  CTestView* other = Make();
  EXPECT_EQ(other->LookupMessageText("17001", 5), L"Exchange closed");
  EXPECT_EQ(host.RequestsOf(hm::MessageText).size(), 6u);
}

TEST_F(AddonViewTest, MessageBox_CaptionedWithAppTitleAndExclamation) {
  host.appTitle = L"My Terminal";
  host.AnswerText("17007, 0", L"Cannot trade");
  CTestView* view = Make();
  view->ShowMessageText("17007");
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].caption, QString("My Terminal"));
  EXPECT_EQ(host.dialogs.shown[0].text, QString("Cannot trade"));
  EXPECT_EQ(host.dialogs.shown[0].icon, platform::Icon::Exclamation);
}

TEST_F(AddonViewTest, LinkMode_StoresAndEchoesOnlyZeroOrOne) {
  CTestView* view = Make();
  host.Send(view, hm::LinkModeFlag, 1);
  EXPECT_TRUE(view->LinkMode());
  host.Send(view, hm::LinkModeFlag, 2);
  host.Send(view, hm::LinkModeFlag, -1);
  EXPECT_TRUE(view->LinkMode());
  host.Send(view, hm::LinkModeFlag, 0);
  EXPECT_FALSE(view->LinkMode());
  const auto echoes = host.RequestsOf(hm::LinkModeFlag);
  ASSERT_EQ(echoes.size(), 2u);
  EXPECT_EQ(echoes[0].value, 1);
  EXPECT_EQ(echoes[1].value, 0);
}

TEST_F(AddonViewTest, AltStatus_OneOrTwoSetsAnythingElseClears) {
  CTestView* view = Make();
  host.Send(view, hm::AltStatus, 2);
  EXPECT_TRUE(view->UsesAltStatus());
  host.Send(view, hm::AltStatus, 3);
  EXPECT_FALSE(view->UsesAltStatus());
  host.Send(view, hm::AltStatus, 1);
  EXPECT_TRUE(view->UsesAltStatus());
  host.Send(view, hm::AltStatus, 0);
  EXPECT_FALSE(view->UsesAltStatus());

  host.AnswerValue(hm::AltStatus, 2);
  EXPECT_TRUE(view->QueryAltStatus());
  host.AnswerValue(hm::AltStatus, 7);
  EXPECT_FALSE(view->QueryAltStatus());
  EXPECT_EQ(host.RequestsOf(hm::AltStatus).size(), 2u);
  EXPECT_TRUE(host.RequestsOf(hm::LinkModeFlag).empty());  // answers send nothing
}

TEST_F(AddonViewTest, DisplayMode_AskedUntilAValidAnswerThenOncePerProcess) {
  CTestView* first = Make();
  host.AnswerValue(hm::DisplayMode, 7);  // not a display mode: ignored
  EXPECT_EQ(first->QueryDisplayMode(), 0);
  host.AnswerValue(hm::DisplayMode, 101);
  EXPECT_EQ(first->QueryDisplayMode(), 101);
  EXPECT_EQ(first->QueryDisplayMode(), 101);
  CTestView* second = Make();
  EXPECT_EQ(second->QueryDisplayMode(), 101);
  const auto asked = host.RequestsOf(hm::DisplayMode);
  ASSERT_EQ(asked.size(), 2u);
  EXPECT_EQ(asked[0].value, 1);
}

TEST_F(AddonViewTest, PrepareBasicData_FirstTimePerClassAsksSettingsThenMissingStores) {
  host.AnswerSetting(hm::SystemParameter, "MAXWL", "300");
  host.AnswerSetting(hm::NoticeParameter, "WLNOT", "NYSE,Not allowed");
  CTestView* view = Make();
  host.Send(view, hm::Activate);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::SystemParameter, hm::NoticeParameter, hm::ProductList,
                                                hm::WatchlistList}));
  EXPECT_EQ(host.Requests()[0].text, "MAXWL");
  EXPECT_EQ(host.Requests()[1].text, "WLNOT");
  EXPECT_EQ(host.Requests()[2].value, 0);
  EXPECT_EQ(addon::SettingTextTable::Instance().MaxWatchlistItems(), 300);
  EXPECT_EQ(addon::SettingTextTable::Instance().Get("WLNOT"), L"NYSE,Not allowed");
  EXPECT_TRUE(view->IsActive());

  host.ClearRequests();
  host.Send(view, hm::Deactivate);
  host.Send(Make(), hm::Activate);
  EXPECT_TRUE(host.Requests().empty());  // later runs of the class ask nothing

  // Logged at the start and the end, under the class name, with the file and
  // line of the view's own call.
  const auto lines = host.logs.Texts();
  ASSERT_GE(lines.size(), 2u);
  const std::string expected =
      "Info:CTestView::PrepareBasicData file:AddonViewTest.cpp line:" + std::to_string(CTestView::activateLine);
  EXPECT_EQ(lines[0], expected);
  EXPECT_EQ(lines[1], expected);
  EXPECT_EQ(host.logs.lines[0].level, 3);
}

TEST_F(AddonViewTest, SettingAnswers_WithoutAPendingRequestAreNotFiled) {
  CTestView* view = Make();
  host.SendNarrow(view, hm::SystemParameter, "123");
  EXPECT_FALSE(addon::SettingTextTable::Instance().Has(""));
  EXPECT_FALSE(view->RequestSetting(hm::SystemParameter, "MAXWT"));  // host silent
  host.AnswerSetting(hm::SystemParameter, "MAXWT", "9");
  EXPECT_TRUE(view->RequestSetting(hm::SystemParameter, "MAXWT"));
  EXPECT_EQ(addon::SettingTextTable::Instance().MaxWatchlists(), 9);
}

TEST_F(AddonViewTest, Title_FromLanguageEntryElseDefault) {
  CTestView* view = Make();
  view->ApplyLanguage();
  host.language.Set(13, 5, L"Tested");
  view->ApplyLanguage();
  const auto titles = host.RequestsOf(hm::Title);
  ASSERT_EQ(titles.size(), 2u);
  EXPECT_EQ(titles[0].wtext, L"Test");
  EXPECT_EQ(titles[1].wtext, L"Tested");
  EXPECT_EQ(view->GetTitle(), L"Tested");
}

TEST_F(AddonViewTest, Mend_NullPointersAndUnknownNumbersChangeNothing) {
  CTestView* view = Make();
  host.Send(view, hm::LinkModeFlag, 1);
  host.ClearRequests();
  for (UINT message : {hm::LinkData, hm::FieldValue, hm::RequestField, hm::InstrumentList, hm::ExchangeList,
                       hm::ProductList, hm::TextByKey, hm::SystemParameter, hm::NoticeParameter, hm::MessageText,
                       hm::LinkedInstrument, hm::MarketInfo, hm::PriceBands})
    EXPECT_EQ(host.Send(view, message, 0), 0u) << message;
  EXPECT_TRUE(view->seen.empty());  // dropped before the view's own handler
  for (UINT message : {0u, 3u, 9999u, 0xFFFFFFFFu}) host.Send(view, message, 0);
  EXPECT_EQ(view->seen, (std::vector<UINT>{0u, 3u, 9999u, 0xFFFFFFFFu}));
  EXPECT_TRUE(host.Requests().empty());
  EXPECT_TRUE(view->LinkMode());
  EXPECT_TRUE(view->LastMessageText().empty());
}

TEST_F(AddonViewTest, Ask_ReturnsTheAnswerDeliveredInsideTheRequestOrNone) {
  CTestView* view = Make();
  // No answer.
  EXPECT_FALSE(view->Ask<LPARAM>(hm::ExchangeEnabled, 0));
  // A number, taken by the question only: the view's own handler never sees it.
  host.AnswerValue(hm::ExchangeEnabled, 0);
  EXPECT_EQ(view->Ask<LPARAM>(hm::ExchangeEnabled, 0), std::optional<LPARAM>(0));
  EXPECT_TRUE(view->seen.empty());
  // A record, copied; a null word is no answer ("no such instrument").
  JInstrumentUnderlying found;
  found.instrumentCode = "D05";
  const JInstrumentUnderlying* answer = &found;
  host.AnswerWith(hm::FindByCode, [&](const mvtest::Feedback&) { return std::optional<LPARAM>(ToLParam(answer)); });
  const auto record = view->Ask<JInstrumentUnderlying>(hm::FindByCode, 0);
  ASSERT_TRUE(record);
  EXPECT_EQ(record->instrumentCode, "D05");
  answer = nullptr;
  EXPECT_FALSE(view->Ask<JInstrumentUnderlying>(hm::FindByCode, 0));
  // Another number that answers, the last of several answers counts.
  host.AnswerWith(hm::DisplayMode, [&](const mvtest::Feedback& f) {
    f.view->OnHostMessage(hm::AltStatus, 1);
    return std::optional<LPARAM>(2);
  });
  EXPECT_EQ(view->Ask<LPARAM>(hm::DisplayMode, 1, {hm::AltStatus, hm::DisplayMode}), std::optional<LPARAM>(2));
  EXPECT_EQ(view->DisplayModeValue(), 0);  // taken by the question, not filed
  EXPECT_TRUE(view->seen.empty());
}

TEST_F(AddonViewTest, Ask_NestedQuestionsEachTakeTheirOwnAnswer) {
  CTestView* view = Make();
  host.AnswerValue(hm::AltStatus, 2);
  std::optional<LPARAM> inner;
  host.AnswerWith(hm::ExchangeEnabled, [&](const mvtest::Feedback&) {
    inner = view->Ask<LPARAM>(hm::AltStatus, 0);  // asked while the outer one waits
    return std::optional<LPARAM>(1);
  });
  EXPECT_EQ(view->Ask<LPARAM>(hm::ExchangeEnabled, 0), std::optional<LPARAM>(1));
  EXPECT_EQ(inner, std::optional<LPARAM>(2));
  // Outside any question the same answer is a notification again.
  host.Send(view, hm::AltStatus, 2);
  EXPECT_TRUE(view->UsesAltStatus());
}

TEST_F(AddonViewTest, Lists_EveryViewFilesExchangesAndMarketDelays) {
  CTestView* view = Make();
  std::vector<JExchangeList> exchanges(2);
  exchanges[0].exchangeCode = "SGX";
  exchanges[0].exchangeName = "Singapore";
  exchanges[1].exchangeCode = "HKEX";
  JExchangeListMsg list{2, 0, &exchanges};
  host.Send(view, hm::ExchangeList, ToLParam(&list));
  ASSERT_NE(ExchangeMgr().FindPtr("SGX"), nullptr);
  EXPECT_EQ(ExchangeMgr().FindPtr("SGX")->exchangeName, "Singapore");
  EXPECT_TRUE(addon::IsStoreLoaded(addon::RefStore::Exchanges));

  std::vector<JMarketInfo> info(2);
  info[0].productId = 1;
  info[0].exchangeCode = "SGX";
  info[0].delay = 15;
  info[1].productId = 1;
  info[1].exchangeCode = "HKEX";
  info[1].delay = 30;
  host.Send(view, hm::MarketInfo, ToLParam(&info));
  EXPECT_EQ(MarketDelayCache::Instance().Lookup(1, L"SGX"), L"15");
  std::wstring text;
  EXPECT_FALSE(MarketDelayCache::Instance().Find(1, L"HKEX", text));  // only the row asked for
  const std::vector<JMarketInfo> none;
  host.Send(view, hm::MarketInfo, ToLParam(&none));  // an unknown exchange: nothing
  // The view still hears of both.
  EXPECT_EQ(view->seen, (std::vector<UINT>{hm::ExchangeList, hm::MarketInfo, hm::MarketInfo}));
  MarketDelayCache::Instance().Clear();
}

TEST_F(AddonViewTest, PrepareBasicData_ClassWithoutANameLogsUnderTheUnknownName) {
  static const addon::ViewClassInfo unnamed{.className = nullptr};
  struct CUnnamedView : CAddonView {
    CUnnamedView() : CAddonView(unnamed) {}
  };
  auto* view = static_cast<CUnnamedView*>(host.Adopt(new CUnnamedView));
  host.Send(view, hm::Activate);
  EXPECT_TRUE(view->IsActive());
  ASSERT_EQ(host.logs.Texts().size(), 2u);
  EXPECT_EQ(host.logs.Texts()[0].rfind("Info:::PrepareBasicData file:AddonView.cpp line:", 0), 0u)
      << host.logs.Texts()[0];
  EXPECT_NE(addon::FindLogger(L"PriceViewUnknow"), nullptr);
}

}  // namespace

namespace {

// A view that counts its timer ticks and window messages.
class CTickingView : public CTestView {
 public:
  void OnTimer(UINT id) override { ticks.push_back(id); }
  LRESULT OnWindowMessage(UINT message, WPARAM, LPARAM lParam) override {
    messages.push_back(message);
    return lParam;
  }
  std::vector<UINT> ticks;
  std::vector<UINT> messages;
};

TEST(ScriptedHost_Clock, AdvancingFiresDueTimersAndDeliversPosts) {
  mvtest::ScriptedHost host;
  auto* view = static_cast<CTickingView*>(host.Adopt(new CTickingView));
  platform::SetTimer(view, 3001, 200);
  platform::SetTimer(view, 3003, 1000);
  host.Advance(199);
  EXPECT_TRUE(view->ticks.empty());
  host.Advance(1);
  EXPECT_EQ(view->ticks, (std::vector<UINT>{3001}));
  host.Advance(800);
  EXPECT_EQ(std::count(view->ticks.begin(), view->ticks.end(), 3001u), 5);
  EXPECT_EQ(std::count(view->ticks.begin(), view->ticks.end(), 3003u), 1);

  const UINT trade = addon::Msg().wlOpenTrade;
  EXPECT_EQ(platform::SendMessage(view, trade, 0, 5), 5);
  platform::PostMessage(view, trade, 0, -1);
  EXPECT_EQ(view->messages.size(), 1u);
  host.Advance(0);
  EXPECT_EQ(view->messages, (std::vector<UINT>{trade, trade}));
  host.Destroy(view);  // timers die with the window
  host.Advance(1000);
}

}  // namespace
