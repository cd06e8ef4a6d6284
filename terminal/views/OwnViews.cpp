#include "terminal/views/OwnViews.h"

#include <QApplication>
#include <QChart>
#include <QChartView>
#include <QComboBox>
#include <QDateTime>
#include <QDateTimeAxis>
#include <QDoubleSpinBox>
#include <QDrag>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QLabel>
#include <QLineEdit>
#include <QLineSeries>
#include <QMimeData>
#include <QMouseEvent>
#include <QPushButton>
#include <QSpinBox>
#include <QStandardItemModel>
#include <QTableView>
#include <QTableWidget>
#include <QValueAxis>
#include <QVBoxLayout>
#include <cmath>
#include <map>

#include "hostview/DragData.h"
#include "hostview/StyleRoles.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"
#include "terminal/views/Blotter.h"

namespace term::views {

namespace {

sim::Market* MarketOrNull() { return Runtime() ? &Runtime()->Market() : nullptr; }

const JInstrumentUnderlying* InstrumentAt(int index) {
  sim::Market* m = MarketOrNull();
  if (!m || index < 0 || static_cast<std::size_t>(index) >= m->Instruments().size()) return nullptr;
  return &m->Instruments()[static_cast<std::size_t>(index)];
}

QString Price(int index, double value) {
  if (value == 0) return QStringLiteral("-");
  return QString::fromStdString(MarketOrNull()->FormatPrice(index, value));
}

QString Grouped(std::int64_t n) { return QLocale(QLocale::English).toString(static_cast<qlonglong>(n)); }

QString JsonEscape(const std::string& s) {
  QString out;
  for (QChar c : QString::fromStdString(s)) {
    if (c == '"' || c == '\\') out += '\\', out += c;
    else if (c.unicode() < 0x20) out += QString("\\u%1").arg(c.unicode(), 4, 16, QChar('0'));
    else out += c;
  }
  return out;
}

QString SectorName(const sim::Market& m, const std::string& code) {
  for (const auto& s : m.Sectors())
    if (s.sectorCode == code) return QString::fromStdString(s.sectorName);
  return code.empty() ? QStringLiteral("-") : QString::fromStdString(code);
}

QTableWidget* MakeTable(const QStringList& headings, QWidget* parent) {
  auto* t = new QTableWidget(0, static_cast<int>(headings.size()), parent);
  t->setHorizontalHeaderLabels(headings);
  t->verticalHeader()->hide();
  t->setEditTriggers(QAbstractItemView::NoEditTriggers);
  t->setSelectionBehavior(QAbstractItemView::SelectRows);
  t->horizontalHeader()->setStretchLastSection(true);
  return t;
}

void SetRow(QTableWidget* t, int row, const QStringList& cells) {
  for (int c = 0; c < cells.size(); ++c) {
    auto* item = t->item(row, c);
    if (!item) t->setItem(row, c, item = new QTableWidgetItem);
    if (item->text() != cells[c]) item->setText(cells[c]);
  }
}

}  // namespace

// ---- Trade ticket -----------------------------------------------------------

void CTradeView::Build() {
  auto* layout = new QVBoxLayout(this);
  auto* form = new QFormLayout;
  m_instrumentLabel = new QLabel(this);
  m_side = new QComboBox(this);
  m_side->addItems({"Buy", "Sell"});
  if (Blotter* b = CurrentBlotter()) m_side->setCurrentText(b->LastSide());
  m_price = new QDoubleSpinBox(this);
  m_price->setObjectName("price");
  m_price->setRange(0, 1e9);
  // The live quote beside the price: a ticket left open shows how far the market went.
  m_bidLabel = new QLabel(this);
  m_bidLabel->setObjectName("live-bid");
  m_askLabel = new QLabel(this);
  m_askLabel->setObjectName("live-ask");
  m_lastLabel = new QLabel(this);
  auto* priceRow = new QHBoxLayout;
  priceRow->addWidget(m_price, 1);
  priceRow->addWidget(m_bidLabel);
  priceRow->addWidget(m_askLabel);
  priceRow->addWidget(m_lastLabel);
  m_quantity = new QSpinBox(this);
  m_quantity->setRange(0, 1000000000);
  m_type = new QComboBox(this);
  m_type->addItems({"Limit", "Market"});
  m_validity = new QComboBox(this);
  m_validity->addItems({"Day", "Good till cancelled", "Fill and kill"});
  m_trigger = new QLabel("-", this);
  form->addRow("Instrument", m_instrumentLabel);
  form->addRow("Side", m_side);
  form->addRow("Price", priceRow);
  form->addRow("Quantity", m_quantity);
  form->addRow("Order type", m_type);
  form->addRow("Validity", m_validity);
  form->addRow("Trigger", m_trigger);
  layout->addLayout(form);
  auto* row = new QHBoxLayout;
  m_place = new QPushButton("Place order", this);
  m_message = new QLabel(this);
  row->addWidget(m_place);
  row->addWidget(m_message, 1);
  layout->addLayout(row);
  m_blotter = MakeTable({"No.", "Time", "Side", "Instrument", "Quantity", "Price", "Type", "Validity", "Status"}, this);
  m_blotter->setObjectName("blotter");
  layout->addWidget(m_blotter, 1);
  connect(m_place, &QPushButton::clicked, this, [this] { PlaceOrder(); });
  connect(m_type, &QComboBox::currentTextChanged, this, [this](const QString& t) { m_price->setEnabled(t != "Market"); });
  // The user's choice of side is the next ticket's side too.
  connect(m_side, &QComboBox::activated, this, [this] {
    if (Blotter* b = CurrentBlotter()) b->SetLastSide(m_side->currentText());
  });
}

double CTradeView::price() const { return m_price ? m_price->value() : 0; }
QString CTradeView::side() const { return m_side ? m_side->currentText() : QString(); }
QString CTradeView::liveQuote() const {
  return m_bidLabel ? m_bidLabel->text() + "  " + m_askLabel->text() : QString();
}

void CTradeView::InstrumentChanged() {
  const auto* ins = InstrumentAt(m_instrument);
  m_instrumentLabel->setText(ins ? InstrumentLabel() + " (" + QString::fromStdString(ins->exchangeCode) + ")"
                                 : QStringLiteral("(none)"));
  if (!ins) return;
  // Decimals first: a price set before would be rounded to the old ones.
  m_price->setDecimals(std::clamp(ins->decimals, 0, 8));
  m_quantity->setSingleStep(static_cast<int>(std::max<std::int64_t>(1, ins->lotSize)));
  if (m_quantity->value() == 0) m_quantity->setValue(static_cast<int>(std::max<std::int64_t>(1, ins->lotSize)));
  const auto& q = MarketOrNull()->QuoteOf(m_instrument);
  if (m_linkPrice > 0) {
    m_price->setValue(m_linkPrice);
    m_linkPrice = 0;
  } else if (m_price->value() == 0) {
    m_price->setValue(m_side->currentText() == "Buy" ? q.ask : q.bid);
  }
  const double at = m_price->value() > 0 ? m_price->value() : std::max(q.last, q.close);
  m_price->setSingleStep(MarketOrNull()->StepAt(ins->priceStepTableId, at > 0 ? at : 1.0));
}

void CTradeView::TakeLink(const std::map<std::string, std::string>& link) {
  auto get = [&](const char* key) -> QString {
    const auto it = link.find(key);
    return it == link.end() ? QString() : QString::fromStdString(it->second);
  };
  if (const QString side = get("Field_side"); side.compare("Sell", Qt::CaseInsensitive) == 0) m_side->setCurrentIndex(1);
  else if (side.compare("Buy", Qt::CaseInsensitive) == 0) m_side->setCurrentIndex(0);
  bool ok = false;
  // The clicked price is kept as it was; without one the ticket starts at the touch.
  const double p = get("Field_Trade_price").toDouble(&ok);
  m_linkPrice = ok && p > 0 ? p : 0;
  m_price->setValue(0);
  if (const qlonglong q = get("Field_qty").toLongLong(&ok); ok && q > 0) m_quantity->setValue(static_cast<int>(q));
  if (const QString type = get("Field_Order_type"); !type.isEmpty()) {
    if (m_type->findText(type) < 0) m_type->addItem(type);
    m_type->setCurrentText(type);
  }
  if (const QString validity = get("Field_Order_validity"); !validity.isEmpty()) {
    if (m_validity->findText(validity) < 0) m_validity->addItem(validity);
    m_validity->setCurrentText(validity);
  }
  const QString trigger = get("Field_Trigger_type");
  m_trigger->setText(trigger.isEmpty() ? QStringLiteral("-") : trigger);
}

void CTradeView::Refresh() {
  if (InstrumentAt(m_instrument)) {
    const auto& q = MarketOrNull()->QuoteOf(m_instrument);
    m_bidLabel->setText("Bid " + Price(m_instrument, q.bid));
    m_askLabel->setText("Ask " + Price(m_instrument, q.ask));
    m_lastLabel->setText("Last " + Price(m_instrument, q.last));
  } else {
    m_bidLabel->setText({});
    m_askLabel->setText({});
    m_lastLabel->setText({});
  }
  FillBlotter();
}

void CTradeView::PlaceOrder() {
  Blotter* blotter = CurrentBlotter();
  const auto* ins = InstrumentAt(m_instrument);
  if (!ins) { m_message->setText("Choose an instrument first."); return; }
  if (!blotter) { m_message->setText("Orders cannot be placed in this terminal."); return; }
  if (ins->accessStatus != 3) { m_message->setText("This instrument cannot be traded."); return; }
  const qint64 qty = m_quantity->value();
  const qint64 lot = std::max<std::int64_t>(1, ins->lotSize);
  if (qty <= 0 || qty % lot != 0) {
    m_message->setText(QString("The quantity must be a multiple of the lot size %1.").arg(Grouped(lot)));
    return;
  }
  if (ins->maxQty1 > 0 && qty > ins->maxQty1) {
    m_message->setText(QString("The quantity exceeds the maximum of %1.").arg(Grouped(ins->maxQty1)));
    return;
  }
  const auto& q = MarketOrNull()->QuoteOf(m_instrument);
  const bool buy = m_side->currentIndex() == 0;
  const bool market = m_type->currentText() == "Market";
  const double touch = buy ? q.ask : q.bid;
  if (!market && m_price->value() <= 0) { m_message->setText("Enter a price."); return; }
  BlotterOrder o;
  o.time = QString::fromStdString(MarketOrNull()->TimeText());
  o.side = buy ? "Buy" : "Sell";
  o.productId = ins->productId;
  o.code = QString::fromStdString(ins->instrumentCode);
  o.quantity = qty;
  o.type = m_type->currentText();
  o.validity = m_validity->currentText();
  o.trigger = m_trigger->text();
  const bool marketable = touch > 0 && (market || (buy ? m_price->value() >= touch : m_price->value() <= touch));
  o.price = marketable ? touch : m_price->value();
  o.status = marketable ? "Filled" : (m_validity->currentText() == "Fill and kill" ? "Cancelled" : "Working");
  const BlotterOrder& kept = blotter->Add(std::move(o));
  QString text = QString("Order %1 %2.").arg(kept.number).arg(kept.status.toLower());
  if (!blotter->LastError().empty())
    text += QString(" It could not be saved: %1").arg(QString::fromStdString(blotter->LastError()));
  m_message->setText(text);
  FillBlotter();
}

void CTradeView::FillBlotter() {
  const Blotter* blotter = CurrentBlotter();
  if (!blotter || blotter->Version() == m_shownVersion) return;
  m_shownVersion = blotter->Version();
  const auto& orders = blotter->Orders();
  m_blotter->setRowCount(static_cast<int>(orders.size()));
  for (std::size_t i = 0; i < orders.size(); ++i) {
    const auto& o = orders[orders.size() - 1 - i];  // newest first
    const int index = MarketOrNull() ? MarketOrNull()->Find(o.productId, o.code.toStdString()) : -1;
    SetRow(m_blotter, static_cast<int>(i),
           {QString::number(o.number), o.time, o.side, o.code, Grouped(o.quantity),
            index >= 0 ? Price(index, o.price) : QString::number(o.price), o.type, o.validity, o.status});
  }
}

// ---- Chart ------------------------------------------------------------------

void CChartView::Build() {
  auto* layout = new QVBoxLayout(this);
  layout->setContentsMargins(0, 0, 0, 0);
  auto* chart = new QChart;
  chart->legend()->hide();
  m_series = new QLineSeries;
  chart->addSeries(m_series);
  m_axisX = new QDateTimeAxis;
  m_axisX->setFormat("HH:mm");
  m_axisX->setTickCount(7);
  m_axisY = new QValueAxis;
  m_axisY->setTickType(QValueAxis::TicksDynamic);
  chart->addAxis(m_axisX, Qt::AlignBottom);
  chart->addAxis(m_axisY, Qt::AlignRight);
  m_series->attachAxis(m_axisX);
  m_series->attachAxis(m_axisY);
  m_view = new QChartView(chart, this);
  m_view->setRenderHint(QPainter::Antialiasing);
  m_empty = new QLabel("No instrument. Drop one here from the explorer or a price view, or open the chart from a "
                       "price view row.",
                       this);
  m_empty->setAlignment(Qt::AlignCenter);
  m_empty->setWordWrap(true);
  layout->addWidget(m_empty);
  layout->addWidget(m_view, 1);
}

int CChartView::pointCount() const { return m_series ? static_cast<int>(m_series->count()) : 0; }

void CChartView::ChangeStyle(int styleId) {
  CTerminalView::ChangeStyle(styleId);
  if (!m_view || !m_pStyleManager) return;
  const bool dark = styleId == 2;
  QChart* chart = m_view->chart();
  chart->setTheme(dark ? QChart::ChartThemeDark : QChart::ChartThemeLight);
  chart->legend()->hide();
  chart->setBackgroundBrush(m_pStyleManager->Color(hv::style::kWindowBackground));
  chart->setTitleBrush(m_pStyleManager->Color(hv::style::kWindowText));
  for (QAbstractAxis* axis : {static_cast<QAbstractAxis*>(m_axisX), static_cast<QAbstractAxis*>(m_axisY)}) {
    axis->setLabelsColor(m_pStyleManager->Color(hv::style::kWindowText));
    axis->setGridLineColor(m_pStyleManager->Color(104));
  }
  m_series->setColor(m_pStyleManager->Color(hv::style::kLinkText));
  m_view->setBackgroundBrush(m_pStyleManager->Color(hv::style::kWindowBackground));
}

void CChartView::InstrumentChanged() {
  m_tradesShown = static_cast<std::size_t>(-1);
  m_empty->setVisible(m_instrument < 0);
  m_view->setVisible(m_instrument >= 0);
  m_view->chart()->setTitle(InstrumentLabel());
}

// A round step for about `ticks` price labels: 1, 2, 2.5 or 5 times a power of
// ten, never finer than the instrument's own price step.
static double NicePriceStep(double range, int ticks, double minStep) {
  const double rough = std::max(range / std::max(1, ticks), 1e-9);
  const double power = std::pow(10.0, std::floor(std::log10(rough)));
  double step = power * 10;
  for (double m : {1.0, 2.0, 2.5, 5.0})
    if (power * m >= rough) { step = power * m; break; }
  return std::max(step, minStep);
}

void CChartView::Refresh() {
  sim::Market* m = MarketOrNull();
  if (!m || m_instrument < 0) {
    m_series->clear();
    return;
  }
  const auto& trades = m->Trades(m_instrument);
  // Times of day on the session's date, as the axis shows them.
  const QDate day = QDate::fromString(QString::fromStdString(m->DateText()), Qt::ISODate);
  const qint64 midnight = QDateTime(day, QTime(0, 0)).toMSecsSinceEpoch();
  auto x = [&](std::uint32_t timeMs) { return static_cast<double>(midnight + timeMs); };
  const double now = x(m->TimeOfDayMs());
  if (trades.size() == m_tradesShown) {
    // No trade since: the time axis still runs on to now.
    if (m_series->count() > 0)
      m_axisX->setMax(QDateTime::fromMSecsSinceEpoch(static_cast<qint64>(std::max(now, m_series->at(0).x() + 60000))));
    return;
  }
  m_tradesShown = trades.size();
  QList<QPointF> points;
  // At most ~800 points: every k-th trade, always the newest.
  const std::size_t step = std::max<std::size_t>(1, trades.size() / 800);
  for (std::size_t i = 0; i < trades.size(); i += step) points.append(QPointF(x(trades[i].timeMs), trades[i].price));
  if (!trades.empty() && (trades.size() - 1) % step != 0)
    points.append(QPointF(x(trades.back().timeMs), trades.back().price));
  if (points.isEmpty()) {
    const auto& q = m->QuoteOf(m_instrument);
    if (q.close > 0) points.append(QPointF(now, q.close));
  }
  double lo = 0, hi = 0;
  for (const auto& p : points) {
    lo = lo == 0 ? p.y() : std::min(lo, p.y());
    hi = std::max(hi, p.y());
  }
  m_series->replace(points);
  const auto* ins = InstrumentAt(m_instrument);
  const double tick = ins ? m->StepAt(ins->priceStepTableId, hi > 0 ? hi : 1.0) : 0.01;
  const double priceStep = NicePriceStep(std::max(hi - lo, tick), 5, tick);
  const double bottom = std::floor(lo / priceStep) * priceStep, top = std::ceil(hi / priceStep) * priceStep;
  m_axisY->setRange(bottom, top > bottom ? top : bottom + priceStep);
  m_axisY->setTickAnchor(bottom);
  m_axisY->setTickInterval(priceStep);
  const int decimals = std::clamp(static_cast<int>(std::ceil(-std::log10(priceStep) - 1e-9)), 0, 6);
  m_axisY->setLabelFormat(QString("%.%1f").arg(decimals));
  const double first = points.isEmpty() ? now - 60000 : points.front().x();
  m_axisX->setRange(QDateTime::fromMSecsSinceEpoch(static_cast<qint64>(first)),
                    QDateTime::fromMSecsSinceEpoch(static_cast<qint64>(std::max(now, first + 60000))));
}

// ---- Instrument explorer ----------------------------------------------------

void CExplorerView::Build() {
  auto* layout = new QVBoxLayout(this);
  m_search = new QLineEdit(this);
  m_search->setObjectName("search");
  m_search->setPlaceholderText("Search by code, symbol or name");
  m_search->setClearButtonEnabled(true);
  m_count = new QLabel(this);
  auto* top = new QHBoxLayout;
  top->addWidget(m_search, 1);
  top->addWidget(m_count);
  layout->addLayout(top);
  m_model = new QStandardItemModel(0, 5, this);
  m_model->setHorizontalHeaderLabels({"Product", "Code", "Exchange", "Name", "Type"});
  m_table = new QTableView(this);
  m_table->setModel(m_model);
  m_table->verticalHeader()->hide();
  m_table->setEditTriggers(QAbstractItemView::NoEditTriggers);
  m_table->setSelectionBehavior(QAbstractItemView::SelectRows);
  m_table->setWordWrap(false);
  m_table->horizontalHeader()->setSectionResizeMode(QHeaderView::ResizeToContents);
  m_table->horizontalHeader()->setSectionResizeMode(3, QHeaderView::Stretch);
  m_table->viewport()->installEventFilter(this);
  layout->addWidget(m_table, 1);
  auto* hint = new QLabel("Double-click an instrument to show it in the linked views. Drag instruments onto a "
                          "watchlist of the price view, or one onto a chart, analytics or news.",
                          this);
  hint->setWordWrap(true);
  layout->addWidget(hint);
  connect(m_search, &QLineEdit::textChanged, this, [this](const QString& t) { search(t); });
  connect(m_table, &QTableView::doubleClicked, this, [this](const QModelIndex& index) { linkRow(index.row()); });
  search({});
}

void CExplorerView::search(const QString& text) {
  if (m_search->text() != text) {
    m_search->setText(text);  // comes back here through textChanged
    return;
  }
  m_model->removeRows(0, m_model->rowCount());
  sim::Market* m = MarketOrNull();
  if (!m) return;
  constexpr int kLimit = 500;
  const QString needle = text.trimmed();
  int matches = 0;
  for (int index = 0; index < int(m->Instruments().size()); ++index) {
    const auto& ins = m->Instruments()[std::size_t(index)];
    const QString code = QString::fromStdString(ins.instrumentCode);
    const QString display = QString::fromStdString(ins.displayCode);
    const QString name = QString::fromStdString(m->NameOf(index));  // the current name, renames included
    const QString symbol = QString::fromStdString(ins.symbol);
    if (!needle.isEmpty() && !code.contains(needle, Qt::CaseInsensitive) &&
        !display.contains(needle, Qt::CaseInsensitive) && !symbol.contains(needle, Qt::CaseInsensitive) &&
        !name.contains(needle, Qt::CaseInsensitive))
      continue;
    if (++matches > kLimit) continue;
    QList<QStandardItem*> row;
    row << new QStandardItem(QString::number(ins.productId)) << new QStandardItem(code)
        << new QStandardItem(QString::fromStdString(ins.exchangeCode)) << new QStandardItem(name)
        << new QStandardItem(TypeName(ins.productType));
    m_model->appendRow(row);
  }
  m_count->setText(matches > kLimit ? QString("%1 of %2").arg(kLimit).arg(matches) : QString::number(matches));
}

int CExplorerView::resultCount() const { return m_model ? m_model->rowCount() : 0; }

void CExplorerView::linkRow(int row) {
  if (row < 0 || row >= m_model->rowCount()) return;
  bool ok = false;
  const qint64 pid = m_model->item(row, 0)->text().toLongLong(&ok);
  if (ok) LinkInstrument(pid, m_model->item(row, 1)->text().toStdString(), this);
}

QString CExplorerView::TypeName(const std::string& productType) {
  static const std::map<std::string, QString> names = {
      {"ES", "Stock"}, {"IDX", "Index"}, {"FUT", "Future"}, {"FX", "Currency"},
      {"CFD", "CFD"},  {"DMA", "DMA"},   {"CS", "Cash"},
  };
  const auto it = names.find(productType);
  return it == names.end() ? QString::fromStdString(productType) : it->second;
}

bool CExplorerView::eventFilter(QObject* watched, QEvent* event) {
  if (watched == m_table->viewport()) {
    if (event->type() == QEvent::MouseButtonPress) {
      m_pressPos = static_cast<QMouseEvent*>(event)->position().toPoint();
    } else if (event->type() == QEvent::MouseMove) {
      auto* me = static_cast<QMouseEvent*>(event);
      if ((me->buttons() & Qt::LeftButton) &&
          (me->position().toPoint() - m_pressPos).manhattanLength() >= QApplication::startDragDistance()) {
        StartDrag();
        return true;
      }
    }
  }
  return CTerminalView::eventFilter(watched, event);
}

void CExplorerView::StartDrag() {
  const auto rows = m_table->selectionModel()->selectedRows();
  if (rows.isEmpty()) return;
  // A link text with one object per instrument.
  QStringList objects;
  for (const auto& r : rows) {
    objects << QString("{\"Field_product_id\":\"%1\",\"Field_instrument_code\":\"%2\",\"Field_exchange_code\":\"%3\"}")
                   .arg(JsonEscape(m_model->item(r.row(), 0)->text().toStdString()),
                        JsonEscape(m_model->item(r.row(), 1)->text().toStdString()),
                        JsonEscape(m_model->item(r.row(), 2)->text().toStdString()));
  }
  const QString link = QString("{\"type\":\"%1\",\"data\":[%2]}")
                           .arg(rows.size() > 1 ? "instrument view multiple" : "instrument view", objects.join(','));
  auto* mime = new QMimeData;
  mime->setData(hv::drag::kLinkMimeType, link.toUtf8());
  mime->setData(hv::drag::kSourceMimeType, QByteArray("CInsExpViewEx"));
  mime->setText(link);
  auto* drag = new QDrag(this);
  drag->setMimeData(mime);
  drag->exec(Qt::CopyAction);
}

// ---- Analytics --------------------------------------------------------------

void CAnalyticsView::Build() {
  auto* layout = new QVBoxLayout(this);
  m_empty = new QLabel("No instrument. Open analytics from a price view row.", this);
  m_table = MakeTable({"Measure", "Value"}, this);
  layout->addWidget(m_empty);
  layout->addWidget(m_table, 1);
}

void CAnalyticsView::Refresh() {
  const auto* ins = InstrumentAt(m_instrument);
  m_empty->setVisible(!ins);
  m_table->setVisible(ins != nullptr);
  if (!ins) {
    m_table->setRowCount(0);
    return;
  }
  sim::Market* m = MarketOrNull();
  const auto& q = m->QuoteOf(m_instrument);
  const auto summary = m->Summary(m_instrument);
  std::int64_t bidVol = 0, askVol = 0;
  for (const auto& line : summary) { bidVol += line.bidVolume; askVol += line.askVolume; }
  const double change = q.last > 0 && q.close > 0 ? q.last - q.close : 0;
  auto pct = [](double v) { return QString::number(v, 'f', 2) + "%"; };
  std::vector<std::pair<QString, QString>> rows = {
      {"Instrument", QString::fromStdString(ins->displayCode.empty() ? ins->instrumentCode : ins->displayCode)},
      {"Name", QString::fromStdString(m->NameOf(m_instrument))},
      {"Exchange", QString::fromStdString(ins->exchangeCode)},
      {"Product type", CExplorerView::TypeName(ins->productType)},
      {"Sector", SectorName(*m, ins->sector)},
      {"Currency", QString::fromStdString(ins->currency)},
      {"Lot size", Grouped(ins->lotSize)},
      {"Last", Price(m_instrument, q.last)},
      {"Change", q.close > 0 && q.last > 0 ? QString::fromStdString(m->FormatPrice(m_instrument, change)) : "-"},
      {"% Change", q.close > 0 && q.last > 0 ? pct(change / q.close * 100) : "-"},
      {"Open", Price(m_instrument, q.open)},
      {"High", Price(m_instrument, q.high)},
      {"Low", Price(m_instrument, q.low)},
      {"Previous close", Price(m_instrument, q.close)},
      {"Bid", Price(m_instrument, q.bid)},
      {"Ask", Price(m_instrument, q.ask)},
      {"Spread", q.bid > 0 && q.ask > 0 ? QString::fromStdString(m->FormatPrice(m_instrument, q.ask - q.bid)) : "-"},
      {"Volume", Grouped(q.volume)},
      {"Turnover", Grouped(static_cast<std::int64_t>(std::llround(q.turnover)))},
      {"Trades", Grouped(q.trades)},
      {"VWAP", q.volume > 0 ? Price(m_instrument, q.turnover / static_cast<double>(q.volume)) : "-"},
      {"Average trade size", q.trades > 0 ? Grouped(q.volume / q.trades) : "-"},
      {"Day range", q.low > 0 ? pct((q.high - q.low) / q.low * 100) : "-"},
      {"Bought at the ask", bidVol + askVol > 0 ? pct(100.0 * static_cast<double>(askVol) /
                                                        static_cast<double>(bidVol + askVol))
                                                 : "-"},
      {"Price levels traded", QString::number(summary.size())},
  };
  m_table->setRowCount(static_cast<int>(rows.size()));
  for (std::size_t i = 0; i < rows.size(); ++i) SetRow(m_table, static_cast<int>(i), {rows[i].first, rows[i].second});
}

// ---- News -------------------------------------------------------------------

void CNewsView::Build() {
  auto* layout = new QVBoxLayout(this);
  m_table = MakeTable({"Time", "Headline"}, this);
  layout->addWidget(m_table, 1);
}

void CNewsView::Add(const QString& time, const QString& headline) {
  m_table->insertRow(0);  // newest first
  SetRow(m_table, 0, {time, headline});
  if (m_table->rowCount() > 500) m_table->setRowCount(500);
}

void CNewsView::InstrumentChanged() {
  m_table->setRowCount(0);
  m_lastReportedChange = 0;
  m_lastReportedVolume = 0;
  m_lastTrades = 0;
  m_lastHigh = m_lastLow = 0;
  m_lastRemarks.clear();
  const auto* ins = InstrumentAt(m_instrument);
  if (!ins) {
    Add("", "No instrument. Open news from a price view row.");
    return;
  }
  sim::Market* m = MarketOrNull();
  const auto& q = m->QuoteOf(m_instrument);
  const QString name = QString::fromStdString(m->NameOf(m_instrument));
  Add(QString::fromStdString(m->TimeText()),
      QString("%1 (%2%3): previous close %4, opened at %5")
          .arg(name, QString::fromStdString(ins->exchangeCode),
               ins->sector.empty() ? QString() : ", " + QString::fromStdString(ins->sector),
               Price(m_instrument, q.close), Price(m_instrument, q.open)));
  m_lastHigh = q.high;
  m_lastLow = q.low;
  m_lastReportedVolume = q.volume;
  m_lastRemarks = q.remarks;
}

void CNewsView::Refresh() {
  const auto* ins = InstrumentAt(m_instrument);
  if (!ins) return;
  sim::Market* m = MarketOrNull();
  const auto& q = m->QuoteOf(m_instrument);
  const QString time = QString::fromStdString(m->TimeText());
  const QString name = QString::fromStdString(m->NameOf(m_instrument));
  if (q.last > 0 && q.close > 0) {
    const double pchange = (q.last - q.close) / q.close * 100;
    // A headline for every further full percent of move.
    if (std::floor(std::abs(pchange)) > std::floor(std::abs(m_lastReportedChange)) ||
        (pchange > 0) != (m_lastReportedChange > 0)) {
      if (std::abs(pchange) >= 1)
        Add(time, QString("%1 %2 %3% to %4").arg(name, pchange > 0 ? "rises" : "falls")
                      .arg(std::abs(pchange), 0, 'f', 2).arg(Price(m_instrument, q.last)));
      m_lastReportedChange = pchange;
    }
  }
  if (m_lastHigh > 0 && q.high > m_lastHigh * 1.002) {
    Add(time, QString("%1 reaches a session high of %2").arg(name, Price(m_instrument, q.high)));
    m_lastHigh = q.high;
  }
  if (m_lastLow > 0 && q.low > 0 && q.low < m_lastLow * 0.998) {
    Add(time, QString("%1 drops to a session low of %2").arg(name, Price(m_instrument, q.low)));
    m_lastLow = q.low;
  }
  // Heavy trading: every time the volume doubles.
  if (q.volume > 0 && q.volume >= std::max<std::int64_t>(2 * m_lastReportedVolume, 10000)) {
    Add(time, QString("Active trading in %1: %2 traded so far").arg(name, Grouped(q.volume)));
    m_lastReportedVolume = q.volume;
  }
  if (q.remarks != m_lastRemarks) {
    if (!q.remarks.empty())
      Add(time, QString("Exchange remark on %1: %2").arg(name, QString::fromStdString(q.remarks)));
    m_lastRemarks = q.remarks;
  }
}

}  // namespace term::views
