// The server registry behind Vexil_Have and Vexil_Start: lookup without insertion, one
// connection per exact name, removal on Exit, and the empty name's odd removal.
#include <gtest/gtest.h>

#include "client/language_server.h"
#include "host/server_registry.h"

namespace {

xServerStart Named(const std::string& name) {
  xServerStart start;
  start.executable = "never-launched";
  start.name = name;
  return start;
}

TEST(ConnectionRegistry, NamesFindOrCreateExactlyOneConnectionAndExitRemovesIt) {
  std::size_t before = vexil::RegisteredServers();
  EXPECT_EQ(Vexil_Have("clangd"), nullptr);
  EXPECT_EQ(vexil::RegisteredServers(), before);

  xLanguageServer* lower = Vexil_Start(Named("clangd"));
  EXPECT_EQ(Vexil_Start(Named("clangd")), lower);
  EXPECT_EQ(Vexil_Have("clangd"), lower);
  xLanguageServer* upper = Vexil_Start(Named("Clangd"));
  EXPECT_NE(upper, lower);
  EXPECT_EQ(vexil::RegisteredServers(), before + 2);

  EXPECT_TRUE(lower->Exit());
  EXPECT_EQ(Vexil_Have("clangd"), nullptr);
  EXPECT_EQ(Vexil_Have("Clangd"), upper);
  xLanguageServer* again = Vexil_Start(Named("clangd"));
  EXPECT_EQ(Vexil_Have("clangd"), again);
  EXPECT_TRUE(again->Exit());
  EXPECT_TRUE(upper->Exit());
  EXPECT_EQ(vexil::RegisteredServers(), before);

  // A connection made outside the registry removes the empty name when it exits.
  xLanguageServer* unnamed = Vexil_Start(Named(""));
  EXPECT_EQ(Vexil_Have(""), unnamed);
  auto* stray = new LSP::LanguageServer(Named("stray"));
  EXPECT_TRUE(stray->Exit());
  EXPECT_EQ(Vexil_Have(""), nullptr);
  EXPECT_TRUE(unnamed->Exit());  // removes nothing more, frees the connection
  EXPECT_EQ(vexil::RegisteredServers(), before);
}

}  // namespace
