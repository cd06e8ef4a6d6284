#include "terminal/host/Services.h"

#include <spdlog/logger.h>
#include <spdlog/sinks/rotating_file_sink.h>
#include <spdlog/sinks/stdout_color_sinks.h>
#include <spdlog/spdlog.h>

#include <QDir>
#include <QFileInfo>
#include <QGuiApplication>
#include <QImage>
#include <QPainter>
#include <QPainterPath>
#include <cstdarg>
#include <cstdio>

#include "hostview/Text.h"

namespace term {

// ---- Language ------------------------------------------------------------

namespace {
struct Entry { int id; const wchar_t* text; };
// Section 13: every text the views read.
const Entry kSection13[] = {
    {7, L"Market Depth"}, {8, L"Time & Sales"}, {9, L"Price Alerts"}, {10, L"Trade Summary"},
    {11, L"Search Instrument"}, {12, L"Instrument already exist in the list."},
    {19, L"Please select an instrument."}, {20, L"This instrument code does not exist."},
    {21, L"This alert does not exist."}, {22, L"Your own watchlists"},
    {29, L"Remark Definition"}, {30, L"For the full list of remark codes click"}, {31, L"Here"},
    {36, L"Long/Short Status"},
    // Quote grid headings.
    {101, L"Symbol"}, {102, L"Name"}, {103, L"Remark"}, {104, L"Exchange"}, {105, L"Code"}, {106, L"Last"},
    {107, L"Change"}, {108, L"Bid"}, {109, L"Ask"}, {110, L"Bid Vol"}, {111, L"Ask Vol"}, {112, L""},
    {113, L""}, {114, L"% Change"}, {115, L"Volume"}, {116, L"Open"}, {117, L"High"}, {118, L"Low"},
    {119, L"Prev Close"}, {120, L"Currency"}, {121, L"L/S"}, {122, L"TAC"}, {123, L"CFD"}, {124, L""},
    {125, L"Delay"}, {126, L"DMA"}, {127, L"Month"}, {128, L"Year"},
    // Board tile captions.
    {201, L"Bid"}, {202, L"Ask"}, {203, L"Vol"}, {204, L"Chg"}, {205, L"Delay"},
    // Price grid menu and watchlists.
    {401, L"Buy"}, {402, L"Sell"}, {403, L"Add to Watchlist"}, {404, L"Remove from this Watchlist"},
    {407, L"Delete this watchlist?"}, {408, L"The watchlist name cannot be empty."},
    {409, L"already exists. Please choose another name."}, {410, L"Rename"}, {411, L"Delete"},
    {412, L"Remove from this list"}, {413, L"This watchlist is empty. Add instruments with the search box above."},
    {414, L"Chart"}, {415, L"Stock Analytics"},
    {416, L"%s has no instruments at the moment."}, {417, L"This list is empty."},
    {418, L"Related News"}, {419, L"Double-click for the legend"},
    // Depth.
    {501, L"Buy Orders"}, {502, L"Buy Vol"}, {503, L"Bid"}, {504, L"Ask"}, {505, L"Sell Vol"},
    {506, L"Sell Orders"}, {507, L"Level"}, {508, L"Spread"},
    // Time and sales.
    {601, L"Time"}, {602, L"Price"}, {603, L"Volume"}, {604, L"Side"}, {605, L"Time"}, {606, L"High"},
    {607, L"Low"}, {608, L"Net Change"}, {609, L"Last"}, {610, L"Total Value"}, {611, L"Total Volume"},
    {613, L"No trades yet."}, {614, L"Buy"}, {615, L"Sell"},
    // Trade summary.
    {651, L"Price"}, {652, L"Trades"}, {653, L"Volume"}, {654, L"Bid Vol"}, {655, L"Ask Vol"},
    {663, L"No trades yet."},
    // Alerts.
    {701, L"Exchange"}, {702, L"Symbol"}, {703, L"Name"}, {704, L"Trigger Once"}, {705, L"Valid Until"},
    {706, L"Delay"}, {707, L"Condition"}, {708, L"Current Value"}, {709, L"Alert Via"}, {710, L"Status"},
    {711, L"New"}, {712, L"Modify"}, {713, L"Delete"},
    {714, L"Instrument"}, {715, L"Price Field"}, {716, L"Condition"}, {717, L"Price"}, {718, L"Valid Until"},
    {719, L"Trigger Once"}, {720, L"Alert Via"}, {721, L"Notice"},
    {723, L"E-mail"}, {724, L"SMS"}, {725, L"New Price Alert"}, {726, L"Modify Price Alert"}, {727, L"Submit"},
    {728, L"Ask"}, {729, L"Bid"}, {730, L"Last Done"}, {731, L"<="}, {732, L">="}, {733, L"Yes"}, {734, L"No"},
    {735, L"Triggered"}, {736, L"Expired"},
};
const Entry kSection30[] = {{1, L"Small"}, {2, L"Medium"}, {3, L"Large"}, {4, L"Extra Large"}};
const Entry kTerminalTexts[] = {
    {1, L"Price View"}, {2, L"Trade Ticket"}, {3, L"Chart"}, {4, L"Instrument Explorer"}, {5, L"Stock Analytics"},
    {6, L"News"},
    // Quote columns whose heading is blank.
    {112, L"Product icon"}, {113, L"Link"}, {124, L"Change arrow"},
};
// Which text names a view class: section and entry.
struct ViewNameEntry { const char* className; int section; int entry; };
const ViewNameEntry kViewNames[] = {
    {"CPriceViewAdv", kTerminalSection, 1}, {"CMarketDepthAdv", 13, 7},      {"CTimeAndSalesAdv", 13, 8},
    {"CTradeSummaryAdv", 13, 10},           {"CPriceAlertList", 13, 9},      {"CNewPriceAlertAdv", 13, 725},
    {"CTradeView", kTerminalSection, 2},    {"CBranticChartView", kTerminalSection, 3},
    {"CInsExpViewEx", kTerminalSection, 4}, {"CStockAnalytics", kTerminalSection, 5},
    {"CFNews", kTerminalSection, 6},
};
}  // namespace

std::wstring ViewName(const ILanguage* language, const std::string& className) {
  for (const ViewNameEntry& v : kViewNames) {
    if (className != v.className) continue;
    std::wstring text = language ? language->GetText(v.section, v.entry) : std::wstring();
    if (!text.empty()) return text;
  }
  return hv::Widen(className);
}

LanguageTable::LanguageTable() {
  for (const Entry& e : kSection13) texts_[{13, e.id}] = e.text;
  for (const Entry& e : kSection30) texts_[{30, e.id}] = e.text;
  for (const Entry& e : kTerminalTexts) texts_[{kTerminalSection, e.id}] = e.text;
}

std::wstring LanguageTable::GetText(int section, int entry) const {
  auto it = texts_.find({section, entry});
  return it == texts_.end() ? std::wstring() : it->second;
}

void LanguageTable::Set(int section, int entry, std::wstring text) { texts_[{section, entry}] = std::move(text); }

std::vector<int> LanguageTable::Entries(int section) const {
  std::vector<int> out;
  for (const auto& [key, text] : texts_) if (key.first == section) out.push_back(key.second);
  return out;
}

// ---- Message texts ---------------------------------------------------------

MessageTexts::MessageTexts() {
  texts_ = {
      {"11007", L"The quantity cannot be zero."},
      {"11013", L"The quantity is above the maximum allowed for this instrument."},
      {"11014", L"The quantity is below the lot size."},
      {"11015", L"The quantity is above your trading limit."},
      {"14009", L"%s are not available in this view."},
      {"17001", L"Market depth is not available for this exchange."},
      {"17002", L"Time and sales is not available for this exchange."},
      {"17003", L"Trade summary is not available for this exchange."},
      {"17004", L"Market data for this instrument is not available at the moment."},
      {"17005", L"No market depth for this instrument yet."},
      {"17006", L"The instrument could not be found."},
      {"17007", L"This instrument cannot be traded from here."},
      {"17008", L"Price alerts are not available for this exchange."},
  };
}

std::string MessageTexts::CodeOf(const std::string& key, long long* number) {
  const std::size_t comma = key.find(',');
  std::string code = key.substr(0, comma);
  while (!code.empty() && code.back() == ' ') code.pop_back();
  while (!code.empty() && code.front() == ' ') code.erase(code.begin());
  if (number) {
    *number = 0;
    if (comma != std::string::npos) {
      try {
        *number = std::stoll(key.substr(comma + 1));
      } catch (...) {
        *number = 0;
      }
    }
  }
  return code;
}

std::wstring MessageTexts::Lookup(const std::string& key, const std::wstring& productName) const {
  auto it = texts_.find(CodeOf(key));
  if (it == texts_.end()) return {};
  std::wstring text = it->second;
  const std::size_t at = text.find(L"%s");
  if (at != std::wstring::npos) text.replace(at, 2, productName.empty() ? std::wstring(L"These instruments") : productName);
  return text;
}

// ---- Styles ----------------------------------------------------------------

namespace {
struct Palette {
  COLORREF window, text, face, border, heading, headingText, oddRow, evenRow, gridLine, selected, selectedText,
      up, down, changedText, riseBg, changedBg, fallBg, link, accent, muted;
};
const Palette kLightPalette{
    MakeColorRef(255, 255, 255), MakeColorRef(20, 24, 32),    MakeColorRef(236, 238, 242), MakeColorRef(190, 196, 206),
    MakeColorRef(58, 74, 99),    MakeColorRef(255, 255, 255), MakeColorRef(255, 255, 255), MakeColorRef(244, 246, 250),
    MakeColorRef(214, 219, 227), MakeColorRef(204, 224, 255), MakeColorRef(10, 20, 40),    MakeColorRef(0, 140, 60),
    MakeColorRef(205, 30, 40),   MakeColorRef(0, 0, 0),       MakeColorRef(200, 240, 205), MakeColorRef(255, 236, 160),
    MakeColorRef(255, 210, 210), MakeColorRef(0, 90, 200),    MakeColorRef(30, 110, 220),  MakeColorRef(130, 136, 146)};
const Palette kDarkPalette{
    MakeColorRef(22, 25, 31),    MakeColorRef(224, 228, 235), MakeColorRef(38, 42, 51),    MakeColorRef(70, 76, 90),
    MakeColorRef(44, 52, 68),    MakeColorRef(230, 234, 240), MakeColorRef(26, 29, 36),    MakeColorRef(32, 36, 44),
    MakeColorRef(52, 57, 68),    MakeColorRef(40, 70, 120),   MakeColorRef(255, 255, 255), MakeColorRef(70, 210, 120),
    MakeColorRef(255, 95, 95),   MakeColorRef(255, 255, 255), MakeColorRef(24, 90, 50),    MakeColorRef(110, 90, 20),
    MakeColorRef(110, 30, 34),   MakeColorRef(110, 170, 255), MakeColorRef(90, 160, 255),  MakeColorRef(140, 146, 158)};

const Palette& PaletteOf(int styleId) { return styleId == StyleManager::kDark ? kDarkPalette : kLightPalette; }

QColor Q(COLORREF c) { return QColor(int(ColorRefRed(c)), int(ColorRefGreen(c)), int(ColorRefBlue(c))); }

std::string Replace(std::string s, const std::string& what, const std::string& with) {
  for (std::size_t at = s.find(what); at != std::string::npos; at = s.find(what, at + with.size())) s.replace(at, what.size(), with);
  return s;
}
}  // namespace

StyleManager::StyleManager(std::string imageDir, int styleId) : imageDir_(std::move(imageDir)), styleId_(styleId) {}

void StyleManager::SetStyleID(int styleId) { styleId_ = styleId == kDark ? kDark : kLight; }

COLORREF StyleManager::GetColor(int id) const {
  const Palette& p = PaletteOf(styleId_);
  switch (id) {
    case 1: case 101: return p.window;   // window and legend background
    case 2: case 204: case 109: return p.text;  // text, legend text, grid data text
    case 3: case 105: return p.face;
    case 4: case 111: return p.border;   // borders and grid lines
    case 24: return p.link;
    case 102: case 108: return p.heading;  // heading background
    case 103: case 110: return p.headingText;
    case 104: return p.gridLine;
    case 106: return p.oddRow;
    case 107: return p.evenRow;
    case 112: return p.selected;
    case 113: return p.selectedText;
    case 201: return p.muted;
    case 202: return p.accent;
    case 203: return p.headingText;
    case 301: return p.text;    // edit and combo box text
    case 304: return p.oddRow;  // edit and combo box background
    case 3101: return p.up;     // rise, buy side
    case 3102: return p.down;   // fall, sell side
    case 3103: return p.changedText;
    case 3104: return p.riseBg;
    case 3105: return p.changedBg;
    case 3106: return p.fallBg;
    case 3107: return p.up;
    case 3108: return p.down;
    default: break;
  }
  return MakeColorRef(128, 128, 128);
}

QFont StyleManager::GetFont(int id) const {
  QFont f(QStringLiteral("Sans Serif"));
  f.setPointSize(9);
  switch (id) {
    case 16: break;                                   // grid data
    case 17: case 18: f.setBold(true); break;         // headings
    case 19: f.setBold(true); break;                  // totals line
    case 20: f.setPointSize(10); break;               // information panels
    case 21: f.setPointSize(11); f.setBold(true); break;  // board tile title
    case 22: f.setPointSize(13); f.setBold(true); break;  // board tile last price
    case 40: f.setUnderline(true); break;             // links
    case 53: f.setPointSize(8); break;                // legend text
    case 54: f.setPointSize(8); f.setBold(true); break;   // legend codes
    default: break;
  }
  return f;
}

std::vector<std::string> StyleManager::KnownImages() {
  return {
      "Toolbar/[styleID]/InstrumentExplorer.bmp", "QuickBar/[styleID]/toList.bmp",
      "QuickBar/[styleID]/tradeboard.bmp",        "QuickBar/[styleID]/CompanyInfo.bmp",
      "QuickBar/[styleID]/toclose.bmp",           "Bitmaps/[styleID]/help.bmp",
      "Products/ES.bmp",  "Products/CS.bmp", "Products/CFD.bmp", "Products/FUT.bmp",
      "Products/FX.bmp",  "Products/DMA.bmp", "Products/IDX.bmp",
  };
}

std::wstring StyleManager::ResolveImagePath(const std::wstring& path, int styleId) const {
  // Terminal paths are Windows-style and relative to the program folder.
  std::string rel = hv::Narrow(path);
  for (char& c : rel) if (c == '\\') c = '/';
  while (rel.rfind("./", 0) == 0) rel.erase(0, 2);
  while (!rel.empty() && rel.front() == '/') rel.erase(0, 1);
  // The image folder is the terminal's "images" folder itself.
  if (rel.rfind("images/", 0) == 0) rel.erase(0, 7);
  const std::string concrete = Replace(rel, "[styleID]", std::to_string(styleId));
  if (concrete.empty() || concrete.find("..") != std::string::npos) return {};
  const std::string file = imageDir_ + "/" + concrete;
  if (QFileInfo::exists(QString::fromStdString(file))) return hv::Widen(file);
  // Find the known image this path names (any style folder).
  for (const std::string& known : KnownImages()) {
    if (Replace(known, "[styleID]", std::to_string(styleId)) == concrete) {
      if (Draw(known, styleId, file)) return hv::Widen(file);
      return {};
    }
  }
  return {};
}

int StyleManager::DrawAll(int styleId) const {
  int n = 0;
  for (const std::string& known : KnownImages()) {
    const std::string file = imageDir_ + "/" + Replace(known, "[styleID]", std::to_string(styleId));
    if (QFileInfo::exists(QString::fromStdString(file))) continue;
    n += Draw(known, styleId, file) ? 1 : 0;
  }
  return n;
}

bool StyleManager::Draw(const std::string& known, int styleId, const std::string& file) const {
  const Palette& p = PaletteOf(styleId);
  const QString name = QFileInfo(QString::fromStdString(known)).completeBaseName();
  const bool product = known.find("Products/") != std::string::npos;
  const int w = product ? 32 : 18, h = product ? 20 : 18;
  QImage img(w, h, QImage::Format_RGB32);
  // Bitmaps carry no alpha; the views draw them with the face colour as the
  // transparent colour, so the background is the style's face.
  img.fill(Q(p.face));
  {
    QPainter g(&img);
    g.setRenderHint(QPainter::Antialiasing, true);
    const QColor ink = Q(p.accent), fg = Q(p.text);
    if (name == "InstrumentExplorer") {
      g.setPen(QPen(ink, 2));
      g.drawEllipse(QRectF(3, 3, 8, 8));
      g.drawLine(QPointF(10, 10), QPointF(15, 15));
    } else if (name == "toList") {
      g.setPen(QPen(fg, 1.5));
      for (int y = 4; y <= 14; y += 5) { g.drawLine(3, y, 5, y); g.drawLine(7, y, 15, y); }
    } else if (name == "tradeboard") {
      g.setPen(Qt::NoPen);
      g.setBrush(fg);
      for (int r = 0; r < 2; ++r) for (int c = 0; c < 2; ++c) g.drawRect(3 + c * 7, 3 + r * 7, 5, 5);
    } else if (name == "CompanyInfo") {
      g.setPen(QPen(ink, 1.5));
      g.drawEllipse(QRectF(2, 2, 14, 14));
      g.setPen(QPen(ink, 2));
      g.drawPoint(QPointF(9, 5.5));
      g.drawLine(QPointF(9, 8), QPointF(9, 13));
    } else if (name == "toclose") {
      g.setPen(QPen(fg, 2));
      g.drawLine(5, 5, 13, 13);
      g.drawLine(13, 5, 5, 13);
    } else if (name == "help") {
      g.setPen(QPen(ink, 1.5));
      g.drawEllipse(QRectF(2, 2, 14, 14));
      QPainterPath q;
      q.moveTo(6.5, 7);
      q.cubicTo(6.5, 3.5, 11.5, 3.5, 11.5, 7);
      q.cubicTo(11.5, 9, 9, 9, 9, 11);
      g.setBrush(Qt::NoBrush);
      g.drawPath(q);
      g.drawPoint(QPointF(9, 13.5));
    } else if (product) {
      // A coloured tag with the product type.
      const QColor tag = name == "CFD" ? QColor(200, 110, 20) : name == "FUT" ? QColor(120, 70, 170)
                         : name == "FX" ? QColor(20, 140, 140) : name == "DMA" ? QColor(170, 40, 80)
                         : name == "CS" ? QColor(90, 110, 40) : name == "IDX" ? QColor(90, 96, 110)
                         : QColor(30, 100, 200);
      g.setPen(Qt::NoPen);
      g.setBrush(tag);
      g.drawRoundedRect(QRectF(1, 2, w - 2, h - 4), 3, 3);
      if (QGuiApplication::instance()) {
        QFont f(QStringLiteral("Sans Serif"));
        f.setPixelSize(10);
        f.setBold(true);
        g.setFont(f);
        g.setPen(Qt::white);
        g.drawText(QRect(0, 0, w, h), Qt::AlignCenter, name);
      }
    } else {
      return false;
    }
  }
  QDir().mkpath(QFileInfo(QString::fromStdString(file)).absolutePath());
  return img.save(QString::fromStdString(file), "BMP");
}

// ---- Logging ---------------------------------------------------------------

namespace {
spdlog::level::level_enum LevelOf(int level) {
  switch (level) {
    case 0: return spdlog::level::trace;
    case 1: return spdlog::level::debug;
    case 2: case 3: return spdlog::level::info;
    case 4: return spdlog::level::warn;
    case 5: return spdlog::level::err;
    default: return level < 0 ? spdlog::level::trace : spdlog::level::critical;
  }
}

class ViewLogger : public ILogger {
 public:
  explicit ViewLogger(std::shared_ptr<spdlog::logger> logger) : logger_(std::move(logger)) {}
  void Log(int level, const char* format, ...) override {
    if (!format) return;
    va_list args;
    va_start(args, format);
    const std::string text = hv::FormatV(format, args);
    va_end(args);
    logger_->log(LevelOf(level), "{}", text);
  }

