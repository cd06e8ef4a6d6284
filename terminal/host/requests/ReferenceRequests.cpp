// Requests for the market's reference data: instrument, exchange and product
// lists and look-ups (from the market source, so a replay answers with its
// recording's), remarks, price bands, sectors, market information (the
// simulator's).
#include <algorithm>

#include "hostview/MessageIds.h"
#include "terminal/host/HostCore.h"

namespace term {

void RegisterReferenceRequests(RequestTable& table) {
  table.On(hm::InstrumentList, [](const Request& r) {
    const auto& list = r.host.source->Instruments();
    r.Answer(JInstrumentListMsg{std::intptr_t(list.size()), 0, &list});
  });
  table.On(hm::ExchangeList, [](const Request& r) {
    const auto& list = r.host.source->Exchanges();
    r.Answer(JExchangeListMsg{std::intptr_t(list.size()), 0, &list});
  });
  table.On(hm::ProductList, [](const Request& r) {
    const auto& list = r.host.source->Products();
    r.Answer(JProductListMsg{std::intptr_t(list.size()), &list});
  });
  table.On(hm::RemarkMessages, [](const Request& r) {
    r.Answer(r.host.market->RemarkMessages());
  });
  table.On(hm::PriceBands, [](const Request& r) {
    const auto& bands = r.host.market->TickBands();
    r.Answer(JTickBandList{std::int32_t(bands.size()), &bands});
  });
  table.On(hm::Sectors, [](const Request& r) {
    r.Answer(r.host.market->Sectors());
  });
  table.On({hm::FindByChartCode, hm::FindByCode}, [](const Request& r) {
    const MarketSource& market = *r.host.source;
    const JInstrumentUnderlying* found = nullptr;
    if (r.data) {
      const auto* q = r.Data<JInstrumentLink>();
      int idx = r.message == hm::FindByChartCode ? market.FindByChartCode(q->text) : -1;
      if (r.message == hm::FindByCode) {
        idx = q->productId > 0 ? market.Find(q->productId, q->text) : -1;
        if (idx < 0) idx = market.FindByCode(q->text);
      }
      if (idx >= 0) found = &market.Instruments()[std::size_t(idx)];
    }
    r.AnswerWord(ToLParam(found));
  });
  table.On(hm::MarketInfo, [](const Request& r) {
    std::vector<JMarketInfo> list;
    if (r.data) {
      const auto* q = r.Data<JMarketInfoRequest>();
      JMarketInfo mi = r.host.market->MarketInfo(q->exchangeCode);
      if (!mi.exchangeCode.empty()) {
        mi.productId = q->productId;  // the key the asker files the answer under
        list.push_back(std::move(mi));
      }
    }
    r.Answer(list);
  });
  table.On(hm::ExchangeEnabled, [](const Request& r) {
    int enabled = 0;
    if (r.data) {
      const std::string code = r.Data<JExchangeList>()->exchangeCode;
      const std::string off = "," + r.host.user->settings.Get("EXOFF") + ",";
      enabled = r.host.source->FindExchange(code) && off.find("," + code + ",") == std::string::npos ? 1 : 0;
    }
    r.AnswerWord(enabled);
  });
  table.On(hm::AlertBoardRequest, [](const Request& r) {
    if (!r.data) return;
    const auto* q = r.Data<JPriceInfoRequest>();
    JPriceInformation info;
    info.referencePrice = q->referencePrice;
    info.tickSize = r.host.market->StepAt(q->priceStepTableId, q->referencePrice > 0 ? q->referencePrice : 1.0);
    if (q->referencePrice > 0) {
      info.lowerLimit = std::max(info.tickSize, q->referencePrice * 0.7);
      info.upperLimit = q->referencePrice * 1.3;
    }
    r.Answer(info);
  });
}

}  // namespace term
