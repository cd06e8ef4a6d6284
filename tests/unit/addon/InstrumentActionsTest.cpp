// The instrument actions and trade keys every view shares, on a view built in
// the test and hosted by the scripted host.
#include <gtest/gtest.h>

#include <QApplication>
#include <QKeyEvent>
#include <QLineEdit>

#include "addon/AddonView.h"
#include "addon/LinkText.h"
#include "hostconfig/UserSettings.h"
#include "hostview/HostLists.h"
#include "mvtest/ScriptedHost.h"

namespace {

// A view that watches the trade keys on itself and on a search box, and
// trades the instrument it is given.
class CKeysView : public CAddonView {
 public:
  CKeysView() : CAddonView(Info()) {}
  static const addon::ViewClassInfo& Info() {
    static const addon::ViewClassInfo info{.className = "CKeysView", .defaultTitle = L"Keys"};
    return info;
  }
  int OnCreate() override {
    search = new QLineEdit(this);
    WatchTradeKeys(this);
    WatchTradeKeys(search, /*textEntry*/ true);
    return 0;
  }
  std::optional<std::wstring> ShortcutTicket(addon::TradeSide side) override {
    if (code.empty()) return std::nullopt;
    return addon::ShortcutTicketText(code, 7, side).Wide();
  }
  using CAddonView::HandleTradeKey;
  std::string code;
  QLineEdit* search = nullptr;
};

// A view that watches no keys (the alert views).
class CQuietView : public CAddonView {
 public:
  CQuietView() : CAddonView(Info()) {}
  static const addon::ViewClassInfo& Info() {
    static const addon::ViewClassInfo info{.className = "CQuietView"};
    return info;
  }
};

bool Press(QWidget* target, int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
  QKeyEvent press(QEvent::KeyPress, key, modifiers);
  press.setAccepted(false);
  QApplication::sendEvent(target, &press);
  return press.isAccepted();
}

JInstrumentUnderlying Instrument(const std::string& exchange, int status, int altStatus) {
  return JInstrumentUnderlying{.exchangeCode = exchange, .instrumentCode = "A17", .productId = 4,
                               .accessStatus = status, .altAccessStatus = altStatus};
}

struct InstrumentActionsTest : ::testing::Test {
  mvtest::ScriptedHost host;
  void SetUp() override { GetUserSettings().ResetToDefaults(); }
  template <class V>
  V* Make() {
    return static_cast<V*>(host.Adopt(new V));
  }
};

TEST_F(InstrumentActionsTest, TradeKeyOf_SixKeysAndWhichOfThemTypeText) {
  struct Case {
    int key;
    Qt::KeyboardModifiers modifiers;
    addon::TradeSide side;
    bool typesText;
  };
  const Case cases[] = {
      {Qt::Key_F5, Qt::NoModifier, addon::TradeSide::Buy, false},
      {Qt::Key_Plus, Qt::KeypadModifier, addon::TradeSide::Buy, false},
      {Qt::Key_Plus, Qt::NoModifier, addon::TradeSide::Buy, true},
      {Qt::Key_Equal, Qt::NoModifier, addon::TradeSide::Buy, true},
      {Qt::Key_F9, Qt::NoModifier, addon::TradeSide::Sell, false},
      {Qt::Key_Minus, Qt::KeypadModifier, addon::TradeSide::Sell, false},
      {Qt::Key_Minus, Qt::NoModifier, addon::TradeSide::Sell, true},
      {Qt::Key_F6, Qt::NoModifier, addon::TradeSide::None, false},
      {Qt::Key_A, Qt::NoModifier, addon::TradeSide::None, false},
  };
  for (const Case& c : cases) {
    const addon::TradeKey key = addon::TradeKeyOf(c.key, c.modifiers);
    EXPECT_EQ(key.side, c.side) << c.key;
    EXPECT_EQ(key.typesText, c.typesText) << c.key;
  }
}

TEST_F(InstrumentActionsTest, TradeKeys_OpenATicketOnlyWhenWatchedAndTheSettingIsOn) {
  auto* view = Make<CKeysView>();
  view->code = "A17";
  EXPECT_TRUE(Press(view, Qt::Key_F9));
  ASSERT_EQ(host.Messages(), (std::vector<UINT>{hm::ShortcutContext, hm::OpenView, hm::LinkData}));
  const auto text = addon::ReadLinkText(host.Requests()[1].link->link);
  ASSERT_TRUE(text);
  EXPECT_EQ(text->type, "price view");
  EXPECT_EQ(text->Get("Field_side"), "sell");
  EXPECT_EQ(text->Get("Field_Fill_price"), "BID");
  EXPECT_EQ(text->Get("Field_product_id"), "7");

  // Nothing to trade, or the setting off: the key is still taken.
  host.ClearRequests();
  view->code.clear();
  EXPECT_TRUE(Press(view, Qt::Key_F5));
  view->code = "A17";
  CKeyboardShortcutsSetting keys;
  keys.SetEnableKeyboardShortcuts(false);
  GetUserSettings().SetKeyboardShortcutsSetting(keys);
  EXPECT_TRUE(Press(view, Qt::Key_Plus, Qt::KeypadModifier));
  EXPECT_TRUE(host.Requests().empty());

  // A view that does not watch the keys leaves them alone.
  auto* quiet = Make<CQuietView>();
  keys.SetEnableKeyboardShortcuts(true);
  GetUserSettings().SetKeyboardShortcutsSetting(keys);
  EXPECT_FALSE(Press(quiet, Qt::Key_F5));
  EXPECT_TRUE(host.Requests().empty());
}

TEST_F(InstrumentActionsTest, TradeKeys_SearchBoxKeepsTypedPlusAndMinus) {
  auto* view = Make<CKeysView>();
  view->code = "A17";
  view->search->setFocus();
  QKeyEvent minus(QEvent::KeyPress, Qt::Key_Minus, Qt::NoModifier, "-");
  QApplication::sendEvent(view->search, &minus);
  EXPECT_EQ(view->search->text(), "-");
  EXPECT_TRUE(host.Requests().empty());
  EXPECT_FALSE(view->HandleTradeKey(Qt::Key_Minus, Qt::NoModifier, /*inTextEntry*/ true));
  Press(view->search, Qt::Key_F5);  // function keys still trade
  EXPECT_EQ(host.RequestsOf(hm::ShortcutContext).size(), 1u);
}

TEST_F(InstrumentActionsTest, OpenViewOn_200Then310AndTheExplorerByName) {
  auto* view = Make<CQuietView>();
  const std::wstring link = L"{\"type\":\"x\",\"data\":[{}]}";
  view->Actions().OpenViewOn(L"CMarketDepthAdv", &link);
  view->Actions().OpenViewOn(L"CFNews", nullptr);
  view->Actions().OpenInstrumentExplorer();
  ASSERT_EQ(host.Messages(),
            (std::vector<UINT>{hm::OpenView, hm::LinkData, hm::OpenView, hm::LinkData, hm::OpenView}));
  EXPECT_EQ(host.Requests()[1].link->className, L"CMarketDepthAdv");
  EXPECT_EQ(host.Requests()[1].link->link, link);
  EXPECT_FALSE(host.Requests()[3].link->hasLink);
  EXPECT_EQ(host.Requests()[4].wtext, L"CInsExpViewEx");
}

TEST_F(InstrumentActionsTest, AccessStatus_AlternateWordWhenTheHostSaysSo) {
  auto* view = Make<CQuietView>();
  const JInstrumentUnderlying instrument = Instrument("SGX", 2, 1);
  EXPECT_EQ(view->Actions().AccessStatusOf(instrument), 2);
  host.AnswerValue(hm::AltStatus, 2);
  EXPECT_EQ(view->Actions().AccessStatusOf(instrument), 1);
  host.AnswerValue(hm::AltStatus, 3);
  EXPECT_EQ(view->Actions().AccessStatusOf(instrument), 2);
  EXPECT_EQ(host.RequestsOf(hm::AltStatus).size(), 3u);
  EXPECT_FALSE(addon::IsViewableStatus(2));
  EXPECT_TRUE(addon::IsViewableStatus(1));
  EXPECT_FALSE(addon::IsTradeableStatus(1));
  EXPECT_TRUE(addon::IsTradeableStatus(3));
}

TEST_F(InstrumentActionsTest, ExchangeCheck_EnabledIsRememberedDisabledIsAskedAgain) {
  auto* view = Make<CQuietView>();
  host.AnswerWith(hm::ExchangeEnabled, [](const mvtest::Feedback& f) {
    const auto* exchange = FromLParam<const JExchangeList>(f.data);
    return std::optional<LPARAM>(exchange->exchangeCode == "SGX" ? 1 : 0);
  });
  auto& actions = view->Actions();
  EXPECT_TRUE(actions.IsExchangeEnabled(Instrument("SGX", 3, 3)));
  EXPECT_TRUE(actions.IsExchangeEnabled(Instrument("SGX", 3, 3)));
  EXPECT_FALSE(actions.IsExchangeEnabled(Instrument("HKEX", 3, 3)));
  EXPECT_FALSE(actions.IsExchangeEnabled(Instrument("HKEX", 3, 3)));
  EXPECT_EQ(host.RequestsOf(hm::ExchangeEnabled).size(), 3u);
  // A later answer outside a question can withdraw it.
  actions.NoteExchangeAnswer("SGX", false);
  EXPECT_FALSE(actions.IsExchangeKnownEnabled("SGX"));
  // No answer at all: not enabled.
  host.ClearAnswers();
  EXPECT_FALSE(actions.IsExchangeEnabled(Instrument("SGX", 3, 3)));
}

}  // namespace
