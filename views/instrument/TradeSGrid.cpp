#include "views/instrument/TradeSGrid.h"

#include <algorithm>

#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "addon/TextTables.h"
#include "hostview/NumberText.h"
#include "hostview/Services.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/instrument/SummaryFeed.h"

namespace {

// Style fonts: data cells, headings, the totals row.
constexpr int kCellFontId = 16;
constexpr int kHeadingFontId = 17;
constexpr int kTotalFontId = 19;

}  // namespace

const std::array<TradeSGrid::ColumnDef, TradeSGrid::kColumnCount>& TradeSGrid::Columns() {
  static const std::array<ColumnDef, kColumnCount> columns{{
      {"colPrice", 100, 1, 651, SummaryLineLayout::Price, L"Price"},
      {"colTrade", 100, 2, 652, SummaryLineLayout::Tradable, L"Trades"},
      {"colVolume", 100, 3, 653, SummaryLineLayout::Vol, L"Volume"},
      {"colBid", 100, 4, 654, SummaryLineLayout::Bid, L"Bid Vol"},
      {"colAsk", 100, 5, 655, SummaryLineLayout::Ask, L"Ask Vol"},
  }};
  return columns;
}

TradeSGrid::TradeSGrid(QWidget* parent) : CInstrumentGrid(parent) {
  SetSelectionMode(SingleSelection);
  SetSH_Width(0);
  SetTH_Height(kRowHeight);
  SetDefRowHeight(kRowHeight);
  SetHighlightSelection(false);
  EnableColumnMove(false);
  EnableRowMove(false);
  setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
  for (int i = 0; i < kColumnCount; ++i) m_headings[std::size_t(i)] = Columns()[std::size_t(i)].fallbackHeading;
  m_cellFont = GetDefFont();
  m_totalFont = m_cellFont;
  m_totalFont.setBold(true);
  SetNumberCols(kColumnCount);
  for (int col = 0; col < kColumnCount; ++col) SetColWidth(col, Columns()[std::size_t(col)].defaultWidth);
  SetNumberRows(0);
  LayoutColumns();
}

TradeSGrid::~TradeSGrid() = default;

// ---- Instrument -----------------------------------------------------------------

void TradeSGrid::Reset() {
  CInstrumentGrid::Reset();
  m_filled = 0;
  m_pages = 0;
  m_key = InstrumentKey{-1, L""};
  LayoutColumns();
}

void TradeSGrid::SetInstrument(const InstrumentKey& key) {
  CInstrumentGrid::Reset();
  m_filled = 0;
  m_key = key;
  m_pages = 1;
  summary::RegisterPage(m_key, 1, platform::TickCount());
  SetTopRow(0);
  LayoutColumns();
}

void TradeSGrid::RegisterPagesUpTo(int pages) {
  if (m_key.InstrumentCode.empty()) return;
  pages = std::min(pages, summary::kLastPage);
  if (pages <= m_pages) return;
  const std::uint32_t now = platform::TickCount();
  for (int page = m_pages + 1; page <= pages; ++page) summary::RegisterPage(m_key, page, now);
  m_pages = pages;
}

std::uint64_t TradeSGrid::NewestStamp() {
  if (m_key.InstrumentCode.empty()) return 0;
  const summary::Extent extent = summary::Recount(m_key);
  if (extent.filled != m_filled) {
    m_filled = extent.filled;
    SetNumberRows(m_filled > 0 ? m_filled + 2 : 0);
    LayoutColumns();
  }
  return extent.newestStamp;
}

int TradeSGrid::LineOfRow(int row) const {
  const int rows = GetNumberRows();
  if (row < 0 || row >= rows) return 0;
  if (row == rows - 1) return summary::kTotalsLine;
  if (row == rows - 2) return 0;  // the blank row, even when the page limit hides stored lines
  return row + 1;
}

// ---- Style and language ---------------------------------------------------------------

void TradeSGrid::SetStyleManager(IStyleManager* style) {
  CInstrumentGrid::SetStyleManager(style);
  if (style) {
    m_cellFont = style->GetFont(kCellFontId);
    m_totalFont = style->GetFont(kTotalFontId);
    SetDefFont(m_cellFont);
    SetHeadingFont(style->GetFont(kHeadingFontId));
  }
  LayoutColumns();
  Redraw();
}

