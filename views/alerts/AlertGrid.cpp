#include "views/alerts/AlertGrid.h"

#include <QScrollBar>
#include <algorithm>

#include "addon/Feeds.h"
#include "addon/TextTables.h"
#include "data/MarketDelayCache.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostview/Services.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/alerts/AlertRules.h"

namespace {

constexpr int kCellFontId = 16;
constexpr int kHeadingFontId = 17;

InstrumentKey KeyOf(const PriceAlertItem& a) { return InstrumentKey{a.productId, hv::Widen(a.instrumentCode)}; }

}  // namespace

const std::array<AlertGrid::ColumnDef, AlertGrid::kColumnCount>& AlertGrid::Columns() {
  static const std::array<ColumnDef, kColumnCount> columns{{
      {"colCheck", 100, true, 1, 0},
      {"colIcon", 80, true, 2, 0},
      {"colExchange", 80, true, 3, 701},
      {"colSymbol", 80, true, 4, 702},
      {"colName", 80, true, 5, 703},
      {"colTrgOnce", 100, true, 6, 704},
      {"colValidity", 100, true, 7, 705},
      {"colDelay", 80, true, 8, 706},
      {"colCondition", 80, true, 9, 707},
      {"colCurValue", 80, true, 10, 708},
      {"colAlertVia", 80, false, 11, 709},
      {"colStatus", 80, true, 12, 710},
  }};
  return columns;
}

AlertGrid::AlertGrid(QWidget* parent) : CInstrumentGrid(parent) {
  SetSelectionMode(SingleSelection);
  SetSH_Width(0);
  SetTH_Height(kRowHeight);
  SetDefRowHeight(kRowHeight);
  SetHighlightSelection(false);
  EnableColumnMove(false);
  EnableRowMove(false);
  SetNumberRows(0);
  ApplyVisibility();
}

AlertGrid::~AlertGrid() = default;

// ---- Columns ------------------------------------------------------------------------

void AlertGrid::SetVisibility(const std::wstring& visibility) {
  std::wstring v = visibility.size() < std::size_t(kColumnCount) ? std::wstring(kDefaultVisibility)
                                                                  : visibility.substr(0, kColumnCount);
  for (wchar_t& c : v)
    if (c != L'1') c = L'0';
  m_visibility = std::move(v);
  ApplyVisibility();
}

void AlertGrid::ApplyVisibility() {
  m_shown.clear();
  for (int i = 0; i < kColumnCount; ++i)
    if (m_visibility[std::size_t(i)] == L'1') m_shown.push_back(i);
  SetNumberCols(int(m_shown.size()));
  for (int col = 0; col < int(m_shown.size()); ++col)
    SetColWidth(col, Columns()[std::size_t(m_shown[std::size_t(col)])].width);
  RefitColumns();
  Redraw();
}

int AlertGrid::PositionOf(int col) const {
  if (col < 0 || col >= int(m_shown.size())) return -1;
  return m_shown[std::size_t(col)];
}

int AlertGrid::ColumnOf(int position) const {
  for (int col = 0; col < int(m_shown.size()); ++col)
    if (m_shown[std::size_t(col)] == position) return col;
  return -1;
}

void AlertGrid::RefitColumns() {
  const int count = int(m_shown.size());
  if (count == 0) return;
  setUpdatesEnabled(false);
  const int frame = 2 * frameWidth();
  int width = std::max(0, this->width() - frame);
  const int clientHeight = std::max(0, height() - frame);
  if ((int(m_rows.size()) + 1) * kRowHeight > clientHeight) width = std::max(0, width - VScrollBarWidth());
  // The tick and picture columns need little room; the others share the rest
  // in proportion to their default widths, never below a readable minimum.
  int fixed = 0;
  int weights = 0;
  for (int position : m_shown) {
    if (position == kCheck) fixed += kTickWidth;
    else if (position == kIcon) fixed += kIconWidth;
    else weights += Columns()[std::size_t(position)].width;
  }
  const int rest = std::max(0, width - fixed);
  int used = 0;
  int lastFlexible = -1;
  for (int col = 0; col < count; ++col) {
    const int position = m_shown[std::size_t(col)];
    int w;
    if (position == kCheck) w = kTickWidth;
    else if (position == kIcon) w = kIconWidth;
    else {
      w = weights > 0 ? rest * Columns()[std::size_t(position)].width / weights : kMinColumnWidth;
      w = std::max(w, kMinColumnWidth);
      used += w;
      lastFlexible = col;
    }
    SetColWidth(col, w);
  }
  // Rounding leftovers go to the last column that shares the width.
  if (lastFlexible >= 0 && used < rest) SetColWidth(lastFlexible, GetColWidth(lastFlexible) + rest - used);
  setUpdatesEnabled(true);
}

bool AlertGrid::TakeRefit() {
  const bool pending = m_refitPending;
  m_refitPending = false;
  return pending;
}

void AlertGrid::OnSize(int, int) { m_refitPending = true; }

// ---- Rows ------------------------------------------------------------------------------

