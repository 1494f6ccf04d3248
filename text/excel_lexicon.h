#pragma once

#include <map>
#include <string>

// One language column of the built-in string table, as a key-to-text map.
class ExcelLexicon {
public:
    ExcelLexicon() = default;
    virtual ~ExcelLexicon() = default;

    // Empties the map and fills it with the column of languageCode from the
    // program resource. False (with an empty map) when the resource is
    // missing or empty, or the code names no usable column.
    bool Load(const std::string& languageCode, const char* resourceName, const char* resourceType);
    // The same from UTF-16 code units already in memory.
    bool LoadFromUnits(const std::string& languageCode, const char16_t* units, size_t count);

    // The text of key, or the shared "not found" text.
    const std::wstring& Find(const std::string& key) const;

    static const std::wstring& NotFoundText();

private:
    std::map<std::string, std::wstring> texts;
};
