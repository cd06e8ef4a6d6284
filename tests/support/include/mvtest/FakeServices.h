#pragma once
// Recording stand-ins for the services the terminal hands to every view.
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "hostview/Services.h"

namespace mvtest {

// Language table from a map the test fills; records every read.
class FakeLanguage : public ILanguage {
 public:
  std::wstring GetText(int section, int entry) const override;
  void Set(int section, int entry, std::wstring text) { texts[{section, entry}] = std::move(text); }

  std::map<std::pair<int, int>, std::wstring> texts;
  mutable std::vector<std::pair<int, int>> reads;
};

// Colours and fonts by id from maps; unknown ids give grey and the default font.
class FakeStyleManager : public IStyleManager {
 public:
  int GetStyleID() const override { return styleId; }
  COLORREF GetColor(int colorId) const override;
  QFont GetFont(int fontId) const override;
  std::wstring ResolveImagePath(const std::wstring& path, int styleId) const override;

  int styleId = 1;
  std::map<int, COLORREF> colors;
  std::map<int, QFont> fonts;
  mutable std::vector<int> colorReads;
  mutable std::vector<int> fontReads;
  mutable std::vector<std::wstring> imageReads;
};

struct LogLine {
  int level = 0;
  std::string text;  // the formatted line
};

class RecordingLogger : public ILogger {
 public:
  void Log(int level, const char* format, ...) override __attribute__((format(printf, 3, 4)));
  std::vector<LogLine> lines;
  std::vector<LogLine>* sink = nullptr;  // the factory's list of all lines
};

// Hands out recording loggers and keeps them for the life of the factory.
class FakeLogFactory : public ILogFactory {
 public:
  ILogger* CreateLogger() override;
  // Every line of every logger, in the order written.
  std::vector<LogLine> lines;
  std::vector<std::string> Texts() const;
  std::vector<std::unique_ptr<RecordingLogger>> loggers;
  int created = 0;
};

class FakeMenuManager : public IMenuManager {
 public:
  int MenuCount() const override { return 0; }
};

}  // namespace mvtest
