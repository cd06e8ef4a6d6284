#pragma once
// The cell grid every grid of the add-on derives from. It paints only the
// visible cells and asks the derived grid for their content (OnGetCell), so a
// grid over a store keeps nothing per cell. User actions reach the derived grid
// as the virtual notifications below.
//
// Coordinates: data cells are (col >= 0, row >= 0). The top heading row is
// row -1, the side heading column is col -1, the corner button is (-1, -1).
// Rows share one height; columns have their own widths.
//
//   class DepthGrid : public CGridCtrl {
//     DepthGrid() { SetNumberCols(6); SetDefRowHeight(21); SetTH_Height(21); }
//     void OnGetCell(int col, int row, CGridCell& cell) override {
//       if (row == -1) { cell.SetText(heading[col]); return; }
//       cell.SetText(levelText(row, col));               // from the store, now
//       cell.SetAlignment(Qt::AlignRight | Qt::AlignVCenter);
//       cell.SetBackColor(row % 2 ? oddColor : evenColor);  // COLORREF or QColor
//     }
//     void OnLClicked(int col, int row, bool pressed, const QRect&, const QPoint&) override {
//       if (!pressed && col >= 0 && row >= 0) ...;     // release on a data cell
//     }
//   };
// A timer that sees new data calls RedrawAll(); only visible cells are asked for.
#include <QAbstractScrollArea>
#include <QFont>
#include <QPointer>
#include <algorithm>
#include <cstdint>
#include <functional>
#include <memory>
#include <unordered_map>
#include <vector>

#include "grid/GridCell.h"
#include "grid/GridCellType.h"

class QDrag;
class QDropEvent;
class QLineEdit;
class QMimeData;
class IStyleManager;

class CGridCtrl : public QAbstractScrollArea {
  Q_OBJECT
 public:
  enum { kHeading = -1 };
  enum SelectionMode { SingleSelection, MultiSelection };

  explicit CGridCtrl(QWidget* parent = nullptr);
  ~CGridCtrl() override;

  // ---- Shape ----
  void SetNumberCols(int cols);
  int GetNumberCols() const { return int(m_colWidths.size()); }
  void SetNumberRows(int rows);
  int GetNumberRows() const { return m_rows; }
  void SetColWidth(int col, int width);  // col -1: the side heading
  int GetColWidth(int col) const;
  void SetDefColWidth(int width) { m_defColWidth = width; }
  void SetDefRowHeight(int height);
  int GetDefRowHeight() const { return m_rowHeight; }
  void SetTH_Height(int height);  // 0 hides the top heading
  int GetTH_Height() const { return m_headHeight; }
  void SetSH_Width(int width) { SetColWidth(-1, width); }  // 0 hides the side heading
  int GetSH_Width() const { return m_sideWidth; }

  // ---- Look ----
  void SetDefFont(const QFont& font);
  const QFont& GetDefFont() const { return m_font; }
  void SetHeadingFont(const QFont& font) { m_headFont = font; viewport()->update(); }
  const QFont& GetHeadingFont() const { return m_headFont; }
  struct Colors {
    QColor back{255, 255, 255};         // cells without a colour
    QColor text{0, 0, 0};
    QColor gridLine{208, 208, 208};     // cell borders
    QColor headBack{236, 236, 236};
    QColor headText{0, 0, 0};
    QColor headLine{180, 180, 180};
    QColor selBack{197, 210, 250};      // selected cells when highlighting is on
    QColor selText{0, 0, 0};
    QColor empty{255, 255, 255};        // area right of and below the cells
  };
  void SetColors(const Colors& colors);
  const Colors& GetColors() const { return m_colors; }
  // Colours and scroll bars from the terminal's style (see skin/Skin.h for the ids).
  void ApplyStyle(const IStyleManager* style);
  // Draw selected data cells in the selection colours (default on). Grids that
  // colour selected rows themselves in OnGetCell turn this off.
  void SetHighlightSelection(bool on) { m_highlight = on; viewport()->update(); }
  bool HighlightSelection() const { return m_highlight; }
  void SetShowCurrentCell(bool on) { m_showCurrent = on; viewport()->update(); }
  void SetDefCellType(CGridCellType* type) { m_userDefType = type; }  // null: plain text
  CGridCellType* GetDefCellType() { return m_userDefType ? m_userDefType : &m_textType; }
  CGridHeadingType* GetHeadingType() { return &m_headType; }

