#include "views/price/PriceGrid.h"

#include <QMimeData>
#include <QPaintEvent>
#include <QHash>
#include <QPainter>
#include <QStaticText>
#include <algorithm>
#include <numeric>

#include "addon/Feeds.h"
#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "addon/TextTables.h"
#include "addon/ViewClasses.h"
#include "data/MarketDelayCache.h"
#include "data/ReferenceStores.h"
#include "hostview/DragData.h"
#include "hostview/HostLists.h"
#include "hostview/MessageIds.h"
#include "hostview/NumberText.h"
#include "hostview/Services.h"
#include "hostview/SuperBaseView.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/price/Watchlists.h"

using pricecol::Col;
using pricecol::Paint;

namespace {

constexpr int kMinRowHeight = 20;

QString Q(const std::wstring& s) { return QString::fromWCharArray(s.data(), qsizetype(s.size())); }
QString Q(const std::string& s) { return QString::fromUtf8(s.data(), qsizetype(s.size())); }

// Language text with a built-in fallback.
QString Text(int id, const wchar_t* fallback) {
  const std::wstring t = addon::LanguageTextTable::Instance().Get(id);
  return t.empty() ? QString::fromWCharArray(fallback) : Q(t);
}

bool HasValue(const QuoteCell& c) { return c.filled && !c.text.empty(); }

bool IsTradeableStatus(int status) { return status != 0 && status != 1; }

// Whole cells drawn once per look and kept as images: the marker and link
// columns draw shapes and pictures that do not change from tick to tick.
class CellTiles {
 public:
  template <class Draw>
  void Paint(QPainter& p, const QRect& rect, QString key, Draw draw) {
    const qreal dpr = p.device() ? p.device()->devicePixelRatioF() : 1.0;
    key += QStringLiteral("|%1x%2@%3").arg(rect.width()).arg(rect.height()).arg(dpr);
    auto it = m_tiles.find(key);
    if (it == m_tiles.end()) {
      if (m_tiles.size() > 1024) m_tiles.clear();
      QImage tile(rect.size() * dpr, QImage::Format_ARGB32_Premultiplied);
      tile.setDevicePixelRatio(dpr);
      tile.fill(Qt::transparent);
      QPainter tp(&tile);
      tp.setFont(p.font());
      draw(tp, QRect(QPoint(0, 0), rect.size()));
      tp.end();
      it = m_tiles.insert(key, tile);
    }
    p.drawImage(rect.topLeft(), it.value());
  }
  void Clear() { m_tiles.clear(); }

 private:
  QHash<QString, QImage> m_tiles;
};

QString ColorKey(const QColor& c) { return QString::number(c.rgba(), 16); }

// The marker columns: the product's picture (icon) and the direction of the
// day's change (arrow), both from the cell's parameter.
class PriceMarkerType : public CGridCellType {
 public:
  using CGridCellType::CGridCellType;
  // Parameters of the arrow column.
  enum : std::int64_t { kFlat = 0, kUp = 1, kDown = 2 };
  std::wstring GetName() const override { return L"PriceMarker"; }
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override {
    const QString key = QStringLiteral("%1|%2|%3|%4|%5|%6|%7")
                            .arg(cell.number)
                            .arg(cell.hasParam ? cell.param : -1)
                            .arg(cell.text.left(1), ColorKey(BackColor(cell, selected)), ColorKey(TextColor(cell, selected)))
                            .arg(ColorKey(m_grid ? m_grid->GetColors().gridLine : QColor()))
                            .arg(p.font().key());
    m_tiles.Paint(p, rect, key, [&](QPainter& tp, const QRect& r) { DrawCell(tp, r, cell, selected); });
  }

 private:
  void DrawCell(QPainter& p, const QRect& rect, const CGridCell& cell, bool selected) {
    DrawBackground(p, rect, cell, selected);
    DrawBorder(p, rect);
    if (!cell.hasParam) return;
    const QRect area = rect.adjusted(4, 3, -5, -4);
    if (cell.number == 1) {  // arrow
      if (cell.param == kFlat) return;
      const QColor color = cell.param == kUp ? ColorFromRef(PriceGrid::kPositiveText) : ColorFromRef(PriceGrid::kNegativeText);
      CGridSortArrowType::DrawArrow(p, area, cell.param == kUp, color);
      return;
    }
    // Icon: a small tag in the product's colour with the first letter of its type.
    const int d = std::min(area.width(), area.height());
    const QRect tag(area.center().x() - d / 2, area.center().y() - d / 2, d, d);
    p.save();
    p.setRenderHint(QPainter::Antialiasing, true);
    p.setPen(Qt::NoPen);
    p.setBrush(cell.textColor.isValid() ? cell.textColor : QColor(30, 100, 200));
    p.drawRoundedRect(tag, 2, 2);
    p.setPen(Qt::white);
    QFont f = p.font();
    f.setPixelSize(std::max(6, d - 4));
    f.setBold(true);
    p.setFont(f);
    p.drawText(tag, Qt::AlignCenter, cell.text.left(1));
    p.restore();
  }

  CellTiles m_tiles;
};

// Headings, with or without the sort arrow: kept as images per text and look.
template <class Base>
class PriceHeadingType : public Base {
 public:
  using Base::Base;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override {
    const CGridCtrl* grid = this->Grid();
    const QString key = cell.text + QStringLiteral("|%1|%2|%3|%4|%5|%6")
                                        .arg(cell.number)
                                        .arg(ColorKey(cell.textColor), ColorKey(cell.backColor))
                                        .arg(cell.alignment)
                                        .arg(grid ? grid->GetHeadingFont().key() : QString())
                                        .arg(grid ? ColorKey(grid->GetColors().headLine) : QString());
    m_tiles.Paint(p, rect, key, [&](QPainter& tp, const QRect& r) { Base::OnDraw(tp, r, col, row, cell, selected, current); });
  }

