#include "hostconfig/UserSettings.h"

#include <json/json.h>

#include <algorithm>
#include <array>
#include <limits>

#include "hostview/Services.h"
#include "hostview/Text.h"

namespace {

struct BuiltInColumn {
  const char* key;
  int columnId;
  int textId;
  int width;
  bool visible;
};

// Default display order of the quote grid.
constexpr std::array<BuiltInColumn, 27> kColumns{{
    {"colIcon", 1, 112, 30, true},       {"colLink", 2, 113, 30, true},
    {"colSymbol", 3, 101, 70, true},     {"colName", 4, 102, 200, true},
    {"colArrow", 6, 124, 30, true},      {"colRem", 5, 103, 70, true},
    {"colExchange", 7, 104, 70, true},   {"colLast", 8, 106, 70, true},
    {"colChange", 9, 107, 70, true},     {"colPerChange", 10, 114, 70, true},
    {"colBid", 11, 108, 70, true},       {"colAsk", 12, 109, 70, true},
    {"colBuyVol", 13, 110, 80, true},    {"colSellVol", 14, 111, 80, true},
    {"colTotVol", 15, 115, 90, true},    {"colOpen", 16, 116, 70, true},
    {"colHigh", 17, 117, 70, true},      {"colLow", 18, 118, 70, true},
    {"colPrevClose", 19, 119, 70, true}, {"colCurrency", 20, 120, 60, false},
    {"colLS", 21, 121, 40, false},       {"colTAC", 22, 122, 60, false},
    {"colCFD", 23, 123, 50, false},      {"colDMA", 24, 126, 50, false},
    {"colDelay", 25, 125, 70, false},    {"colMonth", 26, 127, 50, false},
    {"colYear", 27, 128, 50, false},
}};

constexpr int kFontPoints[] = {8, 9, 11, 13};
constexpr const wchar_t* kFontNames[] = {L"Small", L"Medium", L"Large", L"Extra Large"};
constexpr int kFontNameSection = 30;
constexpr int kHeaderSection = 13;

ColumnSettingItem ToItem(const BuiltInColumn& c) {
  ColumnSettingItem item;
  item.key = c.key;
  item.width = c.width;
  item.visible = c.visible;
  item.columnId = c.columnId;
  item.textId = c.textId;
  return item;
}

bool Parse(const std::string& text, Json::Value& root, std::string* error) {
  Json::CharReaderBuilder builder;
  std::string errors;
  std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
  if (!reader->parse(text.data(), text.data() + text.size(), &root, &errors)) {
    if (error) *error = errors;
    return false;
  }
  if (!root.isObject()) {
    if (error) *error = "not a JSON object";
    return false;
  }
  return true;
}

std::string Write(const Json::Value& root) {
  Json::StreamWriterBuilder writer;
  writer["indentation"] = "";
  return Json::writeString(writer, root);
}

bool IsInt32(const Json::Value& v) { return v.isInt(); }

bool Fail(std::string* error, const std::string& why) {
  if (error) *error = why;
  return false;
}

}  // namespace

// ---- CWatchlistSetting ----

CWatchlistSetting::CWatchlistSetting() {
  ColumnSettingInfo layout;
  layout.id = 1;
  layout.name = L"Default";
  for (const auto& c : kColumns) layout.items.push_back(ToItem(c));
  m_layouts.push_back(std::move(layout));
  m_widxCol = DefaultWIDXCol();
  m_fontItems.assign(std::begin(kFontNames), std::end(kFontNames));
}

bool CWatchlistSetting::GetSettingInfo(std::int32_t id, ColumnSettingInfo& info) const {
  for (const auto& l : m_layouts)
    if (l.id == id) { info = l; return true; }
  return false;
}

void CWatchlistSetting::SetSettingInfo(std::int32_t id, const ColumnSettingInfo& info) {
  ColumnSettingInfo copy = info;
  copy.id = id;
  for (auto& l : m_layouts)
    if (l.id == id) { l = std::move(copy); return; }
  m_layouts.push_back(std::move(copy));
}

