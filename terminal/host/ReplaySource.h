#pragma once
// A recorded market played back as the host's market source: the reference
// data of the recording, and each recorded value from its market time on.
// Market time follows the clock ticks given to AdvanceTo, scaled by the
// speed; it can be paused and moved forward at once. It never runs past the
// recording's end. The file is read as the market time reaches it.
#include <cstdint>
#include <map>
#include <string>
#include <unordered_map>
#include <vector>

#include "terminal/host/MarketRecording.h"
#include "terminal/host/MarketSource.h"

namespace term {

class ReplaySource : public MarketSource {
 public:
  // `recording` passed rec::Scan; market time 0 is at tick `startTick`.
  ReplaySource(const rec::Summary& recording, std::uint32_t startTick, double speed = 1.0);
  ~ReplaySource() override;

  // ---- Playback ------------------------------------------------------------------
  void SetPaused(bool paused);
  bool Paused() const { return paused_; }
  // Speeds above 0; others are ignored.
  void SetSpeed(double speed);
  double Speed() const { return speed_; }
  // Plays everything up to market time `elapsedMs` at once (clamped to the
  // end). False when that is not ahead of the current market time.
  bool JumpTo(std::uint64_t elapsedMs);
  std::uint64_t EndMs() const { return endMs_; }
  bool Ended() const { return elapsed_ >= endMs_; }
  const std::string& Path() const { return path_; }
  // A read error met while playing (the file changed since it was checked);
  // the market then stays as it is.
  const std::string& Problem() const { return problem_; }

  // ---- MarketSource --------------------------------------------------------------
  const std::vector<JProduct>& Products() const override { return ref_.products; }
  const std::vector<JExchangeList>& Exchanges() const override { return ref_.exchanges; }
  const std::vector<JInstrumentUnderlying>& Instruments() const override { return ref_.instruments; }
  int Find(std::int64_t productId, std::string_view code) const override;
  int FindByCode(std::string_view code) const override;
  int FindByChartCode(std::string_view chartCode) const override;
  void AdvanceTo(std::uint32_t now) override;
  std::uint64_t ElapsedMs() const override { return elapsed_; }
  const SessionInfo& Session() const override { return session_; }
  void AddInterest(int) override {}
  void RemoveInterest(int) override {}
  std::vector<std::pair<int, std::uint32_t>> TakeChangedWithBits() override;
  std::string FieldValue(int index, std::string_view field, int param, int kind) override;
  void DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) override;

 private:
  void PlayTo(std::uint64_t target);
  bool Pull();  // reads the next event into pending_; false when there is none
  void Rebase();

  std::string path_, problem_;
  SessionInfo session_;
  rec::Reference ref_;
  std::map<std::pair<std::int64_t, std::string>, int, std::less<>> byKey_;
  std::unordered_map<std::string, int> byCode_, byChart_;
  rec::Reader reader_;
  rec::ValueEvent pending_;
  bool hasPending_ = false, exhausted_ = false;
  rec::ValueTable values_;
  std::vector<std::uint8_t> dirty_;
  std::vector<int> dirtyList_;

  std::uint64_t endMs_ = 0, elapsed_ = 0, anchorMs_ = 0;
  std::uint32_t anchorTick_ = 0, lastTick_ = 0;
  double speed_ = 1.0;
  bool paused_ = false;
};

}  // namespace term
