#include "terminal/app/MarketSummaryDump.h"

#include <fstream>
#include <set>

#include "hostview/SuperBaseView.h"
#include "terminal/app/MainWindow.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"

namespace term {

std::string MarketSummaryTsv(sim::Market& market, int index) {
  std::string out = "price\task_volume\tbid_volume\tblock_volume\ttotal_volume\n";
  if (index < 0) return out;
  for (const sim::SummaryLine& line : market.Summary(index)) {
    const std::int64_t block = line.volume - line.askVolume - line.bidVolume;
    out += market.FormatPrice(index, line.price);
    out += '\t' + std::to_string(line.askVolume) + '\t' + std::to_string(line.bidVolume) + '\t' + std::to_string(block) +
           '\t' + std::to_string(line.volume) + '\n';
  }
  return out;
}

std::string MarketSummaryFileName(const std::string& code) {
  std::string safe = code;
  for (char& c : safe) {
    const bool keep = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '.' ||
                      c == '_' || c == '-';
    if (!keep) c = '_';
  }
  return "market-summary-" + safe + ".tsv";
}

int WriteMarketSummaryDumps(const std::string& dir, sim::Market& market,
                            const std::vector<std::pair<std::int64_t, std::string>>& instruments, std::string& error) {
  int files = 0;
  std::set<std::pair<std::int64_t, std::string>> done;
  for (const auto& instrument : instruments) {
    if (!done.insert(instrument).second) continue;
    const int index = market.Find(instrument.first, instrument.second);
    if (index < 0) continue;
    const std::string path = dir + "/" + MarketSummaryFileName(instrument.second);
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file << MarketSummaryTsv(market, index);
    file.close();
    if (!file) {
      error = "cannot write " + path;
      return -1;
    }
    ++files;
  }
  return files;
}

int WriteMarketSummaryDumps(MainWindow& window, HostRuntime& runtime, const std::string& dir, std::string& error) {
  std::vector<std::pair<std::int64_t, std::string>> shown;
  for (ViewDock* d : window.Docks()) {
    const CSuperBaseView* v = d->View();
    if (!v || d->ClassName() != QLatin1String("CTradeSummaryAdv")) continue;
    shown.emplace_back(v->GetStartProductId(), v->GetStartInstrumentCode());
  }
  return WriteMarketSummaryDumps(dir, runtime.Market(), shown, error);
}

}  // namespace term