void AlertGrid::SetRows(std::vector<PriceAlertItem> rows) {
  m_rows = std::move(rows);
  SetNumberRows(int(m_rows.size()));
  m_refitPending = false;
  RefitColumns();
  Redraw();
}

void AlertGrid::ToggleRow(int row) {
  if (row < 0 || row >= int(m_rows.size())) return;
  PriceAlertItem& alert = m_rows[std::size_t(row)];
  alert.ticked = !alert.ticked;
  alerts::Store().Put(alert);
  Redraw();
  NotifyTicks();
}

void AlertGrid::ToggleAll() {
  m_allTicked = !m_allTicked;
  // Every alert of the store, shown or filtered out.
  std::vector<PriceAlertItem> records = alerts::Store().Records();
  for (PriceAlertItem& r : records) {
    r.ticked = m_allTicked;
    alerts::Store().Put(r);
  }
  for (PriceAlertItem& r : m_rows) r.ticked = m_allTicked;
  Redraw();
  NotifyTicks();
}

int AlertGrid::TickedCount() const {
  return int(std::count_if(m_rows.begin(), m_rows.end(), [](const PriceAlertItem& a) { return a.ticked; }));
}

std::vector<std::int32_t> AlertGrid::TickedIds() const {
  std::vector<std::int32_t> ids;
  for (const PriceAlertItem& a : m_rows)
    if (a.ticked) ids.push_back(a.alertId);
  return ids;
}

void AlertGrid::NotifyTicks() {
  if (m_onTicks) m_onTicks();
}

int AlertGrid::OnCellTypeNotify(CGridCellType* type, int col, int row, int code, std::intptr_t) {
  if (type != &m_check || code != CGridCheckBoxType::kNotifyCheckClicked || PositionOf(col) != kCheck) return 0;
  if (row == kHeading) ToggleAll();
  else ToggleRow(row);
  return 1;
}

// ---- Texts, style, quotes ------------------------------------------------------------------

void AlertGrid::ApplyLanguage(const ILanguage* language) {
  for (int i = 0; i < kColumnCount; ++i) {
    const int id = Columns()[std::size_t(i)].headingId;
    m_headings[std::size_t(i)] = id ? alerts::CachedText(id) : std::wstring();
  }
  auto status = [&](int id, const wchar_t* fallback) {
    std::wstring t = language ? language->GetText(addon::kLanguageSection, id) : std::wstring();
    return t.empty() ? std::wstring(fallback) : t;
  };
  m_triggeredText = status(alerts::text::kTriggered, L"Triggered");
  m_expiredText = status(alerts::text::kExpired, L"Expired");
  Redraw();
}

void AlertGrid::SetStyleManager(IStyleManager* style) {
  CInstrumentGrid::SetStyleManager(style);
  if (style) {
    SetDefFont(style->GetFont(kCellFontId));
    SetHeadingFont(style->GetFont(kHeadingFontId));
    m_triggeredColor = style->Color(kTriggeredColor);
    m_expiredColor = style->Color(kExpiredColor);
    m_styleId = style->GetStyleID();
  }
  m_check.SetGrid(this);
  RefitColumns();
  Redraw();
}

void AlertGrid::ChangeStyle(int styleId) {
  m_styleId = styleId;
  m_pictureIndex.clear();
  m_pictures.clear();
  Redraw();
}

std::set<InstrumentKey> AlertGrid::InstrumentKeys() const {
  std::set<InstrumentKey> keys;
  for (const PriceAlertItem& a : m_rows) keys.insert(KeyOf(a));
  return keys;
}

std::uint64_t AlertGrid::QuoteVersion() const {
  return addon::QuoteFeed::Instance().NewestStamp(InstrumentKeys());
}

std::wstring AlertGrid::HeadingText(int position) const {
  if (position < 0 || position >= kColumnCount) return {};
  return m_headings[std::size_t(position)];
}

int AlertGrid::PictureIndex(std::int64_t productId) {
  const JProduct* product = ProductMgr().FindPtr(productId);
  if (!product || product->pictureFile.empty()) return -1;
  const auto it = m_pictureIndex.find(product->pictureFile);
  if (it != m_pictureIndex.end()) return it->second;
  CStyleImage image(hv::Widen(product->pictureFile));
  QPixmap picture = image.Get(m_style, m_styleId);
  const int index = picture.isNull() ? -1 : int(m_pictures.size());
  if (index >= 0) m_pictures.push_back(std::move(picture));
  m_pictureIndex.emplace(product->pictureFile, index);
  return index;
}

void AlertGrid::PictureType::OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool selected,
                                    bool) {
  DrawBackground(p, rect, cell, selected);
  DrawBorder(p, rect);
  if (!cell.hasParam || cell.param < 0 || cell.param >= std::int64_t(m_owner->m_pictures.size())) return;
  const QPixmap& pm = m_owner->m_pictures[std::size_t(cell.param)];
  const QRect area = rect.adjusted(2, 2, -3, -3);
  if (area.width() <= 0 || area.height() <= 0) return;
  const QPixmap scaled = pm.height() > area.height() || pm.width() > area.width()
                             ? pm.scaled(area.size(), Qt::KeepAspectRatio, Qt::SmoothTransformation)
                             : pm;
  p.drawPixmap(area.x() + (area.width() - scaled.width()) / 2, area.y() + (area.height() - scaled.height()) / 2,
               scaled);
}

