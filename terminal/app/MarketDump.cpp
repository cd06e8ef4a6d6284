#include "terminal/app/MarketDump.h"

#include "hostview/SuperBaseView.h"
#include "hostview/Text.h"
#include "terminal/app/MainWindow.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/host/TradePages.h"

namespace term {

int WriteMarketTradeDumps(MainWindow& window, HostRuntime& runtime, const std::string& dir, std::string& error) {
  std::vector<tape::ShownInstrument> shown;
  for (ViewDock* d : window.Docks()) {
    const CSuperBaseView* v = d->View();
    if (!v || v->GetStartProductId() < 0 || v->GetStartInstrumentCode().empty()) continue;
    shown.push_back({v->GetStartProductId(), v->GetStartInstrumentCode()});
  }
  // The side words the views show, from the terminal's language table.
  tape::SideWords words;
  const std::wstring buy = runtime.Language().GetText(13, 614);
  const std::wstring sell = runtime.Language().GetText(13, 615);
  if (!buy.empty()) words.buy = hv::Narrow(buy);
  if (!sell.empty()) words.sell = hv::Narrow(sell);
  return tape::WriteTapeDumps(runtime.Market(), shown, dir, words, error);
}

}  // namespace term
