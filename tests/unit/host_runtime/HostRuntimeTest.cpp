#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <iterator>
#include <map>

#include "RecordingView.h"
#include "hostview/MessageTrace.h"
#include "TapeParsing.h"

namespace {
const std::vector<std::string> kQuoteFields = {"BID", "ASK", "BVOL", "SVOL", "LAST", "CHANGE", "PCHANGE", "OPEN", "HIGH",
                                               "LOW", "CLOSE", "VOL", "REMARKS", "CFD_STATUS", "DMA_STATUS", "MONTH",
                                               "YEAR", "TAC"};
}

TEST(HostRuntime, SubscriptionIsAnsweredWithCurrentValuesThenPushedOnChangeOnly) {
  Harness h;
  RecordingView& v = h.View("CPriceViewAdv");
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  v.Subscribe(ins.productId, ins.instrumentCode, kQuoteFields);
  // One 412 answer per field, with the market's value, before any pump.
  auto answers = v.Of(hm::RequestField);
  ASSERT_EQ(answers.size(), kQuoteFields.size());
  for (std::size_t k = 0; k < kQuoteFields.size(); ++k) {
    EXPECT_EQ(answers[k]->update.fieldName, kQuoteFields[k]);
    EXPECT_EQ(answers[k]->update.value, h.runtime->Market().FieldValue(i, kQuoteFields[k], 0, 0));
    EXPECT_EQ(answers[k]->update.productId, ins.productId);
    EXPECT_EQ(answers[k]->update.instrumentCode, ins.instrumentCode);
  }
  EXPECT_EQ(h.runtime->Stats().subscriptions, kQuoteFields.size());
  EXPECT_EQ(h.runtime->Market().InterestCount(), 1);

  // Pushes carry changed values only, at most one per field per pump.
  v.Clear();
  std::map<std::string, std::string> last;
  for (const auto* a : answers) last[a->update.fieldName] = a->update.value;
  int pushes = 0;
  for (int tick = 0; tick < 100; ++tick) {
    const std::size_t before = v.notes.size();
    h.Pump(100);
    std::set<std::string> seen;
    for (std::size_t k = before; k < v.notes.size(); ++k) {
      const auto& n = v.notes[k];
      if (n.msg == hm::RequestField) continue;  // answers to the 400 of the batch
      ASSERT_EQ(n.msg, hm::FieldValue);
      EXPECT_TRUE(seen.insert(n.update.fieldName).second) << "coalesced per field";
      EXPECT_NE(n.update.value, last[n.update.fieldName]) << "pushed without a change: " << n.update.fieldName;
      EXPECT_EQ(n.update.value, h.runtime->Market().FieldValue(i, n.update.fieldName, 0, 0));
      last[n.update.fieldName] = n.update.value;
      ++pushes;
    }
  }
  EXPECT_GT(pushes, 5);

  // A withdrawal batch ends the subscriptions.
  for (const auto& f : kQuoteFields) v.Field(hm::WithdrawField, ins.productId, ins.instrumentCode, f);
  v.Field(hm::WithdrawField, ins.productId, ins.instrumentCode, "PMP_Submit");
  EXPECT_EQ(h.runtime->Stats().subscriptions, 0u);
  EXPECT_EQ(h.runtime->Market().InterestCount(), 0);
  v.Clear();
  h.Pump(5000);
  EXPECT_TRUE(v.Of(hm::FieldValue).empty());
}

TEST(HostRuntime, WithdrawalWithoutSubmitChangesNothingYet) {
  Harness h;
  RecordingView& v = h.View("CPriceViewAdv");
  const auto& ins = h.Ins(h.Busy());
  v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "LAST");
  EXPECT_TRUE(v.Of(hm::RequestField).empty()) << "answered at the end of the batch";
  v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "PMP_Submit");
  EXPECT_EQ(v.Of(hm::RequestField).size(), 1u);
  v.Field(hm::WithdrawField, ins.productId, ins.instrumentCode, "LAST");
  EXPECT_EQ(h.runtime->Stats().subscriptions, 1u);
  v.Field(hm::WithdrawField, ins.productId, ins.instrumentCode, "PMP_Submit");
  EXPECT_EQ(h.runtime->Stats().subscriptions, 0u);
}

