#include "terminal/host/MarketRecording.h"

#include <zstd.h>

#include <cerrno>
#include <charconv>
#include <cstdio>
#include <cstring>
#include <set>
#include <utility>

namespace term::rec {

namespace {

// Fast compression: the recorder runs inside the terminal's pump.
constexpr int kLevel = 1;
constexpr std::size_t kWriteChunk = 256 * 1024;
constexpr unsigned char kZstdMagic[4] = {0x28, 0xB5, 0x2F, 0xFD};
constexpr std::size_t kReadChunk = 64 * 1024;
constexpr std::size_t kMaxLine = 16 * 1024 * 1024;

void AppendEscaped(std::string& out, std::string_view s) {
  std::size_t from = 0;
  for (;;) {
    const std::size_t at = s.find_first_of("\\\t\n\r", from);
    if (at == std::string_view::npos) {
      out.append(s.substr(from));
      return;
    }
    out.append(s.substr(from, at - from));
    out.push_back('\\');
    const char c = s[at];
    out.push_back(c == '\t' ? 't' : c == '\n' ? 'n' : c == '\r' ? 'r' : '\\');
    from = at + 1;
  }
}

template <class T>
void AppendNumber(std::string& out, T value) {
  char buf[32];
  const auto r = std::to_chars(buf, buf + sizeof buf, value);
  out.append(buf, r.ptr);
}

template <class T>
bool ParseNumber(std::string_view text, T& out) {
  if (text.empty()) return false;
  const auto r = std::from_chars(text.data(), text.data() + text.size(), out);
  return r.ec == std::errc() && r.ptr == text.data() + text.size();
}

std::string Quoted(std::string_view s) {
  std::string out = "\"";
  AppendEscaped(out, s.substr(0, 40));
  if (s.size() > 40) out += "...";
  return out + "\"";
}

bool ParseClock(std::string_view text, int& seconds) {
  int h = 0, m = 0, s = 0;
  if (text.size() != 8 || text[2] != ':' || text[5] != ':') return false;
  if (!ParseNumber(text.substr(0, 2), h) || !ParseNumber(text.substr(3, 2), m) || !ParseNumber(text.substr(6, 2), s))
    return false;
  if (h > 23 || m > 59 || s > 59) return false;
  seconds = h * 3600 + m * 60 + s;
  return true;
}

bool ValidDate(std::string_view text) {
  int y = 0, m = 0, d = 0;
  return text.size() == 10 && text[4] == '-' && text[7] == '-' && ParseNumber(text.substr(0, 4), y) &&
         ParseNumber(text.substr(5, 2), m) && ParseNumber(text.substr(8, 2), d) && m >= 1 && m <= 12 && d >= 1 &&
         d <= 31;
}

}  // namespace

// ---- ValueTable -------------------------------------------------------------------

std::size_t ValueTable::KeyHash::operator()(const Key& k) const noexcept {
  std::uint64_t h = std::uint64_t(std::uint32_t(k.instrument)) * 0x9E3779B97F4A7C15ull;
  h ^= (std::uint64_t(std::uint32_t(k.param)) << 20) ^ (std::uint64_t(k.field) << 40) ^ std::uint64_t(k.kind);
  h ^= h >> 29;
  h *= 0xBF58476D1CE4E5B9ull;
  return std::size_t(h ^ (h >> 32));
}

std::uint32_t ValueTable::Intern(std::string_view field) {
  auto it = fields_.find(field);
  if (it != fields_.end()) return it->second;
  const auto id = std::uint32_t(fields_.size());
  fields_.emplace(std::string(field), id);
  return id;
}

std::int64_t ValueTable::FieldId(std::string_view field) const {
  auto it = fields_.find(field);
  return it == fields_.end() ? -1 : std::int64_t(it->second);
}

const std::string& ValueTable::Get(int instrument, std::uint32_t field, int param, int kind) const {
  static const std::string none;
  if (IsLevel(param, kind)) {
    const std::vector<std::string>* column = FindColumn(instrument, field);
    return column && std::size_t(param) <= column->size() ? (*column)[std::size_t(param - 1)] : none;
  }
  auto it = values_.find(Key{instrument, param, field, kind});
  return it == values_.end() ? none : it->second;
}

std::string& ValueTable::At(int instrument, std::uint32_t field, int param, int kind) {
  if (IsLevel(param, kind)) {
    std::vector<std::string>& column = Column(instrument, field);
    if (column.size() < std::size_t(param)) column.resize(std::size_t(param));
    return column[std::size_t(param - 1)];
  }
  return values_[Key{instrument, param, field, kind}];
}

std::vector<std::string>& ValueTable::Column(int instrument, std::uint32_t field) {
  return columns_[Key{instrument, 0, field, 0}];
}

const std::vector<std::string>* ValueTable::FindColumn(int instrument, std::uint32_t field) const {
  auto it = columns_.find(Key{instrument, 0, field, 0});
  return it == columns_.end() ? nullptr : &it->second;
}

// ---- Writer -------------------------------------------------------------------------

struct Writer::Out {
  std::FILE* file = nullptr;
  ZSTD_CCtx* cctx = nullptr;
  std::string buf = std::string(ZSTD_CStreamOutSize(), '\0');
  ~Out() {
    if (cctx) ZSTD_freeCCtx(cctx);
    if (file) std::fclose(file);
  }
};

Writer::Writer() = default;
Writer::~Writer() { Close(); }

bool Writer::Open(const std::string& path, std::string& error) {
  Close();
  path_ = path;
  error_.clear();
  auto out = std::make_unique<Out>();
  errno = 0;
  out->file = std::fopen(path.c_str(), "wb");
  if (!out->file) {
    error = "cannot create the recording " + path + (errno ? std::string(": ") + std::strerror(errno) : std::string());
    return false;
  }
  out->cctx = ZSTD_createCCtx();
  if (!out->cctx) {
    error = "cannot create the recording " + path + ": no memory for the compressor";
    return false;
  }
  ZSTD_CCtx_setParameter(out->cctx, ZSTD_c_compressionLevel, kLevel);
  ZSTD_CCtx_setParameter(out->cctx, ZSTD_c_checksumFlag, 1);  // damage is found, not replayed
  out_ = std::move(out);
  return true;
}

void Writer::Fail(const std::string& why) {
  if (!error_.empty()) return;
  error_ = "writing the recording " + path_ + " failed: " + why;
  buf_.clear();
}

// Compresses the buffer with `mode` and writes what comes out. With a flush or
// an end, loops until the compressor holds nothing back.
void Writer::Compress(int mode) {
  if (!out_ || !error_.empty()) return;
  ZSTD_inBuffer in{buf_.data(), buf_.size(), 0};
  for (;;) {
    ZSTD_outBuffer out{out_->buf.data(), out_->buf.size(), 0};
    const std::size_t left = ZSTD_compressStream2(out_->cctx, &out, &in, ZSTD_EndDirective(mode));
    if (ZSTD_isError(left)) {
      Fail(ZSTD_getErrorName(left));
      return;
    }
    if (out.pos > 0 && std::fwrite(out.dst, 1, out.pos, out_->file) != out.pos) {
      Fail(std::strerror(errno));
      return;
    }
    const bool done = mode == ZSTD_e_continue ? in.pos == in.size : left == 0;
    if (done) break;
  }
  buf_.clear();
}

void Writer::Put() {
  if (!buf_.empty()) Compress(ZSTD_e_continue);
}

void Writer::Begin(const SessionInfo& s, const std::vector<JProduct>& products,                   const std::vector<JExchangeList>& exchanges, const std::vector<JInstrumentUnderlying>& instruments) {
  std::string& b = buf_;
  b.append(kMagic);
  b += '\t';
  AppendNumber(b, kVersion);
  b += "\tseed=";
  AppendNumber(b, s.seed);
  b += "\tinstruments=";
  AppendNumber(b, s.instruments);
  b += "\trate=";
  AppendNumber(b, s.fieldUpdatesPerSecond);
  b += "\tdate=";
  AppendEscaped(b, s.date);
  b += "\tstart=";
  b += ClockText(std::uint32_t(s.startSeconds) * 1000u);
  b += "\n# A market recording of the trading terminal (see terminal/README.md, \"Market recordings\").\n";
  for (const JProduct& p : products) {
    b += "P\t";
    AppendNumber(b, p.productId);
    for (const std::string* f : {&p.productType, &p.productName, &p.pictureFile}) {
      b += '\t';
      AppendEscaped(b, *f);
    }
    b += '\n';
  }
  for (const JExchangeList& e : exchanges) {
    b += "X\t";
    AppendEscaped(b, e.exchangeCode);
    b += '\t';
    AppendEscaped(b, e.marketName);
    b += '\t';
    AppendEscaped(b, e.exchangeName);
    b += '\t';
    AppendNumber(b, e.productId);
    b += '\n';
  }
  for (const JInstrumentUnderlying& i : instruments) {
    auto text = [&](const std::string& v) { b += '\t'; AppendEscaped(b, v); };
    auto number = [&](auto v) { b += '\t'; AppendNumber(b, v); };
    b += 'I';
    text(i.exchangeCode);
    text(i.instrumentCode);
    number(i.productId);
    text(i.instrumentName);
    text(i.symbol);
    number(i.decimals);
    text(i.displayCode);
    number(i.accessStatus);
    number(i.altAccessStatus);
    number(i.lotSize);
    number(i.maxQty1);
    number(i.maxQty2);
    text(i.sector);
    number(i.priceStepTableId);
    number(i.referencePrice);
    text(i.chartCode);
    text(i.currency);
    text(i.isin);
    text(i.productType);
    b += '\n';
    if (b.size() >= kWriteChunk) Put();
  }
  b += "R\t";
  AppendNumber(b, products.size());
  b += '\t';
  AppendNumber(b, exchanges.size());
  b += '\t';
  AppendNumber(b, instruments.size());
  b += '\n';
  Flush();
}

void Writer::Value(std::uint64_t timeMs, int instrument, std::string_view field, int param, int kind,
                   std::string_view value) {
  if (!out_ || !error_.empty()) return;
  std::string& b = buf_;
  b += "V\t";
  AppendNumber(b, timeMs);
  b += '\t';
  AppendNumber(b, instrument);
  b += '\t';
  AppendEscaped(b, field);
  b += '\t';
  AppendNumber(b, param);
  b += '\t';
  AppendNumber(b, kind);
  b += '\t';
  AppendEscaped(b, value);
  b += '\n';
  ++values_;
  if (b.size() >= kWriteChunk) Put();
}

void Writer::Depth(std::uint64_t timeMs, int instrument, std::string_view field, int firstLevel,
                   const std::string* values, std::size_t count) {
  if (!out_ || !error_.empty() || count == 0) return;
  std::string& b = buf_;
  b += "D\t";
  AppendNumber(b, timeMs);
  b += '\t';
  AppendNumber(b, instrument);
  b += '\t';
  AppendEscaped(b, field);
  b += '\t';
  AppendNumber(b, firstLevel);
  for (std::size_t k = 0; k < count; ++k) {
    b += '\t';
    AppendEscaped(b, values[k]);
  }
  b += '\n';
  ++values_;
  if (b.size() >= kWriteChunk) Put();
}

bool Writer::Flush() {
  if (!out_) return false;
  Compress(ZSTD_e_flush);
  if (error_.empty() && std::fflush(out_->file) != 0) Fail(std::strerror(errno));
  return error_.empty();
}

bool Writer::Finish(std::uint64_t endMs) {
  if (!out_) return error_.empty() && finished_;
  buf_ += "E\t";
  AppendNumber(buf_, endMs);
  buf_ += '\n';
  finished_ = true;
  Close();
  return error_.empty();
}

void Writer::Close() {
  if (!out_) return;
  Compress(ZSTD_e_end);
  std::FILE* f = out_->file;
  out_->file = nullptr;
  if (std::fclose(f) != 0) Fail(std::strerror(errno));
  out_.reset();
}

// ---- Reader -------------------------------------------------------------------------

struct Reader::Input {
  std::FILE* file = nullptr;
  ZSTD_DCtx* dctx = nullptr;  // null: plain text
  std::string raw, buf;
  std::size_t rawPos = 0, pos = 0;
  std::size_t frameLeft = 0;  // bytes the current frame still needs; 0 at a frame's end
  bool eof = false;
  std::string cut;    // why the input ended early; empty: it did not
  std::string error;  // the input cannot be read

