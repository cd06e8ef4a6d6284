#include <gtest/gtest.h>

#include <QLineEdit>
#include <QSignalSpy>
#include <QTest>

#include "GuiSupport.h"
#include "hostview/CustomTabCtrl.h"

namespace {

class TabCtrlTest : public ::testing::Test {
 protected:
  void SetUp() override {
    EnsureApp();
    tabs = std::make_unique<CCustomTabCtrl>(nullptr, CTCS_ADDBUTTON | CTCS_DRAGMOVE | CTCS_EDITLABELS, 2009);
    tabs->resize(600, 26);
    tabs->SetNotifyHandler([this](CTCNotify& n) {
      seen.push_back(n);
      if (refuseCode == n.code) n.refuse = true;
    });
    tabs->AddItem(L"Tech", 11);
    tabs->AddItem(L"Banks", 22);
    tabs->AddItem(L"REITs", 33);
    tabs->SetCurSel(0);
    tabs->show();
  }

  std::vector<int> Codes() const {
    std::vector<int> codes;
    for (const auto& n : seen) codes.push_back(n.code);
    return codes;
  }
  std::vector<std::wstring> Texts() const {
    std::vector<std::wstring> t;
    for (int i = 0; i < tabs->GetItemCount(); ++i) t.push_back(tabs->GetItemText(i));
    return t;
  }
  QPoint Center(int i) const { return tabs->GetItemRect(i).center(); }

  std::unique_ptr<CCustomTabCtrl> tabs;
  std::vector<CTCNotify> seen;
  int refuseCode = 0;
};

}  // namespace

TEST_F(TabCtrlTest, ItemsKeepTheirDataThroughInsertDeleteAndMove) {
  tabs->SetCurSel(1);  // Banks
  EXPECT_EQ(tabs->InsertItem(0, L"New", 44), 0);
  EXPECT_EQ(tabs->GetCurSel(), 2);  // still Banks
  EXPECT_EQ(tabs->GetItemData(2), 22);
  EXPECT_EQ(tabs->InsertItem(99, L"Last", 55), 4);  // clamped to the end

  ASSERT_TRUE(tabs->MoveItem(2, 4));
  EXPECT_EQ(Texts(), (std::vector<std::wstring>{L"New", L"Tech", L"REITs", L"Last", L"Banks"}));
  EXPECT_EQ(tabs->GetCurSel(), 4);  // the current item moved with Banks
  EXPECT_EQ(tabs->FindItemData(22), 4);

  ASSERT_TRUE(tabs->DeleteItem(4));  // deleting the current selects its neighbour
  EXPECT_EQ(tabs->GetCurSel(), 3);
  EXPECT_FALSE(tabs->DeleteItem(4));
  EXPECT_FALSE(tabs->SetItemText(-1, L"x"));
  EXPECT_EQ(tabs->GetItemData(17), 0);
  EXPECT_TRUE(seen.empty());  // programmatic calls notify nothing

  // Pointer-sized values survive unchanged.
  int anchor = 0;
  ASSERT_TRUE(tabs->SetItemData(0, ToLParam(&anchor)));
  EXPECT_EQ(FromLParam<int>(tabs->GetItemData(0)), &anchor);

  tabs->DeleteAllItems();
  EXPECT_EQ(tabs->GetItemCount(), 0);
  EXPECT_EQ(tabs->GetCurSel(), -1);
}

TEST_F(TabCtrlTest, ClickSelectsAndNotifiesWithTheControlId) {
  QSignalSpy sel(tabs.get(), &CCustomTabCtrl::selectionChanged);
  QTest::mouseClick(tabs.get(), Qt::LeftButton, {}, Center(2));
  EXPECT_EQ(tabs->GetCurSel(), 2);
  ASSERT_EQ(Codes(), (std::vector<int>{CTCN_SELCHANGE, CTCN_CLICK}));
  EXPECT_EQ(seen[0].idFrom, 2009);
  EXPECT_EQ(seen[0].item, 2);
  ASSERT_EQ(sel.count(), 1);
  EXPECT_EQ(sel.at(0).at(0).toInt(), 2);

  // Clicking the current item again is a click, not a selection change.
  seen.clear();
  QTest::mouseClick(tabs.get(), Qt::LeftButton, {}, Center(2));
  EXPECT_EQ(Codes(), (std::vector<int>{CTCN_CLICK}));

  seen.clear();
  QTest::mouseClick(tabs.get(), Qt::RightButton, {}, Center(1));
  ASSERT_EQ(Codes(), (std::vector<int>{CTCN_RCLICK}));
  EXPECT_EQ(seen[0].item, 1);
  EXPECT_EQ(tabs->GetCurSel(), 2);  // a right click does not select
}

