#include "terminal/host/RecordingSource.h"

#include <algorithm>

namespace term {

namespace {
constexpr std::uint32_t kFlushEveryMs = 1000;
}

RecordingSource::RecordingSource(MarketSource& inner, std::shared_ptr<rec::Writer> writer)
    : inner_(inner), writer_(std::move(writer)) {
  writer_->Begin(inner_.Session(), inner_.Products(), inner_.Exchanges(), inner_.Instruments());
}

RecordingSource::~RecordingSource() { Finish(); }

bool RecordingSource::Finish() {
  if (!finished_) {
    finished_ = true;
    writer_->Finish(inner_.ElapsedMs());
  }
  return writer_->Ok();
}

void RecordingSource::AdvanceTo(std::uint32_t now) {
  inner_.AdvanceTo(now);
  if (!started_) {
    started_ = true;
    flushedAt_ = now;
  }
  // A crash loses at most the last second.
  if (!finished_ && now - flushedAt_ >= kFlushEveryMs) {
    flushedAt_ = now;
    writer_->Flush();
  }
}

void RecordingSource::Note(int index, std::uint32_t fieldId, std::string_view field, int param, int kind,
                           const std::string& value) {
  std::string& last = last_.At(index, fieldId, param, kind);
  if (last == value) return;
  last = value;
  if (finished_) return;
  if (rec::ValueTable::IsLevel(param, kind)) writer_->Depth(inner_.ElapsedMs(), index, field, param, &value, 1);
  else writer_->Value(inner_.ElapsedMs(), index, field, param, kind, value);
}

std::string RecordingSource::FieldValue(int index, std::string_view field, int param, int kind) {
  std::string value = inner_.FieldValue(index, field, param, kind);
  if (index >= 0 && std::size_t(index) < inner_.Instruments().size())
    Note(index, last_.Intern(field), field, param, kind, value);
  return value;
}

// One line for the levels between the first and the last that changed.
void RecordingSource::DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) {
  inner_.DepthField(index, field, levels, out);
  if (index < 0 || std::size_t(index) >= inner_.Instruments().size()) return;
  const std::size_t n = std::min<std::size_t>(out.size(), std::size_t(rec::kMaxLevels));
  std::vector<std::string>& column = last_.Column(index, last_.Intern(field));
  if (column.size() < n) column.resize(n);
  std::size_t first = n, last = 0;
  for (std::size_t k = 0; k < n; ++k) {
    if (column[k] == out[k]) continue;
    column[k] = out[k];
    if (first == n) first = k;
    last = k;
  }
  if (first < n && !finished_) writer_->Depth(inner_.ElapsedMs(), index, field, int(first + 1), &out[first], last - first + 1);
}

}  // namespace term
