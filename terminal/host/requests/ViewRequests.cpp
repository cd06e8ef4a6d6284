// Requests about the views themselves: titles, sizes, opening another view and
// handing it the requester's link, the linked instrument, layout changes.
#include <QPointer>

#include "hostview/MessageIds.h"
#include "terminal/host/HostCore.h"

namespace term {

void RegisterViewRequests(RequestTable& table) {
  table.On(hm::Title, [](const Request& r) {
    if (r.data) r.host.shell->ViewTitleChanged(r.view, *r.Data<std::wstring>());
  });
  table.On({hm::ViewSizeRequest, hm::AlertFrameSize, hm::AlertFrameSize2}, [](const Request& r) {
    if (r.data) r.host.shell->ViewSizeRequested(r.view, r.Data<ViewSize>()->width, r.Data<ViewSize>()->height);
  });
  table.On(hm::OpenAlertForm, [](const Request& r) {
    if (!r.data) return;
    const auto* open = r.Data<ViewOpenRequest>();
    r.host.shell->OpenSizeRequested(open->className, open->width, open->height);
  });
  table.On(hm::OpenView, [](const Request& r) {
    if (!r.data) return;
    // Both forms start with the class name (a ViewLink's first member).
    const std::wstring cls = *r.Data<std::wstring>();
    QPointer<CSuperBaseView> target = r.host.shell->OpenView(cls, r.view);
    ViewDirectory::Entry* rec = r.host.views.Find(r.view);
    if (!rec) return;  // the shell may have closed the requester
    rec->linkTarget = target;
    rec->linkClass = cls;
    rec->linkPending = true;
  });
  table.On(hm::AlertSubmitted, [](const Request& r) { r.host.shell->AlertFormSubmitted(r.view); });
  table.On(hm::ShortcutContext, [](const Request& r) {
    if (r.data) r.host.shell->ShortcutContext(r.view, *r.Data<std::wstring>());
  });
  table.On(hm::LinkData, [](const Request& r) {
    if (!r.data) return;
    ViewDirectory::Entry* rec = r.host.views.Find(r.view);
    if (!rec) return;
    const auto* link = r.Data<ViewLink>();
    const std::wstring text = link->link ? *link->link : std::wstring();
    CSuperBaseView* target = rec->linkPending ? rec->linkTarget.data() : nullptr;
    const std::wstring cls = rec->linkPending ? rec->linkClass : link->className;
    rec->linkPending = false;
    if (target && r.host.views.Live(target)) {
      ViewLink copy;
      copy.className = cls;
      copy.flag = link->flag;
      copy.link = &text;
      r.host.views.Deliver(target, hm::LinkData, ToLParam(&copy));
    } else {
      r.host.shell->ForeignLink(cls, text, r.view);
    }
  });
  table.On(hm::LinkedInstrument, [](const Request& r) {
    // A view changed the linked instrument: the single-instrument views
    // follow (when their link flag is on), the terminal's own views and
    // foreign views through the shell.
    if (!r.data) return;
    const auto* link = r.Data<ViewLink>();
    const std::wstring text = link->link ? *link->link : std::wstring();
    for (CSuperBaseView* t : r.host.views.Of(nullptr))
      if (t != r.view && IsSingleInstrumentView(r.host.views.ClassNameOf(t)))
        r.host.views.Deliver(t, hm::LinkedInstrument, ToLParam(&text));
    if (!text.empty()) r.host.shell->InstrumentLinked(text, r.view);
    if (!link->className.empty()) r.host.shell->ForeignLink(link->className, text, r.view);
  });
  table.On(hm::CompactLayout, [](const Request& r) { r.host.shell->CompactLayoutChanged(r.view, r.data == 1); });
  table.On({hm::TabMoved2700, hm::TabMoved2701},
           [](const Request& r) { r.host.shell->TabMoved(r.view, r.message, r.data); });
  table.On(hm::SettingsChanged, [](const Request& r) { r.host.self->BroadcastSettingsChanged(r.view); });
  table.Acknowledge({hm::LinkModeFlag});
}

}  // namespace term
