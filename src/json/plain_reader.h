// A reader of JSON in the plain form servers write, for the replies read most: it reports the
// events RapidJSON's reader reports, reads strings where they lie, and gives up on other forms.
#pragma once

#include <climits>
#include <cstddef>
#include <cstdint>
#include <string>

namespace LSP {

enum class PlainRead {
  Read,      // the text is one JSON value, and the handler took every event of it
  Stopped,   // the handler refused an event
  Declined,  // the text is not JSON, or not in a form this reader takes: the general parser's
};

namespace plain {

// Bytes a string holds as they are: all but the quote, the backslash and control bytes,
// which end a run of them. Other bytes are copied unchecked, as the general parser does.
struct PlainBytes {
  bool plain[256];
  constexpr PlainBytes() : plain() {
    for (int byte = 0x20; byte < 256; ++byte) plain[byte] = byte != '"' && byte != '\\';
  }
};
inline constexpr PlainBytes kPlainBytes;

inline bool IsPlain(char byte) { return kPlainBytes.plain[static_cast<unsigned char>(byte)]; }
inline bool IsDigit(char byte) { return byte >= '0' && byte <= '9'; }
inline bool IsSpace(char byte) { return byte == ' ' || byte == '\n' || byte == '\r' || byte == '\t'; }

inline int HexDigit(char byte) {
  if (IsDigit(byte)) return byte - '0';
  if (byte >= 'a' && byte <= 'f') return byte - 'a' + 10;
  if (byte >= 'A' && byte <= 'F') return byte - 'A' + 10;
  return -1;
}

// The code unit of the four hex digits at `text`, or -1.
inline long Hex4(const char* text) {
  long unit = 0;
  for (int i = 0; i < 4; ++i) {
    const int digit = HexDigit(text[i]);  // a NUL stops the look before the end of the text
    if (digit < 0) return -1;
    unit = unit * 16 + digit;
  }
  return unit;
}

inline void AppendUtf8(std::string& out, unsigned long point) {
  if (point < 0x80) {
    out += static_cast<char>(point);
  } else if (point < 0x800) {
    out += static_cast<char>(0xC0 | point >> 6);
    out += static_cast<char>(0x80 | (point & 0x3F));
  } else if (point < 0x10000) {
    out += static_cast<char>(0xE0 | point >> 12);
    out += static_cast<char>(0x80 | (point >> 6 & 0x3F));
    out += static_cast<char>(0x80 | (point & 0x3F));
  } else {
    out += static_cast<char>(0xF0 | point >> 18);
    out += static_cast<char>(0x80 | (point >> 12 & 0x3F));
    out += static_cast<char>(0x80 | (point >> 6 & 0x3F));
    out += static_cast<char>(0x80 | (point & 0x3F));
  }
}

// The byte a one-letter escape stands for, or 0 for a letter that is no escape.
inline char Unescaped(char letter) {
  switch (letter) {
    case '"':
    case '\\':
    case '/':
      return letter;
    case 'b':
      return '\b';
    case 'f':
      return '\f';
    case 'n':
      return '\n';
    case 'r':
      return '\r';
    case 't':
      return '\t';
    default:
      return 0;
  }
}

// Containers open deeper than this are the general parser's, which has no such limit.
constexpr std::size_t kDeepest = 32;
// Integers of more digits than this, and exponents of more than two, are the general
// parser's too: only there can a number be too big for it.
constexpr std::ptrdiff_t kLongestInteger = 18;
constexpr std::ptrdiff_t kLongestExponent = 2;

template <typename Handler>
class Reader {
 public:
  Reader(const char* text, Handler& handler) : at_(text), handler_(handler) {}

  PlainRead Read() {
    SkipSpace();
    if (!Value()) return failure_;
    while (depth_ > 0) {
      if (!NextInContainer()) return failure_;
    }
    SkipSpace();
    // The text ends at its NUL, as it does for the general parser.
    return *at_ == '\0' ? PlainRead::Read : PlainRead::Declined;
  }

 private:
  struct Container {
    bool object;
    unsigned count;
  };

  bool Stop() {
    failure_ = PlainRead::Stopped;
    return false;
  }
  static bool Decline() { return false; }  // failure_ is Declined until a handler refuses

  void SkipSpace() {
    while (IsSpace(*at_)) ++at_;
  }

  // After a value in the innermost container: the next value, or the container's end.
  bool NextInContainer() {
    Container& container = containers_[depth_ - 1];
    ++container.count;
    SkipSpace();
    if (*at_ == ',') {
      ++at_;
      SkipSpace();
      return (!container.object || Key()) && Value();
    }
    if (*at_ != (container.object ? '}' : ']')) return Decline();
    ++at_;
    --depth_;
    const bool taken = container.object ? handler_.EndObject(container.count) : handler_.EndArray(container.count);
    return taken || Stop();
  }

