#include "base/file_stream.h"

#include "base/exception.h"
#include "base/file_journal.h"

FileStream::~FileStream() { handle.Close(); }

void FileStream::OpenWith(const std::string& path, NativeHandle::Mode mode, const char* failure) {
    Close();
    name = path;
    if (!handle.Open(path, mode)) throw Exception(failure + path);
    filePointer = 0;
    if (IFileJournal* journal = GetFileJournal(); journal != nullptr && mode != NativeHandle::Mode::OpenRead) {
        journal->Created(path, mode == NativeHandle::Mode::CreateAlways);
    }
}

void FileStream::Create(const std::string& path) {
    OpenWith(path, NativeHandle::Mode::CreateAlways, "Failed to create file: ");
}

void FileStream::Open(const std::string& path) {
    OpenWith(path, NativeHandle::Mode::OpenRead, "Failed to open file: ");
}

void FileStream::OpenForWrite(const std::string& path) {
    OpenWith(path, NativeHandle::Mode::OpenAlways, "Failed to open file: ");
}

void FileStream::Close() { handle.Close(); }

int64_t FileStream::Seek(int64_t offset, uint32_t origin) {
    int64_t newPosition = 0;
    if (!handle.Seek(offset, origin, newPosition)) throw Exception("Failed to seek file.");
    position = newPosition;
    filePointer = newPosition;
    return position;
}

int64_t FileStream::GetPosition() { return position; }

int64_t FileStream::GetLength() {
    int64_t length = 0;
    if (!handle.Length(length)) throw Exception("Failed to get of length file.");
    return length;
}

int32_t FileStream::ReadByte() {
    uint8_t value = 0;
    uint32_t done = 0;
    if (!handle.Read(&value, 1, done)) throw Exception("Failed to read byte from file.");
    filePointer += done;
    return done == 0 ? -1 : static_cast<int32_t>(value);
}

uint32_t FileStream::Read(void* destination, uint32_t count) {
    uint32_t done = 0;
    if (!handle.Read(destination, count, done)) throw Exception("Failed to read data from file.");
    filePointer += done;
    return done;
}

uint32_t FileStream::Write(const void* source, uint32_t count) {
    uint32_t done = 0;
    if (!handle.Write(source, count, done)) throw Exception("Failed to write data to file.");
    if (IFileJournal* journal = GetFileJournal()) journal->Wrote(name, filePointer, source, done);
    filePointer += done;
    return done;
}

void FileStream::WriteByte(uint8_t) {}

void FileStream::Attach(uint8_t*, int32_t) {}

void FileStream::Flush() {
    if (!handle.Flush()) throw Exception("Failed to flush file: " + name);
    if (IFileJournal* journal = GetFileJournal()) journal->Flushed(name);
}

bool ReadFileBytes(const std::string& path, int64_t limit, std::string& bytes) {
    bytes.clear();
    try {
        FileStream file;
        file.Open(path);
        const int64_t length = file.GetLength();
        if (length < 0 || length > limit) return false;
        bytes.resize(static_cast<size_t>(length));
        size_t done = 0;
        while (done < bytes.size()) {
            const uint32_t count = file.Read(&bytes[done], static_cast<uint32_t>(bytes.size() - done));
            if (count == 0) return false;
            done += count;
        }
        return true;
    } catch (const Exception&) {
        return false;
    }
}

int64_t GetFileLength(const std::string& path) {
    try {
        FileStream file;
        file.Open(path);
        return file.GetLength();
    } catch (const Exception&) {
        return -1;
    }
}
