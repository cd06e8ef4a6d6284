#include "data/MarketStores.h"
#include "data/QuoteStore.h"

template class CellStore<QuoteLayout>;
template class CellStore<DepthLayout>;
template class CellStore<SalesSummaryLayout>;
template class CellStore<SalesPageLayout>;
template class CellStore<SummaryHeaderLayout>;
template class CellStore<SummaryLineLayout>;