TEST(HostRuntime, DestroyedViewLosesItsSubscriptionsAndIsNeverCalledAgain) {
  Harness h;
  RecordingView& keep = h.View("CPriceViewAdv");
  auto gone = std::make_unique<RecordingView>("CPriceViewAdv");
  h.runtime->AttachView(gone.get());
  const auto& ins = h.Ins(h.Busy());
  keep.Subscribe(ins.productId, ins.instrumentCode, {"LAST", "BID"});
  gone->Subscribe(ins.productId, ins.instrumentCode, {"LAST", "ASK"});
  EXPECT_EQ(h.runtime->Stats().subscriptions, 4u);
  // Deleted without telling the runtime: the runtime notices.
  gone.reset();
  EXPECT_EQ(h.runtime->Stats().subscriptions, 2u);
  EXPECT_EQ(h.runtime->Views().size(), 1u);
  h.Pump(3000);
  EXPECT_FALSE(keep.Of(hm::FieldValue).empty());
  h.runtime->DestroyView(&keep);
  EXPECT_EQ(h.runtime->Stats().subscriptions, 0u);
  EXPECT_EQ(h.runtime->Market().InterestCount(), 0);
}

TEST(HostRuntime, DepthSubscriptionAnswersEveryLevelAndPushesChangedLevels) {
  Harness h;
  RecordingView& v = h.View("CMarketDepthAdv");
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  const std::vector<std::string> fields = {"ORDS_BVOL", "BVOL", "BUY", "SELL", "SVOL", "ORDS_SVOL"};
  v.Subscribe(ins.productId, ins.instrumentCode, fields, 1, 10);
  std::map<std::pair<std::string, int>, std::string> levels;
  for (const auto* n : v.Of(hm::RequestField))
    if (n->update.kind == 1) levels[{n->update.fieldName, n->update.param}] = n->update.value;
  EXPECT_EQ(levels.size(), fields.size() * 10);
  const auto book = h.runtime->Market().Book(i, 10);
  EXPECT_EQ(levels[std::make_pair(std::string("BUY"), 1)], h.runtime->Market().FormatPrice(i, book[0].bid));
  EXPECT_EQ(levels[std::make_pair(std::string("SELL"), 10)], h.runtime->Market().FormatPrice(i, book[9].ask));
  v.Clear();
  h.Pump(5000);
  for (const auto* n : v.Of(hm::FieldValue)) {
    if (n->update.kind != 1) continue;
    EXPECT_GE(n->update.param, 1);
    EXPECT_LE(n->update.param, 10);
    auto& seen = levels[std::make_pair(n->update.fieldName, int(n->update.param))];
    EXPECT_NE(seen, n->update.value);
    seen = n->update.value;
  }
  EXPECT_FALSE(v.Of(hm::FieldValue).empty());
}

