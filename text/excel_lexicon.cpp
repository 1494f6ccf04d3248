#include "text/excel_lexicon.h"

#include <vector>

#include "base/encoding.h"
#include "base/string_helpers.h"
#include "text/program_resource.h"

namespace {

constexpr size_t kMaximumLineLength = 16384;
const std::u16string kLineBreakMarker = u"{LINEBREAK}";

// Reads the TAB-separated cells of one line. Leading spaces of a cell are
// dropped, trailing ones kept; CR and LF end a cell like TAB does.
class CellReader {
public:
    explicit CellReader(const std::u16string& text) : line(text) {}

    bool Read(std::u16string& cell) {
        if (position >= line.size()) return false;
        while (position < line.size() && line[position] == u' ') ++position;
        const size_t start = position;
        while (position < line.size() && line[position] != u'\t' && line[position] != u'\r' &&
               line[position] != u'\n') {
            ++position;
        }
        cell = line.substr(start, position - start);
        if (position < line.size()) ++position;
        return true;
    }

private:
    const std::u16string& line;
    size_t position = 0;
};

std::string ToNarrow(const std::u16string& text) {
    // Keys and language codes are ASCII; anything else cannot match.
    std::string narrow;
    narrow.reserve(text.size());
    for (const char16_t unit : text) narrow += unit < 0x80 ? static_cast<char>(unit) : '?';
    return narrow;
}

void ReplaceLineBreaks(std::u16string& text) {
    std::u16string result;
    size_t from = 0;
    size_t found;
    while ((found = text.find(kLineBreakMarker, from)) != std::u16string::npos) {
        result.append(text, from, found - from);
        result += u'\n';
        from = found + kLineBreakMarker.size();
    }
    result.append(text, from, std::u16string::npos);
    text.swap(result);
}

}  // namespace

const std::wstring& ExcelLexicon::NotFoundText() {
    static const std::wstring text = L"string_not_found_in_lexicon";
    return text;
}

bool ExcelLexicon::Load(const std::string& languageCode, const char* resourceName, const char* resourceType) {
    texts.clear();
    ResourceBytes bytes;
    if (!FindProgramResource(resourceName, resourceType, bytes)) return false;
    // Resource data has no alignment guarantee for char16_t; copy it out.
    std::vector<char16_t> units(bytes.size / 2);
    for (size_t i = 0; i < units.size(); ++i) {
        units[i] = static_cast<char16_t>(bytes.data[2 * i] | (bytes.data[2 * i + 1] << 8));
    }
    return LoadFromUnits(languageCode, units.data(), units.size());
}

bool ExcelLexicon::LoadFromUnits(const std::string& languageCode, const char16_t* units, size_t count) {
    texts.clear();
    size_t position = 0;
    if (count > 0 && units[0] == 0xFEFF) position = 1;
    size_t column = 0;
    while (position < count) {
        size_t end = position;
        while (end < count && units[end] != u'\n') ++end;
        std::u16string line(units + position, end - position);
        position = end + 1;
        const size_t nul = line.find(u'\0');
        if (nul != std::u16string::npos) line.resize(nul);
        if (line.size() > kMaximumLineLength) line.resize(kMaximumLineLength);
        if (line.empty() || line == u"\r") continue;

        CellReader reader(line);
        std::u16string cell;
        if (column == 0) {
            size_t index = 0;
            bool found = false;
            while (reader.Read(cell)) {
                if (EqualsIgnoringCase(ToNarrow(cell), languageCode)) {
                    found = true;
                    break;
                }
                ++index;
            }
            // The first cell names no language; a match there is no column.
            if (!found || index == 0) {
                texts.clear();
                return false;
            }
            column = index;
            continue;
        }
        std::u16string key;
        reader.Read(key);
        // A row shorter than the header gives an empty text, which makes
        // Localize fall back to English.
        std::u16string text;
        bool present = true;
        for (size_t i = 1; i <= column && present; ++i) present = reader.Read(text);
        if (!present) text.clear();
        ReplaceLineBreaks(text);
        texts[ToNarrow(key)] = WidenFromUtf16(text.data(), text.size());
    }
    return column != 0;
}

const std::wstring& ExcelLexicon::Find(const std::string& key) const {
    const auto found = texts.find(key);
    return found == texts.end() ? NotFoundText() : found->second;
}
