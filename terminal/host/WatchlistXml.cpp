#include "terminal/host/WatchlistXml.h"

#include <QString>
#include <QXmlStreamReader>
#include <algorithm>

#include "hostview/Text.h"

namespace term {
namespace {

// Walks `text`: root element `root`, children `child`; calls `take` with the
// attributes of each child. Any other element, or a parse error, fails.
template <class Take>
bool Walk(const std::wstring& text, const char* root, const char* child, std::string& error, Take take) {
  QXmlStreamReader xml(QString::fromStdWString(text));
  bool seenRoot = false;
  int depth = 0;
  while (!xml.atEnd()) {
    const auto token = xml.readNext();
    if (token == QXmlStreamReader::StartElement) {
      ++depth;
      const QString name = xml.name().toString();
      if (depth == 1) {
        if (name != QLatin1String(root)) {
          error = "root element is <" + name.toStdString() + ">, expected <" + root + ">";
          return false;
        }
        seenRoot = true;
      } else if (depth == 2 && name == QLatin1String(child)) {
        if (!take(xml.attributes(), error)) return false;
      } else {
        error = "unexpected element <" + name.toStdString() + "> at line " + std::to_string(xml.lineNumber());
        return false;
      }
    } else if (token == QXmlStreamReader::EndElement) {
      --depth;
    }
  }
  if (xml.hasError()) {
    error = xml.errorString().toStdString() + " at line " + std::to_string(xml.lineNumber()) + ", column " +
            std::to_string(xml.columnNumber());
    return false;
  }
  if (!seenRoot) {
    error = std::string("no <") + root + "> element";
    return false;
  }
  return true;
}

bool Int64Attr(const QXmlStreamAttributes& a, const char* name, std::int64_t& out, std::string& error, bool required = true) {
  if (!a.hasAttribute(QLatin1String(name))) {
    if (!required) return true;
    error = std::string("missing attribute ") + name;
    return false;
  }
  bool ok = false;
  const qlonglong v = a.value(QLatin1String(name)).toString().trimmed().toLongLong(&ok);
  if (!ok) {
    error = std::string("attribute ") + name + " is not a whole number: \"" + a.value(QLatin1String(name)).toString().toStdString() + "\"";
    return false;
  }
  out = v;
  return true;
}

bool TextAttr(const QXmlStreamAttributes& a, const char* name, std::string& out, std::string& error, bool required = true) {
  if (!a.hasAttribute(QLatin1String(name))) {
    if (!required) return true;
    error = std::string("missing attribute ") + name;
    return false;
  }
  out = a.value(QLatin1String(name)).toString().toStdString();
  return true;
}

// Reads one entry per <child> element; on success `out` gets the entries in
// SeqID order, on failure it is left untouched.
template <class T, class Read>
bool ReadEntries(const std::wstring& text, const char* root, std::vector<T>& out, std::string& error, Read read) {
  std::vector<T> v;
  const bool ok = Walk(text, root, "watchlistname", error, [&](const QXmlStreamAttributes& a, std::string& err) {
    T e;
    std::int64_t seq = 0;
    if (!read(a, e, err) || !Int64Attr(a, "SeqID", seq, err, false)) return false;
    e.seq = std::int32_t(seq);
    v.push_back(std::move(e));
    return true;
  });
  if (!ok) return false;
  std::stable_sort(v.begin(), v.end(), [](const T& x, const T& y) { return x.seq < y.seq; });
  out = std::move(v);
  return true;
}

std::wstring Escape(const std::wstring& s) {
  std::wstring out;
  for (wchar_t c : s) {
    switch (c) {
      case L'&': out += L"&amp;"; break;
      case L'<': out += L"&lt;"; break;
      case L'>': out += L"&gt;"; break;
      case L'"': out += L"&quot;"; break;
      case L'\'': out += L"&apos;"; break;
      default: out.push_back(c);
    }
  }
  return out;
}

}  // namespace

bool ParseWatchlistNames(const std::wstring& text, std::vector<NameEntry>& out, std::string& error) {
  return ReadEntries(text, "watchlistmain", out, error, [](const QXmlStreamAttributes& a, NameEntry& e, std::string& err) {
    std::int64_t id = 0;
    if (!Int64Attr(a, "WatchlistID", id, err) || !TextAttr(a, "WatchlistName", e.name, err)) return false;
    e.id = std::int32_t(id);
    return true;
  });
}

bool ParseUserItems(const std::wstring& text, std::vector<ItemEntry>& out, std::string& error) {
  return ReadEntries(text, "watchlistnames", out, error, [](const QXmlStreamAttributes& a, ItemEntry& e, std::string& err) {
    return Int64Attr(a, "ProductID", e.productId, err) && TextAttr(a, "InstrumentCode", e.instrumentCode, err);
  });
}

bool ParseBrandItems(const std::wstring& text, std::vector<ItemEntry>& out, std::string& error) {
  return ReadEntries(text, "watchlistnames", out, error, [](const QXmlStreamAttributes& a, ItemEntry& e, std::string& err) {
    return TextAttr(a, "InstrumentCode", e.instrumentCode, err) && TextAttr(a, "Exchange", e.exchange, err) &&
           Int64Attr(a, "ProductID", e.productId, err) && TextAttr(a, "Symbol", e.symbol, err, false) &&
           TextAttr(a, "Market", e.market, err, false);
  });
}

std::wstring WriteWatchlistNames(const std::vector<NameEntry>& entries) {
  std::wstring s = L"<watchlistmain>";
  for (const NameEntry& e : entries)
    s += L"<watchlistname WatchlistID=\"" + std::to_wstring(e.id) + L"\" WatchlistName=\"" + Escape(hv::Widen(e.name)) +
         L"\" SeqID=\"" + std::to_wstring(e.seq) + L"\" />";
  return s + L"</watchlistmain>";
}

std::wstring WriteUserItems(const std::vector<ItemEntry>& items) {
  std::wstring s = L"<watchlistnames>";
  for (const ItemEntry& e : items)
    s += L"<watchlistname ProductID=\"" + std::to_wstring(e.productId) + L"\" InstrumentCode=\"" +
         Escape(hv::Widen(e.instrumentCode)) + L"\" SeqID=\"" + std::to_wstring(e.seq) + L"\" />";
  return s + L"</watchlistnames>";
}

}  // namespace term
