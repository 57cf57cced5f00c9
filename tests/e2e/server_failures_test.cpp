// Real servers that go wrong or come in numbers: a command that does not exist next to two
// servers at once, one started again after its exit and one killed mid-session.
#include <gtest/gtest.h>

#include "e2e_support.h"

namespace {

using namespace e2e;
using namespace std::chrono_literals;

std::string HoverText(xLanguageServer& server, const Project& project, const std::string& file,
                      const std::string& needle, std::size_t offset) {
  auto at = At(project, file, Find(project, file, needle, offset));
  return server.TextDocument_Hover(&at).contents.value;
}

// Servers at once each answer for their own project: one whose command does not exist fails
// to start and leaves cleanly, pylsp ends and starts again under its name while clangd goes
// on, and clangd, killed, then gives empty results at once.
TEST(ServerFailures, ServersAnswerForTheirOwnProjectsThroughAMissingCommandARestartAndAKill) {
  Project cpp = Cpp();
  Project python = Python();
  xServerStart start = StartRecord(cpp, "both-clangd");
  start.timeout = 60000;  // a wait for the dead server would be unmistakable
  xLanguageServer* clangd = Vexil_Start(start);
  ASSERT_TRUE(clangd->Start(InitRecord(cpp)));
  Open(*clangd, cpp, "main.cpp");

  Project nowhere = Cpp();
  nowhere.executable = "vexil-no-such-language-server";
  const std::size_t errorsBefore = vexil_test::TraceLog::Texts("Error").size();
  xLanguageServer* missing = Vexil_Start(StartRecord(nowhere, "missing"));
  EXPECT_FALSE(missing->Start(InitRecord(nowhere)));
  EXPECT_FALSE(missing->IsRunning());
  EXPECT_EQ(missing->Id(), -1);
  EXPECT_GT(vexil_test::TraceLog::Texts("Error").size(), errorsBefore);
  EXPECT_TRUE(missing->Exit());
  EXPECT_EQ(Vexil_Have("missing"), nullptr);

  for (int life = 0; life < 2; ++life) {
    SCOPED_TRACE("life " + std::to_string(life));
    xLanguageServer* pylsp = Vexil_Start(StartRecord(python, "both-pylsp"));
    ASSERT_NE(clangd, pylsp);
    ASSERT_EQ(Vexil_Have("both-pylsp"), pylsp);
    ASSERT_TRUE(pylsp->Start(InitRecord(python)));
    Open(*pylsp, python, "main.py");
    ExpectHas(HoverText(*clangd, cpp, "main.cpp", "shapes::Clamp(", 8), {"int Clamp(int value, int low, int high)"});
    ExpectHas(HoverText(*pylsp, python, "main.py", "print(clamp(", 6),
              {"clamp(value, low, high)", "Limit value to the range from low to high."});
    ShutDownAndExit(*pylsp, "both-pylsp");
  }
  EXPECT_EQ(HoverText(*clangd, cpp, "main.cpp", "Report(rectangle)", 0).find("function Report"), 0u);

  ASSERT_TRUE(Kill(*clangd));
  auto before = std::chrono::steady_clock::now();
  EXPECT_EQ(HoverText(*clangd, cpp, "main.cpp", "shapes::Clamp(", 8), "");
  EXPECT_LT(std::chrono::steady_clock::now() - before, 6s);
  EXPECT_TRUE(clangd->HaveErrors());
  EXPECT_STREQ(clangd->ErrorMessage(), "A server read was requested but the server is not running.");
  EXPECT_TRUE(clangd->Shutdown());
  EXPECT_TRUE(clangd->Exit());
  EXPECT_EQ(Vexil_Have("both-clangd"), nullptr);
}

}  // namespace
