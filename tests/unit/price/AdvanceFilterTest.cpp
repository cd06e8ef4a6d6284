// The advance filter: its rules on an instrument list, its limit, and the
// four cascading lists of the price view with the result in the visible grid.
#include "PriceFixture.h"
#include "hostview/CustomTabCtrl.h"
#include "skin/Skin.h"
#include "views/price/AdvanceFilter.h"
#include "views/price/BoardGrid.h"

namespace pricetest {
namespace {

using Choice = CAdvanceFilter::Choice;

std::vector<std::wstring> CodesOf(const std::vector<InstrumentKey>& keys) {
  std::vector<std::wstring> out;
  for (const auto& k : keys) out.push_back(k.InstrumentCode);
  return out;
}

QStringList Items(QComboBox* list) {
  QStringList out;
  for (int i = 0; i < list->count(); ++i) out << list->itemText(i);
  return out;
}

JInstrumentUnderlying In(std::int64_t product, const std::string& code, const std::string& exchange,
                         const std::string& sector) {
  JInstrumentUnderlying i = Instrument(product, code, exchange);
  i.sector = sector;
  return i;
}

// ---- Rules ----------------------------------------------------------------------------------------

TEST(AdvanceFilterRules, ProductExchangeSectorAndLetterAllHold) {
  const std::vector<JInstrumentUnderlying> list{
      In(1, "ABC", "SGX", "FIN"),      In(1, "AXE", "SGX", "TEC"),        In(1, "BOB", "SGX", "FIN,TEC"),
      In(2, "ACE", "SGX", "FIN"),      In(1, "ART", "HKEX", "FIN"),       In(1, "7203", "SGX", "IND"),
      In(1, "[KELDO]C6L", "SGX", ""),  In(1, "abc", "SGX", "FIN"),        In(1, "ZED", " SGX ", "FIN"),
  };
  auto codes = [&](const std::string& sector, const std::wstring& letter) {
    return CodesOf(CAdvanceFilter::Filter(list, Choice{1, "SGX", sector, letter}, 100));
  };
  // "***" is every sector, "ALL" every letter; product and exchange always hold.
  EXPECT_EQ(codes("***", L"ALL"),
            (std::vector<std::wstring>{L"ABC", L"AXE", L"BOB", L"7203", L"[KELDO]C6L", L"abc", L"ZED"}));
  // A sector value is found anywhere in the instrument's sector text.
  EXPECT_EQ(codes("FIN", L"ALL"), (std::vector<std::wstring>{L"ABC", L"BOB", L"abc", L"ZED"}));
  EXPECT_EQ(codes("TEC", L"ALL"), (std::vector<std::wstring>{L"AXE", L"BOB"}));
  // A letter is the code's first character; "Others" is anything before "A" or after "Z".
  EXPECT_EQ(codes("***", L"A"), (std::vector<std::wstring>{L"ABC", L"AXE"}));
  EXPECT_EQ(codes("FIN", L"A"), (std::vector<std::wstring>{L"ABC"}));
  EXPECT_EQ(codes("***", L"Others"), (std::vector<std::wstring>{L"7203", L"[KELDO]C6L", L"abc"}));
  EXPECT_EQ(codes("***", L"Q"), (std::vector<std::wstring>{}));
  // The walk stops at the limit, in the list's order.
  EXPECT_EQ(CodesOf(CAdvanceFilter::Filter(list, Choice{1, "SGX", "***", L"ALL"}, 2)),
            (std::vector<std::wstring>{L"ABC", L"AXE"}));
  EXPECT_TRUE(CAdvanceFilter::Filter(list, Choice{1, "SGX", "***", L"ALL"}, 0).empty());
}

TEST(AdvanceFilterRules, LimitIsAdvftFromOneTo10000ElseMaxwl) {
  auto& settings = addon::SettingTextTable::Instance();
  settings.Clear();
  EXPECT_EQ(CAdvanceFilter::Limit(), 500);
  settings.Set("MAXWL", L"30");
  EXPECT_EQ(CAdvanceFilter::Limit(), 30);
  settings.Set("ADVFT", L"20");
  EXPECT_EQ(CAdvanceFilter::Limit(), 20);
  settings.Set("ADVFT", L"1");
  EXPECT_EQ(CAdvanceFilter::Limit(), 1);
  settings.Set("ADVFT", L"10000");
  EXPECT_EQ(CAdvanceFilter::Limit(), 10000);
  for (const wchar_t* bad : {L"10001", L"20000", L"0", L"-5", L"abc", L"", L"12.5"}) {
    settings.Set("ADVFT", bad);
    EXPECT_EQ(CAdvanceFilter::Limit(), 30) << QString::fromWCharArray(bad).toStdString();
  }
  settings.Clear();
}

TEST(AdvanceFilterRules, ChoicesAsAStartParameterText) {
  const Choice c{101, "SGX", "FIN", L"Others"};
  EXPECT_EQ(CAdvanceFilter::ChoiceText(c), "101|SGX|FIN|Others");
  EXPECT_EQ(CAdvanceFilter::ParseChoice("101|SGX|FIN|Others"), c);
  EXPECT_EQ(CAdvanceFilter::ParseChoice("101|SGX|***|A"), (Choice{101, "SGX", "***", L"A"}));
  for (const char* bad : {"", "101|SGX|FIN", "x|SGX|FIN|A", "101|SGX||A", "101|SGX|FIN|A|B", "10 1|SGX|FIN|A"})
    EXPECT_EQ(CAdvanceFilter::ParseChoice(bad), std::nullopt) << bad;
}

// ---- In the price view ------------------------------------------------------------------------------

struct Filter : PriceFixture {
  std::vector<JSector> sectors{{"FIN", "Finance"}, {"TEC", "Technology"}};

