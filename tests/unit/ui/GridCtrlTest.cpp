#include <gtest/gtest.h>

#include <QDrag>
#include <QHelpEvent>
#include <QMimeData>
#include <QLineEdit>
#include <QTest>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "UiTestApp.h"
#include "grid/GridCtrl.h"
#include "grid/GridDropList.h"

namespace {

// A grid that fills cells from a table and records every notification.
class RecordingGrid : public CGridCtrl {
 public:
  RecordingGrid(int cols, int rows) {
    SetNumberCols(cols);
    SetNumberRows(rows);
    SetDefRowHeight(20);
    SetTH_Height(22);
    for (int c = 0; c < cols; ++c) SetColWidth(c, 60);
    for (int r = 0; r < rows; ++r) order.push_back(r);
    resize(400, 300);
  }
  std::vector<std::string> events;
  std::set<std::pair<int, int>> requested;
  std::vector<int> order;  // row data: the original row numbers
  int minWidth = 0;
  bool editable = true;
  QString edited;
  int cursorCol = -99;

  std::string Last() const { return events.empty() ? std::string() : events.back(); }

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override {
    requested.insert({col, row});
    if (row == -1) cell.SetText(QStringLiteral("H%1").arg(col));
    else if (row >= 0 && col >= 0) cell.SetText(QStringLiteral("r%1c%2").arg(order[std::size_t(row)]).arg(col));
  }
  void OnLClicked(int col, int row, bool pressed, const QRect&, const QPoint&) override {
    events.push_back((pressed ? "L+" : "L-") + std::to_string(col) + "," + std::to_string(row));
  }
  void OnRClicked(int col, int row, bool pressed, const QRect&, const QPoint&) override {
    events.push_back((pressed ? "R+" : "R-") + std::to_string(col) + "," + std::to_string(row));
  }
  void OnDClicked(int col, int row, const QRect&, const QPoint&) override {
    events.push_back("D" + std::to_string(col) + "," + std::to_string(row));
  }
  void OnTH_LClicked(int col, bool pressed, const QRect&, const QPoint&) override {
    events.push_back((pressed ? "TH+" : "TH-") + std::to_string(col));
  }
  void OnTH_DClicked(int col, const QRect&, const QPoint&) override { events.push_back("THD" + std::to_string(col)); }
  void OnMouseMove(int col, int row, const QPoint&, Qt::MouseButtons) override {
    if (col == 1 && row >= 0) SetGridCursor(Qt::PointingHandCursor);
  }
  bool OnHint(int col, int row, QString& text) override {
    events.push_back("hint" + std::to_string(col) + "," + std::to_string(row));
    if (col != 2) return false;
    text = QStringLiteral("hint for %1").arg(row);
    return true;
  }
  void OnColSized(int col, int& width) override {
    if (width < minWidth) width = minWidth;
    events.push_back("size" + std::to_string(col) + "=" + std::to_string(width));
  }
  void OnColMoved(int from, int to) override {
    events.push_back("colmove" + std::to_string(from) + ">" + std::to_string(to));
  }
  void OnRowsMoved(const std::vector<int>& rows, int to) override {
    std::string s = "rowmove";
    for (int r : rows) s += std::to_string(r) + ";";
    events.push_back(s + ">" + std::to_string(to));
    ApplyRowMove(order, rows, to);
  }
  bool OnEditStart(int col, int row, QString& text) override {
    events.push_back("editstart" + std::to_string(col) + "," + std::to_string(row));
    return editable;
  }
  bool OnEditFinish(int col, int row, const QString& text, bool cancelled) override {
    events.push_back(std::string(cancelled ? "editcancel" : "editdone") + std::to_string(col) + "," +
                     std::to_string(row));
    if (!cancelled) edited = text;
    return true;
  }
  int OnCellTypeNotify(CGridCellType*, int col, int row, int code, std::intptr_t param) override {
    events.push_back("notify" + std::to_string(code) + ":" + std::to_string(param) + "@" + std::to_string(col) + "," +
                     std::to_string(row));
    return 0;
  }
};

class GridTest : public ::testing::Test {
 protected:
  void SetUp() override { UiApp(); }
  static QPoint CellCenter(CGridCtrl& g, int col, int row) { return g.CellRect(col, row).center(); }
  static void Press(CGridCtrl& g, QPoint pt, Qt::KeyboardModifiers mods = {}) {
    QTest::mousePress(g.viewport(), Qt::LeftButton, mods, pt);
  }
  static void Release(CGridCtrl& g, QPoint pt, Qt::KeyboardModifiers mods = {}) {
    QTest::mouseRelease(g.viewport(), Qt::LeftButton, mods, pt);
  }
  static void Drag(CGridCtrl& g, QPoint from, QPoint to) {
    QTest::mousePress(g.viewport(), Qt::LeftButton, {}, from);
    // Moves in small steps, as a hand would.
    const int steps = 6;
    for (int i = 1; i <= steps; ++i) {
      const QPoint p = from + (to - from) * i / steps;
      QMouseEvent move(QEvent::MouseMove, QPointF(p), g.viewport()->mapToGlobal(QPointF(p)), Qt::NoButton,
                       Qt::LeftButton, Qt::NoModifier);
      QApplication::sendEvent(g.viewport(), &move);
    }
    QTest::mouseRelease(g.viewport(), Qt::LeftButton, {}, to);
  }
};

TEST_F(GridTest, Grid_PaintRequestsOnlyVisibleCells) {
  RecordingGrid g(27, 500);
  g.show();
  QImage img(g.viewport()->size(), QImage::Format_ARGB32_Premultiplied);
  QPainter p(&img);
  g.PaintTo(p, img.rect());
  p.end();
  ASSERT_FALSE(g.requested.empty());
  int maxRow = -1, maxCol = -1;
  for (auto [c, r] : g.requested) { maxRow = std::max(maxRow, r); maxCol = std::max(maxCol, c); }
  EXPECT_EQ(maxRow, g.GetBottomRow());
  EXPECT_EQ(maxCol, g.GetRightCol());
  EXPECT_LT(maxRow, 20);
  EXPECT_LT(maxCol, 10);
  EXPECT_TRUE(g.requested.count({0, -1})) << "headings are requested too";

  // After scrolling, only the rows now in view are asked for.
  g.requested.clear();
  g.SetTopRow(300);
  p.begin(&img);
  g.PaintTo(p, img.rect());
  p.end();
  int minRow = 1 << 30;
  for (auto [c, r] : g.requested) if (r >= 0) minRow = std::min(minRow, r);
  EXPECT_EQ(minRow, 300);
  EXPECT_EQ(g.GetTopRow(), 300);
}

TEST_F(GridTest, Grid_ClicksReachTheGridWithCellAddress) {
  RecordingGrid g(5, 30);
  g.show();
  const QPoint pt = CellCenter(g, 2, 3);
  Press(g, pt);
  Release(g, pt);
  ASSERT_EQ(g.events.size(), 2u);
  EXPECT_EQ(g.events[0], "L+2,3");
  EXPECT_EQ(g.events[1], "L-2,3");
  EXPECT_EQ(g.GetCurrentRow(), 3);
  EXPECT_EQ(g.GetCurrentCol(), 2);
  EXPECT_TRUE(g.IsRowSelected(3));

  g.events.clear();
  QTest::mouseDClick(g.viewport(), Qt::LeftButton, {}, CellCenter(g, 1, 4));
  EXPECT_NE(std::find(g.events.begin(), g.events.end(), "D1,4"), g.events.end());

  g.events.clear();
  QTest::mousePress(g.viewport(), Qt::RightButton, {}, CellCenter(g, 0, 5));
  QTest::mouseRelease(g.viewport(), Qt::RightButton, {}, CellCenter(g, 0, 5));
  ASSERT_EQ(g.events.size(), 2u);
  EXPECT_EQ(g.events[0], "R+0,5");
  EXPECT_TRUE(g.IsRowSelected(5)) << "a right click selects the row under it";
}

TEST_F(GridTest, Grid_HeadingPressAndReleaseCarryTheColumn) {
  RecordingGrid g(5, 30);
  g.show();
  Press(g, CellCenter(g, 1, -1));
  Release(g, CellCenter(g, 1, -1));
  EXPECT_EQ(g.events, (std::vector<std::string>{"TH+1", "TH-1"}));

  // Released over another heading: the grid sees which one (no sort then).
  g.events.clear();
  Press(g, CellCenter(g, 1, -1));
  Release(g, CellCenter(g, 3, -1));
  EXPECT_EQ(g.events, (std::vector<std::string>{"TH+1", "TH-3"}));

  // Released over the data: column -1.
  g.events.clear();
  Press(g, CellCenter(g, 1, -1));
  Release(g, CellCenter(g, 1, 2));
  EXPECT_EQ(g.events, (std::vector<std::string>{"TH+1", "TH--1"}));
  EXPECT_EQ(g.GetCurrentRow(), -1) << "heading clicks do not select";
}

TEST_F(GridTest, Grid_ColumnSizedByDraggingTheHeadingBorder) {
  RecordingGrid g(5, 10);
  g.show();
  const QRect h = g.CellRect(1, -1);
  Drag(g, QPoint(h.right() + 1, h.center().y()), QPoint(h.right() + 41, h.center().y()));
  EXPECT_EQ(g.GetColWidth(1), 100);
  EXPECT_EQ(g.Last(), "size1=100");
  EXPECT_EQ(std::count_if(g.events.begin(), g.events.end(), [](auto& e) { return e.rfind("TH", 0) == 0; }), 0)
      << "sizing is not a heading click";

  // The grid may hold a minimum.
  g.minWidth = 35;
  const QRect h2 = g.CellRect(2, -1);
  Drag(g, QPoint(h2.right() + 1, h2.center().y()), QPoint(h2.left() + 5, h2.center().y()));
  EXPECT_EQ(g.GetColWidth(2), 35);
}

TEST_F(GridTest, Grid_ColumnMovedByDraggingItsHeading) {
  RecordingGrid g(5, 10);
  g.EnableColumnMove(true);
  g.SetColWidth(0, 70);
  g.show();
  // Heading 0 dropped on the right half of heading 2: it becomes column 2.
  const QRect target = g.CellRect(2, -1);
  Drag(g, CellCenter(g, 0, -1), QPoint(target.right() - 5, target.center().y()));
  EXPECT_NE(std::find(g.events.begin(), g.events.end(), "colmove0>2"), g.events.end());
  EXPECT_EQ(g.GetColWidth(2), 70) << "the width moves with the column";
  EXPECT_EQ(g.GetColWidth(0), 60);
  // The release is not over the pressed column, so a press/release sort would not fire.
  EXPECT_EQ(g.Last(), "TH-2");
}

TEST_F(GridTest, Grid_RowsMovedByDragging) {
  RecordingGrid g(3, 10);
  g.EnableRowMove(true);
  g.show();
  const QRect target = g.CellRect(0, 5);
  Drag(g, CellCenter(g, 0, 1), QPoint(target.center().x(), target.top() + 2));
  EXPECT_NE(std::find(g.events.begin(), g.events.end(), "rowmove1;>5"), g.events.end());
  EXPECT_EQ(g.order, (std::vector<int>{0, 2, 3, 4, 1, 5, 6, 7, 8, 9}));
  EXPECT_TRUE(g.IsRowSelected(4)) << "the moved row stays selected where it landed";
  EXPECT_EQ(g.GetCurrentRow(), 4);

  // Several selected rows move together.
  g.SetSelectionMode(CGridCtrl::MultiSelection);
  g.SelectRow(0);
  g.SelectRow(2, true);
  const QRect end = g.CellRect(0, 9);
  Drag(g, CellCenter(g, 0, 2), QPoint(end.center().x(), end.bottom() - 1));
  EXPECT_EQ(g.order, (std::vector<int>{2, 4, 1, 5, 6, 7, 8, 9, 0, 3}));
}

TEST_F(GridTest, Grid_ApplyRowMoveKeepsEveryEntry) {
  std::vector<int> v{0, 1, 2, 3, 4, 5};
  EXPECT_EQ(CGridCtrl::ApplyRowMove(v, {4, 5}, 0), 0);
  EXPECT_EQ(v, (std::vector<int>{4, 5, 0, 1, 2, 3}));
  v = {0, 1, 2, 3, 4, 5};
  EXPECT_EQ(CGridCtrl::ApplyRowMove(v, {0, 2}, 6), 4);
  EXPECT_EQ(v, (std::vector<int>{1, 3, 4, 5, 0, 2}));
  v = {0, 1, 2};
  CGridCtrl::ApplyRowMove(v, {1}, 1);
  EXPECT_EQ(v, (std::vector<int>{0, 1, 2}));
}

TEST_F(GridTest, Grid_EditInPlaceCommitsOrCancels) {
  RecordingGrid g(4, 10);
  g.show();
  g.GotoCell(1, 2);
  QTest::keyClick(&g, Qt::Key_F2);
  ASSERT_TRUE(g.IsEditing());
  EXPECT_EQ(g.Editor()->text(), QStringLiteral("r2c1")) << "the editor starts with the cell's text";
  g.Editor()->setText(QStringLiteral("250"));
  QTest::keyClick(g.Editor(), Qt::Key_Return);
  EXPECT_FALSE(g.IsEditing());
  EXPECT_EQ(g.edited, QStringLiteral("250"));
  EXPECT_EQ(g.Last(), "editdone1,2");

  // Typing starts editing with the typed character; Escape drops the text.
  QTest::keyClick(&g, Qt::Key_7);
  ASSERT_TRUE(g.IsEditing());
  EXPECT_EQ(g.Editor()->text(), QStringLiteral("7"));
  QTest::keyClick(g.Editor(), Qt::Key_Escape);
  EXPECT_FALSE(g.IsEditing());
  EXPECT_EQ(g.Last(), "editcancel1,2");
  EXPECT_EQ(g.edited, QStringLiteral("250"));

  // A grid that refuses editing keeps the cell as it is.
  g.editable = false;
  EXPECT_FALSE(g.StartEdit(0, 0));
  EXPECT_FALSE(g.IsEditing());
}

TEST_F(GridTest, Grid_MultiSelectionWithControlAndShift) {
  RecordingGrid g(3, 20);
  g.SetSelectionMode(CGridCtrl::MultiSelection);
  g.show();
  Press(g, CellCenter(g, 0, 2));
  Release(g, CellCenter(g, 0, 2));
  Press(g, CellCenter(g, 0, 5), Qt::ShiftModifier);
  Release(g, CellCenter(g, 0, 5), Qt::ShiftModifier);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{2, 3, 4, 5}));
  Press(g, CellCenter(g, 0, 3), Qt::ControlModifier);
  Release(g, CellCenter(g, 0, 3), Qt::ControlModifier);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{2, 4, 5}));
  Press(g, CellCenter(g, 0, 8));
  Release(g, CellCenter(g, 0, 8));
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{8}));

  // Single selection ignores the modifiers.
  g.SetSelectionMode(CGridCtrl::SingleSelection);
  Press(g, CellCenter(g, 0, 10), Qt::ShiftModifier);
  Release(g, CellCenter(g, 0, 10), Qt::ShiftModifier);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{10}));

  // Rows that disappear leave the selection.
  g.SetNumberRows(5);
  EXPECT_TRUE(g.GetSelectedRows().empty());
}

