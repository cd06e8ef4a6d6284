#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>

#include "hostconfig/UserSettings.h"
#include "hostview/Services.h"

namespace {

class FakeLanguage : public ILanguage {
 public:
  std::map<std::pair<int, int>, std::wstring> texts;
  std::wstring GetText(int section, int entry) const override {
    auto it = texts.find({section, entry});
    return it == texts.end() ? std::wstring() : it->second;
  }
};

// Counts writes and can refuse them.
class CountingStorage : public CMemorySettingsStorage {
 public:
  int writes = 0;
  bool refuse = false;
  bool Write(const std::string& key, const std::string& text) override {
    ++writes;
    return !refuse && CMemorySettingsStorage::Write(key, text);
  }
};

std::filesystem::path TempDir() {
  const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
  auto dir = std::filesystem::temp_directory_path() /
             ("hostconfig_" + std::string(info->name()) + "_" + std::to_string(::getpid()));
  std::filesystem::remove_all(dir);
  std::filesystem::create_directories(dir);
  return dir;
}

CWatchlistSetting ChangedWatchlist() {
  CWatchlistSetting w;
  ColumnSettingInfo info;
  EXPECT_TRUE(w.GetSettingInfo(w.GetSetInfoList().front().id, info));
  std::swap(info.items[0], info.items[3]);
  info.items[1].visible = false;
  info.items[2].width = 123;
  info.items[2].header = L"Last \u00e9";
  info.name = L"Mine";
  w.SetSettingInfo(7, info);
  w.SetWIDXCol("colLast,colSymbol");
  EXPECT_TRUE(w.SetFontSize(3));
  return w;
}

}  // namespace

TEST(UserSettings, ReadByCopyAndWrittenBackWhole) {
  CUserSettings settings;
  CWatchlistSetting copy = settings.GetWatchlistSetting();
  ASSERT_TRUE(copy.SetFontSize(2));
  copy.SetWIDXCol("colLast");
  // Changing the copy changes nothing until it is handed back.
  EXPECT_EQ(settings.GetWatchlistSetting().GetFontSize(), 1);
  EXPECT_EQ(settings.GetWatchlistSetting().GetWIDXCol(), CWatchlistSetting::DefaultWIDXCol());
  EXPECT_TRUE(settings.SetWatchlistSetting(copy));
  EXPECT_EQ(settings.GetWatchlistSetting().GetFontSize(), 2);
  EXPECT_EQ(settings.GetWatchlistSetting().GetWIDXCol(), "colLast");

  CAlertSetting alert = settings.GetAlertSetting();
  EXPECT_FALSE(alert.SetPriceAlertOption(4));
  EXPECT_FALSE(alert.SetPriceAlertOption(-1));
  EXPECT_TRUE(alert.SetPriceAlertOption(CAlertSetting::kExpired));
  EXPECT_EQ(settings.GetAlertSetting().GetPriceAlertOption(), 0);
  settings.SetAlertSetting(alert);
  EXPECT_EQ(settings.GetAlertSetting().GetPriceAlertOption(), 3);

  EXPECT_EQ(&GetUserSettings(), &GetUserSettings());
}

TEST(UserSettings, EveryGroupSurvivesAStorageRoundTrip) {
  auto storage = std::make_shared<CountingStorage>();
  CUserSettings first;
  ASSERT_TRUE(first.SetStorage(storage));
  const CWatchlistSetting watch = ChangedWatchlist();
  CTradeSetting trade;
  CTradingLimit limit;
  TradingLimitRule rule;
  rule.exchangeCode = "SGX";
  rule.maxQuantity[1] = 5000000000LL;  // beyond 32 bits
  limit.rules.push_back(rule);
  trade.SetTradingLimit(limit);
  CAlertSetting alert;
  alert.SetPriceAlertOption(2);
  CKeyboardShortcutsSetting keys;
  keys.SetEnableKeyboardShortcuts(false);
  CGeneralSetting general;
  general.SetEnableONDisplay(true);
  EXPECT_TRUE(first.SetWatchlistSetting(watch));
  EXPECT_TRUE(first.SetTradeSetting(trade));
  EXPECT_TRUE(first.SetAlertSetting(alert));
  EXPECT_TRUE(first.SetKeyboardShortcutsSetting(keys));
  EXPECT_TRUE(first.SetGeneralSetting(general));
  EXPECT_EQ(storage->writes, 5);

  CUserSettings second;
  ASSERT_TRUE(second.SetStorage(storage)) << second.GetErrorInfo();
  EXPECT_EQ(second.GetWatchlistSetting(), watch);
  EXPECT_EQ(second.GetTradeSetting(), trade);
  EXPECT_EQ(second.GetTradeSetting().GetTradingLimit().GetMaxQuantity(1, "SGX", "D05"), 5000000000LL);
  EXPECT_EQ(second.GetAlertSetting().GetPriceAlertOption(), 2);
  EXPECT_FALSE(second.GetKeyboardShortcutsSetting().GetEnableKeyboardShortcuts());
  EXPECT_TRUE(second.GetGeneralSetting().GetEnableONDisplay());
}

