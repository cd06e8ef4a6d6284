#pragma once
// Process-wide text tables: the host's system parameters (answers to 515/518)
// and the language texts the views read by id. UI thread only; created on
// first use, live until the library is unloaded.
#include <map>
#include <string>
#include <string_view>

class ILanguage;

namespace addon {

// The language section every view reads its labels, headings and titles from.
inline constexpr int kLanguageSection = 13;

// System and notice parameters by five-letter key ("MAXWL", "WLNOT", ...).
class SettingTextTable {
 public:
  static SettingTextTable& Instance();

  // Replaces the text of `key` (an answer of the host).
  void Set(const std::string& key, std::wstring text);
  bool Has(const std::string& key) const { return m_texts.count(key) != 0; }
  // The stored text; empty when the key is absent.
  std::wstring Get(const std::string& key) const;
  // The text read as a decimal integer. `fallback` when the key is absent, the
  // text is not a whole decimal number (blanks around it are allowed), or the
  // number is not above 0. Read afresh on every call.
  int GetNumber(const std::string& key, int fallback) const;

  // The watchlist limits with their built-in defaults.
  int MaxWatchlistItems() const { return GetNumber("MAXWL", 500); }
  int MaxWatchlists() const { return GetNumber("MAXWT", 50); }

  void Clear() { m_texts.clear(); }

 private:
  std::map<std::string, std::wstring> m_texts;
};

// Display texts by numeric id (section 13 of the host's language table),
// refreshed when a view applies the language. Missing ids read as empty.
class LanguageTextTable {
 public:
  static LanguageTextTable& Instance();

  // Reads the entries [first, last] from `language` (nothing when null).
  void Load(const ILanguage* language, int first, int last);
  void Load(const ILanguage* language, std::initializer_list<int> ids);
  void Set(int id, std::wstring text) { m_texts[id] = std::move(text); }
  std::wstring Get(int id) const;

  void Clear() { m_texts.clear(); }

 private:
  std::map<int, std::wstring> m_texts;
};

}  // namespace addon
