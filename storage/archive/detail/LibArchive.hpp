#pragma once

#include <foundation/export.hpp>

#include <memory>

struct archive;
struct archive_entry;

namespace foundation::storage::archive::detail {

struct FreeLibArchive
{
    void operator()(::archive* reader) const;
};

/// An archive as libarchive reads it.
using LibArchivePtr = std::unique_ptr<::archive, FreeLibArchive>;

/// Throws `std::bad_alloc`.
FOUNDATION_API LibArchivePtr newLibArchive();

/// Has libarchive look for gzip, bzip2, xz, lzma and zstd, as far as it does them by itself: it starts other programs
/// for those that it was built without.
FOUNDATION_API void supportCompression(::archive* reader);

/// Has names come out of libarchive the same in every locale of the program.
///
/// libarchive turns names into the characters of the thread's locale where it knows what they are written in, and
/// composes accents on the way. What does not fit into the locale comes as the bytes that stand in the archive.
class FOUNDATION_API NameLocale
{
public:
    enum class Names
    {
        AsBytes, ///< for formats that hold names as bytes
        AsUtf8,  ///< for formats that hold names in UTF-16
    };

    explicit NameLocale(Names names);
    ~NameLocale();
    NameLocale(NameLocale const&) = delete;
    NameLocale& operator=(NameLocale const&) = delete;

private:
    void* previous_;
};

} // namespace foundation::storage::archive::detail
