// Renders every cell type, two board tiles, the bar chart and the combo box
// into one picture (mv_ui_demo.png in the temporary directory, or in
// $MV_UI_DEMO_DIR) so that the look can be checked by eye.
#include <gtest/gtest.h>

#include <QDir>
#include <QLineEdit>
#include <QVBoxLayout>
#include <cstdlib>

#include "UiTestApp.h"
#include "chart/BarChart.h"
#include "controls/BoardTypeEx.h"
#include "controls/CellTypes.h"
#include "controls/InstrumentComboBox.h"
#include "data/MarketDelayCache.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "grid/GridCtrl.h"

namespace {

// One row per cell type: a caption and a sample cell.
class TypesGrid : public CGridCtrl {
 public:
  TypesGrid() : check(this), sort(this), updown(this), empty(this), arrowButton(this), button(this), drop(this) {
    SetNumberCols(4);
    SetNumberRows(9);
    SetDefRowHeight(24);
    SetTH_Height(24);
    SetColWidth(0, 150);
    SetColWidth(1, 110);
    SetColWidth(2, 110);
    SetColWidth(3, 90);
    SelectRow(8);
    resize(462, 24 * 10 + 2);
  }
  PCheckBoxTypeEx check;
  PSortArrowTypeEx sort;
  PUDArrowTypeEx updown;
  PEmptyTypeEx empty;
  PArrowButtonTypeEx arrowButton;
  CGridButtonType button;
  CGridDropListType drop;

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override {
    if (row == -1) {
      static const char* heads[] = {"Type", "Last", "Change", "Tick"};
      cell.text = QString::fromLatin1(heads[col]);
      if (col == 1) { cell.cellType = &sort; cell.number = 0; }
      if (col == 2) { cell.cellType = &sort; cell.number = 1; }
      if (col == 3) { cell.cellType = &check; cell.number = 1; }
      return;
    }
    static const char* names[] = {"Plain text", "PCheckBoxTypeEx", "PUDArrowTypeEx", "PEmptyTypeEx",
                                  "PArrowButtonTypeEx", "Button", "Drop list", "Coloured text", "Selected row"};
    cell.backColor = (row & 1) ? QColor(240, 240, 240) : QColor(255, 255, 255);
    if (col == 0) { cell.text = QString::fromLatin1(names[row]); return; }
    cell.alignment = Qt::AlignRight | Qt::AlignVCenter;
    cell.text = QStringLiteral("%1").arg(12.5 + row * 0.25, 0, 'f', 3);
    if (col == 2) {
      const double v = row % 2 ? -0.5 : 0.75;
      cell.text = QString::number(v, 'f', 3);
      cell.textColor = v > 0 ? QColor(0, 150, 0) : QColor(250, 0, 0);
    }
    if (col != 3) return;
    cell.text.clear();
    switch (row) {
      case 1: cell.cellType = &check; cell.number = 1; break;
      case 2: cell.cellType = &updown; break;
      case 3: cell.cellType = &empty; break;
      case 4: cell.cellType = &arrowButton; break;
      case 5: cell.cellType = &button; cell.text = QStringLiteral("Trade"); break;
      case 6: cell.cellType = &drop; cell.text = QStringLiteral("100\n200"); break;
      case 7: cell.text = QStringLiteral("+1.25"); cell.textColor = QColor(0, 150, 0); cell.backColor = QColor(214, 245, 214); break;
      default: cell.cellType = &check; cell.number = 0; break;
    }
  }
};

class Board : public CGridCtrl {
 public:
  Board() : board(this) {
    SetTH_Height(0);
    SetNumberCols(3);
    SetNumberRows(1);
    SetDefRowHeight(150);
    for (int c = 0; c < 3; ++c) SetColWidth(c, 220);
    SetHighlightSelection(false);
    resize(676, 152);
    SelectRow(0);
  }
  PBoardTypeEx board;

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override {
    cell.cellType = &board;
    if (col < 3) cell.SetParam(col);
    cell.text = col == 1 ? QStringLiteral("150") : QStringLiteral("1000");
    if (col == 1) cell.flags |= PBoardTypeEx::kFlagInvalidQuantity;
  }
};

TEST(DemoRender, Demo_RendersCellTypesTilesAndChart) {
  UiApp();
  static std::vector<JInstrumentUnderlying> list(3);
  list[0].instrumentCode = list[0].symbol = list[0].displayCode = "0005";
  list[0].instrumentName = "Harbour Bank Holdings";
  list[0].exchangeCode = "HKEX";
  list[0].productId = 1;
  list[0].decimals = 2;
  list[1].instrumentCode = list[1].symbol = list[1].displayCode = "600519";
  list[1].instrumentName = "Kweichow Moutai";
  list[1].exchangeCode = "SSE";
  list[1].productId = 2;
  list[2].instrumentCode = list[2].symbol = list[2].displayCode = "AAPL";
  list[2].instrumentName = "Apple Inc";
  list[2].exchangeCode = "NASDAQ";
  list[2].productId = 3;
  InstrumentMgr_ReadOnly().Fill(&list);
  ProductMgr().Fill(std::vector<JProduct>{{1, "ES", "Equities"}, {2, "CS", "China"}, {3, "CFD", "CFD"}});
  MarketDelayCache::Instance().SetDelay(2, L"SSE", 15);
  auto& qs = QuoteStore::Instance();
  const char* fields[] = {"LAST", "CHANGE", "PCHANGE", "BID", "ASK", "BVOL", "SVOL", "HIGH", "LOW", "VOL"};
  const char* values[3][10] = {
      {"63.45", "1.20", "1.93", "63.40", "63.45", "12,000", "8,400", "63.80", "62.10", "18,734,200"},
      {"1688.00", "-21.50", "-1.26", "1687.90", "1688.00", "300", "1,200", "1712.00", "1680.50", "2,310,441"},
      {"189.30", "0", "0", "189.28", "189.31", "500", "700", "190.10", "188.00", "51,004,220"}};
  for (int i = 0; i < 3; ++i) {
    const InstrumentKey key = InstrumentKeyOf(list[std::size_t(i)]);
    qs.Get(key, platform::TickCount());
    for (int f = 0; f < 10; ++f)
      qs.Update(key, hv::Widen(fields[f]), hv::Widen(values[i][f]), platform::TickCount());
  }
  qs.Update(InstrumentKeyOf(list[0]), L"LAST", L"63.50", platform::TickCount());  // a fresh rise

  QWidget page;
  page.resize(700, 860);
  QPalette white = page.palette();
  white.setColor(QPalette::Window, Qt::white);
  page.setPalette(white);
  page.setAutoFillBackground(true);
  auto* layout = new QVBoxLayout(&page);
  auto* types = new TypesGrid;
  types->setFixedSize(462, 24 * 10 + 2);
  auto* board = new Board;
  board->setFixedSize(676, 152);
  auto* chart = new CBarChart;
  chart->AddSeries(QStringLiteral("Ask"), 0x7373FF);
  chart->AddSeries(QStringLiteral("Bid"), 0x50D092);
  chart->AddSeries(QStringLiteral("Blocks"), 0xBD814F);
  for (int i = 0; i < 14; ++i) {
    const double price = 63.0 + i * 0.05;
    const double ask = 1000 + (i * 737) % 4000, bid = 800 + (i * 911) % 3500, blocks = 20 + (i * 13) % 60;
    chart->AddGroup({QString::number(price, 'f', 2), {ask, bid, blocks},
                     QStringLiteral("Price:%1 | Ask:%2 | Bid:%3 | Blocks:%4").arg(price).arg(ask).arg(bid).arg(blocks)});
  }
  chart->SetupRange(0, 20);
  chart->setFixedSize(662, 300);
  auto* combo = new CInstrumentComboBox;
  combo->AttachList(&list, CInstrumentComboBox::ProductMapFromStore());
  combo->SetLanguage(nullptr);
  combo->setFixedWidth(300);
  auto* filter = new PFilterCKListBox;
  filter->addItems({QStringLiteral("a"), QStringLiteral("b"), QStringLiteral("c")});
  filter->setCurrentRow(1);
  filter->setFixedSize(120, 60);
  auto* row = new QHBoxLayout;
  row->addWidget(combo);
  row->addWidget(filter);
  row->addStretch();
  layout->addWidget(types);
  layout->addWidget(board);
  layout->addWidget(chart);
  layout->addLayout(row);
  page.show();
  chart->Redraw();
  QApplication::processEvents();

  const QImage img = Render(&page);
  const QString dir = qEnvironmentVariableIsEmpty("MV_UI_DEMO_DIR") ? QDir::tempPath()
                                                                   : qEnvironmentVariable("MV_UI_DEMO_DIR");
  const QString path = dir + QStringLiteral("/mv_ui_demo.png");
  ASSERT_TRUE(img.save(path));
  std::printf("demo image: %s\n", qPrintable(path));
  // Something was drawn in each part: the tile's title strip is dark, the chart has bar colours.
  const QPoint strip = board->mapTo(&page, QPoint(100, 6));
  EXPECT_NE(img.pixelColor(strip), QColor(Qt::white)) << "the tile's title strip";
  EXPECT_EQ(chart->VisibleGroups().size(), 10u);
  EXPECT_EQ(chart->SeriesColor(0), 0x7373FFu);
}

}  // namespace
