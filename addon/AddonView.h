#pragma once
// CAddonView: the base of the add-on's six views. It holds what every view
// does the same way on the host channel, so that a view only adds its own
// content:
//   - OnHostMessage dispatch: 1 -> OnDeactivate(), 2 -> OnActivate(), the
//     common answers below, everything else -> OnViewMessage(). A null data
//     word on a pointer-carrying message (addon::IsPointerMessage) and an
//     unknown number are dropped: they change nothing.
//   - synchronous questions: Ask<T>(message, data) sends a request and
//     returns the answer the host delivers before SendChildFeedback returns,
//     or nullopt when none came. The question helpers below (514/2814,
//     515/518, 519, 2310; InstrumentActions: 604; the single-instrument views:
//     550/551) all go through it. An answer that arrives outside a question
//     is handled as a notification: 514/2814 keep the last message text, 519
//     the display mode, 2310 the alternative-status flag; 515/518 name no key
//     and are dropped. Answer handlers only store; they never send.
//   - reference lists fill the process-wide stores whichever view receives
//     them: 500 instruments, 503 exchanges, 505 products, 601 market delays
//     (first row of the list). The view then sees the message in
//     OnViewMessage too (to reload its own lists).
//   - 528: stores the link-mode flag (0 or 1) and echoes it; other values are ignored.
//   - PrepareBasicData: log, then, the first time a view of this class runs it
//     in the process, the class's parameter requests and the requests for the
//     reference stores that are not loaded yet; log again.
//   - the message-text lookup ("%s, %I64d" key, 2814, per-view cache).
//   - logging through the process-wide logger registry under the class name.
//   - language texts (section 13), the title (101) and message boxes captioned
//     with the application title.
//   - instrument actions (Actions(): trade tickets, opening views, access and
//     exchange checks) and, for the views that turn them on, the six trade
//     shortcut keys (WatchTradeKeys, ShortcutTicket, OpenTradeTicket).
//
// A derived view:
//   class CMyViewAdv : public CAddonView {
//     ADDON_DECLARE_VIEW(CMyViewAdv)
//    public:
//     CMyViewAdv() : CAddonView(Info()) {}
//    protected:
//     void OnActivate() override { PrepareBasicData(); ... }  // logs this file and line
//     std::uint32_t OnViewMessage(UINT, LPARAM) override;
//   };
//   ADDON_IMPLEMENT_VIEW(CMyViewAdv)   // in the .cpp: the class descriptor
// and lists its Info() in addon/ViewClasses.cpp.
//
// Everything runs on the host's UI thread.
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <map>
#include <optional>
#include <source_location>
#include <string>
#include <vector>

#include "addon/Channel.h"
#include "addon/HostAnswer.h"
#include "addon/InstrumentActions.h"
#include "addon/Registries.h"
#include "addon/StoreStatus.h"
#include "addon/ViewClasses.h"
#include "hostview/MessageIds.h"
#include "hostview/SuperBaseView.h"
#include "platform/Platform.h"

class CAddonView : public CSuperBaseView, public platform::TimerHandler, public platform::MessageTarget {
  Q_OBJECT
 public:
  explicit CAddonView(const addon::ViewClassInfo& info, QWidget* parent = nullptr);
  ~CAddonView() override;

  const addon::ViewClassInfo& ClassInfo() const { return m_info; }
  std::wstring ClassNameW() const;

  // ---- Contract ----
  std::uint32_t OnHostMessage(UINT message, LPARAM data) override;
  void SetAppTitle(std::wstring title) override;
  // Default: sends the class title (language entry, else the default title).
  void ApplyLanguage() override;
  std::wstring GetTitle() override { return m_title; }
  void OnTimer(UINT id) override {}
  LRESULT OnWindowMessage(UINT message, WPARAM wParam, LPARAM lParam) override { return 0; }

