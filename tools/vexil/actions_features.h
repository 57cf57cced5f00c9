// Performing the actions of the newer requests (code actions, highlights, folding, selection
// ranges, semantic tokens, inlay hints, rename preparation, call hierarchies, commands).
#pragma once

#include "actions.h"
#include "columns.h"

namespace cli {

// The params of a request at the action's position, its document opened first.
template <typename P>
P Positioned(Session& session, const Action& action) {
  P params;
  params.textDocument.uri = session.Document(action.path);
  params.position = ProtocolPosition(TextOf(action.path), action.line, action.column);
  return params;
}

// Asks the server for what `action` (one of the newer kinds) wants to know.
void AskFeature(Session& session, const Action& action, Outcome& outcome);
// With --apply: takes the code action the session's choice names (or the preferred or only
// one), writes its edit and runs its command; a failure when none can be taken.
void ApplyCodeAction(Session& session, Outcome& outcome);

}  // namespace cli
