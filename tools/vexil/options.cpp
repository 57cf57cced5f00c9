// Reading GNU-style options, shared by every command of the `vexil` host.
#include "options.h"

#include <cstdlib>

namespace cli {

bool OptionReader::Is(const std::string& name) const { return !Done() && Name() == name; }

std::string OptionReader::Value() {
  std::string name = Name();
  std::size_t equals = Current().find('=');
  if (equals != std::string::npos) return Take().substr(equals + 1);
  if (at_ + 1 >= arguments_.size()) throw UsageError("option '" + name + "' needs a value");
  at_ += 2;
  return arguments_[at_ - 1];
}

void OptionReader::Flag() {
  if (Current().find('=') != std::string::npos) throw UsageError("option '" + Name() + "' takes no value");
  ++at_;
}

void OptionReader::Unknown() const {
  if (Name() == "--help" || Name() == "-h") throw HelpRequested();
  if (IsOption()) throw UsageError("unknown option '" + Name() + "'");
  throw UsageError("unexpected argument '" + Current() + "'");
}

int PositiveNumber(const std::string& text, const std::string& what) {
  char* end = nullptr;
  long value = std::strtol(text.c_str(), &end, 10);
  if (text.empty() || *end != '\0' || value < 1 || value > 1000000000) {
    throw UsageError(what + " must be a positive number, not '" + text + "'");
  }
  return static_cast<int>(value);
}

}  // namespace cli
