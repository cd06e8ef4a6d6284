#include "addon/TextTables.h"

#include <climits>
#include <cwctype>

#include "data/ProcessState.h"
#include "hostview/Services.h"

namespace addon {

SettingTextTable& SettingTextTable::Instance() {
  static SettingTextTable table;
  static const bool hook = mvd::OnResetForTests([] { table.Clear(); });
  (void)hook;
  return table;
}

void SettingTextTable::Set(const std::string& key, std::wstring text) { m_texts[key] = std::move(text); }

std::wstring SettingTextTable::Get(const std::string& key) const {
  auto it = m_texts.find(key);
  return it == m_texts.end() ? std::wstring() : it->second;
}

int SettingTextTable::GetNumber(const std::string& key, int fallback) const {
  auto it = m_texts.find(key);
  if (it == m_texts.end()) return fallback;
  const std::wstring& s = it->second;
  std::size_t i = 0, e = s.size();
  while (i < e && std::iswspace(static_cast<wint_t>(s[i]))) ++i;
  while (e > i && std::iswspace(static_cast<wint_t>(s[e - 1]))) --e;
  if (i < e && s[i] == L'+') ++i;
  if (i == e) return fallback;
  long long value = 0;
  for (; i < e; ++i) {
    if (s[i] < L'0' || s[i] > L'9') return fallback;
    value = value * 10 + (s[i] - L'0');
    if (value > INT_MAX) return fallback;
  }
  return value > 0 ? static_cast<int>(value) : fallback;
}

LanguageTextTable& LanguageTextTable::Instance() {
  static LanguageTextTable table;
  static const bool hook = mvd::OnResetForTests([] { table.Clear(); });
  (void)hook;
  return table;
}

void LanguageTextTable::Load(const ILanguage* language, int first, int last) {
  if (!language) return;
  for (int id = first; id <= last; ++id) m_texts[id] = language->GetText(kLanguageSection, id);
}

void LanguageTextTable::Load(const ILanguage* language, std::initializer_list<int> ids) {
  if (!language) return;
  for (int id : ids) m_texts[id] = language->GetText(kLanguageSection, id);
}

std::wstring LanguageTextTable::Get(int id) const {
  auto it = m_texts.find(id);
  return it == m_texts.end() ? std::wstring() : it->second;
}

}  // namespace addon