// After the answers and after every pump, the book the view has been told
// (answers, then pushes applied in order) is the market's book: every field of
// every level subscribed, with its value.
TEST(HostRuntime, DepthAnswersAndPushesCarryTheBooksValues) {
  Harness h;
  RecordingView& v = h.View("CMarketDepthAdv");
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  sim::Market& m = h.runtime->Market();
  const std::vector<std::string> fields = {"ORDS_BVOL", "BVOL", "BUY", "SELL", "SVOL", "ORDS_SVOL"};
  constexpr int kLevels = 12;
  // The market's level as the terminal writes it: prices in the instrument's
  // format, volumes and order counts whole; a side without a price is empty.
  const auto expected = [&](const std::string& f, int level) -> std::string {
    const sim::DepthLevel l = m.Depth(i, level);
    const bool bid = f == "ORDS_BVOL" || f == "BVOL" || f == "BUY";
    if ((bid ? l.bid : l.ask) <= 0) return {};
    if (f == "BUY") return m.FormatPrice(i, l.bid);
    if (f == "SELL") return m.FormatPrice(i, l.ask);
    if (f == "BVOL") return std::to_string(l.bidVolume);
    if (f == "SVOL") return std::to_string(l.askVolume);
    if (f == "ORDS_BVOL") return std::to_string(l.bidOrders);
    return std::to_string(l.askOrders);
  };
  std::map<std::pair<std::string, int>, std::string> told;
  const auto apply = [&](UINT msg) {
    int n = 0;
    for (const auto* note : v.Of(msg)) {
      if (note->update.kind != 1) continue;
      EXPECT_EQ(note->update.productId, ins.productId);
      EXPECT_EQ(note->update.instrumentCode, ins.instrumentCode);
      told[{note->update.fieldName, int(note->update.param)}] = note->update.value;
      ++n;
    }
    return n;
  };
  const auto expectBook = [&](const char* when) {
    for (int level = 1; level <= kLevels; ++level)
      for (const auto& f : fields) {
        const auto it = told.find({f, level});
        ASSERT_NE(it, told.end()) << when << ": " << f << " " << level << " never sent";
        EXPECT_EQ(it->second, expected(f, level)) << when << ": " << f << " " << level;
      }
    EXPECT_EQ(told.size(), fields.size() * kLevels) << when << ": only the levels subscribed";
  };

  v.Subscribe(ins.productId, ins.instrumentCode, fields, 1, kLevels);
  EXPECT_EQ(apply(hm::RequestField), int(fields.size()) * kLevels);
  expectBook("answers");
  ASSERT_FALSE(expected("BUY", 1).empty());
  EXPECT_NE(expected("BVOL", 1), expected("ORDS_BVOL", 1)) << "volumes and order counts differ in this book";

  int pushed = 0;
  for (int pump = 0; pump < 40; ++pump) {
    v.Clear();
    h.Pump(100);
    pushed += apply(hm::FieldValue);
    expectBook("after a pump");
  }
  EXPECT_GT(pushed, 10);
}

TEST(HostRuntime, TimeAndSalesPagesAreAnsweredPushedAndWithdrawn) {
  Harness h;
  RecordingView& v = h.View("CTimeAndSalesAdv");
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  for (const char* f : {"DTIME", "HIGH", "LOW", "NETCHANGE", "LAST", "TOTALVALUE", "TOTAL_VOLUME", "PAGECOUNT", "PMP_Submit"})
    v.Field(hm::RequestField, ins.productId, ins.instrumentCode, f, 99999, 2);
  for (int page : {99998, 1}) {
    v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "TRADEDATA", page, 2);
    v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "PMP_Submit", page, 2);
  }
  std::map<std::string, std::string> header;
  std::string live, first;
  for (const auto* n : v.Of(hm::RequestField)) {
    if (n->update.param == 99999) header[n->update.fieldName] = n->update.value;
    if (n->update.param == 99998) live = n->update.value;
    if (n->update.param == 1) first = n->update.value;
  }
  EXPECT_EQ(header.size(), 8u);
  int newest = 0;
  tape::ParseTradePage(live, &newest);
  EXPECT_EQ(newest, h.runtime->Market().QuoteOf(i).trades);
  EXPECT_EQ(std::atoi(header["PAGECOUNT"].c_str()), (newest + 99) / 100);
  EXPECT_EQ(tape::ParseTradePage(first).begin()->first, 1);
  // New trades reach the live page; the finished history page is withdrawn.
  v.Field(hm::WithdrawField, ins.productId, ins.instrumentCode, "TIMESALES_DATA", 1, 2);
  v.Field(hm::WithdrawField, ins.productId, ins.instrumentCode, "PMP_Submit", 1, 2);
  v.Clear();
  h.Pump(20000);
  int livePushes = 0;
  for (const auto* n : v.Of(hm::FieldValue)) {
    EXPECT_NE(n->update.param, 1) << "withdrawn page";
    if (n->update.param == 99998) {
      ++livePushes;
      int top = 0;
      tape::ParseTradePage(n->update.value, &top);
      EXPECT_GT(top, newest);
      newest = top;
    }
  }
  EXPECT_GT(livePushes, 0);
}

