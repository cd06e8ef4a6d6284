// The add-on offers the terminal one entry and nothing else.
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <set>
#include <sstream>
#include <string>

#include "mvtest/ScriptedHost.h"

namespace {

std::set<std::string> DefinedDynamicSymbols(const std::string& library) {
  std::set<std::string> symbols;
  const std::string command = "nm -D --defined-only '" + library + "' 2>&1";
  FILE* pipe = popen(command.c_str(), "r");
  if (!pipe) return symbols;
  char line[4096];
  while (std::fgets(line, sizeof line, pipe)) {
    std::istringstream in(line);
    std::string address, type, name;
    if (in >> address >> type >> name) symbols.insert(name);
  }
  pclose(pipe);
  return symbols;
}

TEST(AddonExports_SymbolList, OnlyGetBaseViewPointerUnmangled) {
  const std::string library = mvtest::AddonLibrary::Get().Path();
  ASSERT_TRUE(mvtest::AddonLibrary::Get().Loaded()) << library << ": " << mvtest::AddonLibrary::Get().Error();
  if (std::system("nm --version >/dev/null 2>&1") != 0) GTEST_SKIP() << "nm is not installed";
  EXPECT_EQ(DefinedDynamicSymbols(library), std::set<std::string>{"GetBaseViewPointer"});
}

}  // namespace
