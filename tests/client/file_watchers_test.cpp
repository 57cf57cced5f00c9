// Which changes the registered watchers ask for: the glob syntax servers use, relative
// patterns, watch kinds, registrations replaced and dropped, and malformed params.
#include <gtest/gtest.h>

#include <string>

#include "client/file_watchers.h"
#include "client/glob_pattern.h"
#include "client/path_style.h"
#include "vexil/client/uri.h"

namespace {

using vexil::FileChangeType;
using vexil::GlobPattern;

TEST(GlobPattern, MatchesWhatServersRegister) {
  const std::string deep(200, 'a');  // "a/a/a/...": many ways for `**` and `*` to split it
  std::string segments;
  for (int i = 0; i < 60; ++i) segments += "a/";
  struct Row {
    const char* pattern;
    std::string path;
    bool ignoreCase;
    bool matches;
  } rows[] = {
      {"**/*.py", "/home/u/a.py", false, true},        {"**/*.py", "a.py", false, true},
      {"**/*.py", "/home/u/a.pyc", false, false},      {"*.py", "src/a.py", false, false},
      {"src/*.py", "src/a.py", false, true},           {"src/**", "src", false, true},
      {"src/**", "src/a/b/c", false, true},            {"src/**", "srcx/a", false, false},
      {"a/**/b", "a/b", false, true},                  {"a/**/b", "a/x/y/b", false, true},
      {"a/**/b", "a/x/y/c", false, false},             {"**/node_modules", "/p/node_modules/", false, true},
      {"?.txt", "a.txt", false, true},                 {"?.txt", "ab.txt", false, false},
      {"**/*.{ts,js}", "src/a.js", false, true},       {"**/*.{ts,js}", "src/a.tsx", false, false},
      {"{src,lib}/**/*.c", "lib/x/y.c", false, true},  {"{a,{b,c}d}", "cd", false, true},
      {"**/{compile_commands.json,compile_flags.txt}", "/p/compile_flags.txt", false, true},
      {"example.[0-9]", "example.5", false, true},     {"example.[0-9]", "example.a", false, false},
      {"example.[!0-9]", "example.a", false, true},    {"example.[!0-9]", "example.0", false, false},
      {"[]]x", "]x", false, true},                     {"a[b", "a[b", false, true},
      {"{a,b", "{a,b", false, true},                   {"*.PY", "a.py", false, false},
      {"*.PY", "a.py", true, true},                    {"[A-Z].c", "b.c", true, true},
      {"C:/src/**/*.c", "c:/src/a/b.c", true, true},   {"\xC3\xA9t?", "\xC3\xA9t\xC3\xA9", false, true},
      {"[\xC3\xA9]?", "\xC3\xA9\xFF", false, true},
      {"**/**/**/**/**/**/b", segments + "c", false, false},
      {"*a*a*a*a*a*a*b", deep, false, false},
      {"{a,b}{a,b}{a,b}{a,b}{a,b}{a,b}{a,b}{a,b}{a,b}{a,b}{a,b}x", "aaaaaaaaaaax", false, true},
  };
  for (const Row& row : rows)
    EXPECT_EQ(GlobPattern(row.pattern, row.ignoreCase).Matches(row.path), row.matches)
        << row.pattern << " against " << row.path.substr(0, 40);
}

// A workspace folder of this platform's form, and a path below it.
std::string Folder() { return vexil::NativeSeparator() == '/' ? "/w" : "C:\\w"; }
std::string InFolder(std::string relative) {
  for (char& c : relative)
    if (c == '/') c = vexil::NativeSeparator();
  return Folder() + vexil::NativeSeparator() + relative;
}

// `watchers` as the registration params a server sends, $BASE standing for the folder's URI.
std::string Registration(const char* id, const char* method, std::string watchers) {
  for (std::string::size_type at; (at = watchers.find("$BASE")) != std::string::npos;)
    watchers.replace(at, 5, FileToUri(Folder().c_str()));
  return std::string(R"({"registrations":[{"id":")") + id + R"(","method":")" + method +
         R"(","registerOptions":{"watchers":)" + watchers + "}}]}";
}

