// Watchlists: the lists the price view reads, its edits (texts the runtime
// parses and stores), and the 300 relay that tells the other price views.
#include "hostview/MessageIds.h"
#include "terminal/host/HostCore.h"

namespace term {

namespace {

// After an edit: the requester's answer is already out; the other price views reload.
void Edited(const Request& r, UserData::Edit result, int family) {
  if (result == UserData::Edit::Unreadable)
    r.host.shell->ShowNotice(r.host.options.appTitle,
                             L"A watchlist change could not be saved: the terminal received an unreadable text.");
  if (result == UserData::Edit::Saved) r.host.NotifyWatchlists(family, r.view);
}

}  // namespace

void RegisterWatchlistRequests(RequestTable& table) {
  table.On(hm::WatchlistsLoaded, [](const Request& r) { r.host.NotifyWatchlists(int(r.data), nullptr); });
  table.On({hm::WatchlistGroups520, hm::WatchlistGroups521}, [](const Request& r) {
    const std::vector<JTop30Group> groups = r.host.market->Top30();
    r.Answer(groups);
  });
  table.On(hm::WatchlistRows522, [](const Request& r) {
    const std::vector<JKeldoWatchlistRow> rows = r.host.user->BrandRows(*r.host.source);
    r.Answer(rows);
  });
  table.On(hm::WatchlistList, [](const Request& r) {
    const std::vector<JWatchlistRow> rows = r.host.user->UserRows();
    r.Answer(rows);
  });
  table.On(hm::SaveWatchlistNames, [](const Request& r) {
    if (!r.data) return;
    const UserData::Edit result = r.host.user->SaveNames(*r.Data<WatchlistFeedback>());
    if (result == UserData::Edit::Saved) {
      // The requester learns the ids of new lists.
      std::vector<JWatchlistIdRow> rows;
      for (const auto& w : r.host.user->userLists) rows.push_back({w.id, w.name});
      r.Answer(rows);
    }
    Edited(r, result, 0);
  });
  table.On(hm::SaveUserWatchlist, [](const Request& r) {
    if (r.data) Edited(r, r.host.user->SaveUserItems(*r.Data<WatchlistFeedback>(), *r.host.source), 0);
  });
  table.On(hm::RenameWatchlist, [](const Request& r) {
    if (r.data) Edited(r, r.host.user->RenameBrand(*r.Data<WatchlistFeedback>()), 2);
  });
  table.On(hm::SaveKeldoWatchlist, [](const Request& r) {
    if (r.data) Edited(r, r.host.user->SaveBrandItems(*r.Data<WatchlistFeedback>(), *r.host.source), 2);
  });
  // Price view requests the terminal takes without an answer.
  table.Acknowledge({hm::PriceViewRequest413, hm::PriceViewRequest553, hm::Watchlist606, hm::Watchlist622});
}

}  // namespace term