  // ---- State the common handlers keep ----
  // The link-mode flag of 528 (gates 615 in the single-instrument views).
  bool LinkMode() const { return m_linkMode; }
  // Set by the answer 1 or 2 to request 2310, cleared by any other answer.
  bool UsesAltStatus() const { return m_useAltStatus; }
  // 1 or 101 once known, 0 before.
  int DisplayModeValue() const { return m_displayMode; }
  // The last text answered with 514 or 2814.
  const std::wstring& LastMessageText() const { return m_lastMessageText; }
  bool IsActive() const { return m_active; }

  // ---- Synchronous questions ----
  // Sends `message` with `data` and returns the answer the host delivers
  // while the request is inside SendChildFeedback: a message whose number is
  // in `answers` (default: `message` itself), its data word read as a T (see
  // addon/HostAnswer.h). nullopt when no answer came (or the word carried
  // none). When several answers come, the last counts. The answer is taken by
  // the question only: OnViewMessage does not see it. Questions may nest.
  template <class T>
  std::optional<T> Ask(UINT message, LPARAM data, std::initializer_list<UINT> answers = {}) {
    std::optional<T> answer;
    AskHost(message, data, answers, [&answer](LPARAM word) { answer = addon::HostAnswer<T>::Read(word); });
    return answer;
  }

  // The display text of a message code: key "<code>, <number>"; served from
  // this view's cache, else asked with 2814 (answered with 514 or 2814); the
  // key itself when the host has no text (not cached).
  std::wstring LookupMessageText(const std::string& code, std::int64_t number = 0);
  // Asks 514 with `key` and returns the answer (empty when none). Not cached.
  std::wstring RequestTextByKey(const std::string& key);
  // Asks 515 or 518 for `key`; the answer lands in SettingTextTable. Returns
  // whether an answer came.
  bool RequestSetting(UINT message, const std::string& key);
  // The display mode, asked with 519 only while no view of the process has
  // received 1 or 101. 0 when still unknown.
  int QueryDisplayMode();
  // Clears the alternative-status flag, asks 2310 and returns the flag.
  bool QueryAltStatus();

  // ---- Instrument actions ----
  addon::InstrumentActions& Actions() { return m_actions; }
  // A trade ticket (MSG_WLOPENTRADE and the shortcut keys). Default: the
  // shared path with no access check; the single-instrument views refuse an
  // instrument that is not tradeable first.
  virtual LRESULT OpenTradeTicket(const std::wstring* linkText, LPARAM origin);

  // ---- Helpers ----
  // This view's SendChildFeedback as a sender for the field batch helpers.
  addon::FeedbackSender Sender() {
    return [this](UINT message, LPARAM data) { SendChildFeedback(message, data); };
  }
  // A style bitmap path with every "[styleID]" replaced by the current style id.
  std::wstring StyleImagePath(std::wstring path) const;
  // Language text of section 13; empty without a language service.
  std::wstring LanguageText(int entry) const;
  // Stores `title` (GetTitle) and sends it with 101.
  void SendTitle(const std::wstring& title);
  // A message box captioned with the application title; returns the button id.
  int ShowMessage(const std::wstring& text, platform::Icon icon = platform::Icon::Exclamation,
                  platform::Buttons buttons = platform::Buttons::Ok);
  // The message text of `code` in a box with an exclamation icon.
  int ShowMessageText(const std::string& code, std::int64_t number = 0);
  // Logs "Info:<function> file:<file> line:<line>" under this view's class.
  void LogInfo(const char* function, const char* file, int line) const;
  // The same for the code that calls it: its qualified function name, its
  // source file name and its line.
  void LogHere(std::source_location where = std::source_location::current()) const;
  void LogLine(const char* format, ...) const __attribute__((format(printf, 2, 3)));
  // The log factory's logger registered under this view's class (once per view).
  void RegisterLogger();

