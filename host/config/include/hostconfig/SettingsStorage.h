#pragma once
// Where the user settings live. The terminal plugs in its own store; the
// settings object only reads and writes whole texts by key (one JSON text per
// setting group). Implementations are used on the UI thread only.
#include <map>
#include <optional>
#include <string>

#include "hostview/Types.h"

class HV_API ISettingsStorage {
 public:
  virtual ~ISettingsStorage();
  // The text stored under `key`; none when nothing is stored.
  virtual std::optional<std::string> Read(const std::string& key) const = 0;
  // Stores `text` under `key`; false when it could not be kept.
  virtual bool Write(const std::string& key, const std::string& text) = 0;
};

// Keeps the texts in memory for the life of the process (the default).
class HV_API CMemorySettingsStorage : public ISettingsStorage {
 public:
  std::optional<std::string> Read(const std::string& key) const override;
  bool Write(const std::string& key, const std::string& text) override;

 private:
  std::map<std::string, std::string> m_texts;
};

// Keeps the texts in one JSON file ({"key": "text", ...}). Every Write
// rewrites the file through a temporary file and a rename, so a crash never
// leaves half a file. A file that cannot be read as such JSON is moved aside
// to "<path>.corrupt" on the first Write instead of being overwritten.
class HV_API CJsonFileSettingsStorage : public ISettingsStorage {
 public:
  explicit CJsonFileSettingsStorage(std::string path);
  std::optional<std::string> Read(const std::string& key) const override;
  bool Write(const std::string& key, const std::string& text) override;
  const std::string& GetPath() const { return m_path; }
  // Why the file could not be loaded or written; empty when fine.
  const std::string& GetErrorInfo() const { return m_error; }

 private:
  std::string m_path;
  std::map<std::string, std::string> m_texts;
  bool m_corrupt = false;
  std::string m_error;
};
