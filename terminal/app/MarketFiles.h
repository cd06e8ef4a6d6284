#pragma once
// The market files of a run: --record opens the recording it writes, --replay
// checks the whole recording before the terminal starts on it.
#include <string>
#include <vector>

#include "terminal/app/Options.h"
#include "terminal/host/HostRuntime.h"

namespace term {

// Fills the replay and record parts of `host`. False with `error` when the
// recording to replay is not one (the message names the file, the line and
// the reason) or the file to record cannot be created. `warnings`: what the
// user should know (a cut-off recording).
bool PrepareMarketFiles(const Options& options, HostOptions& host, std::vector<std::string>& warnings,
                        std::string& error);

// Simulated seconds a headless replay of `host.replay` needs to reach its end.
double ReplaySeconds(const HostOptions& host);

}  // namespace term
