#include "terminal/host/SubscriptionBook.h"

#include <algorithm>
#include <set>

#include "hostview/MessageIds.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/host/Services.h"
#include "terminal/host/TextUtil.h"
#include "terminal/host/SummaryPages.h"
#include "terminal/host/TradePages.h"
#include "terminal/host/ViewDirectory.h"
#include "terminal/host/MarketSource.h"
#include "terminal/sim/Market.h"

namespace term {

namespace {
int DepthLevels(std::int32_t param) { return std::clamp(param, 1, int(sim::Market::kDepthLevels)); }
}  // namespace

SubscriptionBook::SubscriptionBook(MarketSource& market, ViewDirectory& views, LogFactory& log, HostStats& stats)
    : market_(market), views_(views), log_(log), stats_(stats) {}

// Which market changes can move a field, so that a quote move does not
// re-format the day figures of every subscription.
std::uint32_t SubscriptionBook::DependsOn(const std::string& f, std::int32_t kind) {
  using M = MarketSource;
  if (kind == 1) return M::kBookChanged;
  if (kind == summary::kKind) return summary::ChangesThatMove(f);
  if (kind != 0) return M::kTradeChanged | M::kBookChanged;
  if (f == "BID" || f == "ASK" || f == "BVOL" || f == "SVOL" || f == "BUY" || f == "SELL" || f == "ORDS_BVOL" ||
      f == "ORDS_SVOL")
    return M::kBookChanged;
  if (f == "REMARKS") return M::kRemarksChanged;
  if (f == "INSTRNAME") return M::kNameChanged;
  if (f == "CLOSE" || f == "CFD_STATUS" || f == "DMA_STATUS" || f == "MONTH" || f == "YEAR")
    return 0;  // fixed for the session
  return M::kTradeChanged;
}

int SubscriptionBook::InstrumentOf(const FieldRequest& r) const { return market_.Find(r.productId, r.instrumentCode); }

void SubscriptionBook::Counted() { stats_.subscriptions = index_.size(); }

void SubscriptionBook::Handle(CSuperBaseView* v, UINT msg, const FieldRequest& r) {
  const bool submit = r.fieldName == "PMP_Submit";
  if (msg == hm::WithdrawField) {
    Pending& p = pending_[v];
    if (!submit) { p.withdraw.push_back(r); return; }
    std::vector<FieldRequest> batch;
    batch.swap(p.withdraw);
    for (const FieldRequest& w : batch) Unsubscribe(v, w);
    Counted();
    return;
  }
  if (msg == hm::RequestField) {
    if (!submit) { pending_[v].subscribe.push_back(r); return; }
    Submit(v);
    return;
  }
  // 400: fetch the listed fields; answered on the next pump, as a terminal that
  // asks its server would. Empty values are not answered (the views re-ask on
  // empty answers, which would otherwise loop).
  const std::string& names = r.fieldName;
  std::size_t start = 0;
  while (start <= names.size()) {
    const std::size_t comma = names.find(',', start);
    const std::string name = Trim(names.substr(start, comma == std::string::npos ? std::string::npos : comma - start));
    if (!name.empty() && name != "PMP_Submit") {
      FieldRequest one = r;
      one.fieldName = name;
      fetches_.push_back({v, std::move(one)});
    }
    if (comma == std::string::npos) break;
    start = comma + 1;
  }
}

void SubscriptionBook::Submit(CSuperBaseView* v) {
  auto it = pending_.find(v);
  if (it == pending_.end() || it->second.subscribe.empty()) return;
  std::vector<FieldRequest> batch;
  batch.swap(it->second.subscribe);
  Answers answers;
  Answered answered;
  for (const FieldRequest& r : batch) {
    const int idx = InstrumentOf(r);
    if (idx < 0) {
      // Once per instrument: a stale watchlist item would otherwise log on every batch.
      if (unknownLogged_.insert({r.productId, r.instrumentCode}).second)
        log_.Warn("field request for an unknown instrument " + std::to_string(r.productId) + "/" + r.instrumentCode);
      continue;
    }
    Subscribe(v, r, idx, answers, answered);
  }
  Counted();
  Deliver(answers, hm::RequestField);
}

void SubscriptionBook::Subscribe(CSuperBaseView* v, const FieldRequest& r, int idx, Answers& answers,
                                 Answered& answered) {
  const Key key{v, idx, r.fieldName, r.param, r.kind};
  std::size_t k;
  auto it = index_.find(key);
  if (it == index_.end()) {
    if (!free_.empty()) { k = free_.back(); free_.pop_back(); }
    else { k = subs_.size(); subs_.emplace_back(); }
    Sub& s = subs_[k];
    s = Sub{};
    s.view = v; s.instrument = idx; s.productId = r.productId; s.code = r.instrumentCode;
    s.field = r.fieldName; s.param = r.param; s.kind = r.kind;
    s.dependsOn = DependsOn(r.fieldName, r.kind);
    index_.emplace(key, k);
    byInstrument_[idx].push_back(k);
    market_.AddInterest(idx);
  } else {
    k = it->second;
  }
  // Answer with the current value, once per field of the batch.
  if (!answered.insert({idx, r.fieldName, r.param, r.kind}).second) return;
  Sub& s = subs_[k];
  if (s.kind == 1) {
    // Depth: one answer per level up to the requested count.
    const int levels = DepthLevels(s.param);
    market_.DepthField(idx, r.fieldName, levels, column_);
    s.last.assign(std::size_t(levels), std::string());
    for (int level = 1; level <= levels; ++level) {
      FieldUpdate u{r.productId, r.instrumentCode, r.fieldName, column_[std::size_t(level - 1)], level, 1};
      s.last[std::size_t(level - 1)] = u.value;
      answers.emplace_back(v, std::move(u));
    }
    return;
  }
  FieldUpdate u{r.productId, r.instrumentCode, r.fieldName, market_.FieldValue(idx, r.fieldName, r.param, r.kind),
                r.param, r.kind};
  s.last.assign(1, u.value);
  answers.emplace_back(v, std::move(u));
}

void SubscriptionBook::Unsubscribe(CSuperBaseView* v, const FieldRequest& r) {
  const int idx = InstrumentOf(r);
  if (idx < 0) return;
  auto it = byInstrument_.find(idx);
  if (it == byInstrument_.end()) return;
  const std::vector<std::size_t> list = it->second;
  for (std::size_t k : list) {
    const Sub& s = subs_[k];
    if (!s.alive || s.view != v) continue;
    bool match;
    if (r.fieldName == "TIMESALES_DATA") match = s.kind == 2 && s.param == r.param;  // a finished page fetch
    else if (r.kind == 0 || r.kind == 1) match = s.field == r.fieldName && (s.kind == 0 || s.kind == 1);
    else match = s.field == r.fieldName && s.kind == r.kind && s.param == r.param;
    if (match) Remove(k);
  }
}

void SubscriptionBook::Remove(std::size_t k) {
  Sub& s = subs_[k];
  if (!s.alive) return;
  index_.erase(Key{s.view, s.instrument, s.field, s.param, s.kind});
  auto& list = byInstrument_[s.instrument];
  list.erase(std::remove(list.begin(), list.end(), k), list.end());
  if (list.empty()) byInstrument_.erase(s.instrument);
  market_.RemoveInterest(s.instrument);
  s = Sub{};
  s.alive = false;
  free_.push_back(k);
}

void SubscriptionBook::Drop(CSuperBaseView* v) {
  for (std::size_t k = 0; k < subs_.size(); ++k)
    if (subs_[k].alive && subs_[k].view == v) Remove(k);
  fetches_.erase(std::remove_if(fetches_.begin(), fetches_.end(), [&](const Fetch& f) { return f.view == v; }),
                 fetches_.end());
  pending_.erase(v);
  Counted();
}

void SubscriptionBook::Pump(const std::vector<CSuperBaseView*>& views) {
  // Requests left open by a batch without its end marker count as submitted.
  for (CSuperBaseView* v : views)
    if (views_.Live(v)) Submit(v);
  AnswerFetches();
  // Changes since the last pump, one push per subscription and field.
  Answers pushes;
  CollectPushes(pushes);
  Deliver(pushes, hm::FieldValue);
}

void SubscriptionBook::AnswerFetches() {
  std::vector<Fetch> fetches;
  fetches.swap(fetches_);
  Answers answers;
  std::set<Key> seen;
  for (const auto& f : fetches) {
    const FieldRequest& r = f.request;
    const int idx = InstrumentOf(r);
    if (idx < 0 || !seen.insert({f.view, idx, r.fieldName, r.param, r.kind}).second) continue;
    if (r.kind == 1) {
      const int levels = DepthLevels(r.param);
      for (int level = 1; level <= levels; ++level) {
        std::string value = market_.FieldValue(idx, r.fieldName, level, 1);
        if (!value.empty())
          answers.emplace_back(f.view, FieldUpdate{r.productId, r.instrumentCode, r.fieldName, value, level, 1});
      }
      continue;
    }
    std::string value = market_.FieldValue(idx, r.fieldName, r.param, r.kind);
    if (value.empty()) continue;
    answers.emplace_back(f.view, FieldUpdate{r.productId, r.instrumentCode, r.fieldName, std::move(value), r.param, r.kind});
  }
  Deliver(answers, hm::RequestField);
}

void SubscriptionBook::CollectPushes(Answers& out) {
  const auto changed = market_.TakeChangedWithBits();
  if (observer_) observer_(changed);
  for (const auto& [idx, bits] : changed) {
    auto it = byInstrument_.find(idx);
    if (it == byInstrument_.end()) continue;
    for (std::size_t k : it->second) {
      Sub& s = subs_[k];
      if (!s.alive || !(s.dependsOn & bits)) continue;
      if (s.kind == 1) {
        const int levels = DepthLevels(s.param);
        market_.DepthField(idx, s.field, levels, column_);
        s.last.resize(std::size_t(levels));
        for (int level = 1; level <= levels; ++level) {
          std::string& value = column_[std::size_t(level - 1)];
          std::string& last = s.last[std::size_t(level - 1)];
          if (value == last) continue;
          last = value;
          out.emplace_back(s.view, FieldUpdate{s.productId, s.code, s.field, std::move(value), level, 1});
        }
        continue;
      }
      if (s.last.empty()) s.last.resize(1);
      // Full history pages of the tape never change: not formatted again. A
      // page sent with its last trade was complete then (the tape only grows),
      // which the text alone tells, whatever market source it came from.
      if (s.kind == 2 && s.param >= 1 && s.param <= 999 &&
          !tape::MayHaveMoved(s.field, s.param, tape::kPageSize * s.param, s.last[0]))
        continue;
      std::string value = market_.FieldValue(idx, s.field, s.param, s.kind);
      if (value == s.last[0]) continue;
      s.last[0] = value;
      out.emplace_back(s.view, FieldUpdate{s.productId, s.code, s.field, std::move(value), s.param, s.kind});
    }
  }
}

void SubscriptionBook::Deliver(Answers& list, UINT msg) {
  for (auto& [v, u] : list) {
    if (!views_.Live(v)) continue;
    if (msg == hm::FieldValue) {
      ++stats_.pushes;
      if (onPush_) onPush_(v);
    } else {
      ++stats_.answers;
    }
    views_.Deliver(v, msg, ToLParam(&u));
  }
}

std::vector<int> SubscriptionBook::QuoteInstruments() const {
  std::vector<int> out;
  std::set<int> seen;
  for (const Sub& s : subs_)
    if (s.alive && s.kind == 0 && s.param == 0 && seen.insert(s.instrument).second) out.push_back(s.instrument);
  return out;
}

}  // namespace term
