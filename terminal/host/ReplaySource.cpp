#include "terminal/host/ReplaySource.h"

#include <algorithm>
#include <cmath>

namespace term {

ReplaySource::ReplaySource(const rec::Summary& recording, std::uint32_t startTick, double speed)
    : path_(recording.path),
      session_(recording.session),
      ref_(recording.reference),
      endMs_(recording.endMs),
      anchorTick_(startTick),
      lastTick_(startTick) {
  if (speed > 0 && std::isfinite(speed)) speed_ = speed;
  session_.instruments = int(ref_.instruments.size());
  for (int i = 0; i < int(ref_.instruments.size()); ++i) {
    const JInstrumentUnderlying& ins = ref_.instruments[std::size_t(i)];
    byKey_.emplace(std::make_pair(ins.productId, ins.instrumentCode), i);
    byCode_.emplace(ins.instrumentCode, i);
    if (!ins.chartCode.empty()) byChart_.emplace(ins.chartCode, i);
  }
  dirty_.assign(ref_.instruments.size(), 0);
  std::string error;
  if (!reader_.Open(path_, error)) {
    problem_ = error;
    exhausted_ = true;
  }
  // The values of the session's first moment, before any view asks.
  PlayTo(0);
}

ReplaySource::~ReplaySource() = default;

int ReplaySource::Find(std::int64_t productId, std::string_view code) const {
  auto it = byKey_.find(std::make_pair(productId, std::string(code)));
  return it == byKey_.end() ? -1 : it->second;
}

int ReplaySource::FindByCode(std::string_view code) const {
  auto it = byCode_.find(std::string(code));
  return it == byCode_.end() ? -1 : it->second;
}

int ReplaySource::FindByChartCode(std::string_view chartCode) const {
  auto it = byChart_.find(std::string(chartCode));
  return it == byChart_.end() ? -1 : it->second;
}

void ReplaySource::Rebase() {
  anchorMs_ = elapsed_;
  anchorTick_ = lastTick_;
}

void ReplaySource::SetPaused(bool paused) {
  if (paused == paused_) return;
  Rebase();
  paused_ = paused;
}

void ReplaySource::SetSpeed(double speed) {
  if (!(speed > 0) || !std::isfinite(speed)) return;
  Rebase();
  speed_ = speed;
}

bool ReplaySource::JumpTo(std::uint64_t elapsedMs) {
  elapsedMs = std::min(elapsedMs, endMs_);
  if (elapsedMs <= elapsed_) return false;
  PlayTo(elapsedMs);
  Rebase();
  return true;
}

void ReplaySource::AdvanceTo(std::uint32_t now) {
  // A clock stepped back plays nothing; the market time never goes back.
  const std::int32_t step = std::int32_t(now - lastTick_);
  if (step < 0) return;
  lastTick_ = now;
  if (paused_) return;
  const double played = double(std::uint32_t(now - anchorTick_)) * speed_;
  const std::uint64_t target = std::min<std::uint64_t>(anchorMs_ + std::uint64_t(played), endMs_);
  if (target > elapsed_) PlayTo(target);
}

bool ReplaySource::Pull() {
  if (hasPending_) return true;
  if (exhausted_) return false;
  switch (reader_.Next(pending_)) {
    case rec::Reader::Step::Value:
      hasPending_ = true;
      return true;
    case rec::Reader::Step::Error:
      problem_ = reader_.Error();
      break;
    case rec::Reader::Step::End:
      break;
  }
  exhausted_ = true;
  return false;
}

void ReplaySource::PlayTo(std::uint64_t target) {
  while (Pull() && pending_.timeMs <= target) {
    const int i = pending_.instrument;
    const std::uint32_t field = values_.Intern(pending_.field);
    if (pending_.depth) {
      std::vector<std::string>& column = values_.Column(i, field);
      const std::size_t first = std::size_t(pending_.param - 1), end = first + pending_.levels.size();
      if (column.size() < end) column.resize(end);
      std::move(pending_.levels.begin(), pending_.levels.end(), column.begin() + std::ptrdiff_t(first));
    } else {
      values_.At(i, field, pending_.param, pending_.kind) = std::move(pending_.value);
    }
    // A recorded name or remark is a change of that kind too (the host tells the price view).
    std::uint32_t bits = kMarketChanged;
    if (!pending_.depth && pending_.kind == 0) {
      if (pending_.field == "INSTRNAME") bits |= kNameChanged;
      else if (pending_.field == "REMARKS") bits |= kRemarksChanged;
    }
    hasPending_ = false;
    if (!dirty_[std::size_t(i)]) dirtyList_.push_back(i);
    dirty_[std::size_t(i)] |= std::uint8_t(bits);
  }
  elapsed_ = std::max(elapsed_, target);
}

std::vector<std::pair<int, std::uint32_t>> ReplaySource::TakeChangedWithBits() {
  std::sort(dirtyList_.begin(), dirtyList_.end());
  std::vector<std::pair<int, std::uint32_t>> out;
  out.reserve(dirtyList_.size());
  for (int i : dirtyList_) {
    out.emplace_back(i, dirty_[std::size_t(i)]);
    dirty_[std::size_t(i)] = 0;
  }
  dirtyList_.clear();
  return out;
}

std::string ReplaySource::FieldValue(int index, std::string_view field, int param, int kind) {
  const std::int64_t id = values_.FieldId(field);
  if (id < 0) return {};
  return values_.Get(index, std::uint32_t(id), param, kind);
}

void ReplaySource::DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) {
  out.assign(std::size_t(std::max(levels, 0)), std::string());
  const std::int64_t id = values_.FieldId(field);
  const std::vector<std::string>* column = id < 0 ? nullptr : values_.FindColumn(index, std::uint32_t(id));
  if (!column) return;
  std::copy_n(column->begin(), std::min(out.size(), column->size()), out.begin());
}

}  // namespace term
