// The `vexil` command lines: server arguments up to the first action, values after '=' or
// in the next argument, positions read from the right of FILE:LINE:COL, files resolved
// against the root, each kind of bad usage refused before any launch, and a task's
// command line split into words as a shell would.
#include <gtest/gtest.h>

#include <filesystem>

#include "lsp_options.h"
#include "run_words.h"

namespace {

using cli::ActionKind;
using cli::ParseLspOptions;
using cli::UsageError;
using Args = std::vector<std::string>;

TEST(LspOptions, ServerArgumentsRunUpToTheFirstActionAndPositionsStayOneBased) {
  cli::LspOptions options = ParseLspOptions(
      {"--trace", "verbose", "--timeout=900", "--json", "--root=src", "--", "clangd", "--log=error", "--pretty",
       "--hover", "c:/odd:name.cpp:15:18", "--range-format=a.cpp:1:2:3:4", "--rename", "a.cpp:5:6:Limit",
       "--workspace-symbols", "Rect", "--close", "a.cc", "--capabilities", "--request", "a/b", R"({"x": [1]})",
       "--notify=c/d", "null"});
  EXPECT_EQ(options.session.trace, LSP::TraceLevel::Verbose);
  EXPECT_EQ(options.session.timeout, 900);
  EXPECT_TRUE(options.json);
  EXPECT_EQ(options.session.program, "clangd");
  EXPECT_EQ(options.session.arguments, (Args{"--log=error", "--pretty"}));
  ASSERT_EQ(options.actions.size(), 8u);
  const cli::Action& hover = options.actions[0];
  EXPECT_EQ(hover.kind, ActionKind::Hover);
  EXPECT_EQ(hover.file, "c:/odd:name.cpp");
  EXPECT_EQ(hover.line, 15);
  EXPECT_EQ(hover.column, 18);
  const cli::Action& range = options.actions[1];
  EXPECT_EQ(std::vector<int>({range.line, range.column, range.endLine, range.endColumn}), std::vector<int>({1, 2, 3, 4}));
  EXPECT_EQ(options.actions[2].text, "Limit");
  EXPECT_EQ(options.actions[2].line, 5);
  EXPECT_EQ(options.actions[3].text, "Rect");
  EXPECT_EQ(options.actions[4].kind, ActionKind::Close);
  const std::filesystem::path root = std::filesystem::absolute("src").lexically_normal();
  EXPECT_EQ(options.session.root, root.string());
  EXPECT_EQ(options.actions[4].path, (root / "a.cc").string());
  EXPECT_EQ(cli::Describe(options.actions[2]), "rename a.cpp:5:6 -> Limit");
  EXPECT_EQ(cli::Describe(options.actions[5]), "capabilities");
  EXPECT_EQ(options.actions[6].text + " " + options.actions[6].params, R"(a/b {"x": [1]})");
  EXPECT_EQ(cli::Describe(options.actions[7]) + " " + options.actions[7].params, "notify c/d null");
  cli::LspOptions environment = ParseLspOptions({"--env", "A=b=c", "--env=EMPTY=", "--progress", "--", "s", "--capabilities"});
  EXPECT_EQ(environment.session.environment, (std::vector<std::pair<std::string, std::string>>{{"A", "b=c"}, {"EMPTY", ""}}));
  EXPECT_TRUE(environment.session.progress);
  EXPECT_FALSE(environment.session.watch);
  EXPECT_TRUE(ParseLspOptions({"--watch", "--", "s"}).session.watch) << "watching needs no action";
}

TEST(LspOptions, BadUsageIsRefusedWithAReason) {
  const std::vector<Args> bad = {
      {"--", "clangd"},                                     // no action
      {"clangd", "--hover", "a.cpp:1:1"},                   // no "--"
      {"--trace", "loud", "--", "clangd", "--open", "a.cpp"},
      {"--timeout", "0", "--", "clangd", "--open", "a.cpp"},
      {"--", "clangd", "--hover", "a.cpp:1"},               // column missing
      {"--", "clangd", "--hover", "a.cpp:0:1"},             // lines count from 1
      {"--", "clangd", "--rename", "a.cpp:1:1:"},           // no new name
      {"--", "clangd", "--hover"},                          // no operand
      {"--", "clangd", "--open", "notes.txt"},              // no language for .txt
      {"--json=yes", "--", "clangd", "--open", "a.cpp"},    // a flag takes no value
      {"--root", "--", "clangd"},                           // the value is taken, then "--" is missing
      {"--", "s", "1", "2", "3", "4", "5", "6", "7", "8", "--open", "a.cpp"},
      {"--", "s", "--request", "a/b"},                      // no params
      {"--", "s", "--request", "a/b", "{oops"},             // not JSON
      {"--", "s", "--notify", "a/b", "[1]"},                // not an object
      {"--", "s", "--capabilities=yes"},                    // takes no operand
      {"--env", "NOVALUE", "--", "s", "--capabilities"},
      {"--env", "=x", "--", "s", "--capabilities"},
      {"--capabilities", "--", "s"},                        // an action before the server
  };
  for (const Args& arguments : bad) {
    EXPECT_THROW(ParseLspOptions(arguments), UsageError) << ::testing::PrintToString(arguments);
  }
  EXPECT_EQ(ParseLspOptions({"--language", "plaintext", "--", "s", "--open", "notes.txt"}).session.language, "plaintext");
  EXPECT_THROW(ParseLspOptions({"--help"}), cli::HelpRequested);
}

TEST(TaskCommand, RunIsSplitIntoWordsAsAShellWould) {
  const std::vector<std::pair<std::string, Args>> cases = {
      {"g++ -c $FN", {"g++", "-c", "$FN"}},
      {"  make   '$FB.o'  ", {"make", "$FB.o"}},
      {"echo 'a b'\"c \\\" d\"e\\ f ''", {"echo", "a bc \" de f", ""}},
  };
  for (const auto& [text, words] : cases) EXPECT_EQ(cli::SplitWords(text), words) << text;
  EXPECT_THROW(cli::SplitWords("echo 'open"), UsageError);
}

}  // namespace
