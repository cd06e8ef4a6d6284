// The recording file: what is written reads back exactly; damaged, cut-off
// and newer files are refused or trimmed with the line and the reason.
#include <gtest/gtest.h>

#include <functional>

#include "ReplayFixture.h"

using term::rec::Reader;
using term::rec::Summary;
using term::rec::ValueEvent;

namespace {

// A small valid recording as plain text, one entry per line.
std::vector<std::string> ValidLines() {
  return {
      "MVREC\t1\tseed=7\tinstruments=2\trate=100\tdate=2026-12-07\tstart=10:30:00",
      "# a comment",
      "P\t101\tES\tEquities\t",
      "X\tSGX\tSGX\tSingapore Exchange\t101",
      "I\tSGX\tAAA\t101\tAlpha\tAAA\t3\tAAA\t3\t3\t100\t0\t0\tFIN\t0\t1.5\tAAA.SI\tSGD\t\tES",
      "I\tSGX\tBBB\t101\tBeta\tBBB\t3\tBBB\t3\t3\t100\t0\t0\tFIN\t0\t2.5\tBBB.SI\tSGD\t\tES",
      "R\t1\t1\t2",
      "V\t0\t0\tBID\t0\t0\t1.500",
      "V\t50\t1\tLAST\t0\t0\t2.500",
      "V\t50\t0\tTRADEDATA\t99998\t2\t20261207103000|1.500|100|1||1",
      "E\t100",
  };
}

std::string Join(const std::vector<std::string>& lines) {
  std::string out;
  for (const auto& l : lines) out += l + "\n";
  return out;
}

std::vector<ValueEvent> ReadAll(const std::string& path, Reader& r, std::string& error) {
  std::vector<ValueEvent> out;
  if (!r.Open(path, error)) return out;
  ValueEvent e;
  while (r.Next(e) == Reader::Step::Value) out.push_back(e);
  error = r.Error();
  return out;
}

}  // namespace

TEST(RecordingFile, WhatIsWrittenReadsBackExactly) {
  TempDir dir;
  const std::string path = dir.File("session.mvrec");
  term::rec::Reference ref = SmallReference();
  // Texts a file format could trip over.
  ref.instruments[0].instrumentName = "Alpha\tHoldings\nLine\\two \xC3\x9C";
  ref.instruments[1].referencePrice = 0.1 + 0.2;
  ref.products[0].pictureFile = ".\\images\\Products\\ES.bmp";
  const std::vector<ValueEvent> values = {
      {0, 0, "BID", 0, 0, "1.500"},
      {0, 0, "BUY", 3, 1, ""},
      {50, 1, "TRADEDATA", 99998, 2, "20261207103001|2.500|100|1||7;20261207103000|2.490|300|2||6"},
      {50, 1, "REMARKS", 0, 0, "tab\there\nand a\\backslash\r"},
      {1200, 0, "WEIGHTED_AVG", 0, 3, "1.5000"},
  };
  {
    term::rec::Writer w;
    std::string error;
    ASSERT_TRUE(w.Open(path, error)) << error;
    w.Begin(SmallSession(), ref.products, ref.exchanges, ref.instruments);
    for (const auto& v : values) w.Value(v.timeMs, v.instrument, v.field, v.param, v.kind, v.value);
    EXPECT_EQ(w.Values(), values.size());
    ASSERT_TRUE(w.Finish(1500)) << w.Error();
  }
  EXPECT_EQ(ReadFile(path).substr(0, 4), "\x28\xb5\x2f\xfd") << "the file is zstd-compressed";

  Reader r;
  std::string error;
  const std::vector<ValueEvent> read = ReadAll(path, r, error);
  ASSERT_TRUE(error.empty()) << error;
  EXPECT_EQ(r.Version(), 1);
  EXPECT_EQ(r.Session().date, "2026-12-07");
  EXPECT_EQ(r.Session().startSeconds, 10 * 3600 + 30 * 60);
  EXPECT_EQ(r.Session().seed, 7u);
  EXPECT_EQ(r.Session().fieldUpdatesPerSecond, 100);
  ASSERT_EQ(r.Ref().products.size(), 1u);
  EXPECT_EQ(r.Ref().products[0].pictureFile, ref.products[0].pictureFile);
  EXPECT_EQ(r.Ref().exchanges[0].exchangeName, "Singapore Exchange");
  ASSERT_EQ(r.Ref().instruments.size(), 2u);
  const auto& a = r.Ref().instruments[0];
  EXPECT_EQ(a.instrumentName, ref.instruments[0].instrumentName);
  EXPECT_EQ(a.decimals, 3);
  EXPECT_EQ(a.lotSize, 100);
  EXPECT_EQ(a.sector, "Finance");
  EXPECT_EQ(a.chartCode, "AAA.SI");
  EXPECT_EQ(a.productType, "ES");
  EXPECT_EQ(r.Ref().instruments[1].referencePrice, 0.1 + 0.2) << "prices keep every bit";
  ASSERT_EQ(read.size(), values.size());
  for (std::size_t k = 0; k < values.size(); ++k) {
    SCOPED_TRACE(k);
    EXPECT_EQ(read[k].timeMs, values[k].timeMs);
    EXPECT_EQ(read[k].instrument, values[k].instrument);
    EXPECT_EQ(read[k].field, values[k].field);
    EXPECT_EQ(read[k].param, values[k].param);
    EXPECT_EQ(read[k].kind, values[k].kind);
    EXPECT_EQ(read[k].value, values[k].value);
  }
  EXPECT_TRUE(r.HasEndMark());
  EXPECT_EQ(r.EndMark(), 1500u);
  EXPECT_TRUE(r.Warnings().empty());

  // The same file as plain text (unpacked, perhaps edited) replays too.
  const std::string plain = dir.File("plain.txt");
  WriteFile(plain, Join(ValidLines()));
  Summary s;
  ASSERT_TRUE(term::rec::Scan(plain, s, error)) << error;
  EXPECT_EQ(s.values, 3u);
  EXPECT_EQ(s.endMs, 100u);
  EXPECT_TRUE(s.closed);
  EXPECT_EQ(s.reference.instruments.size(), 2u);
}

