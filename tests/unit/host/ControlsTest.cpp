#include <gtest/gtest.h>
#include <unistd.h>

#include <QImage>
#include <QSignalSpy>
#include <QTest>
#include <filesystem>

#include "GuiSupport.h"
#include "hostview/Buttons.h"
#include "hostview/Edits.h"
#include "hostview/Statics.h"

class ControlsTest : public ::testing::Test {
 protected:
  void SetUp() override { EnsureApp(); }
};

TEST_F(ControlsTest, FloatEditShowsRoundedValueAndRefusesExtraDecimals) {
  CFloatEdit edit(nullptr, 2);
  EXPECT_FALSE(edit.HasValue());
  EXPECT_EQ(edit.GetValue(), 0.0);
  edit.SetValue(2.675);
  EXPECT_EQ(edit.text(), QStringLiteral("2.68"));
  edit.SetValue(1234567.5);
  EXPECT_EQ(edit.text(), QStringLiteral("1234567.50"));  // no separators in an edit
  EXPECT_DOUBLE_EQ(edit.GetValue(), 1234567.5);

  edit.SetDecimals(3);
  EXPECT_EQ(edit.text(), QStringLiteral("1234567.500"));
  EXPECT_EQ(edit.GetDecimals(), 3);

  // Typing: a fourth decimal and a minus sign (range from 0) are refused.
  edit.clear();
  edit.show();
  edit.setFocus();
  QTest::keyClicks(&edit, QStringLiteral("-12.3456"));
  EXPECT_EQ(edit.text(), QStringLiteral("12.345"));

  // Leaving the edit shows the number in full.
  edit.clear();
  QTest::keyClicks(&edit, QStringLiteral("1.5"));
  QTest::keyClick(&edit, Qt::Key_Return);
  EXPECT_EQ(edit.text(), QStringLiteral("1.500"));

  edit.SetValue(12.345);
  edit.SetRange(-10, 10);
  EXPECT_EQ(edit.text(), QStringLiteral("10.000"));  // moved into the new range
  edit.clear();
  QTest::keyClicks(&edit, QStringLiteral("-1.5"));
  EXPECT_DOUBLE_EQ(edit.GetValue(), -1.5);
}

TEST_F(ControlsTest, SpinAnnouncesStepThenMovesBuddy) {
  CFloatEdit price(nullptr, 2);
  CBranticSpinBt spin(nullptr, 2025);
  spin.SetBuddy(&price);
  spin.SetBuddyStep(0.05);
  price.SetValue(1.00);
  std::vector<std::string> order;
  QObject::connect(&spin, &CBranticSpinBt::positionChanging, [&](int d) {
    order.push_back("changing " + std::to_string(d) + " at " + price.text().toStdString());
  });
  QObject::connect(&spin, &CBranticSpinBt::scrolled, [&](int) { order.push_back("scrolled " + price.text().toStdString()); });
  spin.Step(+1);
  EXPECT_EQ(order, (std::vector<std::string>{"changing 1 at 1.00", "scrolled 1.05"}));
  EXPECT_EQ(spin.GetCtrlId(), 2025);

  price.SetValue(0.02);
  spin.Step(-1);
  EXPECT_EQ(price.text(), QStringLiteral("0.00"));  // never below the edit's minimum

  // The arrow keys in the price edit step as the arrows do.
  price.SetValue(1.00);
  QTest::keyClick(&price, Qt::Key_Up);
  QTest::keyClick(&price, Qt::Key_Up);
  EXPECT_EQ(price.text(), QStringLiteral("1.10"));

  spin.SetRange(0, 2);
  spin.SetPos(2);
  spin.Step(+1);
  EXPECT_EQ(spin.GetPos(), 2);
}

TEST_F(ControlsTest, DateControlKeepsDatesInRange) {
  CptDatetimeCtrl date;
  date.SetFormat(L"dd MMM yyyy");
  const QDate today(2027, 1, 5);
  ASSERT_TRUE(date.SetRange(today, today.addDays(15)));
  EXPECT_TRUE(date.SetTime(today.addDays(3)));
  EXPECT_EQ(date.GetTime(), QDate(2027, 1, 8));
  EXPECT_EQ(date.text(), QStringLiteral("08 Jan 2027"));
  EXPECT_TRUE(date.SetTime(today.addDays(40)));
  EXPECT_EQ(date.GetTime(), today.addDays(15));
  EXPECT_FALSE(date.SetTime(QDate()));
  EXPECT_FALSE(date.SetRange(today, today.addDays(-1)));
  QDate lo, hi;
  date.GetRange(lo, hi);
  EXPECT_EQ(lo, today);
  EXPECT_EQ(hi, today.addDays(15));
}

