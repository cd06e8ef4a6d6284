#include "views/price/BoardGrid.h"

#include <QLineEdit>
#include <QPaintEvent>
#include <QPainter>
#include <QRegularExpressionValidator>
#include <algorithm>
#include <limits>

#include "addon/AddonView.h"
#include "addon/Feeds.h"
#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostview/NumberText.h"
#include "hostview/Services.h"
#include "hostview/SuperBaseView.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/price/PriceGrid.h"
#include "views/price/QuantityCheck.h"
#include "views/price/Watchlists.h"

namespace {

QString Q(const std::wstring& s) { return QString::fromWCharArray(s.data(), qsizetype(s.size())); }

QString Clean(QString text) {
  for (QChar& ch : text)
    if (ch == QLatin1Char('\t') || ch == QLatin1Char('\n') || ch == QLatin1Char('\r')) ch = QLatin1Char(' ');
  return text;
}

// Style colour of the area around the tiles (the grid's even rows).
constexpr int kBoardBackColor = 107;
constexpr int kBoardTextColor = 109;

}  // namespace

BoardGrid::BoardGrid(QWidget* parent) : CGridCtrl(parent) {
  SetTH_Height(0);
  SetSH_Width(0);
  SetDefRowHeight(kTileHeight);
  SetDefColWidth(kTileWidth);
  SetSelectionMode(SingleSelection);
  SetHighlightSelection(false);
  SetShowCurrentCell(false);
  EnableColumnSizing(false);
  EnableColumnMove(false);
  EnableRowMove(false);
  m_tileType.SetQuantitySource([this](int col, int row) { return OfferedQuantities(TileIndex(col, row)); });
  CGridCtrl::Colors c = GetColors();
  c.back = c.empty = m_back;
  SetColors(c);
  LayTiles();
}

BoardGrid::~BoardGrid() = default;

int BoardGrid::ColumnsFor(int clientWidth, int scrollBarWidth) {
  const int columns = std::max(0, clientWidth - scrollBarWidth) / kTileWidth;
  return columns < kMinColumns + 1 ? kMinColumns : columns;
}

CSuperBaseView* BoardGrid::Owner() const {
  if (m_owner) return m_owner;
  return qobject_cast<CSuperBaseView*>(parentWidget());
}

CAddonView* BoardGrid::AddonOwner() const { return dynamic_cast<CAddonView*>(Owner()); }

void BoardGrid::SetOwner(CSuperBaseView* owner) {
  m_owner = owner;
  m_tileType.SetOwnerView(owner);
  m_tileType.SetLanguage(owner ? owner->GetLanguage() : nullptr);
}

QString BoardGrid::LanguageText(int id, const wchar_t* fallback) const {
  const CSuperBaseView* owner = Owner();
  if (owner && owner->GetLanguage()) {
    const std::wstring text = owner->GetLanguage()->GetText(13, id);
    if (!text.empty()) return Q(text);
  }
  return QString::fromWCharArray(fallback);
}

// ---- Tiles -----------------------------------------------------------------------

const JInstrumentUnderlying* BoardGrid::Record(const Tile& tile) const {
  if (tile.param < 0) return nullptr;
  if (tile.param >= PBoardTypeEx::kWritableBase) {
    const auto& records = InstrumentMgr().Records();
    const std::size_t i = std::size_t(tile.param - PBoardTypeEx::kWritableBase);
    return i < records.size() && records[i].productId == tile.key.ProductID ? &records[i] : nullptr;
  }
  const auto& records = InstrumentMgr_ReadOnly().Records();
  const std::size_t i = std::size_t(tile.param);
  return i < records.size() ? &records[i] : nullptr;
}

void BoardGrid::Join(Tile& tile) const {
  // The price view's own records (names the terminal changed) win over the list.
  if (const int i = InstrumentMgr().IndexOf(tile.key); i >= 0) tile.param = PBoardTypeEx::kWritableBase + i;
  else if (const int j = InstrumentMgr_ReadOnly().IndexOf(tile.key); j >= 0) tile.param = j;
  else tile.param = -1;
}

