#include <gtest/gtest.h>

#include <set>
#include <thread>
#include <unordered_set>

#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostview/Text.h"
#include "mvtest/ProcessStateReset.h"

namespace {

using Q = QuoteLayout;
const InstrumentKey kA{1, L"AAA"};
const InstrumentKey kB{1, L"BBB"};

// A store with a known instrument (AAA: 2 decimals); others get "%.3f".
class QuoteStoreTest : public ::testing::Test {
 protected:
  void SetUp() override {
    JInstrumentUnderlying a;
    a.productId = 1;
    a.instrumentCode = "AAA";
    a.decimals = 2;
    JInstrumentUnderlying wide;
    wide.productId = 1;
    wide.instrumentCode = "TWELVE";
    wide.decimals = 12;
    list_ = {a, wide};
    InstrumentMgr_ReadOnly().Fill(&list_);
  }
  std::vector<JInstrumentUnderlying> list_;
  QuoteStore store_;
};

}  // namespace

TEST_F(QuoteStoreTest, Get_UnknownKeyIsQueuedAndAnsweredWithDefaults) {
  const QuoteRecord r = store_.Get(kB, 500);
  EXPECT_EQ(r[Q::Bid].text, L"0.000");
  EXPECT_EQ(r[Q::Close].text, L"0.000");
  EXPECT_EQ(r[Q::BVol].text, L"0.00");
  EXPECT_EQ(r[Q::SVol].text, L"0.00");
  EXPECT_EQ(r[Q::Remarks].text, L"");
  EXPECT_EQ(r[Q::Ask].mark, kMarkNone);
  EXPECT_EQ(r[Q::Ask].changedAt, 500u);
  EXPECT_EQ(r.updatedAt, 500u);
  EXPECT_EQ(r.readAt, 500u);
  EXPECT_FALSE(r.changed);
  EXPECT_EQ(r.NumberFormat(), L"%.3f");
  EXPECT_EQ(store_.PendingCount(), 1u);
  // A second Get finds the record and does not queue it again.
  EXPECT_EQ(store_.Get(kB, 900).readAt, 900u);
  EXPECT_EQ(store_.PendingCount(), 1u);
  EXPECT_EQ(store_.TakePending(), std::vector<InstrumentKey>{kB});
  EXPECT_EQ(store_.PendingCount(), 0u);
}

TEST_F(QuoteStoreTest, Get_NumberFormatFromInstrumentDecimals) {
  EXPECT_EQ(store_.Get(kA, 0).NumberFormat(), L"%.2f");
  EXPECT_EQ(store_.Get(InstrumentKey{1, L"TWELVE"}, 0).NumberFormat(), L"%.3f");
  store_.Update(kA, L"LAST", L"12.345", 1);
  EXPECT_EQ(store_.Get(kA, 2)[Q::Last].text, L"12.35");  // printf rounding of 12.345 (binary 12.3449...)
  store_.Update(InstrumentKey{1, L"TWELVE"}, L"LAST", L"1.23456", 1);
  EXPECT_EQ(store_.Get(InstrumentKey{1, L"TWELVE"}, 2)[Q::Last].text, L"1.235");
}

TEST_F(QuoteStoreTest, Update_UnknownInstrumentIsDropped) {
  EXPECT_FALSE(store_.Update(kA, L"BID", L"10", 1));
  EXPECT_EQ(store_.Size(), 0u);
  EXPECT_EQ(store_.PendingCount(), 0u);
  EXPECT_EQ(store_.Version(), 0u);
}