  void SetUp() override {
    PriceFixture::SetUp();
    // Fifty more SGX shares of the finance sector, all with codes from "A".
    for (int n = 0; n < 50; ++n) {
      char code[8];
      std::snprintf(code, sizeof code, "A%02d", n);
      instruments.push_back(In(1, code, "SGX", n % 2 ? "FIN" : "FIN,TEC"));
    }
    instruments[1].sector = "TEC";  // O39
    host.AnswerWith(hm::Sectors, [this](const mvtest::Feedback&) -> std::optional<LPARAM> {
      return ToLParam(&sectors);
    });
  }

  static CSkinComboBox* List(CPriceViewAdv* view, int id) { return static_cast<CSkinComboBox*>(view->Control(id)); }

  // Product, exchange, sector and letter by their item texts.
  static void Choose(CPriceViewAdv* view, const QString& product, const QString& exchange, const QString& sector,
                     const QString& letter) {
    CAdvanceFilter* f = view->AdvanceFilter();
    f->ChooseProduct(f->List(CAdvanceFilter::kProductListId)->findText(product));
    f->ChooseExchange(f->List(CAdvanceFilter::kExchangeListId)->findText(exchange));
    f->ChooseSector(f->List(CAdvanceFilter::kSectorListId)->findText(sector));
    f->ChooseLetter(f->List(CAdvanceFilter::kLetterListId)->findText(letter));
  }
};

TEST_F(Filter, Lists_CaptionsItemsAndTheCascade) {
  CPriceViewAdv* view = Make();
  host.ClearRequests();
  view->OnCommand(CPriceViewAdv::kFilterButtonId);
  EXPECT_EQ(view->GetListKind(), kAdvanceFilter);
  EXPECT_FALSE(view->Control(CPriceViewAdv::kFilterButtonId)->isHidden());
  EXPECT_FALSE(view->AdvanceFilter()->isHidden());
  EXPECT_TRUE(view->Tabs(kUserWatchlists)->isHidden());
  // The sectors are asked for once.
  EXPECT_EQ(host.RequestsOf(hm::Sectors).size(), 1u);

  CSkinComboBox* product = List(view, 2028);
  CSkinComboBox* exchange = List(view, 2029);
  CSkinComboBox* sector = List(view, 2030);
  CSkinComboBox* letter = List(view, 2031);
  ASSERT_TRUE(product && exchange && sector && letter);
  EXPECT_EQ(product->placeholderText(), "Product");
  EXPECT_EQ(exchange->placeholderText(), "Exchange");
  EXPECT_EQ(sector->placeholderText(), "Sector");
  EXPECT_EQ(letter->placeholderText(), "A-Z");
  // Every product in store order by name; nothing chosen and nothing below it.
  EXPECT_EQ(Items(product), (QStringList{"Shares", "CFDs"}));
  EXPECT_EQ(product->currentIndex(), -1);
  EXPECT_EQ(exchange->count(), 0);
  EXPECT_EQ(view->GetPriceGrid()->RowCount(), 0);
  EXPECT_EQ(view->GetPriceGrid()->EmptyText(), CPriceViewAdv::kFilterChooseText);

  // A product offers the exchanges of its instruments (the exchange store's order).
  view->AdvanceFilter()->ChooseProduct(0);
  EXPECT_EQ(Items(exchange), (QStringList{"SGX", "HKEX", "TSE", "WIDX"}));
  EXPECT_EQ(exchange->currentIndex(), -1);
  EXPECT_EQ(sector->count(), 0);
  view->AdvanceFilter()->ChooseProduct(1);
  EXPECT_EQ(Items(exchange), (QStringList{"SGX"}));
  view->AdvanceFilter()->ChooseProduct(0);
  // An exchange offers the sectors and the letters.
  view->AdvanceFilter()->ChooseExchange(0);
  EXPECT_EQ(Items(sector), (QStringList{"ALL", "Finance", "Technology"}));
  QStringList letters;
  for (char c = 'A'; c <= 'Z'; ++c) letters << QString(QLatin1Char(c));
  letters << "Others" << "ALL";
  EXPECT_EQ(Items(letter), letters);
  EXPECT_EQ(sector->currentIndex(), -1);
  EXPECT_EQ(letter->currentIndex(), -1);
  // A sector alone does not filter yet.
  view->AdvanceFilter()->ChooseSector(0);
  EXPECT_EQ(view->GetPriceGrid()->RowCount(), 0);
  // The letter completes the choice.
  view->AdvanceFilter()->ChooseLetter(letter->findText("ALL"));
  EXPECT_EQ(view->GetPriceGrid()->RowCount(), 55);
  // Another product empties the lists below it; the rows stay until a new choice.
  view->AdvanceFilter()->ChooseProduct(1);
  EXPECT_EQ(sector->count(), 0);
  EXPECT_EQ(letter->count(), 0);
  EXPECT_EQ(view->AdvanceFilter()->CurrentChoice(), std::nullopt);
}

TEST_F(Filter, Result_InTheVisibleGridWithinTheLimitWithItsEmptyText) {
  CPriceViewAdv* view = Make();
  view->OnCommand(CPriceViewAdv::kFilterButtonId);
  addon::SettingTextTable::Instance().Set("ADVFT", L"20");
  Choose(view, "Shares", "SGX", "Finance", "A");
  // Fifty match; the first twenty in the instrument list's order are shown.
  std::vector<std::wstring> first20;
  for (int n = 0; n < 20; ++n) first20.push_back(QString::asprintf("A%02d", n).toStdWString());
  EXPECT_EQ(Codes(view->GetPriceGrid()), first20);
  EXPECT_TRUE(view->GetPriceGrid()->EmptyText().empty());
  EXPECT_EQ(view->GetStartParams().at(CPriceViewAdv::kAdvanceFilterParam), L"1|SGX|FIN|A");

  // Above 10000 the watchlist limit applies.
  addon::SettingTextTable::Instance().Set("ADVFT", L"20000");
  addon::SettingTextTable::Instance().Set("MAXWL", L"7");
  view->AdvanceFilter()->Run();
  EXPECT_EQ(view->GetPriceGrid()->RowCount(), 7);
  addon::SettingTextTable::Instance().Set("MAXWL", L"500");

  // "Others": codes that do not start with a letter; the sector "ALL" takes every sector.
  Choose(view, "Shares", "SGX", "ALL", "Others");
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"[KELDO]C6L"}));
  Choose(view, "Shares", "TSE", "ALL", "Others");
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"7203"}));
  Choose(view, "Shares", "SGX", "Technology", "O");
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"O39"}));
  // No match: the grid says so.
  Choose(view, "Shares", "SGX", "Technology", "Q");
  EXPECT_EQ(view->GetPriceGrid()->RowCount(), 0);
  EXPECT_EQ(view->GetPriceGrid()->EmptyText(), CPriceViewAdv::kFilterNoMatchText);

  // In board mode the result is tiles; switching keeps the filter's list.
  Choose(view, "Shares", "SGX", "ALL", "U");
  view->OnCommand(CPriceViewAdv::kBoardModeButtonId);
  EXPECT_EQ(view->GetBoardGrid()->Rows(), (std::vector<InstrumentKey>{{1, L"U11"}}));
  Choose(view, "Shares", "SGX", "ALL", "D");
  EXPECT_EQ(view->GetBoardGrid()->Rows(), (std::vector<InstrumentKey>{{1, L"D05"}}));
  view->OnCommand(CPriceViewAdv::kListModeButtonId);
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"D05"}));
  // Leaving the family forgets the filter's start parameter.
  view->OnCommand(CPriceViewAdv::kUserButtonId);
  EXPECT_EQ(view->GetStartParams().count(CPriceViewAdv::kAdvanceFilterParam), 0u);
  EXPECT_EQ(Codes(view->GetPriceGrid()), (std::vector<std::wstring>{L"D05", L"O39", L"U11"}));
}

