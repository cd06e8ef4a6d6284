#pragma once
// The process-wide logger registry: one logger per view class name, taken from
// the host's log factory. Loggers belong to the factory; the registry only
// points at them, so the host keeps its factory alive while the add-on is loaded.
#include <string>
#include <string_view>

class ILogger;

namespace addon {

// The level handed with every line the views write.
inline constexpr int kLogLevel = 3;
// The name an empty class name is registered (and looked up) under.
inline constexpr const wchar_t* kUnknownLoggerName = L"PriceViewUnknow";

// Registers (or replaces) the logger of `className`. A null logger removes it.
void RegisterLogger(std::wstring_view className, ILogger* logger);
// The logger of `className`; null when none is registered.
ILogger* FindLogger(std::wstring_view className);
// Writes "Info:<function> file:<file> line:<line>" at level 3 through the
// logger of `className`; nothing when none is registered.
void LogInfo(std::wstring_view className, const char* function, const char* file, int line);
// Writes a printf-style line at level 3; nothing when none is registered.
void LogLine(std::wstring_view className, const char* format, ...) __attribute__((format(printf, 2, 3)));

// The last component of a source path ("views/price/PriceViewAdv.cpp" -> "PriceViewAdv.cpp").
constexpr const char* SourceFileName(const char* path) {
  const char* name = path;
  for (const char* p = path; *p; ++p)
    if (*p == '/' || *p == '\\') name = p + 1;
  return name;
}

}  // namespace addon
