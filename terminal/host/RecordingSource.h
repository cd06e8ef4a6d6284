#pragma once
// A market source that writes what passes through it: in front of the
// simulator (or a replay), it records the reference data at once and every
// value text the host reads whenever it differs from the one recorded last
// for that instrument, field, param and kind, stamped with the market time.
// What the host reads is what it answers and pushes, so the recording holds
// exactly the market the views received. Flushed every second of the clock.
#include <cstdint>
#include <memory>

#include "terminal/host/MarketRecording.h"
#include "terminal/host/MarketSource.h"

namespace term {

class RecordingSource : public MarketSource {
 public:
  // Writes the header and the reference data of `inner` to `writer` (opened).
  RecordingSource(MarketSource& inner, std::shared_ptr<rec::Writer> writer);
  ~RecordingSource() override;  // Finish()
  RecordingSource(const RecordingSource&) = delete;
  RecordingSource& operator=(const RecordingSource&) = delete;

  // Writes the end line and closes the file; later values are not recorded.
  // False when the recording failed at any point (Writer().Error()).
  bool Finish();
  const rec::Writer& Writer() const { return *writer_; }

  const std::vector<JProduct>& Products() const override { return inner_.Products(); }
  const std::vector<JExchangeList>& Exchanges() const override { return inner_.Exchanges(); }
  const std::vector<JInstrumentUnderlying>& Instruments() const override { return inner_.Instruments(); }
  int Find(std::int64_t productId, std::string_view code) const override { return inner_.Find(productId, code); }
  int FindByCode(std::string_view code) const override { return inner_.FindByCode(code); }
  int FindByChartCode(std::string_view chartCode) const override { return inner_.FindByChartCode(chartCode); }
  void AdvanceTo(std::uint32_t now) override;
  std::uint64_t ElapsedMs() const override { return inner_.ElapsedMs(); }
  const SessionInfo& Session() const override { return inner_.Session(); }
  void AddInterest(int index) override { inner_.AddInterest(index); }
  void RemoveInterest(int index) override { inner_.RemoveInterest(index); }
  std::vector<std::pair<int, std::uint32_t>> TakeChangedWithBits() override { return inner_.TakeChangedWithBits(); }
  std::string FieldValue(int index, std::string_view field, int param, int kind) override;
  void DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) override;

 private:
  void Note(int index, std::uint32_t fieldId, std::string_view field, int param, int kind, const std::string& value);

  MarketSource& inner_;
  std::shared_ptr<rec::Writer> writer_;
  rec::ValueTable last_;
  std::uint32_t flushedAt_ = 0;
  bool started_ = false;
  bool finished_ = false;
};

}  // namespace term
