// The trace callback of the command-line host. The library gives the callback no user
// data, so its state is the process's own, behind one lock.
#include "trace_sink.h"

#include <cstdio>
#include <mutex>
#include <vector>

namespace cli {
namespace {

std::mutex sinkMutex;
bool echoing = true;
std::vector<std::string> errorLines;

// The text's lines without carriage returns or blank lines, each after "title: ".
void Print(const std::string& title, const std::string& text) {
  std::size_t start = 0;
  while (start < text.size()) {
    std::size_t end = text.find('\n', start);
    if (end == std::string::npos) end = text.size();
    std::string line = text.substr(start, end - start);
    if (!line.empty() && line.back() == '\r') line.pop_back();
    if (!line.empty()) std::fprintf(stderr, "%s: %s\n", title.c_str(), line.c_str());
    start = end + 1;
  }
}

std::string OneLine(const std::string& text) {
  std::string line;
  for (char c : text) {
    if (c == '\n' || c == '\r') {
      if (!line.empty() && line.back() != ' ') line += ' ';
    } else {
      line += c;
    }
  }
  while (!line.empty() && line.back() == ' ') line.pop_back();
  return line;
}

}  // namespace

void TraceToStderr(TraceType type, const char* title, const char* text) {
  std::lock_guard<std::mutex> lock(sinkMutex);
  if (std::string(title) == "Error") errorLines.push_back(OneLine(text));
  if (echoing) Print(title, text);
}

void EchoTrace(bool echo) {
  std::lock_guard<std::mutex> lock(sinkMutex);
  echoing = echo;
}

int TraceErrors() {
  std::lock_guard<std::mutex> lock(sinkMutex);
  return static_cast<int>(errorLines.size());
}

std::string TraceError(int index) {
  std::lock_guard<std::mutex> lock(sinkMutex);
  return index >= 0 && index < static_cast<int>(errorLines.size()) ? errorLines[static_cast<std::size_t>(index)] : "";
}

}  // namespace cli
