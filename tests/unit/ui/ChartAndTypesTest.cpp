#include <gtest/gtest.h>

#include <QBarSeries>
#include <QBarSet>
#include <QChart>
#include <QScrollBar>
#include <QStyle>
#include <malloc.h>

#include <cmath>

#include "UiTestApp.h"
#include "chart/BarChart.h"
#include "controls/CellTypes.h"
#include "grid/GridCtrl.h"
#include "hostview/Services.h"
#include "skin/Skin.h"

namespace {

class ChartTest : public ::testing::Test {
 protected:
  void SetUp() override { UiApp(); }
  static QBarSeries* Bars(CBarChart& c) { return qobject_cast<QBarSeries*>(c.Chart()->series().front()); }
  static void AddGroups(CBarChart& c, int n) {
    for (int i = 0; i < n; ++i)
      c.AddGroup({QString::number(i), {double(i * 10), double(i * 5), double(i)}, QStringLiteral("tip %1").arg(i)});
  }
};

TEST_F(ChartTest, Chart_SeriesKeepLegendsAndColoursInOrder) {
  CBarChart chart;
  chart.AddSeries(QStringLiteral("Ask"), 0x7373FF);
  chart.AddSeries(QStringLiteral("Bid"), 0x50D092);
  chart.AddSeries(QStringLiteral("Blocks"), 0xBD814F);
  AddGroups(chart, 3);
  chart.Redraw();
  auto sets = Bars(chart)->barSets();
  ASSERT_EQ(sets.size(), 3);
  EXPECT_EQ(sets[0]->label(), QStringLiteral("Ask"));
  // Blue sits in the high byte of the colour value.
  EXPECT_EQ(sets[0]->color(), QColor(0xFF, 0x73, 0x73));
  EXPECT_EQ(sets[1]->color(), QColor(0x92, 0xD0, 0x50));
  EXPECT_EQ(sets[2]->color(), QColor(0x4F, 0x81, 0xBD));
  EXPECT_EQ(sets[0]->at(2), 20.0);
  EXPECT_EQ(sets[2]->at(2), 2.0);
}

TEST_F(ChartTest, Chart_ShowsTenGroupsFromTheScrollPosition) {
  CBarChart chart;
  chart.AddSeries(QStringLiteral("Ask"), 0x7373FF);
  AddGroups(chart, 25);
  chart.Redraw();
  EXPECT_EQ(Bars(chart)->barSets()[0]->count(), 10);
  EXPECT_EQ(chart.VisibleGroups().front(), 0);
  chart.SetScrollPos(12);
  EXPECT_EQ(chart.VisibleGroups().front(), 12);
  EXPECT_EQ(Bars(chart)->barSets()[0]->at(0), 120.0);
  chart.SetScrollPos(100);
  EXPECT_EQ(chart.ScrollPos(), 15) << "the window stays full at the end";
  EXPECT_EQ(chart.VisibleGroups().back(), 24);
  EXPECT_EQ(chart.TooltipOf(24), QStringLiteral("tip 24"));
  chart.SetScrollPos(-3);
  EXPECT_EQ(chart.ScrollPos(), 0);
}

TEST_F(ChartTest, Chart_RangeLeavesHeadroomAndClearEmpties) {
  CBarChart chart;
  chart.AddSeries(QStringLiteral("Ask"), 0x7373FF);
  chart.AddGroup({QStringLiteral("1.00"), {100.0}, QString()});
  chart.SetupRange(0, 20);
  EXPECT_EQ(chart.AxisMin(), 0.0);
  EXPECT_GE(chart.AxisMax(), 120.0);
  chart.Clear();
  chart.Redraw();
  EXPECT_EQ(chart.GroupCount(), 0);
  EXPECT_EQ(chart.SeriesCount(), 1) << "series stay after clear";
  EXPECT_EQ(chart.AxisMin(), 0.0);
  EXPECT_GT(chart.AxisMax(), 0.0);
  // Values that are not numbers draw as 0.
  chart.AddGroup({QStringLiteral("x"), {std::nan("")}, QString()});
  chart.Redraw();
  EXPECT_EQ(Bars(chart)->barSets()[0]->at(0), 0.0);
}

TEST(CellTypesTest, CellTypes_NamesAndIdentifiers) {
  UiApp();
  PUDArrowTypeEx ud;
  PEmptyTypeEx empty;
  EXPECT_EQ(ud.GetName(), L"Up/Down Arrow Type");
  EXPECT_EQ(ud.GetUUID(), QUuid("{24B7AFA0-1146-34E6-E40D-025458E291DF}"));
  EXPECT_EQ(empty.GetName(), L"EmptyCell");
  EXPECT_EQ(empty.GetUUID(), QUuid("{26B7ACA0-1F46-34E6-E42D-005458E291DF}"));
  EXPECT_EQ(CStyleImage::ForStyle(L"images/QuickBar/[styleID]/CompanyInfo.bmp", 3),
            L"images/QuickBar/3/CompanyInfo.bmp");
}

TEST(CellTypesTest, CellTypes_EmptyCellDrawsNoText) {
  UiApp();
  CGridCtrl grid;
  PEmptyTypeEx empty(&grid);
  QImage img(60, 20, QImage::Format_ARGB32);
  img.fill(Qt::black);
  QPainter p(&img);
  CGridCell cell;
  cell.text = QStringLiteral("XXXXXXXX");
  cell.backColor = QColor(10, 200, 10);
  empty.OnDraw(p, img.rect(), 0, 0, cell, false, false);
  p.end();
  for (int x = 0; x < 59; x += 3) EXPECT_EQ(img.pixelColor(x, 9), QColor(10, 200, 10)) << x;
  EXPECT_EQ(img.pixelColor(59, 9), QColor(255, 255, 255)) << "its own white border pen";
}

TEST(CellTypesTest, CellTypes_FilterListItemOutlineAndSquare) {
  UiApp();
  QImage img(40, 18, QImage::Format_ARGB32);
  const auto draw = [&](bool selected) {
    img.fill(QColor(128, 128, 128));
    QPainter p(&img);
    PFilterCKListBox::DrawItem(p, img.rect(), selected);
  };
  draw(true);
  EXPECT_EQ(img.pixelColor(0, 0), QColor(Qt::black));
  EXPECT_EQ(img.pixelColor(38, 16), QColor(Qt::black)) << "right and bottom one pixel inside";
  EXPECT_EQ(img.pixelColor(39, 17), QColor(128, 128, 128));
  EXPECT_EQ(img.pixelColor(2, 2), QColor(Qt::black));
  EXPECT_EQ(img.pixelColor(2 + 12, 2 + 12), QColor(Qt::black)) << "square as high as the item less 5";
  draw(false);
  EXPECT_EQ(img.pixelColor(2, 2), QColor(Qt::white));
}

class FakeStyle : public IStyleManager {
 public:
  int GetStyleID() const override { return 2; }
  COLORREF GetColor(int id) const override {
    switch (id) {
      case 107: return MakeColorRef(250, 250, 240);
      case 109: return MakeColorRef(20, 20, 90);
      case 108: return MakeColorRef(30, 60, 120);
      case 110: return MakeColorRef(255, 255, 255);
      case 111: return MakeColorRef(100, 100, 100);
      case 301: return MakeColorRef(1, 2, 3);
      case 304: return MakeColorRef(200, 210, 220);
      default: return MakeColorRef(128, 128, 128);
    }
  }
  QFont GetFont(int) const override { return QFont(); }
  std::wstring ResolveImagePath(const std::wstring&, int) const override { return {}; }
};

TEST(SkinTest, Skin_GridAndComboTakeTheStyleColours) {
  UiApp();
  FakeStyle style;
  const auto c = skin::ColorsFromStyle(&style);
  EXPECT_EQ(c.text, QColor(1, 2, 3));
  EXPECT_EQ(c.back, QColor(200, 210, 220));
  EXPECT_EQ(c.face, QColor(30, 60, 120));
  CGridCtrl grid;
  grid.ApplyStyle(&style);
  EXPECT_EQ(grid.GetColors().back, QColor(250, 250, 240));
  EXPECT_EQ(grid.GetColors().text, QColor(20, 20, 90));
  EXPECT_EQ(grid.GetColors().headBack, QColor(30, 60, 120));
  EXPECT_NE(dynamic_cast<skin::CSkinStyle*>(grid.verticalScrollBar()->style()), nullptr)
      << "scroll bars are skinned";
  EXPECT_EQ(grid.verticalScrollBar()->style()->pixelMetric(QStyle::PM_ScrollBarExtent), 14);
  CSkinComboBox combo;
  combo.SetStyleManager(&style);
  EXPECT_EQ(combo.palette().color(QPalette::Text), QColor(1, 2, 3));
  EXPECT_EQ(combo.palette().color(QPalette::Base), QColor(200, 210, 220));
}

}  // namespace

