#include "terminal/host/InstrumentNotices.h"

#include <algorithm>

#include "hostview/MessageIds.h"
#include "hostview/Records.h"
#include "terminal/host/HostCore.h"
#include "terminal/host/MarketSource.h"
#include "terminal/host/ViewDirectory.h"

namespace term {

InstrumentNotices::InstrumentNotices(MarketSource& market, ViewDirectory& views) : market_(market), views_(views) {}

void InstrumentNotices::Note(const std::vector<std::pair<int, std::uint32_t>>& changed) {
  const auto& instruments = market_.Instruments();
  for (const auto& [index, bits] : changed) {
    if (!(bits & MarketSource::kNameChanged) || index < 0 || std::size_t(index) >= instruments.size()) continue;
    std::string name = market_.FieldValue(index, "INSTRNAME", 0, 0);
    auto it = current_.find(index);
    const std::string& before = it != current_.end() ? it->second : instruments[std::size_t(index)].instrumentName;
    // A replay that never recorded a name reads "": no change.
    if (name.empty() || name == before) continue;
    current_[index] = std::move(name);
    noted_.push_back(index);
  }
}

void InstrumentNotices::Send(CSuperBaseView* view, int index, const std::string& name) {
  const JInstrumentUnderlying& ins = market_.Instruments()[std::size_t(index)];
  FieldUpdate u{ins.productId, ins.instrumentCode, "INSTRNAME", name, 0, 0};
  views_.Deliver(view, hm::InstrumentFieldUpdate, ToLParam(&u));
}

void InstrumentNotices::Deliver() {
  std::vector<int> noted;
  noted.swap(noted_);
  CSuperBaseView* leading = nullptr;
  for (CSuperBaseView* v : views_.Of(kPriceView))
    if (views_.Live(v)) { leading = v; break; }
  if (!leading) return;
  if (leading != told_.data()) {
    // Its instrument list arrives with its first activation; until then it could not place a rename.
    const ViewDirectory::Entry* rec = views_.Find(leading);
    if (!rec || !rec->activatedOnce) return;
    told_ = leading;
    for (const auto& [index, name] : current_) Send(leading, index, name);
    return;
  }
  // Twice in one pump: the name it has now, once.
  std::sort(noted.begin(), noted.end());
  noted.erase(std::unique(noted.begin(), noted.end()), noted.end());
  for (int index : noted) Send(leading, index, current_[index]);
}

}  // namespace term
