// Hosts call a connection through fixed virtual slots. With the Itanium C++ ABI (GCC and
// Clang, also for mingw) a pointer to a virtual member holds its vtable offset plus one,
// which pins down each operation's slot.
#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>
#include <iterator>

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

// Each operation's slot is its place in this list, the order hosts were built against.
TEST(ConnectionSlots, OperationsSitInTheHostsSlotOrder) {
  using S = xLanguageServer;
  const std::ptrdiff_t slots[] = {
      Slot(&S::Exit), Slot(&S::ErrorMessage), Slot(&S::HaveErrors), Slot(&S::Id), Slot(&S::Initialize),
      Slot(&S::IsRunning), Slot(&S::Start), Slot(&S::Shutdown), Slot(&S::TextDocument_Completion),
      Slot(&S::TextDocument_Declaration), Slot(&S::TextDocument_Definition), Slot(&S::TextDocument_TypeDefinition),
      Slot(&S::TextDocument_Implementation), Slot(&S::TextDocument_References),
      Slot(&S::TextDocument_DocumentSymbol), Slot(&S::TextDocument_WorkspaceSymbol), Slot(&S::TextDocument_Hover),
      Slot(&S::TextDocument_Signature), Slot(&S::TextDocument_Formatting), Slot(&S::TextDocument_RangeFormatting),
      Slot(&S::TextDocument_Rename), Slot(&S::TextDocument_DidChange), Slot(&S::TextDocument_DidClose),
      Slot(&S::TextDocument_DidOpen), Slot(&S::TextDocument_DidSave), Slot(&S::TextDocument_Diagnostics),
      Slot(&S::DiagnosticsVersion), Slot(&S::TextDocument_PullDiagnostics), Slot(&S::Enable),
      Slot(&S::ServerCapabilities), Slot(&S::ServerCapabilitiesJson), Slot(&S::Request), Slot(&S::Notify),
      Slot(&S::SetMessageHandler), Slot(&S::Reply), Slot(&S::ReplyError), Slot(&S::Cancel), Slot(&S::SetEnvironment),
      Slot(&S::TextDocument_CodeAction), Slot(&S::Workspace_ExecuteCommand),
      Slot(&S::TextDocument_DocumentHighlight), Slot(&S::TextDocument_FoldingRange),
      Slot(&S::TextDocument_SelectionRange), Slot(&S::TextDocument_SemanticTokensFull),
      Slot(&S::TextDocument_InlayHint), Slot(&S::CompletionItem_Resolve), Slot(&S::TextDocument_PrepareRename),
      Slot(&S::TextDocument_PrepareCallHierarchy), Slot(&S::CallHierarchy_IncomingCalls),
      Slot(&S::CallHierarchy_OutgoingCalls), Slot(&S::Workspace_DidChangeConfiguration),
      Slot(&S::Workspace_DidChangeWorkspaceFolders), Slot(&S::TextDocument_WillSave)};
  for (std::ptrdiff_t at = 0; at < static_cast<std::ptrdiff_t>(std::size(slots)); ++at)
    EXPECT_EQ(slots[at], at) << "operation number " << at << " of the list";
}

}  // namespace

#endif
