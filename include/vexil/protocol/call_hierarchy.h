// Call hierarchies: the item a server prepares for the symbol at a position, and the
// calls into it and out of it. Items go back to the server as it sent them.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/feature_results.h"

namespace LSP {

class VEXIL_API CallHierarchyPrepareParams : public TextDocumentPositionParams {};

// A function or method of the hierarchy. `rawJson` keeps the item as the server sent it,
// with the "data" servers use to find it again; an item without it (built by the host)
// is written from its members in the protocol's shape.
class VEXIL_API CallHierarchyItem : public JsonObject {
 public:
  const char* Name() const override { return "item"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::string name;
  int kind = -1;  // a symbol kind
  std::string detail;
  std::string uri;
  Range range;
  Range selectionRange;
  std::string rawJson;
};

class VEXIL_API CallHierarchyItemList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<CallHierarchyItem> items;
};

// The params of "callHierarchy/incomingCalls" and "callHierarchy/outgoingCalls".
class VEXIL_API CallHierarchyCallsParams : public Params {
 public:
  CallHierarchyCallsParams() = default;
  explicit CallHierarchyCallsParams(const CallHierarchyItem& item) : item(item) {}
  void Write(xWriter& writer) override;

  CallHierarchyItem item;
};

// A caller (`from`) and the ranges of its calls, in the caller's document.
class VEXIL_API CallHierarchyIncomingCall : public JsonObject {
 public:
  const char* Name() const override { return "incomingCall"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  CallHierarchyItem from;
  std::vector<Range> fromRanges;
};

// A callee (`to`) and the ranges of the calls, in the document of the item asked about.
class VEXIL_API CallHierarchyOutgoingCall : public JsonObject {
 public:
  const char* Name() const override { return "outgoingCall"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  CallHierarchyItem to;
  std::vector<Range> fromRanges;
};

class VEXIL_API CallHierarchyIncomingCallList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<CallHierarchyIncomingCall> items;
};

class VEXIL_API CallHierarchyOutgoingCallList : public ListResult {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;

  std::vector<CallHierarchyOutgoingCall> items;
};

}  // namespace LSP