void TradeSGrid::ApplyLanguage(const ILanguage* language) {
  for (int i = 0; i < kColumnCount; ++i) {
    const ColumnDef& def = Columns()[std::size_t(i)];
    std::wstring text = language ? language->GetText(addon::kLanguageSection, def.headingId) : std::wstring();
    m_headings[std::size_t(i)] = text.empty() ? std::wstring(def.fallbackHeading) : std::move(text);
  }
  Redraw();
}

std::wstring TradeSGrid::HeadingText(int position) const {
  if (position < 0 || position >= kColumnCount) return {};
  return m_headings[std::size_t(position)];
}

void TradeSGrid::LayoutColumns() {
  const int frame = 2 * frameWidth();
  int width = std::max(0, this->width() - frame);
  const int clientHeight = std::max(0, height() - frame);
  if ((GetNumberRows() + 1) * kRowHeight > clientHeight) width = std::max(0, width - VScrollBarWidth());
  const int each = width / kColumnCount;
  for (int col = 0; col < kColumnCount; ++col) SetColWidth(col, each);
  SetColWidth(0, each + width % kColumnCount);
}

void TradeSGrid::OnSize(int, int) { LayoutColumns(); }

void TradeSGrid::OnScrolled() {
  const int top = std::max(0, GetTopRow());
  if (top == m_lastTop) return;
  m_lastTop = top;
  emit topRowChanged(top);
}

// ---- Cells ------------------------------------------------------------------------

QString TradeSGrid::CellText(int col, int row) {
  CGridCell cell;
  GetCell(col, row, cell);
  return cell.text;
}

void TradeSGrid::OnGetCell(int col, int row, CGridCell& cell) {
  if (col < 0 || col >= kColumnCount) return;
  if (row == kHeading) {
    cell.SetText(m_headings[std::size_t(col)]);
    cell.SetCellType(&m_headingType);
    cell.SetAlignment(Qt::AlignCenter);
    cell.SetTextColor(m_headText);
    cell.SetBackColor(m_headBack);
    return;
  }
  if (row < 0) return;
  const int line = LineOfRow(row);
  cell.SetFont(line == summary::kTotalsLine ? m_totalFont : m_cellFont);
  cell.SetAlignment(Qt::AlignCenter);
  cell.SetTextColor(m_cellText);
  cell.SetBackColor(RowBackColor(row));
  if (line == 0) return;
  if (col == kPrice) {
    if (line == summary::kTotalsLine) {
      cell.SetText(kTotalText);
      return;
    }
    QuoteCell price;
    if (summary::ReadCell(m_key, line, SummaryLineLayout::Price, price)) cell.SetText(price.text);
    return;
  }
  QuoteCell value;
  if (!summary::ReadCell(m_key, line, Columns()[std::size_t(col)].field, value) || value.text.empty()) return;
  cell.SetTextUtf8(Integer2Str(static_cast<std::int64_t>(value.value)));
  if (value.mark != kMarkNone) {
    cell.SetTextColor(m_changedText);
    cell.SetBackColor(m_changedBack);
  }
}

bool TradeSGrid::OnHint(int col, int row, QString& text) {
  if (row != kHeading || col < 0 || col >= kColumnCount) return false;
  text = QString::fromStdWString(m_headings[std::size_t(col)]);
  return true;
}

// ---- Mouse ----------------------------------------------------------------------------

void TradeSGrid::OnMouseMove(int col, int row, const QPoint&, Qt::MouseButtons) {
  SetGridCursor(col == kPrice && IsDataRow(row) ? Qt::PointingHandCursor : Qt::ArrowCursor);
}

void TradeSGrid::OnLClicked(int col, int row, bool pressed, const QRect&, const QPoint&) {
  if (pressed) OpenTrade(col, row);
}

bool TradeSGrid::OpenTrade(int col, int row) {
  if (col != kPrice || !IsDataRow(row)) return false;
  QuoteCell price;
  if (!summary::ReadCell(m_key, LineOfRow(row), SummaryLineLayout::Price, price) || price.text.empty()) return false;
  addon::LinkTextBuilder link("price view");
  link.Add(addon::linkkey::kInstrumentCode, m_key.InstrumentCode)
      .AddInt64(addon::linkkey::kProductId, m_key.ProductID)
      .Add(addon::linkkey::kTradePrice, price.text);
  const std::wstring text = link.Wide();
  platform::SendMessage(parentWidget(), addon::Msg().wlOpenTrade, ToLParam(&text), 0);
  return true;
}
