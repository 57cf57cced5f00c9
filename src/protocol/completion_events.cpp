// Reads a completion reply from the parser's events: each member goes into its slot of the
// model as it is parsed, while it is still in cache, rather than into a document first.
// Anything the document read would judge otherwise (an error, a duplicate, another type)
// stops the parse, undoes what was read, and leaves the text to the document read.
#include "protocol/completion_events.h"

#include <climits>
#include <cstdint>

#include "json/plain_reader.h"
#include "json/rapidjson.h"
#include "json/short_names.h"
#include "vexil/protocol/feature_results.h"

namespace LSP {
namespace {

struct Name {
  const char* text;
  std::size_t length;
};

template <std::size_t N>
constexpr Name Named(const char (&text)[N]) {
  return {text, N - 1};
}

// The objects this reader walks, each with the members it reads, in slot order.
enum class Kind : std::uint8_t { Envelope, List, Items, Item, LabelDetails, Markup, Edit, Range, Position };

constexpr Name kEnvelope[] = {Named("jsonrpc"), Named("id"), Named("result"), Named("method"), Named("error")};
enum EnvelopeSlot { kJsonrpc, kId, kResult, kMethod, kError };
constexpr Name kList[] = {Named("isIncomplete"), Named("items")};
enum ListSlot { kIsIncomplete, kItemsArray };
constexpr Name kItem[] = {Named("label"),         Named("labelDetails"),     Named("kind"),     Named("detail"),
                          Named("documentation"), Named("deprecated"),       Named("sortText"), Named("filterText"),
                          Named("insertText"),    Named("insertTextFormat"), Named("textEdit")};
enum ItemSlot {
  kLabel,
  kLabelDetails,
  kItemKind,
  kItemDetail,
  kDocumentation,
  kDeprecated,
  kSortText,
  kFilterText,
  kInsertText,
  kInsertTextFormat,
  kTextEdit
};
constexpr Name kLabelDetailsNames[] = {Named("detail"), Named("description")};
constexpr Name kMarkup[] = {Named("kind"), Named("value")};
constexpr Name kEdit[] = {Named("range"), Named("newText")};
constexpr Name kRange[] = {Named("start"), Named("end")};
constexpr Name kPosition[] = {Named("line"), Named("character")};

// Each kind's names, in the order of Kind (none for the items array).
struct Names {
  const Name* names;
  std::size_t count;
};
template <std::size_t N>
constexpr Names Of(const Name (&names)[N]) {
  return {names, N};
}
constexpr Names kNames[] = {Of(kEnvelope), Of(kList), {nullptr, 0}, Of(kItem),    Of(kLabelDetailsNames),
                            Of(kMarkup),   Of(kEdit), Of(kRange),   Of(kPosition)};
constexpr std::size_t kKinds = sizeof kNames / sizeof kNames[0];
constexpr std::size_t kMostNames = 16;
static_assert(kKinds == static_cast<std::size_t>(Kind::Position) + 1, "a list of names for each kind");
static_assert(sizeof kItem / sizeof kItem[0] <= kMostNames, "a slot for each name");

bool IsName(const Name& name, const char* text, std::size_t length) {
  return name.length == length && SameNameBytes(name.text, text, length);
}

int SlotIn(Kind kind, const char* text, std::size_t length) {
  const Names& names = kNames[static_cast<std::size_t>(kind)];
  for (std::size_t slot = 0; slot < names.count; ++slot) {
    if (IsName(names.names[slot], text, length)) return static_cast<int>(slot);
  }
  return -1;
}

// Servers write every item's members in the same order: the member that followed a slot
// last time is tried first, which finds nearly every name at the first compare.
class SlotGuess {
 public:
  SlotGuess() {
    for (auto& kind : next_)
      for (auto& slot : kind) slot = kNone;
  }
  // The slot of the name after `previous`: a slot, kStart for the first name of an object,
  // kAfterUnread after a name not read.
  int Slot(Kind kind, std::uint8_t previous, const char* text, std::size_t length) {
    const auto k = static_cast<std::size_t>(kind);
    const std::uint8_t guess = next_[k][previous];
    if (guess != kNone && IsName(kNames[k].names[guess], text, length)) return guess;
    const int slot = SlotIn(kind, text, length);
    next_[k][previous] = slot < 0 ? kNone : static_cast<std::uint8_t>(slot);
    return slot;
  }
  static constexpr std::uint8_t kStart = kMostNames;
  static constexpr std::uint8_t kAfterUnread = kMostNames + 1;
  static constexpr std::uint8_t kNone = 0xFF;

