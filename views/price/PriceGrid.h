#pragma once
// PriceGrid: the quote table of the price view in list mode. One row per
// instrument of the shown watchlist, joined with its instrument record (read
// once when the rows are loaded) and with its quote record (a copy per row,
// refreshed from the process-wide quote store when the store moved; painting
// reads the copies and takes no lock).
//
// Row operations (the board grid offers the same ones to the view): load a
// watchlist, add a row, list the rows, build the item texts for saving.
//
// Talks to its owner view (SetOwner; the parent widget by default):
//   posted 4000 / 4001            double click on a remark / long-short cell;
//   MSG_WLOPENTRADE (sent)        wParam = const std::wstring* trade request
//                                 (JSON link text), lParam = 0, or -1 when
//                                 the row's instrument cannot be traded;
//   MSG_WLOPENCHART ... MSG_RELATEDNEWS (sent)  context-menu commands 1001..1007:
//                                 wParam = const std::wstring* link text;
//   MSG_WLADDINSLIST, MSG_WLREMOVEINSLIST, MSG_KELDOWLADDINSLIST,
//   MSG_KELDOWLREMOVEINSLIST (sent)   wParam = const std::vector<InstrumentKey>*
//                                 (the selected rows), lParam = watchlist position;
//   MSG_WLMOVEINS (sent)          rows were moved by dragging (user and brand lists).
//   MSG_WLSTARTDRAG (sent)        rows are being dragged out: wParam = const
//                                 std::vector<InstrumentKey>* (the dragged rows);
//                                 a zero answer refuses the drag. The drag carries
//                                 the JSON link text (one object per row: product
//                                 id, instrument code, exchange code) and the
//                                 source name "price view" (hostview/DragData.h).
// UI thread only.
#include <QColor>
#include <QFont>
#include <QString>
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "controls/CellTypes.h"
#include "data/Keys.h"
#include "data/QuoteStore.h"
#include "grid/GridCtrl.h"
#include "platform/Platform.h"
#include "views/price/PriceColumns.h"
#include "views/price/QuoteGrid.h"

class CSuperBaseView;
class IStyleManager;
class PriceTextType;

class PriceGrid : public CGridCtrl, public IQuoteGrid {
  Q_OBJECT
 public:
  // Messages posted to the owner.
  static constexpr UINT kRemarkLegendMsg = 4000;
  static constexpr UINT kLongShortLegendMsg = 4001;
  // Context-menu commands.
  enum Command : int {
    kCmdTrade = 1000, kCmdChart = 1001, kCmdDepth = 1002, kCmdSales = 1003, kCmdAlert = 1004,
    kCmdAnalytics = 1005, kCmdSummary = 1006, kCmdNews = 1007,
    kCmdAddToUser = 1100, kCmdRemoveFromUser = 1200, kCmdAddToKeldo = 1400, kCmdRemoveFromKeldo = 1500,
  };
  static constexpr int kCommandRange = 99;  // positions 0..98 of each range
  // Style colour ids the grid reads.
  enum ColorId : int {
    kEvenRowColor = 106, kOddRowColor = 107, kHeadBackColor = 108, kTextColor = 109, kHeadTextColor = 110,
    kLineColor = 104, kSelBackColor = 112, kSelTextColor = 113,
    kChangedTextColor = 3103, kRiseBackColor = 3104, kChangedBackColor = 3105, kFallBackColor = 3106,
  };
  // Sign colours of change columns (COLORREF values).
  static constexpr COLORREF kPositiveText = 0x009600;
  static constexpr COLORREF kNegativeText = 0x0000FA;
  // Row colours before a style is known (COLORREF values).
  static constexpr COLORREF kDefaultEvenRow = 0xFFFFFF;
  static constexpr COLORREF kDefaultOddRow = 0xF0F0F0;
  static constexpr COLORREF kDefaultSelRow = 0xFAD2C5;

