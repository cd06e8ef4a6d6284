#pragma once
// BoardGrid: the quote board of the price view (board mode). The instruments
// of the shown list as tiles of 220 x 150 pixels without headings, drawn by
// the board tile type; tile index = row x columns + column. Each tile keeps
// its instrument, the quantity the user entered (kept per instrument while
// the grid lives, so a reload of the list loses nothing typed), the offered
// quantities (multiples of the lot size) and whether the quantity failed its
// check.
//
// Row operations are those of the list grid (IQuoteGrid). What the tiles
// report (codes of the tile type):
//   85 / 86   tooltip over the remove button (language text 412) / the
//             company-information button (language text 415); hidden with 0
//   87        double click on the tile outside its buttons and trading parts:
//             a ticket without a side (mode 0)
//   88        press: the tile becomes the selected one; on the bid part a sell
//             ticket (mode 2), on the ask part a buy ticket (mode 1)
//   89        right click: the price grid's context menu for the tile
//   90        company-information button: MSG_WLOPENSTOCKANALYTICS, only for
//             instruments of the terminal's list (the read-only store)
//   91        remove button: the tile goes, the rest close up, and the view is
//             told with MSG_WLREMOVEINSLIST (brand lists: MSG_KELDOWLREMOVEINSLIST)
//             with the key and the list's position; lists the user cannot
//             edit (TOP30, world indices) show no remove button
// A ticket first checks the tile's quantity (views/price/QuantityCheck.h); a
// refusal shows its message instead (MSG_WLOPENTRADE otherwise, lParam -1
// when the instrument cannot be traded, as the list grid does).
// UI thread only.
#include <QFont>
#include <QString>
#include <QStringList>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "controls/BoardTypeEx.h"
#include "controls/CellTypes.h"
#include "data/Keys.h"
#include "grid/GridCtrl.h"
#include "hostview/Records.h"
#include "views/price/QuoteGrid.h"

class CAddonView;
class CSuperBaseView;
class IStyleManager;

class BoardGrid : public CGridCtrl, public IQuoteGrid {
  Q_OBJECT
 public:
  static constexpr int kTileWidth = 220;
  static constexpr int kTileHeight = 150;
  static constexpr int kMinColumns = 3;
  // How many offered quantities the drop list holds (lot x 1..5, 10..50).
  static constexpr int kOfferedQuantities = 10;
  // Language texts of the tooltips.
  static constexpr int kRemoveTipText = 412;
  static constexpr int kAnalyticsTipText = 415;

  explicit BoardGrid(QWidget* parent = nullptr);
  ~BoardGrid() override;

  // Tile columns for a client width: what is left after the vertical scroll
  // bar, in whole tiles; at least 3.
  static int ColumnsFor(int clientWidth, int scrollBarWidth);

  // ---- IQuoteGrid ----
  QWidget* Widget() override { return this; }
  void SetOwner(CSuperBaseView* owner) override;
  void LoadWatchlist(int listKind, const std::wstring& name) override;
  void LoadItems(int listKind, const std::wstring& name, const std::vector<InstrumentKey>& items) override;
  bool AddRow(const InstrumentKey& key) override;
  std::vector<InstrumentKey> Rows() const override;
  std::vector<InstrumentKey> SelectedKeys() const override;
  void SelectKeys(const std::vector<InstrumentKey>& keys) override;
  std::wstring UserItemText() const override;
  std::wstring KeldoItemText() const override;
  int RowCount() const override { return int(m_tiles.size()); }
  std::uint64_t UpdateCounter() override;
  bool ApplySort() override { return false; }
  void Redraw() override { RedrawAll(); }
  void SetEmptyText(const std::wstring& text) override;
  // Notification 2600: the quantities are checked again (silently, mode 0).
  void ApplyColumns() override;
  void SetStyleManager(IStyleManager* style) override;
  void RejoinInstruments() override;

