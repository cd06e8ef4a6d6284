#include <gtest/gtest.h>

#include <QLineEdit>
#include <QTest>
#include <set>
#include <string>
#include <vector>

#include "UiTestApp.h"
#include "controls/BoardTypeEx.h"
#include "data/MarketDelayCache.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "grid/GridCtrl.h"
#include "grid/GridDropList.h"
#include "hostview/HostLists.h"
#include "hostview/MessageIds.h"
#include "hostview/Services.h"
#include "hostview/SuperBaseView.h"

namespace {

JInstrumentUnderlying Ins(std::string code, std::string name, std::string exchange, std::int64_t product) {
  JInstrumentUnderlying i;
  i.instrumentCode = code;
  i.symbol = code;
  i.displayCode = code;
  i.instrumentName = std::move(name);
  i.exchangeCode = std::move(exchange);
  i.productId = product;
  return i;
}

// A board of tiles; cell (c, r) shows instrument r * 3 + c of the read-only
// store, or the writable store's first one at (2, 1).
class BoardGridForTest : public CGridCtrl {
 public:
  explicit BoardGridForTest(int tiles) : board(this), tiles(tiles) {
    SetTH_Height(0);
    SetNumberCols(3);
    SetNumberRows((tiles + 2) / 3);
    SetDefRowHeight(150);
    for (int c = 0; c < 3; ++c) SetColWidth(c, 220);
    SetHighlightSelection(false);
    resize(680, 320);
    board.SetQuantitySource([](int, int) { return QStringList{QStringLiteral("100"), QStringLiteral("200")}; });
  }
  PBoardTypeEx board;
  int tiles;
  bool writableAt21 = false;
  std::vector<std::string> events;
  std::string Last() const { return events.empty() ? std::string() : events.back(); }

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override {
    if (row < 0 || col < 0) return;
    cell.cellType = &board;
    const int index = row * 3 + col;
    if (writableAt21 && col == 2 && row == 1) cell.SetParam(PBoardTypeEx::kWritableBase);
    else if (index < tiles) cell.SetParam(index);
    cell.text = QStringLiteral("300");
  }
  int OnCellTypeNotify(CGridCellType*, int col, int row, int code, std::intptr_t param) override {
    events.push_back(std::to_string(code) + ":" + std::to_string(param) + "@" + std::to_string(col) + "," +
                     std::to_string(row));
    return 0;
  }
  bool OnEditStart(int col, int row, QString& text) override {
    events.push_back("edit@" + std::to_string(col) + "," + std::to_string(row));
    return true;
  }
};

// A view whose terminal answers 601 from a table of delays.
class DelayHost : public IViewHost {
 public:
  std::vector<JMarketInfoRequest> asked;
  void OnChildFeedback(CSuperBaseView*, UINT message, LPARAM data) override {
    if (message != hm::MarketInfo) return;
    const auto* req = FromLParam<const JMarketInfoRequest>(data);
    asked.push_back(*req);
    if (req->exchangeCode == "HKEX") MarketDelayCache::Instance().SetDelay(req->productId, L"HKEX", 15);
  }
};

class BoardTest : public ::testing::Test {
 protected:
  void SetUp() override {
    UiApp();
    list = {Ins("0005", "Harbour Bank", "HKEX", 1), Ins("600000", "Pudong Bank", "SSE", 2),
            Ins("AAPL", "Apple", "NASDAQ", 3), Ins("0700", "Tencent", "HKEX", 1)};
    InstrumentMgr_ReadOnly().Fill(&list);
  }
  void TearDown() override {
    // The store indexes the list in place: leave it pointing at a list that lives on.
    static const std::vector<JInstrumentUnderlying> none;
    InstrumentMgr_ReadOnly().Fill(&none);
  }
  static void Click(CGridCtrl& g, QPoint press, QPoint release) {
    QTest::mousePress(g.viewport(), Qt::LeftButton, {}, press);
    QTest::mouseRelease(g.viewport(), Qt::LeftButton, {}, release);
  }
  static QPoint Mid(const PBoardTypeEx::Box& b) { return QPoint((b.l + b.r) / 2, (b.t + b.b) / 2); }
  std::vector<JInstrumentUnderlying> list;
};

TEST_F(BoardTest, Board_AreasFollowTheTileGeometryWithBothEdgesInside) {
  const QRect cell(0, 0, 220, 150);
  using B = PBoardTypeEx;
  const auto body = B::AreaBox(cell, B::kBody);
  EXPECT_EQ(body.ToRect(), QRect(QPoint(4, 4), QPoint(216, 146)));
  const auto title = B::AreaBox(cell, B::kTitleButton);
  EXPECT_EQ(title.ToRect(), QRect(QPoint(198, 7), QPoint(212, 21)));
  EXPECT_EQ(B::AreaBox(cell, B::kSecondButton).ToRect(), QRect(QPoint(7, 26), QPoint(23, 41)));
  EXPECT_EQ(B::AreaBox(cell, B::kQtyField).ToRect(), QRect(QPoint(85, 127), QPoint(196, 143)));
  EXPECT_EQ(B::AreaBox(cell, B::kQtyListButton).ToRect(), QRect(QPoint(197, 127), QPoint(213, 143)));
  // Both edges of every button belong to it.
  EXPECT_EQ(B::HitArea(cell, {198, 7}), B::kTitleButton);
  EXPECT_EQ(B::HitArea(cell, {212, 21}), B::kTitleButton);
  EXPECT_EQ(B::HitArea(cell, {197, 7}), B::kTitleStrip);
  EXPECT_EQ(B::HitArea(cell, {7, 26}), B::kSecondButton);
  EXPECT_EQ(B::HitArea(cell, {23, 41}), B::kSecondButton);
  EXPECT_EQ(B::HitArea(cell, {24, 41}), B::kSecondStrip);
  EXPECT_EQ(B::HitArea(cell, {196, 143}), B::kQtyField);
  EXPECT_EQ(B::HitArea(cell, {197, 143}), B::kQtyListButton);
  EXPECT_EQ(B::HitArea(cell, {2, 2}), B::kNone) << "the border around the body";
  // Geometry moves with the cell.
  EXPECT_EQ(B::HitArea(cell.translated(220, 150), {198 + 220, 7 + 150}), B::kTitleButton);
}

TEST_F(BoardTest, Board_ButtonsReportOnReleaseInTheSameArea) {
  BoardGridForTest g(4);
  g.show();
  const QRect cell = g.CellRect(1, 0);
  const QPoint second = Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kSecondButton));
  const QPoint title = Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kTitleButton));

  QTest::mousePress(g.viewport(), Qt::LeftButton, {}, second);
  EXPECT_EQ(g.board.PressState(), 1);
  EXPECT_TRUE(g.GetCellFlags(1, 0) & PBoardTypeEx::kPressedSecond);
  QTest::mouseRelease(g.viewport(), Qt::LeftButton, {}, second);
  EXPECT_EQ(g.Last(), "90:0@1,0");
  EXPECT_EQ(g.GetCellFlags(1, 0), 0u) << "the pressed mark goes with the release";
  EXPECT_EQ(g.board.PressState(), 0);

  Click(g, title, title);
  EXPECT_EQ(g.Last(), "91:0@1,0");

  // Released off the button: nothing reported, the mark is cleared.
  g.events.clear();
  QTest::mousePress(g.viewport(), Qt::LeftButton, {}, title);
  EXPECT_TRUE(g.GetCellFlags(1, 0) & PBoardTypeEx::kPressedTitle);
  QTest::mouseRelease(g.viewport(), Qt::LeftButton, {}, second);
  EXPECT_TRUE(g.events.empty());
  EXPECT_EQ(g.GetCellFlags(1, 0), 0u);
  // Released on the same button of another tile: nothing either.
  Click(g, title, Mid(PBoardTypeEx::AreaBox(g.CellRect(2, 0), PBoardTypeEx::kTitleButton)));
  EXPECT_TRUE(g.events.empty());

  // Anywhere else on the tile: 88 with 0, and the press area is known.
  const QPoint bid = Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kBidBox));
  Click(g, bid, bid);
  EXPECT_EQ(g.Last(), "88:0@1,0");
  EXPECT_EQ(g.board.LastPressArea(), PBoardTypeEx::kBidBox);

  // The quantity field starts editing over the field.
  const QPoint qty = Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kQtyField));
  Click(g, qty, qty);
  EXPECT_EQ(g.Last(), "edit@1,0");
  ASSERT_TRUE(g.IsEditing());
  EXPECT_EQ(g.Editor()->geometry(), PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kQtyField).ToRect());
  g.EndEdit(true);
}

