#pragma once
// The market recording file: what the host played to the views, one event a
// line, so that a session can be replayed (ReplaySource) and compared.
// The format is described in terminal/README.md ("Market recordings").
//
//   MVREC 1 seed=.. instruments=.. rate=.. date=YYYY-MM-DD start=HH:MM:SS
//   P ...   X ...   I ...          products, exchanges, instruments
//   R <products> <exchanges> <instruments>      the reference data is complete
//   V <ms> <instrument> <field> <param> <kind> <value>     a value changed
//   D <ms> <instrument> <field> <level> <value> <value>...  depth levels
//                                 from <level> on changed (kind 1)
//   E <ms>                                        the recording ended cleanly
//
// Fields are tab-separated; "\\", "\t", "\n" and "\r" inside a field are
// written as two characters. The file is zstd-compressed (a plain text file
// reads as well). Plain C++ and libzstd; no Qt.
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "hostview/Records.h"
#include "terminal/host/MarketSource.h"

namespace term::rec {

inline constexpr int kVersion = 1;
inline constexpr std::string_view kMagic = "MVREC";
// Depth levels a recording holds (the views ask for 99 at most).
inline constexpr int kMaxLevels = 999;

struct Reference {
  std::vector<JProduct> products;
  std::vector<JExchangeList> exchanges;
  std::vector<JInstrumentUnderlying> instruments;
};

// One "V" or "D" line: values of a field of an instrument from `timeMs` on.
struct ValueEvent {
  std::uint64_t timeMs = 0;
  int instrument = 0;   // position in the recording's instrument list
  std::string field;
  int param = 0;        // D: the first level of `levels`
  int kind = 0;         // D: 1
  std::string value;    // V
  std::vector<std::string> levels;  // D: levels param, param + 1, ...
  bool depth = false;   // a D line
};

// The current text of every (instrument, field, param, kind) seen, with the
// field names interned; depth levels (kind 1, levels 1..kMaxLevels) are kept
// as one column per instrument and field. A value never set reads as "".
class ValueTable {
 public:
  // A field name's number, made on first use.
  std::uint32_t Intern(std::string_view field);
  // -1 when the name was never interned.
  std::int64_t FieldId(std::string_view field) const;
  const std::string& Get(int instrument, std::uint32_t field, int param, int kind) const;
  // The stored text, made empty on first use.
  std::string& At(int instrument, std::uint32_t field, int param, int kind);
  // The depth levels of a field (level 1 first), made empty on first use.
  std::vector<std::string>& Column(int instrument, std::uint32_t field);
  const std::vector<std::string>* FindColumn(int instrument, std::uint32_t field) const;
  static bool IsLevel(int param, int kind) { return kind == 1 && param >= 1 && param <= kMaxLevels; }

 private:
  struct Key {
    std::int32_t instrument, param;
    std::uint32_t field;
    std::int32_t kind;
    bool operator==(const Key&) const = default;
  };
  struct KeyHash {
    std::size_t operator()(const Key& k) const noexcept;
  };
  struct NameHash {
    using is_transparent = void;
    std::size_t operator()(std::string_view s) const noexcept { return std::hash<std::string_view>{}(s); }
  };
  std::unordered_map<std::string, std::uint32_t, NameHash, std::equal_to<>> fields_;
  std::unordered_map<Key, std::string, KeyHash> values_;
  std::unordered_map<Key, std::vector<std::string>, KeyHash> columns_;  // param and kind 0
};

// Writes a recording. Lines are buffered and compressed; Flush() puts all of
// it into the file (a crash later loses nothing before it). A failed write
// stops the writer: later calls do nothing and Error() says why.
class Writer {
 public:
  Writer();
  ~Writer();  // closes; without Finish the file has no end line
  Writer(const Writer&) = delete;
  Writer& operator=(const Writer&) = delete;

  // Creates (truncates) `path`. False with `error` when it cannot.
  bool Open(const std::string& path, std::string& error);
  // The header and the reference data; once, first.
  void Begin(const SessionInfo& session, const std::vector<JProduct>& products,
             const std::vector<JExchangeList>& exchanges, const std::vector<JInstrumentUnderlying>& instruments);
  void Value(std::uint64_t timeMs, int instrument, std::string_view field, int param, int kind, std::string_view value);
  // Levels `firstLevel`.. of a depth field: `values[0]` .. `values[count - 1]`.
  void Depth(std::uint64_t timeMs, int instrument, std::string_view field, int firstLevel, const std::string* values,
             std::size_t count);
  bool Flush();
  // The end line, then closes. False when anything failed.
  bool Finish(std::uint64_t endMs);

  bool Ok() const { return error_.empty(); }
  const std::string& Error() const { return error_; }
  const std::string& Path() const { return path_; }
  std::uint64_t Values() const { return values_; }  // V and D lines
  bool Finished() const { return finished_; }

 private:
  struct Out;
  void Put();  // hands the buffer to the compressor
  void Compress(int mode);
  void Fail(const std::string& why);
  void Close();

  std::unique_ptr<Out> out_;
  std::string path_, error_, buf_;
  std::uint64_t values_ = 0;
  bool finished_ = false;
};

// Reads a recording line by line: Open reads the header and the reference
// data, Next the value events in order.
class Reader {
 public:
  Reader();
  ~Reader();
  Reader(const Reader&) = delete;
  Reader& operator=(const Reader&) = delete;

  // False with `error` ("FILE:LINE: reason" or "FILE: reason") for a file that
  // is not a recording, of a newer version, or whose header or reference data
  // is bad or incomplete.
  bool Open(const std::string& path, std::string& error);
  int Version() const { return version_; }
  const SessionInfo& Session() const { return session_; }
  const Reference& Ref() const { return ref_; }

  enum class Step { Value, End, Error };
  // Value: `event` holds the next event. End: no more (clean end line, or a
  // cut-off end noted in Warnings()). Error: Error() says which line and why.
  Step Next(ValueEvent& event);
  const std::string& Error() const { return error_; }
  const std::vector<std::string>& Warnings() const { return warnings_; }
  // The time of the end line; 0 before it was read or when there is none.
  bool HasEndMark() const { return hasEnd_; }
  std::uint64_t EndMark() const { return endMs_; }
  std::uint64_t LastTime() const { return lastTime_; }
  std::uint64_t Line() const { return line_; }

 private:
  struct Input;
  // The next non-empty, non-comment line, unescaped into fields. False at the
  // end of the input or on an error (error_ set).
  bool ReadFields();
  bool Fail(const std::string& why);
  bool ParseHeader();
  bool ParseReference();
  bool ParseTime(const std::string& text, std::uint64_t& out);
  bool ParseInstrument(const std::string& text, int& out);
  bool ParseDepth(ValueEvent& e);

  std::unique_ptr<Input> in_;
  std::string path_, error_;
  std::vector<std::string> warnings_;
  std::vector<std::string> fields_;
  std::uint64_t line_ = 0;
  int version_ = 0;
  SessionInfo session_;
  Reference ref_;
  std::uint64_t lastTime_ = 0, endMs_ = 0;
  bool hasEnd_ = false, done_ = false;
};

// What a whole pass over a recording found.
struct Summary {
  std::string path;
  SessionInfo session;
  Reference reference;
  std::uint64_t endMs = 0;      // the end line's time, else the last event's
  std::uint64_t values = 0;
  bool closed = false;          // it has its end line
  std::vector<std::string> warnings;
};

// Reads the whole recording once; false with `error` when any line is bad.
// A cut-off last line is dropped with a warning.
bool Scan(const std::string& path, Summary& out, std::string& error);

}  // namespace term::rec
