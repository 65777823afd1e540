#pragma once
// Small readers the product recognisers of every sensor share.
#include <cstddef>
#include <string>

// Reads count bytes at offset; false when the file cannot be opened or is
// shorter.
bool readFileBytes(const std::string& path, long offset, std::size_t count, std::string& bytes);
// directory + "/" + name, without doubling a separator; name alone for an
// empty directory.
std::string joinedPath(const std::string& directory, const char* name);
// Seconds since 1985 through the text date form; false for a month outside
// 1..12.
bool dateToSec85(int year, int month, int day, int hour, int minute, int second, double& out);
// Last component of a path ('/' or '\\' separated).
std::string baseName(const std::string& path);
