#include "terminal/views/Blotter.h"

#include <algorithm>

#include "terminal/sim/Market.h"
#include "terminal/store/Store.h"

namespace term::views {

namespace {
Blotter* g_blotter = nullptr;
constexpr const char* kSideKey = "ui.ticket.side";
}  // namespace

void SetBlotter(Blotter* blotter) { g_blotter = blotter; }
Blotter* CurrentBlotter() { return g_blotter; }

Blotter::Blotter(Store* store, std::string session) : m_store(store), m_session(std::move(session)) {
  if (!m_store) return;
  for (const OrderRow& r : m_store->LoadOrders(m_session)) {
    BlotterOrder o;
    o.number = static_cast<int>(r.number);
    o.time = QString::fromStdString(r.time);
    o.side = QString::fromStdString(r.side);
    o.productId = r.productId;
    o.code = QString::fromStdString(r.instrumentCode);
    o.quantity = r.quantity;
    o.price = r.price;
    o.type = QString::fromStdString(r.type);
    o.validity = QString::fromStdString(r.validity);
    o.trigger = QString::fromStdString(r.trigger);
    o.status = QString::fromStdString(r.status);
    m_orders.push_back(std::move(o));
  }
  m_lastNumber = m_store->LastOrderNumber();
  const auto ui = m_store->LoadSettings("ui.ticket.");
  if (auto it = ui.find("side"); it != ui.end() && (it->second == "Buy" || it->second == "Sell"))
    m_lastSide = QString::fromStdString(it->second);
}

const BlotterOrder& Blotter::Add(BlotterOrder order) {
  for (const BlotterOrder& o : m_orders) m_lastNumber = std::max<std::int64_t>(m_lastNumber, o.number);
  order.number = static_cast<int>(++m_lastNumber);
  m_orders.push_back(std::move(order));
  ++m_version;
  Save(m_orders.back());
  SetLastSide(m_orders.back().side);
  return m_orders.back();
}

int Blotter::CheckFills(sim::Market& market) {
  int filled = 0;
  for (BlotterOrder& o : m_orders) {
    if (o.status != "Working") continue;
    const int index = market.Find(o.productId, o.code.toStdString());
    if (index < 0) continue;
    const sim::Quote q = market.QuoteOf(index);
    if ((o.side == "Buy" && q.ask > 0 && q.ask <= o.price) || (o.side == "Sell" && q.bid > 0 && q.bid >= o.price)) {
      o.status = "Filled";
      Save(o);
      ++filled;
    }
  }
  if (filled) ++m_version;
  return filled;
}

void Blotter::SetLastSide(const QString& side) {
  if (side == m_lastSide || (side != "Buy" && side != "Sell")) return;
  m_lastSide = side;
  if (m_store && !m_store->SaveSetting(kSideKey, side.toStdString())) m_error = m_store->LastError();
}

void Blotter::Save(const BlotterOrder& o) {
  if (!m_store) return;
  OrderRow r;
  r.number = o.number;
  r.session = m_session;
  r.time = o.time.toStdString();
  r.side = o.side.toStdString();
  r.productId = o.productId;
  r.instrumentCode = o.code.toStdString();
  r.quantity = o.quantity;
  r.price = o.price;
  r.type = o.type.toStdString();
  r.validity = o.validity.toStdString();
  r.trigger = o.trigger.toStdString();
  r.status = o.status.toStdString();
  if (m_store->SaveOrder(r)) m_error.clear();
  else m_error = m_store->LastError();
}

}  // namespace term::views
