#pragma once
// One cell of a grid as the engine hands it to a cell type for drawing. Grids
// fill cells on demand (CGridCtrl::OnGetCell); nothing has to be stored per cell.
#include <QColor>
#include <QFont>
#include <QString>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "hostview/Text.h"
#include "hostview/Types.h"

class CGridCellType;

inline QColor ColorFromRef(COLORREF c) {
  return QColor(int(ColorRefRed(c)), int(ColorRefGreen(c)), int(ColorRefBlue(c)));
}
inline COLORREF RefFromColor(const QColor& c) {
  return MakeColorRef(unsigned(c.red()), unsigned(c.green()), unsigned(c.blue()));
}

class CGridCell {
 public:
  // Property flags. The low 16 bits belong to the engine's stock types, the
  // top bits to the add-on's own types (pressed marks of the board tile).
  enum Flags : std::uint32_t {
    kFlagPressed = 0x0001,    // stock button drawn pushed in
    kFlagDisabled = 0x0002,   // drawn greyed, ignores the mouse
    kFlagReadOnly = 0x0004,   // no in-place editing
  };

  QString text;
  double number = 0.0;          // the cell's value (check box: ticked when non-zero)
  std::int64_t param = 0;       // numeric parameter (valid when hasParam)
  bool hasParam = false;
  QColor textColor;             // invalid: the grid's default
  QColor backColor;             // invalid: the grid's default
  int alignment = 0;            // Qt::Alignment; 0: left, vertically centred
  std::optional<QFont> font;    // none: the grid's default font
  CGridCellType* cellType = nullptr;  // none: the grid's default type for the area
  std::uint32_t flags = 0;

  void SetText(const QString& t) { text = t; }
  void SetText(std::wstring_view t) { text = QString::fromWCharArray(t.data(), qsizetype(t.size())); }
  void SetTextUtf8(std::string_view t) { text = QString::fromUtf8(t.data(), qsizetype(t.size())); }
  void SetNumber(double v) { number = v; }
  void SetParam(std::int64_t p) { param = p; hasParam = true; }
  void ClearParam() { param = 0; hasParam = false; }
  void SetTextColor(COLORREF c) { textColor = ColorFromRef(c); }
  void SetBackColor(COLORREF c) { backColor = ColorFromRef(c); }
  void SetTextColor(const QColor& c) { textColor = c; }
  void SetBackColor(const QColor& c) { backColor = c; }
  void SetAlignment(int a) { alignment = a; }
  void SetFont(const QFont& f) { font = f; }
  void SetCellType(CGridCellType* t) { cellType = t; }
};
