#include "tools/publisher/patch_description.h"

#include "base/exception.h"
#include "base/xml_file.h"
#include "patch/patch_info_file.h"

namespace {

TiXmlElement* AppendElement(TiXmlNode* parent, const char* name) {
    return parent->InsertEndChild(TiXmlElement(name))->ToElement();
}

void AppendItem(TiXmlElement* list, const char* kind, const std::string& path, const std::string* archive = nullptr) {
    TiXmlElement* item = AppendElement(list, kind);
    item->SetAttribute("Path", path);
    if (archive != nullptr) item->SetAttribute("File", *archive);
}

}  // namespace

void WritePatchDescription(const PatchDescription& description, const std::string& path) {
    TiXmlDocument document;
    StartXmlDocument(document);
    TiXmlElement* root = AppendElement(&document, "IronvaleWestPatch");
    TiXmlElement* files = AppendElement(root, "FileChanges");
    for (const auto& item : description.diffFiles) AppendItem(files, "diff", item.first, &item.second);
    for (const auto& item : description.newFiles) AppendItem(files, "new", item.first, &item.second);
    for (const std::string& file : description.deletedFiles) AppendItem(files, "delete", file);
    TiXmlElement* directories = AppendElement(root, "DirectoryChanges");
    for (const std::string& folder : description.deletedDirectories) AppendItem(directories, "delete", folder);
    for (const std::string& folder : description.newDirectories) AppendItem(directories, "new", folder);
    AppendElement(root, "RegistryChanges");
    AppendElement(root, "RegistryGroupChanges");
    AppendTextElement(root, "RegistryHive", PatchInfoFile::HiveName(description.hive));
    AppendTextElement(root, "RegistryPath", description.registryPath);
    if (description.spaceRequirement >= 0) {
        AppendTextElement(root, "SpaceRequirement", std::to_string(description.spaceRequirement));
    }
    if (!description.version.empty()) AppendTextElement(root, "Version", description.version);
    if (!description.fromVersion.empty()) AppendTextElement(root, "FromVersion", description.fromVersion);
    if (!description.archives.empty()) {
        TiXmlElement* archives = AppendElement(root, "Archives");
        for (const ArchiveRecord& archive : description.archives) {
            TiXmlElement* item = AppendElement(archives, "archive");
            item->SetAttribute("File", archive.file);
            item->SetAttribute("Size", std::to_string(archive.size));
            item->SetAttribute("Sha256", archive.sha256);
        }
    }
    if (!SaveXmlFile(document, path)) throw Exception("Failed to write " + path);
}
