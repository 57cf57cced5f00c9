// Splitting a command line into words, and the hidden command that runs such words.
#include "run_words.h"

#include "commands.h"
#include "options.h"

namespace cli {

const char kWordSeparator = '\x1f';  // the unit separator: in no command line or file name

std::vector<std::string> SplitWords(const std::string& text) {
  std::vector<std::string> words;
  std::string word;
  bool inWord = false;
  char quote = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    char c = text[i];
    if (quote == '\'') {
      if (c == '\'') quote = 0;
      else word += c;
    } else if (quote == '"') {
      if (c == '"') quote = 0;
      else if (c == '\\' && i + 1 < text.size() && (text[i + 1] == '"' || text[i + 1] == '\\')) word += text[++i];
      else word += c;
    } else if (c == ' ' || c == '\t' || c == '\n') {
      if (inWord) words.push_back(word);
      word.clear();
      inWord = false;
    } else {
      inWord = true;
      if (c == '\'' || c == '"') quote = c;
      else if (c == '\\' && i + 1 < text.size()) word += text[++i];
      else word += c;
    }
  }
  if (quote) throw UsageError(std::string("unmatched ") + quote + " in '" + text + "'");
  if (inWord) words.push_back(word);
  return words;
}

int RunWords(const std::string& words) {
  std::vector<std::string> split;
  std::size_t start = 1;  // after the leading separator
  while (start <= words.size()) {
    std::size_t end = words.find(kWordSeparator, start);
    if (end == std::string::npos) end = words.size();
    split.push_back(words.substr(start, end - start));
    start = end + 1;
  }
  return RunProgram(split);
}

}  // namespace cli