  // Runs the start-up data steps (see the file comment). The log lines name
  // "<class>::PrepareBasicData" with the file and line of the call, so a view
  // calls it from its own source file.
  void PrepareBasicData(std::source_location where = std::source_location::current());
  // Whether the class's first PrepareBasicData has run in this process.
  static bool HasPreparedClass(const std::string& className);
  // Forgets the process-wide state of the base (classes prepared, the
  // display mode answered), as at load. For tests.
  static void ResetProcessState();

 protected:
  // Message 2 / 1. Defaults: PrepareBasicData, plus the active flag.
  virtual void OnActivate();
  virtual void OnDeactivate();
  // Every message the base does not handle, and the lists it filed. Default:
  // 0, nothing changes.
  virtual std::uint32_t OnViewMessage(UINT message, LPARAM data) { return 0; }
  // Sends the request 102 with a preferred size.
  void SendViewSize(int width, int height);
  void SetActiveFlag(bool active) { m_active = active; }

  // ---- Trade shortcut keys (off unless a view watches them) ----
  // Takes the six trade keys pressed in `widget` (the view itself, a grid, a
  // search box) before any other shortcut of the terminal. In a `textEntry`
  // widget the main-keyboard plus, equals and minus stay text; the keypad and
  // function keys still trade. A key is consumed whether or not a ticket
  // opens; a ticket opens only while the host's shortcut setting is on and
  // ShortcutTicket gives a text, with origin 99.
  void WatchTradeKeys(QWidget* widget, bool textEntry = false);
  // The JSON text of the ticket a shortcut opens; nullopt: none (no instrument).
  virtual std::optional<std::wstring> ShortcutTicket(addon::TradeSide side) { return std::nullopt; }
  // One key: true when it is a trade key and was consumed.
  bool HandleTradeKey(int key, Qt::KeyboardModifiers modifiers, bool inTextEntry = false);

  bool eventFilter(QObject* watched, QEvent* event) override;
  void keyPressEvent(QKeyEvent* e) override;

 private:
  struct Question;
  void AskHost(UINT message, LPARAM data, std::initializer_list<UINT> answers, std::function<void(LPARAM)> take);
  // Stores the lists every view files (500, 503, 505, 601).
  void FileList(UINT message, LPARAM data);

  const addon::ViewClassInfo& m_info;
  addon::InstrumentActions m_actions{*this};
  Question* m_question = nullptr;  // innermost question inside SendChildFeedback
  std::wstring m_title;
  std::wstring m_lastMessageText;
  std::map<std::string, std::wstring> m_messageTexts;  // lookup key -> text, only non-empty
  bool m_linkMode = false;
  bool m_useAltStatus = false;
  bool m_active = false;
  bool m_loggerRegistered = false;
  int m_displayMode = 0;
  // Trade keys: the widgets watched (true: a text entry).
  std::map<const QObject*, bool> m_tradeKeyWidgets;
  const QEvent* m_textKeyEvent = nullptr;  // a key typed into a search box, passed on
};

// The descriptor of a view class, in the host framework's style.
#define ADDON_DECLARE_VIEW(Class)                                                   \
 public:                                                                            \
  static const CRuntimeClass class##Class;                                          \
  const CRuntimeClass* GetRuntimeClass() const override { return &class##Class; }   \
  static const addon::ViewClassInfo& Info();                                        \
  static CSuperBaseView* CreateObject();                                            \
                                                                                    \
 private:

// The creation function never lets an exception reach the host: null instead.
#define ADDON_IMPLEMENT_VIEW(Class)                                                          \
  CSuperBaseView* Class::CreateObject() {                                                    \
    try {                                                                                    \
      return new Class;                                                                      \
    } catch (...) {                                                                          \
      return nullptr;                                                                        \
    }                                                                                        \
  }                                                                                          \
  const CRuntimeClass Class::class##Class{#Class, static_cast<int>(sizeof(Class)), 0xFFFF,   \
                                         &Class::CreateObject, &CSuperBaseView::classCSuperBaseView};