TEST_F(BoardTest, Board_QuantityListOpensTogglesAndMoves) {
  BoardGridForTest g(4);
  g.show();
  const QPoint a = Mid(PBoardTypeEx::AreaBox(g.CellRect(0, 0), PBoardTypeEx::kQtyListButton));
  const QPoint b = Mid(PBoardTypeEx::AreaBox(g.CellRect(1, 0), PBoardTypeEx::kQtyListButton));
  Click(g, a, a);
  ASSERT_TRUE(g.board.IsListOpen());
  EXPECT_EQ(g.board.ListCol(), 0);
  EXPECT_TRUE(g.events.empty()) << "the list button reports nothing";
  Click(g, b, b);
  EXPECT_TRUE(g.board.IsListOpen());
  EXPECT_EQ(g.board.ListCol(), 1) << "open for another tile: moves there";
  Click(g, b, b);
  EXPECT_FALSE(g.board.IsListOpen()) << "open for this tile: hides";
  Click(g, a, a);
  g.board.DropList()->Choose(1);
  EXPECT_EQ(g.Last(), "3:1@0,0");
  EXPECT_EQ(g.board.QuantityListText(1), QStringLiteral("200"));
  // A press elsewhere on a tile hides an open list.
  Click(g, a, a);
  const QPoint body = Mid(PBoardTypeEx::AreaBox(g.CellRect(0, 0), PBoardTypeEx::kAskBox));
  Click(g, body, body);
  EXPECT_FALSE(g.board.IsListOpen());
}