// ---- Cells -----------------------------------------------------------------------------------

QString AlertGrid::CellText(int col, int row) {
  CGridCell cell;
  GetCell(col, row, cell);
  return cell.text;
}

void AlertGrid::OnGetCell(int col, int row, CGridCell& cell) {
  const int position = PositionOf(col);
  if (position < 0) return;
  if (row == kHeading) {
    cell.SetTextColor(m_headText);
    cell.SetBackColor(m_headBack);
    if (position == kCheck) {
      cell.SetCellType(&m_check);
      cell.SetNumber(m_allTicked ? 1 : 0);
      cell.SetAlignment(Qt::AlignCenter);
      return;
    }
    cell.SetText(m_headings[std::size_t(position)]);
    cell.SetCellType(&m_headingType);
    cell.SetAlignment(Qt::AlignCenter);
    return;
  }
  if (row < 0 || row >= int(m_rows.size())) return;
  cell.SetTextColor(m_cellText);
  cell.SetBackColor(RowBackColor(row));
  cell.SetAlignment(Qt::AlignLeft | Qt::AlignVCenter);
  FillDataCell(position, m_rows[std::size_t(row)], cell);
}

void AlertGrid::FillDataCell(int position, const PriceAlertItem& alert, CGridCell& cell) {
  switch (position) {
    case kCheck:
      cell.SetCellType(&m_check);
      cell.SetNumber(alert.ticked ? 1 : 0);
      cell.SetAlignment(Qt::AlignCenter);
      return;
    case kIcon: {
      cell.SetCellType(&m_picture);
      const int index = PictureIndex(alert.productId);
      if (index >= 0) cell.SetParam(index);
      return;
    }
    case kExchange:
      cell.SetTextUtf8(alert.exchangeCode);
      return;
    case kSymbol:
      cell.SetTextUtf8(alert.instrumentCode);
      return;
    case kName:
      if (const auto* ins = InstrumentMgr_ReadOnly().FindPtr(KeyOf(alert))) cell.SetTextUtf8(ins->instrumentName);
      return;
    case kTrgOnce:
      cell.SetText(alerts::CachedText(alert.triggerOnce ? alerts::text::kYes : alerts::text::kNo));
      return;
    case kValidity:
      cell.SetText(alerts::ValidityText(alert.validUntil));
      return;
    case kDelay:
      cell.SetText(MarketDelayCache::Instance().Lookup(alert.productId, hv::Widen(alert.exchangeCode)));
      cell.SetAlignment(Qt::AlignRight | Qt::AlignVCenter);
      return;
    case kCondition:
      cell.SetText(alerts::ConditionText(alert, InstrumentDecimals(KeyOf(alert))));
      return;
    case kCurValue: {
      const int field = alerts::FieldIndex(alert.priceField);
      const QuoteLayout::Field f = field == 0 ? QuoteLayout::Ask : field == 1 ? QuoteLayout::Bid : QuoteLayout::Last;
      QuoteCell value;
      // Nothing until the terminal has sent a value.
      if (addon::QuoteFeed::Instance().ReadCell(KeyOf(alert), f, value) && value.filled) cell.SetText(value.text);
      cell.SetAlignment(Qt::AlignRight | Qt::AlignVCenter);
      return;
    }
    case kAlertVia:
      cell.SetText(alerts::AlertViaText(alert, m_appCaption));
      return;
    case kStatus:
      if (alert.status == alerts::kTriggered) {
        cell.SetText(m_triggeredText);
        cell.SetTextColor(m_triggeredColor);
      } else if (alert.status == alerts::kExpired) {
        cell.SetText(m_expiredText);
        cell.SetTextColor(m_expiredColor);
      } else {
        cell.SetTextUtf8(alert.status);
      }
      return;
    default:
      return;
  }
}

bool AlertGrid::OnHint(int col, int row, QString& text) {
  const int position = PositionOf(col);
  if (position < 0) return false;
  if (row == kHeading) {
    text = QString::fromStdWString(m_headings[std::size_t(position)]);
    return !text.isEmpty();
  }
  if (row < 0 || row >= int(m_rows.size())) return false;
  const PriceAlertItem& alert = m_rows[std::size_t(row)];
  // When and at what value the alert last fired, as the terminal recorded it.
  if (position == kStatus && alert.status == alerts::kTriggered && !alert.hostTextA.empty()) {
    text = QString::fromStdWString(m_triggeredText) + QStringLiteral(" ") + QString::fromUtf8(alert.hostTextA);
    if (!alert.hostTextB.empty()) text += QStringLiteral(" at ") + QString::fromUtf8(alert.hostTextB);
    return true;
  }
  CGridCell cell;
  GetCell(col, row, cell);
  if (cell.text.isEmpty()) return false;
  text = cell.text;
  return true;
}
