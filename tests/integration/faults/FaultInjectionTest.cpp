// Fault injection through the scripted host: each view class, opened from the
// library as the terminal does, gets every host message it handles with a null
// word, empty and large lists (200,000 records), 1 MB texts, invalid UTF-8 and
// NaN/inf/negative numbers in field texts. No synchronous request is answered.
// A view must neither crash nor hang, and no grid cell may show "nan" or "inf";
// a message box it shows carries its caption, the exclamation icon and a text.
// The price view shows an instrument in each watchlist family first, and gets
// its own numbers too (300, 414, 611, and 413, 553, 606, 622 which it leaves alone).
#include <gtest/gtest.h>

#include <QMetaMethod>
#include <QMetaObject>
#include <QRegularExpression>
#include <QWidget>
#include <cmath>
#include <functional>
#include <limits>
#include <set>
#include <tuple>
#include <string>
#include <vector>

#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"
#include "mvtest/ScriptedHost.h"

namespace {

// Records in a "large" list: 200,000 (about 10 s and 1 GB for the busiest view);
// a tenth of that under AddressSanitizer, which is several times slower.
#if defined(__SANITIZE_ADDRESS__)
constexpr std::size_t kLarge = 20000;
#else
constexpr std::size_t kLarge = 200000;
#endif
const std::string kMegabyte(1 << 20, 'W');
const std::string kBadUtf8 = "\xff\xfe\xc3(\xe2\x82\xed\xa0\x80\xf0\x28\x8c\x28";
const std::wstring kMegabyteW(1 << 20, L'W');
const std::wstring kBadWide = std::wstring(L"\xd800\xdfff") + wchar_t(0x110000) + L"\xfffe";
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kInf = std::numeric_limits<double>::infinity();

// Field texts a terminal or a damaged feed might send for a number.
const std::vector<std::string> kBadNumbers = {
    "nan", "NaN", "-nan", "inf", "-inf", "Infinity", "-Infinity", "1e309", "-1e309", "-1", "-0",
    "-123456789012345678901234567890", "1e-320", "0x1p3", "1,2,3", "--5", "", " ", kBadUtf8, kMegabyte};

// Every grid of a view (anything with dumpTsv), dumped.
std::vector<QString> GridDumps(CSuperBaseView* view) {
  std::vector<QString> dumps;
  for (QWidget* w : view->findChildren<QWidget*>()) {
    if (w->metaObject()->indexOfMethod("dumpTsv()") < 0) continue;
    QString tsv;
    QMetaObject::invokeMethod(w, "dumpTsv", Qt::DirectConnection, Q_RETURN_ARG(QString, tsv));
    dumps.push_back(w->objectName() + ":\n" + tsv);
  }
  return dumps;
}

// A cell showing a non-finite number, however it is written.
bool ShowsNonFinite(const QString& dump) {
  static const QRegularExpression re(QStringLiteral(R"((?i)(^|[\t\n\s+\-(])(nan|inf)(inity)?($|[\t\n\s%)]))"));
  return re.match(dump).hasMatch();
}

std::vector<JInstrumentUnderlying> Instruments(std::size_t n, const std::string& text) {
  std::vector<JInstrumentUnderlying> list(n);
  for (std::size_t i = 0; i < n; ++i) {
    auto& r = list[i];
    r.productId = i == 0 ? 5 : static_cast<std::int64_t>(i) * (i % 2 ? -1 : 1);
    r.instrumentCode = i == 0 ? "BN4" : "X" + std::to_string(i) + text;
    r.exchangeCode = text;
    r.instrumentName = text;
    r.decimals = static_cast<std::int32_t>(i % 7) - 3;  // negative and large decimals too
    if (i % 3 == 1) r.decimals = 1000;
    r.referencePrice = i % 2 ? kNaN : -kInf;
    r.lotSize = -static_cast<std::int64_t>(i);
    r.sector = text;
    r.productType = text;
  }
  return list;
}

PriceAlertItem Alert(std::size_t i, const std::string& t) {
  PriceAlertItem a;
  a.alertId = static_cast<std::int32_t>(i) - 1;
  a.productId = i % 2 ? 5 : -1;
  a.instrumentCode = i % 2 ? "BN4" : t;
  a.exchangeCode = t;
  a.validUntil = t;
  a.priceField = t;
  a.comparator = t;
  const double values[] = {kNaN, kInf, -kInf, -1.0, 1e308};
  a.triggerValue = values[i % 5];
  a.status = i % 3 ? (i % 2 ? "Active" : "Triggered") : t;
  a.hostTextA = t;
  a.hostTextB = i % 2 ? "nan" : "inf";
  return a;
}


struct Fault {
  std::string name;
  std::function<void(mvtest::ScriptedHost&, CSuperBaseView*)> deliver;
};

// Sends `message` with `word` pointing at a fresh copy of `value`.
template <class T>
Fault With(const std::string& name, UINT message, T value) {
  return {name, [message, value](mvtest::ScriptedHost& host, CSuperBaseView* v) {
            T copy = value;
            host.Send(v, message, ToLParam(&copy));
          }};
}

template <class Row>
void AddListFaults(std::vector<Fault>& out, UINT message, const std::function<Row(std::size_t, const std::string&)>& make) {
  const std::string id = std::to_string(message);
  out.push_back(With(id + " empty list", message, std::vector<Row>{}));
  for (const std::string* text : {&kMegabyte, &kBadUtf8}) {
    std::vector<Row> few;
    for (std::size_t i = 0; i < 3; ++i) few.push_back(make(i, *text));
    out.push_back(With(id + (text == &kMegabyte ? " 1MB texts" : " invalid UTF-8"), message, few));
  }
  std::vector<Row> large;
  large.reserve(kLarge);
  for (std::size_t i = 0; i < kLarge; ++i) large.push_back(make(i, "n" + std::to_string(i % 97)));
  out.push_back(With(id + " large list", message, std::move(large)));
  // And back to a short one, as after a reconnect (keeps the later checks quick).
  std::vector<Row> one{make(1, "SGX")};
  out.push_back(With(id + " short list again", message, one));
}

// The price view's field relay (414): the leading price view writes it into
// the quote store, and "INSTRNAME" into the instrument record.
constexpr UINT kRelayedField = hm::InstrumentFieldUpdate;

// The price view's own numbers: the watchlist reload (300 with a family), the
// relayed field (414), the acknowledged ids (611), and the numbers it only
// sends (413, 553) or leaves to the terminal (606, 622), which must change
// nothing whatever their word points at.
void AddPriceViewFaults(std::vector<Fault>& f) {
  // BN4 on screen again (the list faults above replaced every watchlist).
  f.push_back({"watchlists again", [](mvtest::ScriptedHost& h, CSuperBaseView* v) {
                 const std::vector<JWatchlistRow> user{{1, 5, "Faults", "BN4", 1, 0}};
                 h.Send(v, hm::WatchlistList, ToLParam(&user));
                 h.Send(v, hm::WatchlistsLoaded, 0);
                 h.Advance(1200);
               }});
  AddListFaults<JWatchlistIdRow>(f, hm::SaveWatchlistNames, [](std::size_t i, const std::string& t) {
    return JWatchlistIdRow{static_cast<std::int32_t>(i) - 1, i % 2 ? std::string("Faults") : t};
  });
  // Numbers for the number fields; texts for the instrument name and remarks
  // (a name that reads "nan" is a name, not a number).
  const std::vector<std::string> badTexts = {"", " ", kBadUtf8, kMegabyte};
  for (const std::string& name : {std::string("LAST"), std::string("BID"), std::string("PCHANGE"), std::string("VOL"),
                                  std::string("INSTRNAME"), std::string("REMARKS"), kBadUtf8}) {
    const bool text = name == "INSTRNAME" || name == "REMARKS";
    for (const std::string& value : text ? badTexts : kBadNumbers)
      f.push_back(With("414 " + name.substr(0, 10), kRelayedField, FieldUpdate{5, "BN4", name, value, 0, 0}));
  }
  f.push_back(With("414 unknown instrument", kRelayedField, FieldUpdate{-5, kMegabyte, "INSTRNAME", kBadUtf8, 0, 0}));
  f.push_back(With("414 other kind", kRelayedField, FieldUpdate{5, "BN4", "LAST", "nan", 7, -1}));
  for (UINT m : {hm::PriceViewRequest413, hm::PriceViewRequest553, hm::Watchlist606, hm::Watchlist622}) {
    const std::string id = std::to_string(m);
    f.push_back(With(id + " split value", m, JSplitValue{-1, std::numeric_limits<std::int32_t>::min()}));
    f.push_back(With(id + " empty list", m, std::vector<JWatchlistRow>{}));
    f.push_back(With(id + " large list", m, std::vector<JWatchlistRow>(kLarge, JWatchlistRow{1, 5, "Faults", "BN4", 1, 0})));
    f.push_back(With(id + " 1MB text", m, kMegabyteW));
    f.push_back(With(id + " invalid UTF-8", m, kBadUtf8));
    f.push_back(With(id + " non-finite", m, JPriceInformation{kNaN, kInf, -kInf, -1.0}));
    f.push_back(With(id + " save record", m, WatchlistFeedback{-1, kMegabyteW}));
  }
}

// Every host -> view message number of the channel with its word shapes.
std::vector<Fault> ChannelFaults() {
  std::vector<Fault> f;
  // Null word on every number (pointer-carrying or not).
  for (UINT m : {hm::Deactivate, hm::Activate, hm::LinkData, hm::FieldValue, hm::RequestField, hm::InstrumentList,
                 hm::ExchangeList, hm::RemarkMessages, hm::ProductList, hm::AlertBoardRequest, hm::TextByKey,
                 hm::SystemParameter, hm::NoticeParameter, hm::DisplayMode, hm::WatchlistGroups520,
                 hm::WatchlistGroups521, hm::WatchlistRows522, hm::LinkModeFlag, hm::CompactLayout,
                 hm::FindByChartCode, hm::FindByCode, hm::MarketInfo, hm::ExchangeEnabled, hm::WatchlistList,
                 hm::LinkedInstrument, hm::FontSizeMenu, hm::Alert701, hm::Alert702, hm::Alert703, hm::Alert704,
                 hm::Alert705, hm::PriceBands, hm::AltStatus, hm::SettingsChanged, hm::Sectors, hm::MessageText,
                 hm::WatchlistsLoaded, kRelayedField, hm::SaveWatchlistNames, hm::PriceViewRequest413,
                 hm::PriceViewRequest553, hm::Watchlist606, hm::Watchlist622})
    f.push_back({"null " + std::to_string(m), [m](mvtest::ScriptedHost& h, CSuperBaseView* v) { h.Send(v, m, 0); }});
  // Numbers in the word: out of range, negative, huge.
  for (UINT m : {hm::DisplayMode, hm::LinkModeFlag, hm::CompactLayout, hm::ExchangeEnabled, hm::AltStatus,
                 hm::WatchlistsLoaded, hm::PriceViewRequest413, hm::PriceViewRequest553, hm::Watchlist606,
                 hm::Watchlist622})
    for (LPARAM value : {LPARAM(-1), LPARAM(2), LPARAM(999999), std::numeric_limits<LPARAM>::min(),
                         std::numeric_limits<LPARAM>::max()})
      f.push_back({std::to_string(m) + " word " + std::to_string(value),
                   [m, value](mvtest::ScriptedHost& h, CSuperBaseView* v) { h.Send(v, m, value); }});
  // Texts.
  for (UINT m : {hm::TextByKey, hm::MessageText, hm::LinkedInstrument}) {
    f.push_back(With(std::to_string(m) + " empty", m, std::wstring()));
    f.push_back(With(std::to_string(m) + " 1MB", m, kMegabyteW));
    f.push_back(With(std::to_string(m) + " bad wide", m, kBadWide));
    f.push_back(With(std::to_string(m) + " broken JSON", m, std::wstring(L"{\"type\":\"x\",\"data\":[{\"Field_product_id\":\"nan\"")));
  }
  for (UINT m : {hm::SystemParameter, hm::NoticeParameter}) {
    f.push_back(With(std::to_string(m) + " empty", m, std::string()));
    f.push_back(With(std::to_string(m) + " 1MB", m, kMegabyte));
    f.push_back(With(std::to_string(m) + " invalid UTF-8", m, kBadUtf8));
  }
  // Links: no text, huge, invalid, numbers that are not.
  f.push_back(With("310 no link text", hm::LinkData, ViewLink{L"CX", 1, 0, nullptr}));
  static const std::vector<std::wstring> links = {
      kMegabyteW, kBadWide, L"{", L"[]", L"{\"data\":{}}", L"{\"data\":[1,2,3]}",
      L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":\"BN4\",\"Field_product_id\":\"nan\"}]}",
      L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":\"BN4\",\"Field_product_id\":\"-1e309\"}]}",
      L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":7,\"Field_product_id\":[]}]}"};
  for (const auto& text : links) {
    f.push_back({"310 link " + std::to_string(text.size()), [&text](mvtest::ScriptedHost& h, CSuperBaseView* v) {
                   h.SendLink(v, text);
                 }});
  }
  // Reference lists: null inner list, empty, large, bad texts.
  f.push_back(With("500 null inner", hm::InstrumentList, JInstrumentListMsg{5, 0, nullptr}));
  f.push_back(With("505 null inner", hm::ProductList, JProductListMsg{5, nullptr}));
  f.push_back(With("503 null inner", hm::ExchangeList, JExchangeListMsg{5, 0, nullptr}));
  for (const auto& [name, list] : std::vector<std::pair<std::string, std::vector<JInstrumentUnderlying>>>{
           {"empty", {}}, {"1MB", Instruments(3, kMegabyte)}, {"invalid UTF-8", Instruments(3, kBadUtf8)},
           {"large", Instruments(kLarge, "n")}}) {
    f.push_back({"500 " + name, [list](mvtest::ScriptedHost& h, CSuperBaseView* v) {
                   JInstrumentListMsg msg{-1, 0, &list};
                   h.Send(v, hm::InstrumentList, ToLParam(&msg));
                 }});
  }
  for (const std::string& text : {std::string(), kMegabyte, kBadUtf8}) {
    std::vector<JProduct> products{{5, text, text}, {-1, text, text}};
    f.push_back({"505 texts", [products](mvtest::ScriptedHost& h, CSuperBaseView* v) {
                   JProductListMsg msg{-7, &products};
                   h.Send(v, hm::ProductList, ToLParam(&msg));
                 }});
    std::vector<JExchangeList> exchanges{{text, text, text, 5}};
    f.push_back({"503 texts", [exchanges](mvtest::ScriptedHost& h, CSuperBaseView* v) {
                   JExchangeListMsg msg{0, 0, &exchanges};
                   h.Send(v, hm::ExchangeList, ToLParam(&msg));
                 }});
  }
  {
    std::vector<JProduct> products(kLarge);
    for (std::size_t i = 0; i < kLarge; ++i) products[i] = {static_cast<std::int64_t>(i), "ES", "P" + std::to_string(i)};
    f.push_back({"505 large", [products](mvtest::ScriptedHost& h, CSuperBaseView* v) {
                   JProductListMsg msg{static_cast<std::intptr_t>(products.size()), &products};
                   h.Send(v, hm::ProductList, ToLParam(&msg));
                 }});
  }
  AddListFaults<JMarketInfo>(f, hm::MarketInfo, [](std::size_t i, const std::string& t) {
    return JMarketInfo{5, t, -static_cast<std::int32_t>(i) - 1, t, t, t, t};
  });
  AddListFaults<JRemarkMessage>(f, hm::RemarkMessages, [](std::size_t, const std::string& t) { return JRemarkMessage{t, t, t}; });
  AddListFaults<JWatchlistRow>(f, hm::WatchlistList, [](std::size_t i, const std::string& t) {
    return JWatchlistRow{static_cast<std::int32_t>(i % 3) - 1, -5, t, t, -static_cast<std::int32_t>(i), 0};
  });
  AddListFaults<JKeldoWatchlistRow>(f, hm::WatchlistRows522, [](std::size_t i, const std::string& t) {
    return JKeldoWatchlistRow{static_cast<std::int32_t>(i % 3) - 1, t, -1, t, t, -static_cast<std::int32_t>(i)};
  });
  for (UINT m : {hm::WatchlistGroups520, hm::WatchlistGroups521})
    AddListFaults<JTop30Group>(f, m, [](std::size_t, const std::string& t) {
      return JTop30Group{t, {JTop30List{t, {JTop30Item{-1, t, t}}}, JTop30List{t, {}}}};
    });
  AddListFaults<JSector>(f, hm::Sectors, [](std::size_t, const std::string& t) { return JSector{t, t}; });
  // Alerts: non-finite trigger values, unknown fields, a large list.

  AddListFaults<PriceAlertItem>(f, hm::Alert701, Alert);
  for (UINT m : {hm::Alert702, hm::Alert703, hm::Alert705})
    for (std::size_t i = 0; i < 5; ++i) f.push_back(With(std::to_string(m) + " alert", m, Alert(i + 1, kBadUtf8)));
  f.push_back(With("704 empty", hm::Alert704, std::vector<std::int32_t>{}));
  f.push_back(With("704 ids", hm::Alert704, std::vector<std::int32_t>{-1, 0, std::numeric_limits<std::int32_t>::max()}));
  // Price information and bands with non-finite and negative numbers.
  for (double d : {kNaN, kInf, -kInf, -1.0, 0.0})
    f.push_back(With("513 " + std::to_string(d), hm::AlertBoardRequest, JPriceInformation{d, d, d, d}));
  f.push_back(With("2301 null bands", hm::PriceBands, JTickBandList{3, nullptr}));
  {
    static const std::vector<TickBand> bands = {{0, kNaN, kInf, kNaN}, {0, -1, 5, 0}, {0, 0, 10, -0.5},
                                                {-1, 10, 0, 1e-300}, {0, -kInf, kInf, kInf}};
    f.push_back(With("2301 bad bands", hm::PriceBands, JTickBandList{5, &bands}));
    static std::vector<TickBand> many;
    for (std::size_t i = 0; i < kLarge; ++i) many.push_back({static_cast<std::int32_t>(i % 4), double(i), double(i + 1), 0.01});
    f.push_back(With("2301 large", hm::PriceBands, JTickBandList{static_cast<std::int32_t>(many.size()), &many}));
  }
  // Lookup answers outside a question.
  {
    static const std::vector<JInstrumentUnderlying> odd = Instruments(2, kBadUtf8);
    for (UINT m : {hm::FindByChartCode, hm::FindByCode})
      f.push_back({std::to_string(m) + " unasked", [m](mvtest::ScriptedHost& h, CSuperBaseView* v) {
                     h.Send(v, m, ToLParam(&odd[1]));
                   }});
  }
  for (UINT m : {hm::FontSizeMenu, hm::SettingsChanged, hm::Deactivate, hm::Activate})
    f.push_back({std::to_string(m), [m](mvtest::ScriptedHost& h, CSuperBaseView* v) { h.Send(v, m, 0); }});
  AddPriceViewFaults(f);
  return f;
}

// Answers each field the view asked for (412/400) with every bad number, then
// with malformed and large "TRADEDATA" texts: the field path a feed takes.
void FeedBadFieldValues(mvtest::ScriptedHost& host, CSuperBaseView* view) {
  // Each distinct request once; after a large alert list the first few hundred
  // stand for the rest.
  std::vector<FieldRequest> asked;
  std::set<std::tuple<std::int64_t, std::string, std::string, std::int32_t, std::int32_t>> seen;
  for (const auto& r : host.RequestsFrom(view))
    if ((r.message == hm::RequestField || r.message == hm::FetchFields) && r.field && asked.size() < 300 &&
        seen.insert({r.field->productId, r.field->instrumentCode, r.field->fieldName, r.field->param, r.field->kind})
            .second)
      asked.push_back(*r.field);
  std::vector<std::string> tradeData = {
      "nan|inf|-inf|nan||1", "10:00:01|nan|5|1||101;10:00:00|inf|-5|2||100",
      "TOTALS:|nan|inf|-1||nan;nan|inf|-inf|1e309||-1", ";;;|||;", "10:00:01|1.0|5|1||-2147483649",
      "10:00:01|1.0|5|1||99999999999999999999", kBadUtf8 + "|" + kBadUtf8, kMegabyte};
  std::string large;
  for (std::size_t i = kLarge; i > 0; --i)
    large += "10:00:01|" + std::string(i % 3 ? "1.5" : "nan") + "|" + std::to_string(i) + "|1||" + std::to_string(i) + ";";
  tradeData.push_back(large);
  for (const FieldRequest& req : asked) {
    std::vector<std::string> names;
    std::string::size_type start = 0;
    while (start <= req.fieldName.size()) {
      const auto comma = req.fieldName.find(',', start);
      names.push_back(req.fieldName.substr(start, comma - start));
      if (comma == std::string::npos) break;
      start = comma + 1;
    }
    for (const std::string& name : names) {
      if (name == "PMP_Submit") continue;
      const auto& values = name == "TRADEDATA" ? tradeData : kBadNumbers;
      for (const std::string& value : values)
        for (UINT m : {hm::RequestField, hm::FieldValue}) {
          FieldUpdate u{req.productId, req.instrumentCode, name, value, req.param, req.kind};
          host.SendField(view, m, u);
        }
    }
  }
  // A field nobody asked for, and an instrument nobody shows.
  host.SendField(view, hm::FieldValue, FieldUpdate{5, "BN4", kBadUtf8, "nan", -1, 99});
  host.SendField(view, hm::FieldValue, FieldUpdate{-1, kMegabyte, "LAST", "inf", 0, 0});
}

struct ViewCase {
  const char* className;
};

class FaultInjection : public testing::TestWithParam<ViewCase> {
 protected:
  void SetUp() override {
    view = host.Open(GetParam().className);
    ASSERT_NE(view, nullptr) << host.Requests().size();
    // An instrument to show, so the feed paths are live.
    instruments = Instruments(1, "SGX");
    instruments[0].decimals = 3;
    instruments[0].referencePrice = 1.0;
    products = {{5, "ES", "Shares"}};
    JProductListMsg productList{1, &products};
    host.Send(view, hm::ProductList, ToLParam(&productList));
    JInstrumentListMsg instrumentList{1, 0, &instruments};
    host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
    host.SendLink(view, L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":\"BN4\",\"Field_product_id\":\"5\"}]}");
    host.Advance(600);
    if (std::string(GetParam().className) == "CPriceViewAdv") SetUpWatchlists();
  }