// Each case breaks the valid recording in one place; the refusal names the
// file, the line and the reason.
TEST(RecordingFile, BadFilesAreRefusedWithTheLineAndTheReason) {
  struct Case {
    const char* what;
    std::function<void(std::vector<std::string>&)> damage;
    int line;  // 0: the message names no line
    const char* reason;
  };
  const std::vector<Case> cases = {
      {"not a recording", [](auto& l) { l[0] = "date,price,volume"; }, 1, "not a market recording"},
      {"version not a number", [](auto& l) { l[0] = "MVREC\tone\tdate=2026-12-07\tstart=10:30:00"; }, 1,
       "format version \"one\" is not a version number"},
      {"no trading day", [](auto& l) { l[0] = "MVREC\t1\tstart=10:30:00"; }, 1, "names no trading day"},
      {"bad header value", [](auto& l) { l[0] += "\tseed=lots"; }, 1, "\"seed=lots\" has a bad value"},
      {"bad start time", [](auto& l) { l[0] = "MVREC\t1\tdate=2026-12-07\tstart=25:00:00"; }, 1,
       "\"start=25:00:00\" has a bad value"},
      {"short instrument line", [](auto& l) { l[4] = "I\tSGX\tAAA\t101\tAlpha"; }, 5,
       "an instrument line needs 19 fields after its type, not 4"},
      {"product id not a number", [](auto& l) { l[2] = "P\tES\tES\tEquities\t"; }, 3,
       "the product id \"ES\" is not a number"},
      {"instrument twice", [](auto& l) { l[5] = l[4]; }, 6, "the instrument 101/AAA is listed twice"},
      {"counts differ", [](auto& l) { l[6] = "R\t1\t1\t3"; }, 7, "counts 1 products, 1 exchanges and 3 instruments"},
      {"values before the reference is complete", [](auto& l) { l.erase(l.begin() + 6); }, 7,
       "a V line before the reference data is complete"},
      {"reference data cut", [](auto& l) { l.resize(5); }, 0, "before its reference data is complete"},
      {"unknown line type", [](auto& l) { l.insert(l.begin() + 8, "Q\t50\tx"); }, 9, "unknown line type \"Q\""},
      {"unknown escape", [](auto& l) { l[7] = "V\t0\t0\tBID\t0\t0\t1\\x5"; }, 8, "unknown escape \"\\x\""},
      {"time going back", [](auto& l) { l[9] = "V\t20\t0\tBID\t0\t0\t1.490"; }, 10,
       "the time 20 is before the previous event's 50"},
      {"unknown instrument", [](auto& l) { l[8] = "V\t50\t2\tLAST\t0\t0\t2.500"; }, 9,
       "the instrument \"2\" is not one of the 2 recorded instruments"},
      {"bad kind", [](auto& l) { l[8] = "V\t50\t1\tLAST\t0\t7\t2.500"; }, 9, "the kind \"7\" is not 0, 1, 2 or 3"},
      {"missing value", [](auto& l) { l[8] = "V\t50\t1\tLAST\t0\t0"; }, 9, "a value line needs 6 fields"},
      {"time not a number", [](auto& l) { l[8] = "V\t5s\t1\tLAST\t0\t0\t2.5"; }, 9,
       "the time \"5s\" is not a number of milliseconds"},
      {"text after the end", [](auto& l) { l.push_back("V\t100\t0\tBID\t0\t0\t1.6"); }, 12,
       "a \"V\" line after the end line"},
      {"end before the last event", [](auto& l) { l[10] = "E\t10"; }, 11, "the end time 10 is before"},
  };
  TempDir dir;
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    std::vector<std::string> lines = ValidLines();
    c.damage(lines);
    const std::string path = dir.File("bad.mvrec");
    WriteFile(path, Join(lines));
    Summary s;
    std::string error;
    EXPECT_FALSE(term::rec::Scan(path, s, error));
    const std::string where = c.line ? path + ":" + std::to_string(c.line) + ": " : path + ": ";
    EXPECT_EQ(error.rfind(where, 0), 0u) << error;
    EXPECT_NE(error.find(c.reason), std::string::npos) << error;
  }
  Summary s;
  std::string error;
  WriteFile(dir.File("empty"), "");
  EXPECT_FALSE(term::rec::Scan(dir.File("empty"), s, error));
  EXPECT_NE(error.find("the file is empty"), std::string::npos) << error;
  EXPECT_FALSE(term::rec::Scan(dir.File("missing"), s, error));
  EXPECT_NE(error.find("cannot open the recording " + dir.File("missing")), std::string::npos) << error;
}

