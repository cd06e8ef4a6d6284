#pragma once
// The watchlists the price view shows: the record, the four process-wide
// stores and what fills them (host replies 610, 611, 520/521, 522 and the
// instrument list), the three XML texts handed to the host for saving, and the
// small rules of editing (new names, renames, the brand-list exchange rule).
//
// Plain C++ over the stores of data/; no Qt. UI thread only, no locks: the
// stores are shared by every price view of the process.
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "data/Keys.h"
#include "data/ReferenceStores.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"

// The family a price view shows.
enum ListKind : int {
  kUserWatchlists = 0,
  kTop30Watchlists = 1,
  kKeldoWatchlists = 2,
  kWorldIndices = 3,
  kAdvanceFilter = 4,
};

// One watchlist; keyed by its name in its store (exact, case-sensitive).
struct WatchListDetail {
  std::int32_t WatchlistID = 0;       // 0: created here, not yet acknowledged by the host
  std::wstring name;
  std::vector<InstrumentKey> items;   // display order
};

using WatchlistStoreT = WatchlistStore<WatchListDetail>;

WatchlistStoreT& UserWatchlistStore();
WatchlistStoreT& Top30WatchlistStore();
WatchlistStoreT& KeldoWatchlistStore();
WatchlistStoreT& WorldIndexStore();
// The store of a family (0..3); null for the advance filter and unknown kinds.
WatchlistStoreT* StoreOfKind(int kind);

namespace watchlist {

// The name and id of the world-index list.
inline constexpr const wchar_t* kWorldIndexName = L"STATIC_INDEX";
inline constexpr std::int32_t kWorldIndexId = 1;
// The exchange whose instruments make up the world-index list.
inline constexpr const char* kWorldIndexExchange = "WIDX";

// Installs the probes that tell PrepareBasicData whether 610, 522 and 521
// must be asked (a store counts as loaded once it holds a watchlist).
void InstallStoreProbes();

// ---- Texts handed to the host ------------------------------------------
// An attribute value: & < > " ' escaped; tab, line feed and carriage return as
// character references (so a parser reads them back unchanged); other control
// characters, which XML cannot carry, become a blank.
std::wstring XmlEscape(std::wstring_view text);
// 611: "<watchlistmain>" + one entry per watchlist of the store (SeqID from 0) + "</watchlistmain>".
std::wstring WatchlistNamesText(const WatchlistStoreT& store);
// 612: "<watchlistnames>" + one entry per item with a product id and a code
// (SeqID = position + 1, so skipped items leave gaps) + "</watchlistnames>".
std::wstring UserItemText(const std::vector<InstrumentKey>& items);
// 618: the brand-list entries, from the instrument and exchange stores.
std::wstring KeldoItemText(const std::vector<InstrumentKey>& items);

// ---- Replies -------------------------------------------------------------------
// 610: rebuilds the user store; a watchlist keeps at most `maxItems` items.
void ApplyUserRows(const std::vector<JWatchlistRow>& rows, int maxItems);
// 611: fills in ids of watchlists that have none yet; ids already set stay.
void ApplyAcknowledgedIds(const std::vector<JWatchlistIdRow>& rows);
// 520/521: rebuilds the TOP30 store: list j of group i gets id i * 1000 + j and
// the name group + " - " + list (the list name translated through "MKTEX").
void ApplyTop30Groups(const std::vector<JTop30Group>& groups);
// 522: rebuilds the brand store (first row of a name wins) and keeps the reply.
void ApplyKeldoRows(const std::vector<JKeldoWatchlistRow>& rows);
// The last 522 reply as received.
const std::vector<JKeldoWatchlistRow>& KeldoReply();
// 500: the world-index list from the instruments of the exchange "WIDX"
// (trimmed), in list order; an instrument list without one leaves the store.
void BuildWorldIndexList(const std::vector<JInstrumentUnderlying>& instruments);

// The "MKTEX" translation of a TOP30 list key; empty when there is none. The
// map is built on the first lookup after the text arrived.
std::wstring TranslateListName(const std::wstring& key);

// ---- Editing rules ------------------------------------------------------------------
// Blanks (spaces, tabs) removed at both ends.
std::wstring Trim(std::wstring_view text);
// The first "NewWatchlist<N>" (N = 1, 2, ...) the store does not hold.
std::wstring NextNewWatchlistName(const WatchlistStoreT& store);

enum class RenameCheck { Accepted, Unchanged, Empty, Duplicate };
// Whether watchlist `index` may take the (already trimmed) `name`.
RenameCheck CheckRename(const WatchlistStoreT& store, int index, const std::wstring& name);
// Renames watchlist `index` in place (id and items kept); false when out of range.
bool RenameAt(WatchlistStoreT& store, int index, const std::wstring& name);
// Removes watchlist `index`, keeping the order of the others.
bool RemoveAt(WatchlistStoreT& store, int index);
// Replaces the items of the watchlist named `name`; false when absent.
bool SetItems(WatchlistStoreT& store, const std::wstring& name, std::vector<InstrumentKey> items);
// Reorders the store after `names` (tab texts, left to right); names that are
// no watchlist are skipped, watchlists not named keep their place at the end.
void Reorder(WatchlistStoreT& store, const std::vector<std::wstring>& names);

// The brand-list exchange rule: "WLNOT" is a comma list of exchange codes
// followed by the refusal text. True (refused, `refusal` set) when
// "," + exchange + "," occurs in "," + wlnot.
bool IsKeldoRefused(const std::wstring& wlnot, const std::wstring& exchange, std::wstring* refusal);

// Empties the stores, the kept 522 reply and the "MKTEX" map (tests).
void ResetForTests();

}  // namespace watchlist
