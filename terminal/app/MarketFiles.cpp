#include "terminal/app/MarketFiles.h"

#include <memory>

#include "terminal/host/MarketRecording.h"

namespace term {

bool PrepareMarketFiles(const Options& options, HostOptions& host, std::vector<std::string>& warnings,
                        std::string& error) {
  if (!options.replayFile.empty()) {
    auto summary = std::make_shared<rec::Summary>();
    if (!rec::Scan(options.replayFile, *summary, error)) return false;
    warnings.insert(warnings.end(), summary->warnings.begin(), summary->warnings.end());
    host.replay = std::move(summary);
    host.replaySpeed = options.speed.value_or(1.0);
  }
  if (!options.recordFile.empty()) {
    auto writer = std::make_shared<rec::Writer>();
    if (!writer->Open(options.recordFile, error)) return false;
    host.record = std::move(writer);
  }
  return true;
}

double ReplaySeconds(const HostOptions& host) {
  if (!host.replay) return 0;
  return double(host.replay->endMs) / 1000.0 / (host.replaySpeed > 0 ? host.replaySpeed : 1.0);
}

}  // namespace term
