// The nesting scanner against TinyXML itself: whenever the scanner
// accepts a text, the elements TinyXML builds from it must nest no deeper
// than the scanner said (plus the innermost empty element), and there must
// be no more nodes and attributes than it counted. Inputs are small, so
// TinyXML's recursion is safe here.
#include <tinyxml.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "base/xml_nesting.h"

namespace {

// The deepest element and the number of nodes and attributes below the
// document.
std::pair<int, int64_t> Measure(const TiXmlNode& document) {
    int deepest = 0;
    int64_t nodes = 0;
    std::vector<std::pair<const TiXmlNode*, int>> pending = {{&document, 0}};
    while (!pending.empty()) {
        const auto [node, depth] = pending.back();
        pending.pop_back();
        for (const TiXmlNode* child = node->FirstChild(); child != nullptr; child = child->NextSibling()) {
            ++nodes;
            const TiXmlElement* element = child->ToElement();
            if (element == nullptr) continue;
            for (const TiXmlAttribute* a = element->FirstAttribute(); a != nullptr; a = a->Next()) ++nodes;
            deepest = std::max(deepest, depth + 1);
            pending.emplace_back(child, depth + 1);
        }
    }
    return {deepest, nodes};
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    if (text.find('\0') != std::string::npos) return 0;
    int64_t nodeBound = 0;
    const int depthBound = MeasureXmlNesting(text, INT_MAX, nodeBound);
    if (depthBound < 0) return 0;
    TiXmlDocument document;
    document.Parse(text.c_str(), nullptr, TIXML_ENCODING_LEGACY);
    const auto [depth, nodes] = Measure(document);
    if (depth > depthBound + 1 || nodes > nodeBound) std::abort();
    return 0;
}
