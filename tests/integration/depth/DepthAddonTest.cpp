// The depth view as the terminal sees it: created through the library's
// descriptor (dlopen), read back only through what the terminal can reach
// (requests, and the grid's dumpTsv by name).
#include <gtest/gtest.h>

#include <QMetaObject>
#include <QWidget>

#include "hostview/Records.h"
#include "mvtest/ScriptedHost.h"

namespace {

QString DumpOf(CSuperBaseView* view) {
  QWidget* grid = view->findChild<QWidget*>(QStringLiteral("DepthGrid"));
  if (!grid) return "<no grid>";
  QString tsv;
  QMetaObject::invokeMethod(grid, "dumpTsv", Qt::DirectConnection, Q_RETURN_ARG(QString, tsv));
  return tsv;
}

FieldUpdate Depth(int level, const std::string& field, const std::string& value) {
  FieldUpdate u;
  u.productId = 5;
  u.instrumentCode = "BN4";
  u.fieldName = field;
  u.value = value;
  u.param = level;
  u.kind = 1;
  return u;
}

TEST(DepthAddon, OpenedThroughTheLibraryShowsPushedLevels) {
  mvtest::ScriptedHost host;
  host.AnswerValue(hm::ExchangeEnabled, 1);
  host.AnswerText("17005", L"Waiting for depth");
  std::vector<JProduct> products{{5, "ES", "Shares"}};
  std::vector<JInstrumentUnderlying> instruments(1);
  instruments[0].productId = 5;
  instruments[0].instrumentCode = "BN4";
  instruments[0].exchangeCode = "SGX";
  instruments[0].instrumentName = "Keppel";
  instruments[0].decimals = 3;

  CSuperBaseView* view = host.Open("CMarketDepthAdv");
  ASSERT_NE(view, nullptr);
  JProductListMsg productList{1, &products};
  host.Send(view, hm::ProductList, ToLParam(&productList));
  JInstrumentListMsg instrumentList{1, 0, &instruments};
  host.Send(view, hm::InstrumentList, ToLParam(&instrumentList));
  host.SendLink(view, L"{\"type\":\"x\",\"data\":[{\"Field_instrument_code\":\"BN4\",\"Field_product_id\":\"5\"}]}");
  EXPECT_EQ(view->GetTitle(), L"Market Depth - Keppel");
  host.Advance(200);
  EXPECT_EQ(host.RequestsOf(hm::FetchFields).size(), 1u);

  for (int level = 1; level <= 3; ++level) {
    const std::string step = std::to_string(level);
    host.SendField(view, hm::FieldValue, Depth(level, "BVOL", step + "000"));
    host.SendField(view, hm::FieldValue, Depth(level, "BUY", "5." + step));
    host.SendField(view, hm::FieldValue, Depth(level, "SELL", "6." + step));
    host.SendField(view, hm::FieldValue, Depth(level, "SVOL", "0"));
  }
  host.Advance(200);
  EXPECT_EQ(DumpOf(view),
            "Buy Vol\tBuy\tSell\tSell Vol\n"
            "1,000\t5.100\t6.100\t\n"
            "2,000\t5.200\t6.200\t\n"
            "3,000\t5.300\t6.300\t\n");
}

}  // namespace