  // ---- Stored cells (optional; for headings and small static grids) ----
  // A stored cell is the starting point OnGetCell receives for that address.
  void SetCell(int col, int row, const CGridCell& cell);
  bool HasStoredCell(int col, int row) const;
  void QuickSetText(int col, int row, const QString& text);
  void QuickSetCellType(int col, int row, CGridCellType* type);
  void QuickSetNumber(int col, int row, double number);
  void QuickSetAlignment(int col, int row, int alignment);
  void ClearStoredCells();
  // Persistent property flags (pressed marks and the like) ORed into the cell
  // after OnGetCell.
  void SetCellFlags(int col, int row, std::uint32_t flags);
  std::uint32_t GetCellFlags(int col, int row) const;

  // The cell as it will be drawn: stored cell, OnGetCell, then flags.
  void GetCell(int col, int row, CGridCell& cell);
  CGridCellType* CellTypeOf(const CGridCell& cell, int col, int row);

  // ---- Selection and current cell ----
  void SetSelectionMode(SelectionMode mode) { m_selMode = mode; }
  SelectionMode GetSelectionMode() const { return m_selMode; }
  int GetCurrentCol() const { return m_curCol; }
  int GetCurrentRow() const { return m_curRow; }
  // Moves the current cell (scrolling it into view) and selects its row alone.
  void GotoCell(int col, int row);
  void SelectRow(int row, bool add = false);
  void SelectRange(int first, int last, bool add = false);
  void ClearSelection();
  bool IsRowSelected(int row) const;
  // Selected rows in ascending order.
  std::vector<int> GetSelectedRows() const;

  // ---- Scrolling and geometry ----
  int GetTopRow() const;
  int GetLeftCol() const;
  // Visible data range (inclusive); -1 when none.
  int GetBottomRow() const;
  int GetRightCol() const;
  void SetTopRow(int row);
  void EnsureVisible(int col, int row);
  // Cell at a viewport point: false outside every cell; col/row -1 on headings.
  bool HitTest(const QPoint& pt, int* col, int* row) const;
  // Viewport rectangle of a cell (headings included); empty when out of view.
  QRect CellRect(int col, int row) const;
  // Width of the whole data area and of the visible data area.
  int TotalColWidth() const { return m_colPos.empty() ? 0 : m_colPos.back(); }
  int ClientDataWidth() const;
  int ClientDataHeight() const;
  int VScrollBarWidth() const;

  // ---- Redraw ----
  void RedrawAll() { viewport()->update(); }
  void RedrawCell(int col, int row);
  void RedrawRow(int row);
  // Paints the visible part into `p` (sized like the viewport); used by the
  // paint event and by benchmarks and image renders.
  void PaintTo(QPainter& p, const QRect& clip);
  // What the user sees, as tab-separated text: the heading texts, then one line
  // per row; hidden (zero-width) columns left out; tabs and line breaks inside a
  // cell become spaces. The terminal's --dump finds grids through this method.
  Q_INVOKABLE QString dumpTsv() const;

  // ---- Editing, hints, find, clipboard ----
  // Opens the in-place editor over the cell unless OnEditStart refuses.
  bool StartEdit(int col, int row, const QString& initial = QString(), bool useInitial = false);
  // Ends editing: the text goes to OnEditFinish (cancelled: it is dropped).
  void EndEdit(bool cancel = false);
  bool IsEditing() const;
  QLineEdit* Editor() const;
  // Asks OnHint for the cell at `pt`; true and the text when there is one.
  bool HintAt(const QPoint& pt, QString* text);
  void ShowHint(const QString& text, const QPoint& viewportPt);
  void HideHint();
  // Next data cell after the current one whose text contains `text`
  // (case-insensitive), going row by row; moves there and returns true.
  bool FindNext(const QString& text);
  // The selected rows as tab-separated text, one line per row.
  QString SelectionText();

  // ---- Dragging ----
  void EnableColumnSizing(bool on) { m_colSizing = on; }
  void EnableColumnMove(bool on) { m_colMoving = on; }
  void EnableRowMove(bool on) { m_rowMoving = on; }
  // Moves column `from` to position `to` (widths and stored cells move with it).
  void MoveColumn(int from, int to);

  // ---- Dragging rows out ----
  // With drag-out on, a press on a data row and a move beyond the start
  // distance drags the selected rows (the pressed row alone when it is not
  // selected) out of the grid: OnDragOutData fills the payload, the drag
  // runner runs the drag. Dropped back on the grid, the rows move there when
  // row moving is on (OnCanMoveRows, OnRowsMoved, as a move by mouse); a drop
  // elsewhere is the target's to take or refuse.
  void EnableDragOut(bool on) { m_dragOut = on; }
  bool DragOutEnabled() const { return m_dragOut; }
  // Runs a drag to its end and returns the drop's action (IgnoreAction: not
  // dropped or refused). The default executes the QDrag (Copy, or Move onto
  // the grid itself). Tests install their own; null restores the default.
  using DragRunner = std::function<Qt::DropAction(QDrag& drag)>;
  static void SetDragRunner(DragRunner runner);
  // The mime type that marks a grid's own rows in its drag.
  static constexpr const char* kOwnRowsMimeType = "application/x-marketviews-grid-rows";
  // A drag over or dropped on the grid (what the viewport receives): true
  // when the grid takes it. Used by the viewport's events and by tests.
  bool HandleDragOver(const QMimeData* mime, const QPoint& viewportPt);
  bool HandleDrop(const QMimeData* mime, const QPoint& viewportPt);
  void HandleDragLeave();

