#include "terminal/store/SqliteSettingsStorage.h"

namespace term {

std::optional<std::string> SqliteSettingsStorage::Read(const std::string& key) const {
  const auto all = m_store.LoadSettings(kPrefix);
  const auto it = all.find(key);
  if (it == all.end()) return std::nullopt;
  return it->second;
}

bool SqliteSettingsStorage::Write(const std::string& key, const std::string& text) {
  // An empty text removes the group: it then reads back as "nothing stored".
  return m_store.SaveSetting(kPrefix + key, text);
}

}  // namespace term