 private:
  std::uint8_t next_[kKinds][kMostNames + 2];
};

// An item as the document read leaves it when the item has none of its members: reading
// from null and from an empty object give the same, down to positions of -1.
const CompletionItem& ItemWithoutMembers() {
  static const CompletionItem item = [] {
    CompletionItem empty;
    empty.Read(xObject());
    return empty;
  }();
  return item;
}

// A scalar the parser reported, as the document would hold it.
struct Scalar {
  enum Type { Null, Bool, Int, String, Other } type;
  bool boolean = false;
  int integer = 0;
  const char* text = nullptr;
  std::size_t length = 0;
};

constexpr int kNoSlot = -1;
constexpr int kUnread = -2;  // a member this reader does not read: its value is passed over

struct Frame {
  Kind kind;
  JsonObject* target;                         // what the object's members are read into (null for the envelope)
  int slot = kNoSlot;                         // the slot of the member whose value comes next
  std::uint8_t previous = SlotGuess::kStart;  // the slot of the last member read
  std::uint32_t seen = 0;
};

class CompletionEvents : public rapidjson::BaseReaderHandler<rapidjson::UTF8<>, CompletionEvents> {
 public:
  CompletionEvents(int id, CompletionList& list) : id_(id), list_(list) {}

  bool Null() { return Take({Scalar::Null}); }
  bool Bool(bool value) {
    Scalar scalar{Scalar::Bool};
    scalar.boolean = value;
    return Take(scalar);
  }
  // The document holds an int for every number in its range, whichever event reported it.
  bool Int(int value) { return TakeInt(value, true); }
  bool Uint(unsigned value) { return TakeInt(static_cast<int>(value), value <= INT_MAX); }
  bool Int64(std::int64_t value) { return TakeInt(static_cast<int>(value), value >= INT_MIN && value <= INT_MAX); }
  bool Uint64(std::uint64_t value) { return TakeInt(static_cast<int>(value), value <= INT_MAX); }
  bool Double(double) { return Take({Scalar::Other}); }
  bool RawNumber(const char*, rapidjson::SizeType, bool) { return Take({Scalar::Other}); }
  bool String(const char* text, rapidjson::SizeType length, bool) {
    Scalar scalar{Scalar::String};
    scalar.text = text;
    scalar.length = length;
    return Take(scalar);
  }
  bool StartObject() { return Open(false); }
  bool StartArray() { return Open(true); }
  bool Key(const char* text, rapidjson::SizeType length, bool);
  bool EndObject(rapidjson::SizeType) { return Close(); }
  bool EndArray(rapidjson::SizeType) { return Close(); }

  // True once the whole message was read and it answers `id`.
  bool Answered() const { return done_ && idSeen_; }
  const std::string& Jsonrpc() const { return jsonrpc_; }

 private:
  bool TakeInt(int value, bool fits) {
    if (!fits) return Take({Scalar::Other});
    Scalar scalar{Scalar::Int};
    scalar.integer = value;
    return Take(scalar);
  }
  bool Take(const Scalar& value);
  bool TakeEnvelope(int slot, const Scalar& value);
  bool TakeItem(CompletionItem& item, int slot, const Scalar& value);
  bool Open(bool array);
  bool OpenMember(const Frame& frame, int slot, bool array);
  bool Push(Kind kind, JsonObject* target) {
    if (depth_ == sizeof stack_ / sizeof stack_[0]) return false;
    stack_[depth_++] = {kind, target};
    return true;
  }
  Frame& Top() { return stack_[depth_ - 1]; }
  bool Close();

