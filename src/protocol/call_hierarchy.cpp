// Reading of call hierarchy items and calls, and writing of an item back to the server.
#include "vexil/protocol/call_hierarchy.h"

#include "protocol/json_arrays.h"
#include "protocol/raw_json.h"

namespace LSP {

void CallHierarchyItem::Read(const xObject& value) {
  name = value.String("name");
  kind = value.Int("kind");
  detail = value.String("detail");
  uri = value.String("uri");
  range.Read(value.Object("range"));
  selectionRange.Read(value.Object("selectionRange"));
  rawJson = RawJsonText(value);
}

void CallHierarchyItem::Write(xWriter& writer) {
  if (!rawJson.empty()) {
    WriteRawMembers(writer, rawJson);
    return;
  }
  writer.RequiredString("name", name);
  writer.Int("kind", kind);
  writer.String("detail", detail);
  writer.RequiredString("uri", uri);
  writer.Object(range, true);
  writer.Object("selectionRange", selectionRange);
}

void CallHierarchyItemList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

void CallHierarchyCallsParams::Write(xWriter& writer) { writer.Object(item, true); }

void CallHierarchyIncomingCall::Read(const xObject& value) {
  from.Read(value.Object("from"));
  ReadArray(value, "fromRanges", fromRanges);
}

void CallHierarchyOutgoingCall::Read(const xObject& value) {
  to.Read(value.Object("to"));
  ReadArray(value, "fromRanges", fromRanges);
}

void CallHierarchyIncomingCallList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }
void CallHierarchyOutgoingCallList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

}  // namespace LSP