TEST_F(GridTest, Grid_HintsAndCursorComeFromTheGrid) {
  RecordingGrid g(4, 10);
  g.show();
  QString text;
  EXPECT_TRUE(g.HintAt(CellCenter(g, 2, 3), &text));
  EXPECT_EQ(text, QStringLiteral("hint for 3"));
  EXPECT_FALSE(g.HintAt(CellCenter(g, 1, 3), &text));
  // The tooltip event asks the grid as well.
  QHelpEvent he(QEvent::ToolTip, CellCenter(g, 2, 1), g.viewport()->mapToGlobal(CellCenter(g, 2, 1)));
  QApplication::sendEvent(g.viewport(), &he);
  EXPECT_EQ(g.Last(), "hint2,1");

  QTest::mouseMove(g.viewport(), CellCenter(g, 1, 2));
  EXPECT_EQ(g.GridCursor(), Qt::PointingHandCursor);
  QTest::mouseMove(g.viewport(), CellCenter(g, 0, 2));
  EXPECT_EQ(g.GridCursor(), Qt::ArrowCursor);
  const QRect h = g.CellRect(0, -1);
  QTest::mouseMove(g.viewport(), QPoint(h.right(), h.center().y()));
  EXPECT_EQ(g.GridCursor(), Qt::SplitHCursor) << "a heading border offers sizing";
}

