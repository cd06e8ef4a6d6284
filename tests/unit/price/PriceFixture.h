#pragma once
// A scripted host with a small market for the price view: products,
// exchanges, instruments of several exchanges and access statuses, a brand
// twin, world indices; helpers to feed the host's replies and quote values
// as the terminal does, and to read what the grid shows.
#include <gtest/gtest.h>

#include <QApplication>
#include <QMouseEvent>
#include <string>
#include <vector>

#include "addon/Feeds.h"
#include "addon/LinkText.h"
#include "addon/RegisteredMessages.h"
#include "addon/TextTables.h"
#include "data/MarketDelayCache.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/HostLists.h"
#include "mvtest/ScriptedHost.h"
#include "views/price/PriceGrid.h"
#include "views/price/PriceViewAdv.h"
#include "views/price/Watchlists.h"

namespace pricetest {

inline JInstrumentUnderlying Instrument(std::int64_t productId, const std::string& code, const std::string& exchange,
                                        int status = 3, int decimals = 2) {
  JInstrumentUnderlying i;
  i.productId = productId;
  i.instrumentCode = code;
  i.exchangeCode = exchange;
  i.instrumentName = code + " Holdings";
  i.symbol = code;
  i.displayCode = code;
  i.decimals = decimals;
  i.accessStatus = status;
  i.altAccessStatus = status;
  i.currency = "SGD";
  i.productType = productId == 2 ? "CFD" : "ES";
  return i;
}

inline JWatchlistRow Row(int id, const std::string& name, std::int32_t productId, const std::string& code) {
  JWatchlistRow r;
  r.watchlistId = id;
  r.productId = productId;
  r.watchlistName = name;
  r.instrumentCode = code;
  return r;
}

// Resets every process-wide store the price view touches, so that a test
// binary run on its own gives the same answers as one process per test.
inline void ResetPriceState() {
  QuoteStore::Instance().Clear();
  addon::QuoteFeed::Instance().Reset();
  watchlist::ResetForTests();
  CPriceViewAdv::ResetProcessState();
  addon::SettingTextTable::Instance().Clear();
  addon::LanguageTextTable::Instance().Clear();
  MarketDelayCache::Instance().Clear();
  GetUserSettings().ResetToDefaults();
  ProductMgr().Fill(std::vector<JProduct>{});
  ExchangeMgr().Fill(std::vector<JExchangeList>{});
  InstrumentMgr_ReadOnly().Fill(nullptr);
  InstrumentMgr().Fill(std::vector<JInstrumentUnderlying>{});
}

struct PriceFixture : ::testing::Test {
  mvtest::ScriptedHost host;
  std::vector<JProduct> products{{1, "ES", "Shares"}, {2, "CFD", "CFDs"}};
  std::vector<JExchangeList> exchanges{{"SGX", "Singapore", "Singapore Exchange", 1},
                                       {"HKEX", "Hong Kong", "Hong Kong Exchange", 1},
                                       {"TSE", "Tokyo", "Tokyo Stock Exchange", 1},
                                       {"WIDX", "World", "World Indices", 1}};
  std::vector<JInstrumentUnderlying> instruments{
      Instrument(1, "D05", "SGX"),           // 0
      Instrument(1, "O39", "SGX"),           // 1
      Instrument(1, "U11", "SGX"),           // 2
      Instrument(1, "Z74", "SGX", 2),        // 3: not viewable
      Instrument(1, "0005", "HKEX", 3, 3),   // 4: three decimals
      Instrument(1, "7203", "TSE"),          // 5: refused for brand lists
      Instrument(1, "[KELDO]C6L", "SGX"),    // 6: a brand twin
      Instrument(1, "HSI", "WIDX"),          // 7: world index
      Instrument(1, "DJI", " WIDX "),        // 8: world index (blanks around its exchange)
      Instrument(2, "D05", "SGX"),           // 9: a CFD
  };
  std::vector<JWatchlistRow> userRows{Row(11, "Banks", 1, "D05"), Row(11, "Banks", 1, "O39"),
                                      Row(11, "Banks", 1, "U11"), Row(12, "Asia", 1, "0005"),
                                      Row(13, "Empty", 0, "")};

