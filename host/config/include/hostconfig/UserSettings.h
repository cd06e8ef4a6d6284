#pragma once
// The user's settings as the terminal keeps them. GetUserSettings() is the one
// process-wide object. Callers read a setting group by copy, change the copy
// and hand it back whole with the matching setter, which stores it at once.
// All calls are made on the UI thread.
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "hostconfig/SettingsStorage.h"
#include "hostview/Types.h"

class ILanguage;

// One column of a quote grid layout.
struct HV_API ColumnSettingItem {
  std::string key;           // "colLast", ...
  std::int32_t width = 70;   // pixels
  bool visible = true;
  std::wstring header;       // filled by RefreshLanguage; may stay empty
  std::int32_t columnId = 0;
  std::int32_t textId = 0;   // header text: language section 13, this entry
  bool operator==(const ColumnSettingItem&) const = default;
};

// One named column layout: the columns in display order.
struct HV_API ColumnSettingInfo {
  std::int32_t id = 0;
  std::wstring name;
  std::vector<ColumnSettingItem> items;
  bool operator==(const ColumnSettingInfo&) const = default;
};

// Columns and font of the quote grids.
//
// The built-in columns (key, column id, text id, width):
//   colIcon 1/112/30, colLink 2/113/30, colSymbol 3/101/70, colName 4/102/200,
//   colRem 5/103/70, colArrow 6/124/30, colExchange 7/104/70, colLast 8/106/70,
//   colChange 9/107/70, colPerChange 10/114/70, colBid 11/108/70,
//   colAsk 12/109/70, colBuyVol 13/110/80, colSellVol 14/111/80,
//   colTotVol 15/115/90, colOpen 16/116/70, colHigh 17/117/70, colLow 18/118/70,
//   colPrevClose 19/119/70, colCurrency 20/120/60, colLS 21/121/40,
//   colTAC 22/122/60, colCFD 23/123/50, colDMA 24/126/50, colDelay 25/125/70,
//   colMonth 26/127/50, colYear 27/128/50.
// The initial layout list holds one layout, id 1 "Default", with all of them;
// colCurrency, colLS, colTAC, colCFD, colDMA, colDelay, colMonth and colYear hidden.
class HV_API CWatchlistSetting {
 public:
  CWatchlistSetting();

  // The layouts, in the order the user arranged them.
  const std::vector<ColumnSettingInfo>& GetSetInfoList() const { return m_layouts; }
  // Copies layout `id` into `info`; false (info untouched) when there is none.
  bool GetSettingInfo(std::int32_t id, ColumnSettingInfo& info) const;
  // Stores `info` as layout `id` (its id member is set to `id`), replacing the
  // layout of that id or appending a new one.
  void SetSettingInfo(std::int32_t id, const ColumnSettingInfo& info);
  bool RemoveSettingInfo(std::int32_t id);
  // The visible columns of the built-in default layout, in default order.
  std::vector<ColumnSettingItem> GetDefaultSetting() const;

  // World-index columns: their keys in display order joined by "," without
  // blanks. Initially the default order below; stored as given.
  const std::string& GetWIDXCol() const { return m_widxCol; }
  void SetWIDXCol(const std::string& text) { m_widxCol = text; }
  static std::string DefaultWIDXCol();

  // Grid font size as an index into GetFontSizeItems(); initially 1.
  int GetFontSize() const { return m_fontSize; }
  // False (nothing changes) for an index outside the items.
  bool SetFontSize(int index);
  // Display texts of the sizes: "Small", "Medium", "Large", "Extra Large"
  // unless RefreshLanguage found texts for them.
  std::vector<std::wstring> GetFontSizeItems() const { return m_fontItems; }
  // Point size of the current index (8, 9, 11, 13).
  int GetFontPointSize() const { return FontPointSize(m_fontSize); }
  static int FontPointSize(int index);

  // Re-reads the translatable texts: every column header (section 13, the
  // item's text id) and the font-size item names (section 30, entries 1 to 4).
  // An entry the language does not have leaves the text as it was.
  void RefreshLanguage(const ILanguage* language);

  bool operator==(const CWatchlistSetting&) const = default;

  // Storage form (JSON). FromText leaves the object unchanged and returns false
  // with a reason in `error` for a text it cannot use.
  std::string ToText() const;
  bool FromText(const std::string& text, std::string* error = nullptr);

 private:
  std::vector<ColumnSettingInfo> m_layouts;
  std::string m_widxCol;
  int m_fontSize = 1;
  std::vector<std::wstring> m_fontItems;
};

// An upper order quantity, by mode, for the instruments a rule matches.
struct HV_API TradingLimitRule {
  std::string exchangeCode;    // empty: every exchange
  std::string instrumentCode;  // empty: every instrument (of the exchange)
  // Per mode (0 any order, 1 buy, 2 sell); 0 = no limit in that mode.
  std::int64_t maxQuantity[3] = {0, 0, 0};
  bool operator==(const TradingLimitRule&) const = default;
};