TEST_F(GridTest, Grid_StockTypesNotifyTheGrid) {
  RecordingGrid g(4, 10);
  CGridButtonType button(&g);
  CGridCheckBoxType check(&g);
  g.QuickSetCellType(1, 2, &button);
  g.QuickSetCellType(2, 2, &check);
  g.QuickSetNumber(2, 2, 1);
  g.show();

  Press(g, CellCenter(g, 1, 2));
  EXPECT_TRUE(g.GetCellFlags(1, 2) & CGridCell::kFlagPressed) << "the button shows pushed in";
  Release(g, CellCenter(g, 1, 2));
  EXPECT_FALSE(g.GetCellFlags(1, 2) & CGridCell::kFlagPressed);
  EXPECT_EQ(g.Last(), "notify2:0@1,2");
  EXPECT_EQ(std::count(g.events.begin(), g.events.end(), "L+1,2"), 0) << "the button keeps the click";

  // Released elsewhere: no click.
  g.events.clear();
  Press(g, CellCenter(g, 1, 2));
  Release(g, CellCenter(g, 3, 5));
  EXPECT_TRUE(g.events.empty());

  // The check box asks for the new state; the cell is the grid's to change.
  Press(g, CellCenter(g, 2, 2));
  Release(g, CellCenter(g, 2, 2));
  EXPECT_EQ(g.events.front(), "notify1:0@2,2");
}

