#include "chart/BarChart.h"

#include <QBarCategoryAxis>
#include <QBarSeries>
#include <QBarSet>
#include <QChart>
#include <QChartView>
#include <QHorizontalBarSeries>
#include <QCursor>
#include <QFontMetrics>
#include <QResizeEvent>
#include <QScrollBar>
#include <QToolTip>
#include <QGraphicsLayout>
#include <QGridLayout>
#include <QLocale>
#include <QValueAxis>
#include <QWheelEvent>
#include <algorithm>
#include <cmath>

CBarChart::CBarChart(QWidget* parent) : QWidget(parent) {
  m_chart = new QChart();
  m_chart->setAnimationOptions(QChart::NoAnimation);
  m_chart->legend()->setVisible(true);
  m_chart->legend()->setAlignment(Qt::AlignTop);
  m_chart->setMargins(QMargins(4, 4, 4, 4));
  m_chart->setBackgroundRoundness(0);
  // Every pixel for the bars: small views show ten groups too.
  m_chart->layout()->setContentsMargins(0, 0, 0, 0);
  m_axisX = new QBarCategoryAxis();
  m_axisY = new QValueAxis();
  m_axisY->setLabelFormat(QStringLiteral("%.0f"));
  // A price is read whole or not at all.
  m_axisX->setTruncateLabels(false);
  // Thousands grouped as in the tables ("100,000").
  m_chart->setLocale(QLocale(QLocale::English, QLocale::UnitedStates));
  m_chart->setLocalizeNumbers(true);
  m_axisY->setRange(0, 1);
  MakeSeries();

  m_view = new QChartView(m_chart, this);
  m_view->setRenderHint(QPainter::Antialiasing, true);
  m_view->setFrameShape(QFrame::NoFrame);
  m_scroll = new QScrollBar(Qt::Horizontal, this);
  m_scroll->setRange(0, 0);
  connect(m_scroll, &QScrollBar::valueChanged, this, [this](int v) {
    if (!m_updatingScroll) UserScroll(v);
  });
  m_layout = new QGridLayout(this);
  m_layout->setContentsMargins(0, 0, 0, 0);
  m_layout->setSpacing(0);
  m_layout->addWidget(m_view, 0, 0);
  m_layout->addWidget(m_scroll, 1, 0);
  SetPalette(m_palette);
  UpdateScrollBar();
}

// The bar series of the orientation, with the category axis along the groups
// and the value axis along the bars.
void CBarChart::MakeSeries() {
  if (m_bars) {
    m_chart->removeSeries(m_bars);
    delete m_bars;
    m_bars = nullptr;
  }
  for (QAbstractAxis* axis : m_chart->axes()) m_chart->removeAxis(axis);
  const bool horizontal = m_orientation == Qt::Horizontal;
  if (horizontal) m_bars = new QHorizontalBarSeries();
  else m_bars = new QBarSeries();
  m_bars->setBarWidth(0.8);
  m_chart->addSeries(m_bars);
  m_chart->addAxis(m_axisX, horizontal ? Qt::AlignLeft : Qt::AlignBottom);
  m_chart->addAxis(m_axisY, horizontal ? Qt::AlignBottom : Qt::AlignLeft);
  m_bars->attachAxis(m_axisX);
  m_bars->attachAxis(m_axisY);
  // One tooltip per bar group, whichever series' bar the pointer is on.
  connect(m_bars, &QAbstractBarSeries::hovered, this, [this](bool status, int index, QBarSet*) {
    const auto visible = DrawnGroups();
    if (status && index >= 0 && index < int(visible.size()))
      QToolTip::showText(QCursor::pos(), TooltipOf(visible[std::size_t(index)]), m_view);
    else
      QToolTip::hideText();
  });
}

void CBarChart::SetOrientation(Qt::Orientation orientation) {
  if (orientation == m_orientation) return;
  m_orientation = orientation;
  // The scroll bar runs along the groups: under them or beside them.
  m_layout->removeWidget(m_scroll);
  if (orientation == Qt::Horizontal) {
    m_scroll->setOrientation(Qt::Vertical);
    m_layout->addWidget(m_scroll, 0, 1);
  } else {
    m_scroll->setOrientation(Qt::Horizontal);
    m_layout->addWidget(m_scroll, 1, 0);
  }
  MakeSeries();
  Rebuild();
}