TEST_F(Filter, StartParameter_RestoresTheChoicesOfASavedLayout) {
  CPriceViewAdv* view = Make();
  host.SendLink(view, L"{\"type\":\"start\",\"data\":[{\"User_field_display_mode\":\"Board\","
                      L"\"User_field_advance_filter\":\"1|SGX|TEC|ALL\"}]}");
  EXPECT_EQ(view->GetListKind(), kAdvanceFilter);
  EXPECT_EQ(view->GetDisplayMode(), CPriceViewAdv::kBoardMode);
  EXPECT_EQ(List(view, 2030)->currentText(), "Technology");
  std::vector<std::wstring> codes;
  for (const auto& k : view->GetBoardGrid()->Rows()) codes.push_back(k.InstrumentCode);
  ASSERT_EQ(codes.size(), 26u);  // O39 and the even A-codes
  EXPECT_EQ(codes.front(), L"O39");
  // A choice that is not offered leaves the family with nothing chosen.
  host.SendLink(view, L"{\"type\":\"start\",\"data\":[{\"User_field_advance_filter\":\"1|NYSE|***|A\"}]}");
  EXPECT_EQ(view->GetListKind(), kAdvanceFilter);
  EXPECT_EQ(view->AdvanceFilter()->CurrentChoice(), std::nullopt);
}

}  // namespace
}  // namespace pricetest
