#include "hostconfig/SettingsStorage.h"

#include <json/json.h>

#include <cstdio>
#include <fstream>
#include <sstream>

ISettingsStorage::~ISettingsStorage() = default;

std::optional<std::string> CMemorySettingsStorage::Read(const std::string& key) const {
  auto it = m_texts.find(key);
  if (it == m_texts.end()) return std::nullopt;
  return it->second;
}

bool CMemorySettingsStorage::Write(const std::string& key, const std::string& text) {
  m_texts[key] = text;
  return true;
}

CJsonFileSettingsStorage::CJsonFileSettingsStorage(std::string path) : m_path(std::move(path)) {
  std::ifstream in(m_path, std::ios::binary);
  if (!in) return;  // no file yet: nothing stored
  std::stringstream buffer;
  buffer << in.rdbuf();
  const std::string content = buffer.str();
  Json::CharReaderBuilder builder;
  Json::Value root;
  std::string errors;
  std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
  if (!reader->parse(content.data(), content.data() + content.size(), &root, &errors) || !root.isObject()) {
    m_corrupt = true;
    m_error = "settings file " + m_path + " is not readable: " + (errors.empty() ? "not a JSON object" : errors);
    return;
  }
  for (const std::string& key : root.getMemberNames()) {
    const Json::Value& v = root[key];
    if (v.isString()) m_texts[key] = v.asString();
  }
}

std::optional<std::string> CJsonFileSettingsStorage::Read(const std::string& key) const {
  auto it = m_texts.find(key);
  if (it == m_texts.end()) return std::nullopt;
  return it->second;
}

bool CJsonFileSettingsStorage::Write(const std::string& key, const std::string& text) {
  if (m_corrupt) {
    // Keep what the user had: the unreadable file goes aside, not away.
    const std::string aside = m_path + ".corrupt";
    std::remove(aside.c_str());
    if (std::rename(m_path.c_str(), aside.c_str()) != 0) {
      m_error = "cannot move unreadable settings file " + m_path + " aside";
      return false;
    }
    m_corrupt = false;
  }
  auto previous = m_texts.find(key);
  const std::optional<std::string> old =
      previous == m_texts.end() ? std::nullopt : std::optional<std::string>(previous->second);
  m_texts[key] = text;

  Json::Value root(Json::objectValue);
  for (const auto& [k, v] : m_texts) root[k] = v;
  Json::StreamWriterBuilder writer;
  writer["indentation"] = "  ";
  const std::string content = Json::writeString(writer, root);
  const std::string temp = m_path + ".tmp";
  bool ok = false;
  {
    std::ofstream out(temp, std::ios::binary | std::ios::trunc);
    out << content;
    out.flush();
    ok = static_cast<bool>(out);
  }
  if (ok) ok = std::rename(temp.c_str(), m_path.c_str()) == 0;
  if (!ok) {
    std::remove(temp.c_str());
    if (old) m_texts[key] = *old;
    else m_texts.erase(key);
    m_error = "cannot write settings file " + m_path;
    return false;
  }
  m_error.clear();
  return true;
}
