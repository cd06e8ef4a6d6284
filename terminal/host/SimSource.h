#pragma once
// The simulator as the host's market source (terminal/host/MarketSource.h).
#include <vector>

#include "terminal/host/MarketSource.h"
#include "terminal/sim/Market.h"

namespace term {

// The book of the instrument last asked for is kept until the market moves,
// so the six depth fields of a depth subscription cost one book.
class SimSource : public MarketSource {
 public:
  explicit SimSource(sim::Market& market);

  const std::vector<JProduct>& Products() const override;
  const std::vector<JExchangeList>& Exchanges() const override;
  const std::vector<JInstrumentUnderlying>& Instruments() const override;
  int Find(std::int64_t productId, std::string_view code) const override;
  int FindByCode(std::string_view code) const override;
  int FindByChartCode(std::string_view chartCode) const override;
  void AdvanceTo(std::uint32_t now) override;
  std::uint64_t ElapsedMs() const override;
  const SessionInfo& Session() const override { return session_; }
  void AddInterest(int index) override;
  void RemoveInterest(int index) override;
  std::vector<std::pair<int, std::uint32_t>> TakeChangedWithBits() override;
  std::string FieldValue(int index, std::string_view field, int param, int kind) override;
  void DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) override;

 private:
  sim::Market& market_;
  SessionInfo session_;
  int bookIndex_ = -1;  // whose book `book_` is; -1 none
  std::vector<sim::DepthLevel> book_;
};

}  // namespace term