TEST_F(QuoteStoreTest, Update_MarksAndTheirExpiry) {
  store_.Get(kB, 0);
  ASSERT_TRUE(store_.Update(kB, L"BID", L"10.5", 1000));
  QuoteRecord r = store_.Get(kB, 1000);
  EXPECT_EQ(r[Q::Bid].mark, kMarkNone);  // first value: no mark
  EXPECT_EQ(r[Q::Bid].text, L"10.500");
  EXPECT_TRUE(r.changed);
  EXPECT_EQ(r.updatedAt, 1000u);

  store_.Update(kB, L"BID", L"10.6", 2000);
  EXPECT_EQ(store_.Get(kB, 2000)[Q::Bid].mark, kMarkUp);
  store_.Update(kB, L"ASK", L"11", 2000);
  store_.Update(kB, L"ASK", L"10.9", 2100);
  EXPECT_EQ(store_.Get(kB, 2100)[Q::Ask].mark, kMarkDown);

  store_.ExpireMarks(3499);  // 1499 ms after the BID change: still marked
  EXPECT_EQ(store_.Get(kB, 3499)[Q::Bid].mark, kMarkUp);
  store_.ClearChanged();
  store_.ExpireMarks(3500);
  r = store_.Get(kB, 3500);
  EXPECT_EQ(r[Q::Bid].mark, kMarkNone);
  EXPECT_EQ(r[Q::Bid].changedAt, 3500u);
  EXPECT_EQ(r[Q::Ask].mark, kMarkDown);  // changed 100 ms later
  EXPECT_TRUE(r.changed);
  EXPECT_EQ(r.updatedAt, 3500u);
  store_.ExpireMarks(3600);
  EXPECT_EQ(store_.Get(kB, 3600)[Q::Ask].mark, kMarkNone);
}

TEST_F(QuoteStoreTest, ExpireMarks_AcrossTickWrap) {
  store_.Get(kB, 0);
  store_.Update(kB, L"LAST", L"1", 0xFFFFFF00u);
  store_.Update(kB, L"LAST", L"2", 0xFFFFFF00u);
  store_.ExpireMarks(100);  // 356 ms later, after the wrap
  EXPECT_EQ(store_.Get(kB, 100)[Q::Last].mark, kMarkUp);
  store_.ExpireMarks(0xFFFFFF00u + 1500u);
  EXPECT_EQ(store_.Get(kB, 2000)[Q::Last].mark, kMarkNone);
}

TEST_F(QuoteStoreTest, Update_ToleranceOfOneHundredMillionth) {
  store_.Get(kB, 0);
  store_.Update(kB, L"BID", L"10.001", 1);
  store_.Update(kB, L"BID", L"10.001000001", 2);
  EXPECT_EQ(store_.Get(kB, 2)[Q::Bid].mark, kMarkNone);
  store_.Update(kB, L"BID", L"10.00100003", 3);
  EXPECT_EQ(store_.Get(kB, 3)[Q::Bid].mark, kMarkUp);
}

TEST_F(QuoteStoreTest, Update_SeparatorsVolumesAndPercentages) {
  store_.Get(kB, 0);
  store_.Update(kB, L"BVOL", L"1,234,567", 1);
  QuoteRecord r = store_.Get(kB, 1);
  EXPECT_DOUBLE_EQ(r[Q::BVol].value, 1234567);
  EXPECT_EQ(r[Q::BVol].text, L"1234567.00");
  store_.Update(kB, L"BVOL", L"1,234,568", 2);
  EXPECT_EQ(store_.Get(kB, 2)[Q::BVol].mark, kMarkChanged);  // volumes: changed, not up
  store_.Update(kB, L"VOL", L"5", 2);
  store_.Update(kB, L"VOL", L"4", 3);
  EXPECT_EQ(store_.Get(kB, 3)[Q::Vol].mark, kMarkChanged);

  store_.Update(kB, L"PCHANGE", L"+1.23456", 1);
  store_.Update(kB, L"CHANGE", L"-0.5", 1);
  r = store_.Get(kB, 3);
  EXPECT_EQ(r[Q::PChange].text, L"1.235");
  EXPECT_EQ(r[Q::PChange].raw, L"+1.23456");
  EXPECT_EQ(r[Q::Change].text, L"-0.500");
  EXPECT_EQ(r[Q::Change].raw, L"-0.5");
  EXPECT_EQ(r[Q::Bid].raw, L"");
}

TEST_F(QuoteStoreTest, Update_TextFieldsAndUnknownNames) {
  store_.Get(kB, 0);
  store_.Update(kB, L"REMARKS", L"CD", 1);
  EXPECT_EQ(store_.Get(kB, 1)[Q::Remarks].mark, kMarkNone);
  store_.Update(kB, L"REMARKS", L"XD", 2);
  EXPECT_EQ(store_.Get(kB, 2)[Q::Remarks].mark, kMarkChanged);
  store_.Update(kB, L"REMARKS", L"XD", 3);
  EXPECT_EQ(store_.Get(kB, 3)[Q::Remarks].mark, kMarkNone);
  const auto v = store_.Version();
  EXPECT_FALSE(store_.Update(kB, L"remarks", L"X", 4));  // names are case-sensitive
  EXPECT_FALSE(store_.Update(kB, L"", L"X", 4));
  EXPECT_FALSE(store_.Update(kB, L"NOSUCH", L"X", 4));
  EXPECT_EQ(store_.Version(), v);
}

