#include <gtest/gtest.h>

#include <set>

#include "addon/Channel.h"
#include "addon/RegisteredMessages.h"
#include "platform/Platform.h"

namespace {

struct Sent {
  UINT message;
  FieldRequest request;
};

// Copies each record while it is alive (the sender owns it only for the call).
struct Recorder {
  std::vector<Sent> sent;
  addon::FeedbackSender Sender() {
    return [this](UINT message, LPARAM data) { sent.push_back({message, *FromLParam<const FieldRequest>(data)}); };
  }
};

// Checks one batch run: `message` for each of `names` then, if given, `last`.
void ExpectRun(const std::vector<Sent>& sent, std::size_t& at, UINT message, const std::vector<std::string>& names,
               std::int32_t kind, std::int32_t param) {
  for (const auto& name : names) {
    ASSERT_LT(at, sent.size());
    EXPECT_EQ(sent[at].message, message) << "at " << at;
    EXPECT_EQ(sent[at].request.fieldName, name) << "at " << at;
    EXPECT_EQ(sent[at].request.kind, kind) << "at " << at;
    EXPECT_EQ(sent[at].request.param, param) << "at " << at;
    EXPECT_EQ(sent[at].request.productId, 7);
    EXPECT_EQ(sent[at].request.instrumentCode, "0005");
    ++at;
  }
}

TEST(FieldBatches_NewInstrument, PriceViewSendsTheThreeBatchesInOrder) {
  Recorder rec;
  addon::SendInterestBatches(rec.Sender(), {7, "0005"}, addon::QuoteInterest());
  ASSERT_EQ(addon::fields::kQuote.size(), 18u);
  ASSERT_EQ(rec.sent.size(), 19u + 19u + 19u);
  std::size_t at = 0;
  ExpectRun(rec.sent, at, hm::WithdrawField, addon::fields::kQuote, 0, 0);
  ExpectRun(rec.sent, at, hm::WithdrawField, {"PMP_Submit"}, 0, 0);
  ExpectRun(rec.sent, at, hm::RequestField, addon::fields::kQuote, 0, 0);
  ExpectRun(rec.sent, at, hm::FetchFields,
            {"BID,ASK,BVOL,SVOL,LAST,CHANGE,PCHANGE,OPEN,HIGH,LOW,CLOSE,VOL,REMARKS,CFD_STATUS,DMA_STATUS,MONTH,YEAR,TAC"},
            0, 0);
  ExpectRun(rec.sent, at, hm::RequestField, addon::fields::kQuote, 0, 0);
  ExpectRun(rec.sent, at, hm::RequestField, {"PMP_Submit"}, 0, 0);
  EXPECT_EQ(at, rec.sent.size());
}

TEST(FieldBatches_NewInstrument, DepthAndAlertVariants) {
  Recorder depth;
  addon::SendInterestBatches(depth.Sender(), {7, "0005"}, addon::DepthInterest(21));
  std::size_t at = 0;
  ExpectRun(depth.sent, at, hm::WithdrawField, addon::fields::kDepth, 0, 21);
  ExpectRun(depth.sent, at, hm::WithdrawField, {"PMP_Submit"}, 0, 21);
  ExpectRun(depth.sent, at, hm::RequestField, addon::fields::kDepth, 0, 21);
  ExpectRun(depth.sent, at, hm::FetchFields, {"ORDS_BVOL,BVOL,BUY,SELL,SVOL,ORDS_SVOL"}, 0, 21);
  ExpectRun(depth.sent, at, hm::RequestField, addon::fields::kDepth, 1, 21);
  ExpectRun(depth.sent, at, hm::RequestField, {"PMP_Submit"}, 1, 21);
  EXPECT_EQ(at, depth.sent.size());

  Recorder alert;
  addon::SendInterestBatches(alert.Sender(), {7, "0005"}, addon::AlertInterest());
  at = 0;
  ExpectRun(alert.sent, at, hm::WithdrawField, {"BID", "ASK", "OPEN", "LAST", "CHANGE", "PCHANGE", "PMP_Submit"}, 0, 0);
  ExpectRun(alert.sent, at, hm::RequestField, addon::fields::kAlert, 0, 0);
  ExpectRun(alert.sent, at, hm::FetchFields, {"BID,ASK,OPEN,LAST,CLOSE,CHANGE,PCHANGE,REMARKS"}, 0, 0);
  ExpectRun(alert.sent, at, hm::RequestField, addon::fields::kAlert, 0, 0);
  ExpectRun(alert.sent, at, hm::RequestField, {"PMP_Submit"}, 0, 0);
  EXPECT_EQ(at, alert.sent.size());
}

TEST(FieldBatches_Requests, PagedViewsSendPlainRequests) {
  Recorder rec;
  addon::SendRequests(rec.Sender(), {7, "0005"}, {"TRADEDATA"}, {2, 3});
  addon::SendWithdrawBatch(addon::FeedbackSender(), {7, "0005"}, {"X"});  // no sender: nothing, no crash
  ASSERT_EQ(rec.sent.size(), 1u);
  EXPECT_EQ(rec.sent[0].message, hm::RequestField);
  EXPECT_EQ(rec.sent[0].request.kind, 2);
  EXPECT_EQ(rec.sent[0].request.param, 3);
}

TEST(RegisteredMessages_Load, EveryNameHasItsOwnProcessWideNumber) {
  const auto& names = addon::RegisteredMessageNames();
  ASSERT_EQ(names.size(), 20u);
  std::set<UINT> numbers;
  for (const auto& name : names) numbers.insert(platform::RegisterWindowMessage(name));
  EXPECT_EQ(numbers.size(), names.size());
  EXPECT_EQ(addon::Msg().wlOpenTrade, platform::RegisterWindowMessage("MSG_WLOPENTRADE"));
  EXPECT_EQ(addon::Msg().mdColumnChange, platform::RegisterWindowMessage("MSG_MDCOLUMNCHANGE"));
  EXPECT_EQ(addon::Msg().childFeedback, platform::RegisterWindowMessage("MSG_CHILDFEEDBACK"));
  EXPECT_GE(addon::Msg().wlOpenTrade, 0xC000u);
}

}  // namespace
