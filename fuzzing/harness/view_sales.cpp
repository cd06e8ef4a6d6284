// OnHostMessage of the time and sales view (see ViewHarness.h).
#include "ViewHarness.h"

MV_VIEW_HARNESS("CTimeAndSalesAdv", {hm::CompactLayout, hm::ExchangeEnabled, hm::LinkedInstrument})
