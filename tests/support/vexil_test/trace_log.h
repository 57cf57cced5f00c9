// A record of every line the library traces, behind a plain callback any test may pass: the
// lines of servers, watchers and tasks, read back whole, by title, counted or searched.
#pragma once

#include <algorithm>
#include <mutex>
#include <string>
#include <vector>

#include "vexil/host/trace.h"

namespace vexil_test {

struct TraceLine {
  std::string title;
  std::string text;
};

// Every line the library traces goes here; reader threads trace too, hence the lock.
class TraceLog {
 public:
  static void Callback(TraceType, const char* title, const char* text) {
    std::lock_guard<std::mutex> lock(mutex_);
    lines_.push_back({title, text});
  }
  static void Clear() {
    std::lock_guard<std::mutex> lock(mutex_);
    lines_.clear();
  }
  static std::vector<TraceLine> Lines() {
    std::lock_guard<std::mutex> lock(mutex_);
    return lines_;
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

 private:
  static inline std::mutex mutex_;
  static inline std::vector<TraceLine> lines_;
};

}  // namespace vexil_test