bool CWatchlistSetting::RemoveSettingInfo(std::int32_t id) {
  auto it = std::find_if(m_layouts.begin(), m_layouts.end(), [id](const auto& l) { return l.id == id; });
  if (it == m_layouts.end()) return false;
  m_layouts.erase(it);
  return true;
}

std::vector<ColumnSettingItem> CWatchlistSetting::GetDefaultSetting() const {
  std::vector<ColumnSettingItem> items;
  for (const auto& c : kColumns)
    if (c.visible) items.push_back(ToItem(c));
  // Keep headers the language already gave the same columns.
  for (auto& item : items)
    for (const auto& l : m_layouts)
      for (const auto& stored : l.items)
        if (stored.key == item.key && !stored.header.empty()) item.header = stored.header;
  return items;
}

std::string CWatchlistSetting::DefaultWIDXCol() {
  return "colIcon,colLink,colSymbol,colName,colArrow,colDelay,colRem,colExchange,colPrevClose,colLast,"
         "colChange,colPerChange,colOpen,colHigh,colLow";
}

bool CWatchlistSetting::SetFontSize(int index) {
  if (index < 0 || index >= static_cast<int>(m_fontItems.size())) return false;
  m_fontSize = index;
  return true;
}

int CWatchlistSetting::FontPointSize(int index) {
  if (index < 0 || index >= static_cast<int>(std::size(kFontPoints))) return kFontPoints[1];
  return kFontPoints[index];
}

void CWatchlistSetting::RefreshLanguage(const ILanguage* language) {
  if (!language) return;
  for (auto& l : m_layouts)
    for (auto& item : l.items) {
      if (item.textId <= 0) continue;
      std::wstring text = language->GetText(kHeaderSection, item.textId);
      if (!text.empty()) item.header = std::move(text);
    }
  for (std::size_t i = 0; i < m_fontItems.size(); ++i) {
    std::wstring text = language->GetText(kFontNameSection, static_cast<int>(i) + 1);
    if (!text.empty()) m_fontItems[i] = std::move(text);
  }
}

std::string CWatchlistSetting::ToText() const {
  Json::Value root(Json::objectValue);
  Json::Value layouts(Json::arrayValue);
  for (const auto& l : m_layouts) {
    Json::Value jl(Json::objectValue);
    jl["id"] = l.id;
    jl["name"] = hv::Narrow(l.name);
    Json::Value items(Json::arrayValue);
    for (const auto& it : l.items) {
      Json::Value ji(Json::objectValue);
      ji["key"] = it.key;
      ji["width"] = it.width;
      ji["visible"] = it.visible;
      ji["header"] = hv::Narrow(it.header);
      ji["columnId"] = it.columnId;
      ji["textId"] = it.textId;
      items.append(ji);
    }
    jl["items"] = items;
    layouts.append(jl);
  }
  root["layouts"] = layouts;
  root["widxCol"] = m_widxCol;
  root["fontSize"] = m_fontSize;
  return Write(root);
}

bool CWatchlistSetting::FromText(const std::string& text, std::string* error) {
  Json::Value root;
  if (!Parse(text, root, error)) return false;
  const Json::Value& layouts = root["layouts"];
  if (!layouts.isArray()) return Fail(error, "\"layouts\" is not a list");
  std::vector<ColumnSettingInfo> parsed;
  for (const auto& jl : layouts) {
    if (!jl.isObject() || !IsInt32(jl["id"]) || !jl["items"].isArray()) return Fail(error, "malformed layout");
    ColumnSettingInfo l;
    l.id = jl["id"].asInt();
    if (jl["name"].isString()) l.name = hv::Widen(jl["name"].asString());
    for (const auto& ji : jl["items"]) {
      if (!ji.isObject() || !ji["key"].isString() || !IsInt32(ji["width"]))
        return Fail(error, "malformed column in layout " + std::to_string(l.id));
      ColumnSettingItem item;
      item.key = ji["key"].asString();
      item.width = std::max(0, ji["width"].asInt());
      item.visible = ji["visible"].isBool() ? ji["visible"].asBool() : true;
      if (ji["header"].isString()) item.header = hv::Widen(ji["header"].asString());
      item.columnId = IsInt32(ji["columnId"]) ? ji["columnId"].asInt() : 0;
      item.textId = IsInt32(ji["textId"]) ? ji["textId"].asInt() : 0;
      l.items.push_back(std::move(item));
    }
    parsed.push_back(std::move(l));
  }
  if (!root["widxCol"].isString()) return Fail(error, "\"widxCol\" is not a text");
  const int font = IsInt32(root["fontSize"]) ? root["fontSize"].asInt() : 1;
  m_layouts = std::move(parsed);
  m_widxCol = root["widxCol"].asString();
  m_fontSize = (font >= 0 && font < static_cast<int>(m_fontItems.size())) ? font : 1;
  return true;
}

