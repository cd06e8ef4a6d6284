// OnHostMessage of the new price alert view (see ViewHarness.h).
#include "ViewHarness.h"

MV_VIEW_HARNESS("CNewPriceAlertAdv", {hm::AlertBoardRequest, hm::Alert705, hm::PriceBands, hm::ExchangeEnabled})