void CBarChart::SetPalette(const Palette& palette) {
  m_palette = palette;
  m_chart->setBackgroundBrush(palette.back);
  m_chart->setBackgroundPen(Qt::NoPen);
  m_chart->setPlotAreaBackgroundVisible(false);
  m_chart->setTitleBrush(palette.text);
  m_chart->legend()->setLabelColor(palette.text);
  for (QAbstractAxis* axis : {static_cast<QAbstractAxis*>(m_axisX), static_cast<QAbstractAxis*>(m_axisY)}) {
    axis->setLabelsColor(palette.text);
    axis->setLinePenColor(palette.gridLine);
    axis->setGridLineColor(palette.gridLine);
  }
  if (m_view) {
    m_view->setBackgroundBrush(palette.back);
    QPalette p = m_view->palette();
    p.setColor(QPalette::Window, palette.back);
    p.setColor(QPalette::Base, palette.back);
    m_view->setPalette(p);
  }
  QPalette own = this->palette();
  own.setColor(QPalette::Window, palette.back);
  setPalette(own);
  setAutoFillBackground(true);
  update();
}

void CBarChart::SetLabelFont(const QFont& font) {
  m_chart->legend()->setFont(font);
  m_axisX->setLabelsFont(font);
  m_axisY->setLabelsFont(font);
  FitTicks();
}

void CBarChart::FitTicks() {
  // Value labels such as "100,000" need about this much room each.
  const QFontMetrics metrics(m_axisY->labelsFont());
  const int room = m_orientation == Qt::Horizontal ? m_view->width() - 80 : m_view->height() - 60;
  const int each = m_orientation == Qt::Horizontal ? metrics.horizontalAdvance(QStringLiteral("000,000")) + 16
                                                   : metrics.height() * 2;
  const int ticks = std::clamp(room / std::max(1, each), 2, 6);
  if (ticks != m_ticks) {
    m_ticks = ticks;
    Rebuild();
  }
}

void CBarChart::resizeEvent(QResizeEvent* e) {
  QWidget::resizeEvent(e);
  FitTicks();
}

QStringList CBarChart::AxisLabels() const { return m_axisX->categories(); }

QString CBarChart::dumpTsv() const {
  auto clean = [](QString text) { return text.replace('\t', ' ').replace('\r', ' ').replace('\n', ' '); };
  QStringList head{QString()};
  for (const Series& s : m_series) head << clean(s.legend);
  QString out = head.join('\t') + '\n';
  for (int g : VisibleGroups()) {
    const Group& group = m_groups[std::size_t(g)];
    QStringList line{clean(group.label)};
    for (int s = 0; s < SeriesCount(); ++s) {
      const double v = std::size_t(s) < group.values.size() ? group.values[std::size_t(s)] : 0.0;
      line << (std::isfinite(v) ? QString::number(v, 'f', v == std::trunc(v) ? 0 : 6) : QStringLiteral("0"));
    }
    out += line.join('\t') + '\n';
  }
  return out;
}

void CBarChart::UserScroll(int first) {
  const int before = m_first;
  SetScrollPos(first);
  if (m_first != before) emit scrollPosChanged(m_first);
}

CBarChart::~CBarChart() = default;

void CBarChart::AddSeries(const QString& legend, COLORREF color) {
  m_series.push_back({legend, color});
  Rebuild();
}

void CBarChart::SetTitle(const QString& title) { m_chart->setTitle(title); }

QString CBarChart::SeriesLegend(int i) const {
  return i >= 0 && i < SeriesCount() ? m_series[std::size_t(i)].legend : QString();
}

COLORREF CBarChart::SeriesColor(int i) const {
  return i >= 0 && i < SeriesCount() ? m_series[std::size_t(i)].color : 0;
}

void CBarChart::AddGroup(Group group) {
  m_groups.push_back(std::move(group));
  UpdateScrollBar();
}

void CBarChart::SetGroups(std::vector<Group> groups) {
  m_groups = std::move(groups);
  m_first = std::clamp(m_first, 0, std::max(0, GroupCount() - m_window));
  UpdateScrollBar();
}

void CBarChart::SetWindowSize(int groups) {
  m_window = std::max(1, groups);
  SetScrollPos(m_first);
}

void CBarChart::SetScrollPos(int first) {
  const int clamped = std::clamp(first, 0, std::max(0, GroupCount() - m_window));
  if (clamped == m_first && m_scroll->value() == clamped) return;
  m_first = clamped;
  UpdateScrollBar();
  Rebuild();
}

