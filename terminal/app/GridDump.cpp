#include "terminal/app/GridDump.h"

#include <QAbstractItemModel>
#include <QHeaderView>
#include <QMetaMethod>
#include <QTableView>
#include <QWidget>

namespace term {

namespace {

QString Clean(QString text) {
  text.replace('\t', ' ').replace('\r', ' ').replace('\n', ' ');
  return text;
}

bool HasDumpMethod(const QObject* o) {
  return o->metaObject()->indexOfMethod("dumpTsv()") >= 0;
}

QString CallDump(QObject* o) {
  QString out;
  QMetaObject::invokeMethod(o, "dumpTsv", Qt::DirectConnection, Q_RETURN_ARG(QString, out));
  if (!out.isEmpty() && !out.endsWith('\n')) out += '\n';
  return out;
}

void Walk(QWidget* w, std::vector<std::pair<QWidget*, QString>>& found) {
  for (QObject* child : w->children()) {
    auto* cw = qobject_cast<QWidget*>(child);
    if (!cw || cw->isHidden()) continue;
    if (HasDumpMethod(cw)) {
      found.push_back({cw, CallDump(cw)});
      continue;
    }
    if (auto* table = qobject_cast<QTableView*>(cw); table && table->model()) {
      found.push_back({cw, TsvFromModel(table->model(), table)});
      continue;
    }
    Walk(cw, found);
  }
}

}  // namespace

QString TsvFromModel(const QAbstractItemModel* model, const QTableView* view) {
  QString out;
  std::vector<int> columns;
  for (int c = 0; c < model->columnCount(); ++c)
    if (!view || !view->isColumnHidden(c)) columns.push_back(c);
  QStringList line;
  for (int c : columns) line << Clean(model->headerData(c, Qt::Horizontal, Qt::DisplayRole).toString());
  out += line.join('\t') + '\n';
  for (int r = 0; r < model->rowCount(); ++r) {
    if (view && view->isRowHidden(r)) continue;
    line.clear();
    for (int c : columns) line << Clean(model->index(r, c).data(Qt::DisplayRole).toString());
    out += line.join('\t') + '\n';
  }
  return out;
}

std::vector<GridDump> DumpGrids(QWidget* view) {
  std::vector<GridDump> out;
  if (!view) return out;
  if (HasDumpMethod(view)) {
    out.push_back({QString(), CallDump(view)});
    return out;
  }
  std::vector<std::pair<QWidget*, QString>> found;
  Walk(view, found);
  for (std::size_t i = 0; i < found.size(); ++i) {
    QString suffix;
    if (i > 0) {
      const QString name = found[i].first->objectName();
      suffix = "-" + (name.isEmpty() ? QString::number(i + 1) : name);
    }
    out.push_back({suffix, found[i].second});
  }
  return out;
}

}  // namespace term