TEST_F(QuoteStoreTest, Update_NonFiniteValueKeepsPreviousValueAndText) {
  store_.Get(kB, 0);
  store_.Update(kB, L"LAST", L"10", 1);
  store_.Update(kB, L"LAST", L"11", 2);
  store_.ClearChanged();
  const auto v = store_.Version();
  for (const wchar_t* bad : {L"nan", L"inf", L"-inf", L"1e999", L"garbage", L"12..5", L"1 2"}) {
    EXPECT_FALSE(store_.Update(kB, L"LAST", bad, 3)) << hv::Narrow(bad);
  }
  const QuoteRecord r = store_.Get(kB, 4);
  EXPECT_DOUBLE_EQ(r[Q::Last].value, 11);
  EXPECT_EQ(r[Q::Last].text, L"11.000");
  EXPECT_EQ(r[Q::Last].mark, kMarkUp);  // the mark of the last real change
  EXPECT_EQ(r[Q::Last].changedAt, 2u);
  EXPECT_FALSE(r.changed);
  EXPECT_EQ(store_.Version(), v);
}

// The terminal withdraws a price with an empty text: it reads as 0, and the
// price coming back is a rise from there.
TEST_F(QuoteStoreTest, Update_WithdrawnBidReadsAsZeroAndComesBack) {
  store_.Get(kA, 0);
  store_.Update(kA, L"BID", L"10.5", 1);
  store_.Update(kA, L"BVOL", L"300", 1);
  store_.ClearChanged();
  ASSERT_TRUE(store_.Update(kA, L"BID", L"", 2));
  QuoteRecord r = store_.Get(kA, 2);
  EXPECT_EQ(r[Q::Bid].text, L"0.00");
  EXPECT_DOUBLE_EQ(r[Q::Bid].value, 0);
  EXPECT_EQ(r[Q::Bid].mark, kMarkDown);
  EXPECT_EQ(r[Q::Bid].changedAt, 2u);
  EXPECT_TRUE(r.changed);
  EXPECT_EQ(r[Q::BVol].text, L"300.00") << "only the withdrawn field moves";

  // Withdrawn again (blanks only): nothing moved, no mark.
  store_.ExpireMarks(2000);
  EXPECT_TRUE(store_.Update(kA, L"BID", L" ", 2100));
  EXPECT_EQ(store_.Get(kA, 2100)[Q::Bid].mark, kMarkNone);

  ASSERT_TRUE(store_.Update(kA, L"BID", L"10.4", 2200));
  r = store_.Get(kA, 2200);
  EXPECT_EQ(r[Q::Bid].text, L"10.40");
  EXPECT_EQ(r[Q::Bid].mark, kMarkUp);

  // Volumes and percentages read the same way.
  store_.Update(kA, L"BVOL", L"", 2300);
  store_.Update(kA, L"PCHANGE", L"", 2300);
  r = store_.Get(kA, 2300);
  EXPECT_EQ(r[Q::BVol].text, L"0.00");
  EXPECT_EQ(r[Q::BVol].mark, kMarkChanged);
  EXPECT_EQ(r[Q::PChange].text, L"0.000");
}

TEST_F(QuoteStoreTest, TakePending_WithLimitOrSet) {
  for (int i = 0; i < 5; ++i) store_.Get(InstrumentKey{2, std::wstring(1, static_cast<wchar_t>(L'a' + i))}, 0);
  const auto two = store_.TakePending(2);
  ASSERT_EQ(two.size(), 2u);
  EXPECT_EQ(two[0].InstrumentCode, L"a");
  EXPECT_EQ(two[1].InstrumentCode, L"b");
  const std::set<InstrumentKey> shown{InstrumentKey{2, L"d"}, InstrumentKey{2, L"z"}};
  const auto inSet = store_.TakePending(shown);
  ASSERT_EQ(inSet.size(), 1u);
  EXPECT_EQ(inSet[0].InstrumentCode, L"d");
  const std::unordered_set<InstrumentKey> none;
  EXPECT_TRUE(store_.TakePending(none).empty());
  const auto rest = store_.TakePending(0);
  ASSERT_EQ(rest.size(), 2u);
  EXPECT_EQ(rest[0].InstrumentCode, L"c");
  EXPECT_EQ(rest[1].InstrumentCode, L"e");
}

