#pragma once
// A styled tab strip. Every item has a text and a pointer-sized value (a
// watchlist id, a view). The strip can offer an add button, a close mark on
// the current tab, rename in place, reordering by dragging, and a status text
// at its right end. What the user does is reported twice: to the notification
// handler (CTCNotify, which may refuse the action) and as Qt signals after the
// action took effect. Programmatic calls (InsertItem, SetCurSel, ...) report
// nothing.
#include <QCursor>
#include <QString>
#include <QWidget>
#include <functional>
#include <string>
#include <vector>

#include "hostview/Services.h"
#include "hostview/Types.h"

class QLineEdit;

// Style flags of the strip (combine with |).
enum CtcStyle : unsigned {
  CTCS_ADDBUTTON = 0x01,   // "+" after the last tab: CTCN_ADDREQUEST
  CTCS_DRAGMOVE = 0x02,    // tabs can be dragged to a new place: CTCN_ITEMMOVED
  CTCS_EDITLABELS = 0x04,  // double click or F2 renames in place: CTCN_LABELUPDATE
  CTCS_CLOSEBUTTON = 0x08, // close mark on the current tab, Delete key: CTCN_DELETEREQUEST
  CTCS_DRAGOUT = 0x10,     // dragging a tab off the strip: CTCN_BEGINDRAG
};

// Notification codes.
enum CtcNotifyCode : int {
  CTCN_CLICK = 1,          // left press on an item (after any selection change)
  CTCN_RCLICK = 2,         // right press on an item (item -1: on the empty strip)
  CTCN_DBLCLK = 3,
  CTCN_SELCHANGE = 4,      // the user made another item current
  CTCN_BEGINDRAG = 5,      // an item was dragged off the strip; the owner takes over
  CTCN_ITEMMOVED = 6,      // item moved from `item` to `target` (already done)
  CTCN_LABELUPDATE = 7,    // item renamed; `oldText` holds the previous label;
                           // refuse = true restores it
  CTCN_ADDREQUEST = 8,     // the add button was pressed; the owner adds the item
  CTCN_DELETEREQUEST = 9,  // the user asks to remove `item`; refuse = true keeps it
};

struct CTCNotify {
  int idFrom = 0;      // the strip's notification id (SetNotifyId)
  int code = 0;        // CtcNotifyCode
  int item = -1;
  int target = -1;     // CTCN_ITEMMOVED: new index
  QPoint globalPos;    // pointer position for mouse notifications
  std::wstring oldText;
  bool refuse = false; // set by the handler to refuse a request
};

class HV_API CCustomTabCtrl : public QWidget {
  Q_OBJECT
 public:
  using NotifyHandler = std::function<void(CTCNotify&)>;

  explicit CCustomTabCtrl(QWidget* parent = nullptr, unsigned style = 0, int notifyId = 0);
  ~CCustomTabCtrl() override;

  void SetStyleManager(IStyleManager* styleManager);
  IStyleManager* GetStyleManager() const { return m_styleManager; }
  void ModifyStyle(unsigned remove, unsigned add);
  unsigned GetStyle() const { return m_style; }
  void SetNotifyId(int id) { m_notifyId = id; }
  int GetNotifyId() const { return m_notifyId; }
  // Called synchronously on the UI thread; may call back into the strip.
  void SetNotifyHandler(NotifyHandler handler) { m_handler = std::move(handler); }

  // Items. Indexes are 0-based; an out-of-range index is refused (-1 / false).
  int InsertItem(int index, const std::wstring& text, LPARAM data = 0);  // index clamped; returns it
  int AddItem(const std::wstring& text, LPARAM data = 0) { return InsertItem(GetItemCount(), text, data); }
  bool DeleteItem(int index);  // the current item's neighbour becomes current
  void DeleteAllItems();
  int GetItemCount() const { return static_cast<int>(m_items.size()); }
  std::wstring GetItemText(int index) const;
  bool SetItemText(int index, const std::wstring& text);
  LPARAM GetItemData(int index) const;  // 0 when out of range
  bool SetItemData(int index, LPARAM data);
  int FindItemData(LPARAM data) const;  // first item with that value, -1 when none
  bool MoveItem(int from, int to);      // `to` is the final index; the current item follows
  int GetCurSel() const { return m_cur; }
  int SetCurSel(int index);             // returns the previous current item; -1 for none
  void EnsureVisible(int index);

  // Rename in place: an editor over the tab; Enter or leaving it commits, Esc cancels.
  bool EditLabel(int index);
  bool IsEditing() const { return m_editItem >= 0; }
  void CommitEdit();
  void CancelEdit();

  void SetStatusText(const std::wstring& text);
  const std::wstring& GetStatusText() const { return m_status; }
  // Cursor while dragging a tab over the strip, and once it has left it.
  void SetDragCursors(const QCursor& inside, const QCursor& outside);

  // Geometry, in widget coordinates.
  int HitTest(QPoint pos) const;        // item under pos, -1 when none
  QRect GetItemRect(int index) const;   // empty when out of range or scrolled away
  QRect GetAddButtonRect() const;       // empty without CTCS_ADDBUTTON
  QRect GetCloseButtonRect() const;     // on the current item; empty without CTCS_CLOSEBUTTON

  QSize sizeHint() const override;
  QSize minimumSizeHint() const override;

 signals:
  void selectionChanged(int index);
  void itemClicked(int index);
  void itemRightClicked(int index, QPoint globalPos);
  void itemDoubleClicked(int index);
  void itemMoved(int from, int to);
  void labelChanged(int index, QString oldText);
  void addRequested();
  void itemDeleted(int index);
  void dragStarted(int index, QPoint globalPos);

 protected:
  void paintEvent(QPaintEvent* event) override;
  void mousePressEvent(QMouseEvent* event) override;
  void mouseMoveEvent(QMouseEvent* event) override;
  void mouseReleaseEvent(QMouseEvent* event) override;
  void mouseDoubleClickEvent(QMouseEvent* event) override;
  void keyPressEvent(QKeyEvent* event) override;
  void resizeEvent(QResizeEvent* event) override;
  bool event(QEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  struct Item {
    std::wstring text;
    LPARAM data = 0;
  };
  struct Layout {
    std::vector<QRect> tabs;  // one per item, in widget coordinates
    QRect add, left, right, status;
    int tabsRight = 0;        // right end of the area the tabs may use
  };

  Layout ComputeLayout() const;
  int TabWidth(int index) const;
  bool Notify(CTCNotify& n);  // false when refused
  CTCNotify MakeNotify(int code, int item) const;
  void UserSelect(int index);
  void UserDelete(int index);
  void EndDrag();
  QColor RoleColor(int role, QColor fallback) const;

  IStyleManager* m_styleManager = nullptr;
  unsigned m_style = 0;
  int m_notifyId = 0;
  NotifyHandler m_handler;
  std::vector<Item> m_items;
  int m_cur = -1;
  int m_first = 0;  // first item shown when the strip scrolls
  std::wstring m_status;
  QCursor m_dragInside{Qt::DragMoveCursor};
  QCursor m_dragOutside{Qt::ClosedHandCursor};

  // Mouse drag state.
  int m_pressItem = -1;
  QPoint m_pressPos;
  bool m_dragging = false;
  bool m_draggedOut = false;
  int m_dropIndex = -1;

  // Rename state.
  QLineEdit* m_editor = nullptr;
  int m_editItem = -1;
};
