// The base behaviour of every model class: reading itself from a document by its name,
// and the conversion of one object into the JSON text that goes on the wire.
#include "vexil/json/json.h"

namespace LSP {

void JsonObject::Read(xReader& reader) { Read(reader.Object(Name())); }

std::string ToJsonText(JsonObject& value) {
  xWriter writer;
  writer.Object(value, false);
  return writer.GetString();
}

}  // namespace LSP
