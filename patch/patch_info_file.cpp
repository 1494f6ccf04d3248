#include "patch/patch_info_file.h"

#include <sstream>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/xml_file.h"

namespace {

struct CursorList {
    const char* list;
    const char* item;
};

// In the order of PatchInfoFile::Cursor.
const CursorList kCursorLists[] = {
    {"FileChanges", "diff"},         {"FileChanges", "new"},
    {"FileChanges", "delete"},       {"DirectoryChanges", "delete"},
    {"DirectoryChanges", "new"},     {"RegistryChanges", "delete"},
    {"RegistryChanges", "new"},      {"RegistryGroupChanges", "delete"},
    {"RegistryGroupChanges", "new"},
};

int32_t CountElements(const TiXmlElement* list) {
    int32_t count = 0;
    for (const TiXmlElement* item = list == nullptr ? nullptr : list->FirstChildElement(); item != nullptr;
         item = item->NextSiblingElement()) {
        ++count;
    }
    return count;
}

std::string AttributeOrEmpty(const TiXmlElement* element, const char* name) {
    const char* value = element->Attribute(name);
    return value == nullptr ? std::string() : std::string(value);
}

[[noreturn]] void RefuseArchiveList(const std::string& detail) {
    throw Exception("Invalid archive list in patch info file: " + detail, ErrorCode::CorruptData);
}

// A byte count in plain decimal digits: no sign, no blanks, and short
// enough for a signed 64-bit number.
bool ParseByteCount(const std::string& text, int64_t& value) {
    if (text.empty() || text.size() > 18 || text.find_first_not_of("0123456789") != std::string::npos) return false;
    value = std::stoll(text);
    return true;
}

bool ParseSha256(std::string text, std::string& hex) {
    if (text.size() != 64 || text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos) return false;
    for (char& c : text) c = static_cast<char>(c >= 'A' && c <= 'F' ? c - 'A' + 'a' : c);
    hex = text;
    return true;
}

void AppendList(TiXmlElement& root, const char* name, const std::vector<std::string>& paths) {
    TiXmlNode* list = root.InsertEndChild(TiXmlElement(name));
    TiXmlElement item("new");
    for (const std::string& path : paths) {
        item.SetAttribute("Path", path);
        list->InsertEndChild(item);
    }
}

}  // namespace

void PatchInfoFile::Load(const std::string& path) {
    std::string text;
    if (!ReadFileBytes(path, kMaximumXmlFileSize, text)) throw Exception("Failed to load patch info file.");
    Parse(std::move(text));
}

void PatchInfoFile::Parse(std::string text) {
    root = nullptr;
    for (const TiXmlElement*& cursor : cursors) cursor = nullptr;
    hive = RegistryHive::LocalMachine;
    registryPath.clear();
    spaceRequirement = -1;
    version.clear();
    fromVersion.clear();
    declaredArchives.clear();

    if (!ParseXml(std::move(text), document)) throw Exception("Failed to load patch info file.");
    root = document.RootElement();

    if (ReadElementText(root, "RegistryHive", text)) hive = ParseHive(text);
    if (ReadElementText(root, "RegistryPath", text)) registryPath = text;
    if (ReadElementText(root, "SpaceRequirement", text)) {
        std::istringstream number(text);
        int64_t value = 0;
        if (number >> value) spaceRequirement = value;
    }
    if (ReadElementText(root, "Version", text)) version = text;
    if (ReadElementText(root, "FromVersion", text)) fromVersion = text;
    ReadDeclaredArchives();
}

// Declared archives are what a damaged or substituted download is judged
// by, so a list that cannot be read whole is refused, not partly used.
void PatchInfoFile::ReadDeclaredArchives() {
    const TiXmlElement* list = root->FirstChildElement("Archives");
    for (const TiXmlElement* item = list == nullptr ? nullptr : list->FirstChildElement("archive"); item != nullptr;
         item = item->NextSiblingElement("archive")) {
        const std::string name = AttributeOrEmpty(item, "File");
        DeclaredArchive archive;
        if (name.empty()) RefuseArchiveList("an archive without a name");
        if (!ParseByteCount(AttributeOrEmpty(item, "Size"), archive.size)) RefuseArchiveList("the size of " + name);
        if (!ParseSha256(AttributeOrEmpty(item, "Sha256"), archive.sha256)) {
            RefuseArchiveList("the SHA-256 of " + name);
        }
        if (!declaredArchives.emplace(name, archive).second) RefuseArchiveList(name + " is listed twice");
    }
}

