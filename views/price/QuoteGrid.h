#pragma once
// The row operations both quote grids of the price view offer (the table in
// list mode, the board of tiles in board mode). The view holds one grid per
// display mode and talks to the visible one through this interface only.
#include <cstdint>
#include <string>
#include <vector>

#include "data/Keys.h"

class CSuperBaseView;
class IStyleManager;
class QWidget;

class IQuoteGrid {
 public:
  virtual ~IQuoteGrid() = default;

  virtual QWidget* Widget() = 0;
  // The view that receives the grid's messages and sends its host requests.
  virtual void SetOwner(CSuperBaseView* owner) = 0;

  // Replaces the rows by the watchlist `name` of the family's store.
  virtual void LoadWatchlist(int listKind, const std::wstring& name) = 0;
  // Replaces the rows by `items` (lists without a store).
  virtual void LoadItems(int listKind, const std::wstring& name, const std::vector<InstrumentKey>& items) = 0;
  // False (nothing added) when the instrument is a row already.
  virtual bool AddRow(const InstrumentKey& key) = 0;
  virtual std::vector<InstrumentKey> Rows() const = 0;
  // Rows the user selected, in display order.
  virtual std::vector<InstrumentKey> SelectedKeys() const = 0;
  // Selects the shown ones of `keys` (the first is scrolled into view); the
  // selection the other grid had when the display mode changes.
  virtual void SelectKeys(const std::vector<InstrumentKey>& keys) = 0;
  // The texts of 612 and 618 from the rows in display order.
  virtual std::wstring UserItemText() const = 0;
  virtual std::wstring KeldoItemText() const = 0;
  virtual int RowCount() const = 0;

  // Grows when a shown quote changed since the last call (reads the store).
  virtual std::uint64_t UpdateCounter() = 0;
  // Re-applies the grid's sort; false when it keeps no sort.
  virtual bool ApplySort() = 0;
  virtual void Redraw() = 0;

  virtual void SetEmptyText(const std::wstring& text) = 0;
  // Columns and font size from the settings (notification 2600, column moves).
  virtual void ApplyColumns() = 0;
  virtual void SetStyleManager(IStyleManager* style) = 0;
  // The instrument stores changed (a new instrument list): join the rows again.
  virtual void RejoinInstruments() = 0;
};
