// What each view asks of the host when it first starts, through the library
// as the terminal loads it.
#include <gtest/gtest.h>

#include "mvtest/ScriptedHost.h"

namespace {

using mvtest::Feedback;

// "515 MAXWL"-style summaries of requests, for readable comparisons.
std::vector<std::string> Summary(const std::vector<Feedback>& requests) {
  std::vector<std::string> out;
  for (const auto& f : requests) {
    std::string s = std::to_string(f.message);
    if (!f.text.empty()) s += " " + f.text;
    if (f.size) s += " " + std::to_string(f.size->width) + "x" + std::to_string(f.size->height);
    if (f.message == hm::Title) s += " title";
    out.push_back(s);
  }
  return out;
}

TEST(PrepareBasicData_FirstActivation, PriceViewAsksItsParametersThenEveryMissingStore) {
  mvtest::ScriptedHost host;
  host.AnswerSetting(hm::SystemParameter, "MAXWL", "250");
  host.AnswerValue(hm::DisplayMode, 1);
  CSuperBaseView* view = host.Open("CPriceViewAdv");
  ASSERT_NE(view, nullptr);
  // Then the size, the display mode for the family buttons, the title, the
  // remark texts and the "MODSA" parameter.
  EXPECT_EQ(Summary(host.Requests()),
            (std::vector<std::string>{"515 ADVFT", "515 MAXWL", "515 MAXWT", "518 OLDWL", "518 WLNOT", "515 MKTEX",
                                      "505", "503", "500", "610", "522", "521", "102 300x150", "519", "101 title",
                                      "504", "515 MODSA"}));

  // Second activation, and a second price view: nothing is asked again.
  host.ClearRequests();
  host.Send(view, hm::Deactivate);
  host.Send(view, hm::Activate);
  host.Open("CPriceViewAdv");
  EXPECT_EQ(Summary(host.Requests()),
            (std::vector<std::string>{"102 300x150", "101 title", "504", "515 MODSA", "102 300x150", "101 title", "504",
                                      "515 MODSA"}));
}

TEST(PrepareBasicData_FirstActivation, EachClassHasItsOwnFirstTimeFlag) {
  mvtest::ScriptedHost host;
  host.AnswerValue(hm::DisplayMode, 1);
  host.Open("CMarketDepthAdv");
  EXPECT_EQ(Summary(host.Requests()), (std::vector<std::string>{"102 270x150", "505", "500", "519", "101 title"}));

  host.ClearRequests();
  host.Open("CMarketDepthAdv");
  EXPECT_EQ(Summary(host.Requests()), (std::vector<std::string>{"102 270x150", "101 title"}));  // 519 cached

  host.ClearRequests();
  host.Open("CTimeAndSalesAdv");
  host.Open("CTradeSummaryAdv");
  EXPECT_EQ(Summary(host.Requests()), (std::vector<std::string>{"102 270x150", "505", "500", "101 title",
                                                                "102 270x150", "505", "500", "101 title"}));

  host.ClearRequests();
  host.Open("CNewPriceAlertAdv");
  EXPECT_EQ(Summary(host.Requests()),
            (std::vector<std::string>{"515 ALEML", "515 ALSMS", "515 MAXPA", "505", "500", "2301", "101 title"}));

  host.ClearRequests();
  host.Open("CPriceAlertList");
  EXPECT_EQ(Summary(host.Requests()), (std::vector<std::string>{"102 370x250", "505", "500", "101 title", "701"}));
}

TEST(PrepareBasicData_FirstActivation, DeactivationAlsoPreparesData) {
  mvtest::ScriptedHost host;
  CSuperBaseView* view = host.Create("CTradeSummaryAdv");
  host.Send(view, hm::Deactivate);
  EXPECT_EQ(Summary(host.Requests()), (std::vector<std::string>{"505", "500"}));
}

TEST(PrepareBasicData_Logging, LogsStartAndEndUnderTheClassName) {
  mvtest::ScriptedHost host;
  host.Open("CMarketDepthAdv");
  ASSERT_EQ(host.logs.created, 1);
  const auto& lines = host.logs.lines;
  ASSERT_EQ(lines.size(), 2u);
  for (const auto& line : lines) {
    EXPECT_EQ(line.level, 3);
    EXPECT_EQ(line.text.rfind("Info:CMarketDepthAdv::PrepareBasicData file:MarketDepthAdv.cpp line:", 0), 0u)
        << line.text;
  }
  host.Open("CMarketDepthAdv");  // a second view of the class registers its own logger
  EXPECT_EQ(host.logs.created, 2);
  EXPECT_EQ(host.logs.lines.size(), 4u);
}

TEST(PrepareBasicData_Logging, WithoutALogFactoryNothingIsLoggedAndNothingBreaks) {
  mvtest::ScriptedHost host;
  CSuperBaseView* view = host.Create("CPriceAlertList");
  view->SetLog(nullptr);
  host.Send(view, hm::Activate);
  EXPECT_TRUE(host.logs.lines.empty());
  EXPECT_EQ(host.RequestsOf(hm::Title).size(), 1u);
}

TEST(ApplyLanguage_Title, SendsTheLanguageTitleOrTheBuiltInOne) {
  mvtest::ScriptedHost host;
  host.language.Set(13, 7, L"Depth");
  host.language.Set(13, 9, L"Alerts");
  host.language.Set(13, 725, L"New alert");
  const std::pair<const char*, std::wstring> expected[] = {
      {"CMarketDepthAdv", L"Depth"},         {"CPriceAlertList", L"Alerts"},
      {"CNewPriceAlertAdv", L"New alert"},   {"CTimeAndSalesAdv", L"Time and Sales"},
      {"CTradeSummaryAdv", L"Trade Summary"}, {"CPriceViewAdv", L"Price View"}};
  for (const auto& [name, title] : expected) {
    CSuperBaseView* view = host.Create(name);
    host.ClearRequests();
    view->ApplyLanguage();
    const auto titles = host.RequestsOf(hm::Title);
    ASSERT_EQ(titles.size(), 1u) << name;
    EXPECT_EQ(titles[0].wtext, title) << name;
    EXPECT_EQ(view->GetTitle(), title) << name;
  }
}

TEST(HostMessages_Common, LinkModeIsEchoedByEveryView) {
  mvtest::ScriptedHost host;
  for (const char* name : {"CPriceViewAdv", "CMarketDepthAdv", "CNewPriceAlertAdv"}) {
    CSuperBaseView* view = host.Create(name);
    host.ClearRequests();
    host.Send(view, hm::LinkModeFlag, 1);
    host.Send(view, hm::LinkModeFlag, 5);
    EXPECT_EQ(Summary(host.Requests()), (std::vector<std::string>{"528"})) << name;
    EXPECT_EQ(host.Requests()[0].value, 1);
  }
}

TEST(HostMessages_Mend, NullDataAndUnknownNumbersNeverCrashAnyView) {
  mvtest::ScriptedHost host;
  const char* names[] = {"CPriceViewAdv",   "CMarketDepthAdv", "CTimeAndSalesAdv",
                         "CTradeSummaryAdv", "CPriceAlertList", "CNewPriceAlertAdv"};
  for (const char* name : names) {
    CSuperBaseView* view = host.Open(name);
    ASSERT_NE(view, nullptr);
    host.ClearRequests();
    for (UINT message : {hm::LinkData, hm::FieldValue, hm::RequestField, hm::InstrumentList, hm::ExchangeList,
                         hm::ProductList, hm::TextByKey, hm::SystemParameter, hm::NoticeParameter,
                         hm::WatchlistGroups520, hm::WatchlistGroups521, hm::WatchlistRows522, hm::MarketInfo,
                         hm::WatchlistList, hm::LinkedInstrument, hm::PriceBands, hm::MessageText,
                         hm::FindByChartCode, hm::FindByCode, 0u, 3u, 77u, 9999u, 0xFFFFFFFFu})
      EXPECT_EQ(host.Send(view, message, 0), 0u) << name << " " << message;
    EXPECT_TRUE(host.Requests().empty()) << name;
  }
  // A 310 whose link text is malformed or missing is ignored too.
  CSuperBaseView* depth = host.Create("CMarketDepthAdv");
  host.ClearRequests();
  host.SendLink(depth, L"{\"data\":[");
  ViewLink noText;
  host.Send(depth, hm::LinkData, ToLParam(&noText));
  EXPECT_TRUE(host.Requests().empty());
}

}  // namespace
