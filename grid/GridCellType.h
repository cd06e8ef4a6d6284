#pragma once
// Cell types draw and handle the cells that carry them. A type belongs to one
// grid (it is usually a member of the grid that uses it) and talks back to the
// grid through Notify(code, param), which reaches CGridCtrl::OnCellTypeNotify.
#include <QPainter>
#include <QPoint>
#include <QRect>
#include <QStringList>
#include <QUuid>
#include <cstdint>
#include <string>

#include "grid/GridCell.h"

class CGridCtrl;
class CUGLstBoxEx;

class CGridCellType {
 public:
  explicit CGridCellType(CGridCtrl* grid = nullptr) : m_grid(grid) {}
  virtual ~CGridCellType();
  CGridCellType(const CGridCellType&) = delete;
  CGridCellType& operator=(const CGridCellType&) = delete;

  // ---- The interface, in slot order ----
  virtual std::wstring GetName() const;
  virtual QUuid GetUUID() const;
  // Whether the type handles the mouse inside its cells itself. The engine then
  // neither starts a row drag nor in-place editing from a click on such a cell.
  virtual bool HandlesMouse() const { return false; }
  // Left button, pressed (true) and released (false). On release `col`/`row`
  // are the cell under the pointer (-1 outside the data area); the release is
  // delivered to the type of the cell that was pressed. True: handled, the
  // grid's own OnLClicked is not called.
  virtual bool OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) { return false; }
  virtual bool OnDClicked(int col, int row, const QRect& rect, const QPoint& pt) { return false; }
  virtual bool OnRClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) { return false; }
  // The pointer moves over a cell of this type (col/row -1: it left the cell).
  // The type may set the grid's cursor (CGridCtrl::SetGridCursor).
  virtual void OnMouseMove(int col, int row, const QRect& rect, const QPoint& pt) {}
  virtual void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
                      bool current);
  // A drop list opened by this type closed with item `index` chosen (-1: none).
  virtual void OnDropListSelected(int col, int row, int index, const QString& text) {}
  // Where the in-place editor goes inside the cell (the whole cell by default).
  virtual QRect EditRect(int col, int row, const QRect& cellRect) { return cellRect; }

  // ---- Helpers ----
  CGridCtrl* Grid() const { return m_grid; }
  void SetGrid(CGridCtrl* grid) { m_grid = grid; }
  // Reports `code` with `param` to the grid; returns the grid's answer (0 without a grid).
  int Notify(int col, int row, int code, std::intptr_t param);
  void SetBorderPen(const QPen& pen) { m_borderPen = pen; m_hasBorderPen = true; }

  // The base drawing: background, then the right and bottom border.
  void DrawBackground(QPainter& p, const QRect& rect, const CGridCell& cell, bool selected) const;
  void DrawBorder(QPainter& p, const QRect& rect) const;
  void DrawText(QPainter& p, const QRect& rect, const CGridCell& cell, bool selected) const;
  QColor BackColor(const CGridCell& cell, bool selected) const;
  QColor TextColor(const CGridCell& cell, bool selected) const;

 protected:
  CGridCtrl* m_grid;
  QPen m_borderPen;
  bool m_hasBorderPen = false;
};

// Heading cells: raised face, centred text unless the cell says otherwise.
class CGridHeadingType : public CGridCellType {
 public:
  using CGridCellType::CGridCellType;
  std::wstring GetName() const override { return L"Heading"; }
  QUuid GetUUID() const override;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
  // The face alone (subclasses draw on top of it).
  void DrawFace(QPainter& p, const QRect& rect, const CGridCell& cell) const;
};

// A check box ticked when the cell's number is not 0. A click on the box
// reports kNotifyCheckClicked with the new state (0/1) and does not change the
// cell: the grid decides and redraws.
class CGridCheckBoxType : public CGridCellType {
 public:
  enum { kNotifyCheckClicked = 1 };
  using CGridCellType::CGridCellType;
  std::wstring GetName() const override { return L"CheckBox"; }
  QUuid GetUUID() const override;
  bool OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
  // The square the box occupies inside `rect`.
  static QRect BoxRect(const QRect& rect, int alignment);
  void DrawBox(QPainter& p, const QRect& box, bool ticked, const QColor& frame, const QColor& back,
               const QColor& tick) const;
};

// A heading with a sort arrow: arrow up when the cell's number is 0
// (ascending), down otherwise.
class CGridSortArrowType : public CGridHeadingType {
 public:
  using CGridHeadingType::CGridHeadingType;
  std::wstring GetName() const override { return L"SortArrow"; }
  QUuid GetUUID() const override;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
  static void DrawArrow(QPainter& p, const QRect& area, bool up, const QColor& color);
};

// A push button filling the cell. Press shows it pushed in; release over the
// same cell reports kNotifyButtonClicked.
class CGridButtonType : public CGridCellType {
 public:
  enum { kNotifyButtonClicked = 2 };
  using CGridCellType::CGridCellType;
  std::wstring GetName() const override { return L"Button"; }
  QUuid GetUUID() const override;
  bool HandlesMouse() const override { return true; }
  bool OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
  void DrawFace(QPainter& p, const QRect& rect, const CGridCell& cell, bool pushed) const;

 protected:
  int m_pressCol = -1, m_pressRow = -1;
};

// A cell with a drop button at its right; the button opens a list of the
// lines of the cell's text (or of the items given to OpenList). Choosing an
// item calls OnDropListSelected, whose default reports kNotifyDropSelected
// with the item index; the grid reads the text with DropList()->ItemText().
class CGridDropListType : public CGridCellType {
 public:
  enum { kNotifyDropSelected = 3 };
  explicit CGridDropListType(CGridCtrl* grid = nullptr);
  ~CGridDropListType() override;
  std::wstring GetName() const override { return L"DropList"; }
  QUuid GetUUID() const override;
  bool OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
  void OnDropListSelected(int col, int row, int index, const QString& text) override;

  // Opens the list under `anchor` (grid viewport coordinates) for the cell.
  void OpenList(int col, int row, const QRect& anchor, const QStringList& items);
  void CloseList();
  bool IsListOpen() const;
  int ListCol() const { return m_listCol; }
  int ListRow() const { return m_listRow; }
  CUGLstBoxEx* DropList();
  static QRect ButtonRect(const QRect& rect);

 protected:
  CUGLstBoxEx* m_list = nullptr;  // created on first use, parented to the grid
  int m_listCol = -1, m_listRow = -1;
};
