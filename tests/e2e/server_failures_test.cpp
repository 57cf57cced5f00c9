// Real servers that go wrong or come in numbers: one killed mid-session, a command that
// does not exist, two servers at once, and a server started again after its exit.
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

TEST(ServerFailures, AServerKilledMidSessionGivesEmptyResultsAtOnce) {
  Project project = Cpp();
  xServerStart start = StartRecord(project, "killed");
  start.timeout = 60000;  // a wait for the dead server would be unmistakable
  xLanguageServer* server = Vexil_Start(start);
  ASSERT_TRUE(server->Start(InitRecord(project)));
  Open(*server, project, "main.cpp");
  EXPECT_NE(HoverText(*server, project, "main.cpp", "shapes::Clamp(", 8).find("Clamp"), std::string::npos);

  ASSERT_TRUE(Kill(*server));
  auto before = std::chrono::steady_clock::now();
  EXPECT_EQ(HoverText(*server, project, "main.cpp", "shapes::Clamp(", 8), "");
  EXPECT_LT(std::chrono::steady_clock::now() - before, 6s);
  EXPECT_TRUE(server->HaveErrors());
  EXPECT_STREQ(server->ErrorMessage(), "A server read was requested but the server is not running.");
  EXPECT_TRUE(server->Shutdown());
  EXPECT_TRUE(server->Exit());
  EXPECT_EQ(Vexil_Have("killed"), nullptr);
}

TEST(ServerFailures, AMissingServerCommandFailsToStartAndExitsCleanly) {
  Project project = Cpp();
  project.executable = "vexil-no-such-language-server";
  int errorsBefore = ErrorLines::Count();
  xLanguageServer* server = Vexil_Start(StartRecord(project, "missing"));
  EXPECT_FALSE(server->Start(InitRecord(project)));
  EXPECT_FALSE(server->IsRunning());
  EXPECT_EQ(server->Id(), -1);
  EXPECT_GT(ErrorLines::Count(), errorsBefore);
  EXPECT_TRUE(server->Exit());
  EXPECT_EQ(Vexil_Have("missing"), nullptr);
}

TEST(ServerFailures, TwoServersAtOnceEachAnswerForTheirOwnProject) {
  Project cpp = Cpp();
  Project python = Python();
  xLanguageServer* clangd = Vexil_Start(StartRecord(cpp, "both-clangd"));
  xLanguageServer* pylsp = Vexil_Start(StartRecord(python, "both-pylsp"));
  ASSERT_NE(clangd, pylsp);
  ASSERT_TRUE(clangd->Start(InitRecord(cpp)));
  ASSERT_TRUE(pylsp->Start(InitRecord(python)));
  Open(*clangd, cpp, "main.cpp");
  Open(*pylsp, python, "main.py");
  for (int round = 0; round < 2; ++round) {
    EXPECT_NE(HoverText(*clangd, cpp, "main.cpp", "shapes::Clamp(", 8).find("int Clamp(int value, int low, int high)"),
              std::string::npos);
    EXPECT_NE(HoverText(*pylsp, python, "main.py", "print(clamp(", 6).find("clamp(value, low, high)"), std::string::npos);
  }
  EXPECT_TRUE(pylsp->Shutdown());
  EXPECT_TRUE(Exits(*pylsp));
  EXPECT_EQ(HoverText(*clangd, cpp, "main.cpp", "Report(rectangle)", 0).find("function Report"), 0u);
  EXPECT_TRUE(clangd->Shutdown());
  EXPECT_TRUE(Exits(*clangd));
}

TEST(ServerFailures, AServerStartsAgainUnderItsNameAfterExit) {
  Project project = Cpp();
  for (int life = 0; life < 2; ++life) {
    xLanguageServer* server = Vexil_Start(StartRecord(project, "again"));
    ASSERT_EQ(Vexil_Have("again"), server);
    ASSERT_TRUE(server->Start(InitRecord(project))) << "life " << life;
    Open(*server, project, "main.cpp");
    EXPECT_NE(HoverText(*server, project, "main.cpp", "shapes::Clamp(", 8).find("function Clamp"), std::string::npos);
    EXPECT_TRUE(server->Shutdown());
    EXPECT_TRUE(Exits(*server));
    EXPECT_EQ(Vexil_Have("again"), nullptr);
  }
}

}  // namespace