TEST(UserSettings, UnreadableGroupKeepsDefaultsAndIsNotOverwritten) {
  auto storage = std::make_shared<CMemorySettingsStorage>();
  storage->Write(CUserSettings::kWatchlistKey, "{ not json");
  storage->Write(CUserSettings::kAlertKey, "{\"priceAlertOption\": 9}");
  storage->Write(CUserSettings::kGeneralKey, "{\"enableONDisplay\": true}");
  CUserSettings settings;
  EXPECT_FALSE(settings.SetStorage(storage));
  EXPECT_NE(settings.GetErrorInfo().find("watchlist"), std::string::npos) << settings.GetErrorInfo();
  EXPECT_NE(settings.GetErrorInfo().find("alert"), std::string::npos) << settings.GetErrorInfo();
  EXPECT_EQ(settings.GetWatchlistSetting(), CWatchlistSetting());
  EXPECT_EQ(settings.GetAlertSetting().GetPriceAlertOption(), 0);
  EXPECT_TRUE(settings.GetGeneralSetting().GetEnableONDisplay());  // the readable group is loaded
  // Loading never writes: the user's text is still there to be repaired.
  EXPECT_EQ(storage->Read(CUserSettings::kWatchlistKey), std::optional<std::string>("{ not json"));
}

TEST(UserSettings, RefusedWriteIsReportedButStaysInForce) {
  auto storage = std::make_shared<CountingStorage>();
  CUserSettings settings;
  settings.SetStorage(storage);
  storage->refuse = true;
  CGeneralSetting general;
  general.SetEnableONDisplay(true);
  EXPECT_FALSE(settings.SetGeneralSetting(general));
  EXPECT_FALSE(settings.GetErrorInfo().empty());
  EXPECT_TRUE(settings.GetGeneralSetting().GetEnableONDisplay());
}

TEST(UserSettings, JsonFileStorageRoundTripAndCorruptFileMovedAside) {
  const auto dir = TempDir();
  const std::string path = (dir / "settings.json").string();
  {
    auto file = std::make_shared<CJsonFileSettingsStorage>(path);
    CUserSettings settings;
    settings.SetStorage(file);
    EXPECT_TRUE(settings.SetWatchlistSetting(ChangedWatchlist()));
  }
  {
    CUserSettings settings;
    ASSERT_TRUE(settings.SetStorage(std::make_shared<CJsonFileSettingsStorage>(path)));
    EXPECT_EQ(settings.GetWatchlistSetting(), ChangedWatchlist());
  }
  { std::ofstream(path, std::ios::trunc) << "garbage {"; }
  auto file = std::make_shared<CJsonFileSettingsStorage>(path);
  EXPECT_FALSE(file->GetErrorInfo().empty());
  EXPECT_FALSE(file->Read(CUserSettings::kWatchlistKey).has_value());
  ASSERT_TRUE(file->Write("general", "{}"));
  std::stringstream aside;
  aside << std::ifstream(path + ".corrupt").rdbuf();
  EXPECT_EQ(aside.str(), "garbage {");
  EXPECT_EQ(CJsonFileSettingsStorage(path).Read("general"), std::optional<std::string>("{}"));
  std::filesystem::remove_all(dir);
}