BoardGrid::Tile BoardGrid::MakeTile(const InstrumentKey& key) {
  Tile tile;
  tile.key = key;
  Join(tile);
  if (const auto typed = m_typed.find(key); typed != m_typed.end()) {
    tile.quantity = typed->second;
  } else if (const JInstrumentUnderlying* record = Record(tile); record && record->lotSize >= 1) {
    // One lot until the user says otherwise.
    tile.quantity = std::to_wstring(record->lotSize);
  }
  CheckQuietly(tile);
  // A shown instrument is registered with the quote feed: its record exists
  // and it is asked for on the view's next second.
  addon::QuoteFeed& feed = addon::QuoteFeed::Instance();
  feed.Register(key, {}, platform::TickCount());
  QuoteRecord quote;
  feed.Read(key, quote);
  tile.quoteVersion = quote.version;
  return tile;
}

int BoardGrid::TileIndex(int col, int row) const {
  const int columns = GetNumberCols();
  if (col < 0 || row < 0 || col >= columns || row >= GetNumberRows()) return -1;
  const long long index = static_cast<long long>(row) * columns + col;
  return index < static_cast<long long>(m_tiles.size()) ? int(index) : -1;
}

void BoardGrid::TileCell(int index, int* col, int* row) const {
  const int columns = std::max(1, GetNumberCols());
  *col = index % columns;
  *row = index / columns;
}

void BoardGrid::LayTiles() {
  const int keep = m_selected;
  // An open quantity list belongs to a cell that may now hold another tile.
  if (m_tileType.IsListOpen()) m_tileType.CloseList();
  // Every cell is drawn afresh from the tiles; nothing stays stored.
  ClearStoredCells();
  const int columns = ColumnsFor(width() - 2 * frameWidth(), VScrollBarWidth());
  const int rows = (int(m_tiles.size()) + columns - 1) / columns;
  m_laidColumns = columns;
  // No row: the current cell goes; it comes back on the kept tile below.
  SetNumberRows(0);
  SetNumberCols(columns);
  for (int c = 0; c < columns; ++c) SetColWidth(c, kTileWidth);
  SetDefRowHeight(kTileHeight);
  SetNumberRows(rows);
  m_selected = -1;
  if (keep >= 0 && keep < int(m_tiles.size())) {
    int col = 0, row = 0;
    TileCell(keep, &col, &row);
    GotoCell(col, row);
  }
  RedrawAll();
}

void BoardGrid::OnSize(int, int) {
  if (ColumnsFor(width() - 2 * frameWidth(), VScrollBarWidth()) != m_laidColumns) LayTiles();
}

void BoardGrid::LoadWatchlist(int listKind, const std::wstring& name) {
  std::vector<InstrumentKey> items;
  if (WatchlistStoreT* store = StoreOfKind(listKind))
    if (const WatchListDetail* w = store->FindPtr(name)) items = w->items;
  LoadItems(listKind, name, items);
}

void BoardGrid::LoadItems(int listKind, const std::wstring& name, const std::vector<InstrumentKey>& items) {
  if (IsEditing()) EndEdit(false);
  m_listKind = listKind;
  m_listName = name;
  m_tiles.clear();
  m_tiles.reserve(items.size());
  for (const InstrumentKey& key : items) m_tiles.push_back(MakeTile(key));
  m_seenStoreVersion = ~0ull;
  m_selected = -1;
  LayTiles();
  SetTopRow(0);
}

bool BoardGrid::AddRow(const InstrumentKey& key) {
  for (const Tile& t : m_tiles)
    if (t.key == key) return false;
  m_tiles.push_back(MakeTile(key));
  LayTiles();
  return true;
}

std::vector<InstrumentKey> BoardGrid::Rows() const {
  std::vector<InstrumentKey> keys;
  keys.reserve(m_tiles.size());
  for (const Tile& t : m_tiles) keys.push_back(t.key);
  return keys;
}

std::vector<InstrumentKey> BoardGrid::SelectedKeys() const {
  if (m_selected < 0 || m_selected >= int(m_tiles.size())) return {};
  return {m_tiles[std::size_t(m_selected)].key};
}

void BoardGrid::SelectKeys(const std::vector<InstrumentKey>& keys) {
  for (const InstrumentKey& k : keys)
    for (std::size_t i = 0; i < m_tiles.size(); ++i)
      if (m_tiles[i].key == k) {
        int col = 0, row = 0;
        TileCell(int(i), &col, &row);
        GotoCell(col, row);
        return;
      }
}

std::wstring BoardGrid::UserItemText() const { return watchlist::UserItemText(Rows()); }
std::wstring BoardGrid::KeldoItemText() const { return watchlist::KeldoItemText(Rows()); }

void BoardGrid::RejoinInstruments() {
  for (Tile& t : m_tiles) Join(t);
  RedrawAll();
}