TEST_F(BoardTest, Board_HoverDoubleAndRightClickCodes) {
  BoardGridForTest g(4);
  g.show();
  const QRect cell = g.CellRect(0, 1);
  QTest::mouseMove(g.viewport(), Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kTitleButton)));
  EXPECT_EQ(g.Last(), "85:" + std::to_string(PBoardTypeEx::kTitleButton) + "@0,1");
  EXPECT_EQ(g.GridCursor(), Qt::PointingHandCursor);
  QTest::mouseMove(g.viewport(), Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kSecondStrip)) + QPoint(60, 0));
  EXPECT_EQ(g.Last(), "85:0@0,1");
  EXPECT_EQ(g.GridCursor(), Qt::ArrowCursor);
  QTest::mouseMove(g.viewport(), Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kSecondButton)));
  EXPECT_EQ(g.Last(), "86:" + std::to_string(PBoardTypeEx::kSecondButton) + "@0,1");
  const std::size_t n = g.events.size();
  QTest::mouseMove(g.viewport(), Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kSecondButton)) + QPoint(1, 1));
  EXPECT_EQ(g.events.size(), n) << "no report while staying on the button";
  // Moving to another tile ends the tip of the first one.
  QTest::mouseMove(g.viewport(), Mid(PBoardTypeEx::AreaBox(g.CellRect(1, 1), PBoardTypeEx::kBody)));
  EXPECT_EQ(g.Last(), "86:0@0,1");

  g.events.clear();
  QTest::mouseDClick(g.viewport(), Qt::LeftButton, {}, Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kAskBox)));
  EXPECT_EQ(g.Last(), "87:" + std::to_string(PBoardTypeEx::kAskBox) + "@0,1");
  QTest::mouseClick(g.viewport(), Qt::RightButton, {}, Mid(PBoardTypeEx::AreaBox(cell, PBoardTypeEx::kBody)));
  EXPECT_EQ(g.Last().substr(0, 3), "89:");
}

