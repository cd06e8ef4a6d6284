#pragma once
// The services the terminal hands to every view: language table, styles and
// their images, log factory, menu manager, and the message texts of 514/2814.
// All on the UI thread.
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <vector>

#include "hostview/Services.h"

namespace spdlog {
class logger;
}

namespace term {

// The terminal's own texts: view names (1..), names of the quote columns whose
// heading is blank (by the heading's entry in section 13), and its messages.
inline constexpr int kTerminalSection = 40;

// English texts by section and entry. Section 13 holds every text the views
// read; section 30 the font-size names; kTerminalSection the terminal's own.
class LanguageTable : public ILanguage {
 public:
  LanguageTable();
  std::wstring GetText(int section, int entry) const override;
  void Set(int section, int entry, std::wstring text);
  // Entries of a section, for checks.
  std::vector<int> Entries(int section) const;

 private:
  std::map<std::pair<int, int>, std::wstring> texts_;
};

// The name a person reads for a view class ("Market Depth" for
// "CMarketDepthAdv"), from the language table; the class name when the table
// has none.
std::wstring ViewName(const ILanguage* language, const std::string& className);

// Message texts by five-digit code ("17001"). The lookup key of 2814 is
// "%s, %I64d" (code and product id); products are named in some texts.
class MessageTexts {
 public:
  MessageTexts();
  // Text for a bare code or a "code, number" key; empty when unknown.
  // `productName` fills "%s" in texts that name the product.
  std::wstring Lookup(const std::string& key, const std::wstring& productName = {}) const;
  // The code part of a "code, number" key, and the number (0 when none).
  static std::string CodeOf(const std::string& key, long long* number = nullptr);

 private:
  std::map<std::string, std::wstring> texts_;
};

// Light (1) and dark (2) styles: colours and fonts by numbered role, and the
// style images, drawn by the terminal into `imageDir` on first need.
class StyleManager : public IStyleManager {
 public:
  static constexpr int kLight = 1;
  static constexpr int kDark = 2;

  explicit StyleManager(std::string imageDir, int styleId = kLight);
  int GetStyleID() const override { return styleId_; }
  void SetStyleID(int styleId);
  COLORREF GetColor(int colorId) const override;
  QFont GetFont(int fontId) const override;
  // ".\images\Toolbar\[styleID]\InstrumentExplorer.bmp" -> "<imageDir>/Toolbar/1/InstrumentExplorer.bmp"
  // (`imageDir` is the terminal's "images" folder).
  // The image is drawn when it does not exist yet; empty for names the
  // terminal does not know.
  std::wstring ResolveImagePath(const std::wstring& path, int styleId) const override;
  // Draws every known image for the given style (the terminal does it for 1
  // and 2 at start). Returns the number of files written.
  int DrawAll(int styleId) const;
  const std::string& ImageDir() const { return imageDir_; }
  // Known image paths relative to the image folder, "[styleID]" unreplaced.
  static std::vector<std::string> KnownImages();

 private:
  bool Draw(const std::string& relative, int styleId, const std::string& file) const;
  std::string imageDir_;
  int styleId_;
};

// spdlog behind the views' loggers: one rotating file (everything) and stderr
// (info and above). Level numbers of the views: 0 trace, 1 debug, 2 and 3
// info, 4 warning, 5 error, 6 and above critical.
class LogFactory : public ILogFactory {
 public:
  LogFactory(const std::string& file, bool toStderr);
  ~LogFactory() override;
  ILogger* CreateLogger() override;
  // The terminal's own lines.
  void Info(const std::string& line);
  void Warn(const std::string& line);
  void Error(const std::string& line);
  void Flush();
  std::shared_ptr<spdlog::logger> Logger() const { return logger_; }

 private:
  std::shared_ptr<spdlog::logger> logger_;
  std::vector<std::unique_ptr<ILogger>> loggers_;
};

class MenuManager : public IMenuManager {
 public:
  int MenuCount() const override { return 0; }
};

}  // namespace term
