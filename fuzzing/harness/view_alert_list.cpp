// OnHostMessage of the price alert list (see ViewHarness.h).
#include "ViewHarness.h"

MV_VIEW_HARNESS("CPriceAlertList", {hm::Alert701, hm::Alert702, hm::Alert703, hm::Alert704})
