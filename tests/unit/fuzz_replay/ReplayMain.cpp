// Replays a harness's seed corpus through the same entry point as the fuzzer,
// compiled as a plain test (no clang needed): each seed must pass.
#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

#ifndef MV_CORPUS_DIR
#error "MV_CORPUS_DIR names the seed folder"
#endif

TEST(FuzzSeeds, EverySeedPassesTheHarness) {
  int seeds = 0;
  for (const auto& entry : std::filesystem::directory_iterator(MV_CORPUS_DIR)) {
    std::ifstream in(entry.path(), std::ios::binary);
    const std::vector<char> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    SCOPED_TRACE(entry.path().string());
    EXPECT_EQ(LLVMFuzzerTestOneInput(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()), 0);
    ++seeds;
  }
  EXPECT_GT(seeds, 0);
}