TEST_F(TabCtrlTest, RenameInPlaceReportsOldTextAndCanBeRefused) {
  QSignalSpy changed(tabs.get(), &CCustomTabCtrl::labelChanged);
  ASSERT_TRUE(tabs->EditLabel(1));
  auto* editor = tabs->findChild<QLineEdit*>();
  ASSERT_NE(editor, nullptr);
  editor->setText(QStringLiteral("Lenders"));
  QTest::keyClick(editor, Qt::Key_Return);
  EXPECT_FALSE(tabs->IsEditing());
  EXPECT_EQ(tabs->GetItemText(1), L"Lenders");
  ASSERT_EQ(Codes(), (std::vector<int>{CTCN_LABELUPDATE}));
  EXPECT_EQ(seen[0].oldText, L"Banks");
  EXPECT_EQ(changed.count(), 1);

  // The owner refuses (say, a name that exists): the old label comes back.
  seen.clear();
  refuseCode = CTCN_LABELUPDATE;
  tabs->EditLabel(1);
  editor->setText(QStringLiteral("Tech"));
  QTest::keyClick(editor, Qt::Key_Return);
  EXPECT_EQ(tabs->GetItemText(1), L"Lenders");
  EXPECT_EQ(changed.count(), 1);

  // Escape cancels without a notification; an unchanged text notifies nothing.
  seen.clear();
  tabs->EditLabel(0);
  editor->setText(QStringLiteral("Other"));
  QTest::keyClick(editor, Qt::Key_Escape);
  tabs->EditLabel(0);
  QTest::keyClick(editor, Qt::Key_Return);
  EXPECT_EQ(tabs->GetItemText(0), L"Tech");
  EXPECT_TRUE(seen.empty());
}

TEST_F(TabCtrlTest, DoubleClickStartsRename) {
  QTest::mouseDClick(tabs.get(), Qt::LeftButton, {}, Center(2));
  EXPECT_TRUE(tabs->IsEditing());
  tabs->CancelEdit();
  tabs->ModifyStyle(CTCS_EDITLABELS, 0);
  QTest::mouseDClick(tabs.get(), Qt::LeftButton, {}, Center(2));
  EXPECT_FALSE(tabs->IsEditing());
}

TEST_F(TabCtrlTest, DraggingATabReordersAndTheCurrentFollows) {
  QSignalSpy moved(tabs.get(), &CCustomTabCtrl::itemMoved);
  const QPoint from = Center(0);
  const QPoint to = Center(2);
  QTest::mousePress(tabs.get(), Qt::LeftButton, {}, from);
  QTest::mouseMove(tabs.get(), from + QPoint(10, 0));
  QTest::mouseMove(tabs.get(), to);
  QTest::mouseRelease(tabs.get(), Qt::LeftButton, {}, to);
  EXPECT_EQ(Texts(), (std::vector<std::wstring>{L"Banks", L"REITs", L"Tech"}));
  EXPECT_EQ(tabs->GetCurSel(), 2);
  ASSERT_EQ(moved.count(), 1);
  const CTCNotify& n = seen.back();
  EXPECT_EQ(n.code, CTCN_ITEMMOVED);
  EXPECT_EQ(n.item, 0);
  EXPECT_EQ(n.target, 2);

  // A press and release without moving reorders nothing.
  QTest::mouseClick(tabs.get(), Qt::LeftButton, {}, Center(1));
  EXPECT_EQ(moved.count(), 1);
}

TEST_F(TabCtrlTest, DraggingOffTheStripHandsTheDragToTheOwner) {
  tabs->ModifyStyle(CTCS_DRAGMOVE, CTCS_DRAGOUT);
  QSignalSpy started(tabs.get(), &CCustomTabCtrl::dragStarted);
  const QPoint from = Center(1);
  QTest::mousePress(tabs.get(), Qt::LeftButton, {}, from);
  QTest::mouseMove(tabs.get(), from + QPoint(0, 10));
  QTest::mouseMove(tabs.get(), from + QPoint(0, 80));
  QTest::mouseMove(tabs.get(), from + QPoint(0, 90));
  QTest::mouseRelease(tabs.get(), Qt::LeftButton, {}, from + QPoint(0, 90));
  ASSERT_EQ(started.count(), 1);  // once per drag
  EXPECT_EQ(started.at(0).at(0).toInt(), 1);
  EXPECT_EQ(seen.back().code, CTCN_BEGINDRAG);
  EXPECT_EQ(Texts(), (std::vector<std::wstring>{L"Tech", L"Banks", L"REITs"}));
}

