#pragma once
// A bar chart over Qt Charts: several series (legend text and colour each),
// groups of one bar per series with a label and a tooltip, and a window of a
// fixed number of groups starting at a scroll position. A scroll bar under the
// chart (and the wheel) moves the window.
//
// Vertical (default): groups along the bottom, bars upwards. Horizontal: groups
// down the left side, the first shown group at the top, bars to the right (a
// volume profile).
#include <QColor>
#include <QFont>
#include <QString>
#include <QStringList>
#include <QWidget>
#include <string>
#include <vector>

#include "hostview/Types.h"

class QChart;
class QChartView;
class QAbstractBarSeries;
class QBarSet;
class QBarCategoryAxis;
class QValueAxis;
class QScrollBar;
class QGridLayout;

class CBarChart : public QWidget {
  Q_OBJECT
 public:
  struct Group {
    QString label;             // category text under the bars
    std::vector<double> values;  // one per series, in series order
    QString tooltip;           // shown while the pointer is over a bar of the group
  };

  explicit CBarChart(QWidget* parent = nullptr);
  ~CBarChart() override;

  // Series, in the order their values appear in every group. Colours are
  // COLORREF values (0x00BBGGRR).
  void AddSeries(const QString& legend, COLORREF color);
  void SetTitle(const QString& title);
  int SeriesCount() const { return int(m_series.size()); }
  QString SeriesLegend(int i) const;
  COLORREF SeriesColor(int i) const;

  void AddGroup(Group group);
  void SetGroups(std::vector<Group> groups);
  int GroupCount() const { return int(m_groups.size()); }
  const Group& GroupAt(int i) const { return m_groups.at(std::size_t(i)); }

  // Number of groups shown at once (ten by default).
  void SetWindowSize(int groups);
  int WindowSize() const { return m_window; }
  // First group shown; clamped to the groups there are.
  void SetScrollPos(int first);
  int ScrollPos() const { return m_first; }
  // The groups in the window (indices into the groups).
  std::vector<int> VisibleGroups() const;

  // The value axis: it starts at `minimum` and leaves `headroomPercent` of
  // the largest shown value free above the bars (0 and 20: from zero to 1.2
  // times the tallest bar). Empty windows show 0 to 1.
  void SetupRange(double minimum, double headroomPercent);
  double AxisMin() const;
  double AxisMax() const;

  // Where the groups run (see the file comment).
  void SetOrientation(Qt::Orientation orientation);
  Qt::Orientation Orientation() const { return m_orientation; }

  // Colours of everything but the bars (background, texts, grid lines).
  struct Palette {
    QColor back{255, 255, 255};
    QColor text{0, 0, 0};
    QColor gridLine{214, 219, 227};
  };
  void SetPalette(const Palette& palette);
  // Font of the legend and the axis labels.
  void SetLabelFont(const QFont& font);
  const Palette& GetPalette() const { return m_palette; }

  // Drops the groups (the series stay).
  void Clear();
  // Rebuilds the bars of the window and repaints now.
  void Redraw();
  // Tooltip of group `index` (what hovering one of its bars shows).
  QString TooltipOf(int index) const;

  QChart* Chart() const { return m_chart; }
  QChartView* View() const { return m_view; }
  QAbstractBarSeries* Bars() const { return m_bars; }
  // The scroll bar along the groups (shown while they do not all fit).
  QScrollBar* ScrollBar() const { return m_scroll; }
  // The category texts in axis order (bottom to top when horizontal).
  QStringList AxisLabels() const;
  // The shown window as the user reads it, tab-separated: a heading line (an
  // empty cell, then the series legends), then one line per shown group (its
  // label, then its values). The terminal's --dump finds it.
  Q_INVOKABLE QString dumpTsv() const;

 signals:
  // The user moved the window (scroll bar or wheel); not sent for SetScrollPos.
  void scrollPosChanged(int first);

 protected:
  void wheelEvent(QWheelEvent* e) override;
  void resizeEvent(QResizeEvent* e) override;

 private:
  struct Series {
    QString legend;
    COLORREF color = 0;
  };
  void Rebuild();
  void UpdateScrollBar();
  void MakeSeries();
  // The visible groups in the order of their categories on the axis.
  std::vector<int> DrawnGroups() const;
  void UserScroll(int first);
  // As many value ticks as the value axis has room for.
  void FitTicks();

  std::vector<Series> m_series;
  std::vector<Group> m_groups;
  int m_window = 10;
  int m_first = 0;
  double m_min = 0.0;
  double m_headroom = 20.0;
  Qt::Orientation m_orientation = Qt::Vertical;
  int m_ticks = 5;  // value-axis ticks wanted
  Palette m_palette;
  QChart* m_chart = nullptr;
  QChartView* m_view = nullptr;
  QAbstractBarSeries* m_bars = nullptr;
  QBarCategoryAxis* m_axisX = nullptr;
  QValueAxis* m_axisY = nullptr;
  QScrollBar* m_scroll = nullptr;
  QGridLayout* m_layout = nullptr;
  bool m_updatingScroll = false;
};
