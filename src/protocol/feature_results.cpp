// Reading of the feature results. Lists accept the shapes servers really send: a bare
// array, a list object, a single location, null.
#include "vexil/protocol/feature_results.h"

#include "json/members.h"
#include "protocol/json_arrays.h"
#include "protocol/raw_json.h"

namespace LSP {
namespace {

// Hierarchical document symbols have no location of their own: they belong to the
// requested document, and so do their children.
void AssignDocument(std::vector<SymbolInformation>& symbols, const std::string& uri) {
  for (SymbolInformation& symbol : symbols) {
    if (symbol.location.uri.empty()) symbol.location.uri = uri;
    AssignDocument(symbol.children, uri);
  }
}

}  // namespace

void Hover::Read(const xObject& value) {
  contents.Read(value.Object("contents"));
  range.Read(value.Object("range"));
}

void ParameterInformation::Read(const xObject& value) {
  label = value.String("label");
  documentation.Read(value.Object("documentation"));
}

void SignatureInformation::Read(const xObject& value) {
  label = value.String("label");
  documentation.Read(value.Object("documentation"));
  ReadArray(value, "parameters", parameters);
}

void SignatureHelp::Read(const xObject& value) {
  ReadArray(value, "signatures", signatures);
  activeSignature = value.Int("activeSignature");
  activeParameter = value.Int("activeParameter");
}

void CompletionItemLabelDetails::Read(const xObject& value) {
  static const MemberNames names{"detail", "description"};
  const Members details(value, names);
  detail = details.String("detail");
  description = details.String("description");
}

void CompletionItem::Read(const xObject& value) {
  // Lists of thousands of items: each item's members are found in one pass.
  static const MemberNames names{"label",      "labelDetails", "kind",       "detail",
                                 "documentation", "deprecated", "sortText", "filterText",
                                 "insertText", "insertTextFormat", "textEdit"};
  const Members item(value, names);
  label = item.String("label");
  labelDetails.Read(item.Object("labelDetails"));
  kind = item.Int("kind");
  detail = item.String("detail");
  documentation.Read(item.Object("documentation"));
  deprecated = item.Bool("deprecated");
  sortText = item.String("sortText");
  filterText = item.String("filterText");
  insertText = item.String("insertText");
  insertTextFormat = item.Int("insertTextFormat");
  textEdit.Read(item.Object("textEdit"));
}

void CompletionList::Read(const xObject& value) {
  xObject array = value;
  if (value.IsObject()) {
    isIncomplete = value.Bool("isIncomplete");
    ReadArray(value, "items", items);
    array = value.Object("items");
  } else if (value.IsArray()) {
    ReadArrayElements(value.Value(), items);
  }
  if (!keepItemJson || !array.IsArray()) return;
  std::size_t item = items.size() - array.Value().Size();  // items read before this reply stay
  RawJsonTexts texts;
  for (const JsonValue& element : array.Value().GetArray()) items[item++].rawJson = texts.Text(xObject(element));
}

void LocationsList::Read(const xObject& value) {
  if (value.IsNull()) return;
  if (value.IsArray()) {
    ReadArrayElements(value.Value(), items);
    return;
  }
  items.emplace_back();
  items.back().Read(value);
}

void SymbolInformationList::Read(const xObject& value) {
  ReadArrayValue(value.Value(), items);
  AssignDocument(items, documentUri);
}

void DocumentFormattingList::Read(const xObject& value) { ReadArrayValue(value.Value(), items); }

}  // namespace LSP
