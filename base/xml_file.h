#pragma once

#include <tinyxml.h>

#include <cstdint>
#include <string>

// Every XML record of the installation ("patchinfo.xml", "PPF.xml",
// "InstallationData.xml", "Uninstall.xml") is read and written here, so
// they all share one reading rule and one printing rule.

// Larger files are refused unread: the biggest record, the uninstall list
// of a complete build, stays far below this.
constexpr int64_t kMaximumXmlFileSize = 64 * 1024 * 1024;
// Our documents nest three levels deep; anything deeper is refused before
// TinyXML's recursive parser sees it.
constexpr int kMaximumXmlNesting = 32;
// TinyXML spends a hundred bytes and more on every node and attribute, so
// a few bytes of "<a/>" each would cost far more memory than disk. A
// million is several times the uninstall record of a complete build.
constexpr int64_t kMaximumXmlNodes = 1000000;

// The line break TinyXML's SaveFile produces on this platform (it writes
// through a text-mode stream, so CR LF on Windows).
extern const char kXmlLineBreak[];

// Parses text as TinyXML's LoadFile does (a UTF-8 byte order mark
// skipped, CR LF and lone CR read as LF) but byte for byte: names and
// values are narrow strings in the system code page, so no byte is taken
// as the start of a multi-byte character. False when the text is too
// deep or has too many nodes, holds a NUL, does not parse or has no root
// element.
[[nodiscard]] bool ParseXml(std::string text, TiXmlDocument& document);
// Reads and parses a file; false on any failure (missing, unreadable, too
// large, or as ParseXml).
[[nodiscard]] bool LoadXmlFile(const std::string& path, TiXmlDocument& document);

// The document as TinyXML prints it: four spaces per level, one element
// per line, an element with one text child on one line.
std::string PrintXml(const TiXmlDocument& document);
// Replaces the file at path with the printed document atomically (through
// temporaryPath when given, else a temporary name beside it). A failure
// is logged at Error level and leaves the old file untouched.
[[nodiscard]] bool SaveXmlFile(const TiXmlDocument& document, const std::string& path,
                               const std::string& temporaryPath = "");

// The text of the first child element called name, when that element
// exists and its first node is text; false otherwise.
bool ReadElementText(const TiXmlNode* parent, const char* name, std::string& text);
// Appends <name>text</name> to parent (an empty text prints as
// <name></name>) and returns it.
TiXmlElement* AppendTextElement(TiXmlNode* parent, const char* name, const std::string& text);
// A new document holding the declaration <?xml version="1.0" ?>.
void StartXmlDocument(TiXmlDocument& document);
