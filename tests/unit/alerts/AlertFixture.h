#pragma once
// A scripted host with a small market for the alert views: products,
// instruments on exchanges that do and do not take price alerts, tick bands,
// the terminal's alert texts, and decoders for the alert records the views send.
// Every test starts from empty process-wide stores and a fixed "today".
#include <gtest/gtest.h>

#include <QApplication>
#include <QKeyEvent>
#include <QMouseEvent>
#include <string>
#include <vector>

#include "addon/Feeds.h"
#include "addon/TextTables.h"
#include "data/MarketDelayCache.h"
#include "data/ReferenceStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"
#include "mvtest/ScriptedHost.h"
#include "views/alerts/AlertGrid.h"
#include "views/alerts/AlertRules.h"
#include "views/alerts/NewPriceAlertAdv.h"
#include "views/alerts/PriceAlertList.h"

namespace alerttest {

inline JInstrumentUnderlying Instrument(std::int64_t productId, const std::string& code, const std::string& exchange,
                                        int status = 3, int altStatus = 3) {
  JInstrumentUnderlying i;
  i.productId = productId;
  i.instrumentCode = code;
  i.exchangeCode = exchange;
  i.instrumentName = code + " Holdings";
  i.symbol = code;
  i.displayCode = code;
  i.decimals = 2;
  i.accessStatus = status;
  i.altAccessStatus = altStatus;
  return i;
}

inline PriceAlertItem Alert(std::int32_t id, const JInstrumentUnderlying& i, const std::string& status = "Active") {
  PriceAlertItem a;
  a.alertId = id;
  a.productId = i.productId;
  a.exchangeCode = i.exchangeCode;
  a.instrumentCode = i.instrumentCode;
  a.triggerOnce = true;
  a.validUntil = "2027-01-15";
  a.priceField = "ASK";
  a.comparator = ">=";
  a.triggerValue = 10.5;
  a.status = status;
  return a;
}

inline const QDate kToday{2027, 1, 10};

struct AlertFixture : ::testing::Test {
  mvtest::ScriptedHost host;
  std::vector<JProduct> products{{1, "ES", "Shares", ".\\images\\Products\\ES.bmp"}, {2, "CFD", "CFDs", ""}};
  std::vector<JInstrumentUnderlying> instruments{
      Instrument(1, "D05", "SGX"),        // 0: viewable, alerts taken
      Instrument(1, "Z74", "SGX", 2),     // 1: not viewable
      Instrument(1, "0005", "HKEX"),      // 2: an exchange without price alerts
      Instrument(1, "O39", "SGX", 2, 3),  // 3: viewable only under the alternate status
      Instrument(2, "C6L", "SGX"),        // 4: another product on SGX
  };
  std::vector<TickBand> bands{{0, 0.0, 10.0, 0.01}, {0, 10.0, 50.0, 0.05}, {0, 50.0, 1000.0, 0.1}};

  void SetUp() override {
    CAddonView::ResetProcessState();
    alerts::AlertSettingsCache::Instance().Clear();
    alerts::Store().Fill(std::vector<PriceAlertItem>{});
    alerts::SetTodayForTests([] { return kToday; });
    MarketDelayCache::Instance().Clear();
    addon::QuoteFeed::Instance().Reset();
    addon::LanguageTextTable::Instance().Clear();
    GetUserSettings().ResetToDefaults();
    instruments[0].priceStepTableId = 0;
    instruments[0].referencePrice = 10.0;
    instruments[4].priceStepTableId = 7;  // a table without bands of its own
    // The read-only store points into the terminal's list: this test's list
    // from the start (the last test's is gone).
    InstrumentMgr_ReadOnly().Fill(&instruments);
    ProductMgr().Fill(products);

    for (const auto& [id, text] : std::vector<std::pair<int, std::wstring>>{
             {19, L"Choose an instrument first."}, {20, L"Instrument not found."}, {21, L"Alert not found."},
             {701, L"Exchange"}, {702, L"Symbol"}, {703, L"Name"}, {704, L"Once"}, {705, L"Valid Until"},
             {706, L"Delay"}, {707, L"Condition"}, {708, L"Value"}, {709, L"Via"}, {710, L"Status"},
             {711, L"New"}, {712, L"Modify"}, {713, L"Delete"}, {714, L"Instrument"}, {723, L"E-mail"},
             {724, L"SMS"}, {725, L"New Alert"}, {726, L"Change Alert"}, {727, L"Submit"}, {728, L"Ask"},
             {729, L"Bid"}, {730, L"Last Done"}, {731, L"at most"}, {732, L"at least"}, {733, L"Yes"},
             {734, L"No"}, {735, L"Fired"}, {736, L"Lapsed"}})
      host.language.Set(13, id, text);
    host.appTitle = L"Brantic";
    host.AnswerText("17008, 0", L"No price alerts on this exchange.");
    host.AnswerSetting(hm::SystemParameter, "EXCPA", "SGX,NYSE");
    host.style.colors[AlertGrid::kTriggeredColor] = MakeColorRef(0, 0, 200);
    host.style.colors[AlertGrid::kExpiredColor] = MakeColorRef(120, 120, 120);

    host.AddDecoder(hm::Alert702, [](LPARAM d) { return std::any(*FromLParam<const PriceAlertItem>(d)); });
    host.AddDecoder(hm::Alert703, [](LPARAM d) { return std::any(*FromLParam<const PriceAlertItem>(d)); });
    host.AddDecoder(hm::Alert705, [](LPARAM d) { return std::any(*FromLParam<const PriceAlertItem>(d)); });
    host.AddDecoder(hm::Alert704, [](LPARAM d) { return std::any(*FromLParam<const std::vector<std::int32_t>>(d)); });
    host.AddDecoder(hm::OpenAlertForm, [](LPARAM d) { return std::any(*FromLParam<const ViewOpenRequest>(d)); });
    host.AddDecoder(hm::MarketInfo, [](LPARAM d) { return std::any(*FromLParam<const JMarketInfoRequest>(d)); });
    host.AddDecoder(hm::AlertBoardRequest, [](LPARAM d) { return std::any(*FromLParam<const JPriceInfoRequest>(d)); });
    host.AddDecoder(hm::AlertFrameSize, [](LPARAM d) { return std::any(*FromLParam<const ViewSize>(d)); });
    host.AddDecoder(hm::AlertFrameSize2, [](LPARAM d) { return std::any(*FromLParam<const ViewSize>(d)); });
  }

