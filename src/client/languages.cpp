// The fixed language table. Rows without extensions are declared but cannot be found; the
// missing extensions (js, json, md, ...) and "xls" for XSL are as the host has always had them.
#include "vexil/client/languages.h"

namespace {

struct Row {
  const char* extensions;
  const char* id;
  const char* name;
};

const Row kRows[] = {
    {"cmd;bat", "bat", "Windows Bat"},
    {"", "bibtex", "BibTeX"},
    {"", "clojure", "Clojure"},
    {"", "coffeescript", "Coffeescript"},
    {"c;h", "c", "C"},
    {"cpp;cxx;c++;hpp;hxx;h++", "cpp", "C++"},
    {"cs", "csharp", "C#"},
    {"", "css", "CSS"},
    {"", "diff", "Diff"},
    {"", "dockerfile", "Dockerfile"},
    {"", "fsharp", "F#"},
    {"", "git-commit", "Git"},
    {"go", "go", "Go"},
    {"", "groovy", "Groovy"},
    {"", "handlebars", "Handlebars"},
    {"html", "html", "HTML"},
    {"", "ini", "Ini"},
    {"java", "java", "Java"},
    {"", "javascript", "JavaScript"},
    {"", "json", "JSON"},
    {"", "latex", "LaTeX"},
    {"", "less", "Less"},
    {"lua", "lua", "Lua"},
    {"", "makefile", "Makefile"},
    {"", "markdown", "Markdown"},
    {"", "objective-c", "Objective-C"},
    {"", "objective-cpp", "Objective-C++"},
    {"", "perl", "Perl"},
    {"", "php", "PHP"},
    {"", "powershell", "Powershell"},
    {"", "jade", "Pug"},
    {"py", "python", "Python"},
    {"r", "r", "R"},
    {"cshtml", "razor", "Razor (cshtml)"},
    {"rb", "ruby", "Ruby"},
    {"rs", "rust", "Rust"},
    {"", "scss", "Sass"},
    {"", "shaderlab", "ShaderLab"},
    {"", "shellscript", "Shell Script (Bash)"},
    {"sql", "sql", "SQL"},
    {"", "swift", "Swift"},
    {"ts", "typescript", "TypeScript"},
    {"", "tex", "TeX"},
    {"vb", "vb", "Visual Basic"},
    {"xml", "xml", "XML"},
    {"xls", "xsl", "XSL"},
    {"yaml", "yaml", "YAML"},
};

}  // namespace

xLanguages::xLanguages() {
  for (const Row& row : kRows) AddLanguage(row.name, row.id, row.extensions);
}

xLanguages::xLanguages(const xLanguages& other) {
  for (const auto& entry : other.languages_)
    languages_.emplace(entry.first, std::make_unique<xLanguage>(*entry.second));
}

xLanguages& xLanguages::operator=(const xLanguages& other) {
  if (this != &other) {
    xLanguages copy(other);
    languages_.swap(copy.languages_);
  }
  return *this;
}

xLanguages::~xLanguages() = default;

const char* xLanguages::LanguageId(const char* extension) const {
  auto found = languages_.find(extension ? extension : "");
  return found == languages_.end() ? "" : found->second->id.c_str();
}

void xLanguages::AddLanguage(const char* name, const char* id, const char* extensions) {
  const std::string list(extensions);
  std::string::size_type begin = 0;
  while (begin <= list.size()) {
    std::string::size_type end = list.find(';', begin);
    if (end == std::string::npos) end = list.size();
    // Empty pieces (";;", a leading or trailing ';', an empty list) add nothing.
    if (end > begin) languages_.emplace(list.substr(begin, end - begin), std::make_unique<xLanguage>(name, id));
    begin = end + 1;
  }
}