 private:
  CellTiles m_tiles;
};

// The link column: the company-information button, kept as an image per look.
class PriceLinkType : public PArrowButtonTypeEx {
 public:
  using PArrowButtonTypeEx::PArrowButtonTypeEx;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override {
    const QString key = QStringLiteral("%1|%2|%3|%4|%5")
                            .arg(cell.flags & CGridCell::kFlagPressed ? 1 : 0)
                            .arg(ColorKey(BackColor(cell, selected)))
                            .arg(ColorKey(m_grid ? m_grid->GetColors().gridLine : QColor()))
                            .arg(StyleID())
                            .arg(quintptr(StyleManager()));
    m_tiles.Paint(p, rect, key, [&](QPainter& tp, const QRect& r) {
      PArrowButtonTypeEx::OnDraw(tp, r, col, row, cell, selected, current);
    });
  }

 private:
  CellTiles m_tiles;
};

}  // namespace

// The data cells: background, the right and bottom border, then the text.
// Texts are laid out once and kept (QStaticText): a quote table redraws the
// same few thousand texts many times a second, and laying text out is the
// costly part of drawing it.
class PriceTextType : public CGridCellType {
 public:
  using CGridCellType::CGridCellType;
  std::wstring GetName() const override { return L"PriceText"; }
  void SetFont(const QFont& font) {
    m_font = font;
    m_texts.clear();
    const QFontMetrics fm(font);
    m_textHeight = fm.height();
  }
  void OnDraw(QPainter& p, const QRect& rect, int, int, const CGridCell& cell, bool selected, bool) override {
    // The grid lines are drawn once over all cells (PriceGrid::paintEvent).
    p.fillRect(rect, BackColor(cell, selected));
    if (cell.text.isEmpty()) return;
    const QStaticText& text = Prepared(cell.text);
    const QRect area = rect.adjusted(3, 0, -4, -1);
    const qreal width = text.size().width();
    qreal x = area.left();
    if (cell.alignment & Qt::AlignRight) x = area.right() + 1 - width;
    else if (cell.alignment & Qt::AlignHCenter) x = area.left() + (area.width() - width) / 2;
    const qreal y = area.top() + (area.height() - m_textHeight) / 2.0;
    if (p.font() != m_font) p.setFont(m_font);
    const QColor color = TextColor(cell, selected);
    if (p.pen().color() != color || p.pen().style() != Qt::SolidLine) p.setPen(color);
    if (width > area.width()) {
      // Too wide: cut at the cell's edge.
      p.save();
      p.setClipRect(area, Qt::IntersectClip);
      p.drawStaticText(QPointF(area.left(), y), text);
      p.restore();
      return;
    }
    p.drawStaticText(QPointF(x, y), text);
  }

 private:
  const QStaticText& Prepared(const QString& text) {
    auto it = m_texts.find(text);
    if (it != m_texts.end()) return it.value();
    // Prices move: the cache is dropped now and then rather than grown forever.
    if (m_texts.size() > 20000) m_texts.clear();
    QStaticText st(text);
    st.setTextFormat(Qt::PlainText);
    st.setPerformanceHint(QStaticText::AggressiveCaching);
    st.prepare(QTransform(), m_font);
    return m_texts.insert(text, st).value();
  }

  QFont m_font;
  int m_textHeight = 12;
  QHash<QString, QStaticText> m_texts;
};

namespace {

QColor ProductColor(const std::string& type) {
  if (type == "CFD") return QColor(200, 110, 20);
  if (type == "FUT") return QColor(120, 70, 170);
  if (type == "FX") return QColor(20, 140, 140);
  if (type == "DMA") return QColor(170, 40, 80);
  if (type == "CS") return QColor(90, 110, 40);
  return QColor(30, 100, 200);
}

}  // namespace

PriceGrid::PriceGrid(QWidget* parent)
    : CGridCtrl(parent),
      m_markerType(std::make_unique<PriceMarkerType>(this)),
      m_textType(std::make_unique<PriceTextType>(this)),
      m_linkType(std::make_unique<PriceLinkType>(this)),
      m_headingType(std::make_unique<PriceHeadingType<CGridHeadingType>>(this)),
      m_sortArrowType(std::make_unique<PriceHeadingType<PSortArrowTypeEx>>(this)) {
  SetDefCellType(m_textType.get());
  SetSelectionMode(MultiSelection);
  SetSH_Width(0);
  SetHighlightSelection(false);
  EnableColumnMove(true);
  EnableRowMove(false);
  EnableDragOut(true);
  m_palette.evenRow = ColorFromRef(kDefaultEvenRow);
  m_palette.oddRow = ColorFromRef(kDefaultOddRow);
  m_palette.selBack = ColorFromRef(kDefaultSelRow);
  m_palette.selText = QColor(0, 0, 0);
  m_palette.text = QColor(0, 0, 0);
  m_palette.riseBack = QColor(200, 240, 205);
  m_palette.fallBack = QColor(255, 210, 210);
  m_palette.changedBack = QColor(255, 236, 160);
  m_palette.changedText = QColor(0, 0, 0);
  m_sortArrowType->SetUseThemes(false);
  m_font = GetDefFont();
  ApplyColumns();
}

PriceGrid::~PriceGrid() = default;

CSuperBaseView* PriceGrid::Owner() const {
  if (m_owner) return m_owner;
  return qobject_cast<CSuperBaseView*>(parentWidget());
}

// ---- Rows --------------------------------------------------------------------------

void PriceGrid::LoadWatchlist(int listKind, const std::wstring& name) {
  std::vector<InstrumentKey> items;
  if (WatchlistStoreT* store = StoreOfKind(listKind))
    if (const WatchListDetail* w = store->FindPtr(name)) items = w->items;
  LoadItems(listKind, name, items);
}

void PriceGrid::LoadItems(int listKind, const std::wstring& name, const std::vector<InstrumentKey>& items) {
  m_listKind = listKind;
  m_listName = name;
  if (m_columnsKind != (listKind == kWorldIndices)) ApplyColumns();
  EnableRowMove(listKind == kUserWatchlists || listKind == kKeldoWatchlists);
  SetRows(items);
  ClearSelection();
  SetTopRow(0);
  RedrawAll();
}

