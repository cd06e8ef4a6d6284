#pragma once
// DepthGrid: the order book of one instrument inside the market-depth view.
// One row per filled price level; buy side on the left (orders, volume,
// price), sell side on the right (price, volume, orders). Cells are read from
// DepthStore while drawing; nothing is kept per cell.
//
// Talks to its parent view with registered window messages:
//   MSG_WLOPENTRADE    a click on a price: wParam = const std::wstring* JSON
//                      link text (side and price), lParam = 0;
//   MSG_MDCOLUMNUPDATE a column was resized or shown/hidden.
// UI thread only.
#include <array>
#include <string>
#include <vector>

#include "data/Keys.h"
#include "data/MarketStores.h"
#include "views/instrument/InstrumentGrid.h"

class DepthGrid : public CInstrumentGrid {
  Q_OBJECT
 public:
  // One column of the book, in its fixed table position.
  struct ColumnDef {
    const char* key;     // "colUCBVol", ...
    int defaultWidth;
    bool defaultVisible;
    int number;          // 1..6
    int headingId;       // language entry (section 13)
    int field;           // DepthLayout::Field shown in the column
    const wchar_t* fallbackHeading;  // without a language text
  };
  static constexpr int kColumnCount = 6;
  enum Position : int { kUCBVol = 0, kBVol, kBuy, kSell, kSVol, kUCSVol };
  static const std::array<ColumnDef, kColumnCount>& Columns();

  static constexpr const wchar_t* kDefaultMask = L"011110";  // order counts hidden
  static constexpr const wchar_t* kFullMask = L"111111";
  static constexpr int kRowHeight = 21;
  static constexpr int kMinColumnWidth = 35;
  static constexpr int kMenuFirstId = 3000;  // column menu: 3000 + table position

  explicit DepthGrid(QWidget* parent = nullptr);
  ~DepthGrid() override;

  // ---- Columns ----
  // Six "0"/"1" characters by table position; a shorter text becomes "011110".
  void SetColumnMask(const std::wstring& mask);
  const std::wstring& ColumnMask() const { return m_mask; }
  // Table positions of the shown columns, in order.
  const std::vector<int>& ShownColumns() const { return m_shown; }
  // Shows or hides the column at a table position and applies the new mask.
  void ToggleColumn(int position);
  // Spreads the client width over the shown columns.
  void LayoutColumns();

  // ---- Instrument ----
  // No rows, filled levels 0, key {-1, ""}.
  void Reset() override;
  // Resets the rows, keeps the key and level count, and registers the key with
  // that level count (the subscription leaves on the next refresh tick).
  void SetInstrument(const InstrumentKey& key, int levelCount);
  // A grown level count: kept and registered again.
  void SetLevelCount(int levelCount);
  const InstrumentKey& Instrument() const { return m_key; }
  int LevelCount() const { return m_levelCount; }
  int FilledLevels() const { return m_filled; }
  // Recounts the filled levels (resizing the rows) and returns the newest
  // change stamp among them; 0 without an instrument.
  std::uint64_t NewestStamp() override;

  // ---- Style and language ----
  void SetStyleManager(IStyleManager* style) override;
  void ApplyLanguage(const ILanguage* language) override;
  std::wstring HeadingText(int position) const;

  // Whether a price cell counts as "a price" for the filled-level rule.
  static bool HasPrice(const QuoteCell& cell) { return cell.value != 0.0 && !cell.text.empty(); }

  // The cell text the user sees at (shown column, row), as drawn.
  QString CellText(int col, int row);

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override;
  void OnMouseMove(int col, int row, const QPoint& pt, Qt::MouseButtons buttons) override;
  void OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnRClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnTH_RClicked(int col, bool pressed, const QRect& rect, const QPoint& pt) override;
  bool OnHint(int col, int row, QString& text) override;
  void OnColSized(int col, int& width) override;
  void OnSize(int width, int height) override;

 private:
  // Table position of a shown column; -1 outside.
  int PositionOf(int col) const;
  void ApplyMask();
  void ShowColumnMenu(const QPoint& globalPos);
  void NotifyColumnsChanged();
  void OpenTrade(int position, int row);

  std::wstring m_mask = kDefaultMask;
  std::vector<int> m_shown;
  std::array<std::wstring, kColumnCount> m_headings;
  InstrumentKey m_key{-1, L""};
  int m_filled = 0;
  int m_levelCount = 0;
  QFont m_cellFont;
};
