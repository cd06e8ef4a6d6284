#include "addon/Logging.h"

#include <cstdarg>
#include <cstdio>
#include <map>
#include <vector>

#include "data/ProcessState.h"
#include "hostview/Services.h"
#include "hostview/Text.h"

namespace addon {
namespace {

std::map<std::wstring, ILogger*, std::less<>>& Loggers() {
  static std::map<std::wstring, ILogger*, std::less<>> loggers;
  static const bool hook = mvd::OnResetForTests([] { loggers.clear(); });
  (void)hook;
  return loggers;
}

std::wstring_view Normalised(std::wstring_view name) { return name.empty() ? kUnknownLoggerName : name; }

}  // namespace

void RegisterLogger(std::wstring_view className, ILogger* logger) {
  const std::wstring key(Normalised(className));
  if (logger)
    Loggers()[key] = logger;
  else
    Loggers().erase(key);
}

ILogger* FindLogger(std::wstring_view className) {
  auto& loggers = Loggers();
  auto it = loggers.find(Normalised(className));
  return it == loggers.end() ? nullptr : it->second;
}

void LogInfo(std::wstring_view className, const char* function, const char* file, int line) {
  if (ILogger* logger = FindLogger(className))
    logger->Log(kLogLevel, "Info:%s file:%s line:%d", function ? function : "", file ? file : "", line);
}

void LogLine(std::wstring_view className, const char* format, ...) {
  ILogger* logger = FindLogger(className);
  if (!logger || !format) return;
  // The host's logger is printf-style but takes no va_list: format here and
  // hand it over as one "%s" argument.
  va_list args;
  va_start(args, format);
  const std::string text = hv::FormatV(format, args);
  va_end(args);
  logger->Log(kLogLevel, "%s", text.c_str());
}

}  // namespace addon
