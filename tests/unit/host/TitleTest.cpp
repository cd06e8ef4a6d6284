#include <gtest/gtest.h>

#include <QDialog>
#include <QSignalSpy>
#include <QTest>

#include "GuiSupport.h"
#include "hostview/Buttons.h"
#include "hosttitle/BranticTitle.h"

class TitleTest : public ::testing::Test {
 protected:
  void SetUp() override { EnsureApp(); }
};

TEST_F(TitleTest, QuickButtonsReportTheirCommands) {
  QDialog dialog;
  dialog.setWindowTitle(QStringLiteral("SGX Remark Definition"));
  dialog.resize(400, 300);
  CBranticTitle title;
  FakeStyle style;
  title.SetMDIChild();
  ASSERT_TRUE(title.SubClassWnd(&dialog));
  title.SetStyleManager(&style);
  EXPECT_EQ(dialog.contentsMargins().top(), title.GetTitleHeight());

  std::vector<int> commands;
  title.SetCommandHandler([&](int id) { commands.push_back(id); });
  EXPECT_TRUE(title.AddQuickButton(11000, L"images/QuickBar/[styleID]/toclose.bmp", L"Close"));
  EXPECT_FALSE(title.AddQuickButton(11000, L"other.bmp", L"Again"));
  EXPECT_TRUE(title.AddQuickButton(11001, L"images/QuickBar/[styleID]/help.bmp", L"Help"));
  dialog.show();

  title.UpdateTitleStyle(7);
  EXPECT_EQ(style.resolved.back(), L"images/QuickBar/7/help.bmp");

  QSignalSpy spy(&title, &CBranticTitle::quickButtonClicked);
  CImageButton* close = title.GetQuickButton(11000);
  ASSERT_NE(close, nullptr);
  QTest::mouseClick(close, Qt::LeftButton);
  EXPECT_EQ(commands, (std::vector<int>{11000}));
  EXPECT_EQ(spy.count(), 1);
  // Buttons sit at the right end, in the order they were added.
  EXPECT_LT(title.GetQuickButton(11000)->x(), title.GetQuickButton(11001)->x());
  EXPECT_GT(title.GetQuickButton(11001)->geometry().right(), dialog.width() - 20);

  title.RemoveAllQuickButtons();
  EXPECT_EQ(title.GetQuickButtonCount(), 0);
  EXPECT_EQ(title.GetQuickButton(11000), nullptr);
}

TEST_F(TitleTest, CaptionFollowsTheWindowAndDetachRestoresMargins) {
  QDialog dialog;
  dialog.setContentsMargins(5, 5, 5, 5);
  dialog.setWindowTitle(QStringLiteral("L/S Regend"));
  {
    CBranticTitle title;
    ASSERT_TRUE(title.SubClassWnd(&dialog));
    EXPECT_EQ(title.GetTitleText(), L"L/S Regend");
    dialog.setWindowTitle(QStringLiteral("Other"));
    EXPECT_EQ(title.GetTitleText(), L"Other");
    title.SetTitleText(L"Fixed");
    dialog.setWindowTitle(QStringLiteral("Ignored"));
    EXPECT_EQ(title.GetTitleText(), L"Fixed");
    dialog.resize(500, 200);
    dialog.show();
    EXPECT_EQ(title.GetBar()->width(), dialog.width());
    EXPECT_EQ(dialog.contentsMargins().top(), 5 + title.GetTitleHeight());
    EXPECT_FALSE(title.SubClassWnd(nullptr));
  }
  EXPECT_EQ(dialog.contentsMargins(), QMargins(5, 5, 5, 5));
}

TEST_F(TitleTest, WindowDeletedBeforeTitleIsSafe) {
  CBranticTitle title;
  auto* dialog = new QDialog;
  ASSERT_TRUE(title.SubClassWnd(dialog));
  title.AddQuickButton(11000, L"x.bmp", L"Close");
  delete dialog;
  EXPECT_EQ(title.GetWindow(), nullptr);
  EXPECT_EQ(title.GetQuickButton(11000), nullptr);
  title.UpdateTitleStyle(1);
  title.RemoveAllQuickButtons();
}
