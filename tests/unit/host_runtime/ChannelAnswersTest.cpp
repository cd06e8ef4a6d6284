#include <gtest/gtest.h>

#include <QFile>
#include <QTemporaryDir>

#include "RecordingView.h"

TEST(HostChannel, AnswersTextAndParameterRequestsBeforeReturning) {
  Harness h;
  RecordingView& v = h.View("CPriceViewAdv");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "MAXWL"), "500");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "MAXWT"), "50");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "ADVFT"), "200");
  EXPECT_NE(v.Ask(hm::SystemParameter, "MKTEX").find("=TOPGAIN"), std::string::npos);
  EXPECT_EQ(v.Ask(hm::SystemParameter, "MAXPA"), "30");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "ALEML"), "1");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "ALSMS"), "1");
  EXPECT_NE(v.Ask(hm::SystemParameter, "EXCPA").find("SGX"), std::string::npos);
  EXPECT_EQ(v.Ask(hm::NoticeParameter, "OLDWL"), "Brantic Lists");
  const std::string wlnot = v.Ask(hm::NoticeParameter, "WLNOT");
  EXPECT_EQ(wlnot.rfind("TSE,", 0), 0u);
  EXPECT_EQ(v.Ask(hm::SystemParameter, "NOSUCH"), "") << "unknown keys answer empty";
  // Message texts: plain code (514) and "code, number" keys (2814).
  for (const char* code : {"11007", "11013", "11014", "11015", "14009", "17001", "17002", "17003", "17004", "17005",
                           "17006", "17007", "17008"}) {
    EXPECT_FALSE(v.Ask(hm::TextByKey, code).empty()) << code;
    EXPECT_FALSE(v.Ask(hm::MessageText, std::string(code) + ", 0").empty()) << code;
  }
  EXPECT_EQ(v.Ask(hm::MessageText, "14009, 103"), "Contracts for Difference are not available in this view.");
  EXPECT_EQ(v.Ask(hm::MessageText, "99999, 0"), "");
}

TEST(HostChannel, AnswersStatusAndLookupRequestsBeforeReturning) {
  Harness h;
  RecordingView& v = h.View("CMarketDepthAdv");
  auto last = [&] { return v.notes.back(); };
  v.Send(hm::DisplayMode, 1);
  EXPECT_EQ(last().msg, hm::DisplayMode);
  EXPECT_EQ(last().word, 1);
  v.Send(hm::AltStatus);
  EXPECT_EQ(last().msg, hm::AltStatus);
  EXPECT_EQ(last().word, 0);
  JExchangeList sgx{"SGX", "", "", 101}, lse{"LSE", "", "", 101}, none{"NOPE", "", "", 101};
  v.Send(hm::ExchangeEnabled, ToLParam(&sgx));
  EXPECT_EQ(last().word, 1);
  v.Send(hm::ExchangeEnabled, ToLParam(&lse));
  EXPECT_EQ(last().word, 0) << "no market data entitlement for LSE by default";
  v.Send(hm::ExchangeEnabled, ToLParam(&none));
  EXPECT_EQ(last().word, 0);
  JMarketInfoRequest mi{101, "SEHK"};
  v.Send(hm::MarketInfo, ToLParam(&mi));
  ASSERT_EQ(last().info.size(), 1u);
  EXPECT_EQ(last().info[0].exchangeCode, "SEHK");
  EXPECT_EQ(last().info[0].productId, 101);
  EXPECT_EQ(last().info[0].delay, 15);
  mi.exchangeCode = "NOPE";
  v.Send(hm::MarketInfo, ToLParam(&mi));
  EXPECT_TRUE(last().info.empty());
  const int i = h.Busy();
  JInstrumentLink byChart{0, h.Ins(i).chartCode, 0};
  v.Send(hm::FindByChartCode, ToLParam(&byChart));
  ASSERT_NE(last().instrument, nullptr);
  EXPECT_EQ(last().instrument->instrumentCode, h.Ins(i).instrumentCode);
  JInstrumentLink byCode{h.Ins(i).productId, h.Ins(i).instrumentCode, 0};
  v.Send(hm::FindByCode, ToLParam(&byCode));
  EXPECT_EQ(last().instrument, &h.Ins(i));
  byCode.text = "NOT-A-CODE";
  v.Send(hm::FindByCode, ToLParam(&byCode));
  EXPECT_EQ(last().instrument, nullptr);
  JPriceInfoRequest pr{0, 0.5};
  v.Send(hm::AlertBoardRequest, ToLParam(&pr));
  EXPECT_DOUBLE_EQ(last().price.tickSize, 0.005);
  EXPECT_DOUBLE_EQ(last().price.referencePrice, 0.5);
  v.Send(hm::PriceBands);
  EXPECT_EQ(last().count, h.runtime->Market().TickBands().size());
  v.Send(hm::Sectors);
  EXPECT_FALSE(last().sectors.empty());
  v.Send(hm::RemarkMessages);
  EXPECT_GT(last().count, 0u);
}

