#pragma once
// A scripted host with a small market for the trade-summary view, and helpers
// to feed summary pages as the terminal does. Every fixture takes instrument
// codes of its own, so that the process-wide summary stores hold nothing from
// an earlier test of the same process.
#include <gtest/gtest.h>

#include <QApplication>
#include <QMouseEvent>
#include <string>
#include <vector>

#include "addon/LinkText.h"
#include "data/MarketStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/HostLists.h"
#include "mvtest/ProcessStateReset.h"
#include "mvtest/ScriptedHost.h"
#include "views/instrument/SummaryFeed.h"
#include "views/instrument/TradeSGrid.h"
#include "views/instrument/TradeSummaryAdv.h"

namespace summarytest {

// A code no earlier fixture of this process used: "<base>.<n>".
inline std::string FreshCode(const std::string& base) {
  static int serial = 0;
  return base + "." + std::to_string(++serial);
}

inline JInstrumentUnderlying Instrument(std::int64_t productId, const std::string& code, const std::string& exchange,
                                        int status = 3) {
  JInstrumentUnderlying i;
  i.productId = productId;
  i.instrumentCode = code;
  i.exchangeCode = exchange;
  i.instrumentName = code + " Holdings";
  i.symbol = code;
  i.displayCode = code;
  i.decimals = 2;
  i.accessStatus = status;
  i.altAccessStatus = status;
  return i;
}

// One "TRADEDATA" item: price|trades|volume|bid||ask.
inline std::string Item(const std::string& price, long long trades, long long volume, long long bid, long long ask) {
  return price + "|" + std::to_string(trades) + "|" + std::to_string(volume) + "|" + std::to_string(bid) + "||" +
         std::to_string(ask);
}
inline std::string Join(const std::vector<std::string>& items) {
  std::string out;
  for (const auto& i : items) out += (out.empty() ? "" : ";") + i;
  return out;
}
// Lines first..last of a page text: price 20.00 - line/100, trades = line, volume 100*line split 40/60.
inline std::string Lines(int first, int last) {
  std::vector<std::string> items;
  for (int line = first; line <= last; ++line) {
    char price[32];
    std::snprintf(price, sizeof price, "%.2f", 20.0 - line / 100.0);
    items.push_back(Item(price, line, 100LL * line, 40LL * line, 60LL * line));
  }
  return Join(items);
}

// Products: 1 shares, 2 CFDs.
struct SummaryFixture : ::testing::Test {
  mvtest::ScriptedHost host;
  std::vector<JProduct> products{{1, "ES", "Shares"}, {2, "CFD", "CFDs"}};
  std::vector<JInstrumentUnderlying> instruments{
      Instrument(1, FreshCode("D05"), "SGX"),   // 0: viewable and tradeable
      Instrument(1, FreshCode("C6L"), "SGX", 1),  // 1: view only
      Instrument(2, FreshCode("D05"), "SGX"),   // 2: a CFD
      Instrument(1, FreshCode("0005"), "HKEX"),  // 3: an exchange the tests may disable
      Instrument(1, FreshCode("U11"), "SGX"),   // 4: another share
  };

  // Page requests queued by a test are the process's: none may leak into the next.
  void TearDown() override { addon::SummaryPageFeed::Instance().Reset(); }

  void SetUp() override {
    CAddonView::ResetProcessState();
    addon::SummaryPageFeed::Instance().Reset();
    host.AnswerValue(hm::ExchangeEnabled, 1);
    host.style.colors[3103] = MakeColorRef(1, 2, 3);
    host.style.colors[3105] = MakeColorRef(250, 240, 10);
    host.style.colors[106] = MakeColorRef(255, 255, 255);
    host.style.colors[107] = MakeColorRef(240, 240, 240);
    host.style.colors[109] = MakeColorRef(10, 10, 10);
    host.style.colors[101] = MakeColorRef(255, 255, 255);
    host.style.colors[204] = MakeColorRef(20, 24, 32);
    QFont total(QStringLiteral("Sans Serif"));
    total.setPointSize(9);
    total.setBold(true);
    host.style.fonts[19] = total;
    host.language.Set(13, 663, L"No trades yet.");
    GetUserSettings().ResetToDefaults();
  }

  // A trade-summary view built from the add-on's objects, created, activated
  // and fed the reference lists.
  CTradeSummaryAdv* Make(int width = 900, int height = 500) {
    auto* view = static_cast<CTradeSummaryAdv*>(host.Adopt(new CTradeSummaryAdv));
    view->resize(width, height);
    view->show();
    host.Send(view, hm::Activate);
    JProductListMsg productList{std::intptr_t(products.size()), &products};
    host.Send(view, hm::ProductList, ToLParam(&productList));
    JInstrumentListMsg instrumentList{std::intptr_t(instruments.size()), 0, &instruments};
    host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
    return view;
  }

  static std::wstring LinkFor(const JInstrumentUnderlying& i) {
    addon::LinkTextBuilder link("start");
    link.Add(addon::linkkey::kInstrumentCode, i.instrumentCode).AddInt64(addon::linkkey::kProductId, i.productId);
    return link.Wide();
  }
  void Select(CTradeSummaryAdv* view, const JInstrumentUnderlying& i) { host.SendLink(view, LinkFor(i)); }

  // One field value as the terminal sends it (412 answer by default).
  void Send(CTradeSummaryAdv* view, const JInstrumentUnderlying& i, const std::string& field, const std::string& value,
            int param = 1, UINT message = hm::RequestField, int kind = 3) {
    FieldUpdate u;
    u.productId = i.productId;
    u.instrumentCode = i.instrumentCode;
    u.fieldName = field;
    u.value = value;
    u.param = param;
    u.kind = kind;
    host.SendField(view, message, u);
  }
  void Page(CTradeSummaryAdv* view, const JInstrumentUnderlying& i, int page, const std::string& text,
            UINT message = hm::RequestField) {
    Send(view, i, "TRADEDATA", text, page, message);
  }

  // Rows of the table as the user sees them (headings first).
  static std::vector<QStringList> Dump(CTradeSummaryAdv* view) {
    std::vector<QStringList> rows;
    for (const QString& line : view->GetSummaryGrid()->dumpTsv().split(QLatin1Char('\n'), Qt::SkipEmptyParts))
      rows.push_back(line.split('\t'));
    return rows;
  }

  // The field requests (400, 401, 412) in the order sent.
  std::vector<FieldRequest> FieldRequests() const {
    std::vector<FieldRequest> out;
    for (const auto& f : host.Requests())
      if (f.field) out.push_back(*f.field);
    return out;
  }
  std::vector<std::pair<UINT, FieldRequest>> FieldMessages() const {
    std::vector<std::pair<UINT, FieldRequest>> out;
    for (const auto& f : host.Requests())
      if (f.field) out.emplace_back(f.message, *f.field);
    return out;
  }

  // A left press and release on a cell of a grid.
  static void ClickCell(CGridCtrl* grid, int col, int row) {
    const QPoint pt = grid->CellRect(col, row).center();
    QMouseEvent press(QEvent::MouseButtonPress, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                      Qt::LeftButton, Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &press);
    QMouseEvent release(QEvent::MouseButtonRelease, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                        Qt::LeftButton, Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &release);
  }
};

}  // namespace summarytest