void PriceGrid::SetRows(std::vector<InstrumentKey> keys) {
  m_rows.clear();
  m_rows.reserve(keys.size());
  for (auto& key : keys) m_rows.push_back(JoinRow(key));
  m_quotes.assign(m_rows.size(), QuoteRecord{});
  m_quoteVersion.assign(m_rows.size(), 0);
  for (std::size_t i = 0; i < m_rows.size(); ++i) ReadRowQuote(i);
  m_seenStoreVersion = ~0ull;
  SetNumberRows(int(m_rows.size()));
  AskMarketDelays();
}

PriceGrid::Row PriceGrid::JoinRow(const InstrumentKey& key) const {
  Row row;
  row.key = key;
  // The price view's own records (names the terminal changed) win over the list.
  const JInstrumentUnderlying* ins = InstrumentMgr().FindPtr(key);
  if (!ins) ins = InstrumentMgr_ReadOnly().FindPtr(key);
  if (!ins) {
    row.symbol = Q(key.InstrumentCode);
    return row;
  }
  row.known = true;
  row.symbol = Q(mvd::TrimmedWide(ins->symbol.empty() ? ins->instrumentCode : ins->symbol));
  row.name = Q(mvd::TrimmedWide(ins->instrumentName));
  row.exchange = Q(mvd::TrimmedWide(ins->exchangeCode));
  row.currency = Q(ins->currency);
  row.exchangeCode = ins->exchangeCode;
  row.accessStatus = ins->accessStatus;
  row.productType = Q(ins->productType.empty() ? std::string("ES") : ins->productType);
  return row;
}

void PriceGrid::RejoinInstruments() {
  for (Row& row : m_rows) row = JoinRow(row.key);
  AskMarketDelays();
  RedrawAll();
}

bool PriceGrid::AddRow(const InstrumentKey& key) {
  if (FindRow(key) >= 0) return false;
  m_rows.push_back(JoinRow(key));
  m_quotes.emplace_back();
  m_quoteVersion.push_back(0);
  ReadRowQuote(m_rows.size() - 1);
  SetNumberRows(int(m_rows.size()));
  AskMarketDelays();
  RedrawAll();
  return true;
}

void PriceGrid::ReadRowQuote(std::size_t i) {
  // A shown instrument is registered with the quote feed: its record exists
  // (so that values land) and it is asked for on the view's next second.
  addon::QuoteFeed& feed = addon::QuoteFeed::Instance();
  feed.Register(m_rows[i].key, {}, platform::TickCount());
  feed.Read(m_rows[i].key, m_quotes[i]);
  m_quoteVersion[i] = m_quotes[i].version;
}

std::vector<InstrumentKey> PriceGrid::Rows() const {
  std::vector<InstrumentKey> keys;
  keys.reserve(m_rows.size());
  for (const Row& r : m_rows) keys.push_back(r.key);
  return keys;
}

std::vector<InstrumentKey> PriceGrid::SelectedKeys() const {
  std::vector<InstrumentKey> keys;
  for (int r : GetSelectedRows()) keys.push_back(m_rows[std::size_t(r)].key);
  return keys;
}

void PriceGrid::SelectKeys(const std::vector<InstrumentKey>& keys) {
  ClearSelection();
  bool first = true;
  for (const InstrumentKey& k : keys) {
    const int row = FindRow(k);
    if (row < 0) continue;
    if (first) GotoCell(std::max(0, GetCurrentCol()), row);
    else SelectRow(row, true);
    first = false;
  }
  RedrawAll();
}

int PriceGrid::FindRow(const InstrumentKey& key) const {
  for (std::size_t i = 0; i < m_rows.size(); ++i)
    if (m_rows[i].key == key) return int(i);
  return -1;
}

std::wstring PriceGrid::UserItemText() const { return watchlist::UserItemText(Rows()); }
std::wstring PriceGrid::KeldoItemText() const { return watchlist::KeldoItemText(Rows()); }

void PriceGrid::AskMarketDelays() {
  // The delay column reads the market information of each exchange; the
  // terminal answers 601 at once, so each key is asked at most once here.
  if (ColumnOf(Col::Delay) < 0) return;
  CSuperBaseView* owner = Owner();
  if (!owner) return;
  std::wstring text;
  for (const Row& row : m_rows) {
    if (!row.known) continue;
    const std::wstring exchange = hv::Widen(row.exchangeCode);
    if (MarketDelayCache::Instance().Find(row.key.ProductID, exchange, text)) continue;
    JMarketInfoRequest request;
    request.productId = row.key.ProductID;
    request.exchangeCode = row.exchangeCode;
    owner->SendChildFeedback(hm::MarketInfo, ToLParam(&request));
    // Remembered as "no delay" when the terminal did not answer.
    if (!MarketDelayCache::Instance().Find(row.key.ProductID, exchange, text))
      MarketDelayCache::Instance().Set(row.key.ProductID, exchange, std::wstring());
  }
}

QString PriceGrid::DelayText(const Row& row) const {
  if (!row.known) return {};
  return Q(MarketDelayCache::Instance().Lookup(row.key.ProductID, hv::Widen(row.exchangeCode)));
}

// ---- Refresh --------------------------------------------------------------------------

std::uint64_t PriceGrid::UpdateCounter() {
  QuoteStore& store = QuoteStore::Instance();
  const std::uint64_t version = store.Version();
  if (version == m_seenStoreVersion) return m_updates;
  m_seenStoreVersion = version;
  store.Read([&](const QuoteStore::Reader& reader) {
    for (std::size_t i = 0; i < m_rows.size(); ++i) {
      const QuoteRecord* r = reader.Find(m_rows[i].key);
      if (!r || r->version == m_quoteVersion[i]) continue;
      m_quotes[i] = *r;
      m_quoteVersion[i] = r->version;
      ++m_updates;
    }
  });
  return m_updates;
}

