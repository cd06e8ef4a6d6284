#include "terminal/host/RecordingSource.h"

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
  if (!finished_) writer_->Value(inner_.ElapsedMs(), index, field, param, kind, value);
}

std::string RecordingSource::FieldValue(int index, std::string_view field, int param, int kind) {
  std::string value = inner_.FieldValue(index, field, param, kind);
  if (index >= 0 && std::size_t(index) < inner_.Instruments().size())
    Note(index, last_.Intern(field), field, param, kind, value);
  return value;
}

void RecordingSource::DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) {
  inner_.DepthField(index, field, levels, out);
  if (index < 0 || std::size_t(index) >= inner_.Instruments().size()) return;
  const std::uint32_t id = last_.Intern(field);
  for (std::size_t k = 0; k < out.size(); ++k) Note(index, id, field, int(k + 1), 1, out[k]);
}

}  // namespace term