struct HV_API CTradingLimit {
  std::vector<TradingLimitRule> rules;
  // The limit for an order of `mode` on the instrument: taken from the most
  // specific matching rule that defines one (instrument rule before exchange
  // rule before the rule for all); a mode limit of 0 falls back to mode 0 of
  // the same rule. None when no rule defines one.
  std::optional<std::int64_t> GetMaxQuantity(int mode, const std::string& exchangeCode,
                                             const std::string& instrumentCode) const;
  bool operator==(const CTradingLimit&) const = default;
};

class HV_API CTradeSetting {
 public:
  const CTradingLimit& GetTradingLimit() const { return m_limit; }
  void SetTradingLimit(const CTradingLimit& limit) { m_limit = limit; }
  bool operator==(const CTradeSetting&) const = default;
  std::string ToText() const;
  bool FromText(const std::string& text, std::string* error = nullptr);

 private:
  CTradingLimit m_limit;  // initially no rule
};

// Order and price alert options.
class HV_API CAlertSetting {
 public:
  enum PriceAlertOption { kShowAll = 0, kTriggered = 1, kActive = 2, kExpired = 3 };
  // Which alerts the alert list shows; initially 0 (all).
  int GetPriceAlertOption() const { return m_priceAlertOption; }
  bool SetPriceAlertOption(int option);  // false for a value outside 0..3
  bool operator==(const CAlertSetting&) const = default;
  std::string ToText() const;
  bool FromText(const std::string& text, std::string* error = nullptr);

 private:
  int m_priceAlertOption = kShowAll;
};

class HV_API CKeyboardShortcutsSetting {
 public:
  // Whether the order shortcut keys open a trade ticket; initially true.
  bool GetEnableKeyboardShortcuts() const { return m_enabled; }
  void SetEnableKeyboardShortcuts(bool enabled) { m_enabled = enabled; }
  bool operator==(const CKeyboardShortcutsSetting&) const = default;
  std::string ToText() const;
  bool FromText(const std::string& text, std::string* error = nullptr);

 private:
  bool m_enabled = true;
};

class HV_API CGeneralSetting {
 public:
  // Whether order-count columns are shown where the exchange offers them; initially false.
  bool GetEnableONDisplay() const { return m_onDisplay; }
  void SetEnableONDisplay(bool enabled) { m_onDisplay = enabled; }
  bool operator==(const CGeneralSetting&) const = default;
  std::string ToText() const;
  bool FromText(const std::string& text, std::string* error = nullptr);

 private:
  bool m_onDisplay = false;
};

class HV_API CUserSettings {
 public:
  // Storage keys, one JSON text each.
  static constexpr const char* kWatchlistKey = "watchlist";
  static constexpr const char* kTradeKey = "trade";
  static constexpr const char* kAlertKey = "alert";
  static constexpr const char* kKeyboardKey = "keyboard_shortcuts";
  static constexpr const char* kGeneralKey = "general";

  CUserSettings();
  ~CUserSettings();
  CUserSettings(const CUserSettings&) = delete;
  CUserSettings& operator=(const CUserSettings&) = delete;

  CWatchlistSetting GetWatchlistSetting() const { return m_watchlist; }
  CTradeSetting GetTradeSetting() const { return m_trade; }
  CAlertSetting GetAlertSetting() const { return m_alert; }
  CKeyboardShortcutsSetting GetKeyboardShortcutsSetting() const { return m_keyboard; }
  CGeneralSetting GetGeneralSetting() const { return m_general; }

  // Each setter keeps the group and writes it to the storage at once. False
  // when the storage refused it (the value is still in force for this run;
  // GetErrorInfo says why).
  bool SetWatchlistSetting(const CWatchlistSetting& setting);
  bool SetTradeSetting(const CTradeSetting& setting);
  bool SetAlertSetting(const CAlertSetting& setting);
  bool SetKeyboardShortcutsSetting(const CKeyboardShortcutsSetting& setting);
  bool SetGeneralSetting(const CGeneralSetting& setting);

  // Switches to another storage (null: a fresh in-memory one) and loads every
  // group from it. A group the storage does not hold keeps its defaults; a
  // group whose text cannot be read keeps its defaults, is not written back
  // until it is set, and makes the call return false with GetErrorInfo set.
  bool SetStorage(std::shared_ptr<ISettingsStorage> storage);
  std::shared_ptr<ISettingsStorage> GetStorage() const { return m_storage; }
  // Loads every group again from the current storage (same rules).
  bool Reload();
  // Back to the built-in values, in memory only (the storage is not touched).
  void ResetToDefaults();

  const std::string& GetErrorInfo() const { return m_error; }

 private:
  bool Store(const char* key, const std::string& text);

  std::shared_ptr<ISettingsStorage> m_storage;
  CWatchlistSetting m_watchlist;
  CTradeSetting m_trade;
  CAlertSetting m_alert;
  CKeyboardShortcutsSetting m_keyboard;
  CGeneralSetting m_general;
  std::string m_error;
};

// The process-wide settings, created on first use with in-memory storage.
HV_API CUserSettings& GetUserSettings();
