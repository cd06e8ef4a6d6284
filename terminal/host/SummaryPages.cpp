#include "terminal/host/SummaryPages.h"

#include "terminal/sim/Market.h"

namespace term::summary {

std::uint32_t ChangesThatMove(const std::string&) { return sim::Market::kTradeChanged; }

}  // namespace term::summary
