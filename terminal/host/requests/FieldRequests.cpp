// Field requests: 400 fetches, 401 withdrawals and 412 subscriptions.
#include "hostview/MessageIds.h"
#include "terminal/host/HostCore.h"

namespace term {

void RegisterFieldRequests(RequestTable& table) {
  table.On({hm::FetchFields, hm::WithdrawField, hm::RequestField}, [](const Request& r) {
    if (r.data) r.host.subscriptions->Handle(r.view, r.message, *r.Data<FieldRequest>());
  });
}

}  // namespace term
