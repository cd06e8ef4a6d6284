#include "views/instrument/TimeASGrid.h"

#include <algorithm>
#include <cmath>

#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "addon/TextTables.h"
#include "data/MarketStores.h"
#include "data/NumberText.h"
#include "hostview/NumberText.h"
#include "hostview/Services.h"
#include "platform/Platform.h"
#include "views/instrument/SalesFeed.h"

namespace {

constexpr int kCellFontId = 16;
constexpr int kHeadingFontId = 17;
// Pages a recount looks at: index 0 stands for the live page.
constexpr int kPageSlots = sales::kMaxHistoryPage + 1;

// A volume as an integer with thousands separators; a text that is no number stays as it came.
std::wstring VolumeText(const std::wstring& volume) {
  double v = 0;
  if (!mvd::ParseNumber(volume, v)) return mvd::IsNonFiniteText(volume) ? std::wstring() : volume;
  v = std::trunc(v);
  if (!(v >= -9.2e18 && v <= 9.2e18)) return volume;
  return hv::Widen(Integer2Str(static_cast<std::int64_t>(v)));
}

}  // namespace

const std::array<TimeASGrid::ColumnDef, TimeASGrid::kColumnCount>& TimeASGrid::Columns() {
  static const std::array<ColumnDef, kColumnCount> columns{{
      {"colTime", 100, 1, 601, L"Time"},
      {"colPrice", 100, 2, 602, L"Price"},
      {"colVol", 100, 3, 603, L"Volume"},
      {"colSide", 100, 4, 604, L"Side"},
  }};
  return columns;
}

TimeASGrid::TimeASGrid(QWidget* parent) : CInstrumentGrid(parent) {
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
  for (int i = 0; i < kColumnCount; ++i) SetColWidth(i, Columns()[std::size_t(i)].defaultWidth);
  SetNumberRows(0);
  LayoutColumns();
}

TimeASGrid::~TimeASGrid() = default;

// ---- Instrument -----------------------------------------------------------------

void TimeASGrid::SetInstrument(const InstrumentKey& key, int page) {
  CInstrumentGrid::Reset();
  m_key = key;
  m_lastFilled = -1;
  m_total = 0;
  m_stamp = 0;
  m_seenHeaders = m_seenPages = ~std::uint64_t{0};
  const std::uint32_t now = platform::TickCount();
  if (page <= 0) {
    m_page = sales::kLivePage;
    sales::RegisterPage(m_key, sales::kLivePage, now);
  } else {
    m_page = page;
    for (int p = 1; p < page && p <= sales::kMaxHistoryPage; ++p) sales::RegisterPage(m_key, p, now);
  }
  LayoutColumns();
}

void TimeASGrid::Reset() {
  CInstrumentGrid::Reset();
  m_key = InstrumentKey{-1, L""};
  m_page = 0;
  m_lastFilled = -1;
  m_total = 0;
  m_stamp = 0;
  m_seenHeaders = m_seenPages = ~std::uint64_t{0};
  LayoutColumns();
}

std::uint64_t TimeASGrid::NewestStamp() {
  if (m_key.InstrumentCode.empty()) return 0;
  Recount();
  return m_stamp;
}

void TimeASGrid::Recount() {
  const std::uint64_t headers = SalesSummaryStore::Instance().Version();
  const std::uint64_t pages = SalesPageStore::Instance().Version();
  if (headers == m_seenHeaders && pages == m_seenPages) return;  // nothing moved anywhere
  m_seenHeaders = headers;
  m_seenPages = pages;

  std::uint64_t headerStamp = 0;
  SalesSummaryStore::Instance().Read([&](const SalesSummaryStore::Reader& reader) {
    const SalesSummaryRecord* r = reader.Find(m_key);
    if (!r) return;
    for (const QuoteCell& c : r->cells)
      if (!c.text.empty()) {
        headerStamp = r->version;
        break;
      }
  });
  int lastFilled = -1;
  std::uint64_t pageStamp = 0;
  std::int32_t total = 0;
  SalesPageStore::Instance().Read([&](const SalesPageStore::Reader& reader) {
    PageKey k{m_key.ProductID, m_key.InstrumentCode, 0};
    for (int i = 0; i < kPageSlots; ++i) {
      k.Page = i == 0 ? sales::kLivePage : i;
      const SalesPageRecord* r = reader.Find(k);
      if (!r || (*r)[SalesPageLayout::TradeData].text.empty()) continue;
      lastFilled = i;
      pageStamp = std::max(pageStamp, r->version);
      // The live page starts with the newest trade: its number is the tape's length.
      if (i == 0) total = std::min(mvd::NewestTradeNumber((*r)[SalesPageLayout::TradeData].text), kMaxRows);
    }
  });
  // Both stamps only grow, so their sum grows whenever either does.
  m_stamp = headerStamp + pageStamp;
  if (lastFilled != m_lastFilled || GetNumberRows() < total) {
    m_lastFilled = lastFilled;
    m_total = total;
    SetNumberRows(total);
    LayoutColumns();
  }
}

TradeRecord TimeASGrid::TradeOfRow(int row) const {
  TradeRecord t;
  const int rows = GetNumberRows();
  if (row < 0 || row >= rows || m_key.InstrumentCode.empty()) return t;
  TradeTape::Instance().Get(m_key, rows - row, t);
  return t;
}

