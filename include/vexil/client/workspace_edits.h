// Applying a server's workspace edit (a rename, a code action, "workspace/applyEdit") to
// the files on disk.
#pragma once

#include <string>

#include "vexil/client/text_edits.h"

namespace LSP {

// Applies every document change of `edit` to its file, all or nothing. Every file is read
// and edited in memory and its new text written to a temporary file beside it before any
// file is replaced; each is then replaced whole by renaming, through symbolic links to
// their target, keeping the file's permissions. A document listed twice takes its edits
// in turn. On failure (a URI that names no local file, a file that cannot be read or
// written, edits that overlap) no file is changed, `error` says why and the result is
// false. Files whose text stays the same are not written.
VEXIL_API bool ApplyWorkspaceEdit(const WorkspaceEdit& edit, std::string& error,
                                  PositionEncoding encoding = PositionEncoding::Utf16);

}  // namespace LSP
