// The message encoding of --trace-messages and the view fuzz harnesses:
// what the terminal writes decodes to the same records, and any bytes decode
// to something without reading past the end.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <string>

#include "hostview/MessageIds.h"
#include "hostview/MessageTrace.h"

namespace {

using hv::trace::Message;
using hv::trace::Reader;

// Encodes one message and decodes it again.
void RoundTrip(UINT number, LPARAM word, Message& out) {
  std::string bytes;
  hv::trace::Encode(number, word, bytes);
  Reader in(bytes);
  ASSERT_TRUE(hv::trace::Decode(in, out));
  EXPECT_TRUE(in.AtEnd()) << number;
  EXPECT_EQ(out.number, number);
}

TEST(MessageTrace, RecordsListsAndTextsComeBackAsSent) {
  {
    const FieldUpdate u{-101, "A97", "LAST", "1,234.5", 99999, 2};
    Message m;
    RoundTrip(hm::FieldValue, ToLParam(&u), m);
    const auto& got = *FromLParam<const FieldUpdate>(m.word);
    EXPECT_EQ(got.productId, -101);
    EXPECT_EQ(got.instrumentCode, "A97");
    EXPECT_EQ(got.fieldName, "LAST");
    EXPECT_EQ(got.value, "1,234.5");
    EXPECT_EQ(got.param, 99999);
    EXPECT_EQ(got.kind, 2);
  }
  {
    std::vector<JInstrumentUnderlying> list(2);
    list[1].instrumentCode = "W96";
    list[1].productId = std::numeric_limits<std::int64_t>::min();
    list[1].referencePrice = std::numeric_limits<double>::quiet_NaN();
    list[1].decimals = -3;
    const JInstrumentListMsg msg{7, 0, &list};
    Message m;
    RoundTrip(hm::InstrumentList, ToLParam(&msg), m);
    const auto& got = *FromLParam<const JInstrumentListMsg>(m.word);
    EXPECT_EQ(got.count, 7);
    ASSERT_NE(got.instruments, nullptr);
    ASSERT_EQ(got.instruments->size(), 2u);
    EXPECT_EQ((*got.instruments)[1].instrumentCode, "W96");
    EXPECT_EQ((*got.instruments)[1].productId, std::numeric_limits<std::int64_t>::min());
    EXPECT_TRUE(std::isnan((*got.instruments)[1].referencePrice));
    EXPECT_EQ((*got.instruments)[1].decimals, -3);
  }
  {
    const std::wstring link = std::wstring(L"{\"data\":[]}") + wchar_t(0xD800) + wchar_t(0x110000);
    const ViewLink vl{L"CMarketDepthAdv", 1, 0, &link};
    Message m;
    RoundTrip(hm::LinkData, ToLParam(&vl), m);
    const auto& got = *FromLParam<const ViewLink>(m.word);
    EXPECT_EQ(got.className, L"CMarketDepthAdv");
    ASSERT_NE(got.link, nullptr);
    EXPECT_EQ(*got.link, link);  // invalid code points too
  }
  {
    const std::vector<JTop30Group> groups{{"SGX", {{"TOPGAIN", {{101, "A97", "SGX"}}}, {"TOPVOL", {}}}}};
    Message m;
    RoundTrip(hm::WatchlistGroups521, ToLParam(&groups), m);
    const auto& got = *FromLParam<const std::vector<JTop30Group>>(m.word);
    ASSERT_EQ(got.size(), 1u);
    ASSERT_EQ(got[0].lists.size(), 2u);
    EXPECT_EQ(got[0].lists[0].instruments[0].instrumentCode, "A97");
    EXPECT_EQ(got[0].lists[1].listName, "TOPVOL");
  }
  {
    Message m;
    RoundTrip(hm::AltStatus, -2, m);
    EXPECT_EQ(m.word, -2);
    RoundTrip(hm::Watchlist606, std::numeric_limits<LPARAM>::min(), m);
    EXPECT_EQ(m.word, std::numeric_limits<LPARAM>::min());
  }
}

TEST(MessageTrace, ANullWordStaysNull) {
  for (UINT number : {hm::LinkData, hm::FieldValue, hm::InstrumentList, hm::TextByKey, hm::SystemParameter,
                      hm::Alert701, hm::PriceBands, hm::Sectors}) {
    Message m;
    RoundTrip(number, 0, m);
    EXPECT_EQ(m.word, 0) << number;
  }
}

TEST(MessageTrace, AnyBytesDecodeWithinTheirLength) {
  // A count far beyond the bytes, a truncated double, a length past the end.
  const std::string cases[] = {
      std::string("\xf4\x03\x01\xff\xff\xff\xff\x0f", 8),  // 500, present, count as large as it gets
      std::string("\xbd\x05\x01\xff\xff\xff\x7f", 7),  // 701, a list of "2^28" alerts
      std::string("\x81\x04\x01\x00\x00", 5),              // 513 with two bytes of a double
      std::string("\x9a\x03\x01\x05\x80\x80\x80\x80\x80\x80\x80\x80\x80\x80\x01", 15)};
  for (const std::string& bytes : cases) {
    Reader in(bytes);
    Message m;
    ASSERT_TRUE(hv::trace::Decode(in, m));
    EXPECT_TRUE(in.AtEnd()) << m.number;
    EXPECT_NE(m.word, 0) << m.number;
  }
}

}  // namespace
