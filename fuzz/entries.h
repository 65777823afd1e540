#pragma once
// Entry points that feed arbitrary bytes to one reader of outside input
// each. The libFuzzer executables call them, and so does the regression test
// that replays every input kept in fuzz/regressions/<entry>/.
//
// Readers that take a path read the bytes from a file of a scratch folder
// made once per process (under TMPDIR) and removed at its end.
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

using FuzzEntry = int (*)(const std::uint8_t* data, std::size_t size);

// The entry of that name, null when there is none.
FuzzEntry fuzzEntry(const std::string& name);
std::vector<std::string> fuzzEntryNames();

// The per-process scratch folder (made on first use) and its removal.
const std::string& fuzzScratch();
void fuzzScratchRemove();
