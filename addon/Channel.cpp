#include "addon/Channel.h"

namespace addon {

bool IsPointerMessage(UINT message) {
  switch (message) {
    case hm::LinkData:
    case hm::FieldValue:
    case hm::RequestField:
    case hm::InstrumentList:
    case hm::ExchangeList:
    case hm::ProductList:
    case hm::TextByKey:
    case hm::SystemParameter:
    case hm::NoticeParameter:
    case hm::WatchlistGroups520:
    case hm::WatchlistGroups521:
    case hm::WatchlistRows522:
    case hm::MarketInfo:
    case hm::WatchlistList:
    case hm::LinkedInstrument:
    case hm::PriceBands:
    case hm::MessageText:
      return true;
    default:
      return false;
  }
}

namespace fields {
const std::vector<std::string> kQuote = {"BID",     "ASK",  "BVOL", "SVOL",  "LAST",    "CHANGE",
                                         "PCHANGE", "OPEN", "HIGH", "LOW",   "CLOSE",   "VOL",
                                         "REMARKS", "CFD_STATUS", "DMA_STATUS", "MONTH", "YEAR", "TAC"};
const std::vector<std::string> kDepth = {"ORDS_BVOL", "BVOL", "BUY", "SELL", "SVOL", "ORDS_SVOL"};
const std::vector<std::string> kAlertShort = {"BID", "ASK", "OPEN", "LAST", "CHANGE", "PCHANGE"};
const std::vector<std::string> kAlert = {"BID", "ASK", "OPEN", "LAST", "CLOSE", "CHANGE", "PCHANGE", "REMARKS"};
const std::vector<std::string> kSalesHeader = {"DTIME", "HIGH",       "LOW",          "NETCHANGE",
                                               "LAST",  "TOTALVALUE", "TOTAL_VOLUME", "PAGECOUNT"};
const std::vector<std::string> kSummary = {"TIME",       "WEIGHTED_AVG", "RATIO", "LAST",    "AVG_TRADE_SIZE",
                                           "QUOTE_LIST", "COUNT",        "PAGECOUNT", "TRADEDATA"};
}  // namespace fields

namespace {

// One record per call, built on the stack: the host must not keep it.
void SendOne(const FeedbackSender& send, UINT message, const FieldTarget& target, std::string_view name,
             BatchTag tag) {
  FieldRequest request;
  request.productId = target.productId;
  request.instrumentCode = target.instrumentCode;
  request.fieldName = std::string(name);
  request.param = tag.param;
  request.kind = tag.kind;
  send(message, ToLParam(&request));
}

}  // namespace

std::string JoinFieldNames(const std::vector<std::string>& names) {
  std::string joined;
  for (std::size_t i = 0; i < names.size(); ++i) {
    if (i) joined += ',';
    joined += names[i];
  }
  return joined;
}

void SendWithdrawBatch(const FeedbackSender& send, const FieldTarget& target, const std::vector<std::string>& names,
                       BatchTag tag) {
  if (!send) return;
  for (const auto& name : names) SendOne(send, hm::WithdrawField, target, name, tag);
  SendOne(send, hm::WithdrawField, target, kSubmitField, tag);
}

void SendFetchBatch(const FeedbackSender& send, const FieldTarget& target, const std::vector<std::string>& names,
                    BatchTag tag) {
  if (!send) return;
  SendRequests(send, target, names, tag);
  SendOne(send, hm::FetchFields, target, JoinFieldNames(names), tag);
}

void SendRequestBatch(const FeedbackSender& send, const FieldTarget& target, const std::vector<std::string>& names,
                      BatchTag tag) {
  if (!send) return;
  SendRequests(send, target, names, tag);
  SendOne(send, hm::RequestField, target, kSubmitField, tag);
}

void SendRequests(const FeedbackSender& send, const FieldTarget& target, const std::vector<std::string>& names,
                  BatchTag tag) {
  if (!send) return;
  for (const auto& name : names) SendOne(send, hm::RequestField, target, name, tag);
}

void SendInterestBatches(const FeedbackSender& send, const FieldTarget& target, const InterestBatches& batches) {
  SendWithdrawBatch(send, target, batches.withdrawNames, batches.withdrawTag);
  SendFetchBatch(send, target, batches.names, batches.fetchTag);
  SendRequestBatch(send, target, batches.names, batches.requestTag);
}

InterestBatches QuoteInterest() {
  InterestBatches b;
  b.withdrawNames = fields::kQuote;
  b.names = fields::kQuote;
  return b;
}

InterestBatches DepthInterest(std::int32_t levelCount) {
  InterestBatches b;
  b.withdrawNames = fields::kDepth;
  b.names = fields::kDepth;
  b.withdrawTag = {0, levelCount};
  b.fetchTag = {0, levelCount};
  b.requestTag = {1, levelCount};
  return b;
}

InterestBatches AlertInterest() {
  InterestBatches b;
  b.withdrawNames = fields::kAlertShort;
  b.names = fields::kAlert;
  return b;
}

}  // namespace addon
