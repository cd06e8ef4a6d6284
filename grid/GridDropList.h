#pragma once
// The list a drop-list cell opens: a child of the grid's viewport placed under
// the cell, so that clicks on the grid still reach the cell types while it is
// open. Items are 18 pixels high, drawn flat in the grid's colours.
#include <QListWidget>
#include <functional>

class CUGLstBoxEx : public QListWidget {
  Q_OBJECT
 public:
  explicit CUGLstBoxEx(QWidget* parent);
  // Shows `items` under (or, without room, above) `anchor`; the row
  // `current` is selected.
  void Open(const QRect& anchor, const QStringList& items, int current = -1);
  QString ItemText(int index) const;
  // Called with the chosen index (-1 when closed without a choice).
  std::function<void(int index)> onChosen;
  // Chooses item `index` as a click would.
  void Choose(int index);

 protected:
  void keyPressEvent(QKeyEvent* e) override;
  void mouseReleaseEvent(QMouseEvent* e) override;
};