bool BoardGrid::Removable() const {
  return m_listKind == kUserWatchlists || m_listKind == kKeldoWatchlists || m_listKind == kAdvanceFilter;
}

// ---- Refresh -------------------------------------------------------------------------

std::uint64_t BoardGrid::UpdateCounter() {
  QuoteStore& store = QuoteStore::Instance();
  const std::uint64_t version = store.Version();
  if (version == m_seenStoreVersion) return m_updates;
  m_seenStoreVersion = version;
  store.Read([&](const QuoteStore::Reader& reader) {
    for (Tile& t : m_tiles) {
      const QuoteRecord* r = reader.Find(t.key);
      if (!r || r->version == t.quoteVersion) continue;
      t.quoteVersion = r->version;
      ++m_updates;
    }
  });
  return m_updates;
}

void BoardGrid::SetEmptyText(const std::wstring& text) {
  if (text == m_emptyText) return;
  m_emptyText = text;
  RedrawAll();
}

void BoardGrid::ApplyColumns() {
  // The board has no columns to choose; a settings change may have changed
  // the trading limits, so the quantities are checked again.
  if (const CSuperBaseView* owner = Owner()) m_tileType.SetLanguage(owner->GetLanguage());
  RecheckQuantities();
}

void BoardGrid::SetStyleManager(IStyleManager* style) {
  m_style = style;
  const CSuperBaseView* owner = Owner();
  m_tileType.SetStyleManager(style, owner ? owner->GetStyleID() : (style ? style->GetStyleID() : 0));
  ApplyStyle(style);
  if (style) {
    m_back = style->Color(kBoardBackColor);
    m_text = style->Color(kBoardTextColor);
    SetDefFont(style->GetFont(16));
  }
  CGridCtrl::Colors c = GetColors();
  c.back = c.empty = m_back;
  c.text = m_text;
  SetColors(c);
  RedrawAll();
}

// ---- Quantities ----------------------------------------------------------------------

QStringList BoardGrid::OfferedQuantities(int index) const {
  QStringList out;
  if (index < 0 || index >= int(m_tiles.size())) return out;
  const JInstrumentUnderlying* record = Record(m_tiles[std::size_t(index)]);
  if (!record || record->lotSize < 1 || record->lotSize > std::numeric_limits<int>::max()) return out;
  for (int q : GenerateQtyList(int(record->lotSize), kOfferedQuantities)) out << QString::number(q);
  return out;
}

void BoardGrid::CheckQuietly(Tile& tile) const {
  const JInstrumentUnderlying* record = Record(tile);
  if (!record) {
    tile.invalid = false;
    return;
  }
  const auto quantity = qtycheck::ParseQuantity(tile.quantity);
  tile.invalid = !quantity || !qtycheck::Check(*record, qtycheck::kAnyOrder, *quantity).valid;
}

void BoardGrid::SetQuantityText(int index, const std::wstring& text) {
  if (index < 0 || index >= int(m_tiles.size())) return;
  Tile& tile = m_tiles[std::size_t(index)];
  tile.quantity = text;
  m_typed[tile.key] = text;
  CheckQuietly(tile);
  int col = 0, row = 0;
  TileCell(index, &col, &row);
  RedrawCell(col, row);
}

void BoardGrid::RecheckQuantities() {
  for (Tile& t : m_tiles) CheckQuietly(t);
  RedrawAll();
}

bool BoardGrid::Tradeable(const JInstrumentUnderlying& record) const {
  if (CAddonView* view = AddonOwner()) return addon::IsTradeableStatus(view->Actions().AccessStatusOf(record));
  return addon::IsTradeableStatus(record.accessStatus);
}

std::wstring BoardGrid::TradeRequestFor(int index, int mode) const {
  if (index < 0 || index >= int(m_tiles.size())) return {};
  const Tile& tile = m_tiles[std::size_t(index)];
  QuoteRecord quote;
  QuoteStore::Instance().Peek(tile.key, quote);
  std::wstring side, price;
  if (mode == qtycheck::kBuy || mode == qtycheck::kSell) {
    side = mode == qtycheck::kBuy ? L"Buy" : L"Sell";
    // A buyer pays the ask, a seller gets the bid.
    const QuoteCell& cell = quote[mode == qtycheck::kBuy ? QuoteLayout::Ask : QuoteLayout::Bid];
    if (cell.filled && !cell.text.empty() && cell.value > 0) price = cell.text;
  }
  const auto quantity = qtycheck::ParseQuantity(tile.quantity);
  addon::LinkTextBuilder link("price view");
  link.Add(addon::linkkey::kInstrumentCode, tile.key.InstrumentCode)
      .AddInt64(addon::linkkey::kProductId, tile.key.ProductID)
      .Add(addon::linkkey::kSide, side)
      .Add(addon::linkkey::kTradePrice, price)
      .Add(addon::linkkey::kQty, quantity && *quantity > 0 ? std::to_wstring(*quantity) : std::wstring())
      .AddInt32(addon::linkkey::kTriggerType, 1);
  return link.Wide();
}

