#pragma once
// The scripted host: plays the terminal's side of the channel in tests.
//
//   mvtest::ScriptedHost host;                       // QApplication, virtual clock, recording dialogs
//   host.AnswerText("17001, 5", L"Exchange closed"); // synchronous answers the test fills
//   host.AnswerSetting(hm::SystemParameter, "MAXWL", "300");
//   host.AnswerValue(hm::DisplayMode, 101);
//   CSuperBaseView* v = host.Open("CMarketDepthAdv"); // dlopen + descriptor + services + Create + 2
//   host.Send(v, hm::LinkModeFlag, 1);                // feed a notification
//   host.RequestsOf(hm::LinkModeFlag)[0].value;       // read what the view sent, decoded
//   host.Advance(200);                                // virtual clock: fires due timers, delivers posts
//
// Views come from the add-on library named by the environment variable
// MV_ADDON (else <build>/lib next to the test folder), loaded with dlopen and
// GetBaseViewPointer as the terminal does.
// Each scripted host gets views from a fresh copy of the library, whose
// process-wide state (stores, registries, first-time flags) starts empty as in
// a new process; copies stay loaded for the life of the process. A test can
// also hand in a view it built itself (Adopt) to reach the add-on's internals.
#include <any>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "hostview/MessageIds.h"
#include "hostview/Records.h"
#include "hostview/SuperBaseView.h"
#include "mvtest/FakeServices.h"
#include "platform/Platform.h"

namespace mvtest {

// The add-on library: the copy of the current scripted host.
class AddonLibrary {
 public:
  // The current copy, loaded on first use.
  static AddonLibrary& Get();
  // The next Get loads a new copy of the library file (a new file, so that the
  // loader does not hand back the loaded one). Each scripted host calls it.
  static void StartFresh();
  bool Loaded() const { return m_entry != nullptr; }
  const std::string& Path() const { return m_path; }
  const std::string& Error() const { return m_error; }
  // GetBaseViewPointer of the library; null when not loaded.
  const CRuntimeClass* Find(const char* className) const;

 private:
  explicit AddonLibrary(int copy);
  using Entry = const CRuntimeClass* (*)(const char*);
  Entry m_entry = nullptr;
  std::string m_path;
  std::string m_error;
};

// A ViewLink as recorded: its texts copied.
struct RecordedLink {
  std::wstring className;
  std::int32_t flag = 0;
  std::int32_t reserved = 0;
  bool hasLink = false;
  std::wstring link;
};

// One SendChildFeedback, decoded by its number (see the data word
// conventions in addon/Channel.h).
struct Feedback {
  CSuperBaseView* view = nullptr;
  UINT message = 0;
  LPARAM data = 0;      // the raw word; pointers in it are dead after the call
  LPARAM value = 0;     // the word as a number (same as data)
  bool nullData = false;  // a pointer-carrying request came with null
  std::string text;     // narrow text: 514, 515, 518, 2814
  std::wstring wtext;   // wide text: 101, 206, 200 with a bare class name
  std::optional<FieldRequest> field;  // 400, 401, 412
  std::optional<RecordedLink> link;   // 200, 310
  std::optional<ViewSize> size;       // 102
  std::any extra;                     // from a decoder added with AddDecoder
};

class ScriptedHost : public IViewHost {
 public:
  ScriptedHost();
  ~ScriptedHost() override;
  ScriptedHost(const ScriptedHost&) = delete;
  ScriptedHost& operator=(const ScriptedHost&) = delete;

  // ---- Creating views ----
  // Through the add-on's descriptor: the services and start parameters are set
  // and the window created, as the terminal does; no activation yet. Null when
  // the name is not registered or the library did not load.
  CSuperBaseView* Create(const std::string& className, std::int64_t productId = -1,
                         const std::string& instrumentCode = {}, const StartParamMap& params = {});
  // Create, then notification 2.
  CSuperBaseView* Open(const std::string& className);
  // The terminal sequence for a view the test built; the host owns it from now.
  CSuperBaseView* Adopt(CSuperBaseView* view);
  // Deletes a view created or adopted here.
  void Destroy(CSuperBaseView* view);
  const std::vector<CSuperBaseView*>& Views() const { return m_views; }

