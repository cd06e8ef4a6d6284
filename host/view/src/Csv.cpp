#include "hostview/Csv.h"

bool Csv::SetSeparateChar(char separator) {
  if (separator == '"' || separator == '\r' || separator == '\n' || separator == '\0') {
    m_error = "separator not allowed: quote, line breaks and NUL cannot separate cells";
    return false;
  }
  m_separator = separator;
  return true;
}

bool Csv::Parse(std::string_view text) {
  m_grid.clear();
  m_error.clear();
  if (text.size() >= 3 && static_cast<unsigned char>(text[0]) == 0xEF &&
      static_cast<unsigned char>(text[1]) == 0xBB && static_cast<unsigned char>(text[2]) == 0xBF)
    text.remove_prefix(3);

  const std::size_t n = text.size();
  std::size_t i = 0;
  std::size_t line = 1;  // physical line, for error texts
  Row row;
  std::string cell;
  bool rowHasContent = false;  // a separator or any character was seen

  auto endRow = [&] {
    if (rowHasContent || !cell.empty()) {
      row.push_back(std::move(cell));
      m_grid.push_back(std::move(row));
    }
    row.clear();
    cell.clear();
    rowHasContent = false;
  };

  while (i < n) {
    const char c = text[i];
    // Only a quote at the very start of a cell opens a quoted cell.
    if (c == '"' && cell.empty()) {
      {
        const std::size_t startLine = line;
        ++i;
        bool closed = false;
        while (i < n) {
          const char q = text[i];
          if (q == '"') {
            if (i + 1 < n && text[i + 1] == '"') { cell.push_back('"'); i += 2; continue; }
            ++i;
            closed = true;
            break;
          }
          if (q == '\n' || (q == '\r' && !(i + 1 < n && text[i + 1] == '\n'))) ++line;
          cell.push_back(q);
          ++i;
        }
        if (!closed) {
          m_error = "line " + std::to_string(startLine) + ": quoted cell is not closed";
          return false;
        }
        rowHasContent = true;
        // After the closing quote only a separator or the end of the row may follow.
        if (i < n && text[i] != m_separator && text[i] != '\r' && text[i] != '\n') {
          m_error = "line " + std::to_string(line) + ": unexpected character after closing quote";
          return false;
        }
        continue;
      }
    }
    if (c == m_separator) {
      row.push_back(std::move(cell));
      cell.clear();
      rowHasContent = true;
      ++i;
      continue;
    }
    if (c == '\r' || c == '\n') {
      endRow();
      if (c == '\r' && i + 1 < n && text[i + 1] == '\n') ++i;
      ++i;
      ++line;
      continue;
    }
    cell.push_back(c);
    rowHasContent = true;
    ++i;
  }
  endRow();
  return true;
}

std::string Csv::GetValue(std::size_t row, std::size_t column) const {
  std::string value;
  GetValue(row, column, value);
  return value;
}

bool Csv::GetValue(std::size_t row, std::size_t column, std::string& value) const {
  if (row >= m_grid.size() || column >= m_grid[row].size()) return false;
  value = m_grid[row][column];
  return true;
}

void Csv::AddData(std::string_view cell) { m_pending.emplace_back(cell); }

std::string Csv::GenerateRow() const { return EncodeRow(m_pending); }

void Csv::ClearRow() { m_pending.clear(); }

void Csv::ClearData() {
  m_grid.clear();
  m_pending.clear();
  m_error.clear();
}

std::string Csv::EncodeCell(std::string_view cell) const {
  bool quote = !cell.empty() && (cell.front() == ' ' || cell.front() == '\t' || cell.back() == ' ' ||
                                 cell.back() == '\t');
  for (char c : cell) {
    if (c == m_separator || c == '"' || c == '\r' || c == '\n') { quote = true; break; }
  }
  if (!quote) return std::string(cell);
  std::string out;
  out.reserve(cell.size() + 2);
  out.push_back('"');
  for (char c : cell) {
    if (c == '"') out.push_back('"');
    out.push_back(c);
  }
  out.push_back('"');
  return out;
}

std::string Csv::EncodeRow(const Row& row) const {
  // A row of one empty cell would be an empty line, which Parse skips.
  if (row.size() == 1 && row[0].empty()) return "\"\"";
  std::string out;
  for (std::size_t k = 0; k < row.size(); ++k) {
    if (k > 0) out.push_back(m_separator);
    out += EncodeCell(row[k]);
  }
  return out;
}

std::string Csv::GenerateText(const Grid& grid) const {
  std::string out;
  for (const Row& row : grid) {
    out += EncodeRow(row);
    out += "\r\n";
  }
  return out;
}