TEST_F(BoardTest, Board_DrawingLooksUpInstrumentsAndAsksForMarketDelayOnce) {
  DelayHost host;
  CSuperBaseView view;
  view.SetHost(&host);
  BoardGridForTest g(4);
  g.board.SetOwnerView(&view);
  JInstrumentUnderlying writable = Ins("ZZZ1", "Added Later", "LSE", 9);
  InstrumentMgr().Put(writable);
  g.writableAt21 = true;
  g.show();
  QImage img(g.viewport()->size(), QImage::Format_ARGB32_Premultiplied);
  QPainter p(&img);
  g.PaintTo(p, img.rect());
  p.end();
  // One request per distinct (product, exchange) of the shown tiles.
  std::set<std::pair<std::int64_t, std::string>> asked;
  for (const auto& r : host.asked) asked.insert({r.productId, r.exchangeCode});
  EXPECT_EQ(asked.size(), host.asked.size());
  EXPECT_TRUE(asked.count({1, "HKEX"}));
  EXPECT_TRUE(asked.count({2, "SSE"}));
  EXPECT_TRUE(asked.count({9, "LSE"})) << "a parameter of 1,000,000 reads the writable store";
  EXPECT_EQ(MarketDelayCache::Instance().Lookup(1, L"HKEX"), L"15");

  // Painting again asks nothing: known delays and unknown exchanges alike.
  const std::size_t before = host.asked.size();
  p.begin(&img);
  g.PaintTo(p, img.rect());
  p.end();
  EXPECT_EQ(host.asked.size(), before);
  // Quote records of the shown instruments were asked for (and queued).
  auto pending = QuoteStore::Instance().TakePending(0);
  EXPECT_GE(pending.size(), 4u);
}

}  // namespace

namespace {

class PathRecordingStyle : public IStyleManager {
 public:
  mutable std::vector<std::pair<std::wstring, int>> asked;
  int GetStyleID() const override { return 4; }
  COLORREF GetColor(int) const override { return MakeColorRef(200, 200, 200); }
  QFont GetFont(int) const override { return QFont(); }
  std::wstring ResolveImagePath(const std::wstring& path, int styleId) const override {
    asked.push_back({path, styleId});
    return {};
  }
};

TEST_F(BoardTest, Board_PicturesComeFromTheStyleForTheCurrentStyleId) {
  ProductMgr().Fill(std::vector<JProduct>{{1, "ES", "Equities", ".\\images\\Products\\ES.bmp"}});
  PathRecordingStyle style;
  BoardGridForTest g(1);
  g.board.SetStyleManager(&style, 4);
  g.show();
  QImage img(g.viewport()->size(), QImage::Format_ARGB32_Premultiplied);
  QPainter p(&img);
  g.PaintTo(p, img.rect());
  const auto has = [&](const std::wstring& path, int id) {
    return std::find(style.asked.begin(), style.asked.end(), std::pair{path, id}) != style.asked.end();
  };
  EXPECT_TRUE(has(L".\\images\\Products\\ES.bmp", 4));
  EXPECT_TRUE(has(PBoardTypeEx::kCompanyInfoPicture, 4));
  // Looked up once per style, again after a style change.
  const std::size_t n = style.asked.size();
  g.PaintTo(p, img.rect());
  EXPECT_EQ(style.asked.size(), n);
  g.board.ChangeStyle(5);
  g.PaintTo(p, img.rect());
  EXPECT_TRUE(has(PBoardTypeEx::kCompanyInfoPicture, 5));
  p.end();
  ProductMgr().Fill(std::vector<JProduct>{});
}

}  // namespace