  // The price view shows BN4 in a user, a TOP30 and a brand watchlist (the
  // terminal relays the view's 300 back), so the faults reach its cells.
  void SetUpWatchlists() {
    const std::vector<JWatchlistRow> user{{1, 5, "Faults", "BN4", 1, 0}};
    host.Send(view, hm::WatchlistList, ToLParam(&user));
    host.Send(view, hm::WatchlistsLoaded, 0);
    const std::vector<JTop30Group> top30{{"SGX", {{"TOPGAIN", {{5, "BN4", "SGX"}}}}}};
    host.Send(view, hm::WatchlistGroups521, ToLParam(&top30));
    host.Send(view, hm::WatchlistsLoaded, 1);
    const std::vector<JKeldoWatchlistRow> brand{{7, "Brand", 5, "BN4", "SGX", 1}};
    host.Send(view, hm::WatchlistRows522, ToLParam(&brand));
    host.Send(view, hm::WatchlistsLoaded, 2);
    host.Advance(1200);
  }

  // A message box the view showed must carry the view's caption, the
  // exclamation icon and a text: the design's, or the lookup key of a
  // message code the terminal did not answer.
  void CheckRefusals(const std::string& after) {
    for (const auto& shown : host.dialogs.shown) {
      if (shown.kind != platform::RecordingDialogService::Shown::Box) continue;
      EXPECT_EQ(shown.caption.toStdWString(), host.appTitle) << after;
      EXPECT_EQ(shown.icon, platform::Icon::Exclamation) << after;
      EXPECT_FALSE(shown.text.trimmed().isEmpty()) << after;
    }
    host.dialogs.shown.clear();
  }

