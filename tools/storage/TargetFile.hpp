#pragma once

#include <storage/provider/ByteStream.hpp>
#include <storage/provider/StorageItem.hpp>

namespace foundation::storage::tool {

/// What becomes of a file that stands at the target already.
enum class Replace
{
    Never,
    Files,
};

/// A file that is being written, from its start to its end. Failures are those of the store.
class TargetFile
{
public:
    virtual ~TargetFile() = default;
    TargetFile(TargetFile const&) = delete;
    TargetFile& operator=(TargetFile const&) = delete;

    /// Writes all bytes, however many the store takes at a time; one that takes none fails with `IOError`.
    void write(char const* data, long count);

    /// Goes on as if `count` zeros had been written, and where the store is known to read zeros from places that were
    /// never written, leaves such a place.
    void writeZeros(long count);

    /// Checks that what was written has the expected size, and ends the file.
    void commit(long expectedSize);

    /// Takes back what was written, as far as that goes; answers whether nothing is left of it. Does nothing after a
    /// commit.
    virtual bool discard() noexcept = 0;

    /// What is left when `discard` has answered false, in words for the user.
    virtual char const* leftover() const = 0;

protected:
    explicit TargetFile(provider::StorageItem target);

    provider::StorageItem const& target() const { return target_; }
    virtual provider::ByteStream& stream() = 0;

    /// Closes the stream and puts the file at its place, all of which has been written.
    virtual void publish() = 0;

private:
    void endHole();

    provider::StorageItem target_;
    long hole_ = 0;
};

} // namespace foundation::storage::tool
