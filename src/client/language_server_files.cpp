// The connection's watching of files changed on disk: the notifier lives from the initialize
// reply to shutdown, takes the server's registrations on the output reader's thread and
// sends its batches from its own.
#include "client/language_server.h"

#include "vexil/client/uri.h"

namespace LSP {
namespace {

constexpr char kRegister[] = "client/registerCapability";
constexpr char kUnregister[] = "client/unregisterCapability";
constexpr char kWatchedFiles[] = "workspace/didChangeWatchedFiles";

// The folders to watch: the workspace folders, or else the root path.
std::vector<std::string> WatchedFolders(const xServerInitialise& init) {
  std::vector<std::string> folders;
  for (const WorkspaceFolder& folder : init.workspaceFolders) {
    std::string path = UriToFile(folder.uri.c_str());
    if (!path.empty()) folders.push_back(path);
  }
  if (folders.empty() && !init.rootPath.empty()) folders.push_back(init.rootPath);
  return folders;
}

}  // namespace

void LanguageServer::WatchFiles(const xServerInitialise& init) {
  if (!features.watchedFiles) return;
  StopWatchingFiles();
  vexil::WatchedFilesNotifier::Callbacks callbacks{
      [this](const std::string& changes) {
        JsonParams params;
        std::string error;
        if (!params.Parse(changes.c_str(), error)) return;
        NotificationMessage message(kWatchedFiles, &params);
        server.SendFromAnyThread(message.ToJSON());
      },
      [this](const std::string& text) { server.ErrorLater(text); }};
  try {
    auto notifier = std::make_unique<vexil::WatchedFilesNotifier>(WatchedFolders(init), std::move(callbacks));
    std::lock_guard<std::mutex> lock(filesMutex);
    files = std::move(notifier);
  } catch (const std::exception& e) {
    server.ErrorLater(std::string("Cannot watch files: ") + e.what() + "\n");
    return;
  }
  const auto take = [this](bool registering) {
    return [this, registering](const std::string& params, std::string& error) {
      std::lock_guard<std::mutex> lock(filesMutex);
      if (!files) return true;
      return registering ? files->Register(params, error) : files->Unregister(params, error);
    };
  };
  server.AnswerWith(kRegister, take(true));
  server.AnswerWith(kUnregister, take(false));
}

void LanguageServer::FilesInitialized() {
  std::lock_guard<std::mutex> lock(filesMutex);
  if (files) files->ServerInitialized();
}

void LanguageServer::StopWatchingFiles() {
  server.AnswerWith(kRegister, nullptr);
  server.AnswerWith(kUnregister, nullptr);
  std::unique_ptr<vexil::WatchedFilesNotifier> stopped;
  {
    std::lock_guard<std::mutex> lock(filesMutex);
    stopped = std::move(files);
  }
}

}  // namespace LSP
