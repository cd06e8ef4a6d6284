#include "terminal/host/ViewDirectory.h"

#include <QObject>

#include "hostview/MessageTrace.h"

namespace term {
namespace {

void AppendLength(std::string& out, std::size_t n) {
  while (n >= 0x80) {
    out.push_back(static_cast<char>((n & 0x7f) | 0x80));
    n >>= 7;
  }
  out.push_back(static_cast<char>(n));
}

}  // namespace

void ViewDirectory::Add(CSuperBaseView* view, std::string className, std::function<void()> onDestroyed) {
  Entry e;
  e.view = view;
  e.className = std::move(className);
  e.destroyed = QObject::connect(view, &QObject::destroyed, std::move(onDestroyed));
  entries_.push_back(std::move(e));
}

void ViewDirectory::Remove(CSuperBaseView* view) {
  for (auto it = entries_.begin(); it != entries_.end(); ++it) {
    if (it->view != view) continue;
    QObject::disconnect(it->destroyed);
    entries_.erase(it);
    break;
  }
  for (auto& e : entries_)
    if (e.linkTarget == view) e.linkTarget = nullptr;
}

void ViewDirectory::DisconnectAll() {
  for (auto& e : entries_) QObject::disconnect(e.destroyed);
}

ViewDirectory::Entry* ViewDirectory::Find(const CSuperBaseView* view) {
  for (auto& e : entries_)
    if (e.view == view) return &e;
  return nullptr;
}

bool ViewDirectory::Live(const CSuperBaseView* view) const {
  for (const auto& e : entries_)
    if (e.view == view) return true;
  return false;
}

std::string ViewDirectory::ClassNameOf(const CSuperBaseView* view) const {
  for (const auto& e : entries_)
    if (e.view == view) return e.className;
  return {};
}

std::vector<CSuperBaseView*> ViewDirectory::Of(const char* cls) const {
  std::vector<CSuperBaseView*> out;
  for (const auto& e : entries_)
    if (!cls || e.className == cls) out.push_back(e.view);
  return out;
}

std::uint32_t ViewDirectory::Deliver(CSuperBaseView* view, UINT message, LPARAM data) {
  if (!view) return 0;
  const Entry* e = Find(view);
  if (!e) return 0;
  if (trace_) {
    std::string frame;
    AppendLength(frame, e->className.size());
    frame += e->className;
    std::string bytes;
    hv::trace::Encode(message, data, bytes);
    AppendLength(frame, bytes.size());
    frame += bytes;
    trace_->write(frame.data(), static_cast<std::streamsize>(frame.size()));
  }
  return view->OnHostMessage(message, data);
}

void ViewDirectory::Broadcast(const std::vector<CSuperBaseView*>& targets, UINT message, LPARAM data,
                              CSuperBaseView* except) {
  for (CSuperBaseView* v : targets)
    if (v != except) Deliver(v, message, data);
}

}  // namespace term
