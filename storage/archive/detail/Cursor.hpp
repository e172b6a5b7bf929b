#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Feed.hpp>
#include <storage/archive/detail/IndexBuilder.hpp>
#include <storage/archive/detail/LibArchive.hpp>

#include <cstdint>
#include <limits>
#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::archive::detail {

/// Goes over the entries of an archive once, in their order, by libarchive. For one thread at a time.
///
/// Errors: `Fault`.
class FOUNDATION_API Cursor
{
public:
    static constexpr std::uint64_t anyNumber = std::numeric_limits<std::uint64_t>::max();

    /// `mostBytesOfDirectory`: to be read until the first entry is known.
    Cursor(ArchiveFormat format, std::unique_ptr<Feed> feed, std::uint64_t mostBytesOfDirectory = anyNumber);
    ~Cursor();
    Cursor(Cursor const&) = delete;
    Cursor& operator=(Cursor const&) = delete;

    /// Goes to the next entry; answers false at the end.
    bool next();

    /// How many entries there are before the one it stands on.
    std::uint64_t number() const { return count_ - 1; }

    /// How many entries it has reached.
    std::uint64_t count() const { return count_; }

    /// What the archive says of the entry; its texts are valid until the next `next`.
    EntryRecord record();
    std::uint64_t size() const;
    bool isEncrypted() const;

    /// Where content stands in the bytes of the feed as it is, in one piece; nothing where it does not, or where that
    /// is not known.
    std::optional<std::uint64_t> offsetOfPlainContent() const;

    /// The next bytes of content, gaps filled with zeros; 0 at the end.
    std::size_t read(char* buffer, std::size_t count);

    /// Reads what follows the last entry, so that a checksum at the end is looked at.
    void drain();

private:
    static std::ptrdiff_t serve(::archive* archive, void* self, void const** data);
    static std::int64_t skip(::archive* archive, void* self, std::int64_t count);
    static std::int64_t seek(::archive* archive, void* self, std::int64_t offset, int origin);

    template <typename Action>
    std::int64_t guarded(::archive* archive, Action const& action);

    void countDirectory(std::size_t bytes);
    [[noreturn]] void throwFault();

    ArchiveFormat const format_;
    std::unique_ptr<Feed> feed_;
    std::uint64_t const mostBytesOfDirectory_;
    std::uint64_t bytesOfDirectory_ = 0;
    std::optional<Fault> failure_; ///< of the feed, which libarchive knows as an error of reading alone
    LibArchivePtr archive_;
    ::archive_entry* entry_ = nullptr;
    bool isDoubtful_ = false; ///< libarchive warns of the entry
    std::uint64_t count_ = 0;
    std::uint64_t contentRead_ = 0; ///< of the entry
    std::u16string path_;
    std::u16string target_;
};

} // namespace foundation::storage::archive::detail
