#pragma once
// Temporary files and small recordings for the replay tests.
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "terminal/host/MarketRecording.h"

namespace fs = std::filesystem;

struct TempDir {
  fs::path path;
  TempDir() {
    std::string tmpl = (fs::temp_directory_path() / "replay_test_XXXXXX").string();
    path = mkdtemp(tmpl.data());
  }
  ~TempDir() { fs::remove_all(path); }
  std::string File(const std::string& name) const { return (path / name).string(); }
};

inline void WriteFile(const std::string& path, const std::string& bytes) {
  std::ofstream f(path, std::ios::binary | std::ios::trunc);
  f << bytes;
}

inline std::string ReadFile(const std::string& path) {
  std::ifstream f(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(f), {});
}

// Two instruments on one exchange of one product.
inline term::rec::Reference SmallReference() {
  term::rec::Reference r;
  r.products = {{101, "ES", "Equities", ".\\images\\Products\\ES.bmp"}};
  r.exchanges = {{"SGX", "SGX", "Singapore Exchange", 101}};
  JInstrumentUnderlying a;
  a.exchangeCode = "SGX";
  a.instrumentCode = "AAA";
  a.productId = 101;
  a.instrumentName = "Alpha Holdings";
  a.symbol = "AAA";
  a.decimals = 3;
  a.displayCode = "AAA";
  a.lotSize = 100;
  a.sector = "Finance";
  a.referencePrice = 1.5;
  a.chartCode = "AAA.SI";
  a.currency = "SGD";
  a.productType = "ES";
  JInstrumentUnderlying b = a;
  b.instrumentCode = b.symbol = b.displayCode = "BBB";
  b.instrumentName = "Beta Ltd";
  b.chartCode = "BBB.SI";
  r.instruments = {a, b};
  return r;
}

inline term::SessionInfo SmallSession() {
  term::SessionInfo s;
  s.date = "2026-12-07";
  s.startSeconds = 10 * 3600 + 30 * 60;
  s.seed = 7;
  s.instruments = 2;
  s.fieldUpdatesPerSecond = 100;
  return s;
}

// Writes a recording of SmallReference with `values`, ended at `endMs`
// (no end line when `endMs` is negative).
inline void WriteRecording(const std::string& path, const std::vector<term::rec::ValueEvent>& values,
                           long long endMs) {
  term::rec::Writer w;
  std::string error;
  if (!w.Open(path, error)) return;
  const term::rec::Reference r = SmallReference();
  w.Begin(SmallSession(), r.products, r.exchanges, r.instruments);
  for (const auto& v : values) w.Value(v.timeMs, v.instrument, v.field, v.param, v.kind, v.value);
  if (endMs >= 0) w.Finish(std::uint64_t(endMs));
}
