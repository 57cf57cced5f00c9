// The requests the round-trip benchmarks send, the same whichever client sends them.
#pragma once

#include "vexil/protocol/feature_params.h"

namespace bench {

// What the host asks: a position in a document.
template <typename Params>
Params AtPosition() {
  Params params;
  params.textDocument.uri = "file:///home/user/project/src/shapes.cpp";
  params.position.line = 12;
  params.position.character = 12;
  return params;
}

}  // namespace bench
