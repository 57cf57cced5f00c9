// Helpers of the protocol tests: test data files, and reading a reply text into a result
// the way the transport does (parse, then the response bound to the caller's result).
#pragma once

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <string>

#include "vexil/protocol/message.h"

namespace vexil_test {

inline std::string ReadDataFile(const std::string& relative) {
  std::ifstream file(std::string(VEXIL_TEST_DATA) + "/" + relative, std::ios::binary);
  EXPECT_TRUE(file) << relative;
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

// Reads a whole reply into `result`; returns the response for its id and error.
inline LSP::ResponseMessage ReadReply(const std::string& text, LSP::Result& result) {
  LSP::xReader reader;
  EXPECT_TRUE(reader.Parse(text)) << reader.Error();
  LSP::ResponseMessage response(&result);
  response.Read(reader);
  return response;
}

// Reads `json` as the value of a reply's "result".
inline void ReadResult(const std::string& json, LSP::Result& result) {
  ReadReply(R"({"jsonrpc":"2.0","id":1,"result":)" + json + "}", result);
}

// The text of an exception thrown by `action`, or "" when none was thrown.
template <typename Action>
std::string ThrownText(Action action) {
  try {
    action();
  } catch (const std::exception& e) {
    return e.what();
  }
  return "";
}

}  // namespace vexil_test
