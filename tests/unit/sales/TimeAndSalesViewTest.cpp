// The time-and-sales view hosted by the scripted host: what a selection asks
// for, how answers and pushes land, the empty-answer re-ask, background
// paging on the 10 s timer (start, the 120 s cancel), the information panel
// and the title.
#include <gtest/gtest.h>

#include <algorithm>

#include "addon/LinkText.h"
#include "data/TradeTape.h"
#include "hostview/HostLists.h"
#include "mvtest/ProcessStateReset.h"
#include "mvtest/ScriptedHost.h"
#include "views/instrument/SalesFeed.h"
#include "views/instrument/SalesPaging.h"
#include "views/instrument/TimeASGrid.h"
#include "views/instrument/TimeAndSalesAdv.h"

namespace {

JInstrumentUnderlying Instrument(std::int64_t productId, const std::string& code, const std::string& exchange,
                                 int status = 3) {
  JInstrumentUnderlying i;
  i.productId = productId;
  i.instrumentCode = code;
  i.exchangeCode = exchange;
  i.instrumentName = code + " Holdings";
  i.symbol = code;
  i.displayCode = code;
  i.decimals = 3;
  i.accessStatus = status;
  i.altAccessStatus = status;
  return i;
}

std::string Item(int number) {
  return "2026120710:3" + std::to_string(number % 10) + ":00|" + std::to_string(number) + ".000|100|1||" +
         std::to_string(number);
}
std::string Page(int newest, int oldest) {
  std::string s;
  for (int n = newest; n >= oldest; --n) s += (s.empty() ? "" : ";") + Item(n);
  return s;
}

struct SalesViewTest : ::testing::Test {
  mvtest::ScriptedHost host;
  std::vector<JProduct> products{{1, "ES", "Shares"}, {3, "DMA", "Direct"}};
  // Each test has instruments of its own: the stores and the tape live for the process.
  const std::string tag = ::testing::UnitTest::GetInstance()->current_test_info()->name();
  std::vector<JInstrumentUnderlying> instruments{
      Instrument(1, "A" + tag, "SGX"),
      Instrument(3, "B" + tag, "SGX"),   // DMA
      Instrument(1, "C" + tag, "HKEX"),  // an exchange the host disables
  };

  void SetUp() override {
    sales::ClearPending();
    sales::PageBatches::Instance().Clear();
    host.AnswerWith(hm::ExchangeEnabled, [](const mvtest::Feedback& f) -> std::optional<LPARAM> {
      const auto* ex = FromLParam<const JExchangeList>(f.data);
      return ex && ex->exchangeCode == "HKEX" ? 0 : 1;
    });
    host.AnswerText("17002, 1", L"Time and sales is closed for this exchange");
    host.language.Set(13, 8, L"Time & Sales");
    host.language.Set(13, 613, L"No trades yet.");
  }
  void TearDown() override {
    for (CSuperBaseView* v : std::vector<CSuperBaseView*>(host.Views())) host.Destroy(v);
    sales::ClearPending();
    sales::PageBatches::Instance().Clear();
  }

