// The nesting scanner against TinyXML itself: whenever the scanner
// accepts a text, the elements TinyXML builds from it must nest no deeper
// than the scanner said (plus the innermost empty element). Inputs are
// small, so TinyXML's recursion is safe here.
#include <tinyxml.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "patch/xml_nesting.h"

namespace {

int ElementDepth(const TiXmlNode& document) {
    int deepest = 0;
    std::vector<std::pair<const TiXmlNode*, int>> pending = {{&document, 0}};
    while (!pending.empty()) {
        const auto [node, depth] = pending.back();
        pending.pop_back();
        for (const TiXmlNode* child = node->FirstChild(); child != nullptr; child = child->NextSibling()) {
            if (child->ToElement() == nullptr) continue;
            deepest = std::max(deepest, depth + 1);
            pending.emplace_back(child, depth + 1);
        }
    }
    return deepest;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    if (text.find('\0') != std::string::npos) return 0;
    const int bound = MeasureXmlNesting(text, INT_MAX);
    if (bound < 0) return 0;
    TiXmlDocument document;
    document.Parse(text.c_str(), nullptr, TIXML_ENCODING_LEGACY);
    if (ElementDepth(document) > bound + 1) std::abort();
    return 0;
}