std::optional<std::int64_t> BoardGrid::CheckQuantity(int index, int mode) {
  if (index < 0 || index >= int(m_tiles.size())) return std::nullopt;
  if (IsEditing()) EndEdit(false);
  Tile& tile = m_tiles[std::size_t(index)];
  const JInstrumentUnderlying* found = Record(tile);
  if (!found) return std::nullopt;
  const JInstrumentUnderlying record = *found;  // the terminal may replace its list while we ask
  CAddonView* view = AddonOwner();
  qtycheck::Verdict verdict;
  const auto quantity = qtycheck::ParseQuantity(tile.quantity);
  if (quantity) {
    qtycheck::TextLookup lookup;
    if (view)
      lookup = [view](const std::string& code, std::int64_t productId) { return view->LookupMessageText(code, productId); };
    verdict = qtycheck::Check(record, mode, *quantity, lookup);
  } else {
    verdict.text = qtycheck::kNotMultipleText;
  }
  tile.invalid = !verdict.valid;
  int col = 0, row = 0;
  TileCell(index, &col, &row);
  RedrawCell(col, row);
  if (verdict.valid) return quantity;
  if (!verdict.text.empty() && view) view->ShowMessage(verdict.text);
  return std::nullopt;
}

void BoardGrid::PrepareTrade(int index, int mode) {
  if (!CheckQuantity(index, mode)) return;
  const JInstrumentUnderlying* record = Record(m_tiles[std::size_t(index)]);
  const bool tradeable = record && Tradeable(*record);
  const std::wstring request = TradeRequestFor(index, mode);
  platform::SendMessage(Owner(), addon::Msg().wlOpenTrade, ToLParam(&request),
                        tradeable ? 0 : addon::kRefusedTradeOrigin);
}

// ---- Cells -------------------------------------------------------------------------------

void BoardGrid::OnGetCell(int col, int row, CGridCell& cell) {
  if (col < 0 || row < 0) return;
  cell.SetBackColor(m_back);
  const int index = TileIndex(col, row);
  if (index < 0) {
    cell.SetCellType(&m_emptyType);
    return;
  }
  const Tile& tile = m_tiles[std::size_t(index)];
  cell.SetCellType(&m_tileType);
  if (tile.param >= 0) cell.SetParam(tile.param);
  cell.text = Q(tile.quantity);
  cell.SetAlignment(Qt::AlignRight | Qt::AlignVCenter);
  if (tile.invalid) cell.flags |= PBoardTypeEx::kFlagInvalidQuantity;
  if (index == m_selected) cell.flags |= PBoardTypeEx::kFlagSelectedTile;
  if (!Removable()) cell.flags |= PBoardTypeEx::kFlagFixedTile;
}

void BoardGrid::OnCellChange(int oldCol, int newCol, int oldRow, int newRow) {
  m_selected = TileIndex(newCol, newRow);
  RedrawCell(oldCol, oldRow);
  RedrawCell(newCol, newRow);
}

void BoardGrid::OnSelectionChanged() {
  // A tile, not a row of tiles, is what the user picks (the current cell).
  ClearSelection();
}

void BoardGrid::paintEvent(QPaintEvent* e) {
  CGridCtrl::paintEvent(e);
  if (m_emptyText.empty() || !m_tiles.empty()) return;
  QPainter p(viewport());
  const QRect area(8, 8, viewport()->width() - 16, std::max(0, viewport()->height() - 16));
  if (area.width() <= 0 || area.height() <= 0) return;
  p.setFont(GetDefFont());
  p.setPen(m_text);
  p.drawText(area, Qt::AlignHCenter | Qt::AlignTop | Qt::TextWordWrap, Q(m_emptyText));
}

// ---- Tile actions ----------------------------------------------------------------------------