  struct Palette {
    QColor evenRow, oddRow, selBack, selText, text;
    QColor riseBack, fallBack, changedBack, changedText;
  };

  explicit PriceGrid(QWidget* parent = nullptr);
  ~PriceGrid() override;

  // The view the grid reports to (messages, host requests); the parent by default.
  void SetOwner(CSuperBaseView* owner) override { m_owner = owner; }
  QWidget* Widget() override { return this; }

  // ---- Rows --------------------------------------------------------------
  // Replaces the rows by the watchlist `name` of the family's store (none when
  // absent); lays the columns out again when the family changed. The sort
  // state stays.
  void LoadWatchlist(int listKind, const std::wstring& name) override;
  // Replaces the rows by `items` (lists without a store: the advance filter).
  void LoadItems(int listKind, const std::wstring& name, const std::vector<InstrumentKey>& items) override;
  // Appends a row; false (nothing added) when an equal key is a row already.
  bool AddRow(const InstrumentKey& key) override;
  // The rows in display order.
  std::vector<InstrumentKey> Rows() const override;
  std::vector<InstrumentKey> SelectedKeys() const override;
  void SelectKeys(const std::vector<InstrumentKey>& keys) override;
  int RowCount() const override { return int(m_rows.size()); }
  const InstrumentKey& RowKey(int row) const { return m_rows[std::size_t(row)].key; }
  int FindRow(const InstrumentKey& key) const;
  // The texts of 612 and 618 from the rows in display order.
  std::wstring UserItemText() const override;
  std::wstring KeldoItemText() const override;
  int ListKind() const { return m_listKind; }
  const std::wstring& ListName() const { return m_listName; }
  // Joins the rows with the instrument stores again (after a new instrument list).
  void RejoinInstruments() override;

  // ---- Refresh -------------------------------------------------------------------
  // Re-reads the quote records of the rows when the store moved; the count
  // grows by one for every row whose record changed (marks expiring included).
  std::uint64_t UpdateCounter() override;
  // The record copy of a row (as of the last UpdateCounter or load).
  const QuoteRecord& RowQuote(int row) const { return m_quotes[std::size_t(row)]; }
  void Redraw() override { RedrawAll(); }

  // ---- Sorting ----------------------------------------------------------------------
  // The header press-release rule: a new column sorts ascending, the same
  // column again flips the direction. Ignored for icon, link and arrow columns.
  void SortOnColumn(int col);
  // Re-applies the current sort (after values changed); false when none.
  bool ApplySort() override;
  void ClearSort();
  int SortColumn() const { return m_sortCol; }
  // 1 ascending (after the first click), 0 descending.
  int SortFlag() const { return m_sortFlag; }

  // ---- Columns, fonts, style ------------------------------------------------------------
  // Columns from the settings for the current family, headings, font size.
  void ApplyColumns() override;
  void SetStyleManager(IStyleManager* style) override;
  const Palette& RowPalette() const { return m_palette; }
  // The shown column of a key, -1 when not shown.
  int ColumnOf(pricecol::Col col) const;
  pricecol::Col ColumnAt(int col) const;

  // ---- Empty-list text ---------------------------------------------------------------------
  void SetEmptyText(const std::wstring& text) override;
  const std::wstring& EmptyText() const { return m_emptyText; }

  // The cell text the user sees.
  QString CellText(int col, int row);
  // The trade request a double click on (col, row) prepares; empty when none.
  std::wstring TradeRequestFor(int col, int row, bool* tradeable = nullptr);
  // Refreshes the quotes, then the headings and rows as the user sees them.
  Q_INVOKABLE QString dumpTsv();
  // The selected rows with the visible headings, tab-separated (Ctrl+C).
  QString CopyText();