TEST_F(GridTest, Grid_DropListChoosesAnItem) {
  RecordingGrid g(4, 10);
  CGridDropListType drop(&g);
  g.QuickSetCellType(3, 1, &drop);
  g.QuickSetText(3, 1, QStringLiteral("100\n200\n500"));
  g.show();
  const QRect r = g.CellRect(3, 1);
  Press(g, CGridDropListType::ButtonRect(r).center());
  Release(g, CGridDropListType::ButtonRect(r).center());
  ASSERT_TRUE(drop.IsListOpen());
  EXPECT_EQ(drop.ListCol(), 3);
  EXPECT_EQ(drop.DropList()->count(), 1) << "one line of text, one item";
  drop.DropList()->Choose(0);
  EXPECT_FALSE(drop.IsListOpen());
  EXPECT_EQ(g.Last(), "notify3:0@3,1");
  // A press on another cell closes an open list.
  Press(g, CGridDropListType::ButtonRect(r).center());
  ASSERT_TRUE(drop.IsListOpen());
  Press(g, CellCenter(g, 0, 5));
  EXPECT_FALSE(drop.IsListOpen());
}

TEST_F(GridTest, Grid_KeysMoveTheCurrentRowAndCopy) {
  RecordingGrid g(3, 100);
  g.show();
  g.GotoCell(0, 0);
  QTest::keyClick(&g, Qt::Key_Down);
  QTest::keyClick(&g, Qt::Key_Down);
  EXPECT_EQ(g.GetCurrentRow(), 2);
  QTest::keyClick(&g, Qt::Key_End);
  EXPECT_EQ(g.GetCurrentRow(), 99);
  EXPECT_EQ(g.GetBottomRow(), 99) << "the current row is scrolled into view";
  auto recorder = std::make_unique<platform::RecordingDialogService>();
  auto* rec = recorder.get();
  platform::SetDialogService(std::move(recorder));
  QTest::keyClick(&g, Qt::Key_C, Qt::ControlModifier);
  EXPECT_EQ(rec->clipboard, QStringLiteral("r99c0\tr99c1\tr99c2\n"));
  platform::SetDialogService(nullptr);
  EXPECT_TRUE(g.FindNext(QStringLiteral("R5C1")));
  EXPECT_EQ(g.GetCurrentRow(), 5);
  EXPECT_EQ(g.GetCurrentCol(), 1);
}

}  // namespace