  void SetUp() override {
    ResetPriceState();
    instruments[6].displayCode = "C6L";
    // Answers the terminal gives at once.
    host.AnswerValue(hm::AltStatus, 0);
    host.AnswerValue(hm::DisplayMode, 1);
    host.AnswerSetting(hm::NoticeParameter, "WLNOT", "TSE,NYSE,Not for brand lists.");
    host.AnswerSetting(hm::NoticeParameter, "OLDWL", "Brand Lists");
    host.AnswerSetting(hm::SystemParameter, "MKTEX", "Top Gainers=TOPGAIN;Top Losers=TOPLOSE");
    for (int id : {7, 8, 10, 12, 22, 401, 402, 403, 404, 407, 408, 409, 410, 411, 414, 415, 418})
      host.language.Set(13, id, L"T" + std::to_wstring(id));
    host.language.Set(13, 413, L"Add instruments above.");
    host.language.Set(13, 416, L"%s is empty.");
    host.language.Set(13, 417, L"No brand items.");
    host.language.Set(13, 419, L"Double-click for the legend");
    host.language.Set(13, 106, L"Last");
    host.language.Set(13, 108, L"Bid");
    host.language.Set(13, 109, L"Ask");
    host.language.Set(13, 101, L"Symbol");
    host.style.colors[PriceGrid::kRiseBackColor] = MakeColorRef(0, 200, 0);
    host.style.colors[PriceGrid::kFallBackColor] = MakeColorRef(200, 0, 0);
    host.style.colors[PriceGrid::kChangedBackColor] = MakeColorRef(250, 250, 0);
    host.style.colors[PriceGrid::kChangedTextColor] = MakeColorRef(1, 2, 3);
    host.style.colors[PriceGrid::kSelBackColor] = MakeColorRef(10, 20, 200);
    host.style.colors[PriceGrid::kSelTextColor] = MakeColorRef(255, 255, 254);
    host.style.colors[PriceGrid::kTextColor] = MakeColorRef(5, 5, 5);
    host.style.colors[PriceGrid::kEvenRowColor] = MakeColorRef(255, 255, 255);
    host.style.colors[PriceGrid::kOddRowColor] = MakeColorRef(240, 240, 240);
  }

  // Settings the first PrepareBasicData would have asked for.
  void SetSettings(const std::string& maxwl = "500", const std::string& maxwt = "50") {
    auto& t = addon::SettingTextTable::Instance();
    t.Set("MAXWL", hv::Widen(maxwl));
    t.Set("MAXWT", hv::Widen(maxwt));
    t.Set("WLNOT", L"TSE,NYSE,Not for brand lists.");
    t.Set("OLDWL", L"Brand Lists");
    t.Set("MKTEX", L"Top Gainers=TOPGAIN;Top Losers=TOPLOSE");
  }

  void FeedReference(CPriceViewAdv* view) {
    JProductListMsg productList{std::intptr_t(products.size()), &products};
    host.Send(view, hm::ProductList, ToLParam(&productList));
    JExchangeListMsg exchangeList{std::intptr_t(exchanges.size()), 0, &exchanges};
    host.Send(view, hm::ExchangeList, ToLParam(&exchangeList));
    JInstrumentListMsg instrumentList{std::intptr_t(instruments.size()), 0, &instruments};
    host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
  }

  std::vector<JTop30Group> Top30Groups() const {
    JTop30Group sgx;
    sgx.groupName = "SGX";
    sgx.lists.push_back({"TOPGAIN", {{1, "D05", "SGX"}, {1, "O39", "SGX"}}});
    sgx.lists.push_back({"TOPLOSE", {{1, "U11", "SGX"}}});
    JTop30Group hk;
    hk.groupName = "HKEX";
    hk.lists.push_back({"TOPVOL", {{1, "0005", "HKEX"}, {1, "NOPE", "HKEX"}}});
    return {sgx, hk};
  }

