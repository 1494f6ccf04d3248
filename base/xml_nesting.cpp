#include "base/xml_nesting.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <string_view>

#include "base/string_helpers.h"

namespace {

// The character classes of TinyXML's parser (bytes from 127 up count as
// letters there).
bool IsSpace(char c) { return std::isspace(static_cast<unsigned char>(c)) != 0; }
bool IsNameStart(char c) {
    const unsigned char byte = static_cast<unsigned char>(c);
    return byte >= 127 || std::isalpha(byte) || c == '_';
}
bool IsNameChar(char c) {
    const unsigned char byte = static_cast<unsigned char>(c);
    return byte >= 127 || std::isalnum(byte) || c == '_' || c == '-' || c == '.' || c == ':';
}

class Scanner {
public:
    explicit Scanner(const std::string& text) : p(text.data()), end(text.data() + text.size()) {}

    int64_t Nodes() const { return nodes; }

    int Run(int limit) {
        int depth = 0;
        int deepest = 0;
        for (;;) {
            SkipSpace();
            if (p == end) return depth == 0 ? deepest : -1;
            if (*p != '<') {
                // Outside the root the parser stops at text; inside an
                // element the text runs to the next tag.
                if (depth == 0) return deepest;
                ++nodes;
                if (!Text('<')) return -1;
                continue;
            }
            if (depth > 0 && StartsWith("</")) {
                if (!SkipPast(">")) return -1;
                --depth;
                continue;
            }
            ++nodes;
            if (StartsWith("<?xml", true)) {
                p += 5;
                if (!Declaration()) return -1;
            } else if (StartsWith("<!--")) {
                p += 4;
                if (!SkipPast("-->")) return -1;
            } else if (StartsWith("<![CDATA[")) {
                p += 9;
                if (!SkipPast("]]>")) return -1;
            } else if (StartsWith("<!") || end - p < 2 || !IsNameStart(p[1])) {
                if (!SkipPast(">")) return -1;
            } else {
                ++p;
                const int opened = StartTag();
                if (opened < 0) return -1;
                depth += opened;
                if (depth > limit) return -1;
                deepest = std::max(deepest, depth);
            }
        }
    }

private:
    void SkipSpace() {
        while (p < end && IsSpace(*p)) ++p;
    }

    bool StartsWith(const char* tag, bool ignoreCase = false) const {
        const std::string_view rest(p, static_cast<size_t>(end - p));
        return ignoreCase ? StartsWithIgnoringCase(rest, tag) : rest.substr(0, std::strlen(tag)) == tag;
    }

    bool SkipPast(const char* terminator) {
        const char* found = std::search(p, end, terminator, terminator + std::strlen(terminator));
        if (found == end) return false;
        p = found + std::strlen(terminator);
        return true;
    }

    // Text or a quoted value up to (not past) terminator. A numeric
    // character reference is where the parser strays: it jumps from "&#"
    // to the first ';' anywhere after it, over tags and quotes alike, as
    // long as what precedes that ';' back to the last 'x' (or '#') is
    // digits; otherwise the parse fails.
    bool Text(char terminator) {
        while (p < end && *p != terminator) {
            if (*p != '&' || end - p < 3 || p[1] != '#') {
                ++p;
                continue;
            }
            const bool hex = p[2] == 'x';
            if (hex && end - p < 4) return false;
            const char* semicolon = std::find(p + (hex ? 3 : 2), end, ';');
            if (semicolon == end) return false;
            for (const char* q = semicolon - 1; *q != (hex ? 'x' : '#'); --q) {
                if (!(hex ? std::isxdigit(static_cast<unsigned char>(*q))
                          : std::isdigit(static_cast<unsigned char>(*q)))) {
                    return false;
                }
            }
            p = semicolon + 1;
        }
        return p < end;
    }

    bool Name() {
        if (p == end || !IsNameStart(*p)) return false;
        while (p < end && IsNameChar(*p)) ++p;
        return p < end;
    }

    // name = "value", name = 'value' or name = value (no quotes in it).
    bool Attribute() {
        ++nodes;
        SkipSpace();
        if (!Name()) return false;
        SkipSpace();
        if (p == end || *p != '=') return false;
        ++p;
        SkipSpace();
        if (p == end) return false;
        if (*p == '"' || *p == '\'') {
            const char quote = *p++;
            if (!Text(quote)) return false;
            ++p;
            return p < end;
        }
        while (p < end && !IsSpace(*p) && *p != '/' && *p != '>') {
            if (*p == '"' || *p == '\'') return false;
            ++p;
        }
        return true;
    }

    // After "<?xml": only version, encoding and standalone are read as
    // attributes (their quoted values may hold '>'); anything else is
    // skipped word by word up to the first '>'.
    bool Declaration() {
        while (p < end) {
            if (*p == '>') {
                ++p;
                return true;
            }
            SkipSpace();
            if (p == end) return false;
            if (StartsWith("version", true) || StartsWith("encoding", true) || StartsWith("standalone", true)) {
                if (!Attribute()) return false;
            } else {
                while (p < end && *p != '>' && !IsSpace(*p)) ++p;
            }
        }
        return false;
    }

    // After '<' of an element: 1 when it opens content, 0 when it closes
    // itself ("/>"), -1 when malformed.
    int StartTag() {
        if (!Name()) return -1;
        for (;;) {
            SkipSpace();
            if (p == end) return -1;
            if (*p == '/') {
                if (end - p < 2 || p[1] != '>') return -1;
                p += 2;
                return 0;
            }
            if (*p == '>') {
                ++p;
                return 1;
            }
            if (!Attribute()) return -1;
        }
    }

    const char* p;
    const char* end;
    int64_t nodes = 0;
};

}  // namespace

int MeasureXmlNesting(const std::string& text, int limit, int64_t& nodes) {
    Scanner scanner(text);
    const int depth = scanner.Run(limit);
    nodes = scanner.Nodes();
    return depth;
}
