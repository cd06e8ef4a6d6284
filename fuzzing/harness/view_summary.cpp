// OnHostMessage of the trade summary view (see ViewHarness.h).
#include "ViewHarness.h"

MV_VIEW_HARNESS("CTradeSummaryAdv", {hm::CompactLayout, hm::ExchangeEnabled, hm::LinkedInstrument})