  // ---- Called by cell types ----
  void SetGridCursor(Qt::CursorShape shape);
  Qt::CursorShape GridCursor() const { return m_cursor; }
  int CellTypeNotify(CGridCellType* type, int col, int row, int code, std::intptr_t param) {
    return OnCellTypeNotify(type, col, row, code, param);
  }
  void SetOpenDropList(CGridDropListType* type) { m_openDrop = type; }

  // Moves the entries `rows` (ascending, distinct) of `items` so that they
  // come before the entry that was at index `to` (to == size: the end), the
  // way the engine moves rows. Returns the new index of the first moved row.
  template <class T>
  static int ApplyRowMove(std::vector<T>& items, const std::vector<int>& rows, int to);

 protected:
  // ---- Notifications to the derived grid ----
  virtual void OnGetCell(int col, int row, CGridCell& cell) {}
  virtual void OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) {}
  virtual void OnRClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) {}
  virtual void OnDClicked(int col, int row, const QRect& rect, const QPoint& pt) {}
  // Top heading (pressed/released with the column, so press and release on
  // the same column can sort).
  virtual void OnTH_LClicked(int col, bool pressed, const QRect& rect, const QPoint& pt) {}
  virtual void OnTH_RClicked(int col, bool pressed, const QRect& rect, const QPoint& pt) {}
  virtual void OnTH_DClicked(int col, const QRect& rect, const QPoint& pt) {}
  virtual void OnSH_LClicked(int row, bool pressed, const QRect& rect, const QPoint& pt) {}
  virtual void OnSH_DClicked(int row, const QRect& rect, const QPoint& pt) {}
  virtual void OnCB_LClicked(bool pressed, const QRect& rect, const QPoint& pt) {}
  // The pointer moved over (col, row) (headings -1; outside every cell both
  // are -2). The engine has set the arrow cursor; SetGridCursor changes it.
  virtual void OnMouseMove(int col, int row, const QPoint& pt, Qt::MouseButtons buttons) {}
  // A hint for the cell; true shows `text`.
  virtual bool OnHint(int col, int row, QString& text) { return false; }
  // A heading border was dragged: `width` is the new width, may be changed.
  virtual void OnColSized(int col, int& width) {}
  // Column move by dragging its heading. OnCanMoveCol may refuse; after the
  // move OnColMoved tells the grid to reorder what it keeps per column.
  virtual bool OnCanMoveCol(int from, int to) { return true; }
  virtual void OnColMoved(int from, int to) {}
  // Rows dragged: `rows` (ascending) go before the row that was at `to`
  // (GetNumberRows(): the end). See ApplyRowMove. The engine keeps no row data.
  virtual bool OnCanMoveRows(const std::vector<int>& rows, int to) { return true; }
  virtual void OnRowsMoved(const std::vector<int>& rows, int to) {}
  // A drag of `rows` (ascending) out of the grid starts: fill `mime`, or
  // return false to drag nothing. After the drag, OnDragOutDone with the
  // drop's action (IgnoreAction when nothing took it).
  virtual bool OnDragOutData(const std::vector<int>& rows, QMimeData& mime) { return false; }
  virtual void OnDragOutDone(Qt::DropAction action) {}
  // A key; true consumes it (the engine then does nothing with it).
  virtual bool OnKeyDown(int key, Qt::KeyboardModifiers mods) { return false; }
  virtual void OnCellChange(int oldCol, int newCol, int oldRow, int newRow) {}
  virtual void OnSelectionChanged() {}
  // In-place editing: false refuses. `text` starts as the cell's text.
  virtual bool OnEditStart(int col, int row, QString& text) { return false; }
  // The editor was made for the cell (a validator, a length limit...).
  virtual void OnEditorCreated(int col, int row, QLineEdit* editor) {}
  // False keeps the editor open (not for cancel).
  virtual bool OnEditFinish(int col, int row, const QString& text, bool cancelled) { return true; }
  // A cell type reports `code` with `param`.
  virtual int OnCellTypeNotify(CGridCellType* type, int col, int row, int code, std::intptr_t param) { return 0; }
  virtual void OnScrolled() {}
  // The viewport got a new size.
  virtual void OnSize(int width, int height) {}

  // ---- Qt ----
  void paintEvent(QPaintEvent* e) override;
  void resizeEvent(QResizeEvent* e) override;
  void mousePressEvent(QMouseEvent* e) override;
  void mouseReleaseEvent(QMouseEvent* e) override;
  void mouseDoubleClickEvent(QMouseEvent* e) override;
  void mouseMoveEvent(QMouseEvent* e) override;
  void keyPressEvent(QKeyEvent* e) override;
  bool viewportEvent(QEvent* e) override;
  void scrollContentsBy(int dx, int dy) override;
  bool eventFilter(QObject* obj, QEvent* e) override;

 private:
  struct Key {
    static std::uint64_t Of(int col, int row) {
      return (std::uint64_t(std::uint32_t(col)) << 32) | std::uint32_t(row);
    }
  };
  void UpdateColPos();
  void UpdateScrollBars();
  int ColAtX(int dataX) const;  // dataX in content coordinates; -1 when none
  int SizingBorderAt(const QPoint& pt) const;  // column whose right border is at pt, or -1
  void PaintCell(QPainter& p, int col, int row, const QRect& rect, CGridCell& cell);
  void SetCurrent(int col, int row);
  void NotifySelection();
  void LeaveHover();
  void MoveCurrentBy(int dCol, int dRow, Qt::KeyboardModifiers mods);
  void PositionEditor();
  // False when the rows may not go (nothing was dragged).
  bool StartDragOut();
  // Moves `rows` before `to` when that changes anything and the grid agrees.
  void MoveRowsTo(std::vector<int> rows, int to);
  int RowInsertionAt(const QPoint& pt) const;

  // shape
  std::vector<int> m_colWidths;
  std::vector<int> m_colPos;  // m_colPos[i] = left of col i; back() = total
  int m_rows = 0;
  int m_rowHeight = 20;
  int m_headHeight = 20;
  int m_sideWidth = 0;
  int m_defColWidth = 80;
  // look
  QFont m_font;
  QFont m_headFont;
  Colors m_colors;
  bool m_highlight = true;
  bool m_showCurrent = false;
  CGridCellType m_textType{this};
  CGridHeadingType m_headType{this};
  CGridCellType* m_userDefType = nullptr;
  // cells
  std::unordered_map<std::uint64_t, CGridCell> m_stored;
  std::unordered_map<std::uint64_t, std::uint32_t> m_flags;
  // selection
  SelectionMode m_selMode = SingleSelection;
  int m_curCol = -1, m_curRow = -1;
  int m_anchorRow = -1;
  std::vector<char> m_selected;  // per row
  int m_selCount = 0;
  // mouse
  enum class Drag { None, Pending, ColSize, ColMove, RowMove, Select };
  Drag m_drag = Drag::None;
  QPoint m_pressPt;
  int m_pressCol = -2, m_pressRow = -2;
  CGridCellType* m_pressType = nullptr;
  bool m_pressHandled = false;
  int m_sizeCol = -1, m_sizeStartWidth = 0;
  int m_dropTarget = -1;  // column or row insertion index while dragging
  int m_hoverCol = -2, m_hoverRow = -2;
  CGridCellType* m_hoverType = nullptr;
  Qt::CursorShape m_cursor = Qt::ArrowCursor;
  bool m_colSizing = true, m_colMoving = false, m_rowMoving = false;
  // drag-out
  bool m_dragOut = false;
  bool m_dragOutRunning = false;
  std::vector<int> m_outRows;  // the rows of the running drag
  QByteArray m_outToken;       // marks this grid's own drag
  CGridDropListType* m_openDrop = nullptr;
  // editing
  QPointer<QLineEdit> m_editor;
  int m_editCol = -1, m_editRow = -1;
  bool m_ending = false;
  int m_findFrom = 0;
};

template <class T>
int CGridCtrl::ApplyRowMove(std::vector<T>& items, const std::vector<int>& rows, int to) {
  std::vector<T> moved;
  std::vector<T> rest;
  moved.reserve(rows.size());
  rest.reserve(items.size());
  int insertAt = 0;
  std::size_t k = 0;
  for (int i = 0; i < int(items.size()); ++i) {
    if (i == to) insertAt = int(rest.size());
    if (k < rows.size() && rows[k] == i) { moved.push_back(std::move(items[i])); ++k; }
    else rest.push_back(std::move(items[i]));
  }
  if (to >= int(items.size())) insertAt = int(rest.size());
  rest.insert(rest.begin() + insertAt, std::make_move_iterator(moved.begin()), std::make_move_iterator(moved.end()));
  items = std::move(rest);
  return insertAt;
}
