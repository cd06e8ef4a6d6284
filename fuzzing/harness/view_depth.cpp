// OnHostMessage of the market depth view (see ViewHarness.h).
#include "ViewHarness.h"

MV_VIEW_HARNESS("CMarketDepthAdv", {hm::CompactLayout, hm::ExchangeEnabled, hm::LinkedInstrument})