void PatchInfoFile::ResetIterators() {
    for (int i = 0; i < kCursorCount; ++i) {
        const TiXmlElement* list = root == nullptr ? nullptr : root->FirstChildElement(kCursorLists[i].list);
        cursors[i] = list == nullptr ? nullptr : list->FirstChildElement(kCursorLists[i].item);
    }
}

int32_t PatchInfoFile::CountFileAndDirectoryChanges() const {
    if (root == nullptr) return 0;
    return CountElements(root->FirstChildElement("FileChanges")) +
           CountElements(root->FirstChildElement("DirectoryChanges"));
}

bool PatchInfoFile::Next(Cursor cursor, std::string& path, std::string* archive) {
    path.clear();
    if (archive != nullptr) archive->clear();
    const TiXmlElement* item = cursors[cursor];
    if (item == nullptr) return false;
    path = AttributeOrEmpty(item, "Path");
    if (archive != nullptr) *archive = AttributeOrEmpty(item, "File");
    cursors[cursor] = item->NextSiblingElement(kCursorLists[cursor].item);
    return true;
}

bool PatchInfoFile::NextDiffFile(std::string& path, std::string& archive) { return Next(kDiffFile, path, &archive); }
bool PatchInfoFile::NextNewFile(std::string& path, std::string& archive) { return Next(kNewFile, path, &archive); }
bool PatchInfoFile::NextDeletedFile(std::string& path) { return Next(kDeletedFile, path, nullptr); }
bool PatchInfoFile::NextDeletedDirectory(std::string& path) { return Next(kDeletedDirectory, path, nullptr); }
bool PatchInfoFile::NextNewDirectory(std::string& path) { return Next(kNewDirectory, path, nullptr); }
bool PatchInfoFile::NextDeletedRegistryKey(std::string& path) { return Next(kDeletedRegistryKey, path, nullptr); }
bool PatchInfoFile::NextNewRegistryKey(std::string& path) { return Next(kNewRegistryKey, path, nullptr); }
bool PatchInfoFile::NextDeletedRegistryGroup(std::string& path) { return Next(kDeletedRegistryGroup, path, nullptr); }
bool PatchInfoFile::NextNewRegistryGroup(std::string& path) { return Next(kNewRegistryGroup, path, nullptr); }

bool PatchInfoFile::Save(const std::string& path, const std::vector<std::string>& files,
                         const std::vector<std::string>& directories, const std::vector<std::string>& registryKeys,
                         const std::vector<std::string>& registryGroups, RegistryHive hive,
                         const std::string& registryPath) {
    const std::string hiveName = HiveName(hive);
    TiXmlDocument document;
    StartXmlDocument(document);
    TiXmlElement* root = document.InsertEndChild(TiXmlElement("IronvaleWestPatch"))->ToElement();
    AppendList(*root, "FileChanges", files);
    AppendList(*root, "DirectoryChanges", directories);
    AppendList(*root, "RegistryChanges", registryKeys);
    AppendList(*root, "RegistryGroupChanges", registryGroups);
    AppendTextElement(root, "RegistryHive", hiveName);
    AppendTextElement(root, "RegistryPath", registryPath);
    return SaveXmlFile(document, path);
}

RegistryHive PatchInfoFile::ParseHive(const std::string& text) {
    if (text == "HKEY_LOCAL_MACHINE") return RegistryHive::LocalMachine;
    if (text == "HKEY_CURRENT_USER") return RegistryHive::CurrentUser;
    if (text == "HKEY_USERS") return RegistryHive::Users;
    throw Exception("Hive not recognized");
}

std::string PatchInfoFile::HiveName(RegistryHive hive) {
    const std::string name = RegistryHiveName(hive);
    if (name.empty()) throw Exception("Hive not supported");
    return name;
}
