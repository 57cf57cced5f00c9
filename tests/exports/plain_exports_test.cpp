// Every plain export of the public headers is found by its undecorated name in the
// loaded library, and the language-server pair works when called through those pointers.
#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

#include "library_loader.h"
#include "vexil/host/language_server.h"

namespace {

using namespace exports_test;

std::vector<std::string> PlainExports() {
  std::vector<std::string> names;
  std::istringstream list(VEXIL_PLAIN_EXPORTS);
  for (std::string name; std::getline(list, name, ',');) names.push_back(name);
  return names;
}

TEST(PlainExports, EveryOneIsFoundByNameAndTheServerPairWorksThroughThem) {
  std::vector<std::string> names = PlainExports();
  for (const char* required : {"Vexil_Have", "Vexil_Start", "xWatcher_Workspace", "xWatcher_WorkspaceEx"}) {
    EXPECT_NE(std::find(names.begin(), names.end(), required), names.end()) << required;
  }
  std::string error;
  void* library = LoadLibraryAt(VEXIL_LIBRARY, error);
  ASSERT_NE(library, nullptr) << error;
  for (const std::string& name : names) EXPECT_NE(FindSymbol(library, name), nullptr) << name;

  auto start = reinterpret_cast<decltype(&Vexil_Start)>(FindSymbol(library, "Vexil_Start"));
  auto have = reinterpret_cast<decltype(&Vexil_Have)>(FindSymbol(library, "Vexil_Have"));
  ASSERT_TRUE(start && have);
  xServerStart record;
  record.name = "loaded by name";
  xLanguageServer* server = start(record);
  EXPECT_EQ(have("loaded by name"), server);
  EXPECT_TRUE(server->Exit());
  EXPECT_EQ(have("loaded by name"), nullptr);
  UnloadLibrary(library);
}

}  // namespace