  const int id_;
  CompletionList& list_;
  // Envelope, list, items, item, edit, range, position: the deepest object read.
  Frame stack_[7];
  std::size_t depth_ = 0;
  std::size_t skipped_ = 0;  // depth inside a value passed over
  SlotGuess guess_;
  std::string jsonrpc_;
  bool idSeen_ = false;
  bool done_ = false;
};

bool IsString(const Scalar& value) { return value.type == Scalar::String; }
void Assign(std::string& target, const Scalar& value) { target.assign(value.text, value.length); }

bool CompletionEvents::Key(const char* text, rapidjson::SizeType length, bool) {
  if (skipped_ > 0) return true;
  Frame& frame = Top();
  const int slot = guess_.Slot(frame.kind, frame.previous, text, length);
  if (slot < 0) {
    frame.slot = kUnread;
    frame.previous = SlotGuess::kAfterUnread;
    return true;
  }
  frame.previous = static_cast<std::uint8_t>(slot);
  // A message with a method, or an error, is no reply for this reader; a second member of
  // the same name makes the first one count, which the document read judges.
  if (frame.kind == Kind::Envelope && (slot == kMethod || slot == kError)) return false;
  if (frame.seen >> slot & 1u) return false;
  frame.seen |= 1u << slot;
  frame.slot = slot;
  return true;
}

bool CompletionEvents::Take(const Scalar& value) {
  if (skipped_ > 0) return true;
  if (depth_ == 0) return false;  // a message that is not an object
  Frame& frame = Top();
  if (frame.kind == Kind::Items) {
    // A null element is an item with no members; any other scalar is a type error.
    if (value.type != Scalar::Null) return false;
    list_.items.push_back(ItemWithoutMembers());
    return true;
  }
  const int slot = frame.slot;
  frame.slot = kNoSlot;
  if (slot == kUnread) return true;
  if (frame.kind == Kind::Envelope) return TakeEnvelope(slot, value);
  // A null "items" is a type error; any other null member reads as a missing one.
  if (frame.kind == Kind::List && slot == kItemsArray) return false;
  if (value.type == Scalar::Null) return true;
  switch (frame.kind) {
    case Kind::List:
      if (value.type != Scalar::Bool) return false;
      list_.isIncomplete = value.boolean;
      return true;
    case Kind::Item:
      return TakeItem(*static_cast<CompletionItem*>(frame.target), slot, value);
    case Kind::LabelDetails: {
      if (!IsString(value)) return false;
      auto& details = *static_cast<CompletionItemLabelDetails*>(frame.target);
      Assign(slot == 0 ? details.detail : details.description, value);
      return true;
    }
    case Kind::Markup: {
      if (!IsString(value)) return false;
      auto& markup = *static_cast<MarkupContent*>(frame.target);
      Assign(slot == 0 ? markup.kind : markup.value, value);
      return true;
    }
    case Kind::Edit:
      if (slot != 1 || !IsString(value)) return false;
      Assign(static_cast<TextEdit*>(frame.target)->newText, value);
      return true;
    case Kind::Position: {
      if (value.type != Scalar::Int) return false;
      auto& position = *static_cast<Position*>(frame.target);
      (slot == 0 ? position.line : position.character) = value.integer;
      return true;
    }
    default:
      return false;
  }
}

bool CompletionEvents::TakeEnvelope(int slot, const Scalar& value) {
  switch (slot) {
    case kJsonrpc:
      if (value.type == Scalar::Null) return true;
      if (!IsString(value)) return false;
      Assign(jsonrpc_, value);
      return true;
    case kId:
      // Only the awaited id: a late answer to another request is the document read's.
      if (value.type != Scalar::Int || value.integer != id_) return false;
      idSeen_ = true;
      return true;
    default:
      // A null result leaves the list as it is; a result of another type is not a list.
      return slot == kResult && value.type == Scalar::Null;
  }
}

bool CompletionEvents::TakeItem(CompletionItem& item, int slot, const Scalar& value) {
  switch (slot) {
    case kItemKind:
    case kInsertTextFormat:
      if (value.type != Scalar::Int) return false;
      (slot == kItemKind ? item.kind : item.insertTextFormat) = value.integer;
      return true;
    case kDeprecated:
      if (value.type != Scalar::Bool) return false;
      item.deprecated = value.boolean;
      return true;
    case kLabelDetails:
    case kTextEdit:
      return false;
    default:
      break;
  }
  if (!IsString(value)) return false;
  switch (slot) {
    case kLabel:
      Assign(item.label, value);
      break;
    case kItemDetail:
      Assign(item.detail, value);
      break;
    case kDocumentation:
      Assign(item.documentation.value, value);
      break;
    case kSortText:
      Assign(item.sortText, value);
      break;
    case kFilterText:
      Assign(item.filterText, value);
      break;
    default:
      Assign(item.insertText, value);
      break;
  }
  return true;
}

bool CompletionEvents::Open(bool array) {
  if (skipped_ > 0) {
    ++skipped_;
    return true;
  }
  if (depth_ == 0) return !array && Push(Kind::Envelope, nullptr);
  Frame& frame = Top();
  if (frame.kind == Kind::Items) {
    if (array) return false;
    list_.items.push_back(ItemWithoutMembers());
    return Push(Kind::Item, &list_.items.back());
  }
  const int slot = frame.slot;
  frame.slot = kNoSlot;
  if (slot == kUnread) {
    skipped_ = 1;
    return true;
  }
  return OpenMember(frame, slot, array);
}

bool CompletionEvents::OpenMember(const Frame& frame, int slot, bool array) {
  JsonObject* target = frame.target;
  switch (frame.kind) {
    case Kind::Envelope:
      // The result is read only into the reply to the awaited id, so "id" must come first.
      if (slot != kResult || !idSeen_) return false;
      if (array) return Push(Kind::Items, nullptr);
      list_.isIncomplete = false;  // a list object says so, or it is complete
      return Push(Kind::List, nullptr);
    case Kind::List:
      return array && slot == kItemsArray && Push(Kind::Items, nullptr);
    case Kind::Item: {
      if (array) return false;
      auto& item = *static_cast<CompletionItem*>(target);
      if (slot == kLabelDetails) return Push(Kind::LabelDetails, &item.labelDetails);
      if (slot == kDocumentation) return Push(Kind::Markup, &item.documentation);
      return slot == kTextEdit && Push(Kind::Edit, &item.textEdit);
    }
    case Kind::Edit:
      return !array && slot == 0 && Push(Kind::Range, &static_cast<TextEdit*>(target)->range);
    case Kind::Range: {
      if (array) return false;
      auto& range = *static_cast<Range*>(target);
      return Push(Kind::Position, slot == 0 ? &range.start : &range.end);
    }
    default:
      return false;
  }
}

bool CompletionEvents::Close() {
  if (skipped_ > 0) {
    --skipped_;
    return true;
  }
  done_ = --depth_ == 0;
  return true;
}

// RapidJSON's read of `text`, which takes every form of JSON: Read or Stopped.
PlainRead GeneralRead(const std::string& text, CompletionEvents& events) {
  rapidjson::Reader reader;
  rapidjson::StringStream stream(text.c_str());
  const bool failed = reader.Parse<rapidjson::kParseIterativeFlag>(stream, events).IsError();
  return failed ? PlainRead::Stopped : PlainRead::Read;
}

// Whether `text` was read whole into `list` as the reply to `id`. Most replies are in the
// plain form, which the plain reader takes fastest; one it declines goes to RapidJSON's.
bool ReadEvents(const std::string& text, int id, CompletionList& list, std::string& jsonrpc) {
  const std::size_t itemsBefore = list.items.size();
  const bool incompleteBefore = list.isIncomplete;
  for (const bool plain : {true, false}) {
    CompletionEvents events(id, list);
    PlainRead read = PlainRead::Stopped;
    try {
      read = plain ? ReadPlainJson(text.c_str(), events) : GeneralRead(text, events);
    } catch (const std::exception&) {
    }
    if (read == PlainRead::Read && events.Answered()) {
      jsonrpc = events.Jsonrpc();
      return true;
    }
    list.items.erase(list.items.begin() + static_cast<std::ptrdiff_t>(itemsBefore), list.items.end());
    list.isIncomplete = incompleteBefore;
    if (read != PlainRead::Declined) return false;
  }
  return false;
}

}  // namespace

bool ReadCompletionReply(const std::string& text, int id, ResponseMessage& response) {
  auto* list = dynamic_cast<CompletionList*>(response.result);
  // Items that keep their JSON need the document's text of each; a byte order mark is the
  // document read's to skip.
  if (!list || list->keepItemJson || (!text.empty() && static_cast<unsigned char>(text[0]) == 0xEF)) return false;
  // Room for items of 256 bytes: the count is known only at the end, and the capacity a
  // long list of small items leaves unused is address space, not memory, until it is used.
  list->items.reserve(list->items.size() + text.size() / 256);
  std::string jsonrpc;
  if (!ReadEvents(text, id, *list, jsonrpc)) return false;
  response.jsonrpc = std::move(jsonrpc);
  response.id = id;
  return true;
}

}  // namespace LSP
