#include <gtest/gtest.h>

#include <QAbstractItemView>
#include <QFocusEvent>
#include <QLineEdit>
#include <QTest>
#include <QWindow>

#include "UiTestApp.h"
#include "controls/InstrumentComboBox.h"
#include "controls/InstrumentSearch.h"
#include "hostview/Services.h"

namespace {

JInstrumentUnderlying Ins(std::string name, std::string symbol, std::string exchange = "HKEX", std::int64_t product = 1,
                          std::string code = {}) {
  JInstrumentUnderlying i;
  i.instrumentName = std::move(name);
  i.symbol = std::move(symbol);
  i.exchangeCode = std::move(exchange);
  i.productId = product;
  i.instrumentCode = code.empty() ? i.symbol : std::move(code);
  i.displayCode = "D-" + i.symbol;
  return i;
}

std::vector<std::string> Names(const std::vector<JInstrumentUnderlying>& list, const std::vector<int>& positions) {
  std::vector<std::string> out;
  for (int p : positions) out.push_back(list[std::size_t(p)].instrumentName);
  return out;
}

class FixedLanguage : public ILanguage {
 public:
  std::wstring GetText(int section, int entry) const override {
    return section == 13 && entry == 11 ? L"Find an instrument" : L"";
  }
};

class ComboTest : public ::testing::Test {
 protected:
  void SetUp() override {
    UiApp();
    clock = &platform::UseVirtualClock();
  }
  static void Type(CInstrumentComboBox& c, const QString& text) {
    for (QChar ch : text) QTest::keyClick(c.lineEdit(), ch.toLatin1());
  }
  platform::VirtualClock* clock = nullptr;
};

TEST_F(ComboTest, Combo_AttachShowsFirstItemsThenFillsInSteps) {
  std::vector<JInstrumentUnderlying> list;
  for (int i = 0; i < 2100; ++i) list.push_back(Ins("Name " + std::to_string(i), "S" + std::to_string(i)));
  CInstrumentComboBox combo;
  combo.AttachList(&list, {});
  EXPECT_EQ(combo.ItemCount(), 52);
  EXPECT_EQ(combo.currentIndex(), 0);
  EXPECT_EQ(combo.GetChosenInstrument().instrumentName, "Name 0");
  EXPECT_TRUE(combo.IsFilling());
  clock->Advance(399);
  EXPECT_EQ(combo.ItemCount(), 52);
  clock->Advance(1);
  EXPECT_EQ(combo.ItemCount(), 52 + 1002);
  clock->Advance(800);
  EXPECT_EQ(combo.ItemCount(), 2100);
  EXPECT_FALSE(combo.IsFilling()) << "the fill stops when everything is in";
  for (int i = 0; i < 2100; i += 350) EXPECT_EQ(combo.ItemPositions()[std::size_t(i)], i);
  EXPECT_EQ(combo.ItemTextAt(7), QStringLiteral("Name 7 [HKEX : S7]"));

  // An empty list is fine.
  std::vector<JInstrumentUnderlying> none;
  combo.AttachList(&none, {});
  EXPECT_EQ(combo.ItemCount(), 0);
  EXPECT_EQ(combo.GetChosenInstrument().productId, -1);
}

TEST_F(ComboTest, Combo_TypingSearchesAfterThePause) {
  std::vector<JInstrumentUnderlying> list{Ins("Zed", "ZAB"), Ins("Xab", "X1"), Ins("Nothing", "N1"),
                                          Ins("Other", "AB1"), Ins("Abc", "C1")};
  CInstrumentComboBox combo;
  combo.AttachList(&list, {});
  combo.lineEdit()->clear();
  Type(combo, QStringLiteral("AB"));
  EXPECT_EQ(combo.ItemCount(), 5) << "no search before the pause";
  clock->Advance(99);
  EXPECT_EQ(combo.LastSearch(), QString());
  clock->Advance(1);
  EXPECT_EQ(combo.LastSearch(), QStringLiteral("AB"));
  EXPECT_EQ(Names(list, combo.ItemPositions()), (std::vector<std::string>{"Abc", "Other", "Xab", "Zed"}));
  EXPECT_EQ(combo.lineEdit()->text(), QStringLiteral("AB")) << "the typed text stays";
  EXPECT_EQ(combo.currentIndex(), 0);
  EXPECT_EQ(combo.GetChosenInstrument().instrumentName, "Abc");
  EXPECT_FALSE(combo.IsFilling());

  // Deleting and retyping the last letter within the pause starts no search.
  QTest::keyClick(combo.lineEdit(), Qt::Key_Backspace);
  EXPECT_TRUE(platform::HasTimer(&combo, CInstrumentComboBox::kSearchTimer));
  clock->Advance(50);
  Type(combo, QStringLiteral("B"));
  EXPECT_FALSE(platform::HasTimer(&combo, CInstrumentComboBox::kSearchTimer));
  clock->Advance(500);
  EXPECT_EQ(combo.ItemCount(), 4);

  // Clearing the text lists everything again, in list order.
  combo.lineEdit()->selectAll();
  QTest::keyClick(combo.lineEdit(), Qt::Key_Delete);
  clock->Advance(100);
  EXPECT_EQ(combo.ItemCount(), 5);
  EXPECT_EQ(combo.ItemPositions(), (std::vector<int>{0, 1, 2, 3, 4}));
}

// Keys as the windowing system delivers them: to the window, which hands them
// to the open drop-down when there is one, else to the focused widget.
void KeyToWindow(QWidget* w, Qt::Key key, const QString& text = QString()) {
  QWindow* window = w->window()->windowHandle();
  ASSERT_NE(window, nullptr);
  QTest::sendKeyEvent(QTest::KeyAction::Click, window, key, text, Qt::NoModifier);
}
void TypeToWindow(QWidget* w, const QString& text) {
  for (QChar ch : text) KeyToWindow(w, Qt::Key(ch.toUpper().unicode()), QString(ch));
}

TEST_F(ComboTest, Combo_TypingGoesOnWhileTheDropDownIsOpen) {
  std::vector<JInstrumentUnderlying> list{Ins("Abc Holdings", "A1"), Ins("Xab", "X1"), Ins("Abd", "A2"),
                                          Ins("Nothing", "N1"), Ins("Other", "ZABC"), Ins("Abcd", "A3")};
  CInstrumentComboBox combo;
  combo.AttachList(&list, {});
  combo.show();
  QApplication::setActiveWindow(&combo);
  combo.lineEdit()->setFocus();
  ASSERT_TRUE(combo.lineEdit()->hasFocus());
  combo.lineEdit()->clear();

  TypeToWindow(&combo, QStringLiteral("ab"));
  clock->Advance(100);
  ASSERT_TRUE(combo.view()->isVisible()) << "the search opens the drop-down";
  EXPECT_EQ(combo.ItemCount(), 5);
  EXPECT_EQ(QApplication::activePopupWidget(), combo.view()->window()) << "the list has the keyboard now";

  TypeToWindow(&combo, QStringLiteral("c"));
  EXPECT_EQ(combo.lineEdit()->text().toStdString(), "abc");
  clock->Advance(100);
  EXPECT_EQ(combo.lineEdit()->text().toStdString(), "abc");
  EXPECT_EQ(combo.LastSearch().toStdString(), "abc");
  EXPECT_EQ(Names(list, combo.ItemPositions()), (std::vector<std::string>{"Abc Holdings", "Abcd", "Other"}));
  EXPECT_TRUE(combo.view()->isVisible()) << "the list stays open, refitted";

  // Editing keys go to the text as well.
  KeyToWindow(&combo, Qt::Key_Backspace);
  EXPECT_EQ(combo.lineEdit()->text().toStdString(), "ab");
  TypeToWindow(&combo, QStringLiteral("cd"));
  clock->Advance(100);
  EXPECT_EQ(combo.lineEdit()->text().toStdString(), "abcd");
  EXPECT_EQ(Names(list, combo.ItemPositions()), (std::vector<std::string>{"Abcd"}));

  // Enter picks the highlighted match.
  int chosen = 0;
  QObject::connect(&combo, &CInstrumentComboBox::InstrumentChosen, [&] { ++chosen; });
  KeyToWindow(&combo, Qt::Key_Backspace);
  clock->Advance(100);
  ASSERT_EQ(Names(list, combo.ItemPositions()), (std::vector<std::string>{"Abc Holdings", "Abcd", "Other"}));
  ASSERT_TRUE(combo.view()->isVisible());
  KeyToWindow(&combo, Qt::Key_Down);  // the list moves its highlight
  EXPECT_EQ(combo.lineEdit()->text().toStdString(), "abc");
  KeyToWindow(&combo, Qt::Key_Return);
  EXPECT_EQ(chosen, 1);
  EXPECT_FALSE(combo.view()->isVisible());
  EXPECT_EQ(combo.GetChosenInstrument().instrumentName, "Abcd");

  // A click picks the match under the pointer.
  combo.lineEdit()->setFocus();
  combo.lineEdit()->selectAll();
  TypeToWindow(&combo, QStringLiteral("oth"));
  clock->Advance(100);
  ASSERT_TRUE(combo.view()->isVisible());
  ASSERT_EQ(Names(list, combo.ItemPositions()), (std::vector<std::string>{"Other", "Nothing"}));
  const QRect second = combo.view()->visualRect(combo.view()->model()->index(1, 0));
  QTest::mouseClick(combo.view()->viewport(), Qt::LeftButton, {}, second.center());
  EXPECT_EQ(chosen, 2);
  EXPECT_EQ(combo.GetChosenInstrument().instrumentName, "Nothing");
}

TEST_F(ComboTest, Combo_SelectByKeyAndChosenInstrument) {
  std::vector<JInstrumentUnderlying> list;
  for (int i = 0; i < 300; ++i) list.push_back(Ins("Name " + std::to_string(i), "S" + std::to_string(i), "HKEX", i % 3));
  CInstrumentComboBox combo;
  combo.AttachList(&list, {});
  combo.lineEdit()->clear();
  Type(combo, QStringLiteral("name 29"));
  clock->Advance(100);
  ASSERT_LT(combo.ItemCount(), 300);

  // Selecting rebuilds the whole list, stops the fill, and finds the item.
  JInstrumentUnderlying wanted = list[250];
  EXPECT_EQ(combo.SelectByKey(wanted), 250);
  EXPECT_EQ(combo.ItemCount(), 300);
  EXPECT_FALSE(combo.IsFilling());
  EXPECT_EQ(combo.GetChosenInstrument().instrumentCode, "S250");
  EXPECT_EQ(combo.lineEdit()->text(), QStringLiteral("Name 250 [HKEX : S250]"));

  // Same code, other product: not there.
  wanted.productId += 1;
  EXPECT_EQ(combo.SelectByKey(wanted), -1);
  EXPECT_EQ(combo.GetChosenInstrument().productId, -1);
}

TEST_F(ComboTest, Combo_ItemTextUsesDisplayCodeForCfdAndDma) {
  std::vector<JInstrumentUnderlying> list{Ins(" Plain ", " P1 ", "HKEX", 1), Ins("Dma Stock", "DM1", "SZ", 2),
                                          Ins("Cfd Stock", "CF1", "US", 3)};
  std::map<std::int64_t, JProduct> products;
  products[1] = JProduct{1, "ES", "Equities"};
  products[2] = JProduct{2, "DMA", "Direct"};
  products[3] = JProduct{3, "CFD", "Contracts"};
  CInstrumentComboBox combo;
  combo.AttachList(&list, products);
  EXPECT_EQ(combo.ItemTextAt(0), QStringLiteral("Plain [HKEX : P1]"));
  EXPECT_EQ(combo.ItemTextAt(1), QStringLiteral("Dma Stock [SZ : D-DM1]"));
  EXPECT_EQ(combo.ItemTextAt(2), QStringLiteral("Cfd Stock [US : D-CF1]"));
}

TEST_F(ComboTest, Combo_PlaceholderWhenEmptyAndGrey) {
  std::vector<JInstrumentUnderlying> list{Ins("Abc", "A1")};
  CInstrumentComboBox combo;
  combo.AttachList(&list, {});
  combo.SetLanguage(nullptr);
  EXPECT_EQ(combo.lineEdit()->text(), QStringLiteral("Search Instrument"));
  EXPECT_TRUE(combo.IsPlaceholderShown());
  EXPECT_EQ(combo.currentIndex(), -1);
  EXPECT_EQ(combo.lineEdit()->palette().color(QPalette::Text), QColor(0xAA, 0xAA, 0xAA));
  EXPECT_FALSE(platform::HasTimer(&combo, CInstrumentComboBox::kSearchTimer)) << "the placeholder is no search";

  FixedLanguage language;
  combo.SetLanguage(&language);
  EXPECT_EQ(combo.lineEdit()->text(), QStringLiteral("Find an instrument"));

  // Entering the box clears the placeholder; leaving it empty brings it back.
  QFocusEvent in(QEvent::FocusIn, Qt::MouseFocusReason);
  QApplication::sendEvent(combo.lineEdit(), &in);
  EXPECT_EQ(combo.lineEdit()->text(), QString());
  EXPECT_FALSE(combo.IsPlaceholderShown());
  EXPECT_NE(combo.lineEdit()->palette().color(QPalette::Text), QColor(0xAA, 0xAA, 0xAA));
  QFocusEvent out(QEvent::FocusOut, Qt::TabFocusReason);
  QApplication::sendEvent(combo.lineEdit(), &out);
  EXPECT_EQ(combo.lineEdit()->text(), QStringLiteral("Find an instrument"));
  EXPECT_TRUE(combo.IsPlaceholderShown());
  EXPECT_EQ(combo.lineEdit()->palette().color(QPalette::Text), QColor(0xAA, 0xAA, 0xAA));

  // Leaving with a text keeps it.
  QApplication::sendEvent(combo.lineEdit(), &in);
  combo.lineEdit()->setText(QStringLiteral("ab"));
  QApplication::sendEvent(combo.lineEdit(), &out);
  EXPECT_EQ(combo.lineEdit()->text().toStdString(), "ab");
}

}  // namespace