// ---- Sorting ------------------------------------------------------------------------------

void PriceGrid::SortOnColumn(int col) {
  if (col < 0 || col >= int(m_columns.size())) return;
  if (!m_columns[std::size_t(col)].info->sortable) return;
  if (m_sortCol != col) {
    m_sortCol = col;
    m_sortFlag = 1;
  } else {
    m_sortFlag = m_sortFlag ? 0 : 1;
  }
  SortRows();
  RedrawAll();
}

bool PriceGrid::ApplySort() {
  if (m_sortCol < 0 || m_sortCol >= int(m_columns.size())) return false;
  SortRows();
  return true;
}

void PriceGrid::ClearSort() {
  m_sortCol = -1;
  m_sortFlag = 0;
  RedrawAll();
}

void PriceGrid::SortRows() {
  const Column& column = m_columns[std::size_t(m_sortCol)];
  const std::size_t n = m_rows.size();
  // Rows with a value in sort order, ties in their previous order (so that
  // re-sorting every tick never shuffles equal rows); rows without one last.
  std::vector<std::size_t> withValue, without;
  withValue.reserve(n);
  const int field = column.info->quoteField;
  const bool numeric = field >= 0 && QuoteLayout::kCells[std::size_t(field)].kind != CellKind::Text;
  if (numeric) {
    std::vector<double> values(n, 0.0);
    for (std::size_t i = 0; i < n; ++i) {
      const QuoteCell& c = m_quotes[i][std::size_t(field)];
      if (HasValue(c)) { values[i] = c.value; withValue.push_back(i); }
      else without.push_back(i);
    }
    const bool ascending = m_sortFlag != 0;
    std::stable_sort(withValue.begin(), withValue.end(), [&](std::size_t a, std::size_t b) {
      return ascending ? values[a] < values[b] : values[b] < values[a];
    });
  } else {
    std::vector<QString> texts(n);
    for (std::size_t i = 0; i < n; ++i) {
      texts[i] = CellText(int(m_sortCol), int(i));
      (texts[i].isEmpty() ? without : withValue).push_back(i);
    }
    const bool ascending = m_sortFlag != 0;
    std::stable_sort(withValue.begin(), withValue.end(), [&](std::size_t a, std::size_t b) {
      const int c = QString::compare(texts[a], texts[b], Qt::CaseInsensitive);
      return ascending ? c < 0 : c > 0;
    });
  }
  withValue.insert(withValue.end(), without.begin(), without.end());
  Permute(withValue);
}

void PriceGrid::Permute(const std::vector<std::size_t>& order) {
  bool identity = true;
  for (std::size_t i = 0; i < order.size() && identity; ++i) identity = order[i] == i;
  if (identity) return;
  // The selection follows its instruments.
  std::vector<char> selected(m_rows.size(), 0);
  for (int r : GetSelectedRows()) selected[std::size_t(r)] = 1;
  std::vector<Row> rows;
  std::vector<QuoteRecord> quotes;
  std::vector<std::uint64_t> versions;
  rows.reserve(order.size());
  quotes.reserve(order.size());
  versions.reserve(order.size());
  std::vector<int> newSelected;
  for (std::size_t i = 0; i < order.size(); ++i) {
    const std::size_t from = order[i];
    rows.push_back(std::move(m_rows[from]));
    quotes.push_back(std::move(m_quotes[from]));
    versions.push_back(m_quoteVersion[from]);
    if (selected[from]) newSelected.push_back(int(i));
  }
  m_rows = std::move(rows);
  m_quotes = std::move(quotes);
  m_quoteVersion = std::move(versions);
  if (!newSelected.empty()) {
    ClearSelection();
    for (int r : newSelected) SelectRow(r, true);
  }
}

// ---- Columns, fonts, style ----------------------------------------------------------------------

void PriceGrid::ApplyColumns() {
  const Col sortedKey = ColumnAt(m_sortCol);
  const std::vector<ColumnSettingItem> items = pricecol::ColumnsFor(m_listKind);
  m_columnsKind = m_listKind == kWorldIndices;
  m_columns.clear();
  for (const ColumnSettingItem& item : items) {
    Column c;
    c.info = &pricecol::InfoOf(item.key);
    c.col = c.info->col;
    if (!pricecol::HasEmptyHeading(c.col)) {
      std::wstring text = addon::LanguageTextTable::Instance().Get(item.textId);
      if (text.empty()) text = item.header;
      if (text.empty()) text = c.info->fallbackHeading;
      if (text.empty()) text = hv::Widen(item.key);
      c.heading = Q(text);
    }
    m_columns.push_back(std::move(c));
  }
  SetNumberCols(int(m_columns.size()));
  // The sorted column keeps its sort when it is still shown.
  m_sortCol = sortedKey == Col::Unknown ? -1 : ColumnOf(sortedKey);
  if (m_sortCol < 0) m_sortFlag = 0;
  // Font size of the settings; the rows grow with it.
  m_font = m_style ? m_style->GetFont(16) : QFont();
  m_font.setPointSize(pricecol::FontPointSize());
  SetDefFont(m_font);
  m_textType->SetFont(m_font);
  QFont heading = m_style ? m_style->GetFont(17) : m_font;
  heading.setPointSize(pricecol::FontPointSize());
  SetHeadingFont(heading);
  const int height = std::max(kMinRowHeight, QFontMetrics(m_font).height() + 6);
  SetDefRowHeight(height);
  SetTH_Height(std::max(kMinRowHeight, QFontMetrics(heading).height() + 6));
  // A heading is never cut: its column is at least as wide as its text and
  // the sort arrow (the stored width is kept for the settings).
  const QFontMetrics headingMetrics(heading);
  for (std::size_t i = 0; i < items.size(); ++i) {
    const int needed = m_columns[i].heading.isEmpty() ? 0 : headingMetrics.horizontalAdvance(m_columns[i].heading) + 24;
    SetColWidth(int(i), std::max(std::max(0, items[i].width), needed));
  }
  AskMarketDelays();
  RedrawAll();
}

