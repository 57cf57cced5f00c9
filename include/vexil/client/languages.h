// The table from file extensions to the protocol's language identifiers, which the host
// asks for the "languageId" of a document it opens.
#pragma once

#include <map>
#include <memory>
#include <string>

#include "vexil/export.h"

class VEXIL_API xLanguage {
 public:
  xLanguage(const char* name, const char* id) : name(name), id(id) {}

  std::string name;  // display name, e.g. "Windows Bat"
  std::string id;    // protocol identifier, e.g. "bat"
};

// Extensions are looked up exactly as given: case-sensitive, without a leading dot.
// Copies are deep, so each table owns its rows.
class VEXIL_API xLanguages {
 public:
  xLanguages();
  xLanguages(const xLanguages& other);
  xLanguages& operator=(const xLanguages& other);
  virtual ~xLanguages();

  // The identifier for `extension`, or "" when the table has none. The text lives as long
  // as the table.
  const char* LanguageId(const char* extension) const;

 protected:
  // Adds one row for each extension of the ';'-separated list; an extension already in the
  // table keeps its first row.
  void AddLanguage(const char* name, const char* id, const char* extensions);

 private:
  std::map<std::string, std::unique_ptr<xLanguage>> languages_;
};
