#include "platform/Platform.h"

#include <QApplication>
#include <QClipboard>
#include <QCoreApplication>
#include <QElapsedTimer>
#include <QMenu>
#include <QMessageBox>
#include <QPointer>
#include <QTimer>
#include <map>
#include <mutex>
#include <unordered_map>

namespace platform {

TimerHandler::~TimerHandler() = default;
MessageTarget::~MessageTarget() = default;
DialogService::~DialogService() = default;

namespace {

struct ClockState {
  bool isVirtual = false;
  std::uint64_t virtualNow = 0;  // 64-bit inside; the tick count is its low 32 bits
  QElapsedTimer elapsed;
};
ClockState& Clock() {
  static ClockState state;
  return state;
}

struct TimerEntry {
  QPointer<QObject> window;
  TimerHandler* handler = nullptr;
  UINT id = 0;
  UINT interval = 0;
  std::uint64_t due = 0;  // virtual mode
  std::uint64_t seq = 0;  // set order, breaks ties between equal due times
  QTimer* timer = nullptr;  // real mode; a child of the window
};

struct TimerKey {
  QObject* window;
  UINT id;
  bool operator<(const TimerKey& o) const { return window != o.window ? window < o.window : id < o.id; }
};

struct Timers {
  std::map<TimerKey, TimerEntry> entries;
  std::map<QObject*, QMetaObject::Connection> watched;
  std::uint64_t nextSeq = 0;
};
Timers& TimerState() {
  static Timers t;
  return t;
}

void Forget(QObject* window) {
  auto& t = TimerState();
  for (auto it = t.entries.begin(); it != t.entries.end();) {
    if (it->first.window == window) it = t.entries.erase(it); else ++it;
  }
  t.watched.erase(window);
}

}  // namespace

std::uint32_t TickCount() {
  auto& c = Clock();
  if (c.isVirtual) return static_cast<std::uint32_t>(c.virtualNow);
  if (!c.elapsed.isValid()) c.elapsed.start();
  return static_cast<std::uint32_t>(c.elapsed.elapsed());
}

VirtualClock& UseVirtualClock() {
  static VirtualClock clock;
  Clock().isVirtual = true;
  return clock;
}

bool IsVirtualClock() { return Clock().isVirtual; }

std::uint32_t VirtualClock::Now() const { return static_cast<std::uint32_t>(Clock().virtualNow); }

void VirtualClock::SetNow(std::uint32_t tick) {
  auto& c = Clock();
  const std::uint64_t base = c.virtualNow & ~std::uint64_t{0xFFFFFFFFu};
  const std::uint64_t next = base | tick;
  // Keep pending timers at the same distance from now.
  const std::int64_t shift = static_cast<std::int64_t>(next) - static_cast<std::int64_t>(c.virtualNow);
  for (auto& [key, e] : TimerState().entries) e.due = static_cast<std::uint64_t>(static_cast<std::int64_t>(e.due) + shift);
  c.virtualNow = next;
}

void VirtualClock::Advance(std::uint32_t ms) {
  auto& c = Clock();
  const std::uint64_t target = c.virtualNow + ms;
  auto& t = TimerState();
  for (;;) {
    const TimerEntry* next = nullptr;
    TimerKey nextKey{nullptr, 0};
    for (const auto& [key, e] : t.entries) {
      if (e.due > target || !e.window) continue;
      if (!next || e.due < next->due || (e.due == next->due && e.seq < next->seq)) { next = &e; nextKey = key; }
    }
    if (!next) break;
    c.virtualNow = next->due;
    TimerHandler* handler = next->handler;
    auto it = t.entries.find(nextKey);
    it->second.due += std::max<UINT>(1, it->second.interval);
    it->second.seq = t.nextSeq++;
    // The handler may kill or set timers or destroy windows: nothing above is used after this.
    handler->OnTimer(nextKey.id);
  }
  c.virtualNow = target;
}

void SetTimer(QObject* window, UINT id, UINT ms) {
  auto* handler = dynamic_cast<TimerHandler*>(window);
  if (!window || !handler) return;
  auto& t = TimerState();
  const TimerKey key{window, id};
  auto& e = t.entries[key];
  e.window = window;
  e.handler = handler;
  e.id = id;
  e.interval = ms;
  e.seq = t.nextSeq++;
  if (!t.watched.count(window))
    t.watched[window] = QObject::connect(window, &QObject::destroyed, [window] { Forget(window); });
  if (Clock().isVirtual) {
    e.due = Clock().virtualNow + std::max<UINT>(1, ms);
    if (e.timer) { delete e.timer; e.timer = nullptr; }
    return;
  }
  if (!e.timer) {
    e.timer = new QTimer(window);
    QObject::connect(e.timer, &QTimer::timeout, window, [handler, id] { handler->OnTimer(id); });
  }
  e.timer->start(static_cast<int>(ms));
}

void KillTimer(QObject* window, UINT id) {
  auto& t = TimerState();
  auto it = t.entries.find(TimerKey{window, id});
  if (it == t.entries.end()) return;
  if (it->second.timer) it->second.timer->deleteLater();
  t.entries.erase(it);
}

bool HasTimer(QObject* window, UINT id) { return TimerState().entries.count(TimerKey{window, id}) != 0; }

UINT RegisterWindowMessage(const std::string& name) {
  static std::mutex lock;
  static std::unordered_map<std::string, UINT> names;
  std::lock_guard<std::mutex> guard(lock);
  auto it = names.find(name);
  if (it != names.end()) return it->second;
  const UINT value = 0xC000u + static_cast<UINT>(names.size());
  names.emplace(name, value);
  return value;
}

LRESULT SendMessage(QObject* target, UINT message, WPARAM wParam, LPARAM lParam) {
  auto* receiver = dynamic_cast<MessageTarget*>(target);
  return receiver ? receiver->OnWindowMessage(message, wParam, lParam) : 0;
}

void PostMessage(QObject* target, UINT message, WPARAM wParam, LPARAM lParam) {
  if (!target) return;
  // Qt drops a queued call whose context object has been destroyed.
  QMetaObject::invokeMethod(
      target, [target, message, wParam, lParam] { SendMessage(target, message, wParam, lParam); },
      Qt::QueuedConnection);
}

void ProcessPosted() { QCoreApplication::sendPostedEvents(nullptr, QEvent::MetaCall); }

// ---- Dialogs ---------------------------------------------------------------
namespace {

class QtDialogService : public DialogService {
 public:
  int MessageBox(QWidget* parent, const QString& caption, const QString& text, Icon icon,
                 Buttons buttons) override {
    QMessageBox box(parent);
    box.setWindowTitle(caption);
    box.setText(text);
    switch (icon) {
      case Icon::Information: box.setIcon(QMessageBox::Information); break;
      case Icon::Warning:
      case Icon::Exclamation: box.setIcon(QMessageBox::Warning); break;
      case Icon::Error: box.setIcon(QMessageBox::Critical); break;
      case Icon::Question: box.setIcon(QMessageBox::Question); break;
      case Icon::None: break;
    }
    switch (buttons) {
      case Buttons::Ok: box.setStandardButtons(QMessageBox::Ok); break;
      case Buttons::OkCancel: box.setStandardButtons(QMessageBox::Ok | QMessageBox::Cancel); break;
      case Buttons::YesNo: box.setStandardButtons(QMessageBox::Yes | QMessageBox::No); break;
      case Buttons::YesNoCancel:
        box.setStandardButtons(QMessageBox::Yes | QMessageBox::No | QMessageBox::Cancel);
        break;
    }
    switch (box.exec()) {
      case QMessageBox::Ok: return IdOk;
      case QMessageBox::Yes: return IdYes;
      case QMessageBox::No: return IdNo;
      default: return IdCancel;
    }
  }

