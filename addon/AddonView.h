#pragma once
// CAddonView: the base of the add-on's six views. It holds what every view
// does the same way on the host channel, so that a view only adds its own
// content:
//   - OnHostMessage dispatch: 1 -> OnDeactivate(), 2 -> OnActivate(), the
//     common answers below, everything else -> OnViewMessage(). A null data
//     word on a pointer-carrying message (addon::IsPointerMessage) and an
//     unknown number are dropped: they change nothing.
//   - answers the host gives synchronously while a request is inside
//     SendChildFeedback: 514/2814 (message text), 515/518 (parameter text into
//     SettingTextTable), 519 (display mode), 2310 (alternative status). These
//     handlers only store; they never send.
//   - 528: stores the link-mode flag (0 or 1) and echoes it; other values are ignored.
//   - PrepareBasicData: log, then, the first time a view of this class runs it
//     in the process, the class's parameter requests and the requests for the
//     reference stores that are not loaded yet; log again.
//   - the message-text lookup ("%s, %I64d" key, 2814, per-view cache).
//   - logging through the process-wide logger registry under the class name.
//   - language texts (section 13), the title (101) and message boxes captioned
//     with the application title.
//
// A derived view:
//   class CMyViewAdv : public CAddonView {
//     ADDON_DECLARE_VIEW(CMyViewAdv)
//    public:
//     CMyViewAdv() : CAddonView(Info()) {}
//    protected:
//     void OnActivate() override;                      // usually calls PrepareBasicData()
//     std::uint32_t OnViewMessage(UINT, LPARAM) override;
//   };
//   ADDON_IMPLEMENT_VIEW(CMyViewAdv)   // in the .cpp: the class descriptor
//
// Everything runs on the host's UI thread.
#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "addon/Channel.h"
#include "addon/Registries.h"
#include "addon/StoreStatus.h"
#include "hostview/MessageIds.h"
#include "hostview/SuperBaseView.h"
#include "platform/Platform.h"

namespace addon {

// One parameter request of a first PrepareBasicData: 515 or 518 with a key.
struct SettingRequest {
  UINT message = hm::SystemParameter;
  std::string key;
};

// What distinguishes one view class in the shared behaviour. A static object
// per class; the base keeps a reference.
struct ViewClassInfo {
  const char* className = "";       // as registered ("CMarketDepthAdv")
  const char* sourceFile = "";      // named in the PrepareBasicData log lines
  int titleEntry = 0;               // language entry (section 13) of the title; 0: none
  const wchar_t* defaultTitle = L"";  // the title when the language gives no text
  // Sent the first time a view of the class prepares its data, in this order:
  std::vector<SettingRequest> firstSettings;
  std::vector<RefStore> firstStores;  // each only when not loaded
};

}  // namespace addon

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

  // ---- Requests with synchronous answers ----
  // The display text of a message code: key "<code>, <number>"; served from
  // this view's cache, else asked with 2814; the key itself when the host has
  // no text (not cached).
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

  // ---- Helpers ----
  // This view's SendChildFeedback as a sender for the field batch helpers.
  addon::FeedbackSender Sender() {
    return [this](UINT message, LPARAM data) { SendChildFeedback(message, data); };
  }
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
  void LogLine(const char* format, ...) const __attribute__((format(printf, 2, 3)));
  // The log factory's logger registered under this view's class (once per view).
  void RegisterLogger();

  // Runs the start-up data steps (see the file comment).
  void PrepareBasicData();
  // Whether the class's first PrepareBasicData has run in this process.
  static bool HasPreparedClass(const std::string& className);

 protected:
  // Message 2 / 1. Defaults: PrepareBasicData, plus the active flag.
  virtual void OnActivate();
  virtual void OnDeactivate();
  // Every message the base does not handle. Default: 0, nothing changes.
  virtual std::uint32_t OnViewMessage(UINT message, LPARAM data) { return 0; }
  // Sends the request 102 with a preferred size.
  void SendViewSize(int width, int height);
  void SetActiveFlag(bool active) { m_active = active; }

 private:
  const addon::ViewClassInfo& m_info;
  std::wstring m_title;
  std::wstring m_lastMessageText;
  std::map<std::string, std::wstring> m_messageTexts;  // lookup key -> text, only non-empty
  std::string m_pendingSettingKey;  // key of the 515/518 inside SendChildFeedback
  bool m_settingAnswered = false;
  bool m_linkMode = false;
  bool m_useAltStatus = false;
  bool m_active = false;
  bool m_loggerRegistered = false;
  int m_displayMode = 0;
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
