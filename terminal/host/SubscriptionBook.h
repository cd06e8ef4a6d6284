#pragma once
// The field subscriptions of every view: 412 batches subscribe and are
// answered at once, 401 batches withdraw, 400 fetches are answered on the next
// pump. Each pump pushes (410) what the market changed, once per subscription
// and field, and only for fields the change can move.
#include <cstdint>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <tuple>
#include <unordered_map>
#include <utility>
#include <vector>

#include "hostview/Records.h"
#include "hostview/SuperBaseView.h"

namespace term {

class MarketSource;
class LogFactory;
class ViewDirectory;
struct HostStats;

class SubscriptionBook {
 public:
  SubscriptionBook(MarketSource& market, ViewDirectory& views, LogFactory& log, HostStats& stats);
  SubscriptionBook(const SubscriptionBook&) = delete;
  SubscriptionBook& operator=(const SubscriptionBook&) = delete;

  // 400, 401 or 412 from `view`. 401 and 412 collect until "PMP_Submit".
  void Handle(CSuperBaseView* view, UINT message, const FieldRequest& request);
  // After the market moved: submits 412 batches left without their end marker
  // (for `views` in that order), answers the 400 fetches, pushes changes.
  void Pump(const std::vector<CSuperBaseView*>& views);
  // Forgets everything of `view`.
  void Drop(CSuperBaseView* view);
  std::size_t Count() const { return index_.size(); }
  // Called just before each 410 reaches its view (measurements); may be empty.
  void SetPushObserver(std::function<void(CSuperBaseView*)> observer) { onPush_ = std::move(observer); }
  // Called in Pump with every change the market reported, before the pushes
  // (the changes of names and remarks go to the leading price view as 414).
  using ChangeObserver = std::function<void(const std::vector<std::pair<int, std::uint32_t>>&)>;
  void SetChangeObserver(ChangeObserver observer) { observer_ = std::move(observer); }
  // The market indexes of the instruments with a quote subscription (kind 0,
  // param 0) of any view, each once, in subscription order.
  std::vector<int> QuoteInstruments() const;

 private:
  struct Sub {
    CSuperBaseView* view = nullptr;
    int instrument = -1;
    std::int64_t productId = 0;
    std::string code, field;
    std::int32_t param = 0, kind = 0;
    std::vector<std::string> last;  // last value sent; one per level for depth
    std::uint32_t dependsOn = 0;    // market change bits that can move this value
    bool alive = true;
  };
  struct Fetch {
    CSuperBaseView* view;
    FieldRequest request;
  };
  struct Pending {
    std::vector<FieldRequest> subscribe, withdraw;
  };
  using Key = std::tuple<CSuperBaseView*, int, std::string, std::int32_t, std::int32_t>;
  using Answers = std::vector<std::pair<CSuperBaseView*, FieldUpdate>>;
  using Answered = std::set<std::tuple<int, std::string, std::int32_t, std::int32_t>>;

  static std::uint32_t DependsOn(const std::string& field, std::int32_t kind);
  int InstrumentOf(const FieldRequest& r) const;
  void Submit(CSuperBaseView* view);
  void Subscribe(CSuperBaseView* view, const FieldRequest& r, int idx, Answers& answers, Answered& answered);
  void Unsubscribe(CSuperBaseView* view, const FieldRequest& r);
  void Remove(std::size_t k);
  void AnswerFetches();
  void CollectPushes(Answers& out);
  void Deliver(Answers& list, UINT message);
  void Counted();

  MarketSource& market_;
  std::vector<std::string> column_;  // depth texts of one field
  ViewDirectory& views_;
  LogFactory& log_;
  HostStats& stats_;
  std::vector<Sub> subs_;
  std::vector<std::size_t> free_;
  std::map<Key, std::size_t> index_;
  std::unordered_map<int, std::vector<std::size_t>> byInstrument_;
  std::unordered_map<CSuperBaseView*, Pending> pending_;
  std::vector<Fetch> fetches_;
  std::function<void(CSuperBaseView*)> onPush_;
  std::set<std::pair<std::int64_t, std::string>> unknownLogged_;
  ChangeObserver observer_;
};

}  // namespace term
