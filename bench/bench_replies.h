// Reply texts shared by the benchmarks: a hover as clangd sends it, and a completion list
// of clangd-shaped items grown to a given size, so every side measures the same bytes.
#pragma once

#include <cstddef>
#include <string>

namespace bench {

// The "result" of clangd's recorded hover reply.
std::string HoverResult();
// A completion list object of at least `bytes` bytes.
std::string CompletionResult(std::size_t bytes);
// The whole reply message the fake server sends for `result`.
std::string Reply(int id, const std::string& result);
// Writes `text` to a file that lives as long as the process; returns its path.
std::string TemporaryFile(const std::string& name, const std::string& text);

// The result files the fake server answers with, written once per run and handed to every
// client measured, so that all of them read the same bytes: the hover, and a 1 MiB completion.
const std::string& HoverFile();
const std::string& CompletionFile();

}  // namespace bench
