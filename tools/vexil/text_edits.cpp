// Diffing texts line by line. Files shown by the command-line host are small, so the
// diff is the plain longest-common-subsequence table.
#include "text_edits.h"

#include <algorithm>
#include <sstream>


namespace cli {
namespace {

constexpr std::size_t kContext = 3;

enum class Op { Keep, Remove, Add };

struct Step {
  Op op;
  std::size_t before;  // line index in the old text (for Keep and Remove)
  std::size_t after;   // line index in the new text (for Keep and Add)
};

std::vector<Step> Script(const std::vector<std::string>& a, const std::vector<std::string>& b) {
  std::vector<std::vector<std::size_t>> common(a.size() + 1, std::vector<std::size_t>(b.size() + 1, 0));
  for (std::size_t i = a.size(); i-- > 0;) {
    for (std::size_t j = b.size(); j-- > 0;) {
      common[i][j] = a[i] == b[j] ? common[i + 1][j + 1] + 1 : std::max(common[i + 1][j], common[i][j + 1]);
    }
  }
  std::vector<Step> steps;
  std::size_t i = 0;
  std::size_t j = 0;
  while (i < a.size() || j < b.size()) {
    // Removals before additions, as diffs are read.
    if (i < a.size() && j < b.size() && a[i] == b[j]) steps.push_back({Op::Keep, i++, j++});
    else if (i < a.size() && (j == b.size() || common[i + 1][j] >= common[i][j + 1])) steps.push_back({Op::Remove, i++, j});
    else steps.push_back({Op::Add, i, j++});
  }
  return steps;
}

// Writes the steps from `first` to `last` (exclusive) as one hunk.
void Hunk(std::ostringstream& out, const std::vector<Step>& steps, std::size_t first, std::size_t last,
          const std::vector<std::string>& a, const std::vector<std::string>& b) {
  std::size_t removed = 0;
  std::size_t added = 0;
  for (std::size_t k = first; k < last; ++k) {
    removed += steps[k].op != Op::Add;
    added += steps[k].op != Op::Remove;
  }
  out << "@@ -" << steps[first].before + (removed ? 1 : 0) << "," << removed << " +"
      << steps[first].after + (added ? 1 : 0) << "," << added << " @@\n";
  for (std::size_t k = first; k < last; ++k) {
    const Step& step = steps[k];
    if (step.op == Op::Keep) out << " " << a[step.before] << "\n";
    else if (step.op == Op::Remove) out << "-" << a[step.before] << "\n";
    else out << "+" << b[step.after] << "\n";
  }
}

}  // namespace

std::vector<std::string> SplitLines(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

std::string UnifiedDiff(const std::string& name, const std::string& before, const std::string& after) {
  if (before == after) return "";
  std::vector<std::string> a = SplitLines(before);
  std::vector<std::string> b = SplitLines(after);
  std::vector<Step> steps = Script(a, b);
  std::ostringstream out;
  out << "--- " << name << "\n+++ " << name << "\n";
  std::size_t k = 0;
  while (k < steps.size()) {
    while (k < steps.size() && steps[k].op == Op::Keep) ++k;
    if (k == steps.size()) break;
    std::size_t first = k >= kContext ? k - kContext : 0;
    // A hunk runs on while changes are no more than two contexts apart.
    std::size_t last = k;
    while (last < steps.size()) {
      std::size_t kept = 0;
      while (last + kept < steps.size() && steps[last + kept].op == Op::Keep) ++kept;
      if (last + kept == steps.size() || kept > 2 * kContext) {
        last += std::min(kept, kContext);
        break;
      }
      last += kept;
      while (last < steps.size() && steps[last].op != Op::Keep) ++last;
    }
    Hunk(out, steps, first, last, a, b);
    k = last;
  }
  return out.str();
}

}  // namespace cli