void BoardGrid::ShowTip(int col, int row, int area, int textId, const wchar_t* fallback) {
  if (area == 0) {
    m_tip.clear();
    HideHint();
    return;
  }
  const QRect cell = CellRect(col, row);
  if (cell.isEmpty()) return;
  const QRect button = PBoardTypeEx::AreaBox(cell, PBoardTypeEx::Area(area)).ToRect();
  m_tip = LanguageText(textId, fallback);
  ShowHint(m_tip, QPoint(button.left(), button.bottom() + 4));
}

std::wstring BoardGrid::LinkTextFor(const Tile& tile) const {
  const JInstrumentUnderlying* record = Record(tile);
  addon::LinkTextBuilder link("price view");
  link.Add(addon::linkkey::kInstrumentCode, tile.key.InstrumentCode)
      .AddInt64(addon::linkkey::kProductId, tile.key.ProductID)
      .Add(addon::linkkey::kExchangeCode, record ? record->exchangeCode : std::string());
  return link.Wide();
}

void BoardGrid::OpenAnalytics(int index) {
  const Tile& tile = m_tiles[std::size_t(index)];
  // Analytics know the terminal's instruments only.
  if (tile.param < 0 || tile.param >= PBoardTypeEx::kWritableBase) return;
  const std::wstring text = LinkTextFor(tile);
  platform::SendMessage(Owner(), addon::Msg().wlOpenStockAnalytics, ToLParam(&text), 0);
}

void BoardGrid::RemoveTile(int index) {
  if (!Removable()) return;
  m_tip.clear();
  HideHint();
  if (IsEditing()) EndEdit(true);
  const InstrumentKey key = m_tiles[std::size_t(index)].key;
  m_tiles.erase(m_tiles.begin() + index);
  if (m_selected == index) m_selected = -1;
  else if (m_selected > index) --m_selected;
  LayTiles();
  if (m_listKind == kAdvanceFilter) return;  // a list of the moment: nothing to save
  const WatchlistStoreT* store = StoreOfKind(m_listKind);
  const int position = store ? store->IndexOf(m_listName) : -1;
  if (position < 0) return;
  const std::vector<InstrumentKey> keys{key};
  const auto& msg = addon::Msg();
  platform::SendMessage(Owner(), m_listKind == kKeldoWatchlists ? msg.keldoWlRemoveInsList : msg.wlRemoveInsList,
                        ToLParam(&keys), position);
}

int BoardGrid::OnCellTypeNotify(CGridCellType*, int col, int row, int code, std::intptr_t param) {
  const int index = TileIndex(col, row);
  switch (code) {
    case PBoardTypeEx::kCodeHoverTitle:
      if (param == 0 || (index >= 0 && Removable())) ShowTip(col, row, int(param), kRemoveTipText, L"Remove");
      return 0;
    case PBoardTypeEx::kCodeHoverSecond: {
      const bool analytics = index >= 0 && m_tiles[std::size_t(index)].param >= 0 &&
                             m_tiles[std::size_t(index)].param < PBoardTypeEx::kWritableBase;
      if (param == 0 || analytics) ShowTip(col, row, int(param), kAnalyticsTipText, L"Stock Analytics");
      return 0;
    }
    default:
      break;
  }
  if (index < 0) return 0;
  switch (code) {
    case PBoardTypeEx::kCodePress: {
      const PBoardTypeEx::Area area = m_tileType.LastPressArea();
      if (area == PBoardTypeEx::kBidBox) PrepareTrade(index, qtycheck::kSell);
      else if (area == PBoardTypeEx::kAskBox) PrepareTrade(index, qtycheck::kBuy);
      return 0;
    }
    case PBoardTypeEx::kCodeDoubleClick:
      // The press of a double click on a trading part has opened its ticket already.
      if (param != PBoardTypeEx::kBidBox && param != PBoardTypeEx::kAskBox) PrepareTrade(index, qtycheck::kAnyOrder);
      return 0;
    case PBoardTypeEx::kCodeSecondButton:
      OpenAnalytics(index);
      return 0;
    case PBoardTypeEx::kCodeTitleButton:
      RemoveTile(index);
      return 0;
    case CGridDropListType::kNotifyDropSelected: {
      const QString text = m_tileType.QuantityListText(int(param));
      if (!text.isEmpty()) SetQuantityText(index, text.toStdWString());
      return 0;
    }
    default:
      return 0;
  }
}

