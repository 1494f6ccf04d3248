#pragma once

#include <string>
#include <vector>

// The one check every name from a patch description or an uninstall record
// passes before it touches the disk. True when path is a plain relative
// path that stays inside the folder it is joined to and names exactly one
// thing there on Windows and on POSIX alike:
// - not empty, and every component (either slash separates) is a real
//   name: not empty, not "." or "..", not ending in a dot or a space
//   (Windows drops those, so two names would reach one file);
// - no root, drive letter, colon or UNC prefix;
// - no wildcard or other character Windows forbids in names (* ? < > | "
//   and control characters);
// - no component that is a device name (CON, PRN, AUX, NUL, CONIN$,
//   CONOUT$, COM and LPT with 0-9 or a superscript 1-3, in any case, with
//   or without an extension, blanks before the extension included).
// ownNames are relative paths the updater keeps for itself (its work
// folders and records): the item may neither name one nor lie inside one
// (compared by components, ignoring ASCII case as Windows does).
bool IsSafeItemPath(const std::string& path, const std::vector<std::string>& ownNames = {});
