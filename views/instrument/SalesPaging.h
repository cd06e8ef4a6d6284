#pragma once
// Background ("free time") fetching of an instrument's history pages.
//
// The live page (99998) holds the newest 100 trades; history page p holds the
// trades (p-1)*100+1 .. p*100. Every 10 s the view showing an instrument
// looks for the newest page that is still missing and, when no batch runs for
// the instrument, asks for it and up to six pages before it in one batch. A
// batch ends when every one of its pages has answered (finish) or after
// 120 s (cancel); either way the pages are withdrawn (401 "TIMESALES_DATA").
// At most one batch per instrument runs at a time, whichever view started it.
//
// UI thread only.
#include <cstdint>
#include <functional>
#include <map>
#include <string>

#include "addon/Channel.h"
#include "data/Keys.h"
#include "data/MarketStores.h"
#include "data/TradeTape.h"

namespace sales {

inline constexpr int kPagesBefore = 6;                // a batch is p-6 .. p
inline constexpr std::uint32_t kBatchTimeoutMs = 120000;
inline constexpr int kMinRowsForPaging = 101;         // a tape within the live page needs no history

// One batch in progress: pages first..last, started at `startTick`; the
// pages that answered since.
struct PageBatch {
  std::uint32_t startTick = 0;
  int first = 0;
  int last = 0;
  std::uint64_t answered = 0;  // bit (page - first)

  int PageCount() const { return last - first + 1; }
  int AnsweredCount() const;
};

// The batches of every instrument (process-wide).
class PageBatches {
 public:
  static PageBatches& Instance();

  const PageBatch* Find(const InstrumentKey& key) const;
  void Start(const InstrumentKey& key, int first, int last, std::uint32_t now);
  void Remove(const InstrumentKey& key);
  // A page's answer arrived: it counts for the instrument's running batch
  // when it is one of that batch's pages.
  void NoteAnswer(const InstrumentKey& key, int page);
  std::size_t Size() const { return m_batches.size(); }
  void Clear() { m_batches.clear(); }

 private:
  std::map<InstrumentKey, PageBatch> m_batches;
};

// The newest history page still missing, or 0 when there is none:
//   - none while the grid has fewer than 101 rows;
//   - none unless "PAGECOUNT" has a text and its whole number n is 1..999;
//   - for p from n down to 1: p is missing when its first trade is absent, or
//     when it lacks any trade up to the newest (`rows`); a present page above
//     998 ends the search; when every page is present there is none.
int NextMissingPage(const InstrumentKey& key, int rows, const SalesSummaryRecord* header, const TradeTape& tape);

// What a background step needs from its view.
struct PagingContext {
  int uid = 0;                      // the view's registration value (log lines)
  InstrumentKey key;
  int rows = 0;                     // the grid's row count
  std::uint32_t now = 0;
  addon::FeedbackSender send;       // the batch ends (401)
  std::function<void(const std::string&)> log;
  // Registers a page for the next refresh tick (SalesFeed's RegisterPage).
  std::function<void(const InstrumentKey&, int page, std::uint32_t now)> registerPage;
};

// Timer 3102 for one instrument: ends a finished or expired batch, then starts
// the next one when a page is missing. `header` is the instrument's header
// (null when it has none); the tape and batches are the process-wide ones
// unless given.
void BackgroundStep(const PagingContext& ctx, const SalesSummaryRecord* header,
                    const TradeTape& tape = TradeTape::Instance(), PageBatches& batches = PageBatches::Instance());

// The batch end of one page: 401 "TIMESALES_DATA" and 401 "PMP_Submit", kind 2, param = page.
void SendBatchEnd(const addon::FeedbackSender& send, const InstrumentKey& key, int page);

}  // namespace sales