std::vector<int> CBarChart::VisibleGroups() const {
  std::vector<int> out;
  for (int i = m_first; i < GroupCount() && i < m_first + m_window; ++i) out.push_back(i);
  return out;
}

void CBarChart::SetupRange(double minimum, double headroomPercent) {
  m_min = minimum;
  m_headroom = std::max(0.0, headroomPercent);
  Rebuild();
}

double CBarChart::AxisMin() const { return m_axisY->min(); }
double CBarChart::AxisMax() const { return m_axisY->max(); }

void CBarChart::Clear() {
  m_groups.clear();
  m_first = 0;
  UpdateScrollBar();
  Rebuild();
}

void CBarChart::Redraw() {
  Rebuild();
  m_view->viewport()->repaint();
}

QString CBarChart::TooltipOf(int index) const {
  return index >= 0 && index < GroupCount() ? m_groups[std::size_t(index)].tooltip : QString();
}

void CBarChart::UpdateScrollBar() {
  m_updatingScroll = true;
  m_scroll->setRange(0, std::max(0, GroupCount() - m_window));
  m_scroll->setPageStep(m_window);
  m_scroll->setValue(m_first);
  m_scroll->setVisible(GroupCount() > m_window);
  m_updatingScroll = false;
}

std::vector<int> CBarChart::DrawnGroups() const {
  auto groups = VisibleGroups();
  // Categories run upwards along a vertical axis: the first group belongs at the top.
  if (m_orientation == Qt::Horizontal) std::reverse(groups.begin(), groups.end());
  return groups;
}

void CBarChart::Rebuild() {
  const auto visible = DrawnGroups();
  // The sets are kept and their values changed in place: replacing the sets
  // on every redraw leaves bar items behind in the chart (memory grows with
  // every update of a chart that is shown all day) and costs a relayout.
  QList<QBarSet*> sets = m_bars->barSets();
  bool sameSets = sets.size() == SeriesCount();
  for (int s = 0; sameSets && s < SeriesCount(); ++s) sameSets = sets[s]->label() == m_series[std::size_t(s)].legend;
  if (!sameSets) {
    m_bars->clear();  // deletes the old sets
    sets.clear();
    for (int s = 0; s < SeriesCount(); ++s) {
      auto* set = new QBarSet(m_series[std::size_t(s)].legend);
      m_bars->append(set);
      sets << set;
    }
  }
  double top = 0.0;
  const int count = int(visible.size());
  for (int s = 0; s < SeriesCount(); ++s) {
    QBarSet* set = sets[s];
    const COLORREF c = m_series[std::size_t(s)].color;
    const QColor color(int(ColorRefRed(c)), int(ColorRefGreen(c)), int(ColorRefBlue(c)));
    if (set->color() != color) set->setColor(color);
    if (set->borderColor() != color.darker(115)) set->setBorderColor(color.darker(115));
    if (set->count() > count) set->remove(count, set->count() - count);
    for (int i = 0; i < count; ++i) {
      const auto& values = m_groups[std::size_t(visible[std::size_t(i)])].values;
      const double v = std::size_t(s) < values.size() && std::isfinite(values[std::size_t(s)]) ? values[std::size_t(s)] : 0.0;
      if (i >= set->count()) set->append(v);
      else if (set->at(i) != v) set->replace(i, v);
      top = std::max(top, v);
    }
  }
  // Category texts must be unique: repeated labels get invisible padding.
  QStringList unique;
  for (int g : visible) {
    QString l = m_groups[std::size_t(g)].label;
    while (unique.contains(l)) l += QChar(0x200B);
    unique << l;
  }
  if (unique.isEmpty()) unique << QString();
  if (m_axisX->categories() != unique) {
    m_axisX->clear();
    m_axisX->append(unique);
  }
  double max = top > m_min ? m_min + (top - m_min) * (1.0 + m_headroom / 100.0) : m_min + 1.0;
  m_axisY->setRange(m_min, max);
  m_axisY->setTickCount(m_ticks);
  m_axisY->applyNiceNumbers();
  if (m_axisY->min() < m_min) m_axisY->setMin(m_min);
}

void CBarChart::wheelEvent(QWheelEvent* e) {
  const int steps = e->angleDelta().y() / 120;
  if (steps) UserScroll(m_first - steps);
  e->accept();
}
