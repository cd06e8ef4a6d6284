#pragma once
// The reading rules of the time-and-sales and trade-summary views, applied to
// the texts the simulated market writes: what the views parse must be what the
// market traded.
#include <map>
#include <sstream>
#include <string>
#include <vector>

namespace tape {

inline std::vector<std::string> Split(const std::string& s, char sep) {
  std::vector<std::string> out;
  std::string cur;
  for (char c : s) {
    if (c == sep) { out.push_back(cur); cur.clear(); }
    else cur.push_back(c);
  }
  out.push_back(cur);
  return out;
}

struct ParsedTrade {
  int number = 0;
  std::string time, price, volume, side;
};

// "TRADEDATA" of a trade page: items of exactly six fields; number > 0.
inline std::map<int, ParsedTrade> ParseTradePage(const std::string& text, int* firstNumber = nullptr) {
  std::map<int, ParsedTrade> out;
  bool first = true;
  for (const std::string& item : Split(text, ';')) {
    const auto f = Split(item, '|');
    if (f.size() != 6) continue;
    const int n = std::atoi(f[5].c_str());
    if (n <= 0) continue;
    if (first && firstNumber) *firstNumber = n;
    first = false;
    out[n] = {n, f[0], f[1], f[2], f[3]};
  }
  return out;
}

struct ParsedLine {
  std::string price, trades, volume, bid, ask;
};

// "TRADEDATA" of a summary page: items with at least six fields; a totals item
// goes to line 99999, item i to line (page - 1) * 40 + 1 + i.
inline std::map<int, ParsedLine> ParseSummaryPage(const std::string& text, int page) {
  std::map<int, ParsedLine> out;
  int i = 0;
  for (const std::string& item : Split(text, ';')) {
    const auto f = Split(item, '|');
    if (f.size() < 6) { ++i; continue; }
    if (f[0].empty() || f[0] == "TOTALS:") out[99999] = {"", f[1], f[2], f[3], f[5]};
    else out[(page - 1) * 40 + 1 + i] = {f[0], f[1], f[2], f[3], f[5]};
    ++i;
  }
  return out;
}

}  // namespace tape
