// Applying a workspace edit to files, all or nothing: every file is read, edited and
// written beside itself before the first is replaced, and a replacement that fails puts
// back the files replaced before it.
#include "vexil/client/workspace_edits.h"

#include "client/file_replace.h"
#include "transport/process.h"
#include "vexil/client/uri.h"

namespace LSP {
namespace {

struct FileChange {
  std::string target;    // the file itself, links resolved
  std::string original;  // its text before the edit
  std::string text;      // its text after
  std::string temporary; // the new text on disk, until it replaces the file
};

// Removes the temporary files that did not replace their targets.
class Temporaries {
 public:
  explicit Temporaries(std::vector<FileChange>& files) : files_(files) {}
  ~Temporaries() {
    for (FileChange& file : files_)
      if (!file.temporary.empty()) vexil::RemoveFile(file.temporary);
  }
  Temporaries(const Temporaries&) = delete;
  Temporaries& operator=(const Temporaries&) = delete;

 private:
  std::vector<FileChange>& files_;
};

// The change of the file `uri` names, added on first sight with the file's text.
FileChange* Find(std::vector<FileChange>& files, const std::string& uri, std::string& error) {
  const std::string path = UriToFile(uri.c_str());
  if (path.empty()) {
    error = "Not a local file: " + uri;
    return nullptr;
  }
  std::string target;
  if (!vexil::ResolveFile(path, target, error)) return nullptr;
  for (FileChange& file : files)
    if (file.target == target) return &file;
  FileChange file;
  file.target = target;
  if (!vexil::ReadWholeFile(target, file.original, error)) return nullptr;
  file.text = file.original;
  files.push_back(std::move(file));
  return &files.back();
}

bool Replace(const std::string& target, const std::string& text, std::string& error) {
  std::string temporary;
  const bool replaced = vexil::WriteBeside(target, text, temporary, error) &&
                        vexil::ReplaceWith(temporary, target, error);
  if (!replaced && !temporary.empty()) vexil::RemoveFile(temporary);
  return replaced;
}

}  // namespace

bool ApplyWorkspaceEdit(const WorkspaceEdit& edit, std::string& error, PositionEncoding encoding) {
  std::vector<FileChange> files;
  files.reserve(edit.documentChanges.size());  // pointers into it stay valid
  for (const TextDocumentEdit& document : edit.documentChanges) {
    if (document.edits.empty()) continue;
    FileChange* file = Find(files, document.textDocument.uri, error);
    if (!file) return false;
    std::string why;
    if (!ApplyTextEdits(file->text, document.edits, why, encoding)) {
      error = "Cannot edit " + file->target + ": " + why;
      return false;
    }
  }
  Temporaries temporaries(files);
  for (FileChange& file : files)
    if (file.text != file.original && !vexil::WriteBeside(file.target, file.text, file.temporary, error)) return false;
  for (std::size_t k = 0; k < files.size(); ++k) {
    if (files[k].temporary.empty()) continue;
    if (!vexil::ReplaceWith(files[k].temporary, files[k].target, error)) {
      for (std::size_t done = 0; done < k; ++done) {
        std::string why;
        if (files[done].text != files[done].original && !Replace(files[done].target, files[done].original, why))
          error += "; not restored: " + why;
      }
      return false;
    }
    files[k].temporary.clear();
  }
  return true;
}

}  // namespace LSP

namespace vexil {

bool SystemFailure(std::string& error, const char* what, const std::string& path) {
  std::string reason = LastSystemErrorText();
  while (!reason.empty() && (reason.back() == '\n' || reason.back() == '\r')) reason.pop_back();
  error = std::string(what) + " " + path + ": " + reason;
  return false;
}

}  // namespace vexil
