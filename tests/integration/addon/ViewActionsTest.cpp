// The instrument actions every view shares, as the terminal sees them through
// the library: the price view's trade tickets and "open view" requests, and
// the log line a view writes from its own source file.
#include <gtest/gtest.h>

#include "hostview/Records.h"
#include "mvtest/ScriptedHost.h"

namespace {

LRESULT Post(CSuperBaseView* view, const char* name, const std::wstring* text, LPARAM lParam) {
  return platform::SendMessage(view, platform::RegisterWindowMessage(name), WPARAM(ToLParam(text)), lParam);
}

const std::wstring kTicket =
    L"{\"type\":\"price view\",\"data\":[{\"Field_instrument_code\":\"D05\",\"Field_product_id\":\"1\"}]}";

struct PriceViewActions : ::testing::Test {
  mvtest::ScriptedHost host;
  CSuperBaseView* view = nullptr;
  void SetUp() override {
    view = host.Open("CPriceViewAdv");
    ASSERT_NE(view, nullptr);
    host.ClearRequests();
  }
};

TEST_F(PriceViewActions, TradeTicket_RefusedOriginShowsTheLookedUpTextAndOpensNothing) {
  host.AnswerText("17007, 0", L"Quantity exceeds the limit.");
  EXPECT_EQ(Post(view, "MSG_WLOPENTRADE", &kTicket, -1), 0);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::MessageText}));  // the lookup only
  EXPECT_EQ(host.Requests()[0].text, "17007, 0");
  ASSERT_EQ(host.dialogs.shown.size(), 1u);
  EXPECT_EQ(host.dialogs.shown[0].text, QString("Quantity exceeds the limit."));
  EXPECT_EQ(host.dialogs.shown[0].caption, QString("Terminal"));
  EXPECT_EQ(host.dialogs.shown[0].icon, platform::Icon::Exclamation);
}

TEST_F(PriceViewActions, TradeTicket_ShortcutOriginSends206FirstThen200And310) {
  Post(view, "MSG_WLOPENTRADE", &kTicket, 99);
  ASSERT_EQ(host.Messages(), (std::vector<UINT>{hm::ShortcutContext, hm::OpenView, hm::LinkData}));
  EXPECT_EQ(host.Requests()[0].wtext, L"OPEN_TRADE_SHORTCUT");
  for (int i : {1, 2}) {
    const auto& link = *host.Requests()[std::size_t(i)].link;
    EXPECT_EQ(link.className, L"CTradeView");
    EXPECT_EQ(link.flag, 1);
    EXPECT_EQ(link.reserved, 0);
    EXPECT_EQ(link.link, kTicket);
  }
  // Any other origin: no 206, and the price view asks no access question.
  host.ClearRequests();
  Post(view, "MSG_WLOPENTRADE", &kTicket, 0);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::OpenView, hm::LinkData}));
  EXPECT_TRUE(host.dialogs.shown.empty());
}

TEST_F(PriceViewActions, OpenMessages_OpenTheirViewOnTheInstrument) {
  const std::pair<const char*, std::wstring> cases[] = {
      {"MSG_WLOPENDEPTH", L"CMarketDepthAdv"},    {"MSG_WLOPENSALES", L"CTimeAndSalesAdv"},
      {"MSG_WLOPENSUMMARY", L"CTradeSummaryAdv"}, {"MSG_WLOPENCHART", L"CBranticChartView"},
      {"MSG_WLOPENSTOCKANALYTICS", L"CStockAnalytics"}, {"MSG_RELATEDNEWS", L"CFNews"}};
  for (const auto& [name, className] : cases) {
    host.ClearRequests();
    Post(view, name, &kTicket, 0);
    ASSERT_EQ(host.Messages(), (std::vector<UINT>{hm::OpenView, hm::LinkData})) << name;
    EXPECT_EQ(host.Requests()[0].link->className, className);
    EXPECT_EQ(host.Requests()[1].link->link, kTicket);
  }
  // The trade-link refresh is 615 alone.
  host.ClearRequests();
  Post(view, "MSG_REFRESHTRADELINK", &kTicket, 0);
  EXPECT_EQ(host.Messages(), (std::vector<UINT>{hm::LinkedInstrument}));
}

TEST_F(PriceViewActions, Drops_RefusedFromInstrumentViewsAndOwnRows) {
  EXPECT_TRUE(view->EnableDropIn("CInsExpViewEx"));
  EXPECT_FALSE(view->EnableDropIn("CMarketDepthAdv"));
  EXPECT_FALSE(view->EnableDropIn("price view"));
  EXPECT_FALSE(view->EnableDropIn("COrderStatusViewNew"));
}

TEST(ViewLogging, PrepareBasicDataNamesTheViewsOwnFileAndLine) {
  mvtest::ScriptedHost host;
  host.Open("CPriceViewAdv");
  // The lines of PrepareBasicData (the price view also logs its tab loaders).
  auto linesOf = [&](const std::string& function) {
    std::vector<std::string> out;
    for (const auto& line : host.logs.Texts())
      if (line.rfind("Info:" + function + " ", 0) == 0) out.push_back(line);
    return out;
  };
  const auto lines = linesOf("CPriceViewAdv::PrepareBasicData");
  ASSERT_EQ(lines.size(), 2u);
  const std::string prefix = "Info:CPriceViewAdv::PrepareBasicData file:PriceViewAdv.cpp line:";
  ASSERT_EQ(lines[0].rfind(prefix, 0), 0u) << lines[0];
  EXPECT_GT(std::stoi(lines[0].substr(prefix.size())), 0);
  EXPECT_EQ(lines[1], lines[0]);

  // A view of the instrument family names its own file too.
  host.Open("CTimeAndSalesAdv");
  const auto sales = linesOf("CTimeAndSalesAdv::PrepareBasicData");
  ASSERT_FALSE(sales.empty());
  EXPECT_EQ(sales[0].rfind("Info:CTimeAndSalesAdv::PrepareBasicData file:TimeAndSalesAdv.cpp line:", 0), 0u);
}

}  // namespace