  std::vector<JKeldoWatchlistRow> KeldoRows() const {
    return {{501, "Brand One", 1, "[KELDO]C6L", "SGX", 1}, {501, "Brand One", 1, "D05", "SGX", 2},
            {502, "Brand Two", 0, "", "", 0}};
  }

  // A price view built from the add-on's objects, created, fed the replies
  // the terminal gives at start, then activated.
  CPriceViewAdv* Make(bool feedLists = true) {
    SetSettings();
    auto* view = static_cast<CPriceViewAdv*>(host.Adopt(new CPriceViewAdv));
    view->resize(900, 500);
    view->show();
    FeedReference(view);
    if (feedLists) {
      host.Send(view, hm::WatchlistList, ToLParam(&userRows));
      const auto groups = Top30Groups();
      host.Send(view, hm::WatchlistGroups521, ToLParam(&groups));
      const auto brand = KeldoRows();
      host.Send(view, hm::WatchlistRows522, ToLParam(&brand));
    }
    host.Send(view, hm::Activate);
    return view;
  }

  // One quote value, as the terminal pushes it (410, kind 0).
  void Push(CPriceViewAdv* view, const JInstrumentUnderlying& i, const std::string& field, const std::string& value,
            int kind = 0, UINT message = hm::FieldValue) {
    FieldUpdate u;
    u.productId = i.productId;
    u.instrumentCode = i.instrumentCode;
    u.fieldName = field;
    u.value = value;
    u.kind = kind;
    host.SendField(view, message, u);
  }

  static std::vector<QStringList> Dump(PriceGrid* grid) {
    std::vector<QStringList> rows;
    for (const QString& line : grid->dumpTsv().split(QLatin1Char('\n'), Qt::SkipEmptyParts))
      rows.push_back(line.split('\t'));
    return rows;
  }

  // The column of a key in the grid; fails the test when not shown.
  static int ColOf(PriceGrid* grid, pricecol::Col c) {
    const int col = grid->ColumnOf(c);
    EXPECT_GE(col, 0);
    return col;
  }

  // Symbols of the rows in display order.
  static std::vector<std::wstring> Codes(PriceGrid* grid) {
    std::vector<std::wstring> out;
    for (const auto& k : grid->Rows()) out.push_back(k.InstrumentCode);
    return out;
  }

  std::vector<mvtest::Feedback> FieldRequests() const {
    std::vector<mvtest::Feedback> out;
    for (const auto& f : host.Requests())
      if (f.field) out.push_back(f);
    return out;
  }

  // Mouse on a cell of the grid.
  static void Mouse(PriceGrid* grid, QEvent::Type type, int col, int row, Qt::MouseButton button = Qt::LeftButton) {
    const QPoint pt = grid->CellRect(col, row).center();
    const Qt::MouseButtons buttons = type == QEvent::MouseButtonRelease ? Qt::NoButton : Qt::MouseButtons(button);
    QMouseEvent e(type, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)), button, buttons, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &e);
  }
  static void Click(PriceGrid* grid, int col, int row, Qt::MouseButton button = Qt::LeftButton) {
    Mouse(grid, QEvent::MouseButtonPress, col, row, button);
    Mouse(grid, QEvent::MouseButtonRelease, col, row, button);
  }
  static void DoubleClick(PriceGrid* grid, int col, int row) {
    Click(grid, col, row);
    Mouse(grid, QEvent::MouseButtonDblClick, col, row);
    Mouse(grid, QEvent::MouseButtonRelease, col, row);
  }

  std::vector<QString> Boxes() const {
    std::vector<QString> out;
    for (const auto& s : host.dialogs.shown)
      if (s.kind == platform::RecordingDialogService::Shown::Box) out.push_back(s.text);
    return out;
  }
};

}  // namespace pricetest