  ~Input() {
    if (dctx) ZSTD_freeDCtx(dctx);
    if (file) std::fclose(file);
  }

  bool Open(const std::string& path) {
    file = std::fopen(path.c_str(), "rb");
    if (!file) return false;
    raw.resize(kReadChunk);
    raw.resize(std::fread(raw.data(), 1, raw.size(), file));
    if (raw.size() >= 4 && std::memcmp(raw.data(), kZstdMagic, 4) == 0) dctx = ZSTD_createDCtx();
    return true;
  }

  // Appends more text to `buf`; sets `eof` when there is none.
  void More() {
    if (!dctx) {
      if (rawPos < raw.size()) {
        buf.append(raw, rawPos, std::string::npos);
        rawPos = raw.size();
        return;
      }
      raw.resize(kReadChunk);
      raw.resize(std::fread(raw.data(), 1, raw.size(), file));
      rawPos = 0;
      if (raw.empty()) eof = true;
      else buf += raw;
      rawPos = raw.size();
      return;
    }
    for (;;) {
      if (rawPos == raw.size()) {
        raw.resize(kReadChunk);
        raw.resize(std::fread(raw.data(), 1, raw.size(), file));
        rawPos = 0;
        if (raw.empty()) {
          eof = true;
          if (frameLeft != 0) cut = "the compressed data ends early";
          return;
        }
      }
      const std::size_t had = buf.size();
      buf.resize(had + ZSTD_DStreamOutSize());
      ZSTD_inBuffer in{raw.data(), raw.size(), rawPos};
      ZSTD_outBuffer out{buf.data() + had, buf.size() - had, 0};
      const std::size_t r = ZSTD_decompressStream(dctx, &out, &in);
      rawPos = in.pos;
      buf.resize(had + out.pos);
      if (ZSTD_isError(r)) {
        error = std::string("the compressed data is damaged (") + ZSTD_getErrorName(r) + ")";
        eof = true;
        return;
      }
      frameLeft = r;
      if (out.pos > 0) return;
    }
  }

