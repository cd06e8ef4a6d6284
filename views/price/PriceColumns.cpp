#include "views/price/PriceColumns.h"

#include <algorithm>
#include <array>
#include <unordered_map>

#include "data/QuoteStore.h"
#include "views/price/Watchlists.h"

namespace pricecol {
namespace {

using Q = QuoteLayout;

// Every key, in the order of Col.
const std::array<ColumnInfo, 28> kInfos{{
    {Col::Icon, "colIcon", false, -1, Paint::None, false, false, L""},
    {Col::Link, "colLink", false, -1, Paint::None, false, false, L""},
    {Col::Arrow, "colArrow", false, -1, Paint::None, false, false, L""},
    {Col::Symbol, "colSymbol", false, -1, Paint::None, false, true, L"Symbol"},
    {Col::Name, "colName", false, -1, Paint::None, false, true, L"Name"},
    {Col::Rem, "colRem", false, Q::Remarks, Paint::Changed, false, true, L"Remark"},
    {Col::Exchange, "colExchange", false, -1, Paint::None, false, true, L"Exchange"},
    {Col::Currency, "colCurrency", false, -1, Paint::None, false, true, L"Currency"},
    {Col::LS, "colLS", false, Q::CfdStatus, Paint::None, false, true, L"L/S"},
    {Col::CFD, "colCFD", false, Q::CfdStatus, Paint::Changed, false, true, L"CFD"},
    {Col::DMA, "colDMA", false, Q::DmaStatus, Paint::Changed, false, true, L"DMA"},
    {Col::Month, "colMonth", false, Q::Month, Paint::Changed, false, true, L"Month"},
    {Col::Year, "colYear", false, Q::Year, Paint::Changed, false, true, L"Year"},
    {Col::Last, "colLast", true, Q::Last, Paint::Direction, false, true, L"Last"},
    {Col::Ask, "colAsk", true, Q::Ask, Paint::Direction, false, true, L"Ask"},
    {Col::Bid, "colBid", true, Q::Bid, Paint::Direction, false, true, L"Bid"},
    {Col::TAC, "colTAC", true, Q::Tac, Paint::None, false, true, L"TAC"},
    {Col::BuyVol, "colBuyVol", true, Q::BVol, Paint::Changed, true, true, L"Bid Vol"},
    {Col::SellVol, "colSellVol", true, Q::SVol, Paint::Changed, true, true, L"Ask Vol"},
    {Col::TotVol, "colTotVol", true, Q::Vol, Paint::Changed, true, true, L"Volume"},
    {Col::Change, "colChange", true, Q::Change, Paint::Signed, false, true, L"Change"},
    {Col::PerChange, "colPerChange", true, Q::PChange, Paint::Signed, false, true, L"% Change"},
    {Col::Open, "colOpen", true, Q::Open, Paint::None, false, true, L"Open"},
    {Col::PrevClose, "colPrevClose", true, Q::Close, Paint::None, false, true, L"Prev Close"},
    {Col::High, "colHigh", true, Q::High, Paint::Direction, false, true, L"High"},
    {Col::Low, "colLow", true, Q::Low, Paint::Direction, false, true, L"Low"},
    {Col::Delay, "colDelay", true, -1, Paint::None, false, true, L"Delay"},
    {Col::Unknown, "", false, -1, Paint::None, false, false, L""},
}};

struct WidxDef {
  const char* key;
  int width, columnId, textId;
};
constexpr WidxDef kWorldIndexColumns[] = {
    {"colIcon", 30, 1, 112},      {"colLink", 30, 2, 113},     {"colSymbol", 70, 3, 101},
    {"colName", 200, 4, 102},     {"colArrow", 30, 6, 124},    {"colDelay", 70, 25, 125},
    {"colRem", 70, 5, 103},       {"colExchange", 70, 7, 104}, {"colPrevClose", 70, 19, 119},
    {"colLast", 70, 8, 106},      {"colChange", 70, 9, 107},   {"colPerChange", 70, 10, 114},
    {"colOpen", 70, 16, 116},     {"colHigh", 70, 17, 117},    {"colLow", 70, 18, 118},
};

std::vector<std::string> SplitKeys(const std::string& text) {
  std::vector<std::string> keys;
  std::size_t start = 0;
  while (start <= text.size()) {
    const std::size_t comma = text.find(',', start);
    keys.push_back(text.substr(start, comma == std::string::npos ? std::string::npos : comma - start));
    if (comma == std::string::npos) break;
    start = comma + 1;
  }
  return keys;
}

std::string JoinKeys(const std::vector<ColumnSettingItem>& items) {
  std::string text;
  for (const auto& item : items) {
    if (!text.empty()) text += ',';
    text += item.key;
  }
  return text;
}

// The world-index columns of the stored order; fewer than fifteen (or none) when
// the text does not name them all.
std::vector<ColumnSettingItem> WorldIndexFromText(const std::string& text) {
  std::vector<ColumnSettingItem> out;
  for (const std::string& key : SplitKeys(text)) {
    for (const ColumnSettingItem& item : WorldIndexDefaults()) {
      if (item.key != key) continue;
      const bool dup = std::any_of(out.begin(), out.end(), [&](const auto& o) { return o.key == key; });
      if (!dup) out.push_back(item);
      break;
    }
  }
  return out;
}

// The visible columns of the layout, or the library's defaults.
std::vector<ColumnSettingItem> LayoutColumns(const CWatchlistSetting& setting) {
  ColumnSettingInfo info;
  std::vector<ColumnSettingItem> out;
  if (setting.GetSettingInfo(LayoutIdOf(setting), info))
    for (const auto& item : info.items)
      if (item.visible) out.push_back(item);
  if (out.empty()) out = setting.GetDefaultSetting();
  return out;
}

}  // namespace

const ColumnInfo& InfoOf(const std::string& key) {
  static const std::unordered_map<std::string, std::size_t> index = [] {
    std::unordered_map<std::string, std::size_t> m;
    for (std::size_t i = 0; i + 1 < kInfos.size(); ++i) m.emplace(kInfos[i].key, i);
    return m;
  }();
  auto it = index.find(key);
  return kInfos[it == index.end() ? kInfos.size() - 1 : it->second];
}

const ColumnInfo& InfoOf(Col col) {
  const auto i = static_cast<std::size_t>(col);
  return kInfos[i < kInfos.size() ? i : kInfos.size() - 1];
}

bool HasEmptyHeading(Col col) { return col == Col::Icon || col == Col::Link || col == Col::Arrow; }

std::int32_t LayoutIdOf(const CWatchlistSetting& setting) {
  const auto& layouts = setting.GetSetInfoList();
  return layouts.empty() ? 4 : layouts.front().id;
}

const std::vector<ColumnSettingItem>& WorldIndexDefaults() {
  static const std::vector<ColumnSettingItem> items = [] {
    std::vector<ColumnSettingItem> v;
    for (const WidxDef& d : kWorldIndexColumns) {
      ColumnSettingItem item;
      item.key = d.key;
      item.width = d.width;
      item.visible = true;
      item.columnId = d.columnId;
      item.textId = d.textId;
      v.push_back(std::move(item));
    }
    return v;
  }();
  return items;
}

std::vector<ColumnSettingItem> ColumnsFor(int listKind) {
  CWatchlistSetting setting = GetUserSettings().GetWatchlistSetting();
  if (listKind != kWorldIndices) return LayoutColumns(setting);
  std::vector<ColumnSettingItem> columns = WorldIndexFromText(setting.GetWIDXCol());
  if (columns.size() < WorldIndexDefaults().size()) {
    columns = WorldIndexDefaults();
    setting.SetWIDXCol(JoinKeys(columns));
    GetUserSettings().SetWatchlistSetting(setting);
  }
  return columns;
}

bool MoveColumn(int listKind, int from, int to) {
  const std::vector<ColumnSettingItem> shown = ColumnsFor(listKind);
  const int n = static_cast<int>(shown.size());
  if (from < 0 || from >= n || to < 0 || to >= n || from == to) return false;
  CWatchlistSetting setting = GetUserSettings().GetWatchlistSetting();
  if (listKind == kWorldIndices) {
    std::vector<ColumnSettingItem> order = shown;
    ColumnSettingItem moved = order[std::size_t(from)];
    order.erase(order.begin() + from);
    order.insert(order.begin() + to, std::move(moved));
    setting.SetWIDXCol(JoinKeys(order));
    return GetUserSettings().SetWatchlistSetting(setting), true;
  }
  const std::int32_t id = LayoutIdOf(setting);
  ColumnSettingInfo info;
  if (!setting.GetSettingInfo(id, info) || info.items.empty()) {
    // No stored layout: the shown defaults become one.
    info = ColumnSettingInfo{};
    info.id = id;
    info.name = L"Default";
    info.items = shown;
  }
  auto find = [&](const std::string& key) {
    return std::find_if(info.items.begin(), info.items.end(), [&](const auto& i) { return i.key == key; });
  };
  auto source = find(shown[std::size_t(from)].key);
  if (source == info.items.end()) return false;
  ColumnSettingItem moved = *source;
  info.items.erase(source);
  auto target = find(shown[std::size_t(to)].key);
  // Moving right lands after the target column, moving left before it.
  if (target != info.items.end() && to > from) ++target;
  info.items.insert(target, std::move(moved));
  setting.SetSettingInfo(id, info);
  GetUserSettings().SetWatchlistSetting(setting);
  return true;
}

int FontPointSize() { return GetUserSettings().GetWatchlistSetting().GetFontPointSize(); }
std::vector<std::wstring> FontSizeItems() { return GetUserSettings().GetWatchlistSetting().GetFontSizeItems(); }
int FontSizeIndex() { return GetUserSettings().GetWatchlistSetting().GetFontSize(); }

bool SetFontSizeIndex(int n) {
  CWatchlistSetting setting = GetUserSettings().GetWatchlistSetting();
  if (!setting.SetFontSize(n)) return false;
  GetUserSettings().SetWatchlistSetting(setting);
  return true;
}

}  // namespace pricecol
