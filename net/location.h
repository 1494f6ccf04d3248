#pragma once

#include <string>

// Joins a download location and a tail with the separator the location's
// kind uses: "/" for HTTP addresses and anything unrecognised, the path
// separator for UNC paths and for the path of a file:// address (whose
// "file://" stays as it is). Slashes of the other kind in either part become
// that separator. An empty base gives the tail alone.
std::string JoinLocation(const std::string& base, const std::string& tail);

// The host name of an address; empty when the address cannot be split or
// its host does not fit 255 bytes.
std::string GetUrlHostName(const std::string& url);

// How the downloader fetches a location.
enum class LocationKind {
    Http,         // "http://" in any letter case
    FileCopy,     // "file://" in any letter case, or a UNC path
    Relative,     // relative to the program's folder, then copied
    Unsupported,  // an absolute local path
};
LocationKind ClassifyLocation(const std::string& url);

// The path a file copy reads: the location without its "file://" prefix.
std::string GetCopySource(const std::string& url);

// The folder of the running executable, with its trailing separator.
std::string GetProgramFolder();

// The platform's own tests of a location's form.
// UNC form: two leading backslashes (on POSIX two leading slashes too).
bool IsUncLocation(const std::string& location);
// Relative unless it begins with a separator (or, on Windows, has a drive
// colon); an empty text counts as relative.
bool IsRelativeLocation(const std::string& location);