TEST(FileWatcherRegistry, WantsWhatTheWatchersMatchWithTheirKinds) {
  const char* watched = "workspace/didChangeWatchedFiles";
  const std::string python = Registration("1", watched, R"([{"globPattern":"**/*.py"}])");
  const std::string deletions = Registration("1", watched, R"([{"globPattern":"**/*.py","kind":4}])");
  const std::string relative = Registration("2", watched, R"([{"globPattern":{"baseUri":"$BASE/src","pattern":"*.py"}}])");
  const std::string ofFolder =
      Registration("3", watched, R"([{"globPattern":{"baseUri":{"uri":"$BASE","name":"w"},"pattern":"setup.cfg"}}])");
  const std::string folderRelative = Registration("4", watched, R"([{"globPattern":"src/*.c"}])");
  const std::string badAndGood = Registration("5", watched, R"([{"globPattern":5},{"kind":1},{"globPattern":"*.md"}])");
  const std::string dropped = R"({"unregisterations":[{"id":"1","method":"workspace/didChangeWatchedFiles"}]})";
  const std::string dropOther = R"({"unregistrations":[{"id":"1","method":"textDocument/didSave"}]})";
  struct Row {
    std::string registered, unregistered;
    const char* path;
    FileChangeType type;
    bool accepted, wanted;
  } rows[] = {
      {"", "", "any/thing.txt", vexil::kFileDeleted, true, true},
      {python, "", "src/a.py", vexil::kFileCreated, true, true},
      {python, "", "src/a.txt", vexil::kFileCreated, true, false},
      {deletions, "", "a.py", vexil::kFileChanged, true, false},
      {deletions, "", "a.py", vexil::kFileDeleted, true, true},
      {relative, "", "src/a.py", vexil::kFileChanged, true, true},
      {relative, "", "a.py", vexil::kFileChanged, true, false},
      {relative, "", "src/x/a.py", vexil::kFileChanged, true, false},
      {ofFolder, "", "setup.cfg", vexil::kFileChanged, true, true},
      {ofFolder, "", "sub/setup.cfg", vexil::kFileChanged, true, false},
      {folderRelative, "", "src/a.c", vexil::kFileCreated, true, true},
      {badAndGood, "", "x.md", vexil::kFileDeleted, true, true},
      {Registration("1", "textDocument/didSave", "[]"), "", "a.txt", vexil::kFileCreated, true, true},
      {python, dropped, "a.py", vexil::kFileCreated, true, false},
      {python, dropOther, "a.py", vexil::kFileCreated, true, true},
      {"[]", "", "a.txt", vexil::kFileCreated, false, true},
      {"{\"registrations\":", "", "a.txt", vexil::kFileCreated, false, true},
      {R"({"registrations":{}})", "", "a.txt", vexil::kFileCreated, false, true},
  };
  for (const Row& row : rows) {
    vexil::FileWatcherRegistry registry;
    std::string error;
    if (!row.registered.empty()) {
      EXPECT_EQ(registry.Register(row.registered, error), row.accepted) << row.registered;
      EXPECT_EQ(error.empty(), row.accepted) << row.registered;
    }
    if (!row.unregistered.empty()) {
      EXPECT_TRUE(registry.Unregister(row.unregistered, error));
    }
    EXPECT_EQ(registry.Wants(InFolder(row.path), Folder(), row.type), row.wanted)
        << row.registered << " " << row.unregistered << " " << row.path << " " << row.type;
  }
  vexil::FileWatcherRegistry registry;
  std::string error;
  EXPECT_FALSE(registry.Unregister(R"({"unregisterations":null})", error));
  EXPECT_NE(error.find("unregisterations"), std::string::npos) << error;
}

}  // namespace
