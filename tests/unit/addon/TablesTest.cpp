#include <gtest/gtest.h>

#include "addon/Logging.h"
#include "hostview/Text.h"
#include "addon/Registries.h"
#include "addon/TextTables.h"
#include "mvtest/FakeServices.h"

namespace {

TEST(SettingTextTable_Limits, FallBackWhenMissingNotANumberOrNotPositive) {
  auto& table = addon::SettingTextTable::Instance();
  EXPECT_EQ(table.MaxWatchlistItems(), 500);
  EXPECT_EQ(table.MaxWatchlists(), 50);
  for (const wchar_t* bad : {L"", L"abc", L"12x", L"0", L"-3", L"99999999999", L" "}) {
    table.Set("MAXWL", bad);
    EXPECT_EQ(table.MaxWatchlistItems(), 500) << hv::Narrow(bad);
  }
  table.Set("MAXWL", L" 300 ");
  EXPECT_EQ(table.MaxWatchlistItems(), 300);
  table.Set("MAXWT", L"7");
  EXPECT_EQ(table.MaxWatchlists(), 7);
  EXPECT_EQ(table.Get("MAXWT"), L"7");
  EXPECT_EQ(table.Get("WLNOT"), L"");
  EXPECT_FALSE(table.Has("WLNOT"));
}

TEST(LanguageTextTable_Load, ReadsSection13AndMissingIdsAreEmpty) {
  mvtest::FakeLanguage language;
  language.Set(13, 407, L"Delete?");
  language.Set(12, 408, L"wrong section");
  auto& table = addon::LanguageTextTable::Instance();
  table.Load(&language, 407, 409);
  EXPECT_EQ(table.Get(407), L"Delete?");
  EXPECT_EQ(table.Get(408), L"");
  EXPECT_EQ(table.Get(999), L"");
  table.Load(nullptr, {407});
  EXPECT_EQ(table.Get(407), L"Delete?");
}

TEST(ViewRegistry_Order, FirstMemberLeadsUntilItLeaves) {
  addon::ViewRegistry registry;
  EXPECT_EQ(registry.First(), 0);
  const int a = registry.Join(nullptr);
  const int b = registry.Join(nullptr);
  EXPECT_GT(a, 0);
  EXPECT_NE(a, b);
  EXPECT_TRUE(registry.IsFirst(a));
  EXPECT_FALSE(registry.IsFirst(b));
  registry.Leave(a);
  EXPECT_TRUE(registry.IsFirst(b));
  const int c = registry.Join(nullptr);
  EXPECT_NE(c, a);  // ids are never handed out twice
  registry.Leave(0);
  registry.Leave(12345);
  EXPECT_EQ(registry.Count(), 2u);
  EXPECT_FALSE(registry.IsFirst(0));
}

TEST(ViewRegistry_Membership, LeavesWhenDestroyed) {
  auto& users = addon::UserViews();
  int id = 0;
  {
    addon::Membership first(addon::UserViews);
    addon::Membership second(addon::UserViews);
    id = first.Join(nullptr);
    EXPECT_EQ(first.Join(nullptr), id);  // joining twice keeps the id
    second.Join(nullptr);
    EXPECT_TRUE(first.IsFirst());
    EXPECT_FALSE(second.IsFirst());
    first.Leave();
    EXPECT_TRUE(second.IsFirst());
  }
  EXPECT_EQ(users.Count(), 0u);
  EXPECT_FALSE(users.Contains(id));
}

TEST(LoggerRegistry_Lookup, EmptyNameIsUnknowAndUnregisteredLogsNothing) {
  mvtest::RecordingLogger depth, unknown;
  addon::RegisterLogger(L"CMarketDepthAdv", &depth);
  addon::RegisterLogger(L"", &unknown);
  EXPECT_EQ(addon::FindLogger(L"PriceViewUnknow"), &unknown);
  EXPECT_EQ(addon::FindLogger(L"CMarketDepthAdv"), &depth);
  EXPECT_EQ(addon::FindLogger(L"cmarketdepthadv"), nullptr);
  EXPECT_EQ(addon::FindLogger(L"CTimeAndSalesAdv"), nullptr);

  addon::LogInfo(L"CTimeAndSalesAdv", "CTimeAndSalesAdv::PrepareBasicData", "TimeAndSalesAdv.cpp", 10);
  addon::LogLine(L"CTimeAndSalesAdv", "(Uid:%d)", 1);
  EXPECT_TRUE(depth.lines.empty());
  EXPECT_TRUE(unknown.lines.empty());

  addon::LogInfo(L"CMarketDepthAdv", "CMarketDepthAdv::PrepareBasicData", "MarketDepthAdv.cpp", 42);
  addon::LogLine(L"CMarketDepthAdv", "(Uid:%d) : Code(%s) Page Count is %s.", 3, "0005", "12");
  ASSERT_EQ(depth.lines.size(), 2u);
  EXPECT_EQ(depth.lines[0].level, 3);
  EXPECT_EQ(depth.lines[0].text, "Info:CMarketDepthAdv::PrepareBasicData file:MarketDepthAdv.cpp line:42");
  EXPECT_EQ(depth.lines[1].text, "(Uid:3) : Code(0005) Page Count is 12.");

  mvtest::RecordingLogger replacement;
  addon::RegisterLogger(L"CMarketDepthAdv", &replacement);  // registering replaces
  addon::LogInfo(L"CMarketDepthAdv", "f", "x.cpp", 1);
  EXPECT_EQ(depth.lines.size(), 2u);
  EXPECT_EQ(replacement.lines.size(), 1u);
  EXPECT_STREQ(addon::SourceFileName("/a/b\\views/price/PriceViewAdv.cpp"), "PriceViewAdv.cpp");
}

}  // namespace
