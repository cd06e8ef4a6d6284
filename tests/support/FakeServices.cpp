#include "mvtest/FakeServices.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>

#include "hostview/Text.h"

namespace mvtest {

std::wstring FakeLanguage::GetText(int section, int entry) const {
  reads.emplace_back(section, entry);
  auto it = texts.find({section, entry});
  return it == texts.end() ? std::wstring() : it->second;
}

COLORREF FakeStyleManager::GetColor(int colorId) const {
  colorReads.push_back(colorId);
  auto it = colors.find(colorId);
  return it == colors.end() ? MakeColorRef(0x80, 0x80, 0x80) : it->second;
}

QFont FakeStyleManager::GetFont(int fontId) const {
  fontReads.push_back(fontId);
  auto it = fonts.find(fontId);
  return it == fonts.end() ? QFont() : it->second;
}

std::wstring FakeStyleManager::ResolveImagePath(const std::wstring& path, int) const {
  imageReads.push_back(path);
  return {};
}

void RecordingLogger::Log(int level, const char* format, ...) {
  if (!format) return;
  va_list args;
  va_start(args, format);
  std::string text = hv::FormatV(format, args);
  va_end(args);
  if (sink) sink->push_back({level, text});
  lines.push_back({level, std::move(text)});
}

ILogger* FakeLogFactory::CreateLogger() {
  ++created;
  loggers.push_back(std::make_unique<RecordingLogger>());
  loggers.back()->sink = &lines;
  return loggers.back().get();
}

std::vector<std::string> FakeLogFactory::Texts() const {
  std::vector<std::string> texts;
  for (const auto& line : lines) texts.push_back(line.text);
  return texts;
}

}  // namespace mvtest
