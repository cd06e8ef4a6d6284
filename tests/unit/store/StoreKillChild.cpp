// Saves a growing state again and again and prints "<n>\n" on stdout after each
// commit, until it is killed. Usage: term_store_kill_child <data dir>
#include <unistd.h>

#include <cstdio>
#include <string>

#include "terminal/store/Store.h"

int main(int argc, char** argv) {
  if (argc != 2) return 2;
  term::StoreOpenReport report;
  std::string error;
  auto store = term::Store::Open(argv[1], report, error);
  if (!store) {
    std::fprintf(stderr, "%s\n", error.c_str());
    return 1;
  }
  for (long n = 1;; ++n) {
    // One save writes the counter and n watchlists: after a kill the two must agree.
    std::vector<term::WatchlistRow> lists;
    for (long i = 0; i < n % 50 + 1; ++i)
      lists.push_back({0, i, "list " + std::to_string(i), "<n>" + std::to_string(n) + "</n>"});
    if (!store->SaveWatchlists(0, lists)) return 3;
    if (!store->SaveSettings({{"counter", std::to_string(n)}, {"lists", std::to_string(lists.size())}})) return 3;
    const std::string line = std::to_string(n) + "\n";
    if (write(STDOUT_FILENO, line.data(), line.size()) != static_cast<ssize_t>(line.size())) return 4;
  }
}
