// The trace callback of the command-line host. The library gives the callback no user
// data, so its state is the process's own, behind one lock.
#include "trace_sink.h"

#include <algorithm>
#include <cstdio>
#include <deque>
#include <mutex>
#include <vector>

#include "commands.h"
#include "host_process.h"

namespace cli {
namespace {

// Output without a frame beyond this is no protocol, only a program talking.
constexpr std::size_t kFloodBytes = 64 * 1024;
constexpr std::size_t kSaidLines = 3;

// The beginnings of the library's own message lines; any other message text is what the
// program wrote (its output at a failed start, or stray bytes between messages).
const char* const kLibraryMessages[] = {"\nSent: ", "Reply: ", "Ignoring Reply: ", "JSON Parse Failed:",
                                        "Reply Exception: ", "Warning: "};

std::mutex sinkMutex;
LSP::TraceLevel shown = LSP::TraceLevel::Verbose;
std::vector<std::string> errorLines;
std::deque<std::string> said;  // the program's last lines on stderr
std::size_t unframed = 0;      // bytes of output seen outside frames
bool notAServer = false;
bool listening = false;  // for signs of a language server

bool StartsWith(const std::string& text, const char* prefix) { return text.rfind(prefix, 0) == 0; }

std::vector<std::string> Lines(const std::string& text) {
  std::vector<std::string> lines;
  std::size_t start = 0;
  while (start < text.size()) {
    std::size_t end = text.find('\n', start);
    if (end == std::string::npos) end = text.size();
    std::string line = text.substr(start, end - start);
    if (!line.empty() && line.back() == '\r') line.pop_back();
    if (!line.empty()) lines.push_back(line);
    start = end + 1;
  }
  return lines;
}

std::string OneLine(const std::string& text) {
  std::string line;
  for (const std::string& piece : Lines(text)) line += (line.empty() ? "" : " ") + piece;
  return line;
}

bool Shown(const std::string& title) {
  if (shown == LSP::TraceLevel::Verbose) return true;
  return shown == LSP::TraceLevel::Messages && title != "Verbose";
}

void Said(const std::string& text) {
  for (const std::string& line : Lines(text)) {
    said.push_back(line);
    if (said.size() > kSaidLines) said.pop_front();
  }
}

bool IsLibraryMessage(const std::string& text) {
  for (const char* prefix : kLibraryMessages)
    if (StartsWith(text, prefix)) return true;
  return false;
}

// Reads one line for what it tells of the program; true when it just proved that the
// program speaks no protocol.
bool Learn(const std::string& title, const std::string& text) {
  bool wasServer = !notAServer;
  if (title == "Verbose" && StartsWith(text, "Reply: ")) Said(text.substr(7));
  if (title == "Message" && !IsLibraryMessage(text)) {
    unframed += text.size();
    if (text.size() < kFloodBytes) Said(text);
  }
  if (title == "Error" && StartsWith(text, "Output: ")) unframed += text.size();
  if (title == "Message" && StartsWith(text, "Ignoring Reply: ") &&
      text.find("\"method\":\"initialize\"") != std::string::npos) {
    notAServer = true;
  }
  if (unframed >= kFloodBytes) notAServer = true;
  return wasServer && notAServer;
}

}  // namespace

void TraceToStderr(TraceType, const char* title, const char* text) {
  const std::string name = title;
  bool ended = false;
  {
    std::lock_guard<std::mutex> lock(sinkMutex);
    if (name == "Error") errorLines.push_back(OneLine(text));
    ended = listening && Learn(name, text);
    if (Shown(name) && !notAServer) {
      for (std::string line : Lines(text)) {
        std::replace(line.begin(), line.end(), kWordSeparator, ' ');  // a task's split command line
        std::fprintf(stderr, "%s: %s\n", title, line.c_str());
      }
    }
  }
  if (ended) EndChildren();
}

void ShowTrace(LSP::TraceLevel level) {
  std::lock_guard<std::mutex> lock(sinkMutex);
  shown = level;
}

void ListenForServer() {
  std::lock_guard<std::mutex> lock(sinkMutex);
  listening = true;
}

int TraceErrors() {
  std::lock_guard<std::mutex> lock(sinkMutex);
  return static_cast<int>(errorLines.size());
}

std::string TraceError(int index) {
  std::lock_guard<std::mutex> lock(sinkMutex);
  return index >= 0 && index < static_cast<int>(errorLines.size()) ? errorLines[static_cast<std::size_t>(index)] : "";
}

std::string ServerSaid() {
  std::lock_guard<std::mutex> lock(sinkMutex);
  std::string line;
  for (const std::string& piece : said) line += (line.empty() ? "" : " ") + piece;
  return line;
}

bool NotAServer() {
  std::lock_guard<std::mutex> lock(sinkMutex);
  return notAServer;
}

}  // namespace cli
