#pragma once

#include <cstdint>
#include <string>

// TinyXML parses nested elements by recursion, so a downloaded file of a
// few hundred kilobytes of "<a>" would overflow the stack. Before any
// document is handed to it, this scanner walks the text the way TinyXML's
// parser does in its byte (legacy) encoding and measures how deep the
// elements nest.
//
// Returns the largest number of elements open at once, or -1 when that
// number would exceed limit or when the text is malformed in a way that
// makes the parse fail anyway (an unterminated tag, comment or section).
// Where TinyXML would stop with an error, the scanner may go on; its
// result is then still an upper bound of what TinyXML reached.
//
// nodes receives an upper bound of the nodes and attributes TinyXML would
// build: each costs it a hundred bytes or more, so the caller can refuse a
// file that is small on disk but huge in memory.
int MeasureXmlNesting(const std::string& text, int limit, int64_t& nodes);