void PriceGrid::SetStyleManager(IStyleManager* style) {
  m_style = style;
  if (style) {
    m_palette.evenRow = style->Color(kEvenRowColor);
    m_palette.oddRow = style->Color(kOddRowColor);
    m_palette.selBack = style->Color(kSelBackColor);
    m_palette.selText = style->Color(kSelTextColor);
    m_palette.text = style->Color(kTextColor);
    m_palette.riseBack = style->Color(kRiseBackColor);
    m_palette.fallBack = style->Color(kFallBackColor);
    m_palette.changedBack = style->Color(kChangedBackColor);
    m_palette.changedText = style->Color(kChangedTextColor);
    m_headBack = style->Color(kHeadBackColor);
    m_headText = style->Color(kHeadTextColor);
  }
  ApplyStyle(style);
  CGridCtrl::Colors c = GetColors();
  c.back = m_palette.evenRow;
  c.empty = m_palette.evenRow;
  c.text = m_palette.text;
  c.headBack = m_headBack;
  c.headText = m_headText;
  if (style) c.gridLine = style->Color(kLineColor);
  SetColors(c);
  m_linkType->SetStyleManager(style, style ? style->GetStyleID() : 0);
  ApplyColumns();
}

int PriceGrid::ColumnOf(Col col) const {
  for (std::size_t i = 0; i < m_columns.size(); ++i)
    if (m_columns[i].col == col) return int(i);
  return -1;
}

Col PriceGrid::ColumnAt(int col) const {
  if (col < 0 || col >= int(m_columns.size())) return Col::Unknown;
  return m_columns[std::size_t(col)].col;
}

bool PriceGrid::OnCanMoveCol(int from, int to) { return from != to; }

void PriceGrid::OnColMoved(int from, int to) {
  m_columnMoved = true;
  // The new order goes to the settings; the layout is read back from there.
  pricecol::MoveColumn(m_listKind, from, to);
  m_sortCol = -1;
  m_sortFlag = 0;
  ApplyColumns();
  RedrawAll();
}

// ---- Empty text ------------------------------------------------------------------------------

void PriceGrid::SetEmptyText(const std::wstring& text) {
  if (text == m_emptyText) return;
  m_emptyText = text;
  viewport()->update();
}

void PriceGrid::paintEvent(QPaintEvent* e) {
  CGridCtrl::paintEvent(e);
  QPainter p(viewport());
  PaintGridLines(p, e->rect());
  if (m_emptyText.empty() || !m_rows.empty()) return;
  const QRect area(8, GetTH_Height() + 8, viewport()->width() - 16, std::max(0, viewport()->height() - GetTH_Height() - 16));
  if (area.width() <= 0 || area.height() <= 0) return;
  p.setFont(GetDefFont());
  p.setPen(m_palette.text);
  p.drawText(area, Qt::AlignHCenter | Qt::AlignTop | Qt::TextWordWrap, Q(m_emptyText));
}

void PriceGrid::PaintGridLines(QPainter& p, const QRect& clip) {
  const int top = GetTopRow(), bottom = GetBottomRow(), left = GetLeftCol(), right = GetRightCol();
  if (top < 0 || left < 0) return;
  const QRect first = CellRect(left, top), last = CellRect(right, bottom);
  const QRect area = QRect(0, GetTH_Height(), viewport()->width(), viewport()->height() - GetTH_Height()) & clip;
  if (area.isEmpty()) return;
  p.save();
  p.setClipRect(area);
  p.setPen(QPen(GetColors().gridLine, 0));
  // One line per row and per column instead of two per cell.
  for (int c = left; c <= right; ++c) {
    const QRect r = CellRect(c, top);
    if (r.width() > 0) p.drawLine(r.right(), first.top(), r.right(), last.bottom());
  }
  for (int row = top; row <= bottom; ++row) {
    const int y = first.top() + (row - top) * GetDefRowHeight() + GetDefRowHeight() - 1;
    p.drawLine(first.left(), y, last.right(), y);
  }
  p.restore();
}

// ---- Cells ------------------------------------------------------------------------------------

void PriceGrid::RowColors(int row, QColor& back, QColor& text) const {
  if (IsRowSelected(row)) {
    back = m_palette.selBack;
    text = m_palette.selText;
    return;
  }
  back = row % 2 == 0 ? m_palette.evenRow : m_palette.oddRow;
  text = m_palette.text;
}

QString PriceGrid::QuoteText(const Column& column, const QuoteCell& value) const {
  if (column.info->volume) {
    if (value.text.empty()) return {};
    // The host's volume text may carry thousands separators.
    double v = 0.0;
    std::wstring plain;
    plain.reserve(value.text.size());
    for (wchar_t ch : value.text) if (ch != L',') plain.push_back(ch);
    if (!mvd::ParseNumber(plain, v)) return {};
    return Q(Double2Str(v, 2));
  }
  return Q(value.text);
}

void PriceGrid::QuoteCellColors(const Column& column, const QuoteCell& value, bool selected, CGridCell& cell) const {
  switch (column.info->paint) {
    case Paint::None:
      return;
    case Paint::Signed:
      if (!selected && !value.text.empty()) {
        if (value.value > 0) cell.SetTextColor(kPositiveText);
        else if (value.value < 0) cell.SetTextColor(kNegativeText);
      }
      [[fallthrough]];
    case Paint::Direction:
      if (value.mark == kMarkUp) {
        cell.SetBackColor(m_palette.riseBack);
        cell.SetTextColor(m_palette.changedText);
      } else if (value.mark == kMarkDown) {
        cell.SetBackColor(m_palette.fallBack);
        cell.SetTextColor(m_palette.changedText);
      }
      return;
    case Paint::Changed:
      if (value.mark == kMarkChanged) {
        cell.SetBackColor(m_palette.changedBack);
        cell.SetTextColor(m_palette.changedText);
      }
      return;
  }
}

