#pragma once
// The add-on's own cell types on top of the engine's stock types, and the
// filter check list of the price grid.
#include <QListWidget>
#include <QPixmap>
#include <string>

#include "grid/GridCellType.h"

class IStyleManager;

// A style picture whose path holds "[styleID]": reloaded when the style id
// changes. Magenta (255, 0, 255) is transparent, as in the terminal's bitmaps.
class CStyleImage {
 public:
  explicit CStyleImage(std::wstring path = {}) : m_path(std::move(path)) {}
  void SetPath(std::wstring path);
  const std::wstring& Path() const { return m_path; }
  // The picture for `styleId` (null pixmap when there is none).
  const QPixmap& Get(const IStyleManager* style, int styleId);
  // The path with "[styleID]" replaced by the id.
  static std::wstring ForStyle(const std::wstring& path, int styleId);

 private:
  std::wstring m_path;
  int m_loadedStyle = -1;
  const IStyleManager* m_loadedFrom = nullptr;
  bool m_loaded = false;
  QPixmap m_pixmap;
};

// Where the add-on's cell types read the current style from.
class CStyledCellType {
 public:
  void SetStyleManager(const IStyleManager* style, int styleId) { m_style = style; m_styleId = styleId; }
  void ChangeStyle(int styleId) { m_styleId = styleId; }
  const IStyleManager* StyleManager() const { return m_style; }
  int StyleID() const { return m_styleId; }

 protected:
  const IStyleManager* m_style = nullptr;
  int m_styleId = 0;
};

// Tick column of the alert list: a check box in the cell's colours, ticked
// when the cell's number is not 0.
class PCheckBoxTypeEx : public CGridCheckBoxType {
 public:
  using CGridCheckBoxType::CGridCheckBoxType;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
};

// A heading with the sort direction (number 0: ascending, arrow up). With a
// widget style at hand the arrow is the style's spin-box arrow.
class PSortArrowTypeEx : public CGridSortArrowType {
 public:
  using CGridSortArrowType::CGridSortArrowType;
  void SetUseThemes(bool on) { m_themes = on; }
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;

 private:
  bool m_themes = true;
};

// Background and border, then an up arrow over a down arrow.
class PUDArrowTypeEx : public CGridCellType {
 public:
  using CGridCellType::CGridCellType;
  std::wstring GetName() const override { return L"Up/Down Arrow Type"; }
  QUuid GetUUID() const override { return QUuid("{24B7AFA0-1146-34E6-E40D-025458E291DF}"); }
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
};

// Only the background and the border (the type's own pen), no text.
class PEmptyTypeEx : public CGridCellType {
 public:
  explicit PEmptyTypeEx(CGridCtrl* grid = nullptr);
  std::wstring GetName() const override { return L"EmptyCell"; }
  QUuid GetUUID() const override { return QUuid("{26B7ACA0-1F46-34E6-E42D-005458E291DF}"); }
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
};

// A push button carrying the company-information picture.
class PArrowButtonTypeEx : public CGridButtonType, public CStyledCellType {
 public:
  static constexpr const wchar_t* kPicture = L"images/QuickBar/[styleID]/CompanyInfo.bmp";
  explicit PArrowButtonTypeEx(CGridCtrl* grid = nullptr) : CGridButtonType(grid), m_image(kPicture) {}
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
  // The picture, or a drawn stand-in when the style has none.
  static void DrawInfoGlyph(QPainter& p, const QRect& r, const QColor& color);

 private:
  CStyleImage m_image;
};

// The price grid's column filter list: 18-pixel items, each an outline with a
// square at its left, black when selected and white otherwise. No text.
class PFilterCKListBox : public QListWidget {
  Q_OBJECT
 public:
  explicit PFilterCKListBox(QWidget* parent = nullptr);
  static constexpr int kItemHeight = 18;
  // Draws one item into `rect` (what the delegate does for every item).
  static void DrawItem(QPainter& p, const QRect& rect, bool selected);
};