namespace {

// A chart shown all day is redrawn on every update: its memory must not grow
// with the redraws, and the bars must show the latest values.
TEST_F(ChartTest, Chart_RedrawsKeepMemoryFlatAndShowTheLatestValues) {
  CBarChart chart;
  chart.AddSeries(QStringLiteral("Ask"), 0x7373FF);
  chart.AddSeries(QStringLiteral("Bid"), 0x50D092);
  chart.resize(400, 300);
  chart.show();
  std::vector<CBarChart::Group> groups;
  for (int i = 0; i < 25; ++i) groups.push_back({QString::number(i), {double(i * 10), double(i)}, QString()});
  auto redraw = [&](int times) {
    for (int i = 0; i < times; ++i) {
      groups[std::size_t(i % 10)].values[0] += 1;
      chart.SetGroups(groups);
      chart.Redraw();
      QCoreApplication::processEvents();
    }
  };
#if defined(__SANITIZE_ADDRESS__)
  redraw(20);  // the sanitizer's allocator keeps no figures here
#else
  redraw(1000);  // Qt's caches filled
  const std::size_t before = mallinfo2().uordblks;
  redraw(500);
  const std::size_t after = mallinfo2().uordblks;
  // Replacing the bar sets on each redraw left about 200 to 800 bytes behind each time.
  EXPECT_LT(after, before + 500 * 64) << "grew by " << (after - before) / 500 << " bytes a redraw";
#endif
  ASSERT_EQ(Bars(chart)->barSets().size(), 2);
  EXPECT_EQ(Bars(chart)->barSets()[0]->at(3), groups[3].values[0]);
  EXPECT_EQ(Bars(chart)->barSets()[1]->at(9), 9.0);

  // Fewer groups than the window: fewer bars, not stale ones.
  groups.resize(3);
  chart.SetGroups(groups);
  chart.Redraw();
  EXPECT_EQ(Bars(chart)->barSets()[0]->count(), 3);
  EXPECT_EQ(chart.Chart()->axes(Qt::Horizontal).isEmpty(), false);
}

}  // namespace
