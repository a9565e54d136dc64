#ifndef VORN_PLATFORM_TEXT_FILE_H
#define VORN_PLATFORM_TEXT_FILE_H

#include <cstddef>
#include <string>
#include <vector>

#include "platform/qlibc_container.h"

// The line syntax of section files and key=value files, shared by the file calls and the fuzzer.
// Texts are whole files already in memory; paths here are real (already rooted).
namespace vorn {
namespace platform {

constexpr std::size_t kMaxTextFileSize = 1024 * 1024;
constexpr std::size_t kMaxLineLength = 8192;

// Reads a whole file. Fails with a QLIBC error code set when the file is missing or unreadable
// (QLIBC_ERR_NOT_FOUND, QLIBC_ERR_FILE_IO), or is not text within bounds (QLIBC_ERR_FORMAT).
bool ReadTextFile(const std::string& realPath, std::string& text);
// True when text has no NUL byte, no line over kMaxLineLength and is within kMaxTextFileSize.
bool IsBoundedText(const std::string& text);

// Lines without their ends; "\n", "\r\n" and a lone "\r" all end a line.
std::vector<std::string> SplitLines(const std::string& text);

// A "key<separator>value" line: leading white space and blanks around the key are ignored.
// False for blank and comment lines, section headers, lines without separator or with an empty
// key. unquote drops one pair of double quotes around the value.
bool ParseKeyLine(const std::string& line, const std::string& separator, bool unquote,
                  std::string& key, std::string& value);
// A "[name]" line (leading white space ignored, text after "]" ignored).
bool ParseSectionHeader(const std::string& line, std::string& name);

// Section names of a section file in file order, each once.
std::vector<std::string> SectionNames(const std::string& text);
// Adds the pairs of every block of the named section to hash. Returns the number of distinct
// keys of the section, or -1 when hash refused a pair.
int ReadSection(const std::string& text, const std::string& name, QLIBSZHASH* hash);
// Adds the pairs of a key=value file to hash (only the keys listed in filter, when not null).
// Returns the number of distinct keys added, or -1 when hash refused a pair.
int ReadKeys(const std::string& text, const std::string& separator, const QLIBSZLIST* filter,
             QLIBSZHASH* hash);

// Prints one pair through a format holding exactly two "%s" (and any number of "%%").
// False when the format is not of that shape.
bool FormatPair(const char* format, const char* key, const char* value, std::string& out);
// Whether a pair, written as a line, reads back as the same pair.
bool IsWritableKey(const std::string& key);
bool IsWritableValue(const std::string& value);
bool IsWritableSectionName(const std::string& name);

// Replaces a file by writing a temporary file beside it and renaming it over the file. The file
// keeps its permission bits; a new file gets 0644. Sets QLIBC_ERR_FILE_IO on failure.
bool WriteFileAtomically(const std::string& realPath, const std::string& content);

}  // namespace platform
}  // namespace vorn

#endif
