// The plain reader against RapidJSON's reader: where it takes a text, it must report the
// same events, stop where a handler refuses one, and take no text RapidJSON rejects.
#pragma once

#include <algorithm>
#include <cstdint>
#include <string>

#include "json/plain_reader.h"
#include "json/rapidjson.h"

namespace fuzz {

// Every event as text; strings carry their length, so any bytes in them stay unambiguous.
// Numbers beyond Int and Uint are "number": the plain reader reports them raw where
// RapidJSON converts them. Refuses the event numbered `refuse`, when there is one.
struct EventLog : rapidjson::BaseReaderHandler<rapidjson::UTF8<>, EventLog> {
  explicit EventLog(int refuse = -1) : refuse(refuse) {}
  bool Log(const std::string& event) {
    log += event + ' ';
    return events++ != refuse;
  }
  bool Text(char kind, const char* text, rapidjson::SizeType length) {
    return Log(kind + std::to_string(length) + ':' + std::string(text, length));
  }
  bool Null() { return Log("null"); }
  bool Bool(bool value) { return Log(value ? "true" : "false"); }
  bool Int(int value) { return Log("i" + std::to_string(value)); }
  bool Uint(unsigned value) { return Log("u" + std::to_string(value)); }
  bool Int64(std::int64_t) { return Log("number"); }
  bool Uint64(std::uint64_t) { return Log("number"); }
  bool Double(double) { return Log("number"); }
  bool RawNumber(const char* text, rapidjson::SizeType length, bool);
  bool String(const char* text, rapidjson::SizeType length, bool) { return Text('s', text, length); }
  bool Key(const char* text, rapidjson::SizeType length, bool) { return Text('k', text, length); }
  bool StartObject() { return Log("{"); }
  bool EndObject(rapidjson::SizeType members) { return Log("}" + std::to_string(members)); }
  bool StartArray() { return Log("["); }
  bool EndArray(rapidjson::SizeType elements) { return Log("]" + std::to_string(elements)); }

  int refuse;
  int events = 0;
  std::string log;
};

// RapidJSON's events for `text`, parsed as the library parses, and whether it parsed.
inline bool GeneralRead(const std::string& text, EventLog& events) {
  rapidjson::Reader reader;
  rapidjson::StringStream stream(text.c_str());
  return !reader.Parse<rapidjson::kParseIterativeFlag>(stream, events).IsError();
}

// A raw number is "number" when its text alone is one RapidJSON reports beyond Int and Uint.
inline bool EventLog::RawNumber(const char* text, rapidjson::SizeType length, bool) {
  EventLog alone;
  const std::string number(text, length);
  return Log(GeneralRead(number, alone) && alone.log == "number " ? "number" : "raw " + number);
}

// "read" or "declined" when the plain reader agrees with RapidJSON's on `text`; otherwise
// what it got wrong.
inline std::string PlainAgrees(const std::string& text) {
  EventLog general;
  EventLog plain;
  const bool parsed = GeneralRead(text, general);
  const LSP::PlainRead read = LSP::ReadPlainJson(text.c_str(), plain);
  if (read == LSP::PlainRead::Declined) return "declined";
  if (read != LSP::PlainRead::Read || !parsed || plain.log != general.log)
    return "read " + plain.log + "\nwhere RapidJSON " + (parsed ? "reads " + general.log : "fails");
  // A handler that refuses an event stops both readers there: any event of a short text, some
  // sixteen spread over a long one.
  for (int refuse = 0; refuse < general.events; refuse += std::max(1, general.events / 16)) {
    EventLog generalPart(refuse);
    EventLog plainPart(refuse);
    GeneralRead(text, generalPart);
    if (LSP::ReadPlainJson(text.c_str(), plainPart) != LSP::PlainRead::Stopped || plainPart.log != generalPart.log)
      return "stopped at " + plainPart.log + "\nwhere RapidJSON stops at " + generalPart.log;
  }
  return "read";
}

}  // namespace fuzz