  // ---- Feeding notifications ----
  std::uint32_t Send(CSuperBaseView* view, UINT message, LPARAM data = 0);
  std::uint32_t SendText(CSuperBaseView* view, UINT message, const std::wstring& text);
  std::uint32_t SendNarrow(CSuperBaseView* view, UINT message, const std::string& text);
  std::uint32_t SendField(CSuperBaseView* view, UINT message, const FieldUpdate& update);
  // 310 (or 615 when message says so) with a ViewLink carrying `linkText`.
  std::uint32_t SendLink(CSuperBaseView* view, const std::wstring& linkText, UINT message = hm::LinkData);

  // ---- What the views sent ----
  const std::vector<Feedback>& Requests() const { return m_requests; }
  std::vector<Feedback> RequestsOf(UINT message) const;
  std::vector<Feedback> RequestsFrom(const CSuperBaseView* view) const;
  std::vector<UINT> Messages() const;  // the numbers in order
  void ClearRequests() { m_requests.clear(); }
  // Decodes the data word of `message` into Feedback::extra (later records).
  void AddDecoder(UINT message, std::function<std::any(LPARAM)> decoder) { m_decoders[message] = std::move(decoder); }

  // ---- Synchronous answers ----
  // A text for a 514 or 2814 key, answered with `via` (0: the request's own number).
  void AnswerText(const std::string& key, std::wstring text, UINT via = 0);
  // Keys without a text: answered with an empty text (true) or not at all (false, default).
  void AnswerMissingTextsEmpty(bool on) { m_emptyForMissingText = on; }
  // The narrow answer to 515 or 518 for `key`.
  void AnswerSetting(UINT message, const std::string& key, std::string value);
  // A number answered to `message` (519, 2310, 604...).
  void AnswerValue(UINT message, LPARAM value);
  // Any other answer: `answer` sees the request and returns the word to
  // deliver with the same number, or nullopt to stay silent (550/551 with an
  // instrument pointer, 601 with a list...). The word must stay valid for the call.
  void AnswerWith(UINT message, std::function<std::optional<LPARAM>(const Feedback&)> answer);
  void ClearAnswers();

  // ---- Services and time ----
  FakeLanguage language;
  FakeStyleManager style;
  // Process-wide (the add-on's logger registry keeps pointers into it for the
  // life of the process, as into the terminal's); emptied by each new host.
  FakeLogFactory& logs;
  FakeMenuManager menus;
  std::wstring appTitle = L"Terminal";
  int styleId = 1;
  platform::VirtualClock& clock;
  platform::RecordingDialogService& dialogs;
  // Moves the virtual clock, then delivers posted window messages.
  void Advance(std::uint32_t ms);

  // IViewHost
  void OnChildFeedback(CSuperBaseView* view, UINT message, LPARAM data) override;
  bool IsPopview(const CSuperBaseView* view) const override { return popview; }
  bool popview = false;

 private:
  Feedback Decode(CSuperBaseView* view, UINT message, LPARAM data) const;
  void Wire(CSuperBaseView* view);

  std::vector<CSuperBaseView*> m_views;
  std::vector<Feedback> m_requests;
  std::map<UINT, std::function<std::any(LPARAM)>> m_decoders;
  struct TextAnswer {
    std::wstring text;
    UINT via;
  };
  std::map<std::string, TextAnswer> m_texts;
  bool m_emptyForMissingText = false;
  std::map<std::pair<UINT, std::string>, std::string> m_settings;
  std::map<UINT, LPARAM> m_values;
  std::map<UINT, std::function<std::optional<LPARAM>(const Feedback&)>> m_answers;
};

}  // namespace mvtest
