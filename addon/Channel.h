#pragma once
// The view side of the numbered channel: what the data word of each message
// carries, and the field subscription batches.
//
// Data word conventions (both directions, all on the UI thread):
//   - a narrow text travels as `const std::string*`, a wide text as
//     `const std::wstring*` (101, 206, 514, 515, 518, 2814 and their answers);
//   - a record travels as a pointer to it (FieldRequest, FieldUpdate, ViewLink,
//     ViewSize, lists); the sender owns it for the duration of the call;
//   - a small number travels in the word itself (519, 528, 529, 604 answer,
//     2310 answer, 300, the 0 of the list requests 500/503/505/610/521/522).
//   - 200 carries a ViewLink, or a `const std::wstring*` naming "CInsExpViewEx".
//     ViewLink starts with its class name, so a host may read the word as a
//     wide string first to tell the two apart.
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "hostview/MessageIds.h"
#include "hostview/Records.h"
#include "hostview/Types.h"

namespace addon {

// Sends one request; a view passes its SendChildFeedback, tests a recorder.
// The data word is only valid during the call.
using FeedbackSender = std::function<void(UINT message, LPARAM data)>;

// Host-to-view messages whose data word must point at something. A null word
// on any of them is dropped before a view sees it. 550/551 are not listed:
// there null is a valid answer ("no such instrument"). Views that own further
// pointer-carrying messages add them here.
bool IsPointerMessage(UINT message);

// The pseudo-field that closes a batch.
inline constexpr std::string_view kSubmitField = "PMP_Submit";

// Field sets, in the order they are sent.
namespace fields {
extern const std::vector<std::string> kQuote;         // price view, 18 quote fields
extern const std::vector<std::string> kDepth;         // depth view
extern const std::vector<std::string> kAlertShort;    // new-alert view, batch 1
extern const std::vector<std::string> kAlert;         // new-alert view, batches 2 and 3
extern const std::vector<std::string> kSalesHeader;   // time and sales header (param 99999)
extern const std::vector<std::string> kSummary;       // trade summary (param = page)
}  // namespace fields

// The instrument a batch is about.
struct FieldTarget {
  std::int64_t productId = 0;
  std::string instrumentCode;  // narrow (UTF-8)
};

// kind and param of one batch.
struct BatchTag {
  std::int32_t kind = 0;
  std::int32_t param = 0;
};

// Batch 1: 401 for every field, then 401 "PMP_Submit".
void SendWithdrawBatch(const FeedbackSender& send, const FieldTarget& target,
                       const std::vector<std::string>& names, BatchTag tag = {});
// Batch 2: 412 for every field (no end marker), then one 400 whose field name
// joins the same names with "," in the same order.
void SendFetchBatch(const FeedbackSender& send, const FieldTarget& target,
                    const std::vector<std::string>& names, BatchTag tag = {});
// Batch 3 (and the request batches of the paged views): 412 for every field,
// then 412 "PMP_Submit".
void SendRequestBatch(const FeedbackSender& send, const FieldTarget& target,
                      const std::vector<std::string>& names, BatchTag tag = {});
// 412 for every field, no end marker (the paged views' page requests).
void SendRequests(const FeedbackSender& send, const FieldTarget& target,
                  const std::vector<std::string>& names, BatchTag tag = {});

// The three batches for an instrument that has just entered a view's interest.
struct InterestBatches {
  std::vector<std::string> withdrawNames;  // batch 1 (the new-alert view's is shorter)
  std::vector<std::string> names;          // batches 2 and 3
  BatchTag withdrawTag;                    // batch 1
  BatchTag fetchTag;                       // batch 2
  BatchTag requestTag;                     // batch 3 (depth: kind 1, param = level count)
};
void SendInterestBatches(const FeedbackSender& send, const FieldTarget& target, const InterestBatches& batches);

// The common variants.
InterestBatches QuoteInterest();                          // price view
InterestBatches DepthInterest(std::int32_t levelCount);   // depth view
InterestBatches AlertInterest();                          // new-alert view

// Names joined with "," (the field name of a 400).
std::string JoinFieldNames(const std::vector<std::string>& names);

}  // namespace addon
