// Price alerts: the list (701), create (702), change (703), delete (704), and
// 705, an alert handed to the new-alert view.
#include "hostview/MessageIds.h"
#include "terminal/host/HostCore.h"

namespace term {

void RegisterAlertRequests(RequestTable& table) {
  table.On(hm::Alert701, [](const Request& r) {
    const std::vector<PriceAlertItem> list = r.host.user->alerts->All();
    r.Answer(list);
  });
  table.On(hm::Alert702, [](const Request& r) {
    if (!r.data) return;
    PriceAlertItem item = *r.Data<PriceAlertItem>();
    if (item.productId < 0 || item.instrumentCode.empty()) {
      r.host.log->Warn("alert without an instrument refused");
      return;
    }
    const std::int32_t id = r.host.user->alerts->Create(item);
    r.host.log->Info("alert " + std::to_string(id) + " created for " + item.instrumentCode);
    r.host.AlertsChanged(hm::Alert702);
  });
  table.On(hm::Alert703, [](const Request& r) {
    if (!r.data) return;
    const PriceAlertItem& item = *r.Data<PriceAlertItem>();
    if (!r.host.user->alerts->Update(item)) {
      r.host.log->Warn("change of unknown alert " + std::to_string(item.alertId) + " ignored");
      return;
    }
    r.host.AlertsChanged(hm::Alert703);
  });
  table.On(hm::Alert704, [](const Request& r) {
    if (!r.data) return;
    const int n = r.host.user->alerts->Remove(*r.Data<std::vector<std::int32_t>>());
    if (n > 0) r.host.AlertsChanged(hm::Alert704);
  });
  table.On(hm::Alert705, [](const Request& r) {
    if (!r.data) return;
    // Goes to the new-alert view the requester just opened, else to any.
    PriceAlertItem item = *r.Data<PriceAlertItem>();
    ViewDirectory& views = r.host.views;
    const ViewDirectory::Entry* rec = views.Find(r.view);
    CSuperBaseView* target = rec ? rec->linkTarget.data() : nullptr;
    if (!target || !views.Live(target) || views.ClassNameOf(target) != kNewAlertView) {
      target = nullptr;
      for (CSuperBaseView* t : views.Of(kNewAlertView)) target = t;
    }
    if (target) views.Deliver(target, hm::Alert705, ToLParam(&item));
  });
}

}  // namespace term