  // Context menu at a global position for the selected rows (also used by tests).
  void ShowContextMenu(const QPoint& globalPos);
  std::vector<platform::MenuItem> BuildContextMenu() const;
  void RunCommand(int command);
  // The same menu for any quote grid (the board offers it too): for the rows
  // of the list `listName` of a family, and the commands run for `keys` (the
  // first key opens views and tickets with its link text).
  static std::vector<platform::MenuItem> ContextMenuFor(int listKind, const std::wstring& listName);
  static void RunMenuCommand(CSuperBaseView* owner, int command, const std::vector<InstrumentKey>& keys,
                             const std::wstring& firstLinkText, bool firstTradeable);

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override;
  void OnDClicked(int col, int row, const QRect& rect, const QPoint& pt) override;
  void OnTH_LClicked(int col, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnRClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnMouseMove(int col, int row, const QPoint& pt, Qt::MouseButtons buttons) override;
  bool OnHint(int col, int row, QString& text) override;
  bool OnCanMoveCol(int from, int to) override;
  void OnColMoved(int from, int to) override;
  bool OnCanMoveRows(const std::vector<int>& rows, int to) override;
  void OnRowsMoved(const std::vector<int>& rows, int to) override;
  bool OnDragOutData(const std::vector<int>& rows, QMimeData& mime) override;
  void OnDragOutDone(Qt::DropAction action) override;
  bool OnKeyDown(int key, Qt::KeyboardModifiers mods) override;
  void paintEvent(QPaintEvent* e) override;

 private:
  struct Row {
    InstrumentKey key;
    QString symbol, name, exchange, currency, productType;
    std::string exchangeCode;  // narrow, for host requests
    int accessStatus = 3;
    bool known = false;
  };
  struct Column {
    pricecol::Col col = pricecol::Col::Unknown;
    const pricecol::ColumnInfo* info = nullptr;
    QString heading;
  };

  CSuperBaseView* Owner() const;
  void SetRows(std::vector<InstrumentKey> keys);
  Row JoinRow(const InstrumentKey& key) const;
  void ReadRowQuote(std::size_t i);
  void AskMarketDelays();
  QString DelayText(const Row& row) const;
  // Sorting helpers.
  void SortRows();
  void Permute(const std::vector<std::size_t>& order);
  // Row colours of (row), selection considered.
  void RowColors(int row, QColor& back, QColor& text) const;
  void QuoteCellColors(const Column& column, const QuoteCell& value, bool selected, CGridCell& cell) const;
  QString QuoteText(const Column& column, const QuoteCell& value) const;
  void SendToOwner(UINT message, WPARAM wParam, LPARAM lParam);
  void PaintGridLines(QPainter& p, const QRect& clip);
  std::wstring LinkTextFor(const Row& row) const;

  CSuperBaseView* m_owner = nullptr;
  int m_listKind = 0;
  int m_columnsKind = -1;  // family the columns were laid out for
  std::wstring m_listName;
  std::vector<Row> m_rows;
  std::vector<QuoteRecord> m_quotes;
  std::vector<std::uint64_t> m_quoteVersion;
  std::uint64_t m_seenStoreVersion = ~0ull;
  std::uint64_t m_updates = 0;
  std::vector<Column> m_columns;
  int m_sortCol = -1;
  // The instruments of the drag that runs: a re-sort while it runs moves their rows.
  std::vector<InstrumentKey> m_dragKeys;
  int m_sortFlag = 0;
  int m_pressedHeading = -2;
  bool m_columnMoved = false;
  std::wstring m_emptyText;
  Palette m_palette;
  QColor m_headBack{58, 74, 99}, m_headText{255, 255, 255};
  IStyleManager* m_style = nullptr;
  QFont m_font;
  std::unique_ptr<CGridCellType> m_markerType;      // icon and arrow columns
  std::unique_ptr<PriceTextType> m_textType;        // every other data cell
  std::unique_ptr<PArrowButtonTypeEx> m_linkType;   // the link column
  std::unique_ptr<CGridHeadingType> m_headingType;  // headings
  std::unique_ptr<PSortArrowTypeEx> m_sortArrowType;  // the sorted column's heading
};
