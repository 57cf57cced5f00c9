// The language-server tours of the demo: clangd over the C++ example and pylsp over the
// Python one, through the same actions `vexil lsp` performs, every answer checked.
#include <algorithm>
#include <sstream>
#include <thread>

#include "demo.h"
#include "render.h"
#include "session.h"

namespace cli {
namespace {

// What one server is shown doing, and what its answers must contain.
struct Tour {
  std::string title;
  std::string program;
  std::vector<std::string> arguments;
  std::string project;                 // directory below the examples
  std::vector<std::string> files;      // opened first, the last being the main file
  std::string call;                    // a call in the main file; the function starts at `callOffset`
  std::size_t callOffset;
  std::string hoverSays;               // text the hover of the call must contain
  std::string definitionFile;          // where the function is defined, and its first line's text
  std::string definitionLine;
  std::size_t uses;                    // references of the function, declaration included
  std::string member;                  // "object.member" in the main file; completion after the dot
  std::vector<std::string> members;    // completion labels that must be offered
  std::string symbolsFile;
  std::vector<std::string> symbols;    // names its symbols must include
  bool format;                         // whether the server formats (pylsp needs plug-ins)
  std::string newName;
  std::size_t renamedFiles;
};

std::string Join(const std::vector<std::string>& items, std::size_t most) {
  std::string text;
  for (std::size_t i = 0; i < items.size() && i < most; ++i) text += (i ? ", " : "") + items[i];
  if (items.size() > most) text += ", ... (" + std::to_string(items.size()) + " in all)";
  return text;
}

std::string FirstLine(const std::string& text) { return text.substr(0, text.find('\n')); }

// The first line of a hover, and its last one when that differs (clangd ends with the
// declaration).
std::string Gist(const std::string& text) {
  std::string last = text.substr(0, text.find_last_not_of("\n") + 1);
  last = last.substr(last.rfind('\n') == std::string::npos ? 0 : last.rfind('\n') + 1);
  return last == FirstLine(text) ? last : FirstLine(text) + " ... " + last;
}

std::string Name(const std::string& path) { return path.substr(path.rfind('/') + 1); }

std::string At(const Action& action) {
  return Name(action.file) + ":" + std::to_string(action.line) + ":" + std::to_string(action.column);
}

Outcome Checked(Session& session, const Action& action, const std::string& title) {
  Outcome outcome = Perform(session, action);
  Expect(!outcome.failed, title + " " + Describe(action) + ": " + outcome.why);
  return outcome;
}

// Servers index opened files in the background; until every use is known, completion and
// rename would see too little. Asks for the references until they are all there.
void AwaitIndex(Session& session, const Tour& tour, const Action& call) {
  Action references = call;
  references.kind = ActionKind::References;
  auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(30);
  while (Checked(session, references, tour.title).locations.size() < tour.uses) {
    Expect(std::chrono::steady_clock::now() < deadline,
           tour.title + " did not find the " + std::to_string(tour.uses) + " uses of the function within 30 s");
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
  }
}

void ShowNavigation(Session& session, const Tour& tour, const Action& call, const std::string& directory) {
  Action hover = call;
  hover.kind = ActionKind::Hover;
  std::string text = HoverText(Checked(session, hover, tour.title).hover);
  Expect(text.find(tour.hoverSays) != std::string::npos,
         tour.title + " hover at " + At(call) + " does not mention '" + tour.hoverSays + "': '" + FirstLine(text) + "'");
  Report("hover " + At(call), Gist(text));

  Action definition = call;
  definition.kind = ActionKind::Definition;
  std::vector<LSP::Location> found = Checked(session, definition, tour.title).locations;
  int expected = LineOf(directory + "/" + tour.definitionFile, tour.definitionLine) - 1;
  Expect(found.size() == 1 && found[0].range.start.line == expected,
         tour.title + " definition at " + At(call) + " is not " + tour.definitionFile + ":" + std::to_string(expected + 1));
  Report("definition " + At(call), Where(found[0]));

  Action references = call;
  references.kind = ActionKind::References;
  std::vector<std::string> uses;
  for (const LSP::Location& location : Checked(session, references, tour.title).locations) {
    uses.push_back(Name(Where(location)));
  }
  Report("references " + At(call), std::to_string(uses.size()) + " uses: " + Join(uses, 5));
}

void ShowAssistance(Session& session, const Tour& tour, const std::string& main) {
  Action completion = cli::At(ActionKind::Completion, main, tour.member, tour.member.find('.') + 1);
  std::vector<std::string> labels;
  for (const LSP::CompletionItem& item : Checked(session, completion, tour.title).completion.items) {
    std::string label = item.label;
    label.erase(0, label.find_first_not_of(' '));
    labels.push_back(label);
  }
  for (const std::string& member : tour.members) {
    bool offered = std::any_of(labels.begin(), labels.end(),
                               [&](const std::string& label) { return label.rfind(member, 0) == 0; });
    Expect(offered, tour.title + " completion at " + At(completion) + " does not offer " + member);
  }
  Report("completion " + At(completion), Join(labels, 4));

  Action symbols;
  symbols.kind = ActionKind::Symbols;
  symbols.file = symbols.path = main.substr(0, main.rfind('/') + 1) + tour.symbolsFile;
  std::vector<std::string> names;
  for (const LSP::SymbolInformation& symbol : Checked(session, symbols, tour.title).symbols) {
    names.push_back(std::string(SymbolKindName(symbol.kind)) + " " + symbol.name);
  }
  for (const std::string& wanted : tour.symbols) {
    bool listed = std::any_of(names.begin(), names.end(), [&](const std::string& name) {
      return name.size() > wanted.size() && name.compare(name.size() - wanted.size(), wanted.size(), wanted) == 0;
    });
    Expect(listed, tour.title + " symbols of " + tour.symbolsFile + " do not list " + wanted);
  }
  Report("symbols " + tour.symbolsFile, Join(names, 4));
}

void ShowEdits(Session& session, const Tour& tour, const Action& call, const std::string& main) {
  if (tour.format) {
    Action format;
    format.kind = ActionKind::Format;
    format.file = format.path = main;
    Outcome formatted = Checked(session, format, tour.title);
    Expect(!formatted.edits.empty() && !formatted.edits[0].edits.empty(),
           tour.title + " proposed no formatting for " + Name(main) + ", whose layout is odd on purpose");
    Report("format " + Name(main), std::to_string(formatted.edits[0].edits.size()) + " edits:");
    std::istringstream diff(EditsAsDiff(formatted.edits[0]));
    for (std::string line; std::getline(diff, line);) std::printf("      %s\n", line.c_str());
  }
  Action rename = call;
  rename.kind = ActionKind::Rename;
  rename.text = tour.newName;
  Outcome renamed = Checked(session, rename, tour.title);
  std::vector<std::string> files;
  for (const FileEdits& file : renamed.edits) files.push_back(Name(file.path));
  Expect(files.size() == tour.renamedFiles, tour.title + " rename to " + tour.newName + " touched " +
                                                std::to_string(files.size()) + " files, not " +
                                                std::to_string(tour.renamedFiles));
  Report("rename " + At(call) + " -> " + tour.newName, "edits in " + Join(files, 5) + " (not applied)");
}

void Run(const Tour& tour, const std::string& examples) {
  std::string directory = examples + "/" + tour.project;
  std::printf("\n%s over examples/%s\n", tour.title.c_str(), tour.project.c_str());
  SessionOptions options;
  options.name = "demo-" + tour.title;
  options.program = tour.program;
  options.arguments = tour.arguments;
  options.root = directory;
  Session session(options);
  auto start = std::chrono::steady_clock::now();
  std::string why;
  Expect(session.Start(why), why + " (is it installed? `make deps` installs it)");
  Report("start", "process " + std::to_string(session.Server().Id()) + ", initialized in " + Elapsed(start));

  std::string main = directory + "/" + tour.files.back();
  for (const std::string& file : tour.files) session.Document(directory + "/" + file);
  Action call = cli::At(ActionKind::Hover, main, tour.call, tour.callOffset);
  AwaitIndex(session, tour, call);
  ShowNavigation(session, tour, call, directory);
  ShowAssistance(session, tour, main);
  ShowEdits(session, tour, call, main);

  auto stop = std::chrono::steady_clock::now();
  Expect(session.Stop(), tour.title + " did not end after shutdown and exit");
  Report("shutdown and exit", "done in " + Elapsed(stop));
}

}  // namespace

void DemoClangd(const std::string& examples) {
  Run({"clangd", "clangd", {"--log=error"}, "cpp", {"shapes.h", "shapes.cpp", "main.cpp"}, "shapes::Clamp(", 8,
       "int Clamp(int value, int low, int high)", "shapes.cpp", "int Clamp(", 5, "rectangle.Scale",
       {"Area", "Perimeter", "Scale"}, "shapes.h", {"Shape", "Rectangle", "Clamp"}, true, "Limit", 3},
      examples);
}

void DemoPylsp(const std::string& examples) {
  Run({"pylsp", "pylsp", {}, "python", {"geometry.py", "main.py"}, "print(clamp(", 6,
       "Limit value to the range from low to high.", "geometry.py", "def clamp", 5, "rectangle.scale",
       {"area", "scale"}, "geometry.py", {"Rectangle", "clamp"}, false, "limit", 2},
      examples);
}

}  // namespace cli
