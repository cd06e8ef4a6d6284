#pragma once
// The process-wide pieces (stores, registries, tables, first-time flags) live
// from first use to the end of the process. Tests start each case as a new
// process would: every piece registers, when it is made, how it returns to its
// first-use state, and ResetProcessStateForTests runs them all. The add-on
// never calls it. UI thread only.
//
//   Store& TheStore() {
//     static Store s;
//     static const bool hook = mvd::OnResetForTests([] { s.ResetForTests(); });
//     (void)hook;
//     return s;
//   }
namespace mvd {

// Registers `reset` (run by ResetProcessStateForTests); returns true.
bool OnResetForTests(void (*reset)());
// Runs every registered reset, in the order registered.
void ResetProcessStateForTests();

}  // namespace mvd