void PriceGrid::OnGetCell(int col, int row, CGridCell& cell) {
  if (col < 0 || col >= int(m_columns.size())) return;
  const Column& column = m_columns[std::size_t(col)];
  if (row == kHeading) {
    cell.text = column.heading;
    cell.SetAlignment((column.info->rightAligned ? Qt::AlignRight : Qt::AlignLeft) | Qt::AlignVCenter);
    cell.SetTextColor(m_headText);
    cell.SetBackColor(m_headBack);
    if (col == m_sortCol) {
      cell.SetCellType(m_sortArrowType.get());
      cell.SetNumber(m_sortFlag ? 0 : 1);
    } else {
      cell.SetCellType(m_headingType.get());
    }
    return;
  }
  if (row < 0 || row >= int(m_rows.size())) return;
  const Row& r = m_rows[std::size_t(row)];
  const bool selected = IsRowSelected(row);
  QColor back, text;
  RowColors(row, back, text);
  cell.SetBackColor(back);
  cell.SetTextColor(text);
  cell.SetAlignment((column.info->rightAligned ? Qt::AlignRight : Qt::AlignLeft) | Qt::AlignVCenter);
  const QuoteRecord& quote = m_quotes[std::size_t(row)];
  switch (column.col) {
    case Col::Icon:
      cell.SetCellType(m_markerType.get());
      cell.SetNumber(0);
      if (r.known) {
        cell.SetParam(0);
        cell.text = r.productType;
        cell.SetTextColor(ProductColor(r.productType.toStdString()));
      }
      return;
    case Col::Link:
      cell.SetCellType(m_linkType.get());
      return;
    case Col::Arrow: {
      cell.SetCellType(m_markerType.get());
      cell.SetNumber(1);
      const QuoteCell& change = quote[QuoteLayout::Change];
      const std::int64_t dir = !HasValue(change) || change.value == 0 ? PriceMarkerType::kFlat
                               : change.value > 0                    ? PriceMarkerType::kUp
                                                                     : PriceMarkerType::kDown;
      cell.SetParam(dir);
      return;
    }
    case Col::Symbol: cell.text = r.symbol; return;
    case Col::Name: cell.text = r.name; return;
    case Col::Exchange: cell.text = r.exchange; return;
    case Col::Currency: cell.text = r.currency; return;
    case Col::Delay: cell.text = DelayText(r); return;
    case Col::Unknown: return;
    default: break;
  }
  const int field = column.info->quoteField;
  if (field < 0) return;
  const QuoteCell& value = quote[std::size_t(field)];
  cell.text = QuoteText(column, value);
  cell.SetNumber(value.value);
  QuoteCellColors(column, value, selected, cell);
}

QString PriceGrid::CellText(int col, int row) {
  CGridCell cell;
  GetCell(col, row, cell);
  return cell.text;
}

QString PriceGrid::dumpTsv() {
  UpdateCounter();
  return CGridCtrl::dumpTsv();
}

QString PriceGrid::CopyText() {
  const std::vector<int> selected = GetSelectedRows();
  if (selected.empty()) return {};
  QString out;
  auto line = [&](int row) {
    bool first = true;
    for (int col = 0; col < GetNumberCols(); ++col) {
      if (GetColWidth(col) <= 0) continue;
      if (!first) out += QLatin1Char('\t');
      first = false;
      QString text = row == kHeading ? m_columns[std::size_t(col)].heading : CellText(col, row);
      for (QChar& ch : text)
        if (ch == QLatin1Char('\t') || ch == QLatin1Char('\n') || ch == QLatin1Char('\r')) ch = QLatin1Char(' ');
      out += text;
    }
    out += QLatin1Char('\n');
  };
  line(kHeading);
  for (int row : selected) line(row);
  return out;
}

bool PriceGrid::OnKeyDown(int key, Qt::KeyboardModifiers mods) {
  if (key == Qt::Key_C && (mods & Qt::ControlModifier)) {
    const QString text = CopyText();
    if (!text.isEmpty()) platform::Dialogs().SetClipboardText(text);
    return true;
  }
  // The grid is read-only: typing never starts an editor.
  return key == Qt::Key_F2 || key == Qt::Key_Return || key == Qt::Key_Enter;
}

bool PriceGrid::OnHint(int col, int row, QString& text) {
  if (row < 0) return false;
  switch (ColumnAt(col)) {
    case Col::LS:
    case Col::Rem:
      text = Text(419, L"");
      return !text.isEmpty();
    case Col::Delay:
      text = CellText(col, row);
      return !text.isEmpty();
    default:
      return false;
  }
}

void PriceGrid::OnMouseMove(int col, int row, const QPoint&, Qt::MouseButtons) {
  const Col c = ColumnAt(col);
  const bool hand = row >= 0 && (c == Col::Bid || c == Col::Ask);
  SetGridCursor(hand ? Qt::PointingHandCursor : Qt::ArrowCursor);
}

// ---- Header clicks -------------------------------------------------------------------------------

void PriceGrid::OnTH_LClicked(int col, bool pressed, const QRect&, const QPoint&) {
  if (pressed) {
    m_pressedHeading = col;
    m_columnMoved = false;
    return;
  }
  const int pressedCol = m_pressedHeading;
  m_pressedHeading = -2;
  if (m_columnMoved || col < 0 || col != pressedCol) return;
  SortOnColumn(col);
}

// ---- Double clicks and trade requests -----------------------------------------------------------

