#include "data/ProcessState.h"

#include <vector>

namespace mvd {
namespace {
std::vector<void (*)()>& Resets() {
  static std::vector<void (*)()> resets;
  return resets;
}
}  // namespace

bool OnResetForTests(void (*reset)()) {
  if (reset) Resets().push_back(reset);
  return true;
}

void ResetProcessStateForTests() {
  for (auto* reset : Resets()) reset();
}

}  // namespace mvd
