#include "views/price/Watchlists.h"

#include <cwchar>
#include <map>
#include <unordered_map>

#include "addon/StoreStatus.h"
#include "addon/TextTables.h"
#include "hostview/Text.h"

WatchlistStoreT& UserWatchlistStore() { return WatchlistMgr<WatchListDetail>(WatchlistFamily::User); }
WatchlistStoreT& Top30WatchlistStore() { return WatchlistMgr<WatchListDetail>(WatchlistFamily::Top30); }
WatchlistStoreT& KeldoWatchlistStore() { return WatchlistMgr<WatchListDetail>(WatchlistFamily::Keldo); }
WatchlistStoreT& WorldIndexStore() { return WatchlistMgr<WatchListDetail>(WatchlistFamily::WorldIndex); }

WatchlistStoreT* StoreOfKind(int kind) {
  switch (kind) {
    case kUserWatchlists: return &UserWatchlistStore();
    case kTop30Watchlists: return &Top30WatchlistStore();
    case kKeldoWatchlists: return &KeldoWatchlistStore();
    case kWorldIndices: return &WorldIndexStore();
    default: return nullptr;
  }
}

namespace watchlist {
namespace {

std::vector<JKeldoWatchlistRow>& KeldoHolder() {
  static std::vector<JKeldoWatchlistRow> rows;
  return rows;
}

struct MarketTextMap {
  bool built = false;
  std::map<std::wstring, std::wstring> names;  // key -> display name
};
MarketTextMap& MarketTexts() {
  static MarketTextMap map;
  return map;
}

std::vector<std::wstring> Split(std::wstring_view text, wchar_t separator) {
  std::vector<std::wstring> parts;
  std::size_t start = 0;
  while (true) {
    const std::size_t at = text.find(separator, start);
    parts.emplace_back(text.substr(start, at == std::wstring_view::npos ? std::wstring_view::npos : at - start));
    if (at == std::wstring_view::npos) break;
    start = at + 1;
  }
  return parts;
}

void AppendAttr(std::wstring& out, const wchar_t* name, std::wstring_view value) {
  out += L' ';
  out += name;
  out += L"=\"";
  out += XmlEscape(value);
  out += L'"';
}

void AppendNumber(std::wstring& out, const wchar_t* name, long long value) {
  out += L' ';
  out += name;
  out += L"=\"";
  out += std::to_wstring(value);
  out += L'"';
}

// The instrument as the read-only store holds it, else as the price view's own store does.
const JInstrumentUnderlying* FindInstrument(const InstrumentKey& key) {
  if (const auto* r = InstrumentMgr_ReadOnly().FindPtr(key)) return r;
  return InstrumentMgr().FindPtr(key);
}

// A TOP30 item as an instrument key: by product id and code, else by its code
// read as a symbol on its exchange. Unknown instruments are left out.
bool ResolveTop30Item(const JTop30Item& item, InstrumentKey& out) {
  InstrumentKey key{item.productId, hv::Widen(item.instrumentCode)};
  if (FindInstrument(key)) {
    out = std::move(key);
    return true;
  }
  const SymbolKey symbol{item.productId, hv::Widen(item.instrumentCode), hv::Widen(item.exchangeCode)};
  if (const auto* r = SymbolMgr_ReadOnly().FindPtr(symbol)) {
    out = InstrumentKeyOf(*r);
    return true;
  }
  return false;
}

bool StoreHasLists(WatchlistStoreT& (*store)()) { return !store().Records().empty(); }

}  // namespace

void InstallStoreProbes() {
  addon::SetStoreProbe(addon::RefStore::UserWatchlists, [] { return StoreHasLists(UserWatchlistStore); });
  addon::SetStoreProbe(addon::RefStore::KeldoWatchlists, [] { return StoreHasLists(KeldoWatchlistStore); });
  addon::SetStoreProbe(addon::RefStore::Top30Watchlists, [] { return StoreHasLists(Top30WatchlistStore); });
}

// ---- Texts --------------------------------------------------------------------------

std::wstring XmlEscape(std::wstring_view text) {
  std::wstring out;
  out.reserve(text.size() + 8);
  for (wchar_t c : text) {
    switch (c) {
      case L'&': out += L"&amp;"; break;
      case L'<': out += L"&lt;"; break;
      case L'>': out += L"&gt;"; break;
      case L'"': out += L"&quot;"; break;
      case L'\'': out += L"&apos;"; break;
      case L'\t': out += L"&#9;"; break;
      case L'\n': out += L"&#10;"; break;
      case L'\r': out += L"&#13;"; break;
      default:
        // XML 1.0 has no way to carry the other control characters.
        out.push_back(c < 0x20 || c == 0xFFFE || c == 0xFFFF ? L' ' : c);
    }
  }
  return out;
}

std::wstring WatchlistNamesText(const WatchlistStoreT& store) {
  std::wstring out = L"<watchlistmain>";
  const auto& lists = store.Records();
  for (std::size_t i = 0; i < lists.size(); ++i) {
    out += L"<watchlistname";
    AppendNumber(out, L"WatchlistID", lists[i].WatchlistID);
    AppendAttr(out, L"WatchlistName", lists[i].name);
    AppendNumber(out, L"SeqID", static_cast<long long>(i));
    out += L" />";
  }
  out += L"</watchlistmain>";
  return out;
}

std::wstring UserItemText(const std::vector<InstrumentKey>& items) {
  std::wstring out = L"<watchlistnames>";
  for (std::size_t i = 0; i < items.size(); ++i) {
    const InstrumentKey& k = items[i];
    if (k.ProductID == 0 || k.InstrumentCode.empty()) continue;
    out += L"<watchlistname";
    AppendNumber(out, L"ProductID", k.ProductID);
    AppendAttr(out, L"InstrumentCode", k.InstrumentCode);
    AppendNumber(out, L"SeqID", static_cast<long long>(i + 1));
    out += L" />";
  }
  out += L"</watchlistnames>";
  return out;
}

std::wstring KeldoItemText(const std::vector<InstrumentKey>& items) {
  static const std::wstring kBrandTag = L"[KELDO]";
  std::wstring out = L"<watchlistnames>";
  for (std::size_t i = 0; i < items.size(); ++i) {
    const JInstrumentUnderlying* ins = FindInstrument(items[i]);
    if (!ins || ins->instrumentCode.empty()) continue;
    const std::wstring code = hv::Widen(ins->instrumentCode);
    const std::wstring shownCode =
        code.find(kBrandTag) != std::wstring::npos ? code.substr(std::min<std::size_t>(7, code.size()))
                                                   : hv::Widen(ins->displayCode);
    const std::wstring exchange = hv::Widen(ins->exchangeCode);
    const JExchangeList* market = ExchangeMgr().FindPtr(ins->exchangeCode);
    if (ins->productId == 0 || shownCode.empty() || exchange.empty()) continue;
    out += L"<watchlistname";
    AppendAttr(out, L"InstrumentCode", shownCode);
    AppendAttr(out, L"Symbol", hv::Widen(ins->symbol));
    AppendAttr(out, L"Market", market ? hv::Widen(market->marketName) : std::wstring());
    AppendAttr(out, L"Exchange", exchange);
    AppendNumber(out, L"SeqID", static_cast<long long>(i + 1));
    AppendNumber(out, L"ProductID", ins->productId);
    out += L" />";
  }
  out += L"</watchlistnames>";
  return out;
}

// ---- Replies ---------------------------------------------------------------------------

void ApplyUserRows(const std::vector<JWatchlistRow>& rows, int maxItems) {
  std::vector<WatchListDetail> lists;
  std::unordered_map<std::wstring, std::size_t> byName;
  for (const JWatchlistRow& row : rows) {
    std::wstring name = hv::Widen(row.watchlistName);
    auto [it, added] = byName.try_emplace(name, lists.size());
    if (added) {
      // Ids of later rows of the same name are ignored.
      WatchListDetail w;
      w.WatchlistID = row.watchlistId;
      w.name = std::move(name);
      lists.push_back(std::move(w));
    }
    WatchListDetail& w = lists[it->second];
    if (static_cast<int>(w.items.size()) < maxItems && !row.instrumentCode.empty())
      w.items.push_back(InstrumentKey{static_cast<std::int64_t>(row.productId), hv::Widen(row.instrumentCode)});
  }
  UserWatchlistStore().Fill(std::move(lists));
}

void ApplyAcknowledgedIds(const std::vector<JWatchlistIdRow>& rows) {
  WatchlistStoreT& store = UserWatchlistStore();
  std::vector<WatchListDetail> lists = store.Records();
  bool changed = false;
  for (const JWatchlistIdRow& row : rows) {
    const int i = store.IndexOf(hv::Widen(row.watchlistName));
    if (i < 0 || lists[std::size_t(i)].WatchlistID != 0) continue;
    lists[std::size_t(i)].WatchlistID = row.watchlistId;
    changed = true;
  }
  if (changed) store.Fill(std::move(lists));
}

void ApplyTop30Groups(const std::vector<JTop30Group>& groups) {
  std::vector<WatchListDetail> lists;
  for (std::size_t i = 0; i < groups.size(); ++i) {
    const JTop30Group& group = groups[i];
    for (std::size_t j = 0; j < group.lists.size(); ++j) {
      const JTop30List& list = group.lists[j];
      const std::wstring key = hv::Widen(list.listName);
      std::wstring listName = TranslateListName(key);
      if (listName.empty()) listName = key;
      WatchListDetail w;
      w.WatchlistID = static_cast<std::int32_t>(i * 1000 + j);
      w.name = hv::Widen(group.groupName) + L" - " + listName;
      for (const JTop30Item& item : list.instruments) {
        InstrumentKey k;
        if (ResolveTop30Item(item, k)) w.items.push_back(std::move(k));
      }
      lists.push_back(std::move(w));
    }
  }
  Top30WatchlistStore().Fill(std::move(lists));
}

void ApplyKeldoRows(const std::vector<JKeldoWatchlistRow>& rows) {
  KeldoHolder() = rows;
  std::vector<WatchListDetail> lists;
  std::unordered_map<std::wstring, std::size_t> byName;
  for (const JKeldoWatchlistRow& row : rows) {
    std::wstring name = hv::Widen(row.watchlistName);
    auto [it, added] = byName.try_emplace(name, lists.size());
    if (added) {
      WatchListDetail w;
      w.WatchlistID = row.watchlistId;
      w.name = std::move(name);
      lists.push_back(std::move(w));
    }
    if (!row.instrumentCode.empty())
      lists[it->second].items.push_back(InstrumentKey{row.productId, hv::Widen(row.instrumentCode)});
  }
  KeldoWatchlistStore().Fill(std::move(lists));
}

const std::vector<JKeldoWatchlistRow>& KeldoReply() { return KeldoHolder(); }

void BuildWorldIndexList(const std::vector<JInstrumentUnderlying>& instruments) {
  WatchListDetail w;
  w.WatchlistID = kWorldIndexId;
  w.name = kWorldIndexName;
  for (const JInstrumentUnderlying& ins : instruments)
    if (mvd::TrimmedWide(ins.exchangeCode) == L"WIDX") w.items.push_back(InstrumentKeyOf(ins));
  if (w.items.empty()) return;
  WorldIndexStore().Fill(std::vector<WatchListDetail>{std::move(w)});
}

std::wstring TranslateListName(const std::wstring& key) {
  MarketTextMap& map = MarketTexts();
  if (!map.built && addon::SettingTextTable::Instance().Has("MKTEX")) {
    map.built = true;
    for (const std::wstring& entry : Split(addon::SettingTextTable::Instance().Get("MKTEX"), L';')) {
      const std::vector<std::wstring> parts = Split(entry, L'=');
      if (parts.size() != 2) continue;
      const std::wstring name = Trim(parts[0]);
      for (const std::wstring& k : Split(parts[1], L',')) {
        const std::wstring trimmed = Trim(k);
        if (!trimmed.empty()) map.names[trimmed] = name;
      }
    }
  }
  auto it = map.names.find(key);
  return it == map.names.end() ? std::wstring() : it->second;
}

// ---- Editing rules ---------------------------------------------------------------------

std::wstring Trim(std::wstring_view text) {
  std::size_t b = 0, e = text.size();
  while (b < e && (text[b] == L' ' || text[b] == L'\t')) ++b;
  while (e > b && (text[e - 1] == L' ' || text[e - 1] == L'\t')) --e;
  return std::wstring(text.substr(b, e - b));
}

std::wstring NextNewWatchlistName(const WatchlistStoreT& store) {
  for (int n = 1;; ++n) {
    std::wstring name = L"NewWatchlist" + std::to_wstring(n);
    if (store.IndexOf(name) < 0) return name;
  }
}

RenameCheck CheckRename(const WatchlistStoreT& store, int index, const std::wstring& name) {
  if (name.empty()) return RenameCheck::Empty;
  const auto& lists = store.Records();
  for (std::size_t i = 0; i < lists.size(); ++i)
    if (static_cast<int>(i) != index && lists[i].name == name) return RenameCheck::Duplicate;
  if (index >= 0 && std::size_t(index) < lists.size() && lists[std::size_t(index)].name == name)
    return RenameCheck::Unchanged;
  return RenameCheck::Accepted;
}

bool RenameAt(WatchlistStoreT& store, int index, const std::wstring& name) {
  std::vector<WatchListDetail> lists = store.Records();
  if (index < 0 || std::size_t(index) >= lists.size()) return false;
  lists[std::size_t(index)].name = name;
  store.Fill(std::move(lists));
  return true;
}

bool RemoveAt(WatchlistStoreT& store, int index) {
  std::vector<WatchListDetail> lists = store.Records();
  if (index < 0 || std::size_t(index) >= lists.size()) return false;
  lists.erase(lists.begin() + index);
  store.Fill(std::move(lists));
  return true;
}

bool SetItems(WatchlistStoreT& store, const std::wstring& name, std::vector<InstrumentKey> items) {
  const WatchListDetail* found = store.FindPtr(name);
  if (!found) return false;
  WatchListDetail w = *found;
  w.items = std::move(items);
  store.Put(w);
  return true;
}

void Reorder(WatchlistStoreT& store, const std::vector<std::wstring>& names) {
  const auto& old = store.Records();
  std::vector<WatchListDetail> lists;
  std::vector<char> taken(old.size(), 0);
  for (const std::wstring& name : names) {
    const int i = store.IndexOf(name);
    if (i < 0 || taken[std::size_t(i)]) continue;
    taken[std::size_t(i)] = 1;
    lists.push_back(old[std::size_t(i)]);
  }
  for (std::size_t i = 0; i < old.size(); ++i)
    if (!taken[i]) lists.push_back(old[i]);
  store.Fill(std::move(lists));
}

bool IsKeldoRefused(const std::wstring& wlnot, const std::wstring& exchange, std::wstring* refusal) {
  if (wlnot.empty()) return false;
  if ((L"," + wlnot).find(L"," + exchange + L",") == std::wstring::npos) return false;
  if (refusal) *refusal = Split(wlnot, L',').back();
  return true;
}

void ResetForTests() {
  for (int kind = kUserWatchlists; kind <= kWorldIndices; ++kind) StoreOfKind(kind)->Fill(std::vector<WatchListDetail>{});
  KeldoHolder().clear();
  MarketTexts() = MarketTextMap{};
}

}  // namespace watchlist
