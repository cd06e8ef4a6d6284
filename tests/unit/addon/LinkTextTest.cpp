#include <gtest/gtest.h>
#include <json/json.h>

#include "addon/LinkText.h"

namespace {

using addon::LinkTextBuilder;
using addon::ReadLinkText;

// What any JSON reader makes of a text the add-on sends.
Json::Value ParseStrict(const std::string& text) {
  Json::CharReaderBuilder builder;
  builder["failIfExtra"] = true;
  std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
  Json::Value root;
  std::string errors;
  EXPECT_TRUE(reader->parse(text.data(), text.data() + text.size(), &root, &errors)) << text << ": " << errors;
  return root;
}

TEST(LinkText_Builder, WritesEnvelopeAndQuotedPairs) {
  const std::string text = LinkTextBuilder("price view")
                               .Add("Field_instrument_code", "0005")
                               .AddInt64("Field_product_id", 9000000000LL)
                               .AddInt32("Field_qty", -12)
                               .Narrow();
  EXPECT_EQ(text,
            "{\"type\":\"price view\",\"data\":[{\"Field_instrument_code\":\"0005\","
            "\"Field_product_id\":\"9000000000\",\"Field_qty\":\"-12\"}]}");
  EXPECT_EQ(LinkTextBuilder("price view").Add("k", "v").Wide(),
            L"{\"type\":\"price view\",\"data\":[{\"k\":\"v\"}]}");
}

TEST(LinkText_Builder, JoinsSeveralObjectsInTheDataArray) {
  const std::string text = LinkTextBuilder("t").Add("a", "1").NextObject().Add("b", "2").Narrow();
  EXPECT_EQ(text, "{\"type\":\"t\",\"data\":[{\"a\":\"1\"},{\"b\":\"2\"}]}");
  EXPECT_EQ(LinkTextBuilder("t").Narrow(), "{\"type\":\"t\",\"data\":[{}]}");
}

TEST(LinkText_Builder, EscapesCodesSoEveryTextParses) {
  const std::string nasty = "AB\"C\\D\n\t\x01 end";
  const std::wstring wideName = L"Caf\u00e9 \"Nord\"";
  const std::string text = LinkTextBuilder("price \"view\"")
                               .Add("Field_instrument_code", nasty)
                               .Add("Field_watchlist_name", wideName)
                               .Narrow();
  const Json::Value root = ParseStrict(text);
  EXPECT_EQ(root["type"].asString(), "price \"view\"");
  EXPECT_EQ(root["data"][0u]["Field_instrument_code"].asString(), nasty);

  // The add-on's own reader gets the same values back, through the wide form too.
  const auto link = ReadLinkText(LinkTextBuilder("x").Add("Field_instrument_code", nasty)
                                     .Add("Field_watchlist_name", wideName).Wide());
  ASSERT_TRUE(link);
  EXPECT_EQ(link->Get("Field_instrument_code"), nasty);
  EXPECT_EQ(link->GetWide("Field_watchlist_name"), wideName);
}

TEST(LinkText_Escape, LeavesPlainTextAndUtf8Alone) {
  EXPECT_EQ(addon::JsonEscape("0005.HK"), "0005.HK");
  EXPECT_EQ(addon::JsonEscape("\xE6\x97\xA5"), "\xE6\x97\xA5");
  EXPECT_EQ(addon::JsonEscape("a\"b\\c"), "a\\\"b\\\\c");
  EXPECT_EQ(addon::JsonEscape(std::string("\x1f\x7f", 2)), "\\u001f\\u007f");
}

TEST(LinkText_Reader, ReadsStringMembersOfTheFirstElement) {
  const auto link = ReadLinkText(std::string_view(
      R"({"type":"depth","data":[{"Field_instrument_code":"0005","Field_product_id":"12","User_field_save_space":1},)"
      R"({"Field_instrument_code":"other"}]})"));
  ASSERT_TRUE(link);
  EXPECT_EQ(link->type, "depth");
  EXPECT_EQ(link->Get("Field_instrument_code"), "0005");
  EXPECT_EQ(link->GetInt64("Field_product_id"), 12);
  EXPECT_EQ(link->Get("User_field_save_space"), "1");
  EXPECT_FALSE(link->Has("Field_side"));
  EXPECT_EQ(link->Get("Field_side"), "");
}

TEST(LinkText_Reader, IgnoresMalformedOrIncompleteTexts) {
  for (const char* bad : {"", "not json", "{\"type\":\"x\",\"data\":[{\"a\":\"1\"}]", "[1,2]",
                          "{\"type\":\"x\"}", "{\"type\":\"x\",\"data\":[]}", "{\"type\":\"x\",\"data\":{}}",
                          "{\"type\":\"x\",\"data\":[\"a\"]}", "{\"data\":[{\"a\":\"1\"}]} trailing"}) {
    EXPECT_FALSE(ReadLinkText(std::string_view(bad))) << bad;
  }
  EXPECT_FALSE(ReadLinkText(static_cast<const ViewLink*>(nullptr)));
  ViewLink noText;
  EXPECT_FALSE(ReadLinkText(&noText));
}

TEST(LinkText_Reader, NumbersMustBeWholeDecimals) {
  const auto link = ReadLinkText(std::string_view(R"({"data":[{"a":" 42 ","b":"4x","c":"","d":"-7"}]})"));
  ASSERT_TRUE(link);
  EXPECT_EQ(link->GetInt64("a"), 42);
  EXPECT_FALSE(link->GetInt64("b"));
  EXPECT_FALSE(link->GetInt64("c"));
  EXPECT_EQ(link->GetInt64("d"), -7);
  EXPECT_FALSE(link->GetInt64("missing"));
}

}  // namespace
