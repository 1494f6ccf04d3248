#include "state/processes.h"

#include <vector>

#include "base/command_line.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/paths.h"

ProgramCall ElevatedCall(const std::string& parameters, const std::string& programPath) {
    if (!programPath.empty()) return {programPath, parameters};
    const std::vector<std::string> words = SplitCommandLine(parameters);
    ProgramCall call;
    for (size_t i = 0; i < words.size(); ++i) {
        if (i == 0) {
            call.program = words[0];
        } else {
            call.parameters += "\"" + words[i] + "\" ";
        }
    }
    return call;
}

std::string GameParameters(const std::string& configured, const std::string& sessionId, const std::string& dataCenters,
                           const std::string& hostName) {
    // The values come from the command line: each stays one argument,
    // whatever it holds.
    std::string parameters = configured;
    if (!sessionId.empty()) parameters += " +sessionId " + QuoteArgument(sessionId);
    if (!dataCenters.empty()) parameters += " +dataCenters " + QuoteArgument(dataCenters);
    if (!hostName.empty()) parameters += " +webSiteHostName " + QuoteArgument(hostName);
    return parameters;
}

bool IsSteamEdition(const std::string& installDir) {
    if (installDir.empty()) return false;
    try {
        FileStream marker;
        marker.Open(PathJoin(installDir, "GDFBinary.dll"));
        return true;
    } catch (const Exception&) {
        return false;
    }
}