void BoardGrid::OnRClicked(int col, int row, bool pressed, const QRect&, const QPoint& pt) {
  const int index = TileIndex(col, row);
  if (!pressed || index < 0) return;
  const Tile& tile = m_tiles[std::size_t(index)];
  const std::vector<platform::MenuItem> items = PriceGrid::ContextMenuFor(m_listKind, m_listName);
  const int chosen = platform::Dialogs().PopupMenu(this, items, viewport()->mapToGlobal(pt));
  if (chosen == 0 || index >= int(m_tiles.size())) return;
  const JInstrumentUnderlying* record = Record(tile);
  const bool tradeable = record && Tradeable(*record);
  PriceGrid::RunMenuCommand(Owner(), chosen, {tile.key}, LinkTextFor(tile), tradeable);
}

bool BoardGrid::OnKeyDown(int key, Qt::KeyboardModifiers mods) {
  if (key == Qt::Key_C && (mods & Qt::ControlModifier)) {
    if (m_selected >= 0) platform::Dialogs().SetClipboardText(DumpHeading() + DumpLine(m_selected));
    return true;
  }
  return false;
}

// ---- In-place quantity --------------------------------------------------------------------

bool BoardGrid::OnEditStart(int col, int row, QString& text) {
  const int index = TileIndex(col, row);
  if (index < 0 || m_tiles[std::size_t(index)].param < 0) return false;
  text = Q(m_tiles[std::size_t(index)].quantity);
  return true;
}

void BoardGrid::OnEditorCreated(int, int, QLineEdit* editor) {
  // Whole numbers only; a typed first key that is not a digit is dropped.
  static const QRegularExpression kDigits(QStringLiteral("[0-9]{0,12}"));
  QString text = editor->text();
  text.remove(QRegularExpression(QStringLiteral("[^0-9]")));
  editor->setText(text.left(12));
  editor->setValidator(new QRegularExpressionValidator(kDigits, editor));
}

bool BoardGrid::OnEditFinish(int col, int row, const QString& text, bool cancelled) {
  if (cancelled) return true;
  const int index = TileIndex(col, row);
  if (index >= 0) SetQuantityText(index, text.trimmed().toStdWString());
  return true;
}

// ---- Dump ----------------------------------------------------------------------------------

QString BoardGrid::DumpHeading() const {
  return QStringLiteral(
      "Row\tColumn\tName\tCode\tExchange\tLast\tChange\t% Change\tBid\tBid Vol\tAsk\tAsk Vol\tVolume\tHigh\tLow\t"
      "Delay\tQuantity\tQuantity check\n");
}

QString BoardGrid::DumpLine(int index) {
  const Tile& tile = m_tiles[std::size_t(index)];
  int col = 0, row = 0;
  TileCell(index, &col, &row);
  QStringList f;
  f << QString::number(row) << QString::number(col);
  const JInstrumentUnderlying* record = Record(tile);
  if (!record) {
    f << QString() << Q(tile.key.InstrumentCode);
    while (f.size() < 18) f << QString();
    return f.join(QLatin1Char('\t')) + QLatin1Char('\n');
  }
  const JInstrumentUnderlying ins = *record;
  QuoteRecord quote;
  QuoteStore::Instance().Peek(tile.key, quote);
  f << Clean(PBoardTypeEx::NameText(ins)) << Clean(PBoardTypeEx::CodeText(ins))
    << Clean(Q(mvd::TrimmedWide(ins.exchangeCode))) << Q(quote[QuoteLayout::Last].text)
    << PBoardTypeEx::ChangeText(quote[QuoteLayout::Change]) << PBoardTypeEx::PercentText(quote[QuoteLayout::PChange])
    << Q(quote[QuoteLayout::Bid].text) << PBoardTypeEx::VolumeText(quote[QuoteLayout::BVol])
    << Q(quote[QuoteLayout::Ask].text) << PBoardTypeEx::VolumeText(quote[QuoteLayout::SVol])
    << PBoardTypeEx::VolumeText(quote[QuoteLayout::Vol]) << Q(quote[QuoteLayout::High].text)
    << Q(quote[QuoteLayout::Low].text) << Clean(m_tileType.MarketDelay(ins.productId, ins.exchangeCode))
    << Clean(Q(tile.quantity)) << (tile.invalid ? QStringLiteral("invalid") : QString());
  return f.join(QLatin1Char('\t')) + QLatin1Char('\n');
}

QString BoardGrid::dumpTsv() {
  UpdateCounter();
  QString out = DumpHeading();
  for (int i = 0; i < int(m_tiles.size()); ++i) out += DumpLine(i);
  return out;
}
