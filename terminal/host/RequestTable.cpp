#include "terminal/host/RequestTable.h"

#include "terminal/host/HostCore.h"

#include <stdexcept>
#include <string>

namespace term {

void Request::AnswerWord(LPARAM word) const { host.views.Deliver(view, message, word); }

void RequestTable::On(UINT message, RequestHandler handler) {
  if (!handlers_.emplace(message, std::move(handler)).second)
    throw std::logic_error("request " + std::to_string(message) + " has two handlers");
}

void RequestTable::On(std::initializer_list<UINT> messages, const RequestHandler& handler) {
  for (UINT m : messages) On(m, handler);
}

void RequestTable::Acknowledge(std::initializer_list<UINT> messages) {
  for (UINT m : messages) On(m, [](const Request&) {});
}

const RequestHandler* RequestTable::Find(UINT message) const {
  auto it = handlers_.find(message);
  return it == handlers_.end() ? nullptr : &it->second;
}

}  // namespace term
