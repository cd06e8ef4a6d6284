#include "terminal/host/TradePages.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <set>

#include "terminal/sim/Market.h"

namespace term::tape {

bool IsCompletePage(int page, int tradeCount) {
  return page >= 1 && page <= 999 && static_cast<std::int64_t>(page) * kPageSize <= tradeCount;
}

int NewestTradeOfPage(const std::string& text) {
  const std::size_t end = std::min(text.find(';'), text.size());
  const std::size_t bar = text.rfind('|', end == 0 ? 0 : end - 1);
  if (bar == std::string::npos || bar >= end) return 0;
  int number = 0;
  for (std::size_t i = bar + 1; i < end; ++i) {
    if (text[i] < '0' || text[i] > '9' || number > 100000000) return 0;
    number = number * 10 + (text[i] - '0');
  }
  return number;
}

bool MayHaveMoved(const std::string& field, int param, int tradeCount, const std::string& lastSent) {
  if (field != "TRADEDATA" || !IsCompletePage(param, tradeCount)) return true;
  // Sent while the page was still filling: its completed text is still due.
  return NewestTradeOfPage(lastSent) != param * kPageSize;
}

namespace {

std::string ClockText(std::uint32_t ms) {
  char buf[16];
  const unsigned s = (ms / 1000) % 86400;
  std::snprintf(buf, sizeof buf, "%02u:%02u:%02u", s / 3600, (s / 60) % 60, s % 60);
  return buf;
}

std::string SideText(std::uint8_t side, const SideWords& words) {
  switch (side) {
    case 0: return "Married Deal";
    case 1: return words.buy;
    case 2: return words.sell;
    case 3: return "Auction";
    default: return {};
  }
}

// A file name part: the code with anything but letters, digits, "-", "_" and "." replaced.
std::string FilePart(const std::string& code) {
  std::string out = code;
  for (char& c : out) {
    const bool keep = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '-' ||
                      c == '_' || c == '.';
    if (!keep) c = '_';
  }
  return out.empty() || out == "." || out == ".." ? "_" + out : out;
}

}  // namespace

std::string TapeTsv(sim::Market& market, int index, const SideWords& words) {
  const sim::Tape& trades = market.Trades(index);
  std::string out = "trade\ttime\tprice\tvolume\tside\n";
  out.reserve(out.size() + trades.size() * 40);
  for (std::size_t k = trades.size(); k-- > 0;) {
    const sim::Trade& t = trades[k];
    out += std::to_string(k + 1);
    out += '\t';
    out += ClockText(t.timeMs);
    out += '\t';
    out += market.FormatPrice(index, t.price);
    out += '\t';
    out += std::to_string(t.volume);
    out += '\t';
    out += SideText(t.side, words);
    out += '\n';
  }
  return out;
}

int WriteTapeDumps(sim::Market& market, const std::vector<ShownInstrument>& shown, const std::string& dir,
                   const SideWords& words, std::string& error) {
  namespace fs = std::filesystem;
  std::error_code ec;
  fs::create_directories(dir, ec);
  if (ec) {
    error = "cannot create " + dir + ": " + ec.message();
    return -1;
  }
  std::set<std::string> written;
  int files = 0;
  for (const ShownInstrument& s : shown) {
    const int index = market.Find(s.productId, s.code);
    if (index < 0 || !written.insert(s.code).second) continue;
    const fs::path path = fs::path(dir) / ("market-trades-" + FilePart(s.code) + ".tsv");
    std::ofstream f(path, std::ios::binary | std::ios::trunc);
    const std::string tsv = TapeTsv(market, index, words);
    f.write(tsv.data(), static_cast<std::streamsize>(tsv.size()));
    f.close();
    if (!f) {
      error = "cannot write " + path.string();
      return -1;
    }
    ++files;
  }
  return files;
}

}  // namespace term::tape