  static void Fill(QMenu& menu, const std::vector<MenuItem>& items) {
    for (const auto& item : items) {
      if (!item.children.empty()) {
        QMenu* sub = menu.addMenu(item.text);
        sub->setEnabled(item.enabled);
        Fill(*sub, item.children);
      } else if (item.id == 0 && item.text.isEmpty()) {
        menu.addSeparator();
      } else {
        QAction* a = menu.addAction(item.text);
        a->setData(item.id);
        a->setEnabled(item.enabled);
        a->setCheckable(item.checked);
        a->setChecked(item.checked);
      }
    }
  }

  int PopupMenu(QWidget* parent, const std::vector<MenuItem>& items, const QPoint& globalPos) override {
    QMenu menu(parent);
    Fill(menu, items);
    QAction* chosen = menu.exec(globalPos);
    return chosen ? chosen->data().toInt() : 0;
  }

  void SetClipboardText(const QString& text) override {
    if (auto* cb = QGuiApplication::clipboard()) cb->setText(text);
  }
  QString ClipboardText() override {
    auto* cb = QGuiApplication::clipboard();
    return cb ? cb->text() : QString();
  }
};

std::unique_ptr<DialogService>& Installed() {
  static std::unique_ptr<DialogService> service;
  return service;
}

}  // namespace

DialogService& Dialogs() {
  auto& s = Installed();
  if (!s) s = std::make_unique<QtDialogService>();
  return *s;
}

void SetDialogService(std::unique_ptr<DialogService> service) { Installed() = std::move(service); }

int RecordingDialogService::MessageBox(QWidget*, const QString& caption, const QString& text, Icon icon,
                                       Buttons buttons) {
  Shown s;
  s.kind = Shown::Box;
  s.caption = caption;
  s.text = text;
  s.icon = icon;
  s.buttons = buttons;
  shown.push_back(s);
  if (onShown) onShown(s);
  if (!boxAnswers.empty()) {
    const int a = boxAnswers.front();
    boxAnswers.erase(boxAnswers.begin());
    return a;
  }
  return (buttons == Buttons::YesNo || buttons == Buttons::YesNoCancel) ? IdYes : IdOk;
}

int RecordingDialogService::PopupMenu(QWidget*, const std::vector<MenuItem>& items, const QPoint&) {
  Shown s;
  s.kind = Shown::Menu;
  s.items = items;
  shown.push_back(s);
  if (onShown) onShown(s);
  if (!menuAnswers.empty()) {
    const int a = menuAnswers.front();
    menuAnswers.erase(menuAnswers.begin());
    return a;
  }
  return 0;
}

}  // namespace platform
