#pragma once
// The user settings (columns, font size, shortcuts, alert filter, order-number
// display) kept in the terminal's SQLite store under the "user." key prefix.
#include "hostconfig/SettingsStorage.h"
#include "terminal/store/Store.h"

namespace term {

class SqliteSettingsStorage : public ISettingsStorage {
 public:
  static constexpr const char* kPrefix = "user.";
  // `store` must outlive this object.
  explicit SqliteSettingsStorage(Store& store) : m_store(store) {}
  std::optional<std::string> Read(const std::string& key) const override;
  bool Write(const std::string& key, const std::string& text) override;

 private:
  Store& m_store;
};

}  // namespace term
