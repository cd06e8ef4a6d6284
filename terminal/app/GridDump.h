#pragma once
// Reads the tables a view shows, without knowing the view's classes: every
// widget that offers `Q_INVOKABLE QString dumpTsv() const` answers for itself,
// and a plain QTableView is read from its model (see the grid dump convention
// in the project notes).
#include <QString>
#include <vector>

class QAbstractItemModel;
class QTableView;
class QWidget;

namespace term {

struct GridDump {
  QString suffix;  // "" for the first table of the view, else "-<name or index>"
  QString tsv;
};

// The dumps of `view`'s visible tables, in child order.
std::vector<GridDump> DumpGrids(QWidget* view);

// TSV of a table model: headings, then rows. Cells keep what the user sees.
QString TsvFromModel(const QAbstractItemModel* model, const QTableView* view = nullptr);

}  // namespace term
