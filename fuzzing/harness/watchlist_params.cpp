// The price view's watchlist parameters as the terminal answers them (515 and
// 518, narrow texts): "MKTEX" (TOP30 list names: "name=key,key;...") read
// into its translation map and used to name TOP30 lists, "WLNOT" (exchange
// codes, then the refusal text) checked for exchanges, and the limits
// "MAXWL"/"MAXWT" read as numbers. The input is the three texts and an
// exchange code, separated by NUL bytes.
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "addon/TextTables.h"
#include "hostview/Text.h"
#include "views/price/Watchlists.h"

namespace {

std::vector<std::string> Parts(const std::uint8_t* data, std::size_t size, std::size_t count) {
  std::vector<std::string> parts(count);
  std::size_t k = 0;
  for (std::size_t i = 0; i < size; ++i) {
    if (data[i] == 0 && k + 1 < count) ++k;
    else parts[k].push_back(static_cast<char>(data[i]));
  }
  return parts;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::vector<std::string> p = Parts(data, size, 4);
  auto& settings = addon::SettingTextTable::Instance();
  settings.Clear();
  watchlist::ResetForTests();
  const std::wstring mktex = hv::Widen(p[0]), wlnot = hv::Widen(p[1]), exchange = hv::Widen(p[3]);
  settings.Set("MKTEX", mktex);
  settings.Set("WLNOT", wlnot);
  settings.Set("MAXWL", hv::Widen(p[2]));
  settings.Set("MAXWT", hv::Widen(p[2]));

  // MKTEX: every key of the text, and the exchange text as a key.
  std::vector<std::wstring> keys{exchange, L"", L"TOPGAIN"};
  for (std::size_t at = 0; (at = mktex.find(L',', at)) != std::wstring::npos; ++at)
    keys.push_back(mktex.substr(at + 1, 12));
  for (const std::wstring& key : keys) {
    const std::wstring name = watchlist::TranslateListName(key);
    if (!name.empty() && mktex.find(name) == std::wstring::npos) __builtin_trap();
  }
  // The TOP30 lists named through it.
  std::vector<JTop30Group> groups(1);
  groups[0].groupName = p[3];
  for (const std::wstring& key : keys) groups[0].lists.push_back(JTop30List{hv::Narrow(key), {}});
  watchlist::ApplyTop30Groups(groups);
  if (Top30WatchlistStore().Records().size() > keys.size()) __builtin_trap();

  // WLNOT: a refusal names the exchange in the list and shows the text after the last ",".
  std::wstring refusal = L"unset";
  if (watchlist::IsKeldoRefused(wlnot, exchange, &refusal)) {
    if ((L"," + wlnot).find(L"," + exchange + L",") == std::wstring::npos) __builtin_trap();
    if (refusal.find(L',') != std::wstring::npos || wlnot.size() < refusal.size() ||
        wlnot.compare(wlnot.size() - refusal.size(), refusal.size(), refusal) != 0)
      __builtin_trap();
  }

  if (settings.MaxWatchlistItems() <= 0 || settings.MaxWatchlists() <= 0) __builtin_trap();
  return 0;
}