TEST(HostChannel, DeliversReferenceAndWatchlistLists) {
  Harness h;
  RecordingView& v = h.View("CPriceViewAdv");
  v.Send(hm::InstrumentList);
  EXPECT_EQ(v.notes.back().count, h.runtime->Market().Instruments().size());
  v.Send(hm::ExchangeList);
  EXPECT_EQ(v.notes.back().count, h.runtime->Market().Exchanges().size());
  v.Send(hm::ProductList);
  EXPECT_EQ(v.notes.back().count, 7u);
  for (const JProduct& p : h.runtime->Market().Products()) {
    const std::wstring file = h.runtime->Styles().ResolveImagePath(hv::Widen(p.pictureFile), 2);
    EXPECT_FALSE(file.empty()) << p.pictureFile;
  }
  v.Send(hm::WatchlistGroups521);
  ASSERT_FALSE(v.notes.back().groups.empty());
  EXPECT_EQ(v.notes.back().groups[0].groupName, "SGX");
  v.Send(hm::WatchlistGroups520);
  EXPECT_EQ(v.notes.back().msg, hm::WatchlistGroups520);
  v.Send(hm::WatchlistRows522);
  const auto brands = v.notes.back().rows522;
  ASSERT_FALSE(brands.empty());
  for (const auto& r : brands) EXPECT_EQ(r.instrumentCode.rfind("[KELDO]", 0), 0u);
  v.Send(hm::WatchlistList);
  const auto rows = v.notes.back().rows610;
  ASSERT_FALSE(rows.empty()) << "starter watchlists on first start";
  EXPECT_EQ(rows[0].watchlistName, "My Watchlist");
  EXPECT_EQ(rows[0].seqId, 1);
}

TEST(HostChannel, SettingsComeFromDefaultsThenTheConfigFileThenTheStore) {
  EnsureApp();
  QTemporaryDir dir;
  const QString path = dir.filePath("terminal.conf");
  QFile f(path);
  ASSERT_TRUE(f.open(QIODevice::WriteOnly));
  f.write("# overrides\nMAXWL = 20\nMKTEX=Gainers=TOPGAIN;Losers=TOPLOSE\nnot a setting line\nMAXWT=9\n");
  f.close();
  term::MemoryHostStore store;
  store.settings["MAXWT"] = "7";
  RecordingShell shell;
  term::HostOptions o;
  o.instruments = 200;
  o.logToStderr = false;
  o.configFile = path.toStdString();
  o.imageDir = dir.filePath("img").toStdString();
  term::HostRuntime rt(o, &shell, &store);
  RecordingView v("CPriceViewAdv");
  rt.AttachView(&v);
  EXPECT_EQ(v.Ask(hm::SystemParameter, "MAXWL"), "20");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "MKTEX"), "Gainers=TOPGAIN;Losers=TOPLOSE");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "MAXWT"), "7");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "ADVFT"), "200");
  RecordingView other("CPriceViewAdv");
  rt.AttachView(&other);
  rt.SaveSetting("MAXPA", "10");
  EXPECT_EQ(store.settings["MAXPA"], "10");
  EXPECT_EQ(v.Ask(hm::SystemParameter, "MAXPA"), "10");
  EXPECT_EQ(other.Of(hm::SettingsChanged).size(), 1u);
  rt.DestroyView(&v);
  rt.DestroyView(&other);
}
