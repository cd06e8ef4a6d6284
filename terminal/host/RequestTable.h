#pragma once
// The runtime's dispatch: one handler per request number a view sends through
// SendChildFeedback.
//
// Adding a handler: put a file in terminal/host/requests/, say
// PageRequests.cpp, that defines
//     void term::RegisterPageRequests(RequestTable& table)
// (the name is "Register" + the file name) and registers its numbers there:
//     table.On(hm::SomeRequest, [](const Request& r) { r.Answer(...); });
// The build finds the file and calls its Register function when the runtime
// is created; nothing else changes. A number registered twice stops the
// runtime's construction (std::logic_error), so two files never both answer.
// Handlers reach the runtime's parts through `r.host` (terminal/host/HostCore.h).
#include <functional>
#include <initializer_list>
#include <unordered_map>

#include "hostview/Types.h"

class CSuperBaseView;

namespace term {

struct HostCore;

// One request as it arrived.
struct Request {
  HostCore& host;
  CSuperBaseView* view;  // the requester, known to the runtime
  UINT message;
  LPARAM data;           // what the data word points at depends on `message`

  template <class T>
  const T* Data() const { return FromLParam<const T>(data); }
  // Answers the requester with the same number; the data word points at `value`.
  template <class T>
  void Answer(const T& value) const { AnswerWord(ToLParam(&value)); }
  // Answers with a plain data word (a number, a flag).
  void AnswerWord(LPARAM word) const;
};

using RequestHandler = std::function<void(const Request&)>;

class RequestTable {
 public:
  // Throws std::logic_error when `message` already has a handler.
  void On(UINT message, RequestHandler handler);
  void On(std::initializer_list<UINT> messages, const RequestHandler& handler);
  // Requests the terminal takes without doing anything.
  void Acknowledge(std::initializer_list<UINT> messages);
  // Null when nothing handles `message`.
  const RequestHandler* Find(UINT message) const;
  std::size_t Size() const { return handlers_.size(); }

 private:
  std::unordered_map<UINT, RequestHandler> handlers_;
};

// Calls every Register<File> function of terminal/host/requests/ (generated).
void RegisterAllRequests(RequestTable& table);

}  // namespace term
