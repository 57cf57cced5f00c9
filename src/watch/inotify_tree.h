// Which watches cover which inotify descriptors, and how the raw events of one read become
// batches per watch. Linux only; the caller holds the monitor's lock.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <unordered_map>
#include <vector>

#include "watch/monitor_backend.h"
#include "watch/unique_fd_posix.h"

namespace vexil {

// What one read of the inotify descriptor amounts to.
struct ReadOutcome {
  std::map<std::int64_t, BatchList> batches;
  // Watches whose root was deleted or moved away; the tree has already forgotten them.
  std::vector<std::int64_t> rootsGone;
  // Subdirectories that could not be watched, as error texts...
  std::vector<std::string> errors;
  // ...except those that the system's limit on watches left out, with the watches they
  // belong to.
  std::vector<std::pair<std::vector<std::int64_t>, std::string>> limited;
  // The kernel dropped events: every watch may have missed some.
  bool overflow = false;
};

// The error text of a directory that cannot be watched, with the system's reason.
std::string CannotWatchDirectory(const std::string& path, int error);

class InotifyTree {
 public:
  // One raw inotify event, parsed.
  struct Event {
    int descriptor;
    std::uint32_t mask;
    std::uint32_t cookie;
    std::string name;
  };

  explicit InotifyTree(int inotifyFd) : fd_(inotifyFd) {}
  InotifyTree(const InotifyTree&) = delete;
  InotifyTree& operator=(const InotifyTree&) = delete;

  // Watches `root`, and with a recursive watch every directory below it, for watch `id`.
  // Returns 0, or the errno of the root's own watch; subdirectories that cannot be watched
  // go to `outcome`'s errors or, for the watch limit, its limited directories.
  int AddRoot(const std::string& root, std::int64_t id, const WatchOptions& options, ReadOutcome& outcome);
  // Forgets watch `id` and drops the descriptors no other watch needs.
  void Remove(std::int64_t id);
  // Turns the events of one read, after those held back from the read before, into batches,
  // following created and moved directories. A move out whose other half may be in the next
  // read is held back, with what came after it, for the next call; a call without bytes lets
  // everything held go.
  ReadOutcome Translate(const char* buffer, std::size_t length);
  bool Holding() const { return !held_.empty(); }

 private:
  // Prefix of a directory relative to each root that covers it: "" for the root, "a/b/" below.
  using Owners = std::map<std::int64_t, std::string>;
  struct Project {
    std::string root;
    WatchOptions options;
    std::map<std::string, int> descriptors;  // by prefix, so a subtree is one key range
  };
  struct Identity {
    dev_t device;
    ino_t inode;
  };
  struct MoveHalves;
  using Moves = std::unordered_map<std::uint32_t, MoveHalves>;

  void Handle(const Event& event, const Moves& moves, ReadOutcome& outcome);
  void Created(const Event& event, const Owners& owners, ReadOutcome& outcome);
  void Removed(const Event& event, const Owners& owners, ReadOutcome& outcome);
  void MovedFrom(const Event& event, const Event* partner, const Owners& owners, ReadOutcome& outcome);
  void MovedTo(const Event& event, const Event* partner, const Owners& owners, ReadOutcome& outcome);
  void Modified(const Event& event, const Owners& owners, ReadOutcome& outcome);
  void SelfChanged(const Event& event, const Owners& owners, ReadOutcome& outcome);

  void Report(ReadOutcome& outcome, std::int64_t id, const std::string& relative, bool isDirectory,
              unsigned action) const;
  // With a watch that asked for them: the file at `relative` has new content.
  void ReportModified(ReadOutcome& outcome, std::int64_t id, const std::string& relative) const;
  bool Recursive(std::int64_t id) const;
  // Where a directory is opened from: its parent, held open, and its name there; or, with
  // no parent, its path.
  struct Opening {
    int parent;
    const char* name;
    int heldLevels;  // ancestors held open, the parent included
  };
  static constexpr Opening kByPath{-1, nullptr, 0};
  // Watches `path` and its subdirectories for `owners`; with `reportEntries`, every entry
  // found is reported as added, since it may have appeared before the watch existed.
  void AddSubtree(const std::string& path, const Owners& owners, ReadOutcome& outcome, bool reportEntries,
                  const Opening& from = kByPath);
  // Opens the directory as a directory and watches it through that descriptor, so that the
  // watch, its identity and the listing are all of one directory whatever was renamed meanwhile.
  int WatchDirectory(const std::string& path, const Opening& from, bool followLink, bool modifications,
                     Identity& identity, UniqueFd& directory) const;
  void Adopt(int descriptor, const Identity& identity, const Owners& owners);
  void Disown(int descriptor, std::int64_t id);
  void DetachSubtree(std::int64_t id, const std::string& prefix);
  void MoveSubtree(std::int64_t id, const std::string& from, const std::string& to);
  // Whether watch `id` already watches the directory that was renamed from `fromPrefix` to
  // `to`; false when it never could, or when what it watches is another directory that
  // took the old name meanwhile.
  bool WatchesRenamed(std::int64_t id, const std::string& fromPrefix, const std::string& to) const;
  void RootGone(std::int64_t id, ReadOutcome& outcome);
  // The prefix under which watch `id` sees directory `descriptor`; null when it does not.
  const std::string* PrefixIn(int descriptor, std::int64_t id) const;
  // The path of the directory that the first of `below` names.
  std::string EntryPath(const Owners& below) const;

  int fd_;
  std::unordered_map<int, Owners> owners_;  // by inotify descriptor
  std::unordered_map<int, Identity> identities_;
  std::map<std::int64_t, Project> projects_;
  std::vector<Event> held_;
};

}  // namespace vexil