TEST_F(TabCtrlTest, AddButtonAsksTheOwner) {
  QSignalSpy add(tabs.get(), &CCustomTabCtrl::addRequested);
  const QRect r = tabs->GetAddButtonRect();
  ASSERT_FALSE(r.isEmpty());
  QTest::mouseClick(tabs.get(), Qt::LeftButton, {}, r.center());
  EXPECT_EQ(add.count(), 1);
  EXPECT_EQ(Codes(), (std::vector<int>{CTCN_ADDREQUEST}));
  EXPECT_EQ(tabs->GetItemCount(), 3);  // the owner adds the item, not the strip
  tabs->ModifyStyle(CTCS_ADDBUTTON, 0);
  EXPECT_TRUE(tabs->GetAddButtonRect().isEmpty());
}

TEST_F(TabCtrlTest, DeleteRequestCanBeRefused) {
  tabs->ModifyStyle(0, CTCS_CLOSEBUTTON);
  tabs->SetCurSel(1);
  refuseCode = CTCN_DELETEREQUEST;
  QTest::mouseClick(tabs.get(), Qt::LeftButton, {}, tabs->GetCloseButtonRect().center());
  EXPECT_EQ(tabs->GetItemCount(), 3);
  EXPECT_EQ(Codes(), (std::vector<int>{CTCN_DELETEREQUEST}));

  seen.clear();
  refuseCode = 0;
  QSignalSpy deleted(tabs.get(), &CCustomTabCtrl::itemDeleted);
  tabs->setFocus();
  QTest::keyClick(tabs.get(), Qt::Key_Delete);
  EXPECT_EQ(Texts(), (std::vector<std::wstring>{L"Tech", L"REITs"}));
  EXPECT_EQ(deleted.count(), 1);
  EXPECT_EQ(tabs->GetCurSel(), 1);  // REITs took the place
  EXPECT_EQ(Codes(), (std::vector<int>{CTCN_DELETEREQUEST, CTCN_SELCHANGE}));
}

TEST_F(TabCtrlTest, ManyTabsScrollToKeepTheCurrentVisible) {
  tabs->DeleteAllItems();
  for (int i = 0; i < 40; ++i) tabs->AddItem(L"Watchlist " + std::to_wstring(i), i);
  tabs->resize(300, 26);
  tabs->SetCurSel(39);
  const QRect r = tabs->GetItemRect(39);
  ASSERT_FALSE(r.isEmpty());
  EXPECT_LE(r.right(), tabs->width());
  EXPECT_TRUE(tabs->GetItemRect(0).isEmpty());
  tabs->SetCurSel(0);
  EXPECT_FALSE(tabs->GetItemRect(0).isEmpty());
  EXPECT_EQ(tabs->HitTest(tabs->GetItemRect(0).center()), 0);

  // Selected while still narrow, then widened: the first tabs come back.
  tabs->resize(60, 26);
  tabs->SetCurSel(3);
  tabs->resize(3000, 26);
  EXPECT_FALSE(tabs->GetItemRect(0).isEmpty());
  EXPECT_FALSE(tabs->GetItemRect(3).isEmpty());
}

TEST_F(TabCtrlTest, StatusTextLeavesRoomAndHandlerMayRebuild) {
  tabs->SetStatusText(L"Delayed 15 min");
  EXPECT_EQ(tabs->GetStatusText(), L"Delayed 15 min");
  FakeStyle style;
  tabs->SetStyleManager(&style);
  tabs->grab();  // paints with the style without trouble

  // A handler that rebuilds the strip on a click must not crash it.
  tabs->SetNotifyHandler([this](CTCNotify& n) {
    if (n.code == CTCN_SELCHANGE) {
      tabs->DeleteAllItems();
      tabs->AddItem(L"Only", 1);
    }
  });
  QTest::mouseClick(tabs.get(), Qt::LeftButton, {}, Center(2));
  EXPECT_EQ(Texts(), (std::vector<std::wstring>{L"Only"}));
}
