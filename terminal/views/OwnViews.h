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

// Trade ticket: shows what the link carries and records simulated orders in
// the blotter (Blotter.h). The price stays the one the user clicked; the live
// bid and ask beside it show how far the market has moved since.
class CTradeView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CTradeView"); }
  // Tests and scripts: the ticket's price and the live quote beside it.
  Q_INVOKABLE double price() const;
  Q_INVOKABLE QString side() const;
  Q_INVOKABLE QString liveQuote() const;
  Q_INVOKABLE void placeOrder() { PlaceOrder(); }

 protected:
  void Build() override;
  void Refresh() override;
  void TakeLink(const std::map<std::string, std::string>& link) override;
  void InstrumentChanged() override;
  UINT RefreshInterval() const override { return 250; }

 private:
  void PlaceOrder();
  void FillBlotter();
  QLabel* m_instrumentLabel = nullptr;
  QLabel* m_bidLabel = nullptr;
  QLabel* m_askLabel = nullptr;
  QLabel* m_lastLabel = nullptr;
  QComboBox* m_side = nullptr;
  QDoubleSpinBox* m_price = nullptr;
  double m_linkPrice = 0;  // the price the link carried, set once the instrument's decimals are known
  QSpinBox* m_quantity = nullptr;
  QComboBox* m_type = nullptr;
  QComboBox* m_validity = nullptr;
  QLabel* m_trigger = nullptr;
  QLabel* m_message = nullptr;
  QPushButton* m_place = nullptr;
  QTableWidget* m_blotter = nullptr;
  std::uint64_t m_shownVersion = 0;
};

// Price chart of the instrument's traded prices in the session.
class CChartView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CBranticChartView"); }
  // Number of points drawn (tests).
  Q_INVOKABLE int pointCount() const;
  void ChangeStyle(int styleId) override;

 protected:
  bool TakesInstrumentDrops() const override { return true; }
  void Build() override;
  void Refresh() override;
  void InstrumentChanged() override;

 private:
  QChartView* m_view = nullptr;
  QLineSeries* m_series = nullptr;
  QDateTimeAxis* m_axisX = nullptr;  // time of day
  QValueAxis* m_axisY = nullptr;     // price, in round steps
  QLabel* m_empty = nullptr;
  std::size_t m_tradesShown = 0;
};

// Instrument explorer: search by code, symbol or name; double-click shows an
// instrument in the linked views; rows drag onto a watchlist, a chart,
// analytics or news.
class CExplorerView : public CTerminalView {
  Q_OBJECT
 public:
  QString Caption() const override { return NameFor("CInsExpViewEx"); }
  // Searches as if typed (tests and scripts).
  Q_INVOKABLE void search(const QString& text);
  Q_INVOKABLE int resultCount() const;
  // What a double-click on result `row` does.
  Q_INVOKABLE void linkRow(int row);
  // What the Type column reads for a product type ("Index" for "IDX").
  static QString TypeName(const std::string& productType);

 protected:
  bool WatchesInstrument() const override { return false; }
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
  bool TakesInstrumentDrops() const override { return true; }
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
  bool TakesInstrumentDrops() const override { return true; }
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