std::wstring PriceGrid::TradeRequestFor(int col, int row, bool* tradeable) {
  if (row < 0 || row >= int(m_rows.size())) return {};
  const Col c = ColumnAt(col);
  const QuoteRecord& quote = m_quotes[std::size_t(row)];
  const char* side = nullptr;
  std::wstring price, qty;
  int trigger = 1;
  auto wholeText = [](const QuoteCell& cell) {
    return HasValue(cell) ? std::to_wstring(static_cast<long long>(cell.value)) : std::wstring();
  };
  switch (c) {
    case Col::Bid:
      side = "Sell";
      price = HasValue(quote[QuoteLayout::Bid]) ? quote[QuoteLayout::Bid].text : L"";
      break;
    case Col::BuyVol:
      side = "Sell";
      price = HasValue(quote[QuoteLayout::Bid]) ? quote[QuoteLayout::Bid].text : L"";
      qty = wholeText(quote[QuoteLayout::BVol]);
      break;
    case Col::Ask:
      side = "Buy";
      price = HasValue(quote[QuoteLayout::Ask]) ? quote[QuoteLayout::Ask].text : L"";
      break;
    case Col::SellVol:
      side = "Buy";
      price = HasValue(quote[QuoteLayout::Ask]) ? quote[QuoteLayout::Ask].text : L"";
      qty = wholeText(quote[QuoteLayout::SVol]);
      break;
    case Col::TAC:
      if (!HasValue(quote[QuoteLayout::Tac]) || !(quote[QuoteLayout::Tac].value > 0)) return {};
      side = "Buy";
      price = quote[QuoteLayout::Tac].text;
      trigger = 0;
      break;
    default:
      return {};
  }
  const Row& r = m_rows[std::size_t(row)];
  if (tradeable) *tradeable = r.known && IsTradeableStatus(r.accessStatus);
  addon::LinkTextBuilder link("price view");
  link.Add(addon::linkkey::kInstrumentCode, r.key.InstrumentCode)
      .AddInt64(addon::linkkey::kProductId, r.key.ProductID)
      .Add(addon::linkkey::kSide, side)
      .Add(addon::linkkey::kTradePrice, price)
      .Add(addon::linkkey::kQty, qty)
      .AddInt32(addon::linkkey::kTriggerType, trigger);
  return link.Wide();
}

void PriceGrid::OnDClicked(int col, int row, const QRect&, const QPoint&) {
  if (row < 0 || row >= int(m_rows.size())) return;
  switch (ColumnAt(col)) {
    case Col::Rem:
      platform::PostMessage(Owner(), kRemarkLegendMsg, 0, 0);
      return;
    case Col::LS:
      platform::PostMessage(Owner(), kLongShortLegendMsg, 0, 0);
      return;
    case Col::Link: {
      if (m_listKind == kWorldIndices) return;
      const Row& r = m_rows[std::size_t(row)];
      addon::LinkTextBuilder link("price view");
      link.AddInt64(addon::linkkey::kProductId, r.key.ProductID)
          .Add(addon::linkkey::kExchangeCode, r.exchangeCode)
          .Add(addon::linkkey::kInstrumentCode, r.key.InstrumentCode);
      const std::wstring text = link.Wide();
      ViewLink record;
      record.link = &text;
      if (CSuperBaseView* owner = Owner()) owner->SendChildFeedback(hm::LinkedInstrument, ToLParam(&record));
      return;
    }
    default: {
      bool tradeable = false;
      const std::wstring request = TradeRequestFor(col, row, &tradeable);
      if (request.empty()) return;
      SendToOwner(addon::Msg().wlOpenTrade, ToLParam(&request), tradeable ? 0 : -1);
      return;
    }
  }
}

void PriceGrid::SendToOwner(UINT message, WPARAM wParam, LPARAM lParam) {
  platform::SendMessage(Owner(), message, wParam, lParam);
}

// ---- Context menu ---------------------------------------------------------------------------------

void PriceGrid::OnRClicked(int col, int row, bool pressed, const QRect&, const QPoint& pt) {
  if (!pressed || row < 0 || row >= int(m_rows.size()) || col < 0) return;
  ShowContextMenu(viewport()->mapToGlobal(pt));
}

std::vector<platform::MenuItem> PriceGrid::BuildContextMenu() const { return ContextMenuFor(m_listKind, m_listName); }

std::vector<platform::MenuItem> PriceGrid::ContextMenuFor(int listKind, const std::wstring& listName) {
  std::vector<platform::MenuItem> items;
  auto add = [&](int id, const QString& text) {
    platform::MenuItem item;
    item.id = id;
    item.text = text;
    items.push_back(std::move(item));
  };
  auto separator = [&] { items.push_back(platform::MenuItem{}); };
  if (listKind != kWorldIndices) {
    add(kCmdTrade, Text(401, L"Trade"));
    separator();
    add(kCmdChart, Text(402, L"Chart"));
    add(kCmdAlert, Text(414, L"Price Alert"));
    add(kCmdNews, Text(418, L"Related News"));
    separator();
    add(kCmdSales, Text(8, L"Time & Sales"));
    add(kCmdSummary, Text(10, L"Trade Summary"));
    add(kCmdAnalytics, Text(415, L"Stock Analytics"));
    add(kCmdDepth, Text(7, L"Market Depth"));
    separator();
  }
  if (listKind != kKeldoWatchlists) {
    platform::MenuItem sub;
    sub.text = Text(403, L"Add to Watchlist");
    const auto& lists = UserWatchlistStore().Records();
    for (std::size_t i = 0; i < lists.size() && int(i) < kCommandRange; ++i) {
      if (listKind == kUserWatchlists && lists[i].name == listName) continue;
      platform::MenuItem item;
      item.id = kCmdAddToUser + int(i);
      item.text = Q(lists[i].name);
      sub.children.push_back(std::move(item));
    }
    // A submenu without entries would look like a broken item.
    if (sub.children.empty()) sub.enabled = false;
    items.push_back(std::move(sub));
  }
  const WatchlistStoreT* store = StoreOfKind(listKind);
  const int position = store ? store->IndexOf(listName) : -1;
  if (listKind == kUserWatchlists && position >= 0 && position < kCommandRange)
    add(kCmdRemoveFromUser + position, Text(404, L"Remove from this Watchlist"));
  if (listKind == kKeldoWatchlists && position >= 0 && position < kCommandRange)
    add(kCmdRemoveFromKeldo + position, QStringLiteral("Remove From KELDO Watchlist"));
  // No trailing separator.
  while (!items.empty() && items.back().id == 0 && items.back().text.isEmpty()) items.pop_back();
  return items;
}

