#pragma once
// What the windowing system offers the add-on beyond Qt: one clock, numbered
// timers per window, registered window messages, and one dialog service.
// Everything is called on the UI thread.
#include <QObject>
#include <QPoint>
#include <QString>
#include <QStringList>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "hostview/Types.h"

#define PLATFORM_API __attribute__((visibility("default")))

class QWidget;

namespace platform {

// ---- Clock ---------------------------------------------------------------
// Milliseconds since an arbitrary start; wraps at 2^32 like the terminal's tick
// count, so compare ticks by unsigned difference.
PLATFORM_API std::uint32_t TickCount();

// ---- Timers --------------------------------------------------------------
// A window that wants numbered timers implements this.
class PLATFORM_API TimerHandler {
 public:
  virtual ~TimerHandler();
  virtual void OnTimer(UINT id) = 0;
};

// Starts or restarts timer `id` of `window` (which must also be a TimerHandler)
// to fire every `ms` milliseconds. Timers die with the window.
PLATFORM_API void SetTimer(QObject* window, UINT id, UINT ms);
PLATFORM_API void KillTimer(QObject* window, UINT id);
PLATFORM_API bool HasTimer(QObject* window, UINT id);

// The virtual clock: installed by tests and the headless terminal before any
// timer is set. Advancing it fires every due timer in time order (ties in the
// order they were set); time does not move otherwise.
class PLATFORM_API VirtualClock {
 public:
  // Moves time forward by `ms`, firing due timers on the way.
  void Advance(std::uint32_t ms);
  std::uint32_t Now() const;
  // Sets the tick without firing timers (to test wrap-around, say).
  void SetNow(std::uint32_t tick);
};
// Installs the virtual clock (idempotent) and returns it.
PLATFORM_API VirtualClock& UseVirtualClock();
PLATFORM_API bool IsVirtualClock();

// ---- Registered window messages -----------------------------------------
// The same name gives the same number (0xC000 and up) for the whole process.
PLATFORM_API UINT RegisterWindowMessage(const std::string& name);

// A window that receives window messages implements this.
class PLATFORM_API MessageTarget {
 public:
  virtual ~MessageTarget();
  virtual LRESULT OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) = 0;
};
// Delivers at once; 0 when `target` is null or not a MessageTarget.
PLATFORM_API LRESULT SendMessage(QObject* target, UINT message, WPARAM wParam, LPARAM lParam);
// Queues for the event loop; dropped safely when the target is gone by then.
PLATFORM_API void PostMessage(QObject* target, UINT message, WPARAM wParam, LPARAM lParam);
// Delivers every queued post (tests and the headless terminal call this).
PLATFORM_API void ProcessPosted();

// ---- Dialog service -------------------------------------------------------
enum class Icon { None, Information, Warning, Exclamation, Error, Question };
enum class Buttons { Ok, OkCancel, YesNo, YesNoCancel };
enum DialogResult : int { IdOk = 1, IdCancel = 2, IdYes = 6, IdNo = 7 };

struct MenuItem {
  int id = 0;            // 0 with empty text: a separator
  QString text;
  bool checked = false;
  bool enabled = true;
  std::vector<MenuItem> children;  // a submenu when not empty
};

class PLATFORM_API DialogService {
 public:
  virtual ~DialogService();
  virtual int MessageBox(QWidget* parent, const QString& caption, const QString& text, Icon icon,
                         Buttons buttons) = 0;
  // Returns the chosen item's id, 0 when nothing was chosen.
  virtual int PopupMenu(QWidget* parent, const std::vector<MenuItem>& items, const QPoint& globalPos) = 0;
  virtual void SetClipboardText(const QString& text) = 0;
  virtual QString ClipboardText() = 0;
};

// The service in use (the Qt one unless another was installed).
PLATFORM_API DialogService& Dialogs();
// Installs `service` (owned from then on); null restores the Qt one.
PLATFORM_API void SetDialogService(std::unique_ptr<DialogService> service);

// A service that shows nothing: records every call and answers from a script.
// Tests and the headless terminal use it.
class PLATFORM_API RecordingDialogService : public DialogService {
 public:
  struct Shown {
    enum Kind { Box, Menu } kind = Box;
    QString caption, text;
    Icon icon = Icon::None;
    Buttons buttons = Buttons::Ok;
    std::vector<MenuItem> items;
  };
  int MessageBox(QWidget* parent, const QString& caption, const QString& text, Icon icon,
                 Buttons buttons) override;
  int PopupMenu(QWidget* parent, const std::vector<MenuItem>& items, const QPoint& globalPos) override;
  void SetClipboardText(const QString& text) override { clipboard = text; }
  QString ClipboardText() override { return clipboard; }

  std::vector<Shown> shown;
  std::vector<int> boxAnswers;   // answers in order; IdOk/IdYes when they run out
  std::vector<int> menuAnswers;  // chosen ids in order; 0 when they run out
  QString clipboard;
  std::function<void(const Shown&)> onShown;  // e.g. the headless terminal logs boxes
};

}  // namespace platform