// ---- trading limits ----

std::optional<std::int64_t> CTradingLimit::GetMaxQuantity(int mode, const std::string& exchangeCode,
                                                          const std::string& instrumentCode) const {
  if (mode < 0 || mode > 2) return std::nullopt;
  // 2: instrument rule, 1: exchange rule, 0: rule for all.
  int bestRank = -1;
  std::int64_t best = 0;
  for (const auto& r : rules) {
    if (!r.exchangeCode.empty() && r.exchangeCode != exchangeCode) continue;
    if (!r.instrumentCode.empty() && r.instrumentCode != instrumentCode) continue;
    const int rank = !r.instrumentCode.empty() ? 2 : (!r.exchangeCode.empty() ? 1 : 0);
    std::int64_t limit = r.maxQuantity[mode] > 0 ? r.maxQuantity[mode] : r.maxQuantity[0];
    if (limit <= 0 || rank <= bestRank) continue;
    bestRank = rank;
    best = limit;
  }
  if (bestRank < 0) return std::nullopt;
  return best;
}

std::string CTradeSetting::ToText() const {
  Json::Value root(Json::objectValue);
  Json::Value rules(Json::arrayValue);
  for (const auto& r : m_limit.rules) {
    Json::Value jr(Json::objectValue);
    jr["exchange"] = r.exchangeCode;
    jr["instrument"] = r.instrumentCode;
    Json::Value q(Json::arrayValue);
    for (std::int64_t v : r.maxQuantity) q.append(Json::Int64(v));
    jr["maxQuantity"] = q;
    rules.append(jr);
  }
  root["tradingLimits"] = rules;
  return Write(root);
}

bool CTradeSetting::FromText(const std::string& text, std::string* error) {
  Json::Value root;
  if (!Parse(text, root, error)) return false;
  const Json::Value& rules = root["tradingLimits"];
  if (!rules.isArray()) return Fail(error, "\"tradingLimits\" is not a list");
  CTradingLimit limit;
  for (const auto& jr : rules) {
    const Json::Value& q = jr["maxQuantity"];
    if (!jr.isObject() || !q.isArray() || q.size() != 3) return Fail(error, "malformed trading limit");
    TradingLimitRule r;
    r.exchangeCode = jr["exchange"].isString() ? jr["exchange"].asString() : std::string();
    r.instrumentCode = jr["instrument"].isString() ? jr["instrument"].asString() : std::string();
    for (Json::ArrayIndex i = 0; i < 3; ++i) {
      if (!q[i].isInt64()) return Fail(error, "malformed trading limit quantity");
      r.maxQuantity[i] = std::max<std::int64_t>(0, q[i].asInt64());
    }
    limit.rules.push_back(std::move(r));
  }
  m_limit = std::move(limit);
  return true;
}

// ---- small groups ----

bool CAlertSetting::SetPriceAlertOption(int option) {
  if (option < kShowAll || option > kExpired) return false;
  m_priceAlertOption = option;
  return true;
}

std::string CAlertSetting::ToText() const {
  Json::Value root(Json::objectValue);
  root["priceAlertOption"] = m_priceAlertOption;
  return Write(root);
}

