// Texts and settings the views ask for, and the settings they store.
#include "hostview/MessageIds.h"
#include "terminal/host/HostCore.h"

namespace term {

void RegisterSettingRequests(RequestTable& table) {
  table.On({hm::TextByKey, hm::MessageText}, [](const Request& r) {
    const std::wstring text = r.data ? r.host.self->MessageText(*r.Data<std::string>()) : std::wstring();
    r.Answer(text);
  });
  table.On({hm::SystemParameter, hm::NoticeParameter}, [](const Request& r) {
    const std::string value = r.data ? r.host.user->settings.Get(*r.Data<std::string>()) : std::string();
    r.Answer(value);
  });
  table.On(hm::SaveSetting, [](const Request& r) {
    if (!r.data) return;
    const auto* s = r.Data<JSettingSave>();
    r.host.user->SaveViewSetting(s->key, s->value);
  });
  table.On(hm::DisplayMode,
           [](const Request& r) { r.AnswerWord(r.host.options.displayMode); });
  table.On(hm::AltStatus, [](const Request& r) {
    r.AnswerWord(r.host.user->settings.GetInt("ALTST", 0));
  });
}

}  // namespace term