TEST_F(ControlsTest, CheckBoxButtonTogglesAndReportsItsCommand) {
  CButtonEx box(nullptr, 2018);
  box.SetCheckBox(true);
  box.SetWindowText(L"Email");
  box.resize(box.sizeHint());
  box.show();
  QSignalSpy cmd(&box, &CHostButton::commandClicked);
  QTest::mouseClick(&box, Qt::LeftButton);
  EXPECT_TRUE(box.GetCheck());
  QTest::mouseClick(&box, Qt::LeftButton);
  EXPECT_FALSE(box.GetCheck());
  ASSERT_EQ(cmd.count(), 2);
  EXPECT_EQ(cmd.at(0).at(0).toInt(), 2018);
  EXPECT_EQ(box.GetWindowText(), L"Email");
  box.grab();

  CBranticButton submit(nullptr, 2016);
  submit.SetFlat(true);
  submit.SetWindowText(L"slable");
  submit.show();
  QSignalSpy submitted(&submit, &CHostButton::commandClicked);
  QTest::mouseClick(&submit, Qt::LeftButton);
  EXPECT_EQ(submitted.count(), 1);
  submit.setEnabled(false);
  QTest::mouseClick(&submit, Qt::LeftButton);
  EXPECT_EQ(submitted.count(), 1);  // disabled buttons report nothing
}

TEST_F(ControlsTest, ImageButtonLoadsStateStripsThroughTheStyle) {
  const auto dir = std::filesystem::temp_directory_path() / ("hostview_img_" + std::to_string(::getpid()));
  std::filesystem::create_directories(dir);
  QImage strip(64, 16, QImage::Format_RGB32);
  strip.fill(Qt::red);
  ASSERT_TRUE(strip.save(QString::fromStdString((dir / "InstrumentExplorer.bmp").string()), "BMP"));

  FakeStyle style;
  style.imageDir = dir.string();
  CImageButton button(nullptr, 2015);
  button.SetStyleManager(&style);
  EXPECT_TRUE(button.LoadBitmap(L".\\images\\Toolbar\\3\\InstrumentExplorer.bmp", 4));
  ASSERT_FALSE(style.resolved.empty());
  EXPECT_EQ(style.resolved.back(), L".\\images\\Toolbar\\3\\InstrumentExplorer.bmp");
  EXPECT_EQ(button.sizeHint(), QSize(16 + 4, 16 + 4));  // one state wide
  button.grab();

  EXPECT_FALSE(button.LoadBitmap(L".\\images\\Toolbar\\3\\missing.bmp"));
  EXPECT_FALSE(button.HasBitmap());
  button.grab();  // falls back to its text
  std::filesystem::remove_all(dir);
}

TEST_F(ControlsTest, EditSwitchesToMultiLineKeepingText) {
  CBranticEdit edit;
  edit.SetWindowText(L"first");
  edit.SetMultiLine(true);
  EXPECT_TRUE(edit.IsMultiLine());
  EXPECT_EQ(edit.GetWindowText(), L"first");
  edit.SetLimitText(8);
  edit.SetWindowText(L"line one\nline two");
  EXPECT_EQ(edit.GetWindowText(), L"line one");
  edit.SetMultiLine(false);
  EXPECT_EQ(edit.GetWindowText(), L"line one");
}

TEST_F(ControlsTest, HyperlinkOpensThroughTheReplaceableOpener) {
  std::vector<QString> opened;
  CHyperlinkStatic::SetUrlOpener([&](const QString& url) {
    opened.push_back(url);
    return true;
  });
  CHyperlinkStatic link;
  link.SetCaption(L"Here");
  link.resize(link.sizeHint());
  link.show();
  QTest::mouseClick(&link, Qt::LeftButton);
  EXPECT_TRUE(opened.empty());  // no address yet
  link.SetHyperlink(L"https://broker.example/remarks");
  QTest::mouseClick(&link, Qt::LeftButton);
  ASSERT_EQ(opened.size(), 1u);
  EXPECT_EQ(opened[0], QStringLiteral("https://broker.example/remarks"));
  CHyperlinkStatic::SetUrlOpener({});
}

TEST_F(ControlsTest, ToolTipShowsHidesAndForgetsDeletedTools) {
  CPPToolTip tip;
  FakeStyle style;
  tip.SetStyleManager(&style);
  tip.ShowHelpTooltip(QPoint(10, 10), L"Price:<b>1.23</b>");
  EXPECT_TRUE(tip.IsShown());
  EXPECT_EQ(tip.GetShownText(), L"Price:<b>1.23</b>");
  tip.grab();
  tip.ShowHelpTooltip(QPoint(10, 10), L"");
  EXPECT_FALSE(tip.IsShown());

  auto* tool = new QWidget;
  tip.AddTool(tool, L"Table View");
  EXPECT_TRUE(tip.HasTool(tool));
  tip.UpdateTipText(L"Grid View", tool);
  EXPECT_EQ(tip.GetToolText(tool), L"Grid View");
  delete tool;
  EXPECT_FALSE(tip.HasTool(tool));
}