bool CAlertSetting::FromText(const std::string& text, std::string* error) {
  Json::Value root;
  if (!Parse(text, root, error)) return false;
  const Json::Value& v = root["priceAlertOption"];
  if (!v.isInt() || v.asInt() < kShowAll || v.asInt() > kExpired)
    return Fail(error, "\"priceAlertOption\" is not 0 to 3");
  m_priceAlertOption = v.asInt();
  return true;
}

std::string CKeyboardShortcutsSetting::ToText() const {
  Json::Value root(Json::objectValue);
  root["enableKeyboardShortcuts"] = m_enabled;
  return Write(root);
}

bool CKeyboardShortcutsSetting::FromText(const std::string& text, std::string* error) {
  Json::Value root;
  if (!Parse(text, root, error)) return false;
  const Json::Value& v = root["enableKeyboardShortcuts"];
  if (!v.isBool()) return Fail(error, "\"enableKeyboardShortcuts\" is not true or false");
  m_enabled = v.asBool();
  return true;
}

std::string CGeneralSetting::ToText() const {
  Json::Value root(Json::objectValue);
  root["enableONDisplay"] = m_onDisplay;
  return Write(root);
}

bool CGeneralSetting::FromText(const std::string& text, std::string* error) {
  Json::Value root;
  if (!Parse(text, root, error)) return false;
  const Json::Value& v = root["enableONDisplay"];
  if (!v.isBool()) return Fail(error, "\"enableONDisplay\" is not true or false");
  m_onDisplay = v.asBool();
  return true;
}

// ---- CUserSettings ----

CUserSettings::CUserSettings() : m_storage(std::make_shared<CMemorySettingsStorage>()) {}
CUserSettings::~CUserSettings() = default;

bool CUserSettings::Store(const char* key, const std::string& text) {
  if (m_storage->Write(key, text)) return true;
  m_error = std::string("the storage refused \"") + key + "\"";
  return false;
}

bool CUserSettings::SetWatchlistSetting(const CWatchlistSetting& s) {
  m_watchlist = s;
  return Store(kWatchlistKey, s.ToText());
}
bool CUserSettings::SetTradeSetting(const CTradeSetting& s) {
  m_trade = s;
  return Store(kTradeKey, s.ToText());
}
bool CUserSettings::SetAlertSetting(const CAlertSetting& s) {
  m_alert = s;
  return Store(kAlertKey, s.ToText());
}
bool CUserSettings::SetKeyboardShortcutsSetting(const CKeyboardShortcutsSetting& s) {
  m_keyboard = s;
  return Store(kKeyboardKey, s.ToText());
}
bool CUserSettings::SetGeneralSetting(const CGeneralSetting& s) {
  m_general = s;
  return Store(kGeneralKey, s.ToText());
}

bool CUserSettings::SetStorage(std::shared_ptr<ISettingsStorage> storage) {
  m_storage = storage ? std::move(storage) : std::make_shared<CMemorySettingsStorage>();
  return Reload();
}

void CUserSettings::ResetToDefaults() {
  m_watchlist = CWatchlistSetting();
  m_trade = CTradeSetting();
  m_alert = CAlertSetting();
  m_keyboard = CKeyboardShortcutsSetting();
  m_general = CGeneralSetting();
  m_error.clear();
}

bool CUserSettings::Reload() {
  ResetToDefaults();
  std::string errors;
  auto load = [&](const char* key, auto& group) {
    const std::optional<std::string> text = m_storage->Read(key);
    if (!text) return;
    std::string why;
    auto copy = group;
    if (copy.FromText(*text, &why)) group = std::move(copy);
    else errors += std::string(errors.empty() ? "" : "; ") + "\"" + key + "\" not readable: " + why;
  };
  load(kWatchlistKey, m_watchlist);
  load(kTradeKey, m_trade);
  load(kAlertKey, m_alert);
  load(kKeyboardKey, m_keyboard);
  load(kGeneralKey, m_general);
  m_error = errors;
  return errors.empty();
}

CUserSettings& GetUserSettings() {
  static CUserSettings settings;
  return settings;
}
