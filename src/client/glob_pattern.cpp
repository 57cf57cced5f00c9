// Matching of watched-file glob patterns: the alternatives are expanded once, each compiled
// to segments of tokens; a path is matched segment by segment, `**` by dynamic programming
// so that several of them never backtrack exponentially.
#include "client/glob_pattern.h"

namespace vexil {
namespace {

// Splits at '/', after dropping one trailing '/'; an empty text has no segments.
std::vector<std::string> SplitSegments(std::string text) {
  if (!text.empty() && text.back() == '/') text.pop_back();
  std::vector<std::string> segments;
  if (text.empty()) return segments;
  std::string::size_type start = 0;
  for (std::string::size_type slash; (slash = text.find('/', start)) != std::string::npos; start = slash + 1)
    segments.push_back(text.substr(start, slash - start));
  segments.push_back(text.substr(start));
  return segments;
}

// Where the class opened at `open` ends (its ']'), or npos when it never closes. A ']'
// right after the opening (and its negation) is a member, not the end.
template <typename Text>
std::size_t ClassEnd(const Text& text, std::size_t open) {
  std::size_t at = open + 1;
  if (at < text.size() && (text[at] == '!' || text[at] == '^')) ++at;
  if (at < text.size() && text[at] == ']') ++at;
  return text.find(']', at);
}

// The first `{...}` group whose braces balance: where it opens, its top-level commas, where
// it closes. False when there is none.
bool FindGroup(const std::string& pattern, std::vector<std::string::size_type>& cuts) {
  int depth = 0;
  for (std::string::size_type at = 0; at < pattern.size(); ++at) {
    const char c = pattern[at];
    if (c == '[') {
      const std::string::size_type end = ClassEnd(pattern, at);
      if (end != std::string::npos) at = end;
    } else if (c == '{') {
      if (depth++ == 0) cuts.assign(1, at);
    } else if (c == ',' && depth == 1) {
      cuts.push_back(at);
    } else if (c == '}' && depth > 0 && --depth == 0) {
      cuts.push_back(at);
      return true;
    }
  }
  return false;
}

void Expand(const std::string& pattern, std::vector<std::string>& out, std::size_t limit) {
  if (out.size() >= limit) return;
  std::vector<std::string::size_type> cuts;
  if (!FindGroup(pattern, cuts)) return out.push_back(pattern);
  const std::string prefix = pattern.substr(0, cuts.front());
  const std::string suffix = pattern.substr(cuts.back() + 1);
  for (std::size_t i = 0; i + 1 < cuts.size(); ++i)
    Expand(prefix + pattern.substr(cuts[i] + 1, cuts[i + 1] - cuts[i] - 1) + suffix, out, limit);
}

char32_t Lower(char32_t c) { return c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c; }
char32_t Upper(char32_t c) { return c >= 'a' && c <= 'z' ? c - 'a' + 'A' : c; }

// UTF-8 as characters. A byte that starts no valid sequence stands for itself, apart from
// every character (U+DC80 and up, as Python's "surrogateescape" has it).
std::u32string Decode(const std::string& text) {
  std::u32string decoded;
  for (std::size_t at = 0; at < text.size();) {
    const auto lead = static_cast<unsigned char>(text[at]);
    const std::size_t length = lead < 0x80 ? 1 : (lead >> 5) == 6 ? 2 : (lead >> 4) == 14 ? 3 : (lead >> 3) == 30 ? 4 : 0;
    char32_t c = length == 1 ? lead : length == 0 ? 0 : lead & (0x7F >> length);
    bool valid = length > 0 && at + length <= text.size();
    for (std::size_t i = 1; valid && i < length; ++i) {
      const auto next = static_cast<unsigned char>(text[at + i]);
      valid = (next >> 6) == 2;
      c = (c << 6) | (next & 0x3F);
    }
    decoded.push_back(valid ? c : 0xDC00 + lead);
    at += valid ? length : 1;
  }
  return decoded;
}

std::vector<std::u32string> DecodeAll(const std::vector<std::string>& texts) {
  std::vector<std::u32string> decoded;
  for (const std::string& text : texts) decoded.push_back(Decode(text));
  return decoded;
}

}  // namespace

GlobPattern::GlobPattern(const std::string& pattern, bool ignoreCase) : ignoreCase_(ignoreCase) {
  std::vector<std::string> expanded;
  Expand(pattern, expanded, kMaxAlternatives);
  for (const std::string& alternative : expanded) alternatives_.push_back(Compile(alternative));
}

bool GlobPattern::Matches(const std::string& path) const {
  const std::vector<std::u32string> segments = DecodeAll(SplitSegments(path));
  for (const Segments& alternative : alternatives_)
    if (MatchesSegments(alternative, segments)) return true;
  return false;
}

GlobPattern::Segments GlobPattern::Compile(const std::string& alternative) {
  Segments segments;
  for (const std::u32string& text : DecodeAll(SplitSegments(alternative))) segments.push_back(CompileSegment(text));
  return segments;
}

GlobPattern::Segment GlobPattern::CompileSegment(const std::u32string& text) {
  Segment segment{text == U"**", {}};
  for (std::size_t at = 0; at < text.size() && !segment.anyDepth; ++at) {
    const char32_t c = text[at];
    const std::size_t end = c == '[' ? ClassEnd(text, at) : std::u32string::npos;
    if (c == '*') {
      if (segment.tokens.empty() || segment.tokens.back().kind != Token::Kind::Star)
        segment.tokens.push_back({Token::Kind::Star, 0, false, {}});
    } else if (c == '?') {
      segment.tokens.push_back({Token::Kind::AnyChar, 0, false, {}});
    } else if (end == std::u32string::npos) {
      segment.tokens.push_back({Token::Kind::Literal, c, false, {}});
    } else {
      Token token{Token::Kind::Class, 0, text[at + 1] == '!' || text[at + 1] == '^', {}};
      for (std::size_t member = at + 1 + (token.negated ? 1 : 0); member < end; ++member) {
        const bool range = member + 2 < end && text[member + 1] == '-';
        token.ranges.emplace_back(text[member], text[range ? member + 2 : member]);
        if (range) member += 2;
      }
      segment.tokens.push_back(std::move(token));
      at = end;
    }
  }
  return segment;
}

// matches[p][s]: whether pattern segments from p on match path segments from s on.
bool GlobPattern::MatchesSegments(const Segments& pattern, const std::vector<std::u32string>& path) const {
  const std::size_t width = path.size() + 1;
  std::vector<char> matches((pattern.size() + 1) * width, 0);
  matches[pattern.size() * width + path.size()] = 1;
  for (std::size_t p = pattern.size(); p-- > 0;) {
    for (std::size_t s = path.size() + 1; s-- > 0;) {
      const bool more = s < path.size();
      char& here = matches[p * width + s];
      if (pattern[p].anyDepth) {
        here = matches[(p + 1) * width + s] || (more && matches[p * width + s + 1]);
      } else {
        here = more && matches[(p + 1) * width + s + 1] && MatchesSegment(pattern[p], path[s]);
      }
    }
  }
  return matches[0] != 0;
}

// Stars backtrack only to the last one seen: each other token takes exactly one character.
bool GlobPattern::MatchesSegment(const Segment& segment, const std::u32string& text) const {
  const std::vector<Token>& tokens = segment.tokens;
  const std::size_t none = tokens.size();
  std::size_t t = 0, s = 0, star = none, starFrom = 0;
  while (s < text.size()) {
    if (t < tokens.size() && tokens[t].kind == Token::Kind::Star) {
      star = t++;
      starFrom = s;
    } else if (t < tokens.size() && MatchesChar(tokens[t], text[s])) {
      ++t;
      ++s;
    } else if (star != none) {
      t = star + 1;
      s = ++starFrom;
    } else {
      return false;
    }
  }
  while (t < tokens.size() && tokens[t].kind == Token::Kind::Star) ++t;
  return t == tokens.size();
}

bool GlobPattern::MatchesChar(const Token& token, char32_t c) const {
  const auto same = [&](char32_t a, char32_t b) { return a == b || (ignoreCase_ && Lower(a) == Lower(b)); };
  if (token.kind == Token::Kind::AnyChar) return true;
  if (token.kind == Token::Kind::Literal) return same(token.literal, c);
  const auto within = [&](char32_t x) {
    for (const auto& [low, high] : token.ranges)
      if (low <= x && x <= high) return true;
    return false;
  };
  const bool member = within(c) || (ignoreCase_ && (within(Lower(c)) || within(Upper(c))));
  return member != token.negated;
}

}  // namespace vexil
