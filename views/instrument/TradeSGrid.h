#pragma once
// TradeSGrid: the table of the trade-summary view. One row per traded price
// (line 1, 2, ... of SummaryLineStore), then a blank row, then the totals row
// (line 99999, "Total", in the totals font). Cells are read from the store
// while drawing; nothing is kept per cell.
//
// Talks to its parent view with registered window messages:
//   MSG_WLOPENTRADE  a click on a price: wParam = const std::wstring* JSON
//                    link text (instrument and price, no side), lParam = 0.
// Emits topRowChanged when the user scrolls, so that the chart can follow.
// UI thread only.
#include <array>
#include <string>

#include "data/Keys.h"
#include "views/instrument/InstrumentGrid.h"

class TradeSGrid : public CInstrumentGrid {
  Q_OBJECT
 public:
  struct ColumnDef {
    const char* key;     // "colPrice", ...
    int defaultWidth;
    int number;          // 1..5
    int headingId;       // language entry (section 13)
    int field;           // SummaryLineLayout::Field shown in the column
    const wchar_t* fallbackHeading;  // without a language text
  };
  static constexpr int kColumnCount = 5;
  enum Position : int { kPrice = 0, kTrade, kVolume, kBid, kAsk };
  static const std::array<ColumnDef, kColumnCount>& Columns();
  static constexpr const wchar_t* kColumnMask = L"11111";  // always all shown
  static constexpr int kRowHeight = 21;
  static constexpr const wchar_t* kTotalText = L"Total";

  explicit TradeSGrid(QWidget* parent = nullptr);
  ~TradeSGrid() override;

  // ---- Instrument ----
  // No rows, no instrument.
  void Reset() override;
  // No rows, filled lines 0, the key stored, page count 1 and page 1 registered.
  void SetInstrument(const InstrumentKey& key);
  const InstrumentKey& Instrument() const { return m_key; }
  // Registers the pages above the registered count up to `pages` (at most
  // 99); nothing when `pages` does not exceed it.
  void RegisterPagesUpTo(int pages);
  int RegisteredPages() const { return m_pages; }
  int FilledLines() const { return m_filled; }
  // Recounts the filled lines (rows = filled + 2, or 0) and returns the newest
  // change stamp of the header and the lines; 0 without an instrument.
  std::uint64_t NewestStamp() override;
  // The line a row shows: r + 1, the totals line for the last row; 0 for the
  // blank row and outside the rows.
  int LineOfRow(int row) const;

  // ---- Style and language ----
  void SetStyleManager(IStyleManager* style) override;
  void ApplyLanguage(const ILanguage* language) override;
  std::wstring HeadingText(int position) const;
  // Equal widths; column 0 takes what is left over.
  void LayoutColumns();

  // The cell text the user sees at (col, row), as drawn.
  QString CellText(int col, int row);
  // The price click: sends MSG_WLOPENTRADE for a data row's price; false when
  // nothing was sent (blank or totals row, no price, another column).
  bool OpenTrade(int col, int row);

 signals:
  void topRowChanged(int row);

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override;
  void OnMouseMove(int col, int row, const QPoint& pt, Qt::MouseButtons buttons) override;
  void OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  bool OnHint(int col, int row, QString& text) override;
  void OnSize(int width, int height) override;
  void OnScrolled() override;

 private:
  bool IsDataRow(int row) const { return row >= 0 && row < GetNumberRows() - 2; }

  std::array<std::wstring, kColumnCount> m_headings;
  InstrumentKey m_key{-1, L""};
  int m_pages = 0;
  int m_filled = 0;
  int m_lastTop = -1;
  QFont m_cellFont;
  QFont m_totalFont;
};
