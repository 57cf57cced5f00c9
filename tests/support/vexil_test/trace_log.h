// A record of every line the library traces, behind a plain callback any test may pass: the
// lines of servers, watchers and tasks, read back whole, by title, counted, searched or awaited.
#pragma once

#include <algorithm>
#include <chrono>
#include <string>
#include <vector>

#include "vexil/host/trace.h"
#include "vexil_test/support.h"

namespace vexil_test {

struct TraceLine {
  TraceType type;
  std::string title;
  std::string text;

  bool operator==(const TraceLine& other) const {
    return type == other.type && title == other.title && text == other.text;
  }
};

// Every line the library traces goes here; reader threads trace too, hence the guard.
class TraceLog {
 public:
  static void Callback(TraceType type, const char* title, const char* text) {
    shared_.Update([&] { lines_.push_back({type, title, text}); });
  }
  static void Clear() {
    shared_.Update([] { lines_.clear(); });
  }
  static std::vector<TraceLine> Lines() {
    return shared_.Read([] { return lines_; });
  }
  // The texts in order, optionally only those under `title`.
  static std::vector<std::string> Texts(const std::string& title = "") {
    std::vector<std::string> texts;
    for (const TraceLine& line : Lines()) {
      if (title.empty() || line.title == title) texts.push_back(line.text);
    }
    return texts;
  }
  static int Count(const std::string& text) {
    const std::vector<std::string> texts = Texts();
    return static_cast<int>(std::count(texts.begin(), texts.end(), text));
  }
  static bool Contains(const std::string& piece) {
    const std::vector<std::string> texts = Texts();
    return std::any_of(texts.begin(), texts.end(),
                       [&](const std::string& text) { return text.find(piece) != std::string::npos; });
  }
  // Waits until a traced line matches. Only the lines added since the last look are
  // searched: a command's output of 200,000 lines wakes the waiter at every line, and
  // searching all of them each time is quadratic.
  template <typename Match>
  static bool WaitUntilTraced(Match match, std::chrono::milliseconds limit = std::chrono::seconds(30)) {
    std::size_t searched = 0;
    return shared_.WaitUntil(
        [&] {
          const auto from = lines_.begin() + static_cast<std::ptrdiff_t>(std::min(searched, lines_.size()));
          searched = lines_.size();
          return std::find_if(from, lines_.end(), match) != lines_.end();
        },
        limit);
  }

 private:
  static inline Shared shared_;
  static inline std::vector<TraceLine> lines_;
};

}  // namespace vexil_test
