#include "base/xml_file.h"

#include "base/atomic_file.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "base/xml_nesting.h"

namespace {

std::string NormaliseLineBreaks(const std::string& text) {
    std::string result;
    result.reserve(text.size());
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '\r') {
            result += text[i];
            continue;
        }
        result += '\n';
        if (i + 1 < text.size() && text[i + 1] == '\n') ++i;
    }
    return result;
}

}  // namespace

bool ParseXml(std::string text, TiXmlDocument& document) {
    document.Clear();
    if (text.find('\0') != std::string::npos) return false;
    if (text.compare(0, 3, "\xEF\xBB\xBF") == 0) text.erase(0, 3);
    text = NormaliseLineBreaks(text);
    int64_t nodes = 0;
    if (MeasureXmlNesting(text, kMaximumXmlNesting, nodes) < 0 || nodes > kMaximumXmlNodes) return false;
    // Legacy encoding: TinyXML's UTF-8 mode would take a code-page byte
    // such as 0xE9 as the lead of a three-byte character and swallow the
    // quote after it (or step past the end of the text).
    document.Parse(text.c_str(), nullptr, TIXML_ENCODING_LEGACY);
    return !document.Error() && document.RootElement() != nullptr;
}

bool LoadXmlFile(const std::string& path, TiXmlDocument& document) {
    document.Clear();
    std::string text;
    return ReadFileBytes(path, kMaximumXmlFileSize, text) && ParseXml(std::move(text), document);
}

std::string PrintXml(const TiXmlDocument& document) {
    TiXmlPrinter printer;
    printer.SetIndent("    ");
    printer.SetLineBreak(kXmlLineBreak);
    document.Accept(&printer);
    return printer.Str();
}

bool SaveXmlFile(const TiXmlDocument& document, const std::string& path, const std::string& temporaryPath) {
    const std::string content = PrintXml(document);
    const bool saved = temporaryPath.empty() ? ReplaceFileAtomically(path, content)
                                             : ReplaceFileAtomically(path, content, temporaryPath);
    if (!saved) LOG(Error) << "Failed to write file: " << path;
    return saved;
}

bool ReadElementText(const TiXmlNode* parent, const char* name, std::string& text) {
    const TiXmlElement* element = parent == nullptr ? nullptr : parent->FirstChildElement(name);
    const TiXmlNode* child = element == nullptr ? nullptr : element->FirstChild();
    if (child == nullptr || child->ToText() == nullptr) return false;
    text = child->ValueStr();
    return true;
}

TiXmlElement* AppendTextElement(TiXmlNode* parent, const char* name, const std::string& text) {
    TiXmlElement* element = parent->InsertEndChild(TiXmlElement(name))->ToElement();
    element->InsertEndChild(TiXmlText(text));
    return element;
}

void StartXmlDocument(TiXmlDocument& document) {
    document.Clear();
    document.InsertEndChild(TiXmlDeclaration("1.0", "", ""));
}
