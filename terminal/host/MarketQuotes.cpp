#include "terminal/host/MarketQuotes.h"

#include <fstream>
#include <set>

#include "terminal/sim/Market.h"

namespace term {

const std::vector<std::string>& QuoteFieldNames() {
  static const std::vector<std::string> names{"BID",  "ASK",  "BVOL",  "SVOL",    "LAST",       "CHANGE",
                                              "PCHANGE", "OPEN", "HIGH", "LOW", "CLOSE", "VOL",
                                              "REMARKS", "CFD_STATUS", "DMA_STATUS", "MONTH", "YEAR", "TAC"};
  return names;
}

namespace {
std::string Clean(std::string text) {
  for (char& c : text)
    if (c == '\t' || c == '\n' || c == '\r') c = ' ';
  return text;
}
}  // namespace

std::string MarketQuotesTsv(sim::Market& market, const std::vector<int>& instruments) {
  std::string out = "product_id\tcode";
  for (const std::string& name : QuoteFieldNames()) out += "\t" + name;
  out += "\n";
  std::set<int> written;
  const auto& list = market.Instruments();
  for (int idx : instruments) {
    if (idx < 0 || idx >= int(list.size()) || !written.insert(idx).second) continue;
    const JInstrumentUnderlying& ins = list[std::size_t(idx)];
    out += std::to_string(ins.productId) + "\t" + Clean(ins.instrumentCode);
    for (const std::string& name : QuoteFieldNames()) out += "\t" + Clean(market.FieldValue(idx, name, 0, 0));
    out += "\n";
  }
  return out;
}

bool WriteMarketQuotes(const std::string& path, sim::Market& market, const std::vector<int>& instruments,
                       std::string& error) {
  std::ofstream file(path, std::ios::binary | std::ios::trunc);
  if (!file) {
    error = "cannot write " + path;
    return false;
  }
  file << MarketQuotesTsv(market, instruments);
  file.close();
  if (!file) {
    error = "cannot write " + path;
    return false;
  }
  return true;
}

}  // namespace term
