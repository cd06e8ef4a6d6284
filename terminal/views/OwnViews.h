#pragma once
// The five views of the terminal itself (see TerminalView.h).
#include <QString>
#include <vector>

#include "terminal/views/TerminalView.h"

class QComboBox;
class QDoubleSpinBox;
class QLabel;
class QLineEdit;
class QPushButton;
class QSpinBox;
class QStandardItemModel;
class QTableView;
class QTableWidget;
class QChart;
class QChartView;
class QLineSeries;
class QValueAxis;
class QDateTimeAxis;

namespace term::views {

// One simulated order of the blotter, shared by every trade ticket.
struct BlotterOrder {
  int number = 0;
  QString time, side, code, type, validity, trigger, status;
  double price = 0;
  qint64 quantity = 0;
};
std::vector<BlotterOrder>& Blotter();

// Trade ticket: shows what the link carries and records simulated orders.
class CTradeView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CTradeView"); }

 protected:
  void Build() override;
  void Refresh() override;
  void TakeLink(const std::map<std::string, std::string>& link) override;
  void InstrumentChanged() override;

 private:
  void PlaceOrder();
  void FillBlotter();
  QLabel* m_instrumentLabel = nullptr;
  QLabel* m_quoteLabel = nullptr;
  QComboBox* m_side = nullptr;
  QDoubleSpinBox* m_price = nullptr;
  QSpinBox* m_quantity = nullptr;
  QComboBox* m_type = nullptr;
  QComboBox* m_validity = nullptr;
  QLabel* m_trigger = nullptr;
  QLabel* m_message = nullptr;
  QPushButton* m_place = nullptr;
  QTableWidget* m_blotter = nullptr;
  std::size_t m_shownOrders = 0;
};

// Price chart of the instrument's traded prices in the session.
class CChartView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CBranticChartView"); }
  // Number of points drawn (tests).
  Q_INVOKABLE int pointCount() const;

 protected:
  void Build() override;
  void Refresh() override;
  void InstrumentChanged() override;

 private:
  QChartView* m_view = nullptr;
  QLineSeries* m_series = nullptr;
  QValueAxis* m_axisX = nullptr;
  QValueAxis* m_axisY = nullptr;
  QLabel* m_empty = nullptr;
  std::size_t m_tradesShown = 0;
};

// Instrument explorer: search by code or name, drag rows into a watchlist.
class CExplorerView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CInsExpViewEx"); }
  // Searches as if typed (tests and scripts).
  Q_INVOKABLE void search(const QString& text);
  Q_INVOKABLE int resultCount() const;

 protected:
  void Build() override;
  void Refresh() override {}
  UINT RefreshInterval() const override { return 0; }
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  void StartDrag();
  QLineEdit* m_search = nullptr;
  QTableView* m_table = nullptr;
  QStandardItemModel* m_model = nullptr;
  QLabel* m_count = nullptr;
  QPoint m_pressPos;
};

// Analytics of one instrument from the simulated session.
class CAnalyticsView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CStockAnalytics"); }

 protected:
  void Build() override;
  void Refresh() override;

 private:
  QTableWidget* m_table = nullptr;
  QLabel* m_empty = nullptr;
};

// News about one instrument, written from what happens in the simulated market.
class CNewsView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CFNews"); }

 protected:
  void Build() override;
  void Refresh() override;
  void InstrumentChanged() override;

 private:
  void Add(const QString& time, const QString& headline);
  QTableWidget* m_table = nullptr;
  double m_lastReportedChange = 0;
  std::int64_t m_lastReportedVolume = 0;
  std::size_t m_lastTrades = 0;
  double m_lastHigh = 0, m_lastLow = 0;
  std::string m_lastRemarks;
};

}  // namespace term::views
