// Every plain export of the public headers is found by its undecorated name in the library
// loaded at run time (dlopen or LoadLibrary, through Poco), as a host that loads modules
// does, and the language-server pair works when called through those pointers.
#include <Poco/SharedLibrary.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

#include "vexil/host/language_server.h"

namespace {

TEST(PlainExports, EveryOneIsFoundByNameAndTheServerPairWorksThroughThem) {
  std::vector<std::string> names;
  std::istringstream list(VEXIL_PLAIN_EXPORTS);
  for (std::string name; std::getline(list, name, ',');) names.push_back(name);
  for (const char* required : {"Vexil_Have", "Vexil_Start", "xWatcher_Workspace", "xWatcher_WorkspaceEx"}) {
    EXPECT_NE(std::find(names.begin(), names.end(), required), names.end()) << required;
  }
  Poco::SharedLibrary library(VEXIL_LIBRARY, Poco::SharedLibrary::SHLIB_LOCAL);
  for (const std::string& name : names) EXPECT_TRUE(library.hasSymbol(name)) << name;

  auto start = reinterpret_cast<decltype(&Vexil_Start)>(library.getSymbol("Vexil_Start"));
  auto have = reinterpret_cast<decltype(&Vexil_Have)>(library.getSymbol("Vexil_Have"));
  xServerStart record;
  record.name = "loaded by name";
  xLanguageServer* server = start(record);
  EXPECT_EQ(have("loaded by name"), server);
  EXPECT_TRUE(server->Exit());
  EXPECT_EQ(have("loaded by name"), nullptr);
  library.unload();
}

}  // namespace