 private:
  std::shared_ptr<spdlog::logger> logger_;
};
}  // namespace

LogFactory::LogFactory(const std::string& file, bool toStderr) {
  std::vector<spdlog::sink_ptr> sinks;
  if (!file.empty()) {
    try {
      QDir().mkpath(QFileInfo(QString::fromStdString(file)).absolutePath());
      auto rotating = std::make_shared<spdlog::sinks::rotating_file_sink_mt>(file, 5 * 1024 * 1024, 3);
      rotating->set_level(spdlog::level::trace);
      sinks.push_back(rotating);
    } catch (const std::exception& e) {
      std::fprintf(stderr, "terminal: cannot open log file %s: %s\n", file.c_str(), e.what());
    }
  }
  if (toStderr) {
    auto err = std::make_shared<spdlog::sinks::stderr_color_sink_mt>();
    err->set_level(spdlog::level::info);
    sinks.push_back(err);
  }
  // Not registered with spdlog's registry: several runtimes may live in one process.
  logger_ = std::make_shared<spdlog::logger>("terminal", sinks.begin(), sinks.end());
  logger_->set_level(spdlog::level::trace);
  logger_->set_pattern("%Y-%m-%d %H:%M:%S.%e %^%l%$ %v");
  logger_->flush_on(spdlog::level::warn);
}

LogFactory::~LogFactory() {
  if (logger_) logger_->flush();
}

ILogger* LogFactory::CreateLogger() {
  loggers_.push_back(std::make_unique<ViewLogger>(logger_));
  return loggers_.back().get();
}

void LogFactory::Info(const std::string& line) { logger_->info("{}", line); }
void LogFactory::Warn(const std::string& line) { logger_->warn("{}", line); }
void LogFactory::Error(const std::string& line) { logger_->error("{}", line); }
void LogFactory::Flush() { logger_->flush(); }

}  // namespace term
