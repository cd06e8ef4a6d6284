#include "views/instrument/SalesPaging.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdio>

#include "data/ProcessState.h"
#include "hostview/Text.h"
#include "views/instrument/SalesFeed.h"

namespace sales {

int PageBatch::AnsweredCount() const { return std::popcount(answered); }

PageBatches& PageBatches::Instance() {
  static PageBatches batches;
  static const bool hook = mvd::OnResetForTests([] { batches.Clear(); });
  (void)hook;
  return batches;
}

const PageBatch* PageBatches::Find(const InstrumentKey& key) const {
  const auto it = m_batches.find(key);
  return it == m_batches.end() ? nullptr : &it->second;
}

void PageBatches::Start(const InstrumentKey& key, int first, int last, std::uint32_t now) {
  PageBatch batch;
  batch.startTick = now;
  batch.first = first;
  batch.last = last;
  m_batches[key] = batch;
}

void PageBatches::Remove(const InstrumentKey& key) { m_batches.erase(key); }

void PageBatches::NoteAnswer(const InstrumentKey& key, int page) {
  const auto it = m_batches.find(key);
  if (it == m_batches.end()) return;
  PageBatch& b = it->second;
  if (page < b.first || page > b.last) return;
  b.answered |= std::uint64_t{1} << (page - b.first);
}

int NextMissingPage(const InstrumentKey& key, int rows, const SalesSummaryRecord* header, const TradeTape& tape) {
  if (rows < kMinRowsForPaging || !header) return 0;
  const QuoteCell& count = (*header)[SalesSummaryLayout::PageCount];
  if (!count.filled || count.text.empty()) return 0;
  const double n = std::trunc(count.value);
  if (!(n >= 1 && n <= kMaxHistoryPage)) return 0;
  // The search ends at page 1: a tape whose every page is held has nothing
  // missing (a first trade number clamped at 1 never drops below it).
  for (int p = static_cast<int>(n); p >= 1; --p) {
    const std::int32_t first = mvd::FirstTradeOfPage(p);
    if (!tape.Has(key, first)) return p;
    // A page that lost trades in the middle (a gap in the live page) is
    // missing too, up to the newest trade the grid shows.
    if (rows >= first) {
      const std::int32_t last = std::min<std::int32_t>(rows, first + mvd::kTradesPerPage - 1);
      if (tape.CountRange(key, first, last) < last - first + 1) return p;
    }
    if (p > kMaxHistoryPage - 1) return 0;
  }
  return 0;
}

namespace {

std::string Format(const char* format, int uid, const std::string& code, int first, int last, int a = 0, int b = 0) {
  char buf[512];
  std::snprintf(buf, sizeof buf, format, uid, code.c_str(), first, last, a, b);
  return buf;
}

}  // namespace

void SendBatchEnd(const addon::FeedbackSender& send, const InstrumentKey& key, int page) {
  addon::SendWithdrawBatch(send, addon::FieldTarget{key.ProductID, hv::Narrow(key.InstrumentCode)},
                           {"TIMESALES_DATA"}, addon::BatchTag{kKind, page});
}

void BackgroundStep(const PagingContext& ctx, const SalesSummaryRecord* header, const TradeTape& tape,
                    PageBatches& batches) {
  if (ctx.key.InstrumentCode.empty()) return;
  const std::string code = hv::Narrow(ctx.key.InstrumentCode);
  auto log = [&](const std::string& line) {
    if (ctx.log) ctx.log(line);
  };
  if (const PageBatch* running = batches.Find(ctx.key)) {
    const PageBatch b = *running;
    const int answered = b.AnsweredCount();
    const bool finished = answered >= b.PageCount();
    const bool expired = static_cast<std::uint32_t>(ctx.now - b.startTick) > kBatchTimeoutMs;
    if (finished || expired) {
      if (ctx.send)
        for (int page = b.first; page <= b.last; ++page) SendBatchEnd(ctx.send, ctx.key, page);
      batches.Remove(ctx.key);
      if (finished)
        log(Format("(Uid:%d) : Code(%s) Page(%d-%d) free time subscibe finish.", ctx.uid, code, b.first, b.last));
      else
        log(Format("(Uid:%d) : Code(%s) Page(%d-%d) free time subscibe cancel(%d of %d).", ctx.uid, code, b.first,
                   b.last, answered, b.PageCount()));
    }
  }
  const int p = NextMissingPage(ctx.key, ctx.rows, header, tape);
  if (p <= 0 || batches.Find(ctx.key)) return;
  const int first = std::max(1, p - kPagesBefore);
  const int last = std::min(p, kMaxHistoryPage);
  if (ctx.registerPage)
    for (int page = last; page >= first; --page) ctx.registerPage(ctx.key, page, ctx.now);
  batches.Start(ctx.key, first, last, ctx.now);
  log(Format("(Uid:%d) : Code(%s) Page(%d-%d) free time subscibe start.", ctx.uid, code, first, last));
}

}  // namespace sales
