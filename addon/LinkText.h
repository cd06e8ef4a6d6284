#pragma once
// The JSON link text that hands an instrument from one view to another
// (messages 200/310, drops, 615): {"type":"<type>","data":[{"k":"v",...},...]}.
// Every value is written as a JSON string, numbers included. Values are
// escaped, so any instrument code or name yields a text that parses.
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "hostview/Records.h"

namespace addon {

// Keys shared by every sender and receiver.
namespace linkkey {
inline constexpr const char* kInstrumentCode = "Field_instrument_code";
inline constexpr const char* kExchangeCode = "Field_exchange_code";
inline constexpr const char* kProductId = "Field_product_id";
inline constexpr const char* kSide = "Field_side";
inline constexpr const char* kQty = "Field_qty";
inline constexpr const char* kRelatedOrderType = "Field_related_order_type";
inline constexpr const char* kIndexRelatedOrder = "Field_Index_RelatedOrder";
inline constexpr const char* kTradePrice = "Field_Trade_price";
inline constexpr const char* kOrderType = "Field_Order_type";
inline constexpr const char* kOrderValidity = "Field_Order_validity";
inline constexpr const char* kChartCode = "Field_Chart_code";
inline constexpr const char* kFillPrice = "Field_Fill_price";
inline constexpr const char* kWatchlistAddOrRemove = "Field_watchlist_addOrRemove";
inline constexpr const char* kWatchlistId = "Field_watchlist_id";
inline constexpr const char* kWatchlistName = "Field_watchlist_name";
inline constexpr const char* kTriggerType = "Field_Trigger_type";
inline constexpr const char* kUserProductId = "User_field_product_id";
inline constexpr const char* kUserSaveSpace = "User_field_save_space";
inline constexpr const char* kUserDisplayMode = "User_field_display_mode";
}  // namespace linkkey

// `text` as the inside of a JSON string: quote, backslash and every control
// character are escaped; other bytes (UTF-8) pass unchanged.
std::string JsonEscape(std::string_view text);

// Builds one link text. Pairs go into the current object; NextObject() starts
// another object of the "data" array. Cheap to copy; not thread-bound.
class LinkTextBuilder {
 public:
  explicit LinkTextBuilder(std::string_view type);
  explicit LinkTextBuilder(std::wstring_view type);

  LinkTextBuilder& Add(std::string_view key, std::string_view value);   // "%s":"%s"
  LinkTextBuilder& Add(std::string_view key, std::wstring_view value);  // widened values are narrowed first
  LinkTextBuilder& Add(std::string_view key, const char* value) { return Add(key, std::string_view(value ? value : "")); }
  LinkTextBuilder& Add(std::string_view key, const wchar_t* value) { return Add(key, std::wstring_view(value ? value : L"")); }
  LinkTextBuilder& AddInt64(std::string_view key, std::int64_t value);  // "%s":"%I64d"
  LinkTextBuilder& AddInt32(std::string_view key, std::int32_t value);  // "%s":"%d"
  LinkTextBuilder& NextObject();

  std::string Narrow() const;   // UTF-8
  std::wstring Wide() const;    // what travels in ViewLink::link

 private:
  std::string m_type;
  std::string m_objects;  // finished objects, joined with ","
  std::string m_pairs;    // pairs of the current object
  int m_objectCount = 0;
};

// The first object of "data" as key -> text. String members are taken as they
// are; number and boolean members as their decimal text; other members are
// skipped.
struct LinkText {
  std::string type;
  std::map<std::string, std::string> fields;

  bool Has(const std::string& key) const { return fields.count(key) != 0; }
  // The text of `key`; empty when absent.
  std::string Get(const std::string& key) const;
  std::wstring GetWide(const std::string& key) const;
  // The value read as a decimal integer; nullopt when absent or not a number.
  std::optional<std::int64_t> GetInt64(const std::string& key) const;
};

// Parses a link text. nullopt (ignore it) when the text does not parse, is not
// an object, lacks a "data" array or its element 0, or element 0 is not an object.
std::optional<LinkText> ReadLinkText(std::string_view utf8);
std::optional<LinkText> ReadLinkText(std::wstring_view text);
// The link of a ViewLink record; nullopt when the record or its link is null.
std::optional<LinkText> ReadLinkText(const ViewLink* link);

}  // namespace addon