void PriceGrid::ShowContextMenu(const QPoint& globalPos) {
  if (GetSelectedRows().empty()) return;
  const int chosen = platform::Dialogs().PopupMenu(this, BuildContextMenu(), globalPos);
  if (chosen != 0) RunCommand(chosen);
}

std::wstring PriceGrid::LinkTextFor(const Row& row) const {
  addon::LinkTextBuilder link("price view");
  link.Add(addon::linkkey::kInstrumentCode, row.key.InstrumentCode)
      .AddInt64(addon::linkkey::kProductId, row.key.ProductID)
      .Add(addon::linkkey::kExchangeCode, row.exchangeCode);
  return link.Wide();
}

void PriceGrid::RunCommand(int command) {
  const std::vector<int> selected = GetSelectedRows();
  if (selected.empty()) return;
  const Row& first = m_rows[std::size_t(selected.front())];
  std::vector<InstrumentKey> keys;
  for (int r : selected) keys.push_back(m_rows[std::size_t(r)].key);
  RunMenuCommand(Owner(), command, keys, LinkTextFor(first), first.known && IsTradeableStatus(first.accessStatus));
}

void PriceGrid::RunMenuCommand(CSuperBaseView* owner, int command, const std::vector<InstrumentKey>& keys,
                               const std::wstring& firstLinkText, bool firstTradeable) {
  if (keys.empty()) return;
  const auto& msg = addon::Msg();
  auto send = [owner](UINT message, WPARAM wParam, LPARAM lParam) {
    platform::SendMessage(owner, message, wParam, lParam);
  };
  if (command >= kCmdTrade && command <= kCmdNews) {
    const std::wstring& text = firstLinkText;
    UINT message = 0;
    switch (command) {
      case kCmdTrade: message = msg.wlOpenTrade; break;
      case kCmdChart: message = msg.wlOpenChart; break;
      case kCmdDepth: message = msg.wlOpenDepth; break;
      case kCmdSales: message = msg.wlOpenSales; break;
      case kCmdAlert: message = msg.wlOpenPriceAlert; break;
      case kCmdAnalytics: message = msg.wlOpenStockAnalytics; break;
      case kCmdSummary: message = msg.wlOpenSummary; break;
      case kCmdNews: message = msg.relatedNews; break;
      default: return;
    }
    LPARAM second = 0;
    if (command == kCmdTrade && !firstTradeable) second = -1;
    send(message, ToLParam(&text), second);
    return;
  }
  auto inRange = [&](int base) { return command >= base && command < base + kCommandRange; };
  if (inRange(kCmdAddToUser)) send(msg.wlAddInsList, ToLParam(&keys), command - kCmdAddToUser);
  else if (inRange(kCmdRemoveFromUser)) send(msg.wlRemoveInsList, ToLParam(&keys), command - kCmdRemoveFromUser);
  else if (inRange(kCmdAddToKeldo)) send(msg.keldoWlAddInsList, ToLParam(&keys), command - kCmdAddToKeldo);
  else if (inRange(kCmdRemoveFromKeldo))
    send(msg.keldoWlRemoveInsList, ToLParam(&keys), command - kCmdRemoveFromKeldo);
}

// ---- Row moves ------------------------------------------------------------------------------------

bool PriceGrid::OnCanMoveRows(const std::vector<int>&, int) {
  return m_listKind == kUserWatchlists || m_listKind == kKeldoWatchlists;
}

void PriceGrid::OnRowsMoved(const std::vector<int>& movedRows, int to) {
  std::vector<int> rows = movedRows;
  if (!m_dragKeys.empty()) {
    // Dropped back: the dragged instruments where they are now (the sort may have run meanwhile).
    rows.clear();
    for (int r = 0; r < int(m_rows.size()); ++r)
      if (std::find(m_dragKeys.begin(), m_dragKeys.end(), m_rows[std::size_t(r)].key) != m_dragKeys.end())
        rows.push_back(r);
    if (rows.empty()) return;
  }
  std::vector<std::size_t> order(m_rows.size());
  std::iota(order.begin(), order.end(), std::size_t(0));
  CGridCtrl::ApplyRowMove(order, rows, to);
  Permute(order);
  // The user's order replaces any sort.
  m_sortCol = -1;
  m_sortFlag = 0;
  SendToOwner(addon::Msg().wlMoveIns, 0, 0);
  RedrawAll();
}

// ---- Dragging rows out ----------------------------------------------------------------------------

bool PriceGrid::OnDragOutData(const std::vector<int>& rows, QMimeData& mime) {
  // World indices open nothing elsewhere (no link, no view commands): they stay.
  if (m_listKind == kWorldIndices) return false;
  std::vector<InstrumentKey> keys;
  addon::LinkTextBuilder link{std::string_view(addon::kPriceViewSource)};
  for (int r : rows) {
    if (r < 0 || r >= int(m_rows.size())) continue;
    const Row& row = m_rows[std::size_t(r)];
    if (!keys.empty()) link.NextObject();
    link.AddInt64(addon::linkkey::kProductId, row.key.ProductID)
        .Add(addon::linkkey::kInstrumentCode, std::wstring_view(row.key.InstrumentCode))
        .Add(addon::linkkey::kExchangeCode, std::string_view(row.exchangeCode));
    keys.push_back(row.key);
  }
  if (keys.empty()) return false;
  if (!platform::SendMessage(Owner(), addon::Msg().wlStartDrag, ToLParam(&keys), 0)) return false;
  m_dragKeys = keys;
  const QByteArray text = QByteArray::fromStdString(link.Narrow());
  mime.setData(hv::drag::kLinkMimeType, text);
  mime.setData(hv::drag::kSourceMimeType, QByteArray(addon::kPriceViewSource));
  mime.setText(QString::fromUtf8(text));
  return true;
}

void PriceGrid::OnDragOutDone(Qt::DropAction) { m_dragKeys.clear(); }