// The terminal's --dump reads what a user sees: headings first, every row
// (visible or scrolled away), hidden columns left out.
TEST_F(GridTest, Grid_DumpShowsHeadingsAndEveryRowWithoutHiddenColumns) {
  RecordingGrid g(3, 40);
  g.SetColWidth(1, 0);
  const QStringList lines = g.dumpTsv().split(QLatin1Char('\n'), Qt::SkipEmptyParts);
  ASSERT_EQ(lines.size(), 41);
  EXPECT_EQ(lines[0], QStringLiteral("H0\tH2"));
  EXPECT_EQ(lines[1], QStringLiteral("r0c0\tr0c2"));
  EXPECT_EQ(lines[40], QStringLiteral("r39c0\tr39c2"));
}

namespace {

// A grid that shows only what is stored in it, or the texts a test gives.
class StoredGrid : public CGridCtrl {
 public:
  StoredGrid(int cols, int rows) {
    SetNumberCols(cols);
    SetNumberRows(rows);
    for (int c = 0; c < cols; ++c) SetColWidth(c, 50 + 10 * c);
    resize(400, 300);
  }
  std::map<std::pair<int, int>, QString> texts;  // overrides by (col, row)

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override {
    auto it = texts.find({col, row});
    if (it != texts.end()) cell.text = it->second;
  }
};

// A moved column takes its stored cells (headings included), its flags and
// its width; the columns between shift by one; the side heading stays.
TEST_F(GridTest, Grid_MovedColumnTakesItsStoredCellsFlagsAndWidth) {
  StoredGrid g(4, 3);
  for (int c = 0; c < 4; ++c) {
    g.QuickSetText(c, -1, QStringLiteral("H%1").arg(c));
    for (int r = 0; r < 3; ++r) g.QuickSetText(c, r, QStringLiteral("c%1r%2").arg(c).arg(r));
  }
  g.QuickSetText(-1, 1, QStringLiteral("side"));
  g.SetCellFlags(1, 2, 0x40);
  g.SetCellFlags(3, 0, 0x80);
  g.GotoCell(1, 0);

  g.MoveColumn(1, 3);
  EXPECT_EQ(g.dumpTsv(), QStringLiteral("H0\tH2\tH3\tH1\n"
                                        "c0r0\tc2r0\tc3r0\tc1r0\n"
                                        "c0r1\tc2r1\tc3r1\tc1r1\n"
                                        "c0r2\tc2r2\tc3r2\tc1r2\n"));
  EXPECT_EQ(g.GetCellFlags(3, 2), 0x40u);
  EXPECT_EQ(g.GetCellFlags(1, 2), 0u);
  EXPECT_EQ(g.GetCellFlags(2, 0), 0x80u);
  EXPECT_EQ((std::vector<int>{g.GetColWidth(0), g.GetColWidth(1), g.GetColWidth(2), g.GetColWidth(3)}),
            (std::vector<int>{50, 70, 80, 60}));
  EXPECT_EQ(g.GetCurrentCol(), 3) << "the current cell moves with its column";
  CGridCell side;
  g.GetCell(-1, 1, side);
  EXPECT_EQ(side.text, QStringLiteral("side"));

  // And back to the left: the order is restored.
  g.MoveColumn(3, 1);
  EXPECT_EQ(g.dumpTsv().split('\n')[1], QStringLiteral("c0r0\tc1r0\tc2r0\tc3r0"));
  EXPECT_EQ(g.GetCellFlags(1, 2), 0x40u);
  EXPECT_EQ(g.GetCellFlags(3, 0), 0x80u);
  // Moves outside the columns do nothing.
  g.MoveColumn(0, 4);
  g.MoveColumn(-1, 2);
  EXPECT_EQ(g.dumpTsv().split('\n')[0], QStringLiteral("H0\tH1\tH2\tH3"));
}

TEST_F(GridTest, Grid_SingleSelectionKeepsOneRowWhateverIsAdded) {
  RecordingGrid g(3, 10);
  g.show();
  g.SetSelectionMode(CGridCtrl::SingleSelection);
  g.SelectRow(2);
  g.SelectRow(5, true);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{5}));
  g.SelectRange(1, 3, true);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{3}));
  Press(g, CellCenter(g, 0, 7), Qt::ControlModifier);
  Release(g, CellCenter(g, 0, 7), Qt::ControlModifier);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{7}));

  // With multiple selection the same calls add.
  g.SetSelectionMode(CGridCtrl::MultiSelection);
  g.SelectRow(2, true);
  g.SelectRange(4, 5, true);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{2, 4, 5, 7}));
  g.SelectRow(9);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{9}));
}

