// The nesting scanner against TinyXML itself: whenever the scanner accepts a text, the elements TinyXML builds from it
// must nest no deeper than the scanner said (plus the innermost empty element), and there must be no more nodes and
// attributes than it counted. Inputs are small, so TinyXML's recursion is safe here.
#include <tinyxml.h>

#include <algorithm>
#include <climits>
#include <functional>

#include "base/xml_nesting.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    int64_t nodeBound = 0;
    const int depthBound = MeasureXmlNesting(text, INT_MAX, nodeBound);
    if (text.find('\0') != std::string::npos || depthBound < 0) return 0;
    TiXmlDocument document;
    document.Parse(text.c_str(), nullptr, TIXML_ENCODING_LEGACY);
    // The deepest element and the nodes and attributes below the document.
    int deepest = 0;
    int64_t nodes = 0;
    std::function<void(const TiXmlNode*, int)> walk = [&](const TiXmlNode* node, int depth) {
        for (const TiXmlNode* child = node->FirstChild(); child != nullptr; child = child->NextSibling()) {
            ++nodes;
            const TiXmlElement* element = child->ToElement();
            if (element == nullptr) continue;
            for (const TiXmlAttribute* a = element->FirstAttribute(); a != nullptr; a = a->Next()) ++nodes;
            deepest = std::max(deepest, depth + 1);
            walk(child, depth + 1);
        }
    };
    walk(&document, 0);
    if (deepest > depthBound + 1 || nodes > nodeBound) std::abort();
    return 0;
}
