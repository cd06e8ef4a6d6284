#include "views/instrument/DepthGrid.h"

#include <QCursor>
#include <QScrollBar>
#include <algorithm>

#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "addon/TextTables.h"
#include "hostview/NumberText.h"
#include "hostview/Services.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "addon/Feeds.h"

namespace {

// Style font of the data cells and of the headings.
constexpr int kCellFontId = 16;
constexpr int kHeadingFontId = 17;

bool IsPriceColumn(int position) { return position == DepthGrid::kBuy || position == DepthGrid::kSell; }

}  // namespace

const std::array<DepthGrid::ColumnDef, DepthGrid::kColumnCount>& DepthGrid::Columns() {
  static const std::array<ColumnDef, kColumnCount> columns{{
      {"colUCBVol", 80, true, 1, 501, DepthLayout::OrdsBVol, L"Buy Orders"},
      {"colBVol", 80, true, 2, 502, DepthLayout::BVol, L"Buy Vol"},
      {"colBuy", 80, true, 3, 503, DepthLayout::Buy, L"Buy"},
      {"colSell", 80, true, 4, 504, DepthLayout::Sell, L"Sell"},
      {"colSVol", 80, true, 5, 505, DepthLayout::SVol, L"Sell Vol"},
      {"colUCSVol", 80, true, 6, 506, DepthLayout::OrdsSVol, L"Sell Orders"},
  }};
  return columns;
}

DepthGrid::DepthGrid(QWidget* parent) : CInstrumentGrid(parent) {
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
  SetNumberCols(kColumnCount);
  SetNumberRows(0);
  ApplyMask();
}

DepthGrid::~DepthGrid() = default;

// ---- Columns ------------------------------------------------------------------

void DepthGrid::SetColumnMask(const std::wstring& mask) {
  std::wstring m = mask.size() < std::size_t(kColumnCount) ? std::wstring(kDefaultMask) : mask.substr(0, kColumnCount);
  for (wchar_t& c : m)
    if (c != L'1') c = L'0';
  m_mask = std::move(m);
  ApplyMask();
}

void DepthGrid::ApplyMask() {
  m_shown.clear();
  for (int i = 0; i < kColumnCount; ++i)
    if (m_mask[std::size_t(i)] == L'1') m_shown.push_back(i);
  SetNumberCols(int(m_shown.size()));
  for (int col = 0; col < int(m_shown.size()); ++col)
    SetColWidth(col, Columns()[std::size_t(m_shown[std::size_t(col)])].defaultWidth);
  LayoutColumns();
  Redraw();
}

void DepthGrid::ToggleColumn(int position) {
  if (position < 0 || position >= kColumnCount) return;
  wchar_t& c = m_mask[std::size_t(position)];
  c = c == L'1' ? L'0' : L'1';
  ApplyMask();
  NotifyColumnsChanged();
}

void DepthGrid::LayoutColumns() {
  const int count = int(m_shown.size());
  if (count == 0) return;
  const int frame = 2 * frameWidth();
  int width = std::max(0, this->width() - frame);
  const int clientHeight = std::max(0, height() - frame);
  if ((m_filled + 1) * kRowHeight > clientHeight) width = std::max(0, width - VScrollBarWidth());
  if (count == kColumnCount) {
    const int rest = std::max(0, width - 2 * kMinColumnWidth);
    const int quarter = rest / 4;
    SetColWidth(0, kMinColumnWidth);
    SetColWidth(5, kMinColumnWidth);
    SetColWidth(2, quarter);
    SetColWidth(3, quarter);
    SetColWidth(4, quarter);
    SetColWidth(1, rest - 3 * quarter);
  } else {
    const int each = width / count;
    for (int col = 0; col < count; ++col) SetColWidth(col, each);
    SetColWidth(0, each + width % count);
  }
}

int DepthGrid::PositionOf(int col) const {
  if (col < 0 || col >= int(m_shown.size())) return -1;
  return m_shown[std::size_t(col)];
}

void DepthGrid::NotifyColumnsChanged() {
  platform::SendMessage(parentWidget(), addon::Msg().mdColumnUpdate, 0, 0);
}

// ---- Instrument -----------------------------------------------------------------

void DepthGrid::Reset() {
  CInstrumentGrid::Reset();
  m_filled = 0;
  m_key = InstrumentKey{-1, L""};
  LayoutColumns();
}

void DepthGrid::SetInstrument(const InstrumentKey& key, int levelCount) {
  CInstrumentGrid::Reset();
  m_filled = 0;
  m_key = key;
  m_levelCount = levelCount;
  addon::DepthFeed::Instance().Register(m_key, m_levelCount, platform::TickCount());
  LayoutColumns();
}

void DepthGrid::SetLevelCount(int levelCount) {
  m_levelCount = levelCount;
  addon::DepthFeed::Instance().Register(m_key, m_levelCount, platform::TickCount());
}

std::uint64_t DepthGrid::NewestStamp() {
  if (m_key.InstrumentCode.empty()) return 0;
  // Filled levels run from level 1 up to the first level whose buy and sell
  // prices are both zero or without text.
  const auto extent = addon::DepthFeed::Instance().LeadingRun(
      addon::DepthLevels(m_key, 1, addon::DepthFeedTraits::kMaxLevels), [](const DepthRecord& r) {
        return HasPrice(r[DepthLayout::Buy]) || HasPrice(r[DepthLayout::Sell]);
      });
  if (extent.count != m_filled) {
    m_filled = extent.count;
    SetNumberRows(m_filled);
    LayoutColumns();
  }
  return extent.newestStamp;
}

// ---- Style and language ---------------------------------------------------------------