TEST(HostRuntime, FetchIsAnsweredOnTheNextPumpAndNeverWithAnEmptyValue) {
  Harness h;
  RecordingView& v = h.View("CTimeAndSalesAdv");
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  // The views re-ask an empty answer with 400: that must not loop.
  v.onNote = [&](const RecordingView::Note& n) {
    if (n.msg == hm::RequestField && n.update.value.empty()) {
      FieldRequest r{n.update.productId, n.update.instrumentCode, n.update.fieldName, n.update.param, n.update.kind};
      v.Send(hm::FetchFields, ToLParam(&r));
    }
  };
  v.Field(hm::FetchFields, ins.productId, ins.instrumentCode, "BID,ASK");
  v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "TRADEDATA", 998, 2);
  v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "PMP_Submit", 998, 2);
  ASSERT_EQ(v.Of(hm::RequestField).size(), 1u);
  EXPECT_TRUE(v.Of(hm::RequestField)[0]->update.value.empty()) << "a page beyond the tape";
  h.Pump(100);
  const auto answers = v.Of(hm::RequestField);
  ASSERT_EQ(answers.size(), 3u);
  EXPECT_EQ(answers[1]->update.fieldName, "BID");
  EXPECT_EQ(answers[2]->update.fieldName, "ASK");
  h.Pump(1000);
  EXPECT_EQ(v.Of(hm::RequestField).size(), 3u);
}

TEST(HostRuntime, OpenedViewReceivesTheLinkOfTheFollowing310) {
  Harness h;
  RecordingView& price = h.View("CPriceViewAdv");
  const std::wstring json = L"{\"type\":\"price view\",\"data\":[{\"Field_instrument_code\":\"D05\",\"Field_product_id\":\"101\"}]}";
  ViewLink link;
  link.className = L"CMarketDepthAdv";
  link.link = &json;
  price.Send(hm::OpenView, ToLParam(&link));
  price.Send(hm::LinkData, ToLParam(&link));
  ASSERT_EQ(h.shell.opened.size(), 1u);
  auto got = h.shell.opened[0]->Of(hm::LinkData);
  ASSERT_EQ(got.size(), 1u);
  EXPECT_EQ(got[0]->wtext, json);
  EXPECT_EQ(got[0]->text, "CMarketDepthAdv");
  EXPECT_TRUE(price.Of(hm::LinkData).empty());
  // A trade ticket is no add-on view: the link goes to the shell.
  link.className = L"CTradeView";
  price.Send(hm::OpenView, ToLParam(&link));
  price.Send(hm::LinkData, ToLParam(&link));
  ASSERT_EQ(h.shell.foreignLinks.size(), 1u);
  EXPECT_EQ(h.shell.foreignLinks[0].first, L"CTradeView");
  EXPECT_EQ(h.shell.foreignLinks[0].second, json);
  // The class name alone opens too (the instrument explorer form).
  std::wstring cls = L"CNewPriceAlertAdv";
  price.Send(hm::OpenView, ToLParam(&cls));
  EXPECT_EQ(h.shell.opened.size(), 2u);
  PriceAlertItem fill;
  fill.alertId = -1;
  fill.productId = 101;
  fill.instrumentCode = "D05";
  price.Send(hm::Alert705, ToLParam(&fill));
  ASSERT_EQ(h.shell.opened[1]->Of(hm::Alert705).size(), 1u);
  EXPECT_EQ(h.shell.opened[1]->Of(hm::Alert705)[0]->alert.instrumentCode, "D05");
}

