// Reading registrations of watched files and matching changes against them: a plain glob
// pattern against the absolute path (and, leniently, the path within its workspace folder),
// a relative pattern against the path below its base.
#include "client/file_watchers.h"

#include <initializer_list>

#include "client/path_style.h"
#include "json/rapidjson.h"
#include "vexil/client/uri.h"
#include "vexil/json/json.h"
#include "watch/no_case.h"

namespace vexil {
namespace {

using LSP::JsonValue;

const char kWatchedFilesMethod[] = "workspace/didChangeWatchedFiles";
constexpr unsigned kAllKinds = 7;

const JsonValue* Member(const JsonValue& object, const char* name) {
  if (!object.IsObject()) return nullptr;
  const auto found = object.FindMember(name);
  return found == object.MemberEnd() ? nullptr : &found->value;
}

std::string Text(const JsonValue* value) {
  return value && value->IsString() ? std::string(value->GetString(), value->GetStringLength()) : std::string();
}

// The array `names` (the first present) of the params in `text`; null, with `error` set,
// when the params are not an object holding one.
const JsonValue* ParamsArray(LSP::xReader& reader, const std::string& text, std::initializer_list<const char*> names,
                             std::string& error) {
  if (!reader.Parse(text)) {
    error = reader.Error();
    return nullptr;
  }
  for (const char* name : names) {
    const JsonValue* array = Member(reader.Root().Value(), name);
    if (array && array->IsArray()) return array;
  }
  error = std::string("Invalid params: expected an object with an array \"") + *names.begin() + "\"";
  return nullptr;
}

// A directory's path with '/' separators and no trailing one (unless it is the root).
std::string DirectoryPath(const std::string& path) {
  std::string slashed = SlashSeparated(path);
  if (slashed.size() > 1 && slashed.back() == '/') slashed.pop_back();
  return slashed;
}

// The directory a relative pattern's base names: a URI, or a workspace folder's.
std::string BaseDirectory(const JsonValue& base) {
  const std::string uri = base.IsString() ? Text(&base) : Text(Member(base, "uri"));
  return DirectoryPath(UriToFile(uri.c_str()));
}

// `relative` is `path` below `base` ("" for the base itself); false when it is not below.
bool Below(const std::string& path, const std::string& base, std::string& relative) {
  if (base.empty() || path.size() < base.size()) return false;
  const std::string head = path.substr(0, base.size());
  if (PathsIgnoreCase() ? CompareNoCase(head.c_str(), base.c_str()) != 0 : head != base) return false;
  std::string::size_type from = base.size();
  if (from < path.size() && base.back() != '/' && path[from++] != '/') return false;
  relative = path.substr(from);
  return true;
}

}  // namespace

bool FileWatcherRegistry::Register(const std::string& params, std::string& error) {
  LSP::xReader reader;
  const JsonValue* registrations = ParamsArray(reader, params, {"registrations"}, error);
  if (!registrations) return false;
  const bool ignoreCase = PathsIgnoreCase();
  for (const JsonValue& registration : registrations->GetArray()) {
    if (Text(Member(registration, "method")) != kWatchedFilesMethod) continue;
    registered_ = true;
    std::vector<Watcher>& watchers = registrations_[Text(Member(registration, "id"))];
    watchers.clear();
    const JsonValue* options = Member(registration, "registerOptions");
    const JsonValue* list = options ? Member(*options, "watchers") : nullptr;
    if (!list || !list->IsArray()) continue;
    for (const JsonValue& watcher : list->GetArray()) {
      const JsonValue* glob = Member(watcher, "globPattern");
      const JsonValue* kind = Member(watcher, "kind");
      const unsigned bits = kind && kind->IsUint() ? kind->GetUint() & kAllKinds : kAllKinds;
      if (glob && glob->IsString()) {
        watchers.push_back({GlobPattern(SlashSeparated(Text(glob)), ignoreCase), "", false, bits});
      } else if (const JsonValue* base = glob ? Member(*glob, "baseUri") : nullptr) {
        const std::string pattern = SlashSeparated(Text(Member(*glob, "pattern")));
        const std::string directory = BaseDirectory(*base);
        if (!directory.empty()) watchers.push_back({GlobPattern(pattern, ignoreCase), directory, true, bits});
      }
    }
  }
  return true;
}

bool FileWatcherRegistry::Unregister(const std::string& params, std::string& error) {
  LSP::xReader reader;
  const JsonValue* removals = ParamsArray(reader, params, {"unregisterations", "unregistrations"}, error);
  if (!removals) return false;
  for (const JsonValue& removal : removals->GetArray())
    if (Text(Member(removal, "method")) == kWatchedFilesMethod) registrations_.erase(Text(Member(removal, "id")));
  return true;
}

bool FileWatcherRegistry::Wants(const std::string& path, const std::string& folder, FileChangeType type) const {
  if (!registered_) return true;
  const std::string slashed = SlashSeparated(path);
  std::string inFolder;
  const bool hasFolderPath = Below(slashed, DirectoryPath(folder), inFolder);
  const unsigned bit = 1u << (type - 1);
  for (const auto& [id, watchers] : registrations_) {
    for (const Watcher& watcher : watchers) {
      if (!(watcher.kind & bit)) continue;
      std::string relative;
      if (watcher.relative ? Below(slashed, watcher.base, relative) && watcher.pattern.Matches(relative)
                           : watcher.pattern.Matches(slashed) || (hasFolderPath && watcher.pattern.Matches(inFolder)))
        return true;
    }
  }
  return false;
}

}  // namespace vexil