  void CheckGrids(const std::string& after) {
    for (const QString& dump : GridDumps(view))
      ASSERT_FALSE(ShowsNonFinite(dump)) << GetParam().className << " after " << after << "\n"
                                         << dump.left(2000).toStdString();
  }

  mvtest::ScriptedHost host;
  CSuperBaseView* view = nullptr;
  std::vector<JInstrumentUnderlying> instruments;
  std::vector<JProduct> products;
};

TEST_P(FaultInjection, BadFieldValuesNeverShowAsNonFiniteNumbers) {
  // The exchange check answered, so the views subscribe; alerts on the list.
  host.AnswerValue(hm::ExchangeEnabled, 1);
  host.SendLink(view, L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":\"BN4\",\"Field_product_id\":\"5\"}]}");
  std::vector<PriceAlertItem> alerts;
  for (std::size_t i = 0; i < 10; ++i) alerts.push_back(Alert(i, "SGX"));
  host.Send(view, hm::Alert701, ToLParam(&alerts));
  host.Advance(600);
  FeedBadFieldValues(host, view);
  host.Advance(600);
  CheckGrids("bad field values");
  CheckRefusals("bad field values");
  if (std::string(GetParam().className) == "CPriceViewAdv") {
    // The watchlist is on screen: the faults above reached its cells.
    bool shown = false;
    for (const QString& dump : GridDumps(view)) shown |= dump.contains(QStringLiteral("\tBN4\t"));
    EXPECT_TRUE(shown);
  }
  // Again after the view re-asks (pages, refresh): the new requests get the same treatment.
  host.Advance(5000);
  FeedBadFieldValues(host, view);
  host.Advance(600);
  CheckGrids("bad field values, second round");
}

TEST_P(FaultInjection, EveryMessageWithBadDataLeavesAWorkingView) {
  // The terminal keeps a 500 list alive until the next 500: so do the faults.
  const std::vector<Fault> faults = ChannelFaults();
  for (const Fault& fault : faults) {
    SCOPED_TRACE(fault.name);
    fault.deliver(host, view);
    host.Advance(300);
    CheckGrids(fault.name);
    CheckRefusals(fault.name);
    if (HasFatalFailure()) return;
  }
  // Still alive and still answering: the real list again, re-link and feed.
  JInstrumentListMsg instrumentList{1, 0, &instruments};
  host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
  host.SendLink(view, L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":\"BN4\",\"Field_product_id\":\"5\"}]}");
  host.Advance(600);
  FeedBadFieldValues(host, view);
  host.Advance(600);
  CheckGrids("the end");
  // A refused trade ticket after all that, with the message text unanswered:
  // the box shows the lookup key, as for any code without a text.
  const std::string cls = GetParam().className;
  if (cls != "CNewPriceAlertAdv" && cls != "CPriceAlertList") {
    host.dialogs.shown.clear();
    const std::wstring ticket = L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":\"BN4\",\"Field_product_id\":\"5\"}]}";
    platform::SendMessage(view, platform::RegisterWindowMessage("MSG_WLOPENTRADE"), WPARAM(ToLParam(&ticket)), -1);
    ASSERT_EQ(host.dialogs.shown.size(), 1u);
    EXPECT_EQ(host.dialogs.shown[0].text.toStdString(), "17007, 0");
    CheckRefusals("a refused trade ticket");
  }
  host.Destroy(view);
}

INSTANTIATE_TEST_SUITE_P(AllViews, FaultInjection,
                         testing::Values(ViewCase{"CMarketDepthAdv"}, ViewCase{"CTimeAndSalesAdv"},
                                         ViewCase{"CTradeSummaryAdv"}, ViewCase{"CNewPriceAlertAdv"},
                                         ViewCase{"CPriceAlertList"}, ViewCase{"CPriceViewAdv"}),
                         [](const testing::TestParamInfo<ViewCase>& info) { return std::string(info.param.className + 1); });

}  // namespace