void DepthGrid::SetStyleManager(IStyleManager* style) {
  CInstrumentGrid::SetStyleManager(style);
  if (style) {
    m_cellFont = style->GetFont(kCellFontId);
    SetDefFont(m_cellFont);
    SetHeadingFont(style->GetFont(kHeadingFontId));
  }
  LayoutColumns();
  Redraw();
}

void DepthGrid::ApplyLanguage(const ILanguage* language) {
  for (int i = 0; i < kColumnCount; ++i) {
    const ColumnDef& def = Columns()[std::size_t(i)];
    std::wstring text = language ? language->GetText(addon::kLanguageSection, def.headingId) : std::wstring();
    m_headings[std::size_t(i)] = text.empty() ? std::wstring(def.fallbackHeading) : std::move(text);
  }
  Redraw();
}

std::wstring DepthGrid::HeadingText(int position) const {
  if (position < 0 || position >= kColumnCount) return {};
  return m_headings[std::size_t(position)];
}

// ---- Cells ------------------------------------------------------------------------

QString DepthGrid::CellText(int col, int row) {
  CGridCell cell;
  GetCell(col, row, cell);
  return cell.text;
}

void DepthGrid::OnGetCell(int col, int row, CGridCell& cell) {
  const int position = PositionOf(col);
  if (position < 0) return;
  if (row == kHeading) {
    cell.SetText(m_headings[std::size_t(position)]);
    cell.SetCellType(&m_headingType);
    cell.SetAlignment(Qt::AlignRight | Qt::AlignVCenter);
    cell.SetTextColor(m_headText);
    cell.SetBackColor(m_headBack);
    return;
  }
  if (row < 0) return;
  cell.SetFont(m_cellFont);
  cell.SetAlignment(Qt::AlignRight | Qt::AlignVCenter);
  cell.SetTextColor(m_cellText);
  cell.SetBackColor(RowBackColor(row));

  QuoteCell value;
  const DepthKey levelKey{m_key.ProductID, m_key.InstrumentCode, row + 1};
  if (!addon::DepthFeed::Instance().ReadCell(levelKey, Columns()[std::size_t(position)].field, value)) return;
  if (IsPriceColumn(position)) {
    // Prices as the store formats them (instrument decimals), never highlighted.
    if (value.value != 0.0) cell.SetText(value.text);
    return;
  }
  if (value.value != 0.0 && !value.text.empty()) {
    cell.SetTextUtf8(Integer2Str(static_cast<std::int64_t>(value.value)));
    if (value.mark != kMarkNone) {
      cell.SetTextColor(m_changedText);
      cell.SetBackColor(m_changedBack);
    }
  }
}

bool DepthGrid::OnHint(int col, int row, QString& text) {
  if (row != kHeading) return false;
  const int position = PositionOf(col);
  if (position < 0) return false;
  text = QString::fromStdWString(m_headings[std::size_t(position)]);
  return true;
}

// ---- Mouse ----------------------------------------------------------------------------

void DepthGrid::OnMouseMove(int col, int row, const QPoint&, Qt::MouseButtons) {
  const bool overPrice = row >= 0 && IsPriceColumn(PositionOf(col));
  SetGridCursor(overPrice ? Qt::PointingHandCursor : Qt::ArrowCursor);
}

void DepthGrid::OnLClicked(int col, int row, bool pressed, const QRect&, const QPoint&) {
  if (!pressed || row < 0) return;
  OpenTrade(PositionOf(col), row);
}

void DepthGrid::OpenTrade(int position, int row) {
  if (!IsPriceColumn(position) || row < 0) return;
  DepthRecord level;
  if (!addon::DepthFeed::Instance().Read(DepthKey{m_key.ProductID, m_key.InstrumentCode, row + 1}, level)) return;
  const bool buy = position == kBuy;
  const std::wstring& price = level[buy ? DepthLayout::Buy : DepthLayout::Sell].text;
  if (price.empty()) return;
  addon::LinkTextBuilder link("price view");
  link.Add(addon::linkkey::kInstrumentCode, m_key.InstrumentCode)
      .AddInt64(addon::linkkey::kProductId, m_key.ProductID)
      .Add(addon::linkkey::kSide, buy ? "Buy" : "Sell")
      .Add(addon::linkkey::kTradePrice, price);
  const std::wstring text = link.Wide();
  platform::SendMessage(parentWidget(), addon::Msg().wlOpenTrade, ToLParam(&text), 0);
}

void DepthGrid::OnRClicked(int, int, bool pressed, const QRect&, const QPoint& pt) {
  if (pressed) ShowColumnMenu(viewport()->mapToGlobal(pt));
}

void DepthGrid::OnTH_RClicked(int, bool pressed, const QRect&, const QPoint& pt) {
  if (pressed) ShowColumnMenu(viewport()->mapToGlobal(pt));
}

void DepthGrid::ShowColumnMenu(const QPoint& globalPos) {
  std::vector<platform::MenuItem> items;
  for (int i = 0; i < kColumnCount; ++i) {
    platform::MenuItem item;
    item.id = kMenuFirstId + i;
    item.text = QString::fromStdWString(m_headings[std::size_t(i)]);
    item.checked = m_mask[std::size_t(i)] == L'1';
    items.push_back(std::move(item));
  }
  const int chosen = platform::Dialogs().PopupMenu(this, items, globalPos);
  if (chosen >= kMenuFirstId && chosen < kMenuFirstId + kColumnCount) ToggleColumn(chosen - kMenuFirstId);
}

void DepthGrid::OnColSized(int, int& width) {
  width = std::max(width, kMinColumnWidth);
  NotifyColumnsChanged();
}

void DepthGrid::OnSize(int, int) { LayoutColumns(); }