TEST_F(QuoteStoreTest, Version_MovesOnChangesOnly) {
  store_.Get(kB, 0);
  const auto v0 = store_.Version();
  store_.Get(kB, 5);  // reads do not count
  EXPECT_EQ(store_.Version(), v0);
  store_.Update(kB, L"BID", L"1", 6);
  const auto v1 = store_.Version();
  EXPECT_GT(v1, v0);
  EXPECT_EQ(store_.Get(kB, 7).version, v1);
  store_.ExpireMarks(10000);  // nothing marked: no change
  EXPECT_EQ(store_.Version(), v1);
}

TEST_F(QuoteStoreTest, Dump_ListsEveryKey) {
  store_.Get(InstrumentKey{-3, L"X1"}, 0);
  EXPECT_EQ(store_.Dump(), L" [-3 | X1]");
}

TEST(QuoteStore_Instance, OneStorePerProcess) {
  EXPECT_EQ(&QuoteStore::Instance(), &QuoteStore::Instance());
  QuoteStore::Instance().Get(kA, 0);
  EXPECT_EQ(QuoteStore::Instance().PendingCount(), 1u);
}

TEST_F(QuoteStoreTest, ApplyFieldUpdate_WidensTerminalText) {
  store_.Get(InstrumentKey{1, L"Q\uFFFD"}, 0);
  FieldUpdate u;
  u.productId = 1;
  u.instrumentCode = "Q\xc3";  // truncated sequence
  u.fieldName = "REMARKS";
  u.value = "caf\xc3\xa9 \xff ok";
  EXPECT_TRUE(ApplyFieldUpdate(store_, u, 5));
  EXPECT_EQ(store_.Get(InstrumentKey{1, L"Q\uFFFD"}, 6)[Q::Remarks].text, L"caf\u00e9 \uFFFD ok");
}

TEST_F(QuoteStoreTest, Get_InstrumentListArrivingLaterSetsTheFormat) {
  const InstrumentKey late{9, L"LATE"};
  store_.Get(late, 0);
  store_.Update(late, L"BID", L"1.5", 1);
  EXPECT_EQ(store_.Get(late, 2)[Q::Bid].text, L"1.500");
  JInstrumentUnderlying ins;
  ins.productId = 9;
  ins.instrumentCode = "LATE";
  ins.decimals = 1;
  list_.push_back(ins);
  InstrumentMgr_ReadOnly().Fill(&list_);
  const QuoteRecord r = store_.Get(late, 3);
  EXPECT_EQ(r.NumberFormat(), L"%.1f");
  EXPECT_EQ(r[Q::Bid].text, L"1.5");
  EXPECT_EQ(r[Q::Ask].text, L"0.000");  // no value yet: the default text stays
  EXPECT_TRUE(r.changed);
}

TEST(QuoteStore_Threads, WritersAndReadersSeeWholeRecords) {
  QuoteStore store;
  const InstrumentKey k{1, L"T"};
  store.Get(k, 0);
  constexpr int kRounds = 20000;
  std::thread writer([&] {
    for (int i = 1; i <= kRounds; ++i) {
      const std::wstring v = std::to_wstring(i);
      store.Update(k, L"BID", v, static_cast<std::uint32_t>(i));
      store.Update(k, L"ASK", v, static_cast<std::uint32_t>(i));
      if (i % 64 == 0) store.ExpireMarks(static_cast<std::uint32_t>(i));
    }
  });
  int torn = 0;
  for (int i = 0; i < kRounds; ++i) {
    const QuoteRecord r = store.Get(k, 0);
    // BID leads ASK by at most one update; a copy never shows a half-written text.
    const double bid = r[Q::Bid].value, ask = r[Q::Ask].value;
    if (bid < ask || bid > ask + 1) ++torn;
    if (!r[Q::Bid].text.empty() && r[Q::Bid].text.back() != L'0') ++torn;
  }
  writer.join();
  EXPECT_EQ(torn, 0);
  EXPECT_EQ(store.Get(k, 0)[Q::Ask].text, std::to_wstring(kRounds) + L".000");
}
