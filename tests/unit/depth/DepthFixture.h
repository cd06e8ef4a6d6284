#pragma once
// A scripted host with a small market: products, instruments of several
// exchanges and access statuses, and helpers to select an instrument in a
// depth view and to feed depth values as the terminal does.
#include <gtest/gtest.h>

#include <QApplication>
#include <QKeyEvent>
#include <QMouseEvent>
#include <string>
#include <vector>

#include "addon/Feeds.h"
#include "addon/LinkText.h"
#include "data/MarketStores.h"
#include "hostconfig/UserSettings.h"
#include "hostview/HostLists.h"
#include "mvtest/ProcessStateReset.h"
#include "mvtest/ScriptedHost.h"
#include "views/instrument/DepthGrid.h"
#include "views/instrument/MarketDepthAdv.h"

namespace depthtest {

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

// Products: 1 shares, 2 CFDs, 3 DMA.
struct DepthFixture : ::testing::Test {
  mvtest::ScriptedHost host;
  std::vector<JProduct> products{{1, "ES", "Shares"}, {2, "CFD", "CFDs"}, {3, "DMA", "Direct"}};
  std::vector<JInstrumentUnderlying> instruments{
      Instrument(1, "D05", "SGX"),      // 0: viewable and tradeable
      Instrument(1, "Z74", "SGX", 2),   // 1: not viewable
      Instrument(1, "C6L", "SGX", 1),   // 2: view only
      Instrument(1, "0005", "HKEX"),    // 3: another exchange
      Instrument(2, "D05", "SGX"),      // 4: a CFD
      Instrument(3, "U11", "SGX"),      // 5: DMA
      Instrument(1, "O39", "SGX", 2, 3),  // 6: viewable only under the alternate status
  };
  std::uint32_t pushes = 0;

  void SetUp() override {
    CAddonView::ResetProcessState();
    addon::DepthFeed::Instance().Reset();
    host.AnswerValue(hm::ExchangeEnabled, 1);
    host.AnswerText("17005", L"No depth yet");
    host.style.colors[3103] = MakeColorRef(1, 2, 3);
    host.style.colors[3105] = MakeColorRef(250, 240, 10);
    host.style.colors[106] = MakeColorRef(255, 255, 255);
    host.style.colors[107] = MakeColorRef(240, 240, 240);
    host.style.colors[109] = MakeColorRef(10, 10, 10);
    GetUserSettings().ResetToDefaults();
  }

  // A depth view built from the add-on's objects, created, activated and fed
  // the reference lists (as the terminal answers 505 and 500).
  CMarketDepthAdv* Make() {
    auto* view = static_cast<CMarketDepthAdv*>(host.Adopt(new CMarketDepthAdv));
    view->resize(480, 400);
    view->show();
    host.Send(view, hm::Activate);
    JProductListMsg productList{std::intptr_t(products.size()), &products};
    host.Send(view, hm::ProductList, ToLParam(&productList));
    JInstrumentListMsg instrumentList{std::intptr_t(instruments.size()), 0, &instruments};
    host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
    return view;
  }

  static std::wstring LinkFor(const JInstrumentUnderlying& i, const std::string& saveSpace = "",
                              const std::string& mask = "") {
    addon::LinkTextBuilder link("start");
    link.Add(addon::linkkey::kInstrumentCode, i.instrumentCode).AddInt64(addon::linkkey::kProductId, i.productId);
    if (!mask.empty()) link.Add(addon::linkkey::kUserProductId, mask);
    if (!saveSpace.empty()) link.Add(addon::linkkey::kUserSaveSpace, saveSpace);
    return link.Wide();
  }

  // Selection through the start parameters (310), as the terminal does when
  // it opens the view on an instrument.
  void Select(CMarketDepthAdv* view, const JInstrumentUnderlying& i) { host.SendLink(view, LinkFor(i)); }

  // One depth value, as the terminal pushes it (410, kind 1).
  void Push(CMarketDepthAdv* view, const JInstrumentUnderlying& i, int level, const std::string& field,
            const std::string& value, int kind = 1, UINT message = hm::FieldValue) {
    FieldUpdate u;
    u.productId = i.productId;
    u.instrumentCode = i.instrumentCode;
    u.fieldName = field;
    u.value = value;
    u.param = level;
    u.kind = kind;
    host.SendField(view, message, u);
  }

  // A full level: buy 10.00 - level/100, sell 10.01 + level/100.
  void PushLevel(CMarketDepthAdv* view, const JInstrumentUnderlying& i, int level, int volume = 100) {
    Push(view, i, level, "ORDS_BVOL", std::to_string(level));
    Push(view, i, level, "BVOL", std::to_string(volume));
    Push(view, i, level, "BUY", std::to_string(10.0 - level / 100.0));
    Push(view, i, level, "SELL", std::to_string(10.01 + level / 100.0));
    Push(view, i, level, "SVOL", std::to_string(volume + 1));
    Push(view, i, level, "ORDS_SVOL", std::to_string(level + 1));
  }
  void PushLevels(CMarketDepthAdv* view, const JInstrumentUnderlying& i, int from, int to) {
    for (int level = from; level <= to; ++level) PushLevel(view, i, level);
  }

  // Lines of the grid dump (headings first).
  static std::vector<QStringList> Dump(CMarketDepthAdv* view) {
    std::vector<QStringList> rows;
    const QString tsv = view->GetDepthGrid()->dumpTsv();
    for (const QString& line : tsv.split(QLatin1Char('\n'), Qt::SkipEmptyParts)) rows.push_back(line.split('\t'));
    return rows;
  }

  // The field requests (400, 401, 412) in the order sent.
  std::vector<mvtest::Feedback> FieldRequests() const {
    std::vector<mvtest::Feedback> out;
    for (const auto& f : host.Requests())
      if (f.field) out.push_back(f);
    return out;
  }

  // A left press on a data cell of the depth grid.
  static void ClickCell(DepthGrid* grid, int col, int row) {
    const QPoint pt = grid->CellRect(col, row).center();
    QMouseEvent press(QEvent::MouseButtonPress, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                      Qt::LeftButton, Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &press);
    QMouseEvent release(QEvent::MouseButtonRelease, QPointF(pt), QPointF(grid->viewport()->mapToGlobal(pt)),
                        Qt::LeftButton, Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(grid->viewport(), &release);
  }

  static void PressKey(QWidget* target, int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier,
                       const QString& text = QString()) {
    QKeyEvent press(QEvent::KeyPress, key, modifiers, text);
    QApplication::sendEvent(target, &press);
  }

  QColor StyleColor(int id) const { return host.style.Color(id); }
};

}  // namespace depthtest
