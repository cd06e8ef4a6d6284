// Renders every cell type, two board tiles, the bar chart and the combo box
// into one picture (mv_ui_demo.png in the temporary directory, or in
// $MV_UI_DEMO_DIR) so that the look can be checked by eye.
#include <gtest/gtest.h>

#include <QDir>
#include <QLineEdit>
#include <QVBoxLayout>
#include <cstdlib>
#include <set>

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

// Whether `r` of `img` holds a pixel within `tolerance` (per channel) of `c`.
bool HasColour(const QImage& img, const QRect& r, const QColor& c, int tolerance = 0) {
  for (int y = r.top(); y <= r.bottom(); ++y)
    for (int x = r.left(); x <= r.right(); ++x) {
      const QColor p = img.pixelColor(x, y);
      if (std::abs(p.red() - c.red()) <= tolerance && std::abs(p.green() - c.green()) <= tolerance &&
          std::abs(p.blue() - c.blue()) <= tolerance)
        return true;
    }
  return false;
}

// Distinct colours in `r` of `img`.
int Colours(const QImage& img, const QRect& r) {
  std::set<QRgb> seen;
  for (int y = r.top(); y <= r.bottom(); ++y)
    for (int x = r.left(); x <= r.right(); ++x) seen.insert(img.pixel(x, y));
  return int(seen.size());
}

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

  // The picture shows what each part draws. Cell types: the coloured cell's
  // background, the selected row in the selection colour, and the check box,
  // arrows and buttons drawing something in cells that have no text.
  const auto rectOn = [&](QWidget* w, const QRect& r) { return QRect(w->mapTo(&page, r.topLeft()), r.size()); };
  const auto cellOf = [&](CGridCtrl* g, int col, int row) {
    return rectOn(g->viewport(), g->CellRect(col, row)).adjusted(2, 2, -2, -2);
  };
  EXPECT_TRUE(HasColour(img, cellOf(types, 3, 7), QColor(214, 245, 214))) << "coloured cell";
  EXPECT_TRUE(HasColour(img, cellOf(types, 0, 8), types->GetColors().selBack)) << "selected row";
  EXPECT_FALSE(HasColour(img, cellOf(types, 0, 7), types->GetColors().selBack)) << "only the selected row";
  for (int row : {1, 2, 4, 5, 6}) EXPECT_GE(Colours(img, cellOf(types, 3, row)), 3) << "cell type of row " << row;
  EXPECT_LE(Colours(img, cellOf(types, 3, 3)), 1) << "the empty cell type draws nothing";
  // Tiles: each tile is drawn, and the quantity field of the tile flagged
  // invalid is framed in the falling colour.
  for (int col = 0; col < 3; ++col) EXPECT_GE(Colours(img, cellOf(board, col, 0)), 8) << "tile " << col;
  const auto fieldEdge = [&](int col) {
    const QRect cell = board->CellRect(col, 0);
    const QRect field = PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kQtyField).ToRect();
    return img.pixelColor(board->viewport()->mapTo(&page, QPoint(field.left(), field.center().y())));
  };
  EXPECT_EQ(fieldEdge(1), QColor(250, 0, 0));
  EXPECT_NE(fieldEdge(0), QColor(250, 0, 0));
  // Chart: the bars of all three series are on screen.
  const QRect plot = rectOn(chart, chart->rect());
  for (unsigned series : {0x7373FFu, 0x50D092u, 0xBD814Fu}) {  // colour words: 0x00BBGGRR
    const QColor colour(int(series & 0xFF), int((series >> 8) & 0xFF), int((series >> 16) & 0xFF));
    EXPECT_TRUE(HasColour(img, plot, colour)) << std::hex << series;
  }
  // The instrument box shows its placeholder in grey.
  EXPECT_TRUE(HasColour(img, rectOn(combo, combo->rect()), QColor(0xAA, 0xAA, 0xAA), 40)) << "placeholder";
}

}  // namespace
