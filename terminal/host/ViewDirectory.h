#pragma once
// The views the runtime hosts, in the order they arrived, with what the
// runtime remembers about each (class, activation, the view its last 200
// opened). Delivery goes only to views still listed: a view may close another
// from inside OnHostMessage.
#include <QMetaObject>
#include <QPointer>
#include <cstdint>
#include <functional>
#include <ostream>
#include <string>
#include <vector>

#include "hostview/SuperBaseView.h"

namespace term {

class ViewDirectory {
 public:
  struct Entry {
    CSuperBaseView* view = nullptr;
    std::string className;
    bool active = false;
    bool activatedOnce = false;
    // The view opened by this view's last 200, waiting for its 310 (or 705).
    QPointer<CSuperBaseView> linkTarget;
    std::wstring linkClass;
    bool linkPending = false;
    QMetaObject::Connection destroyed;
  };

  ViewDirectory() = default;
  ViewDirectory(const ViewDirectory&) = delete;
  ViewDirectory& operator=(const ViewDirectory&) = delete;

  // Lists `view`; `onDestroyed` runs when the view is deleted while listed.
  void Add(CSuperBaseView* view, std::string className, std::function<void()> onDestroyed);
  // Forgets `view` and every link pointing at it.
  void Remove(CSuperBaseView* view);
  // Stops watching every view for deletion (the runtime is going away).
  void DisconnectAll();

  // The entry of a listed view, else null. Invalid after Add or Remove: look
  // it up again after anything that may open or close a view.
  Entry* Find(const CSuperBaseView* view);
  bool Live(const CSuperBaseView* view) const;
  std::string ClassNameOf(const CSuperBaseView* view) const;
  // Views of class `cls` (every view when null), in arrival order.
  std::vector<CSuperBaseView*> Of(const char* cls) const;

  // OnHostMessage of a listed view; 0 for one that is not.
  std::uint32_t Deliver(CSuperBaseView* view, UINT message, LPARAM data);
  void Broadcast(const std::vector<CSuperBaseView*>& targets, UINT message, LPARAM data,
                 CSuperBaseView* except = nullptr);
  // Every later delivery is also written to `out` (null: none): per message the
  // view's class name and the message as hv::trace encodes it, each a length
  // (LEB128) and its bytes.
  void TraceTo(std::ostream* out) { trace_ = out; }

 private:
  std::vector<Entry> entries_;
  std::ostream* trace_ = nullptr;
};

}  // namespace term