void TimeASGrid::LayoutColumns() {
  const int frame = 2 * frameWidth();
  int width = std::max(0, this->width() - frame);
  const int clientHeight = std::max(0, height() - frame);
  // Whether the rows fit is decided in 64 bits: a tape may hold many thousand rows.
  const std::int64_t needed = (std::int64_t(GetNumberRows()) + 1) * kRowHeight;
  if (needed > clientHeight) width = std::max(0, width - VScrollBarWidth());
  const int each = width / kColumnCount;
  for (int col = 0; col < kColumnCount; ++col) SetColWidth(col, each);
  SetColWidth(0, each + width % kColumnCount);
}

// ---- Style and language -------------------------------------------------------------

void TimeASGrid::SetStyleManager(IStyleManager* style) {
  CInstrumentGrid::SetStyleManager(style);
  if (style) {
    m_cellFont = style->GetFont(kCellFontId);
    SetDefFont(m_cellFont);
    SetHeadingFont(style->GetFont(kHeadingFontId));
    m_buyColor = style->Color(kBuyColor);
    m_sellColor = style->Color(kSellColor);
  }
  LayoutColumns();
  Redraw();
}

void TimeASGrid::ApplyLanguage(const ILanguage* language) {
  auto text = [&](int id, const wchar_t* fallback) {
    std::wstring t = language ? language->GetText(addon::kLanguageSection, id) : std::wstring();
    return t.empty() ? std::wstring(fallback) : t;
  };
  for (int i = 0; i < kColumnCount; ++i) {
    const ColumnDef& def = Columns()[std::size_t(i)];
    m_headings[std::size_t(i)] = text(def.headingId, def.fallbackHeading);
  }
  m_buyText = text(kBuyTextId, L"Buy");
  m_sellText = text(kSellTextId, L"Sell");
  Redraw();
}

std::wstring TimeASGrid::HeadingText(int position) const {
  if (position < 0 || position >= kColumnCount) return {};
  return m_headings[std::size_t(position)];
}

std::wstring TimeASGrid::SideText(const std::wstring& code) const {
  if (code == L"1") return m_buyText;
  if (code == L"2") return m_sellText;
  if (code == L"3") return L"Auction";
  if (code == L"0") return L"Married Deal";
  return {};
}

// ---- Cells ----------------------------------------------------------------------------

QString TimeASGrid::CellText(int col, int row) {
  CGridCell cell;
  GetCell(col, row, cell);
  return cell.text;
}

void TimeASGrid::OnGetCell(int col, int row, CGridCell& cell) {
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
  cell.SetFont(m_cellFont);
  cell.SetAlignment(Qt::AlignCenter);
  cell.SetTextColor(m_cellText);
  cell.SetBackColor(RowBackColor(row));
  const int rows = GetNumberRows();
  if (row >= rows) return;
  TradeTape::Instance().Read(m_key, rows - row, [&](const TradeRecord& t) {
    switch (col) {
      case kTime:
        cell.SetText(mvd::IsNonFiniteText(t.time) ? std::wstring() : t.time.size() > 8 ? t.time.substr(8) : t.time);
        break;
      case kPrice:
        // As received, but a non-finite number reads as no price.
        cell.SetText(mvd::IsNonFiniteText(t.price) ? std::wstring() : t.price);
        break;
      case kVol:
        cell.SetText(VolumeText(t.volume));
        break;
      case kSide:
        cell.SetText(SideText(t.side));
        if (t.side == L"1") cell.SetTextColor(m_buyColor);
        else if (t.side == L"2") cell.SetTextColor(m_sellColor);
        break;
      default:
        break;
    }
  });
}

bool TimeASGrid::OnHint(int col, int row, QString& text) {
  if (row != kHeading || col < 0 || col >= kColumnCount) return false;
  text = QString::fromStdWString(m_headings[std::size_t(col)]);
  return true;
}

// ---- Mouse ---------------------------------------------------------------------------------

void TimeASGrid::OnMouseMove(int col, int row, const QPoint&, Qt::MouseButtons) {
  SetGridCursor(row >= 0 && col == kPrice ? Qt::PointingHandCursor : Qt::ArrowCursor);
}

void TimeASGrid::OnLClicked(int col, int row, bool pressed, const QRect&, const QPoint&) {
  if (!pressed || row < 0 || col != kPrice) return;
  OpenTrade(row);
}

void TimeASGrid::OpenTrade(int row) {
  const TradeRecord trade = TradeOfRow(row);
  if (trade.number == 0 || trade.price.empty() || mvd::IsNonFiniteText(trade.price)) return;
  // The side codes of a trade are "0" to "3"; only "A" and "B" name a side
  // for the ticket, so a click usually opens it without one.
  const char* side = trade.side == L"A" ? "Buy" : trade.side == L"B" ? "Sell" : "";
  addon::LinkTextBuilder link("price view");
  link.Add(addon::linkkey::kInstrumentCode, m_key.InstrumentCode)
      .AddInt64(addon::linkkey::kProductId, m_key.ProductID)
      .Add(addon::linkkey::kSide, side)
      .Add(addon::linkkey::kTradePrice, trade.price);
  const std::wstring text = link.Wide();
  platform::SendMessage(parentWidget(), addon::Msg().wlOpenTrade, ToLParam(&text), 0);
}

void TimeASGrid::OnSize(int, int) { LayoutColumns(); }