// Tabs and line breaks inside a cell would shift columns and rows of the dump:
// they become spaces there (and only there).
TEST_F(GridTest, Grid_DumpKeepsOneLinePerRowWhateverTheCellsHold) {
  StoredGrid g(3, 2);
  g.texts[{0, -1}] = QStringLiteral("Na\tme");
  g.texts[{1, -1}] = QStringLiteral("Two\nLines");
  g.texts[{2, -1}] = QStringLiteral("Plain");
  g.texts[{0, 0}] = QStringLiteral("a\tb\tc");
  g.texts[{1, 0}] = QStringLiteral("x\r\ny");
  g.texts[{2, 0}] = QStringLiteral("\t");
  g.texts[{1, 1}] = QStringLiteral("last");
  EXPECT_EQ(g.dumpTsv(), QStringLiteral("Na me\tTwo Lines\tPlain\n"
                                        "a b c\tx  y\t \n"
                                        "\tlast\t\n"));
  CGridCell cell;
  g.GetCell(0, 0, cell);
  EXPECT_EQ(cell.text, QStringLiteral("a\tb\tc")) << "the cell itself keeps its text";
}

// A grid whose rows can be dragged out; a runner stands in for the drag.
class DragOutGrid : public RecordingGrid {
 public:
  using RecordingGrid::RecordingGrid;
  bool refuse = false;
  std::vector<int> dragged;
  std::vector<Qt::DropAction> done;
  bool OnDragOutData(const std::vector<int>& rows, QMimeData& mime) override {
    dragged = rows;
    if (refuse) return false;
    QByteArray text;
    for (int r : rows) text += QByteArray::number(order[std::size_t(r)]) + ";";
    mime.setData("text/x-test-rows", text);
    return true;
  }
  void OnDragOutDone(Qt::DropAction action) override { done.push_back(action); }
};

