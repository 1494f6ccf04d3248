#include "app/updater_arguments.h"

#include <cmath>
#include <limits>
#include <sstream>
#include <vector>

#include "base/command_line.h"
#include "base/string_helpers.h"

const char* const kDefaultHostName = "updates.ironvale-game.com";

namespace {

// Stream extraction of a single-precision number, truncated toward zero.
// Values outside the 32-bit range saturate instead of overflowing.
void ReadSeconds(const std::string& text, int32_t& field) {
    std::istringstream in(text);
    float value = 0;
    if (!(in >> value) || std::isnan(value)) return;
    const double truncated = std::trunc(static_cast<double>(value));
    if (truncated >= static_cast<double>(std::numeric_limits<int32_t>::max())) {
        field = std::numeric_limits<int32_t>::max();
    } else if (truncated <= static_cast<double>(std::numeric_limits<int32_t>::min())) {
        field = std::numeric_limits<int32_t>::min();
    } else {
        field = static_cast<int32_t>(truncated);
    }
}

}  // namespace

UpdaterArguments::UpdaterArguments() : hostName(kDefaultHostName) {}

bool UpdaterArguments::Parse(const std::string& commandLine) {
    const std::vector<std::string> words = SplitCommandLine(commandLine);
    if (!words.empty() && EqualsIgnoringCase(words[0], "-kdl_gl_remove")) {
        kdlGlRemove = true;
        for (size_t i = 1; i < words.size(); ++i) {
            if (EqualsIgnoringCase(words[i], "-silent")) silent = true;
            if (EqualsIgnoringCase(words[i], "-delete_corvid")) deleteCorvid = true;
        }
        return true;
    }
    size_t cursor = 0;
    while (words.size() >= 2 && cursor + 1 < words.size()) {
        const std::string& name = words[cursor];
        const std::string& value = words[cursor + 1];
        if (EqualsIgnoringCase(name, "-serverDeltaTime")) {
            ReadSeconds(value, serverDeltaTime);
        } else if (EqualsIgnoringCase(name, "-internallyElevated")) {
            if (!value.empty() && value[0] == '1') internallyElevated = true;
        } else if (EqualsIgnoringCase(name, "-SID")) {
            sid = value;
        } else if (EqualsIgnoringCase(name, "-hostname")) {
            hostName = value;
        } else if (EqualsIgnoringCase(name, "-downloadEula")) {
            downloadEula = EqualsIgnoringCase(value, "true");
        } else if (EqualsIgnoringCase(name, "-doUninstallCleanup")) {
            doUninstallCleanup = EqualsIgnoringCase(value, "true");
        } else if (EqualsIgnoringCase(name, "-doRemoveSettings")) {
            doRemoveSettings = EqualsIgnoringCase(value, "true");
        } else if (EqualsIgnoringCase(name, "-latestVersion")) {
            latestVersion = value;
        } else {
            cursor += 1;
            continue;
        }
        cursor += 2;
    }
    return true;
}

std::string UpdaterArguments::Describe() const {
    std::ostringstream out;
    out << "Arguments: ServerDeltaTime=" << serverDeltaTime << " InternallyElevated=" << (internallyElevated ? 1 : 0)
        << " loggedIn=" << (loggedIn ? 1 : 0) << " SessionId=" << sessionId << " HostName=" << hostName;
    return out.str();
}