  CTimeAndSalesAdv* Make() {
    auto* view = static_cast<CTimeAndSalesAdv*>(host.Adopt(new CTimeAndSalesAdv));
    view->resize(480, 500);
    view->show();
    host.Send(view, hm::Activate);
    JProductListMsg productList{std::intptr_t(products.size()), &products};
    host.Send(view, hm::ProductList, ToLParam(&productList));
    JInstrumentListMsg instrumentList{std::intptr_t(instruments.size()), 0, &instruments};
    host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
    return view;
  }
  void Select(CTimeAndSalesAdv* view, const JInstrumentUnderlying& i) {
    addon::LinkTextBuilder link("start");
    link.Add(addon::linkkey::kInstrumentCode, i.instrumentCode).AddInt64(addon::linkkey::kProductId, i.productId);
    host.SendLink(view, link.Wide());
  }
  void Field(CTimeAndSalesAdv* view, const JInstrumentUnderlying& i, UINT message, int param,
             const std::string& field, const std::string& value, int kind = 2) {
    host.SendField(view, message, FieldUpdate{i.productId, i.instrumentCode, field, value, param, kind});
  }
  std::vector<FieldRequest> Fields(UINT message) const {
    std::vector<FieldRequest> out;
    for (const auto& f : host.RequestsOf(message))
      if (f.field) out.push_back(*f.field);
    return out;
  }
  std::vector<int> PagesAsked() const {
    std::vector<int> pages;
    for (const auto& r : Fields(hm::RequestField))
      if (r.fieldName == "TRADEDATA") pages.push_back(r.param);
    return pages;
  }
  bool Logged(const std::string& line) const {
    const auto texts = host.logs.Texts();
    return std::find(texts.begin(), texts.end(), line) != texts.end();
  }
};

TEST_F(SalesViewTest, SelectionAsksForTheHeaderAndTheLivePageAndTitlesTheView) {
  CTimeAndSalesAdv* view = Make();
  host.ClearRequests();
  Select(view, instruments[0]);
  EXPECT_EQ(view->GetSalesGrid()->GetMessage(), L"No trades yet.");
  EXPECT_TRUE(Fields(hm::RequestField).empty()) << "requests leave on the next refresh tick";
  const auto titles = host.RequestsOf(hm::Title);
  ASSERT_FALSE(titles.empty());
  EXPECT_EQ(titles.back().wtext, L"Time & Sales - " + hv::Widen(instruments[0].instrumentName));
  host.Advance(200);
  const auto asked = Fields(hm::RequestField);
  ASSERT_EQ(asked.size(), 11u);
  const std::vector<std::string> header = {"DTIME", "HIGH", "LOW", "NETCHANGE", "LAST", "TOTALVALUE", "TOTAL_VOLUME",
                                           "PAGECOUNT", "PMP_Submit"};
  for (std::size_t k = 0; k < header.size(); ++k) {
    EXPECT_EQ(asked[k].fieldName, header[k]);
    EXPECT_EQ(asked[k].param, 99999);
    EXPECT_EQ(asked[k].kind, 2);
    EXPECT_EQ(asked[k].instrumentCode, instruments[0].instrumentCode);
  }
  EXPECT_EQ(asked[9].fieldName, "TRADEDATA");
  EXPECT_EQ(asked[9].param, 99998);
  EXPECT_EQ(asked[10].fieldName, "PMP_Submit");
  EXPECT_EQ(asked[10].param, 99998);

  // The live page shows at once.
  Field(view, instruments[0], hm::RequestField, 99998, "TRADEDATA", Page(250, 151));
  host.Advance(200);
  EXPECT_EQ(view->GetSalesGrid()->GetNumberRows(), 250);
  EXPECT_EQ(view->GetSalesGrid()->GetMessage(), L"");
  EXPECT_TRUE(Logged("(Uid:" + std::to_string(view->RegistrationValue()) + ") : Code(" +
                     instruments[0].instrumentCode + ") Page(99998) receive old."));

  // A DMA product is "Cash" time and sales.
  Select(view, instruments[1]);
  EXPECT_EQ(host.RequestsOf(hm::Title).back().wtext, L"Cash Time & Sales - " + hv::Widen(instruments[1].instrumentName));
  // A disabled exchange shows the view's own refusal ("17002").
  Select(view, instruments[2]);
  EXPECT_EQ(view->GetSalesGrid()->GetNumberRows(), 0);
  EXPECT_FALSE(view->GetSalesGrid()->GetMessage().empty());
}

TEST_F(SalesViewTest, EmptyAnswerIsAskedAgainWithTheSameParamAndPushesLandOnceByTheCurrentView) {
  CTimeAndSalesAdv* first = Make();
  CTimeAndSalesAdv* second = Make();
  Select(first, instruments[0]);
  Select(second, instruments[0]);
  host.Advance(200);
  host.ClearRequests();
  Field(second, instruments[0], hm::RequestField, 7, "TRADEDATA", "");
  const auto again = Fields(hm::FetchFields);
  ASSERT_EQ(again.size(), 1u);
  EXPECT_EQ(again[0].fieldName, "TRADEDATA");
  EXPECT_EQ(again[0].param, 7);
  EXPECT_EQ(again[0].kind, 2);
  EXPECT_EQ(again[0].productId, instruments[0].productId);
  EXPECT_EQ(again[0].instrumentCode, instruments[0].instrumentCode);
  EXPECT_EQ(host.RequestsFrom(second).size(), 1u) << "the view that got the answer asks again";
  // Other kinds and params are not this view's.
  Field(second, instruments[0], hm::RequestField, 5000, "TRADEDATA", "");
  Field(second, instruments[0], hm::RequestField, 7, "TRADEDATA", "", 0);
  EXPECT_EQ(Fields(hm::FetchFields).size(), 1u);

  // A push reaching the second view is left to the first (current) one.
  const InstrumentKey key{instruments[0].productId, hv::Widen(instruments[0].instrumentCode)};
  Field(second, instruments[0], hm::FieldValue, 99998, "TRADEDATA", Item(3));
  EXPECT_FALSE(TradeTape::Instance().Has(key, 3));
  Field(first, instruments[0], hm::FieldValue, 99998, "TRADEDATA", Item(3));
  EXPECT_TRUE(TradeTape::Instance().Has(key, 3));
  EXPECT_TRUE(Logged("(Uid:" + std::to_string(first->RegistrationValue()) + ") : Code(" +
                     instruments[0].instrumentCode + ") Page(99998) receive."));
  // Answers land from any view.
  Field(second, instruments[0], hm::RequestField, 1, "TRADEDATA", Item(1));
  EXPECT_TRUE(TradeTape::Instance().Has(key, 1));
  Field(second, instruments[0], hm::RequestField, 99999, "PAGECOUNT", "4");
  EXPECT_TRUE(Logged("(Uid:" + std::to_string(second->RegistrationValue()) + ") : Code(" +
                     instruments[0].instrumentCode + ") Page Count is 4."));
  // When the first view closes, the second asks again for what it shows.
  host.Destroy(first);
  host.ClearRequests();
  host.Advance(200);
  EXPECT_EQ(PagesAsked(), (std::vector<int>{99998}));
  EXPECT_EQ(Fields(hm::RequestField).front().fieldName, "DTIME");
}

TEST_F(SalesViewTest, BackgroundPagingStartsAfterTenSecondsAndCancelsThreeOfSevenAfter120) {
  CTimeAndSalesAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  // 750 trades: the live page holds 651..750, so page 8 is whole and page 7 the newest missing.
  Field(view, instruments[0], hm::RequestField, 99999, "PAGECOUNT", "8");
  Field(view, instruments[0], hm::RequestField, 99998, "TRADEDATA", Page(750, 651));
  host.Advance(200);
  ASSERT_EQ(view->GetSalesGrid()->GetNumberRows(), 750);
  host.ClearRequests();
  host.Advance(9600 - 400);  // the 10 s timer has not fired yet
  EXPECT_TRUE(PagesAsked().empty());
  host.Advance(400);
  host.Advance(200);  // the pages leave with the next refresh tick
  const std::string uid = std::to_string(view->RegistrationValue());
  const std::string code = instruments[0].instrumentCode;
  EXPECT_TRUE(Logged("(Uid:" + uid + ") : Code(" + code + ") Page(1-7) free time subscibe start."));
  EXPECT_EQ(PagesAsked(), (std::vector<int>{7, 6, 5, 4, 3, 2, 1})) << "registered last down to first";
  // Three pages answer; the others never do.
  for (int page : {7, 4, 1}) Field(view, instruments[0], hm::RequestField, page, "TRADEDATA", Page(page * 100, page * 100 - 99));
  host.ClearRequests();
  host.Advance(110000);
  EXPECT_TRUE(Fields(hm::WithdrawField).empty()) << "still within 120 s";
  host.Advance(20000);
  EXPECT_TRUE(Logged("(Uid:" + uid + ") : Code(" + code + ") Page(1-7) free time subscibe cancel(3 of 7)."));
  std::vector<int> ended;
  for (const auto& r : Fields(hm::WithdrawField)) {
    EXPECT_EQ(r.kind, 2);
    if (r.fieldName == "TIMESALES_DATA") ended.push_back(r.param);
  }
  EXPECT_EQ(ended, (std::vector<int>{1, 2, 3, 4, 5, 6, 7}));
  // The pages still missing are asked for again.
  EXPECT_TRUE(Logged("(Uid:" + uid + ") : Code(" + code + ") Page(1-6) free time subscibe start."));
}

TEST_F(SalesViewTest, LosingActivationKeepsTheTapeMoving) {
  CTimeAndSalesAdv* view = Make();
  Select(view, instruments[0]);
  host.Send(view, hm::Deactivate);
  host.Advance(200);
  Field(view, instruments[0], hm::FieldValue, 99998, "TRADEDATA", Page(120, 21));
  Field(view, instruments[0], hm::RequestField, 99999, "PAGECOUNT", "2");
  host.Advance(200);
  EXPECT_EQ(view->GetSalesGrid()->GetNumberRows(), 120) << "drawn while not active";
  host.ClearRequests();
  host.Advance(10000);
  EXPECT_EQ(PagesAsked(), (std::vector<int>{1})) << "and the history still fills";
  // Activation again does not restart the 10 s wait.
  Field(view, instruments[0], hm::RequestField, 1, "TRADEDATA", Page(100, 1));
  host.Advance(5000);
  host.Send(view, hm::Activate);
  host.ClearRequests();
  host.Advance(5000);
  EXPECT_TRUE(Logged("(Uid:" + std::to_string(view->RegistrationValue()) + ") : Code(" +
                     instruments[0].instrumentCode + ") Page(1-1) free time subscibe finish."));
}

TEST_F(SalesViewTest, InformationPanelShowsTheDayFigures) {
  CTimeAndSalesAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  for (const auto& [field, value] : std::vector<std::pair<std::string, std::string>>{
           {"DTIME", "2026-12-07 10:31:59"}, {"HIGH", "1.26"}, {"LOW", "1.2"}, {"NETCHANGE", "-0.015"},
           {"LAST", "1.25"}, {"TOTALVALUE", "1234567.89"}, {"TOTAL_VOLUME", "9876543"}})
    Field(view, instruments[0], hm::RequestField, 99999, field, value);
  host.Advance(200);
  EXPECT_EQ(view->panelTexts(), QStringList({"Time", "2026-12-07 10:31:59", "High", "1.260", "Low", "1.200",
                                             "Net Change", "-0.015", "Last", "1.250", "Total Value", "1,234,567",
                                             "Total Volume", "9,876,543"}));
  EXPECT_FALSE(view->PanelRect().isEmpty());
  EXPECT_GE(view->GetSalesGrid()->geometry().top(), view->PanelRect().bottom()) << "the grid lies below the panel";
  host.language.Set(13, 606, L"Hoch");
  EXPECT_EQ(view->panelTexts()[2], "Hoch");
  // Compact layout: the grid takes the whole area.
  host.Send(view, hm::CompactLayout, 1);
  EXPECT_TRUE(view->PanelRect().isEmpty());
  EXPECT_EQ(view->GetSalesGrid()->geometry().top(), 0);
}

}  // namespace
