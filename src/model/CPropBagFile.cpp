#include "qzivi/model/CPropBagFile.h"

#include "qzivi/support/failure.h"

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qzivi {

namespace {

constexpr std::uint16_t kByteArrayTag = 0x2011;
constexpr const char* kLoad = "LoadPropBagFile";
constexpr const char* kSave = "SavePropBagFile";

[[noreturn]] void FileFailure(const char* source, const std::string& path,
                              const std::string& what) {
    RaiseRuntime(runtime::kFileAccess,
                 "The configuration file \"" + path + "\" " + what + ": " + std::strerror(errno),
                 source);
}

[[noreturn]] void Improper(const std::string& why) {
    RaiseRuntime(-runtime::kImproperFile, "Improper file type. " + why, kLoad);
}

// The file, closed on every way out.
struct Fd {
    int fd = -1;
    ~Fd() {
        if (fd >= 0) ::close(fd);
    }
};

void ReadExactly(int fd, void* into, std::size_t size, const std::string& path) {
    auto* p = static_cast<char*>(into);
    while (size > 0) {
        const ssize_t got = ::read(fd, p, size);
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) FileFailure(kLoad, path, "cannot be read");
        if (got == 0) Improper("The file \"" + path + "\" ends inside its header or contents.");
        p += got;
        size -= static_cast<std::size_t>(got);
    }
}

void WriteAll(int fd, const void* data, std::size_t size, const std::string& path) {
    const auto* p = static_cast<const char*>(data);
    while (size > 0) {
        const ssize_t put = ::write(fd, p, size);
        if (put < 0 && errno == EINTR) continue;
        if (put < 0) FileFailure(kSave, path, "cannot be written");
        p += put;
        size -= static_cast<std::size_t>(put);
    }
}

} // namespace

CPropBagFile::~CPropBagFile() {
    try {
        SavePropBagFile();
    } catch (...) {
    }
}

void CPropBagFile::FilePath(const std::string& value) {
    m_sFilePath = value;
    m_bDirty = true;
}

void CPropBagFile::FileIdentifier(const std::string& value) {
    m_sFileIdentifier = value;
    m_bDirty = true;
}

void CPropBagFile::InitPropBagFile(const std::string& path, const std::string& identifier) {
    m_oBag = std::make_unique<PropertyBag>();
    FilePath(path);
    FileIdentifier(identifier);
}

PropertyBag& CPropBagFile::WritableBag() {
    if (!m_oBag) m_oBag = std::make_unique<PropertyBag>();
    m_bDirty = true;
    return *m_oBag;
}

void CPropBagFile::LoadPropBagFile(const std::string& path, const std::string& identifier) {
    m_sFilePath = path;
    m_sFileIdentifier = identifier;
    struct stat info {};
    if (path.empty() || ::stat(path.c_str(), &info) != 0) return;
    Fd file;
    file.fd = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC); // a FIFO must not block
    if (file.fd < 0) FileFailure(kLoad, path, "cannot be opened");
    if (::fstat(file.fd, &info) != 0 || !S_ISREG(info.st_mode))
        RaiseRuntime(runtime::kFileAccess,
                     "The configuration file \"" + path + "\" is no regular file.", kLoad);
    const auto length = static_cast<std::uint64_t>(info.st_size);

    std::string head(identifier.size(), '\0');
    if (length < identifier.size())
        Improper("The file \"" + path + "\" is shorter than its identifier.");
    ReadExactly(file.fd, head.data(), head.size(), path);
    if (head != identifier)
        Improper("The file \"" + path + "\" does not begin with \"" + identifier + "\".");
    auto bag = std::make_unique<PropertyBag>();
    std::int32_t size = 0;
    if (length - identifier.size() < sizeof size) {
        m_oBag = std::move(bag); // the identifier alone: an empty bag
        return;
    }
    ReadExactly(file.fd, &size, sizeof size, path);
    if (size <= 0) {
        m_oBag = std::move(bag);
        return;
    }
    std::uint16_t tag = 0, dimensions = 0;
    std::int32_t count = 0, lowerBound = 0;
    ReadExactly(file.fd, &tag, sizeof tag, path);
    ReadExactly(file.fd, &dimensions, sizeof dimensions, path);
    ReadExactly(file.fd, &count, sizeof count, path);
    ReadExactly(file.fd, &lowerBound, sizeof lowerBound, path);
    if (tag != kByteArrayTag || dimensions != 1 || lowerBound != 0)
        Improper("The contents of \"" + path + "\" are not a block of bytes.");
    const std::uint64_t header = identifier.size() + 16;
    if (count < 0 || static_cast<std::uint64_t>(count) > length - header)
        Improper("The file \"" + path + "\" claims " + std::to_string(count) +
                 " bytes of contents but holds " + std::to_string(length - header) + ".");
    auto contents = std::make_shared<Bytes>(static_cast<std::size_t>(count));
    ReadExactly(file.fd, contents->data(), contents->size(), path);
    try {
        bag->SetContents(SharedBytes(std::move(contents), 0, static_cast<std::size_t>(count)));
    } catch (Failure& f) {
        throw Failure(f.Number(), kLoad, f.Description());
    }
    m_oBag = std::move(bag);
}

void CPropBagFile::SavePropBagFile() {
    if (!m_bDirty) return;
    const std::string& path = m_sFilePath;
    // A bag without values is no content: the file ends after the identifier.
    const bool empty = !m_oBag || m_oBag->Size() == 0;
    std::size_t count = 0;
    if (!empty) m_oBag->WriteContents([&](const void*, std::size_t size) { count += size; });
    if (count > 0x7FFFFFFF)
        RaiseRuntime(runtime::kOverflow, "The configuration is too large for its file.", kSave);
    const std::string temporary = path + ".tmp-" + std::to_string(::getpid());
    Fd file;
    file.fd = ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
    if (file.fd < 0) FileFailure(kSave, temporary, "cannot be created");
    try {
        // Small pieces gather here; large ones go straight to the file.
        Bytes pending;
        pending.reserve(1 << 16);
        auto flush = [&] {
            WriteAll(file.fd, pending.data(), pending.size(), temporary);
            pending.clear();
        };
        auto sink = [&](const void* data, std::size_t size) {
            if (pending.size() + size > pending.capacity()) flush();
            if (size >= pending.capacity()) {
                WriteAll(file.fd, data, size, temporary);
                return;
            }
            const auto* bytes = static_cast<const std::uint8_t*>(data);
            pending.insert(pending.end(), bytes, bytes + size);
        };
        sink(m_sFileIdentifier.data(), m_sFileIdentifier.size());
        if (!empty) {
            const auto total = static_cast<std::int32_t>(count);
            const std::int32_t highest = total - 1, lowerBound = 0;
            const std::uint16_t tag = kByteArrayTag, dimensions = 1;
            sink(&highest, sizeof highest);
            sink(&tag, sizeof tag);
            sink(&dimensions, sizeof dimensions);
            sink(&total, sizeof total);
            sink(&lowerBound, sizeof lowerBound);
            m_oBag->WriteContents(sink);
        }
        flush();
        if (::fsync(file.fd) != 0) FileFailure(kSave, temporary, "cannot be flushed");
        ::close(file.fd);
        file.fd = -1;
        if (::rename(temporary.c_str(), path.c_str()) != 0)
            FileFailure(kSave, path, "cannot be replaced");
    } catch (...) {
        ::unlink(temporary.c_str());
        throw;
    }
    m_bDirty = false;
}

} // namespace qzivi