  // One value; for a container, its start and its first value down to a scalar or an empty
  // container, the rest being read by NextInContainer.
  bool Value() {
    for (;;) {
      switch (*at_) {
        case '{':
        case '[': {
          const bool object = *at_++ == '{';
          if (!(object ? handler_.StartObject() : handler_.StartArray())) return Stop();
          SkipSpace();
          if (*at_ == (object ? '}' : ']')) {
            ++at_;
            return (object ? handler_.EndObject(0) : handler_.EndArray(0)) || Stop();
          }
          if (depth_ == kDeepest) return Decline();
          containers_[depth_++] = {object, 0};
          if (object && !Key()) return false;
          continue;
        }
        case '"':
          return String(false);
        case 'n':
          return Literal("null") && (handler_.Null() || Stop());
        case 't':
          return Literal("true") && (handler_.Bool(true) || Stop());
        case 'f':
          return Literal("false") && (handler_.Bool(false) || Stop());
        default:
          return Number();
      }
    }
  }

  // A member's name and its colon.
  bool Key() {
    if (*at_ != '"' || !String(true)) return false;
    SkipSpace();
    if (*at_ != ':') return Decline();
    ++at_;
    SkipSpace();
    return true;
  }

  bool Literal(const char* word) {
    for (; *word; ++word, ++at_) {
      if (*at_ != *word) return Decline();  // stops at the text's NUL
    }
    return true;
  }

  bool String(bool key) {
    const char* begin = ++at_;
    while (IsPlain(*at_)) ++at_;
    if (*at_ == '"') return Report(key, begin, at_++ - begin);
    if (*at_ != '\\') return Decline();
    unescaped_.assign(begin, at_);
    while (*at_ == '\\') {
      if (!Escape()) return Decline();
      begin = at_;
      while (IsPlain(*at_)) ++at_;
      unescaped_.append(begin, at_);
    }
    if (*at_ != '"') return Decline();
    ++at_;
    return Report(key, unescaped_.data(), static_cast<std::ptrdiff_t>(unescaped_.size()));
  }

  bool Report(bool key, const char* text, std::ptrdiff_t length) {
    const auto size = static_cast<unsigned>(length);
    return (key ? handler_.Key(text, size, true) : handler_.String(text, size, true)) || Stop();
  }

  // The escape at the backslash, appended to unescaped_. A high surrogate must be followed
  // by a low one; a lone low one is left to the general parser, whose versions differ on it.
  bool Escape() {
    const char letter = at_[1];
    if (letter != 'u') {
      const char byte = Unescaped(letter);
      if (byte == 0) return false;
      unescaped_ += byte;
      at_ += 2;
      return true;
    }
    long point = Hex4(at_ + 2);
    if (point < 0 || (point >= 0xDC00 && point <= 0xDFFF)) return false;
    at_ += 6;
    if (point >= 0xD800 && point <= 0xDBFF) {
      const long low = at_[0] == '\\' && at_[1] == 'u' ? Hex4(at_ + 2) : -1;
      if (low < 0xDC00 || low > 0xDFFF) return false;
      point = ((point - 0xD800) << 10 | (low - 0xDC00)) + 0x10000;
      at_ += 6;
    }
    AppendUtf8(unescaped_, static_cast<unsigned long>(point));
    return true;
  }

  // Reported as the general parser reports it: Uint and Int where it does; every other
  // number, which its handler would get as Int64, Uint64 or Double, as a raw number.
  bool Number() {
    const char* begin = at_;
    const bool minus = *at_ == '-';
    if (minus) ++at_;
    const char* digits = at_;
    if (*at_ == '0') {
      ++at_;
    } else {
      if (!IsDigit(*at_)) return Decline();
      while (IsDigit(*at_)) ++at_;
    }
    const std::ptrdiff_t integerDigits = at_ - digits;
    if (integerDigits > kLongestInteger) return Decline();
    bool integer = true;
    if (*at_ == '.') {
      integer = false;
      if (!IsDigit(*++at_)) return Decline();
      while (IsDigit(*at_)) ++at_;
    }
    if (*at_ == 'e' || *at_ == 'E') {
      integer = false;
      if (*++at_ == '+' || *at_ == '-') ++at_;
      const char* exponent = at_;
      while (IsDigit(*at_)) ++at_;
      if (at_ == exponent || at_ - exponent > kLongestExponent) return Decline();
    }
    if (integer && integerDigits <= 10) {
      std::uint64_t value = 0;
      for (const char* digit = digits; digit < at_; ++digit) value = value * 10 + static_cast<unsigned>(*digit - '0');
      if (!minus && value <= UINT_MAX) return handler_.Uint(static_cast<unsigned>(value)) || Stop();
      if (minus && value <= 0x80000000u)
        return handler_.Int(static_cast<int>(0u - static_cast<unsigned>(value))) || Stop();
    }
    return handler_.RawNumber(begin, static_cast<unsigned>(at_ - begin), true) || Stop();
  }

  const char* at_;
  Handler& handler_;
  Container containers_[kDeepest];
  std::size_t depth_ = 0;
  std::string unescaped_;  // a string with escapes, decoded
  PlainRead failure_ = PlainRead::Declined;
};

}  // namespace plain

// Reads the NUL-terminated `text` into `handler` (a RapidJSON handler that takes RawNumber),
// with the events RapidJSON's reader reports for it, strings included: their bytes are valid
// until the next event. Numbers RapidJSON would report as Int64, Uint64 or Double come as their
// text, which a handler converting it may round otherwise than RapidJSON does. A text it does
// not take is Declined with no event promised right.
template <typename Handler>
PlainRead ReadPlainJson(const char* text, Handler& handler) {
  return plain::Reader<Handler>(text, handler).Read();
}

}  // namespace LSP