TEST(RecordingFile, ANewerVersionIsRefusedByName) {
  TempDir dir;
  std::vector<std::string> lines = ValidLines();
  lines[0] = "MVREC\t2\tdate=2026-12-07\tstart=10:30:00\tsomething=new";
  lines.insert(lines.begin() + 1, "K\tkinds of lines version 1 does not know");
  const std::string path = dir.File("next.mvrec");
  WriteFile(path, Join(lines));
  Summary s;
  std::string error;
  EXPECT_FALSE(term::rec::Scan(path, s, error));
  EXPECT_EQ(error, path + ": a recording of format version 2, newer than this terminal reads (version 1); "
                          "replay it with a newer terminal");
}

TEST(RecordingFile, ACutOffLastLineIsDroppedWithAWarning) {
  TempDir dir;
  // Plain text: the last line lacks its line feed (and the end line is missing).
  std::vector<std::string> lines = ValidLines();
  lines.pop_back();
  std::string text = Join(lines) + "V\t60\t0\tBID\t0\t0\t1.5";
  const std::string path = dir.File("cut.txt");
  WriteFile(path, text);
  Summary s;
  std::string error;
  ASSERT_TRUE(term::rec::Scan(path, s, error)) << error;
  EXPECT_EQ(s.values, 3u) << "the incomplete line is not played";
  EXPECT_FALSE(s.closed);
  EXPECT_EQ(s.endMs, 50u) << "without an end line the replay ends with the last event";
  ASSERT_EQ(s.warnings.size(), 2u);
  EXPECT_EQ(s.warnings[0], path + ":11: the last line is incomplete (the recording was cut off); it is dropped");
  EXPECT_NE(s.warnings[1].find("no end line"), std::string::npos) << s.warnings[1];
}

