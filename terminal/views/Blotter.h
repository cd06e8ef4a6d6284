#pragma once
// The day's orders of the trade tickets, kept in the terminal's database so
// that they survive a restart, and the ticket's last side. One blotter serves
// every ticket; the application owns it.
#include <QString>
#include <cstdint>
#include <string>
#include <vector>

namespace sim {
class Market;
}

namespace term {
class Store;

namespace views {

struct BlotterOrder {
  int number = 0;
  QString time, side, type, validity, trigger, status;
  std::int64_t productId = 0;
  QString code;
  double price = 0;
  qint64 quantity = 0;
};

class Blotter {
 public:
  // `store` may be null (nothing kept). `session`: the trading day shown.
  Blotter(Store* store, std::string session);

  const std::vector<BlotterOrder>& Orders() const { return m_orders; }
  // Numbers the order, keeps it and saves it; returns the kept order.
  const BlotterOrder& Add(BlotterOrder order);
  // Working orders the market has reached become "Filled" (and are saved).
  // Returns the number that filled.
  int CheckFills(sim::Market& market);
  // Bumps with every change, so that tickets redraw only when needed.
  std::uint64_t Version() const { return m_version; }

  // The side of the last order or choice ("Buy", "Sell"); "Buy" at first.
  QString LastSide() const { return m_lastSide; }
  void SetLastSide(const QString& side);

  // The last save that failed, empty when all went well.
  const std::string& LastError() const { return m_error; }

 private:
  void Save(const BlotterOrder& order);
  Store* m_store;
  std::string m_session;
  std::vector<BlotterOrder> m_orders;
  std::int64_t m_lastNumber = 0;
  std::uint64_t m_version = 1;
  QString m_lastSide = QStringLiteral("Buy");
  std::string m_error;
};

// The blotter the tickets use; set by the application before any ticket is
// created, cleared before it goes. Null: tickets cannot place orders.
void SetBlotter(Blotter* blotter);
Blotter* CurrentBlotter();

}  // namespace views
}  // namespace term
