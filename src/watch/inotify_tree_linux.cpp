// Bookkeeping of inotify descriptors per watch, and the translation of raw events into
// per-watch batches: created, renamed and moved-in directories are watched and scanned at once.
#include "watch/inotify_tree.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/inotify.h>
#include <sys/stat.h>

#include <cerrno>
#include <charconv>
#include <cstring>
#include <system_error>

namespace vexil {
namespace {

constexpr std::uint32_t kEntryEvents = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_DELETE_SELF |
                                       IN_MOVE_SELF | IN_EXCL_UNLINK | IN_ONLYDIR;
// A file's new content is complete when its writer closes it. Each write (IN_MODIFY) would
// report one ordinary save several times, the first of them before the content is all there.
constexpr std::uint32_t kContentEvents = IN_CLOSE_WRITE;
constexpr std::uint32_t kSelfEvents = IN_DELETE_SELF | IN_MOVE_SELF | IN_IGNORED | IN_UNMOUNT;
// Ancestors held open while a new subtree is walked, each one descriptor.
constexpr int kHeldLevels = 32;

using Event = InotifyTree::Event;

bool IsDirectory(const Event& event) { return (event.mask & IN_ISDIR) != 0; }

std::string JoinPath(const std::string& directory, const std::string& name) {
  if (directory.empty() || directory.back() == '/') return directory + name;
  return directory + "/" + name;
}

// The entries of `descriptors` at `prefix` and below: one key range, as prefixes end in '/'.
std::pair<std::map<std::string, int>::iterator, std::map<std::string, int>::iterator> SubtreeRange(
    std::map<std::string, int>& descriptors, const std::string& prefix) {
  const auto first = descriptors.lower_bound(prefix);
  auto last = first;
  while (last != descriptors.end() && last->first.compare(0, prefix.size(), prefix) == 0) ++last;
  return {first, last};
}

std::string Marked(const std::string& relative, bool isDirectory) {
  return isDirectory ? relative + "/" : relative;
}

struct Entry {
  std::string name;
  bool isDirectory;
};

// Read whole before any subdirectory is walked, which may close the directory first.
// The entries come straight from getdents64 on the descriptor we hold: a directory stream
// would cost a dup(), an fstat() and an fcntl() more per directory, which a tree of tens of
// thousands of directories feels at start-up.
std::vector<Entry> ListDirectory(int directory) {
  std::vector<Entry> entries;
  alignas(dirent64) char buffer[32768];
  for (;;) {
    const ssize_t got = getdents64(directory, buffer, sizeof buffer);
    if (got <= 0) return entries;
    for (ssize_t offset = 0; offset < got;) {
      const auto* entry = reinterpret_cast<const dirent64*>(buffer + offset);
      offset += entry->d_reclen;
      if (std::strcmp(entry->d_name, ".") == 0 || std::strcmp(entry->d_name, "..") == 0) continue;
      bool isDirectory = entry->d_type == DT_DIR;
      struct stat status;
      if (entry->d_type == DT_UNKNOWN)
        isDirectory = fstatat(directory, entry->d_name, &status, AT_SYMLINK_NOFOLLOW) == 0 && S_ISDIR(status.st_mode);
      entries.push_back({entry->d_name, isDirectory});
    }
  }
}

void ParseEvents(const char* buffer, std::size_t length, std::vector<Event>& events) {
  std::size_t offset = 0;
  while (offset + sizeof(inotify_event) <= length) {
    inotify_event header;
    std::memcpy(&header, buffer + offset, sizeof header);
    const char* name = buffer + offset + sizeof header;
    events.push_back({header.wd, header.mask, header.cookie, std::string(name, strnlen(name, header.len))});
    offset += sizeof header + header.len;
  }
}

bool HasMoveTo(const std::vector<Event>& events, std::size_t after, std::uint32_t cookie) {
  for (std::size_t i = after + 1; i < events.size(); ++i)
    if ((events[i].mask & IN_MOVED_TO) && events[i].cookie == cookie) return true;
  return false;
}

// Where the events to hold back begin: at the first move out, among those after `carried`,
// whose other half is not there (yet). Its events are handled in order, so the ones after
// it wait with it.
std::size_t HoldFrom(const std::vector<Event>& events, std::size_t carried) {
  for (std::size_t i = carried; i < events.size(); ++i)
    if ((events[i].mask & IN_MOVED_FROM) && !HasMoveTo(events, i, events[i].cookie)) return i;
  return events.size();
}

}  // namespace

std::string CannotWatchDirectory(const std::string& path, int error) {
  return "Cannot watch directory: " + path + ": " + std::error_code(error, std::generic_category()).message() + "\n";
}

// Both halves of one move, by cookie.
struct InotifyTree::MoveHalves {
  const Event* from = nullptr;
  const Event* to = nullptr;
};

int InotifyTree::AddRoot(const std::string& root, std::int64_t id, const WatchOptions& options,
                         ReadOutcome& outcome) {
  Identity identity;
  UniqueFd directory;
  const int descriptor = WatchDirectory(root, kByPath, true, options.modifications, identity, directory);
  if (descriptor < 0) return errno;
  projects_[id] = {root, options, {}};
  const Owners owners{{id, ""}};
  Adopt(descriptor, identity, owners);
  if (!options.recursive) return 0;
  // What exists already is not a change; only its directories need watching.
  for (const Entry& entry : ListDirectory(directory.Get())) {
    if (!entry.isDirectory) continue;
    AddSubtree(JoinPath(root, entry.name), {{id, entry.name + "/"}}, outcome, false,
               {directory.Get(), entry.name.c_str(), 1});
  }
  return 0;
}

void InotifyTree::Remove(std::int64_t id) {
  DetachSubtree(id, "");
  projects_.erase(id);
}

ReadOutcome InotifyTree::Translate(const char* buffer, std::size_t length) {
  std::vector<Event> events = std::move(held_);
  held_.clear();
  const std::size_t carried = events.size();  // held once already: they go now
  ParseEvents(buffer, length, events);
  const std::size_t end = length == 0 ? events.size() : HoldFrom(events, carried);
  held_.assign(events.begin() + static_cast<std::ptrdiff_t>(end), events.end());
  events.resize(end);

  Moves moves;
  for (const Event& event : events) {
    if (event.mask & IN_MOVED_FROM) moves[event.cookie].from = &event;
    if (event.mask & IN_MOVED_TO) moves[event.cookie].to = &event;
  }
  ReadOutcome outcome;
  for (const Event& event : events) Handle(event, moves, outcome);
  return outcome;
}

void InotifyTree::Handle(const Event& event, const Moves& moves, ReadOutcome& outcome) {
  if (event.mask & IN_Q_OVERFLOW) {
    outcome.overflow = true;
    return;
  }
  const auto found = owners_.find(event.descriptor);
  if (found == owners_.end()) return;  // dropped by us while the kernel still queued it
  const Owners owners = found->second;   // a copy: handling may add or drop descriptors
  if (event.mask & kSelfEvents) {
    SelfChanged(event, owners, outcome);
  } else if (event.mask & IN_CREATE) {
    Created(event, owners, outcome);
  } else if (event.mask & IN_DELETE) {
    Removed(event, owners, outcome);
  } else if (event.mask & IN_MOVED_FROM) {
    MovedFrom(event, moves.at(event.cookie).to, owners, outcome);
  } else if (event.mask & IN_MOVED_TO) {
    MovedTo(event, moves.at(event.cookie).from, owners, outcome);
  } else if (event.mask & kContentEvents) {
    Modified(event, owners, outcome);
  }
}

void InotifyTree::Created(const Event& event, const Owners& owners, ReadOutcome& outcome) {
  Owners below;
  for (const auto& [id, prefix] : owners) {
    Report(outcome, id, prefix + event.name, IsDirectory(event), kActionAdded);
    if (IsDirectory(event) && Recursive(id)) below.emplace(id, prefix + event.name + "/");
  }
  // Already renamed away, the directory is watched when that rename is handled.
  if (!below.empty()) AddSubtree(EntryPath(below), below, outcome, true);
}

void InotifyTree::Removed(const Event& event, const Owners& owners, ReadOutcome& outcome) {
  // A removed directory's own descriptor is released when the kernel ignores it.
  for (const auto& [id, prefix] : owners)
    Report(outcome, id, prefix + event.name, IsDirectory(event), kActionRemoved);
}

void InotifyTree::MovedFrom(const Event& event, const Event* partner, const Owners& owners,
                            ReadOutcome& outcome) {
  const bool isDirectory = IsDirectory(event);
  Owners unwatched;  // renamed before its watch could be added, or whose watch is another's now
  for (const auto& [id, prefix] : owners) {
    const std::string from = prefix + event.name;
    const std::string* target = partner ? PrefixIn(partner->descriptor, id) : nullptr;
    if (!target) {  // left this watch's tree
      Report(outcome, id, from, isDirectory, kActionRemoved);
      if (isDirectory) DetachSubtree(id, from + "/");
      continue;
    }
    const std::string to = *target + partner->name;
    outcome.batches[id].AddRename(Marked(from, isDirectory), Marked(to, isDirectory));
    if (!isDirectory) {
      ReportModified(outcome, id, to);
    } else if (!Recursive(id)) {
      continue;
    } else if (WatchesRenamed(id, from + "/", to)) {
      MoveSubtree(id, from + "/", to + "/");
    } else {
      unwatched.emplace(id, to + "/");
    }
  }
  if (!unwatched.empty()) AddSubtree(EntryPath(unwatched), unwatched, outcome, true);
}

void InotifyTree::MovedTo(const Event& event, const Event* partner, const Owners& owners, ReadOutcome& outcome) {
  Owners arrived;
  for (const auto& [id, prefix] : owners) {
    // A move within this watch's tree was reported whole by its first half.
    if (partner && PrefixIn(partner->descriptor, id)) continue;
    Report(outcome, id, prefix + event.name, IsDirectory(event), kActionAdded);
    if (!IsDirectory(event)) {
      ReportModified(outcome, id, prefix + event.name);
    } else if (Recursive(id)) {
      arrived.emplace(id, prefix + event.name + "/");
    }
  }
  if (!arrived.empty()) AddSubtree(EntryPath(arrived), arrived, outcome, true);
}

void InotifyTree::Modified(const Event& event, const Owners& owners, ReadOutcome& outcome) {
  if (IsDirectory(event)) return;
  for (const auto& [id, prefix] : owners) ReportModified(outcome, id, prefix + event.name);
}

void InotifyTree::SelfChanged(const Event& event, const Owners& owners, ReadOutcome& outcome) {
  // Below a root, a directory's own move or removal is reported by its parent.
  for (const auto& [id, prefix] : owners)
    if (prefix.empty()) RootGone(id, outcome);
  if (!(event.mask & IN_IGNORED)) return;
  const auto found = owners_.find(event.descriptor);
  if (found == owners_.end()) return;
  for (const auto& [id, prefix] : found->second) {
    auto& descriptors = projects_[id].descriptors;
    const auto entry = descriptors.find(prefix);
    if (entry != descriptors.end() && entry->second == event.descriptor) descriptors.erase(entry);
  }
  owners_.erase(found);
  identities_.erase(event.descriptor);
}

void InotifyTree::Report(ReadOutcome& outcome, std::int64_t id, const std::string& relative, bool isDirectory,
                         unsigned action) const {
  outcome.batches[id].Add(Marked(relative, isDirectory), action);
}

void InotifyTree::ReportModified(ReadOutcome& outcome, std::int64_t id, const std::string& relative) const {
  const auto project = projects_.find(id);
  if (project != projects_.end() && project->second.options.modifications)
    outcome.batches[id].Add(relative, kActionModified);
}

bool InotifyTree::Recursive(std::int64_t id) const {
  const auto project = projects_.find(id);
  return project != projects_.end() && project->second.options.recursive;
}

void InotifyTree::RootGone(std::int64_t id, ReadOutcome& outcome) {
  outcome.rootsGone.push_back(id);
  Remove(id);
}

void InotifyTree::AddSubtree(const std::string& path, const Owners& owners, ReadOutcome& outcome,
                             bool reportEntries, const Opening& from) {
  bool modifications = false;
  for (const auto& owner : owners) modifications = modifications || projects_.at(owner.first).options.modifications;
  Identity identity;
  UniqueFd directory;
  const int descriptor = WatchDirectory(path, from, false, modifications, identity, directory);
  if (descriptor < 0) {
    // Gone, replaced or renamed before we got to it: its parent's events tell the rest.
    if (errno == ENOENT || errno == ENOTDIR || errno == ELOOP) return;
    if (errno != ENOSPC) return outcome.errors.push_back(CannotWatchDirectory(path, errno));
    std::vector<std::int64_t> ids;
    for (const auto& owner : owners) ids.push_back(owner.first);
    outcome.limited.emplace_back(std::move(ids), path);
    return;
  }
  Adopt(descriptor, identity, owners);
  const std::vector<Entry> entries = ListDirectory(directory.Get());
  // Subdirectories are opened relative to this one while it is held open, a lookup of one
  // name instead of a whole path; a deep tree must not hold one open directory per level,
  // so below kHeldLevels they are opened by path.
  const int heldLevels = from.heldLevels + 1;
  if (heldLevels > kHeldLevels) directory.Reset();
  for (const Entry& entry : entries) {
    for (const auto& [id, prefix] : owners) {
      if (reportEntries) Report(outcome, id, prefix + entry.name, entry.isDirectory, kActionAdded);
    }
    if (!entry.isDirectory) continue;
    Owners below;
    for (const auto& [id, prefix] : owners) below.emplace(id, prefix + entry.name + "/");
    const Opening opening = directory.Valid() ? Opening{directory.Get(), entry.name.c_str(), heldLevels} : kByPath;
    AddSubtree(JoinPath(path, entry.name), below, outcome, reportEntries, opening);
  }
}

int InotifyTree::WatchDirectory(const std::string& path, const Opening& from, bool followLink, bool modifications,
                                Identity& identity, UniqueFd& directory) const {
  // Below the root a symbolic link is an entry of its own, never a directory to descend into.
  const int flags = O_RDONLY | O_DIRECTORY | O_CLOEXEC | (followLink ? 0 : O_NOFOLLOW);
  directory = UniqueFd(from.parent >= 0 ? openat(from.parent, from.name, flags) : open(path.c_str(), flags));
  if (!directory.Valid()) return -1;
  struct stat status;
  if (fstat(directory.Get(), &status) != 0) return -1;
  identity = {status.st_dev, status.st_ino};
  // Another watch may share the directory and want other events: masks only ever grow.
  const std::uint32_t mask = kEntryEvents | IN_MASK_ADD | (modifications ? kContentEvents : 0);
  // Formatted by hand: this runs once for every directory of the tree.
  static constexpr char kOpenedPrefix[] = "/proc/self/fd/";
  char opened[sizeof kOpenedPrefix + 12];
  std::memcpy(opened, kOpenedPrefix, sizeof kOpenedPrefix - 1);
  *std::to_chars(opened + sizeof kOpenedPrefix - 1, opened + sizeof opened - 1, directory.Get()).ptr = '\0';
  const int descriptor = inotify_add_watch(fd_, opened, mask);
  if (descriptor >= 0 || errno != ENOENT) return descriptor;
  // Without /proc, by name, which may belong to another directory by now.
  return inotify_add_watch(fd_, path.c_str(), mask | (followLink ? 0 : IN_DONT_FOLLOW));
}

void InotifyTree::Adopt(int descriptor, const Identity& identity, const Owners& owners) {
  identities_[descriptor] = identity;
  Owners& current = owners_[descriptor];
  for (const auto& [id, prefix] : owners) {
    auto& descriptors = projects_[id].descriptors;
    const auto previous = current.find(id);
    if (previous != current.end() && previous->second != prefix) descriptors.erase(previous->second);
    current[id] = prefix;
    descriptors[prefix] = descriptor;
  }
}

void InotifyTree::Disown(int descriptor, std::int64_t id) {
  const auto found = owners_.find(descriptor);
  if (found == owners_.end()) return;
  found->second.erase(id);
  if (!found->second.empty()) return;  // another watch still needs it
  inotify_rm_watch(fd_, descriptor);
  owners_.erase(found);
  identities_.erase(descriptor);
}

void InotifyTree::DetachSubtree(std::int64_t id, const std::string& prefix) {
  const auto project = projects_.find(id);
  if (project == projects_.end()) return;
  auto& descriptors = project->second.descriptors;
  const auto [first, last] = SubtreeRange(descriptors, prefix);
  for (auto entry = first; entry != last; ++entry) Disown(entry->second, id);
  descriptors.erase(first, last);
}

void InotifyTree::MoveSubtree(std::int64_t id, const std::string& from, const std::string& to) {
  auto& descriptors = projects_[id].descriptors;
  const auto [first, last] = SubtreeRange(descriptors, from);
  const std::map<std::string, int> moved(first, last);
  descriptors.erase(first, last);
  for (const auto& [prefix, descriptor] : moved) {
    const std::string renamed = to + prefix.substr(from.size());
    descriptors[renamed] = descriptor;
    owners_[descriptor][id] = renamed;
  }
}

bool InotifyTree::WatchesRenamed(std::int64_t id, const std::string& fromPrefix, const std::string& to) const {
  const Project& project = projects_.at(id);
  const auto watched = project.descriptors.find(fromPrefix);
  if (watched == project.descriptors.end()) return false;
  struct stat status;
  // Renamed on again or removed since: the events still to come say where it went.
  if (lstat(JoinPath(project.root, to).c_str(), &status) != 0) return true;
  const auto identity = identities_.find(watched->second);
  return identity == identities_.end() ||
         (identity->second.device == status.st_dev && identity->second.inode == status.st_ino);
}

const std::string* InotifyTree::PrefixIn(int descriptor, std::int64_t id) const {
  const auto found = owners_.find(descriptor);
  if (found == owners_.end()) return nullptr;
  const auto owner = found->second.find(id);
  return owner == found->second.end() ? nullptr : &owner->second;
}

std::string InotifyTree::EntryPath(const Owners& below) const {
  const auto& [id, prefix] = *below.begin();
  return JoinPath(projects_.at(id).root, prefix.substr(0, prefix.size() - 1));
}

}  // namespace vexil
