#pragma once
// Splits separated text into rows and cells and builds such text, with the
// quoting rules of ordinary CSV files:
// - a cell that starts with a double quote runs to the matching closing quote;
//   inside it "" stands for one quote, and separators and line breaks are data;
// - rows end at CR LF, LF or CR; an empty line is skipped (a row with one empty
//   cell is written as "" so that it survives a round trip);
// - a quote inside an unquoted cell is taken literally;
// - a UTF-8 byte-order mark at the start of the text is dropped.
// Texts are narrow (UTF-8) and passed through unchanged. Qt-free.
#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "hostview/Types.h"

class HV_API Csv {
 public:
  using Row = std::vector<std::string>;
  using Grid = std::vector<Row>;

  // The cell separator; ',' by default. Quote, CR and LF cannot be separators
  // (refused: returns false and the separator stays as it was).
  bool SetSeparateChar(char separator);
  char GetSeparateChar() const { return m_separator; }

  // Replaces the grid with the rows of `text`. On malformed text (a quoted cell
  // that never closes, or characters after a closing quote) returns false, keeps
  // the rows before the faulty one and describes the fault in GetErrorInfo().
  bool Parse(std::string_view text);

  // The cell at (row, column), both from 0; empty when out of range.
  std::string GetValue(std::size_t row, std::size_t column) const;
  // False (and `value` untouched) when out of range.
  bool GetValue(std::size_t row, std::size_t column, std::string& value) const;
  const Grid& GetGridData() const { return m_grid; }
  std::size_t GetRowCount() const { return m_grid.size(); }

  // Building: cells are added to the pending row; GenerateRow encodes it
  // (separated, quoted where needed, no line break) without clearing it.
  void AddData(std::string_view cell);
  std::string GenerateRow() const;
  const Row& GetPendingRow() const { return m_pending; }
  // Empties the pending row.
  void ClearRow();
  // Empties the grid, the pending row and the error text.
  void ClearData();

  // Whole text of a grid, rows ended by CR LF; Parse gives back the same grid.
  std::string GenerateText(const Grid& grid) const;
  // One cell as it must be written: quoted when it holds the separator, a quote,
  // a line break or leading/trailing blanks, or when it is the only, empty cell.
  std::string EncodeCell(std::string_view cell) const;

  // Description of the last failure (line number included); empty when the last
  // Parse succeeded.
  const std::string& GetErrorInfo() const { return m_error; }

 private:
  std::string EncodeRow(const Row& row) const;

  char m_separator = ',';
  Grid m_grid;
  Row m_pending;
  std::string m_error;
};
