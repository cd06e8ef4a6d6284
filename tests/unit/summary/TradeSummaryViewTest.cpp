// The trade-summary view through the scripted host: what it asks the
// terminal for, how it takes the answers, and what the table and the chart
// show.
#include "SummaryFixture.h"

#include <QWheelEvent>
#include <algorithm>

namespace summarytest {
namespace {

const std::vector<std::string> kSummaryFields{"TIME",       "WEIGHTED_AVG", "RATIO",     "LAST",     "AVG_TRADE_SIZE",
                                              "QUOTE_LIST", "COUNT",        "PAGECOUNT", "TRADEDATA"};

using TradeSummaryView = SummaryFixture;

bool Logged(const mvtest::FakeLogFactory& logs, const std::string& text) {
  const auto texts = logs.Texts();
  return std::any_of(texts.begin(), texts.end(), [&](const std::string& t) { return t.find(text) != std::string::npos; });
}

TEST_F(TradeSummaryView, Selection_AsksForPageOneOnTheNextTick) {
  CTradeSummaryAdv* view = Make();
  addon::SummaryPageFeed::Instance().TakePending();
  host.ClearRequests();
  Select(view, instruments[0]);
  EXPECT_TRUE(FieldRequests().empty()) << "nothing leaves at selection time";
  ASSERT_FALSE(host.RequestsOf(hm::Title).empty());
  EXPECT_EQ(host.RequestsOf(hm::Title).back().wtext, L"Trade Summary - " + hv::Widen(instruments[0].instrumentName));
  EXPECT_EQ(view->GetSummaryGrid()->GetMessage(), L"No trades yet.");

  host.Advance(200);
  const auto sent = FieldMessages();
  ASSERT_EQ(sent.size(), kSummaryFields.size() + 1);
  for (std::size_t i = 0; i < sent.size(); ++i) {
    SCOPED_TRACE(i);
    EXPECT_EQ(sent[i].first, UINT(hm::RequestField));
    EXPECT_EQ(sent[i].second.fieldName, i < kSummaryFields.size() ? kSummaryFields[i] : "PMP_Submit");
    EXPECT_EQ(sent[i].second.kind, 3);
    EXPECT_EQ(sent[i].second.param, 1);
    EXPECT_EQ(sent[i].second.instrumentCode, instruments[0].instrumentCode);
  }
  host.ClearRequests();
  host.Advance(2000);
  EXPECT_TRUE(FieldRequests().empty()) << "asked once while the page count does not grow";
}

TEST_F(TradeSummaryView, Selection_RefusalsShowTheirTextsAndClearTableAndChart) {
  host.AnswerText("14009, " + std::to_string(instruments[2].productId), L"CFDs are not available in this view.");
  host.AnswerText("17003, 1", L"Trade summary is not available for this exchange.");
  CTradeSummaryAdv* view = Make();
  Select(view, instruments[0]);
  Page(view, instruments[0], 1, Lines(1, 3));
  host.Advance(200);
  ASSERT_EQ(view->GetChart()->GroupCount(), 3);

  Select(view, instruments[2]);
  EXPECT_EQ(view->GetSummaryGrid()->GetMessage(), L"CFDs are not available in this view.");
  EXPECT_EQ(view->GetSummaryGrid()->GetNumberRows(), 0);
  EXPECT_EQ(view->GetChart()->GroupCount(), 0) << "no bars of the previous instrument";

  host.AnswerValue(hm::ExchangeEnabled, 0);
  Select(view, instruments[3]);
  EXPECT_EQ(view->GetSummaryGrid()->GetMessage(), L"Trade summary is not available for this exchange.");
  addon::SummaryPageFeed::Instance().TakePending();
  host.ClearRequests();
  host.Advance(400);
  EXPECT_TRUE(FieldRequests().empty());
}

TEST_F(TradeSummaryView, Answers_EmptyIsAskedAgainOthersLandWhereTheyBelong) {
  CTradeSummaryAdv* first = Make();
  CTradeSummaryAdv* second = Make();
  Select(first, instruments[0]);
  Select(second, instruments[4]);
  host.Advance(200);
  host.ClearRequests();

  // An empty answer is asked again with 400, nothing else.
  Send(second, instruments[4], "TRADEDATA", "", 2);
  const auto again = host.RequestsOf(hm::FetchFields);
  ASSERT_EQ(again.size(), 1u);
  EXPECT_EQ(again[0].field->fieldName, "TRADEDATA");
  EXPECT_EQ(again[0].field->param, 2);
  EXPECT_EQ(again[0].field->kind, 3);
  EXPECT_EQ(again[0].field->instrumentCode, instruments[4].instrumentCode);
  EXPECT_EQ(FieldRequests().size(), 1u);

  // 412 is taken by every view; 410 only by the current one (the first).
  Page(second, instruments[4], 1, Lines(1, 2));
  Page(second, instruments[0], 1, Lines(1, 4), hm::FieldValue);
  Page(first, instruments[0], 1, Lines(1, 3), hm::FieldValue);
  // Pushes outside the pages and the header, or of another kind, change nothing.
  Page(first, instruments[0], 0, Lines(1, 9), hm::FieldValue);
  Page(first, instruments[0], 100, Lines(1, 9), hm::FieldValue);
  Send(first, instruments[0], "TRADEDATA", Lines(1, 9), 1, hm::FieldValue, 2);
  host.Advance(200);
  EXPECT_EQ(second->GetSummaryGrid()->FilledLines(), 2);
  EXPECT_EQ(first->GetSummaryGrid()->FilledLines(), 3);
  EXPECT_EQ(Dump(first)[1], (QStringList{"19.990", "1", "100", "40", "60"}));
  EXPECT_EQ(first->GetSummaryGrid()->GetMessage(), L"");
}

TEST_F(TradeSummaryView, PageCount_GrowthRegistersTheNewPagesOnlyAndIsLogged) {
  CTradeSummaryAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  host.ClearRequests();
  Send(view, instruments[0], "COUNT", "95");
  Send(view, instruments[0], "PAGECOUNT", "3.00");
  const std::string uid = std::to_string(view->RegistrationValue());
  EXPECT_TRUE(Logged(host.logs, "(Uid:" + uid + ") : Code(" + instruments[0].instrumentCode + ") Line Count is 95."));
  EXPECT_TRUE(Logged(host.logs, "(Uid:" + uid + ") : Code(" + instruments[0].instrumentCode + ") Page Count is 3.00."));

  host.Advance(1200);  // 3102 registers, the next 3101 sends
  std::vector<int> pages;
  for (const auto& r : FieldRequests())
    if (r.fieldName == "PMP_Submit") pages.push_back(r.param);
  EXPECT_EQ(pages, (std::vector<int>{2, 3}));
  EXPECT_EQ(view->GetSummaryGrid()->RegisteredPages(), 3);

  host.ClearRequests();
  Send(view, instruments[0], "PAGECOUNT", "3.00", 2);
  host.Advance(2200);
  EXPECT_TRUE(FieldRequests().empty()) << "a page count that does not grow registers nothing";
}

TEST_F(TradeSummaryView, Successor_AsksAgainWhenTheCurrentViewCloses) {
  CTradeSummaryAdv* first = Make();
  CTradeSummaryAdv* second = Make();
  Select(first, instruments[0]);
  Select(second, instruments[4]);
  host.Advance(200);
  // The current view asked for both.
  std::vector<std::string> codes;
  for (const auto& f : host.RequestsOf(hm::RequestField))
    if (f.field->fieldName == "PMP_Submit") codes.push_back(f.field->instrumentCode);
  EXPECT_EQ(codes, (std::vector<std::string>{instruments[0].instrumentCode, instruments[4].instrumentCode}));
  for (const auto& f : host.RequestsOf(hm::RequestField)) EXPECT_EQ(f.view, first);

  host.Destroy(first);
  host.ClearRequests();
  host.Advance(200);
  const auto again = host.RequestsOf(hm::RequestField);
  ASSERT_EQ(again.size(), kSummaryFields.size() + 1);
  EXPECT_EQ(again.front().view, second);
  EXPECT_EQ(again.front().field->instrumentCode, instruments[4].instrumentCode);
}

TEST_F(TradeSummaryView, Chart_ThreeSeriesTenLinesTooltipsFromTheFirstRows) {
  CTradeSummaryAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  CBarChart* chart = view->GetChart();
  ASSERT_EQ(chart->SeriesCount(), 3);
  EXPECT_EQ(chart->SeriesLegend(0), "Ask");
  EXPECT_EQ(chart->SeriesLegend(1), "Bid");
  EXPECT_EQ(chart->SeriesLegend(2), "Blocks");
  EXPECT_EQ(chart->SeriesColor(0), COLORREF(0x7373FF));
  EXPECT_EQ(chart->SeriesColor(1), COLORREF(0x50D092));
  EXPECT_EQ(chart->SeriesColor(2), COLORREF(0xBD814F));
  EXPECT_EQ(chart->GroupCount(), 0);

  Page(view, instruments[0], 1, Join({Item("10.50", 3, 12000, 5000, 6500), Lines(2, 14), Item("TOTALS:", 1, 1, 1, 1)}));
  Send(view, instruments[0], "PAGECOUNT", "1");
  host.Advance(200);
  ASSERT_EQ(chart->GroupCount(), 14);
  EXPECT_EQ(chart->VisibleGroups().size(), 10u);
  EXPECT_EQ(chart->GroupAt(0).label, "10.500");
  EXPECT_EQ(chart->GroupAt(0).values, (std::vector<double>{6500, 5000, 3}));
  EXPECT_EQ(chart->TooltipOf(0), "Price:10.500 | Ask:6,500 | Bid:5,000 | Blocks:3");
  EXPECT_EQ(chart->AxisMin(), 0.0);
  EXPECT_GE(chart->AxisMax(), 6500 * 1.2) << "the range leaves 20 % above the tallest bar";
  // The first line shown at the top of the profile.
  EXPECT_EQ(chart->AxisLabels().back(), "10.500");
}

TEST_F(TradeSummaryView, Chart_FollowsTheTableScrollAndTheTableFollowsTheChart) {
  CTradeSummaryAdv* view = Make(900, 300);
  Select(view, instruments[0]);
  host.Advance(200);
  Page(view, instruments[0], 1, Lines(1, 25));
  Send(view, instruments[0], "PAGECOUNT", "1");
  host.Advance(200);
  TradeSGrid* grid = view->GetSummaryGrid();
  CBarChart* chart = view->GetChart();
  ASSERT_EQ(chart->GroupCount(), 25);
  EXPECT_EQ(chart->ScrollPos(), 0);

  grid->SetTopRow(12);
  ASSERT_EQ(grid->GetTopRow(), 12);
  EXPECT_EQ(chart->ScrollPos(), 12);
  const auto shown = chart->VisibleGroups();
  ASSERT_EQ(shown.size(), 10u);
  EXPECT_EQ(shown.front(), 12);
  EXPECT_EQ(shown.back(), 21);
  // The chart's window reads the same lines as the table's top rows.
  const QStringList window = chart->dumpTsv().split('\n', Qt::SkipEmptyParts);
  EXPECT_EQ(window.value(1).split('\t').value(0), grid->CellText(TradeSGrid::kPrice, 12));
  EXPECT_EQ(window.value(10).split('\t').value(0), grid->CellText(TradeSGrid::kPrice, 21));

  // Scrolling the chart moves the table.
  QWheelEvent wheel(QPointF(10, 10), QPointF(10, 10), QPoint(), QPoint(0, 240), Qt::NoButton, Qt::NoModifier,
                    Qt::NoScrollPhase, false);
  QApplication::sendEvent(chart, &wheel);
  EXPECT_EQ(chart->ScrollPos(), 10);
  EXPECT_EQ(grid->GetTopRow(), 10);
}

TEST_F(TradeSummaryView, Chart_TakesAChangeThatArrivesRightAfterATick) {
  CTradeSummaryAdv* view = Make();
  Select(view, instruments[0]);
  host.Advance(200);
  Page(view, instruments[0], 1, Lines(1, 5));
  Send(view, instruments[0], "PAGECOUNT", "1");
  host.Advance(200);
  CBarChart* chart = view->GetChart();
  ASSERT_EQ(chart->GroupCount(), 5);
  // The push lands in the same millisecond as the tick that just ran; the
  // next tick is 200 ms later and must still see it.
  Page(view, instruments[0], 1, Join({Item("19.99", 9, 900, 400, 500), Lines(2, 5)}), hm::FieldValue);
  host.Advance(200);
  EXPECT_EQ(chart->GroupAt(0).values, (std::vector<double>{500, 400, 9}));
  // A new line in the window appears too.
  Page(view, instruments[0], 1, Join({Item("19.99", 9, 900, 400, 500), Lines(2, 6)}), hm::FieldValue);
  host.Advance(200);
  EXPECT_EQ(chart->GroupCount(), 6);
}

TEST_F(TradeSummaryView, Style_ChartTakesTheViewColoursInBothStyles) {
  CTradeSummaryAdv* view = Make();
  EXPECT_EQ(view->GetChart()->GetPalette().back, QColor(255, 255, 255));
  EXPECT_EQ(view->GetChart()->GetPalette().text, QColor(20, 24, 32));
  host.style.colors[101] = MakeColorRef(22, 25, 31);
  host.style.colors[204] = MakeColorRef(224, 228, 235);
  host.style.styleId = 2;
  view->ChangeStyle(2);
  EXPECT_EQ(view->GetChart()->GetPalette().back, QColor(22, 25, 31));
  EXPECT_EQ(view->GetChart()->GetPalette().text, QColor(224, 228, 235));
  // Wide views put the chart beside the table, narrow ones under it.
  EXPECT_LT(view->GetSummaryGrid()->geometry().right(), view->GetChart()->geometry().left());
  view->resize(400, 600);
  EXPECT_LT(view->GetSummaryGrid()->geometry().bottom(), view->GetChart()->geometry().top());
}

}  // namespace
}  // namespace summarytest