struct DragRunnerScope {
  explicit DragRunnerScope(CGridCtrl::DragRunner runner) { CGridCtrl::SetDragRunner(std::move(runner)); }
  ~DragRunnerScope() { CGridCtrl::SetDragRunner(nullptr); }
};

TEST_F(GridTest, Grid_RowsDraggedOutCarryTheSelectionAndMoveOnlyWhenDroppedBackOnAMovableGrid) {
  DragOutGrid g(3, 10);
  g.SetSelectionMode(CGridCtrl::MultiSelection);
  g.EnableDragOut(true);
  g.show();
  std::vector<QByteArray> payloads;
  bool dropBack = false, taken = false;
  QPoint dropAt;
  DragRunnerScope scope([&](QDrag& d) {
    payloads.push_back(d.mimeData()->data("text/x-test-rows"));
    EXPECT_FALSE(d.mimeData()->data(CGridCtrl::kOwnRowsMimeType).isEmpty()) << "marked as the grid's own";
    if (!dropBack) return Qt::IgnoreAction;
    taken = g.HandleDrop(d.mimeData(), dropAt);
    return taken ? Qt::MoveAction : Qt::IgnoreAction;
  });
  // Less than the start distance is a click, not a drag.
  const QPoint row1 = CellCenter(g, 0, 1);
  Drag(g, row1, row1 + QPoint(1, 0));
  EXPECT_TRUE(payloads.empty());
  // An unselected row goes alone; nothing moves when nothing takes it.
  Drag(g, row1, CellCenter(g, 0, 6));
  ASSERT_EQ(payloads.size(), 1u);
  EXPECT_EQ(g.dragged, (std::vector<int>{1}));
  EXPECT_EQ(payloads[0], "1;");
  EXPECT_EQ(g.done, (std::vector<Qt::DropAction>{Qt::IgnoreAction}));
  EXPECT_EQ(g.order, (std::vector<int>{0, 1, 2, 3, 4, 5, 6, 7, 8, 9}));
  // The selected rows travel together in row order, whichever of them is pressed.
  g.SelectRow(2);
  g.SelectRow(4, true);
  g.SelectRow(5, true);
  Drag(g, CellCenter(g, 0, 4), CellCenter(g, 0, 8));
  EXPECT_EQ(g.dragged, (std::vector<int>{2, 4, 5}));
  EXPECT_EQ(payloads.back(), "2;4;5;");
  EXPECT_TRUE(g.IsRowSelected(2) && g.IsRowSelected(4) && g.IsRowSelected(5)) << "the press kept the selection";

  // Dropped back on a grid whose rows move: they move there and stay selected.
  g.EnableRowMove(true);
  dropBack = true;
  dropAt = QPoint(CellCenter(g, 0, 0).x(), g.CellRect(0, 0).top() + 2);
  Drag(g, CellCenter(g, 0, 4), CellCenter(g, 0, 8));
  EXPECT_TRUE(taken);
  EXPECT_EQ(g.order, (std::vector<int>{2, 4, 5, 0, 1, 3, 6, 7, 8, 9}));
  EXPECT_EQ(g.done.back(), Qt::MoveAction);
  EXPECT_TRUE(g.IsRowSelected(0) && g.IsRowSelected(1) && g.IsRowSelected(2));
  // Without row moving, the grid refuses its own rows.
  g.EnableRowMove(false);
  Drag(g, CellCenter(g, 0, 0), CellCenter(g, 0, 8));
  EXPECT_FALSE(taken);
  EXPECT_EQ(g.order, (std::vector<int>{2, 4, 5, 0, 1, 3, 6, 7, 8, 9}));
  // Another drag's data is never taken for a row move.
  g.EnableRowMove(true);
  QMimeData foreign;
  foreign.setData(CGridCtrl::kOwnRowsMimeType, "someone-else");
  EXPECT_FALSE(g.HandleDrop(&foreign, dropAt));
  // A grid that refuses the rows starts no drag: the same gesture selects rows.
  g.refuse = true;
  const std::size_t before = payloads.size();
  Drag(g, CellCenter(g, 0, 3), CellCenter(g, 0, 8));
  EXPECT_EQ(payloads.size(), before);
  EXPECT_EQ(g.GetSelectedRows(), (std::vector<int>{3, 4, 5, 6, 7, 8}));
}

}  // namespace
