// Writing of the client capability tree, depth first, each node in its fixed member order.
// Nodes held for completeness but unwritten (file operations, refresh support) stay out.
#include "vexil/protocol/capabilities.h"

#include <numeric>

#include "json/rapidjson.h"

namespace LSP {
namespace {

// Merges `source` into `target` in place: objects member by member, other values replaced,
// new members appended after the existing ones.
void Merge(JsonValue& target, const JsonValue& source, JsonDocument::AllocatorType& allocator) {
  for (const auto& member : source.GetObject()) {
    auto found = target.FindMember(member.name);
    if (found == target.MemberEnd())
      target.AddMember(JsonValue(member.name, allocator), JsonValue(member.value, allocator), allocator);
    else if (found->value.IsObject() && member.value.IsObject())
      Merge(found->value, member.value, allocator);
    else
      found->value.CopyFrom(member.value, allocator);
  }
}

}  // namespace

void DynamicRegistrationCapabilities::Write(xWriter& writer) {
  writer.Bool("dynamicRegistration", dynamicRegistration);
}

ValueSetCapabilities::ValueSetCapabilities(int last) : valueSet(static_cast<std::size_t>(last)) {
  std::iota(valueSet.begin(), valueSet.end(), 1);
}

void ValueSetCapabilities::Write(xWriter& writer) {
  if (!valueSet.empty()) writer.Integers("valueSet", valueSet);
}

void RefreshCapabilities::Write(xWriter& writer) { writer.Bool("refreshSupport", refreshSupport); }

void SymbolClientCapabilities::Write(xWriter& writer) {
  DynamicRegistrationCapabilities::Write(writer);
  writer.Object(symbolKind, true);
}

void WorkspaceEditCapabilities::Write(xWriter& writer) {
  writer.Bool("documentChanges", documentChanges);
  writer.Bool("resourceChanges", resourceChanges);
}

void FileOperations::Write(xWriter& writer) {
  DynamicRegistrationCapabilities::Write(writer);
  writer.Bool("didCreate", didCreate);
  writer.Bool("willCreate", willCreate);
  writer.Bool("didRename", didRename);
  writer.Bool("willRename", willRename);
  writer.Bool("didDelete", didDelete);
  writer.Bool("willDelete", willDelete);
}

void WorkspaceClientCapabilities::Write(xWriter& writer) {
  writer.Bool("applyEdit", applyEdit);
  writer.Object(workspaceEdit, true);
  writer.Object(didChangeConfiguration, true);
  writer.Object(didChangeWatchedFiles, true);
  writer.Object(symbol, true);
  writer.Object(executeCommand, true);
  writer.Bool("workspaceFolders", workspaceFolders);
  writer.Bool("configuration", configuration);
}

void PublishDiagnosticsClientCapabilities::Write(xWriter& writer) {
  writer.Bool("relatedInformation", relatedInformation);
}

void SynchronizationClientCapabilities::Write(xWriter& writer) {
  DynamicRegistrationCapabilities::Write(writer);
  writer.Bool("willSave", willSave);
  writer.Bool("willSaveWaitUntil", willSaveWaitUntil);
  writer.Bool("didSave", didSave);
}

void CompletionItemCapabilities::Write(xWriter& writer) {
  writer.Bool("snippetSupport", snippetSupport);
  writer.Bool("commitCharactersSupport", commitCharactersSupport);
  writer.Strings("documentationFormat", documentationFormat);
  writer.Bool("deprecatedSupport", deprecatedSupport);
}

void CompletionClientCapabilities::Write(xWriter& writer) {
  DynamicRegistrationCapabilities::Write(writer);
  writer.Bool("contextSupport", contextSupport);
  writer.Object(completionItem, true);
  writer.Object(completionItemKind, true);
}

void HoverClientCapabilities::Write(xWriter& writer) {
  DynamicRegistrationCapabilities::Write(writer);
  writer.Strings("contentFormat", contentFormat);
}

void SignatureClientInformation::Write(xWriter& writer) {
  writer.Strings("documentationFormat", documentationFormat);
}

void DeclarationClientCapabilities::Write(xWriter& writer) {
  DynamicRegistrationCapabilities::Write(writer);
  writer.Bool("linkSupport", linkSupport);
}

void TextDocumentClientCapabilities::Write(xWriter& writer) {
  Params* children[] = {&publishDiagnostics, &synchronization, &completion,     &hover,
                        &signatureHelp,      &definition,      &references,     &documentHighlight,
                        &documentSymbol,     &codeAction,      &codeLens,       &formatting,
                        &rangeFormatting,    &onTypeFormatting, &rename,        &documentLink,
                        &typeDefinition,     &implementation,  &declaration,    &colorProvider,
                        &foldingRange,       &selectionRange,  &linkedEditingRange, &callHierarchy,
                        &moniker,            &typeHierarchy,   &inlineValue,    &inlayHint,
                        &diagnostic};
  for (Params* child : children) writer.Object(*child, true);
}

void ClientCapabilities::Write(xWriter& writer) {
  if (additions.empty()) {
    writer.Object(workspace, true);
    writer.Object(textDocument, true);
    return;
  }
  // The tree as text, merged with the additions, then written member by member.
  xWriter plain;
  plain.StartObject();
  plain.Object(workspace, true);
  plain.Object(textDocument, true);
  plain.EndObject();
  const std::string text = plain.GetString();
  JsonDocument tree;
  tree.Parse(text.c_str(), text.size());
  for (const std::string& addition : additions) {
    JsonDocument extra;
    extra.Parse(addition.c_str(), addition.size());
    if (!extra.HasParseError() && extra.IsObject()) Merge(tree, extra, tree.GetAllocator());
  }
  for (const auto& member : tree.GetObject()) writer.Raw(member.name.GetString(), member.value);
}

}  // namespace LSP
