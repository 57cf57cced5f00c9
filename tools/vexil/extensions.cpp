// The language ids of files the library's table does not name: common extensions and
// file names, as editors give them to servers.
#include <algorithm>
#include <filesystem>

#include "session.h"
#include "vexil/client/languages.h"

namespace cli {
namespace {

struct Known {
  const char* names;  // extensions (without the dot) or whole file names, ';' between
  const char* id;
};

const Known kKnown[] = {
    {"cc;hh;ipp;inl;tcc", "cpp"},
    {"m", "objective-c"},
    {"mm", "objective-cpp"},
    {"js;mjs;cjs", "javascript"},
    {"jsx", "javascriptreact"},
    {"tsx", "typescriptreact"},
    {"mts;cts", "typescript"},
    {"json;jsonc;json5", "json"},
    {"sh;bash;zsh;ksh", "shellscript"},
    {"css", "css"},
    {"scss", "scss"},
    {"less", "less"},
    {"yml", "yaml"},
    {"htm;xhtml", "html"},
    {"md;markdown", "markdown"},
    {"pyi;pyw", "python"},
    {"tex;ltx", "latex"},
    {"bib", "bibtex"},
    {"php", "php"},
    {"pl;pm", "perl"},
    {"swift", "swift"},
    {"kt;kts", "kotlin"},
    {"fs;fsi;fsx", "fsharp"},
    {"clj;cljs;cljc", "clojure"},
    {"coffee", "coffeescript"},
    {"ps1;psm1", "powershell"},
    {"ini;cfg", "ini"},
    {"diff;patch", "diff"},
    {"toml", "toml"},
    {"groovy;gradle", "groovy"},
    {"hs", "haskell"},
    {"ml;mli", "ocaml"},
    {"ex;exs", "elixir"},
    {"erl;hrl", "erlang"},
    {"dart", "dart"},
    {"vue", "vue"},
    {"svelte", "svelte"},
    {"zig", "zig"},
    {"cmake", "cmake"},
    {"mk;mak", "makefile"},
    {"Makefile;makefile;GNUmakefile", "makefile"},
    {"Dockerfile;Containerfile", "dockerfile"},
    {"CMakeLists.txt", "cmake"},
};

bool Lists(const std::string& names, const std::string& name) {
  return !name.empty() && (";" + names + ";").find(";" + name + ";") != std::string::npos;
}

}  // namespace

std::string KnownLanguageOf(const std::string& path) {
  static const xLanguages languages;
  const std::filesystem::path file(path);
  std::string extension = file.extension().string();
  if (!extension.empty()) extension.erase(0, 1);
  std::string id = extension.empty() ? "" : languages.LanguageId(extension.c_str());
  if (!id.empty()) return id;
  std::string lower = extension;
  std::transform(lower.begin(), lower.end(), lower.begin(), [](unsigned char c) { return std::tolower(c); });
  const std::string name = file.filename().string();
  for (const Known& known : kKnown) {
    if (Lists(known.names, name) || Lists(known.names, lower)) return known.id;
  }
  return "";
}

}  // namespace cli
