// Hosts call a connection through fixed virtual slots. With the Itanium C++ ABI (GCC and
// Clang, also for mingw) a pointer to a virtual member holds its vtable offset plus one,
// which pins down each operation's slot.
#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>

#include "vexil/host/language_server.h"

#if defined(__GNUC__) && !defined(_MSC_VER)

namespace {

template <typename Member>
std::ptrdiff_t Slot(Member member) {
  static_assert(sizeof member == 2 * sizeof(std::ptrdiff_t), "Itanium member pointers are two words");
  std::ptrdiff_t words[2];
  std::memcpy(words, &member, sizeof words);
  return (words[0] - 1) / static_cast<std::ptrdiff_t>(sizeof(void*));
}

TEST(ConnectionSlots, OperationsSitInTheHostsSlotOrder) {
  using S = xLanguageServer;
  EXPECT_EQ(Slot(&S::Exit), 0);
  EXPECT_EQ(Slot(&S::ErrorMessage), 1);
  EXPECT_EQ(Slot(&S::HaveErrors), 2);
  EXPECT_EQ(Slot(&S::Id), 3);
  EXPECT_EQ(Slot(&S::Initialize), 4);
  EXPECT_EQ(Slot(&S::IsRunning), 5);
  EXPECT_EQ(Slot(&S::Start), 6);
  EXPECT_EQ(Slot(&S::Shutdown), 7);
  EXPECT_EQ(Slot(&S::TextDocument_Completion), 8);
  EXPECT_EQ(Slot(&S::TextDocument_Declaration), 9);
  EXPECT_EQ(Slot(&S::TextDocument_Definition), 10);
  EXPECT_EQ(Slot(&S::TextDocument_TypeDefinition), 11);
  EXPECT_EQ(Slot(&S::TextDocument_Implementation), 12);
  EXPECT_EQ(Slot(&S::TextDocument_References), 13);
  EXPECT_EQ(Slot(&S::TextDocument_DocumentSymbol), 14);
  EXPECT_EQ(Slot(&S::TextDocument_WorkspaceSymbol), 15);
  EXPECT_EQ(Slot(&S::TextDocument_Hover), 16);
  EXPECT_EQ(Slot(&S::TextDocument_Signature), 17);
  EXPECT_EQ(Slot(&S::TextDocument_Formatting), 18);
  EXPECT_EQ(Slot(&S::TextDocument_RangeFormatting), 19);
  EXPECT_EQ(Slot(&S::TextDocument_Rename), 20);
  EXPECT_EQ(Slot(&S::TextDocument_DidChange), 21);
  EXPECT_EQ(Slot(&S::TextDocument_DidClose), 22);
  EXPECT_EQ(Slot(&S::TextDocument_DidOpen), 23);
  EXPECT_EQ(Slot(&S::TextDocument_DidSave), 24);
  EXPECT_EQ(Slot(&S::TextDocument_Diagnostics), 25);
  EXPECT_EQ(Slot(&S::DiagnosticsVersion), 26);
  EXPECT_EQ(Slot(&S::TextDocument_PullDiagnostics), 27);
  EXPECT_EQ(Slot(&S::Enable), 28);
  EXPECT_EQ(Slot(&S::ServerCapabilities), 29);
  EXPECT_EQ(Slot(&S::ServerCapabilitiesJson), 30);
  EXPECT_EQ(Slot(&S::Request), 31);
  EXPECT_EQ(Slot(&S::Notify), 32);
  EXPECT_EQ(Slot(&S::SetMessageHandler), 33);
  EXPECT_EQ(Slot(&S::Reply), 34);
  EXPECT_EQ(Slot(&S::ReplyError), 35);
  EXPECT_EQ(Slot(&S::Cancel), 36);
  EXPECT_EQ(Slot(&S::SetEnvironment), 37);
  EXPECT_EQ(Slot(&S::TextDocument_CodeAction), 38);
  EXPECT_EQ(Slot(&S::Workspace_ExecuteCommand), 39);
  EXPECT_EQ(Slot(&S::TextDocument_DocumentHighlight), 40);
  EXPECT_EQ(Slot(&S::TextDocument_FoldingRange), 41);
  EXPECT_EQ(Slot(&S::TextDocument_SelectionRange), 42);
  EXPECT_EQ(Slot(&S::TextDocument_SemanticTokensFull), 43);
  EXPECT_EQ(Slot(&S::TextDocument_InlayHint), 44);
  EXPECT_EQ(Slot(&S::CompletionItem_Resolve), 45);
  EXPECT_EQ(Slot(&S::TextDocument_PrepareRename), 46);
  EXPECT_EQ(Slot(&S::TextDocument_PrepareCallHierarchy), 47);
  EXPECT_EQ(Slot(&S::CallHierarchy_IncomingCalls), 48);
  EXPECT_EQ(Slot(&S::CallHierarchy_OutgoingCalls), 49);
  EXPECT_EQ(Slot(&S::Workspace_DidChangeConfiguration), 50);
  EXPECT_EQ(Slot(&S::Workspace_DidChangeWorkspaceFolders), 51);
  EXPECT_EQ(Slot(&S::TextDocument_WillSave), 52);
}

}  // namespace

#endif
