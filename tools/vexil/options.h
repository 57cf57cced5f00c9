// GNU-style options for every command: "--name VALUE" or "--name=VALUE", flags without a
// value, "--" ending the options, and the errors a person needs to correct a command line.
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

namespace cli {

using Arguments = std::vector<std::string>;

// Bad usage: one line saying what was wrong; the caller points to the command's help.
class UsageError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// A failure to report in one line with exit status 1, such as a missing file.
class Failure : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// "--help" was given: the command prints its help and succeeds.
struct HelpRequested {};

// Walks a command's arguments one at a time.
class OptionReader {
 public:
  explicit OptionReader(const Arguments& arguments) : arguments_(arguments) {}

  bool Done() const { return at_ >= arguments_.size(); }
  // The argument at hand, as written.
  const std::string& Current() const { return arguments_[at_]; }
  // Whether the argument at hand is the option `name`, alone or as "name=VALUE".
  bool Is(const std::string& name) const;
  bool IsOption() const { return Current().size() > 1 && Current()[0] == '-'; }
  // The value of the option at hand (after '=' or the next argument), moving past both.
  std::string Value();
  // Moves past a flag; a value given to it is refused.
  void Flag();
  // The argument at hand as it is, moving past it.
  std::string Take() { return arguments_[at_++]; }
  // Throws HelpRequested for "--help", UsageError for any other option.
  [[noreturn]] void Unknown() const;

 private:
  std::string Name() const { return Current().substr(0, Current().find('=')); }

  const Arguments& arguments_;
  std::size_t at_ = 0;
};

// `text` as a number from 1 up; throws UsageError naming `what` otherwise.
int PositiveNumber(const std::string& text, const std::string& what);

}  // namespace cli