  // ---- Tiles ----
  int ListKind() const { return m_listKind; }
  const std::wstring& ListName() const { return m_listName; }
  int TileColumns() const { return GetNumberCols(); }
  int TileRows() const { return GetNumberRows(); }
  // Index of the tile at (col, row), -1 when the cell holds none.
  int TileIndex(int col, int row) const;
  // The cell of tile `index`.
  void TileCell(int index, int* col, int* row) const;
  const InstrumentKey& TileKey(int index) const { return m_tiles[std::size_t(index)].key; }
  // The numeric parameter the tile cell carries (see PBoardTypeEx); -1 without a record.
  std::int64_t TileParam(int index) const { return m_tiles[std::size_t(index)].param; }
  int SelectedTile() const { return m_selected; }
  const std::wstring& QuantityText(int index) const { return m_tiles[std::size_t(index)].quantity; }
  // Sets the quantity of a tile and checks it silently (marks it invalid or not).
  void SetQuantityText(int index, const std::wstring& text);
  bool IsQuantityInvalid(int index) const { return m_tiles[std::size_t(index)].invalid; }
  QStringList OfferedQuantities(int index) const;
  // Every tile's quantity checked again, silently, in mode 0; then a redraw.
  void RecheckQuantities();
  // The trade ticket of a tile: the quantity check for `mode` (0 none, 1 buy,
  // 2 sell), then MSG_WLOPENTRADE; a refusal shows its message instead.
  void PrepareTrade(int index, int mode);
  // The JSON text of that ticket (no check).
  std::wstring TradeRequestFor(int index, int mode) const;
  // The check of a tile's quantity for `mode`: marks the tile and, when it
  // fails, shows its message. The checked quantity on success.
  std::optional<std::int64_t> CheckQuantity(int index, int mode);
  PBoardTypeEx& TileType() { return m_tileType; }
  const std::wstring& EmptyText() const { return m_emptyText; }
  // The tooltip on show (85/86), empty when none.
  const QString& ShownTip() const { return m_tip; }

  // What the tiles show, one line per tile in index order, after the quote
  // values were read again.
  Q_INVOKABLE QString dumpTsv();

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override;
  int OnCellTypeNotify(CGridCellType* type, int col, int row, int code, std::intptr_t param) override;
  void OnRClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnCellChange(int oldCol, int newCol, int oldRow, int newRow) override;
  void OnSelectionChanged() override;
  bool OnKeyDown(int key, Qt::KeyboardModifiers mods) override;
  bool OnEditStart(int col, int row, QString& text) override;
  void OnEditorCreated(int col, int row, QLineEdit* editor) override;
  bool OnEditFinish(int col, int row, const QString& text, bool cancelled) override;
  void OnSize(int width, int height) override;
  void paintEvent(QPaintEvent* e) override;

 private:
  struct Tile {
    InstrumentKey key;
    std::int64_t param = -1;  // position in the stores (PBoardTypeEx), -1: no record
    std::wstring quantity;
    bool invalid = false;
    std::uint64_t quoteVersion = 0;
  };

  CSuperBaseView* Owner() const;
  CAddonView* AddonOwner() const;
  // The instrument record of a tile; null when neither store has it.
  const JInstrumentUnderlying* Record(const Tile& tile) const;
  void Join(Tile& tile) const;
  Tile MakeTile(const InstrumentKey& key);
  // Columns from the width, rows from the tiles; the selected tile stays selected.
  void LayTiles();
  bool Removable() const;
  void CheckQuietly(Tile& tile) const;
  void RemoveTile(int index);
  void OpenAnalytics(int index);
  void ShowTip(int col, int row, int area, int textId, const wchar_t* fallback);
  std::wstring LinkTextFor(const Tile& tile) const;
  bool Tradeable(const JInstrumentUnderlying& record) const;
  QString LanguageText(int id, const wchar_t* fallback) const;
  QString DumpHeading() const;
  QString DumpLine(int index);

  CSuperBaseView* m_owner = nullptr;
  int m_listKind = 0;
  std::wstring m_listName;
  std::vector<Tile> m_tiles;
  // Quantities typed, by instrument: a reloaded list keeps them.
  std::map<InstrumentKey, std::wstring> m_typed;
  int m_selected = -1;
  int m_laidColumns = 0;
  std::uint64_t m_seenStoreVersion = ~0ull;
  std::uint64_t m_updates = 0;
  std::wstring m_emptyText;
  QString m_tip;
  QColor m_back{255, 255, 255};
  QColor m_text{0, 0, 0};
  IStyleManager* m_style = nullptr;
  PBoardTypeEx m_tileType{this};
  PEmptyTypeEx m_emptyType{this};
};
