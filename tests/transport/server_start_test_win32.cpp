// Launching the server on Windows: directly and through cmd.exe in its working directory,
// and what fails a launch here, with the system's own reason text.
#include <gtest/gtest.h>
#include <windows.h>

#include <filesystem>
#include <string>

#include "transport_test_support.h"

namespace {

using namespace transport_test;

// The build knows the fake by a path with forward slashes (a Unix one under wine), which
// cmd.exe would read as switches: hand it over in the system's own form.
std::string FakeServerPath() {
  char buffer[MAX_PATH];
  const DWORD size = GetFullPathNameA(VEXIL_FAKE_SERVER, sizeof buffer, buffer, nullptr);
  return size > 0 && size < sizeof buffer ? std::string(buffer, size) : VEXIL_FAKE_SERVER;
}

std::string WorkingDirectoryOf(vexil::xServer& server) { return Ask(server, "fake/cwd").cwd; }

TEST_F(ServerStart, LaunchesDirectlyAndThroughCmdExeInItsOwnDirectory) {
  vexil_test::TempDirectory directory;
  const std::string before = std::filesystem::current_path().string();
  xServerStart direct = FakeStart({"stderr=direct\\n"});
  direct.executable = FakeServerPath();
  direct.directory = directory.Path().string();
  vexil::xServer server(direct);
  ASSERT_TRUE(server.Start());
  EXPECT_EQ(TraceLog::Texts("Verbose")[0], " Executable: " + direct.executable + "\n");
  EXPECT_EQ(std::filesystem::current_path().string(), before);
  EXPECT_EQ(WorkingDirectoryOf(server), direct.directory);
  EXPECT_TRUE(ErrorLineArrives(server, "direct"));

  TraceLog::Clear();
  xServerStart command = FakeStart({"", "stderr=through\\n"}, 0);
  command.useCommand = true;
  command.executable = FakeServerPath();
  vexil::xServer interpreted(command);
  ASSERT_TRUE(interpreted.Start());
  EXPECT_EQ(TraceLog::Texts("Verbose"),
            (Texts{" Executable: cmd.exe\n", "  Directory: \n",
                   "  Arguments: /C " + command.executable + " stderr=through\\n \n", "Use Command: Yes\n",
                   "     Timout: 200 (milliseconds)\n\n"}));
  interpreted.Timeout(30000);  // cmd.exe under wine on a busy machine can take longer than 200 ms
  // The pipes reach the server through the interpreter, both ways.
  EXPECT_EQ(WorkingDirectoryOf(interpreted), before);
  EXPECT_TRUE(ErrorLineArrives(interpreted, "through"));
}

}  // namespace

namespace transport_test {

// The reasons are the system's message table's texts.
std::vector<LaunchFailure> LaunchFailures() {
  auto reason = [](DWORD code) {
    char* text = nullptr;
    FormatMessageA(FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS, nullptr,
                   code, MAKELANGID(LANG_NEUTRAL, SUBLANG_DEFAULT), reinterpret_cast<char*>(&text), 0, nullptr);
    std::string reason = text ? text : "";
    LocalFree(text);
    return reason;
  };
  auto failure = [&](const std::string& executable, const std::string& directory, DWORD code) {
    return LaunchFailure{executable, directory, "Cannot launch process: " + executable, reason(code)};
  };
  return {failure("C:\\nonexistent\\server.exe", "", ERROR_FILE_NOT_FOUND),
          failure("no-such-language-server-here", "", ERROR_FILE_NOT_FOUND),
          failure(FakeServerPath(), "C:\\nonexistent\\dir", ERROR_DIRECTORY)};
}

}  // namespace transport_test
