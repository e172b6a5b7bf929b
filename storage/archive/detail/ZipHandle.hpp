#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/BufferedReader.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Source.hpp>

#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

struct zip;
struct zip_error;
struct zip_file;

namespace foundation::storage::archive::detail {

/// What the directory of a zip says of an entry.
struct ZipEntry
{
    std::u16string name;
    std::uint64_t size = 0;
    std::uint64_t sizeInArchive = 0;
    std::int64_t modified = 0;  ///< microseconds since 1970
    std::uint32_t unixMode = 0; ///< 0 where the archive was not made by a system that has it
    bool isStored = false;
    bool isEncrypted = false;
    bool isFolder = false; ///< as the attributes have it, whatever the name
};

/// The name of an entry; empty where it has none.
std::u16string nameOfEntry(::zip* archive, std::uint64_t number);

/// What an error of libzip means.
ArchiveException::Reason reasonOf(::zip_error const& error);

/// An archive opened by libzip. One thread at a time may use it, and holds its lock meanwhile.
///
/// Errors: `Fault`.
class FOUNDATION_API ZipHandle
{
public:
    /// Reads the directory; gives up, and does not keep it in memory, where that has more entries than the limits
    /// allow.
    ZipHandle(std::shared_ptr<Source const> source, ArchiveLimits const& limits);
    ~ZipHandle();
    ZipHandle(ZipHandle const&) = delete;
    ZipHandle& operator=(ZipHandle const&) = delete;

    std::mutex& mutex() { return mutex_; }

    std::uint64_t size() const;
    ZipEntry entry(std::uint64_t number);

    struct CloseFile
    {
        void operator()(::zip_file* file) const;
    };
    using File = std::unique_ptr<::zip_file, CloseFile>;

    File open(std::uint64_t number);

    /// 0 at the end, where size and checksum have turned out to be right.
    std::size_t read(File const& file, char* buffer, std::size_t count);
    void seek(File const& file, std::uint64_t position);

private:
    static std::int64_t serve(void* self, void* data, std::uint64_t length, int command);

    void requireWithinLimits(std::uint64_t length);
    std::int64_t answer(void* data, std::uint64_t length, int command);
    [[noreturn]] void throwFault(::zip_error const& error);
    [[noreturn]] void throwFault(File const& file);

    BufferedReader reader_;
    ArchiveLimits const limits_;
    bool isOpening_ = true;
    std::uint64_t bytesOfDirectory_ = 0;
    std::uint64_t recordsOfDirectory_ = 0;
    std::unique_ptr<::zip_error> error_;
    std::optional<Fault> failure_;     ///< of the source, which libzip knows as an error of reading alone
    std::optional<Fault> lastFailure_; ///< which libzip may come back to
    ::zip* zip_ = nullptr;
    std::mutex mutex_;
};

} // namespace foundation::storage::archive::detail