TEST(WatchlistSetting, LayoutsById) {
  CWatchlistSetting w;
  ASSERT_EQ(w.GetSetInfoList().size(), 1u);
  ColumnSettingInfo info;
  info.id = 99;
  EXPECT_FALSE(w.GetSettingInfo(5, info));
  EXPECT_EQ(info.id, 99);  // untouched
  ASSERT_TRUE(w.GetSettingInfo(1, info));
  EXPECT_EQ(info.items.size(), 27u);

  // Storing under a new id appends, with the id forced; under an old id replaces.
  info.items.resize(2);
  w.SetSettingInfo(4, info);
  ASSERT_EQ(w.GetSetInfoList().size(), 2u);
  EXPECT_EQ(w.GetSetInfoList()[1].id, 4);
  info.items.resize(1);
  w.SetSettingInfo(4, info);
  ASSERT_EQ(w.GetSetInfoList().size(), 2u);
  EXPECT_EQ(w.GetSetInfoList()[1].items.size(), 1u);
  EXPECT_TRUE(w.RemoveSettingInfo(4));
  EXPECT_FALSE(w.RemoveSettingInfo(4));
}

TEST(WatchlistSetting, DefaultsAndWorldIndexText) {
  CWatchlistSetting w;
  const auto defaults = w.GetDefaultSetting();
  ASSERT_FALSE(defaults.empty());
  for (const auto& item : defaults) EXPECT_TRUE(item.visible) << item.key;
  EXPECT_EQ(defaults.front().key, "colIcon");
  const std::string widx = CWatchlistSetting::DefaultWIDXCol();
  EXPECT_EQ(std::count(widx.begin(), widx.end(), ','), 14);
  EXPECT_EQ(widx.find(' '), std::string::npos);
  EXPECT_EQ(w.GetWIDXCol(), widx);
}

TEST(WatchlistSetting, FontSizeItemsAndLanguage) {
  CWatchlistSetting w;
  ASSERT_EQ(w.GetFontSizeItems().size(), 4u);
  EXPECT_EQ(w.GetFontSize(), 1);
  EXPECT_FALSE(w.SetFontSize(4));
  EXPECT_FALSE(w.SetFontSize(-1));
  EXPECT_EQ(w.GetFontSize(), 1);
  EXPECT_TRUE(w.SetFontSize(2));
  EXPECT_EQ(w.GetFontPointSize(), 11);

  FakeLanguage lang;
  lang.texts[{30, 1}] = L"Klein";
  lang.texts[{13, 106}] = L"Letzter";
  w.RefreshLanguage(&lang);
  EXPECT_EQ(w.GetFontSizeItems()[0], L"Klein");
  EXPECT_EQ(w.GetFontSizeItems()[1], L"Medium");  // missing entry keeps the text
  ColumnSettingInfo info;
  ASSERT_TRUE(w.GetSettingInfo(1, info));
  auto last = std::find_if(info.items.begin(), info.items.end(), [](auto& i) { return i.key == "colLast"; });
  ASSERT_NE(last, info.items.end());
  EXPECT_EQ(last->header, L"Letzter");
  w.RefreshLanguage(nullptr);  // no language: nothing changes, no crash
}

TEST(TradingLimit, MostSpecificRuleAndModeFallback) {
  CTradingLimit limit;
  EXPECT_FALSE(limit.GetMaxQuantity(1, "SGX", "D05").has_value());
  TradingLimitRule all;
  all.maxQuantity[0] = 1000;
  TradingLimitRule sgx;
  sgx.exchangeCode = "SGX";
  sgx.maxQuantity[1] = 500;
  TradingLimitRule d05;
  d05.exchangeCode = "SGX";
  d05.instrumentCode = "D05";
  d05.maxQuantity[2] = 50;
  limit.rules = {d05, all, sgx};
  EXPECT_EQ(limit.GetMaxQuantity(2, "SGX", "D05"), 50);
  EXPECT_EQ(limit.GetMaxQuantity(1, "SGX", "D05"), 500);   // the instrument rule has no buy limit
  EXPECT_EQ(limit.GetMaxQuantity(1, "SGX", "O39"), 500);
  EXPECT_EQ(limit.GetMaxQuantity(2, "SGX", "O39"), 1000);  // exchange rule defines no sell limit
  EXPECT_EQ(limit.GetMaxQuantity(1, "HKEX", "5"), 1000);
  EXPECT_FALSE(limit.GetMaxQuantity(3, "SGX", "D05").has_value());
}
