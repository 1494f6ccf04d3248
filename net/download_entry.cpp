#include "net/download_entry.h"

#include "base/paths.h"
#include "net/location.h"

std::list<DownloadEntry> MakeDownloadList(const std::vector<std::string>& names, const std::string& location,
                                          const std::string& folder) {
    std::list<DownloadEntry> list;
    for (const std::string& name : names) list.emplace_back(JoinLocation(location, name), PathJoin(folder, name));
    return list;
}