  // One line without its line feed. False when there is none left (or on an
  // error). `complete` is false for a last line without its line feed.
  bool Line(std::string& out, bool& complete) {
    for (;;) {
      const std::size_t nl = buf.find('\n', pos);
      if (nl != std::string::npos) {
        out.assign(buf, pos, nl - pos);
        pos = nl + 1;
        if (!out.empty() && out.back() == '\r') out.pop_back();
        complete = true;
        return true;
      }
      if (!error.empty()) return false;
      if (buf.size() - pos > kMaxLine) {
        error = "a line longer than 16 MiB";
        return false;
      }
      if (eof) {
        if (pos >= buf.size()) return false;
        out.assign(buf, pos, std::string::npos);
        pos = buf.size();
        complete = false;
        return true;
      }
      buf.erase(0, pos);
      pos = 0;
      More();
    }
  }
};

Reader::Reader() = default;
Reader::~Reader() = default;

bool Reader::Fail(const std::string& why) {
  if (error_.empty()) error_ = path_ + ":" + std::to_string(line_) + ": " + why;
  done_ = true;
  return false;
}

bool Reader::ReadFields() {
  std::string line;
  for (;;) {
    bool complete = true;
    if (!in_->Line(line, complete)) {
      if (in_->error.empty()) return false;
      ++line_;
      return Fail(in_->error);
    }
    ++line_;
    if (!complete) {
      warnings_.push_back(path_ + ":" + std::to_string(line_) +
                          ": the last line is incomplete (the recording was cut off); it is dropped");
      return false;
    }
    if (line.empty() || line[0] == '#') continue;
    fields_.clear();
    std::string field;
    for (std::size_t i = 0; i <= line.size(); ++i) {
      if (i == line.size() || line[i] == '\t') {
        fields_.push_back(std::move(field));
        field.clear();
        continue;
      }
      if (line[i] != '\\') {
        field.push_back(line[i]);
        continue;
      }
      const char c = i + 1 < line.size() ? line[++i] : '\0';
      if (c == 't') field.push_back('\t');
      else if (c == 'n') field.push_back('\n');
      else if (c == 'r') field.push_back('\r');
      else if (c == '\\') field.push_back('\\');
      else return Fail(c ? std::string("unknown escape \"\\") + c + "\"" : "a \"\\\" at the end of the line");
    }
    return true;
  }
}

bool Reader::Open(const std::string& path, std::string& error) {
  path_ = path;
  in_ = std::make_unique<Input>();
  errno = 0;
  if (!in_->Open(path)) {
    error = "cannot open the recording " + path + (errno ? std::string(": ") + std::strerror(errno) : std::string());
    return false;
  }
  if (!ParseHeader() || !ParseReference()) {
    error = error_;
    return false;
  }
  return true;
}

bool Reader::ParseHeader() {
  std::string line;
  bool complete = true;
  if (!in_->Line(line, complete)) {
    if (!in_->error.empty()) return Fail(in_->error);
    error_ = path_ + ": the file is empty; it is not a market recording";
    return false;
  }
  line_ = 1;
  const std::size_t tab = line.find('\t');
  if (line.substr(0, tab) != kMagic) return Fail("not a market recording (the first line does not start with MVREC)");
  if (!complete) return Fail("the header line is incomplete (the recording was cut off at its start)");
  fields_.clear();
  std::size_t from = tab + 1;
  while (tab != std::string::npos) {
    const std::size_t next = line.find('\t', from);
    fields_.push_back(line.substr(from, next == std::string::npos ? std::string::npos : next - from));
    if (next == std::string::npos) break;
    from = next + 1;
  }
  if (fields_.empty() || !ParseNumber(fields_[0], version_) || version_ < 1)
    return Fail("the format version " + Quoted(fields_.empty() ? "" : fields_[0]) + " is not a version number");
  if (version_ > kVersion) {
    error_ = path_ + ": a recording of format version " + std::to_string(version_) +
             ", newer than this terminal reads (version " + std::to_string(kVersion) +
             "); replay it with a newer terminal";
    return false;
  }
  bool date = false, start = false;
  for (std::size_t k = 1; k < fields_.size(); ++k) {
    const std::string& f = fields_[k];
    const std::size_t eq = f.find('=');
    if (eq == std::string::npos) return Fail("the header item " + Quoted(f) + " is not KEY=VALUE");
    const std::string key = f.substr(0, eq), value = f.substr(eq + 1);
    bool ok = true;
    if (key == "seed") ok = ParseNumber(value, session_.seed);
    else if (key == "instruments") ok = ParseNumber(value, session_.instruments) && session_.instruments >= 0;
    else if (key == "rate") ok = ParseNumber(value, session_.fieldUpdatesPerSecond) && session_.fieldUpdatesPerSecond >= 0;
    else if (key == "date") {
      ok = date = ValidDate(value);
      session_.date = value;
    } else if (key == "start") {
      ok = start = ParseClock(value, session_.startSeconds);
    }
    // Other keys are notes a later version 1 writer may add.
    if (!ok) return Fail("the header item " + Quoted(f) + " has a bad value");
  }
  if (!date) return Fail("the header names no trading day (date=YYYY-MM-DD)");
  if (!start) return Fail("the header names no start time (start=HH:MM:SS)");
  return true;
}

bool Reader::ParseReference() {
  std::set<std::pair<std::int64_t, std::string>> keys;
  auto count = [&](const char* what, std::size_t want) {
    if (fields_.size() == want + 1) return true;
    return Fail(std::string("a") + (what[0] == 'i' || what[0] == 'e' ? "n " : " ") + what + " line needs " +
                std::to_string(want) + " fields after its type, not " + std::to_string(fields_.size() - 1));
  };
  auto number = [&](std::size_t k, auto& out, const char* what) {
    if (ParseNumber(fields_[k], out)) return true;
    return Fail(std::string("the ") + what + " " + Quoted(fields_[k]) + " is not a number");
  };
  for (;;) {
    if (!ReadFields()) {
      if (!error_.empty()) return false;
      error_ = path_ + ": the recording ends at line " + std::to_string(line_) +
               " before its reference data is complete (no R line); it cannot be replayed";
      return false;
    }
    const std::string& type = fields_[0];
    if (type == "P") {
      if (!count("product", 4)) return false;
      JProduct p;
      if (!number(1, p.productId, "product id")) return false;
      p.productType = fields_[2];
      p.productName = fields_[3];
      p.pictureFile = fields_[4];
      ref_.products.push_back(std::move(p));
    } else if (type == "X") {
      if (!count("exchange", 4)) return false;
      JExchangeList e;
      e.exchangeCode = fields_[1];
      e.marketName = fields_[2];
      e.exchangeName = fields_[3];
      if (!number(4, e.productId, "product id")) return false;
      ref_.exchanges.push_back(std::move(e));
    } else if (type == "I") {
      if (!count("instrument", 19)) return false;
      JInstrumentUnderlying i;
      i.exchangeCode = fields_[1];
      i.instrumentCode = fields_[2];
      i.instrumentName = fields_[4];
      i.symbol = fields_[5];
      i.displayCode = fields_[7];
      i.sector = fields_[13];
      i.chartCode = fields_[16];
      i.currency = fields_[17];
      i.isin = fields_[18];
      i.productType = fields_[19];
      if (!number(3, i.productId, "product id") || !number(6, i.decimals, "decimals") ||
          !number(8, i.accessStatus, "access status") || !number(9, i.altAccessStatus, "access status") ||
          !number(10, i.lotSize, "lot size") || !number(11, i.maxQty1, "maximum quantity") ||
          !number(12, i.maxQty2, "maximum quantity") || !number(14, i.priceStepTableId, "price step table") ||
          !number(15, i.referencePrice, "reference price"))
        return false;
      if (i.instrumentCode.empty()) return Fail("an instrument line has no instrument code");
      if (!keys.insert({i.productId, i.instrumentCode}).second)
        return Fail("the instrument " + std::to_string(i.productId) + "/" + i.instrumentCode + " is listed twice");
      ref_.instruments.push_back(std::move(i));
    } else if (type == "R") {
      if (!count("R", 3)) return false;
      std::size_t p = 0, e = 0, n = 0;
      if (!number(1, p, "count") || !number(2, e, "count") || !number(3, n, "count")) return false;
      if (p != ref_.products.size() || e != ref_.exchanges.size() || n != ref_.instruments.size())
        return Fail("the R line counts " + std::to_string(p) + " products, " + std::to_string(e) + " exchanges and " +
                    std::to_string(n) + " instruments, but the file lists " + std::to_string(ref_.products.size()) +
                    ", " + std::to_string(ref_.exchanges.size()) + " and " + std::to_string(ref_.instruments.size()));
      return true;
    } else if (type == "V" || type == "D" || type == "E") {
      return Fail("a " + type + " line before the reference data is complete (no R line yet)");
    } else {
      return Fail("unknown line type " + Quoted(type));
    }
  }
}

Reader::Step Reader::Next(ValueEvent& e) {
  for (;;) {
    if (done_) return error_.empty() ? Step::End : Step::Error;
    if (!ReadFields()) {
      if (!error_.empty()) return Step::Error;
      done_ = true;
      if (!in_->cut.empty())
        warnings_.push_back(path_ + ": " + in_->cut + " (the recording was cut off after line " +
                            std::to_string(line_) + ")");
      if (!hasEnd_)
        warnings_.push_back(path_ + ": no end line (the terminal that wrote it did not close it); the replay ends "
                            "with the last event, " + std::to_string(lastTime_) + " ms into the session");
      return Step::End;
    }
    const std::string& type = fields_[0];
    if (hasEnd_) {
      Fail("a " + Quoted(type) + " line after the end line");
      return Step::Error;
    }
    if (type == "E") {
      std::uint64_t t = 0;
      if (fields_.size() != 2 || !ParseNumber(fields_[1], t)) {
        Fail("the end line must be \"E<TAB>milliseconds\"");
        return Step::Error;
      }
      if (t < lastTime_) {
        Fail("the end time " + std::to_string(t) + " is before the last event's " + std::to_string(lastTime_));
        return Step::Error;
      }
      hasEnd_ = true;
      endMs_ = t;
      continue;
    }
    if (type == "D") {
      if (!ParseDepth(e)) return Step::Error;
      return Step::Value;
    }
    if (type != "V") {
      Fail(type == "P" || type == "X" || type == "I" || type == "R"
               ? "a reference line (" + type + ") after the reference data was complete"
               : "unknown line type " + Quoted(type));
      return Step::Error;
    }
    if (fields_.size() != 7) {
      Fail("a value line needs 6 fields after its type (time, instrument, field, param, kind, value), not " +
           std::to_string(fields_.size() - 1));
      return Step::Error;
    }
    ValueEvent v;
    if (!ParseTime(fields_[1], v.timeMs) || !ParseInstrument(fields_[2], v.instrument)) return Step::Error;
    if (fields_[3].empty()) {
      Fail("the field name is empty");
      return Step::Error;
    }
    if (!ParseNumber(fields_[4], v.param)) {
      Fail("the param " + Quoted(fields_[4]) + " is not a whole number");
      return Step::Error;
    }
    if (!ParseNumber(fields_[5], v.kind) || v.kind < 0 || v.kind > 3) {
      Fail("the kind " + Quoted(fields_[5]) + " is not 0, 1, 2 or 3");
      return Step::Error;
    }
    v.field = std::move(fields_[3]);
    v.value = std::move(fields_[6]);
    lastTime_ = v.timeMs;
    e = std::move(v);
    return Step::Value;
  }
}

bool Reader::ParseTime(const std::string& text, std::uint64_t& out) {
  if (!ParseNumber(text, out)) return Fail("the time " + Quoted(text) + " is not a number of milliseconds");
  if (out < lastTime_)
    return Fail("the time " + text + " is before the previous event's " + std::to_string(lastTime_));
  return true;
}

bool Reader::ParseInstrument(const std::string& text, int& out) {
  if (ParseNumber(text, out) && out >= 0 && std::size_t(out) < ref_.instruments.size()) return true;
  return Fail("the instrument " + Quoted(text) + " is not one of the " + std::to_string(ref_.instruments.size()) +
              " recorded instruments (0 to " + std::to_string(std::int64_t(ref_.instruments.size()) - 1) + ")");
}

bool Reader::ParseDepth(ValueEvent& e) {
  if (fields_.size() < 6)
    return Fail("a depth line needs the time, instrument, field, first level and at least one value");
  ValueEvent v;
  v.depth = true;
  v.kind = 1;
  if (!ParseTime(fields_[1], v.timeMs) || !ParseInstrument(fields_[2], v.instrument)) return false;
  if (fields_[3].empty()) return Fail("the field name is empty");
  const std::size_t count = fields_.size() - 5;
  if (!ParseNumber(fields_[4], v.param) || v.param < 1 || std::size_t(v.param) - 1 + count > std::size_t(kMaxLevels))
    return Fail("the depth levels " + Quoted(fields_[4]) + " to " + std::to_string(count) +
                " values later are not within 1 to " + std::to_string(kMaxLevels));
  v.field = std::move(fields_[3]);
  v.levels.assign(std::make_move_iterator(fields_.begin() + 5), std::make_move_iterator(fields_.end()));
  lastTime_ = v.timeMs;
  e = std::move(v);
  return true;
}

bool Scan(const std::string& path, Summary& out, std::string& error) {
  Reader r;
  if (!r.Open(path, error)) return false;
  out = Summary{};
  out.path = path;
  ValueEvent e;
  for (;;) {
    const Reader::Step s = r.Next(e);
    if (s == Reader::Step::Error) {
      error = r.Error();
      return false;
    }
    if (s == Reader::Step::End) break;
    ++out.values;
  }
  out.session = r.Session();
  out.reference = r.Ref();
  out.closed = r.HasEndMark();
  out.endMs = r.HasEndMark() ? r.EndMark() : r.LastTime();
  out.warnings = r.Warnings();
  return true;
}

}  // namespace term::rec
