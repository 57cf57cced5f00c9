// Writing of the opt-in capabilities of the newer requests, each node in the order the
// default tree has it, so that merged over the tree they extend it in place.
#include "vexil/protocol/feature_capabilities.h"

namespace LSP {
namespace {

// A node written by a function: the partial tree needs many one-off objects.
template <typename Members>
class Node : public JsonObject {
 public:
  Node(const char* key, Members members) : key_(key), members_(members) {}
  const char* Name() const override { return key_; }
  void Read(const xObject&) override {}
  using JsonObject::Read;
  void Write(xWriter& writer) override { members_(writer); }

 private:
  const char* key_;
  Members members_;
};

template <typename Members>
void WriteNode(xWriter& writer, const char* key, Members members) {
  Node<Members> node(key, members);
  writer.Object(node, true);
}

void WriteWorkspace(xWriter& writer) {
  writer.Bool("applyEdit", true);
  WriteNode(writer, "workspaceEdit", [](xWriter& w) { w.Bool("documentChanges", true); });
}

}  // namespace

void FeatureClientCapabilities::Write(xWriter& writer) {
  WriteNode(writer, "workspace", WriteWorkspace);
  WriteNode(writer, "textDocument", [this](xWriter& w) {
    WriteNode(w, "synchronization", [](xWriter& node) { node.Bool("willSave", true); });
    WriteNode(w, "codeAction", [this](xWriter& node) {
      WriteNode(node, "codeActionLiteralSupport", [this](xWriter& literals) {
        WriteNode(literals, "codeActionKind", [this](xWriter& kinds) { kinds.Strings("valueSet", codeActionKinds); });
      });
      node.Bool("isPreferredSupport", true);
    });
    WriteNode(w, "rename", [](xWriter& node) { node.Bool("prepareSupport", true); });
    WriteNode(w, "semanticTokens", [this](xWriter& node) {
      node.Bool("dynamicRegistration", false);
      WriteNode(node, "requests", [](xWriter& requests) {
        requests.Bool("range", false);
        requests.Bool("full", true);
      });
      node.Strings("tokenTypes", tokenTypes);
      node.Strings("tokenModifiers", tokenModifiers);
      node.Strings("formats", {"relative"});
      node.Bool("overlappingTokenSupport", false);
      node.Bool("multilineTokenSupport", false);
    });
  });
}

}  // namespace LSP
