#pragma once
// Services the terminal hands to every view by pointer. The terminal owns them;
// a view never frees them. All calls are made on the UI thread.
#include <QColor>
#include <QFont>
#include <string>

#include "hostview/Types.h"

// Colours and fonts of the current style, by numbered role.
class HV_API IStyleManager {
 public:
  virtual ~IStyleManager();
  virtual int GetStyleID() const = 0;
  // Colour of a numbered role as 0x00BBGGRR; an unknown id gives a neutral grey.
  virtual COLORREF GetColor(int colorId) const = 0;
  // Font of a numbered role; an unknown id gives the default UI font.
  virtual QFont GetFont(int fontId) const = 0;
  // Turns a terminal image path (".\images\[styleID]\x.bmp") into a file path
  // on this machine for the given style; empty when there is no such image.
  virtual std::wstring ResolveImagePath(const std::wstring& path, int styleId) const = 0;

  QColor Color(int colorId) const {
    const COLORREF c = GetColor(colorId);
    return QColor(int(ColorRefRed(c)), int(ColorRefGreen(c)), int(ColorRefBlue(c)));
  }
};

// The terminal's language table: wide text by section and entry.
class HV_API ILanguage {
 public:
  virtual ~ILanguage();
  // Empty when the entry does not exist.
  virtual std::wstring GetText(int section, int entry) const = 0;
};

// A logger handed out by the log factory. printf-style formatting.
class HV_API ILogger {
 public:
  virtual ~ILogger();
  virtual void Log(int level, const char* format, ...) __attribute__((format(printf, 3, 4))) = 0;
};

class HV_API ILogFactory {
 public:
  virtual ~ILogFactory();
  // A new logger owned by the factory; valid for the life of the factory.
  virtual ILogger* CreateLogger() = 0;
};

// The terminal's menu service; views keep the pointer and pass it on.
class HV_API IMenuManager {
 public:
  virtual ~IMenuManager();
  virtual int MenuCount() const = 0;
};
