#pragma once

#include <functional>
#include <string>

// A fresh folder under the system's temporary folder, removed with all its contents when the object goes away.
class TempFolder {
public:
    // In the system's temporary folder, or in base when given.
    explicit TempFolder(const std::string& base = "");
    TempFolder(const TempFolder&) = delete;
    TempFolder& operator=(const TempFolder&) = delete;
    ~TempFolder();

    const std::string& Path() const { return path; }
    // Path of a name inside the folder (joined with the platform separator).
    std::string operator/(const std::string& name) const;

private:
    std::string path;
};

// Whole-file helpers for fixtures; they throw std::runtime_error (or a filesystem_error) on failure so a broken fixture
// cannot pass for a product fault.
void WriteTextFile(const std::string& path, const std::string& content);
std::string ReadTextFile(const std::string& path);
bool PathExists(const std::string& path);

// Natively only: makes a file or folder immutable (nothing may delete,
// rename or replace it, not even root), or mutable again.
void SetImmutable(const std::string& path, bool immutable);
// The message of the Exception that action throws and its code, as "message (code)"; "" when it throws none.
std::string ErrorOf(const std::function<void()>& action);
inline bool EndsWith(const std::string& text, const std::string& end) {
    return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}
