// Semantic colouring: the legend a server announces with its capabilities, the tokens of
// a whole document as the protocol packs them (five relative integers each), and the
// decoding of those integers into tokens with absolute positions and names.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/feature_params.h"

namespace LSP {

// Names for the numbers in the tokens: a type index, and one bit per modifier.
class VEXIL_API SemanticTokensLegend : public Params {
 public:
  SemanticTokensLegend() { name = "legend"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  std::vector<std::string> tokenTypes;
  std::vector<std::string> tokenModifiers;
};

// The server's "semanticTokensProvider". "range" and "full" may each be a boolean or an
// options object; an object counts as supported, and `fullDelta` tells whether "full"
// also offers deltas.
class VEXIL_API SemanticTokensOptions : public Params {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  bool IsProvided() const { return full || range; }

  SemanticTokensLegend legend;
  bool range = false;
  bool full = false;
  bool fullDelta = false;
};

class VEXIL_API SemanticTokensParams : public TextDocumentParams {};

// One token decoded: zero-based line, start and length in the position encoding's units
// (UTF-16 unless another was agreed), its type and modifiers by name. A type index the
// legend does not name gives type "", modifier bits beyond the legend are left out.
struct VEXIL_API SemanticToken {
  int line = 0;
  int character = 0;
  int length = 0;
  int typeIndex = 0;
  unsigned modifierBits = 0;
  std::string type;
  std::vector<std::string> modifiers;
};

// The reply to "textDocument/semanticTokens/full".
class VEXIL_API SemanticTokens : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  // The tokens with absolute positions, in the order sent. Each token is five numbers
  // relative to the one before; an incomplete group at the end is left out.
  std::vector<SemanticToken> Decode(const SemanticTokensLegend& legend) const;

  std::string resultId;
  std::vector<unsigned> data;
};

}  // namespace LSP