  void TearDown() override { alerts::SetTodayForTests(nullptr); }

  void FeedLists(CSuperBaseView* view) {
    JProductListMsg productList{std::intptr_t(products.size()), &products};
    host.Send(view, hm::ProductList, ToLParam(&productList));
    JInstrumentListMsg instrumentList{std::intptr_t(instruments.size()), 0, &instruments};
    host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
  }

  // A new-alert form built from the add-on's objects, activated and fed the
  // lists and the bands.
  CNewPriceAlertAdv* MakeForm() {
    auto* view = static_cast<CNewPriceAlertAdv*>(host.Adopt(new CNewPriceAlertAdv));
    view->resize(CNewPriceAlertAdv::kWidth, CNewPriceAlertAdv::kCompactHeight);
    view->show();
    host.Send(view, hm::Activate);
    FeedLists(view);
    JTickBandList list{std::int32_t(bands.size()), &bands};
    host.Send(view, hm::PriceBands, ToLParam(&list));
    view->ApplyLanguage();
    return view;
  }

  // An alert list, activated, fed the lists.
  CPriceAlertList* MakeList() {
    auto* view = static_cast<CPriceAlertList*>(host.Adopt(new CPriceAlertList));
    view->resize(700, 300);
    view->show();
    host.Send(view, hm::Activate);
    FeedLists(view);
    return view;
  }

  // The terminal's 705: fill the form.
  void Load(CNewPriceAlertAdv* form, std::int32_t id, std::int64_t productId = -1, const std::string& code = {}) {
    PriceAlertItem request;
    request.alertId = id;
    request.productId = productId;
    request.instrumentCode = code;
    host.Send(form, hm::Alert705, ToLParam(&request));
  }

  // The terminal's 701: the complete list.
  void Deliver(CSuperBaseView* view, const std::vector<PriceAlertItem>& list) {
    host.Send(view, hm::Alert701, ToLParam(&list));
  }

  template <class T>
  std::vector<T> Sent(UINT message) const {
    std::vector<T> out;
    for (const auto& f : host.RequestsOf(message)) out.push_back(std::any_cast<T>(f.extra));
    return out;
  }

  // Lines of a grid dump, headings first.
  static std::vector<QStringList> Dump(AlertGrid* grid) {
    std::vector<QStringList> rows;
    for (const QString& line : grid->dumpTsv().split(QLatin1Char('\n'), Qt::SkipEmptyParts))
      rows.push_back(line.split('\t'));
    return rows;
  }

  static void Click(QWidget* target, const QPoint& pt) {
    QMouseEvent press(QEvent::MouseButtonPress, QPointF(pt), QPointF(target->mapToGlobal(pt)), Qt::LeftButton,
                      Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(target, &press);
    QMouseEvent release(QEvent::MouseButtonRelease, QPointF(pt), QPointF(target->mapToGlobal(pt)), Qt::LeftButton,
                        Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(target, &release);
  }
  // A click on the tick box of a row (-1: the heading).
  static void ClickTick(AlertGrid* grid, int row) {
    Click(grid->viewport(), grid->CellRect(grid->ColumnOf(AlertGrid::kCheck), row).center());
  }
};

}  // namespace alerttest
