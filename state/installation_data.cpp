#include "state/installation_data.h"

#include <sstream>
#include <vector>

#include "base/exception.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "base/xml_file.h"

namespace {

const char kReadFailure[] = "Failed to read InstallationData file.";

std::string TextOr(const TiXmlElement* root, const char* name, const char* fallback) {
    std::string text;
    return ReadElementText(root, name, text) ? text : std::string(fallback);
}

// "a,1,,b,2,x" -> a=1, b=2: runs of commas separate, empty tokens vanish,
// tokens pair up as key and value, and an odd last token is dropped.
void ReadHashes(const std::string& text, std::map<std::string, std::string>& hashes) {
    std::vector<std::string> tokens;
    std::string token;
    std::istringstream stream(text);
    while (std::getline(stream, token, ',')) {
        if (!token.empty()) tokens.push_back(token);
    }
    for (size_t i = 0; i + 1 < tokens.size(); i += 2) hashes[tokens[i]] = tokens[i + 1];
}

}  // namespace

void InstallationData::SetDirectory(const std::string& folder) {
    directory = folder;
    filePath = PathJoin(directory, kInstallationDataFileName);
}

void InstallationData::Load(const std::string& folder) {
    SetDirectory(folder);
    TiXmlDocument document;
    if (!LoadXmlFile(filePath, document)) throw Exception("Failed to load InstallationData file.");
    const TiXmlElement* root = document.RootElement();
    std::string text;
    if (!ReadElementText(root, "CurrentVersion", text)) throw Exception(kReadFailure);
    currentVersion = text;
    if (!ReadElementText(root, "PatcherVersion", text)) throw Exception(kReadFailure);
    patcherVersion = text;
    eulaVersion = TextOr(root, "EulaVersion", "0");
    pbEulaVersion = TextOr(root, "PbEulaVersion", "0");
    sku = TextOr(root, "Sku", "");
    if (ReadElementText(root, "InstalledHashes", text)) ReadHashes(text, installedHashes);
}

bool InstallationData::Save() const {
    std::string hashes;
    for (const auto& entry : installedHashes) hashes += entry.first + "," + entry.second + ",";
    TiXmlDocument document;
    StartXmlDocument(document);
    TiXmlNode* root = document.InsertEndChild(TiXmlElement("InstallationData"));
    AppendTextElement(root, "CurrentVersion", currentVersion);
    AppendTextElement(root, "PatcherVersion", patcherVersion);
    AppendTextElement(root, "EulaVersion", eulaVersion);
    AppendTextElement(root, "PbEulaVersion", pbEulaVersion);
    AppendTextElement(root, "Sku", sku);
    AppendTextElement(root, "InstalledHashes", hashes);
    return SaveXmlFile(document, filePath);
}

void InstallationData::SetPatcherVersion(float number) {
    std::ostringstream text;
    text << number;
    patcherVersion = text.str();
}