TEST(RecordingFile, ACompressedRecordingCutAnywhereAfterItsReferenceKeepsAPrefixOfItsValues) {
  TempDir dir;
  const std::string full = dir.File("full.mvrec");
  std::vector<ValueEvent> values;
  for (int k = 0; k < 3000; ++k)
    values.push_back({std::uint64_t(k / 10) * 50, k % 2, k % 3 ? "BID" : "TRADEDATA", k % 3 ? 0 : 99998, k % 3 ? 0 : 2,
                      std::to_string(1000 + k * 7) + (k % 3 ? "" : "|a page of trades that repeats|" + std::to_string(k))});
  std::size_t referenceBytes = 0;
  {
    term::rec::Writer w;
    std::string error;
    ASSERT_TRUE(w.Open(full, error));
    const term::rec::Reference r = SmallReference();
    w.Begin(SmallSession(), r.products, r.exchanges, r.instruments);
    referenceBytes = fs::file_size(full);  // Begin puts the reference data in the file at once
    for (std::size_t k = 0; k < values.size(); ++k) {
      const auto& v = values[k];
      w.Value(v.timeMs, v.instrument, v.field, v.param, v.kind, v.value);
      if (k % 500 == 499) {
        ASSERT_TRUE(w.Flush());
      }
    }
    ASSERT_TRUE(w.Finish(20000));
  }
  const std::string bytes = ReadFile(full);
  ASSERT_GT(referenceBytes, 0u);
  ASSERT_LT(referenceBytes, bytes.size());
  for (int cut = 1; cut <= 12; ++cut) {
    const std::size_t size = referenceBytes + (bytes.size() - referenceBytes) * std::size_t(cut) / 13;
    SCOPED_TRACE("cut at byte " + std::to_string(size) + " of " + std::to_string(bytes.size()));
    const std::string path = dir.File("cut.mvrec");
    WriteFile(path, bytes.substr(0, size));
    Reader r;
    std::string error;
    const std::vector<ValueEvent> read = ReadAll(path, r, error);
    ASSERT_TRUE(error.empty()) << error;
    ASSERT_LE(read.size(), values.size());
    for (std::size_t k = 0; k < read.size(); ++k) ASSERT_EQ(read[k].value, values[k].value) << k;
    EXPECT_FALSE(r.Warnings().empty()) << "a cut-off recording is reported";
  }
  // Data damaged in the middle of the compressed stream is refused.
  std::string damaged = bytes;
  for (std::size_t k = bytes.size() / 2; k < bytes.size() / 2 + 64; ++k) damaged[k] = char(damaged[k] ^ 0x5A);
  WriteFile(dir.File("damaged.mvrec"), damaged);
  Summary s;
  std::string error;
  EXPECT_FALSE(term::rec::Scan(dir.File("damaged.mvrec"), s, error));
  EXPECT_EQ(error.rfind(dir.File("damaged.mvrec") + ":", 0), 0u) << error;
}

TEST(RecordingFile, AWriterThatCannotWriteSaysWhy) {
  TempDir dir;
  term::rec::Writer w;
  std::string error;
  EXPECT_FALSE(w.Open(dir.File("no/such/folder/x.mvrec"), error));
  EXPECT_NE(error.find("cannot create the recording " + dir.File("no/such/folder/x.mvrec")), std::string::npos)
      << error;
  if (!fs::exists("/dev/full")) GTEST_SKIP() << "no /dev/full here";
  term::rec::Writer full;
  ASSERT_TRUE(full.Open("/dev/full", error)) << error;
  const term::rec::Reference r = SmallReference();
  full.Begin(SmallSession(), r.products, r.exchanges, r.instruments);
  EXPECT_FALSE(full.Flush());
  EXPECT_FALSE(full.Ok());
  EXPECT_NE(full.Error().find("writing the recording /dev/full failed"), std::string::npos) << full.Error();
  full.Value(0, 0, "BID", 0, 0, "1");  // ignored once failed
  EXPECT_FALSE(full.Finish(10));
}
