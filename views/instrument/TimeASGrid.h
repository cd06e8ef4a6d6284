#pragma once
// TimeASGrid: the trade tape of one instrument inside the time-and-sales
// view, newest trade in the first row. Row r shows trade (rows - r); the row
// count is the newest trade number of the live page, so trades not received
// yet draw as empty rows until background paging brings their page. Cells are
// read from the shared TradeTape while drawing; nothing is kept per row, so
// drawing costs the same however long the tape is.
//
// Talks to its parent view with the registered window message
// MSG_WLOPENTRADE (a click on a price: wParam = const std::wstring* JSON link
// text, lParam = 0).
// UI thread only.
#include <array>
#include <string>

#include "data/Keys.h"
#include "data/TradeTape.h"
#include "views/instrument/InstrumentGrid.h"

class TimeASGrid : public CInstrumentGrid {
  Q_OBJECT
 public:
  struct ColumnDef {
    const char* key;   // "colTime", ...
    int defaultWidth;
    int number;        // 1..4
    int headingId;     // language entry (section 13)
    const wchar_t* fallbackHeading;
  };
  static constexpr int kColumnCount = 4;
  enum Position : int { kTime = 0, kPrice, kVol, kSide };
  static const std::array<ColumnDef, kColumnCount>& Columns();
  static constexpr const wchar_t* kColumnMask = L"1111";  // every column, always
  static constexpr int kRowHeight = 21;
  // Rows at most: far beyond a trading day's tape, and a garbled trade number
  // cannot make the grid reserve rows by the billion.
  static constexpr int kMaxRows = 10'000'000;
  // Style colours of the side texts and language entries of their words.
  static constexpr int kBuyColor = 3101;
  static constexpr int kSellColor = 3102;
  static constexpr int kBuyTextId = 614;
  static constexpr int kSellTextId = 615;

  explicit TimeASGrid(QWidget* parent = nullptr);
  ~TimeASGrid() override;

  // ---- Instrument ----
  // No rows; keeps the key. Page 0: the live page (99998) is registered;
  // page n > 0: history pages 1..n-1 are registered.
  void SetInstrument(const InstrumentKey& key, int page = 0);
  // No rows, key {-1, ""}.
  void Reset() override;
  const InstrumentKey& Instrument() const { return m_key; }
  int CurrentPage() const { return m_page; }
  // Recounts the rows from the stores and returns the newest change stamp of
  // the instrument's header and pages (0 without an instrument).
  std::uint64_t NewestStamp() override;
  // The trade shown in row r (number 0 when it has not arrived).
  TradeRecord TradeOfRow(int row) const;

  // Spreads the client width equally over the four columns.
  void LayoutColumns();

  // ---- Style and language ----
  void SetStyleManager(IStyleManager* style) override;
  void ApplyLanguage(const ILanguage* language) override;
  std::wstring HeadingText(int position) const;

  // The cell text the user sees at (column, row), as drawn.
  QString CellText(int col, int row);
  // The side word of a side code ("" for codes without one).
  std::wstring SideText(const std::wstring& code) const;

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override;
  void OnMouseMove(int col, int row, const QPoint& pt, Qt::MouseButtons buttons) override;
  void OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  bool OnHint(int col, int row, QString& text) override;
  void OnSize(int width, int height) override;

 private:
  void Recount();
  void OpenTrade(int row);

  InstrumentKey m_key{-1, L""};
  int m_page = 0;
  int m_lastFilled = -1;  // last filled page index (0 the live page), -1 none
  std::uint64_t m_stamp = 0;
  std::uint64_t m_seenHeaders = ~std::uint64_t{0};  // store versions of the last recount
  std::uint64_t m_seenPages = ~std::uint64_t{0};
  std::int32_t m_total = 0;
  std::array<std::wstring, kColumnCount> m_headings;
  std::wstring m_buyText = L"Buy";
  std::wstring m_sellText = L"Sell";
  QColor m_buyColor{0, 128, 0};
  QColor m_sellColor{200, 0, 0};
  QFont m_cellFont;
};