TEST(HostRuntime, RelaysSettingsChangesLinksAndWatchlistNotices) {
  Harness h;
  RecordingView& a = h.View("CPriceViewAdv");
  RecordingView& b = h.View("CPriceViewAdv");
  RecordingView& depth = h.View("CMarketDepthAdv");
  RecordingView& sales = h.View("CTimeAndSalesAdv");
  a.Send(hm::SettingsChanged);
  EXPECT_TRUE(a.Of(hm::SettingsChanged).empty());
  EXPECT_EQ(b.Of(hm::SettingsChanged).size(), 1u);
  EXPECT_EQ(depth.Of(hm::SettingsChanged).size(), 1u);
  // 300 from the leading price view reaches every price view, itself included.
  a.Send(hm::WatchlistsLoaded, 0);
  EXPECT_EQ(a.Of(hm::WatchlistsLoaded).size(), 1u);
  EXPECT_EQ(b.Of(hm::WatchlistsLoaded).size(), 1u);
  EXPECT_TRUE(depth.Of(hm::WatchlistsLoaded).empty());
  // 615: the linked instrument goes to the single-instrument views.
  const std::wstring json = L"{\"type\":\"price view\",\"data\":[{\"Field_instrument_code\":\"X\"}]}";
  ViewLink link;
  link.className = L"CTradeView";
  link.link = &json;
  a.Send(hm::LinkedInstrument, ToLParam(&link));
  EXPECT_EQ(depth.Of(hm::LinkedInstrument).size(), 1u);
  EXPECT_EQ(sales.Of(hm::LinkedInstrument)[0]->wtext, json);
  EXPECT_TRUE(b.Of(hm::LinkedInstrument).empty());
  EXPECT_EQ(h.shell.foreignLinks.size(), 1u);
  // Titles and sizes go to the shell.
  std::wstring title = L"Market Depth - X";
  depth.Send(hm::Title, ToLParam(&title));
  ViewSize size{270, 150};
  depth.Send(hm::ViewSizeRequest, ToLParam(&size));
  EXPECT_EQ(h.shell.titles.back(), title);
  EXPECT_EQ(h.shell.sizes.back(), std::make_pair(270, 150));
}

TEST(HostRuntime, SameSeedAndClockGiveTheSamePushes) {
  auto run = [](std::uint64_t seed) {
    Harness h(seed);
    RecordingView& v = h.View("CPriceViewAdv");
    for (int k = 0; k < 20; ++k) {
      const auto& ins = h.Ins(30 + k * 7);
      v.Subscribe(ins.productId, ins.instrumentCode, kQuoteFields);
    }
    h.Pump(10000);
    std::string out;
    for (const auto& n : v.notes)
      out += std::to_string(n.msg) + " " + n.update.instrumentCode + " " + n.update.fieldName + "=" + n.update.value + "\n";
    return out;
  };
  const std::string a = run(9);
  EXPECT_EQ(a, run(9));
  EXPECT_NE(a, run(10));
}

TEST(HostRuntime, TracedMessagesAreWhatTheViewsReceivedWithTheirClass) {
  Harness h;
  const std::string path = QDir::tempPath().toStdString() + "/host-runtime-trace-" +
                           std::to_string(QCoreApplication::applicationPid()) + ".bin";
  std::string error;
  ASSERT_FALSE(h.runtime->TraceMessages("/nonexistent-folder/trace.bin", error));
  EXPECT_NE(error.find("/nonexistent-folder/trace.bin"), std::string::npos);
  ASSERT_TRUE(h.runtime->TraceMessages(path, error)) << error;
  RecordingView& v = h.View("CMarketDepthAdv");
  const auto& ins = h.Ins(h.Busy());
  v.Subscribe(ins.productId, ins.instrumentCode, {"BUY"});
  h.Pump(1000);
  const std::size_t received = v.notes.size();
  ASSERT_GT(received, 0u);
  h.runtime.reset();  // closes the trace

  std::ifstream in(path, std::ios::binary);
  const std::string bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  std::remove(path.c_str());
  // Frames: class name and message, each with its length.
  hv::trace::Reader frames(bytes);
  std::size_t k = 0;
  while (!frames.AtEnd()) {
    EXPECT_EQ(frames.Narrow(), "CMarketDepthAdv");
    const std::string message = frames.Narrow();
    hv::trace::Reader one(message);
    hv::trace::Message m;
    ASSERT_TRUE(hv::trace::Decode(one, m));
    ASSERT_LT(k, received);
    EXPECT_EQ(m.number, v.notes[k].msg) << k;
    if (m.number == hm::RequestField || m.number == hm::FieldValue) {
      const auto& u = *FromLParam<const FieldUpdate>(m.word);
      EXPECT_EQ(u.fieldName, v.notes[k].update.fieldName);
      EXPECT_EQ(u.value, v.notes[k].update.value);
    }
    ++k;
  }
  EXPECT_EQ(k, received);
}
