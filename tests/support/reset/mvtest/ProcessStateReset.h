#pragma once
// Include in one source file of a suite that links the stores: every test
// starts and ends with the process-wide stores, registries, tables and
// first-time flags as a new process has them (data/ProcessState.h), so the
// suite binary run as one process gives the same answer as one process per
// test. Views must be gone by the end of the test (fixtures destroy theirs).
#include <gtest/gtest.h>

#include "data/ProcessState.h"

namespace mvtest {

class ProcessStateReset : public ::testing::EmptyTestEventListener {
 public:
  void OnTestStart(const ::testing::TestInfo&) override { mvd::ResetProcessStateForTests(); }
  void OnTestEnd(const ::testing::TestInfo&) override { mvd::ResetProcessStateForTests(); }
};

inline const bool kProcessStateResetInstalled = [] {
  ::testing::UnitTest::GetInstance()->listeners().Append(new ProcessStateReset);
  return true;
}();

}  // namespace mvtest
