#include "addon/LinkText.h"

#include <json/json.h>

#include <charconv>
#include <memory>

#include "hostview/Text.h"

namespace addon {

std::string JsonEscape(std::string_view text) {
  static constexpr char kHex[] = "0123456789abcdef";
  std::string out;
  out.reserve(text.size() + 8);
  for (const char ch : text) {
    const auto c = static_cast<unsigned char>(ch);
    switch (c) {
      case '"': out += "\\\""; break;
      case '\\': out += "\\\\"; break;
      case '\b': out += "\\b"; break;
      case '\f': out += "\\f"; break;
      case '\n': out += "\\n"; break;
      case '\r': out += "\\r"; break;
      case '\t': out += "\\t"; break;
      default:
        if (c < 0x20 || c == 0x7F) {
          out += "\\u00";
          out += kHex[c >> 4];
          out += kHex[c & 0xF];
        } else {
          out += ch;
        }
    }
  }
  return out;
}

LinkTextBuilder::LinkTextBuilder(std::string_view type) : m_type(JsonEscape(type)) {}
LinkTextBuilder::LinkTextBuilder(std::wstring_view type) : m_type(JsonEscape(hv::Narrow(type))) {}

LinkTextBuilder& LinkTextBuilder::Add(std::string_view key, std::string_view value) {
  if (!m_pairs.empty()) m_pairs += ',';
  m_pairs += '"';
  m_pairs += JsonEscape(key);
  m_pairs += "\":\"";
  m_pairs += JsonEscape(value);
  m_pairs += '"';
  return *this;
}

LinkTextBuilder& LinkTextBuilder::Add(std::string_view key, std::wstring_view value) {
  return Add(key, std::string_view(hv::Narrow(value)));
}

LinkTextBuilder& LinkTextBuilder::AddInt64(std::string_view key, std::int64_t value) {
  return Add(key, std::string_view(std::to_string(value)));
}

LinkTextBuilder& LinkTextBuilder::AddInt32(std::string_view key, std::int32_t value) {
  return Add(key, std::string_view(std::to_string(value)));
}

LinkTextBuilder& LinkTextBuilder::NextObject() {
  if (!m_objects.empty() || m_objectCount) m_objects += ',';
  m_objects += '{';
  m_objects += m_pairs;
  m_objects += '}';
  m_pairs.clear();
  ++m_objectCount;
  return *this;
}

std::string LinkTextBuilder::Narrow() const {
  std::string data = m_objects;
  if (!m_pairs.empty() || m_objectCount == 0) {
    if (m_objectCount) data += ',';
    data += '{';
    data += m_pairs;
    data += '}';
  }
  std::string out = "{\"type\":\"";
  out += m_type;
  out += "\",\"data\":[";
  out += data;
  out += "]}";
  return out;
}

std::wstring LinkTextBuilder::Wide() const { return hv::Widen(Narrow()); }

std::string LinkText::Get(const std::string& key) const {
  auto it = fields.find(key);
  return it == fields.end() ? std::string() : it->second;
}

std::wstring LinkText::GetWide(const std::string& key) const { return hv::Widen(Get(key)); }

std::optional<std::int64_t> LinkText::GetInt64(const std::string& key) const {
  auto it = fields.find(key);
  if (it == fields.end()) return std::nullopt;
  const std::string& s = it->second;
  std::size_t b = 0, e = s.size();
  while (b < e && (s[b] == ' ' || s[b] == '\t')) ++b;
  while (e > b && (s[e - 1] == ' ' || s[e - 1] == '\t')) --e;
  if (b < e && s[b] == '+') ++b;
  std::int64_t value = 0;
  const auto [ptr, ec] = std::from_chars(s.data() + b, s.data() + e, value);
  if (ec != std::errc() || ptr != s.data() + e || b == e) return std::nullopt;
  return value;
}

std::optional<LinkText> ReadLinkText(std::string_view utf8) {
  Json::CharReaderBuilder builder;
  builder["failIfExtra"] = true;
  builder["collectComments"] = false;
  std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
  Json::Value root;
  std::string errors;
  try {
    if (!reader->parse(utf8.data(), utf8.data() + utf8.size(), &root, &errors)) return std::nullopt;
    if (!root.isObject()) return std::nullopt;
    const Json::Value& data = root["data"];
    if (!data.isArray() || data.empty()) return std::nullopt;
    const Json::Value& first = data[0u];
    if (!first.isObject()) return std::nullopt;
    LinkText link;
    if (root["type"].isString()) link.type = root["type"].asString();
    for (const auto& name : first.getMemberNames()) {
      const Json::Value& v = first[name];
      if (v.isString() || v.isNumeric() || v.isBool()) link.fields[name] = v.asString();
    }
    return link;
  } catch (const std::exception&) {
    return std::nullopt;  // jsoncpp throws on deep nesting and the like: a bad text is ignored
  }
}

std::optional<LinkText> ReadLinkText(std::wstring_view text) { return ReadLinkText(std::string_view(hv::Narrow(text))); }

std::optional<LinkText> ReadLinkText(const ViewLink* link) {
  if (!link || !link->link) return std::nullopt;
  return ReadLinkText(std::wstring_view(*link->link));
}

}  // namespace addon
