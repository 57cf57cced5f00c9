// Glob patterns as language servers register them for watched files: `*` and `?` within one
// path segment, `**` for any number of segments, `{a,b}` alternatives (nested too), and
// character classes `[0-9]` and `[!0-9]`. Patterns and paths separate segments with '/';
// both are UTF-8, and `?` or a class takes one character, whatever its length in bytes.
#pragma once

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace vexil {

class GlobPattern {
 public:
  // A pattern with more alternatives than this keeps the first ones: `{a,b}{c,d}...`
  // multiplies, and a server's pattern must not cost the IDE unbounded memory.
  static constexpr std::size_t kMaxAlternatives = 1024;

  // `ignoreCase`: ASCII letters match in either case, as file names do on Windows. Nothing
  // is malformed: an unclosed `[` or `{` stands for itself.
  GlobPattern(const std::string& pattern, bool ignoreCase);

  // Whether the whole of `path` matches; a trailing '/' (a directory's) is ignored.
  bool Matches(const std::string& path) const;

 private:
  struct Token {
    enum class Kind { Literal, AnyChar, Star, Class };
    Kind kind;
    char32_t literal;
    bool negated;
    std::vector<std::pair<char32_t, char32_t>> ranges;
  };
  struct Segment {
    bool anyDepth;  // "**": no segment, or any number of them
    std::vector<Token> tokens;
  };
  using Segments = std::vector<Segment>;

  static Segments Compile(const std::string& alternative);
  static Segment CompileSegment(const std::u32string& text);
  bool MatchesSegments(const Segments& pattern, const std::vector<std::u32string>& path) const;
  bool MatchesSegment(const Segment& segment, const std::u32string& text) const;
  bool MatchesChar(const Token& token, char32_t c) const;

  bool ignoreCase_;
  std::vector<Segments> alternatives_;
};

}  // namespace vexil
