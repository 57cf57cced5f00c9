// Reading of semantic token replies and of the server's legend, and the decoding of the
// packed relative integers.
#include "vexil/protocol/semantic_tokens.h"

#include "json/json_errors.h"
#include "json/rapidjson.h"

namespace LSP {
namespace {

constexpr std::size_t kGroup = 5;  // line delta, start delta, length, type, modifiers
// The model's wording for lists, with the JSON library's type number.
constexpr char kWrongType[] = "Expecting a %s JSON object but found %d JSON object .";

// "full" and "range" are `boolean | {}`; a number or a text counts as not supported.
bool Supported(const xObject& member) {
  if (member.IsObject()) return true;
  return member.Value().IsBool() && member.Value().GetBool();
}

void NameToken(SemanticToken& token, const SemanticTokensLegend& legend) {
  if (token.typeIndex >= 0 && static_cast<std::size_t>(token.typeIndex) < legend.tokenTypes.size())
    token.type = legend.tokenTypes[static_cast<std::size_t>(token.typeIndex)];
  for (std::size_t bit = 0; bit < legend.tokenModifiers.size() && bit < 32; ++bit)
    if (token.modifierBits & (1u << bit)) token.modifiers.push_back(legend.tokenModifiers[bit]);
}

}  // namespace

void SemanticTokensLegend::Read(const xObject& value) {
  tokenTypes = value.Strings("tokenTypes");
  tokenModifiers = value.Strings("tokenModifiers");
}

void SemanticTokensLegend::Write(xWriter& writer) {
  writer.Strings("tokenTypes", tokenTypes);
  writer.Strings("tokenModifiers", tokenModifiers);
}

void SemanticTokensOptions::Read(const xObject& value) {
  legend.Read(value.Object("legend"));
  range = Supported(value.Object("range"));
  xObject fullMember = value.Object("full");
  full = Supported(fullMember);
  fullDelta = fullMember.IsObject() && fullMember.Bool("delta");
}

// The numbers are unsigned 32-bit integers: a modifier set with its 32nd bit does not fit
// an int, so the array is read here rather than with xObject::Integers.
void SemanticTokens::Read(const xObject& value) {
  resultId = value.String("resultId");
  xObject array = value.Object("data");
  if (array.IsNull()) return;
  if (!array.IsArray()) ThrowFormatted(kWrongType, "array", static_cast<int>(array.Value().GetType()));
  data.reserve(array.Value().Size());
  for (const JsonValue& number : array.Value().GetArray()) {
    if (!number.IsUint()) ThrowFormatted(kWrongType, "uint", static_cast<int>(number.GetType()));
    data.push_back(number.GetUint());
  }
}

std::vector<SemanticToken> SemanticTokens::Decode(const SemanticTokensLegend& legend) const {
  std::vector<SemanticToken> tokens;
  tokens.reserve(data.size() / kGroup);
  // Unsigned, so that absurd deltas wrap instead of overflowing.
  unsigned line = 0;
  unsigned character = 0;
  for (std::size_t at = 0; at + kGroup <= data.size(); at += kGroup) {
    const unsigned deltaLine = data[at];
    // A token on a new line counts its start from the line's beginning.
    character = deltaLine == 0 ? character + data[at + 1] : data[at + 1];
    line += deltaLine;
    SemanticToken token;
    token.line = static_cast<int>(line);
    token.character = static_cast<int>(character);
    token.length = static_cast<int>(data[at + 2]);
    token.typeIndex = static_cast<int>(data[at + 3]);
    token.modifierBits = data[at + 4];
    NameToken(token, legend);
    tokens.push_back(std::move(token));
  }
  return tokens;
}

}  // namespace LSP
