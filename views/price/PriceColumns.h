#pragma once
// The columns of the quote grids: what each column key shows and how, and the
// layouts the user keeps in the host's watchlist settings (CWatchlistSetting):
// the layout of the other families, the fifteen fixed world-index columns and
// their order text, column moves and the grid font size.
//
// Every call reads the settings afresh from GetUserSettings() and writes the
// whole watchlist setting object back when it changes something. UI thread only.
#include <cstdint>
#include <string>
#include <vector>

#include "hostconfig/UserSettings.h"

namespace pricecol {

// The column keys of the quote grids.
enum class Col : int {
  Icon, Link, Arrow, Symbol, Name, Rem, Exchange, Currency, LS, CFD, DMA, Month, Year,
  Last, Ask, Bid, TAC, BuyVol, SellVol, TotVol, Change, PerChange, Open, PrevClose, High, Low, Delay,
  Unknown,
};

// How a column's cell is coloured by its quote field.
enum class Paint : std::uint8_t {
  None,       // never (open, previous close, TAC, instrument columns)
  Direction,  // rise/fall background on marks 2/3
  Signed,     // green/red text by sign, then rise/fall background
  Changed,    // changed background on mark 1
};

// What a column key stands for.
struct ColumnInfo {
  Col col = Col::Unknown;
  const char* key = "";
  bool rightAligned = false;
  int quoteField = -1;        // QuoteLayout::Field, -1: an instrument column
  Paint paint = Paint::None;
  bool volume = false;        // the field's text is shown through Double2Str(value, 2)
  bool sortable = true;       // icon, link and arrow headers do not sort
  const wchar_t* fallbackHeading = L"";  // without a language text
};

// The column of a key; Col::Unknown (and a left-aligned text column) for others.
const ColumnInfo& InfoOf(const std::string& key);
const ColumnInfo& InfoOf(Col col);
// Headings that stay empty whatever the language says.
bool HasEmptyHeading(Col col);

// The id of the layout the grids use: the first layout's id, 4 when there is none.
std::int32_t LayoutIdOf(const CWatchlistSetting& setting);

// The fifteen world-index columns in their default order.
const std::vector<ColumnSettingItem>& WorldIndexDefaults();

// The columns of a family (ListKind), in display order, with their widths and
// text ids. World indices: the stored order text; an order that does not name
// all fifteen keys is replaced by the default and written back. Others: the
// visible items of the layout, else the library's default list.
std::vector<ColumnSettingItem> ColumnsFor(int listKind);

// Moves the column shown at `from` to the place of the column shown at `to`
// (positions among the columns ColumnsFor gives) and stores the new order.
// False when a position is out of range or nothing moved.
bool MoveColumn(int listKind, int from, int to);

// Font size: the point size of the current index, the menu texts, and the
// choice of index `n` (false when out of range; nothing is stored then).
int FontPointSize();
std::vector<std::wstring> FontSizeItems();
int FontSizeIndex();
bool SetFontSizeIndex(int n);

}  // namespace pricecol
