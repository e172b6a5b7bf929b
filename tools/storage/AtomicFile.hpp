#pragma once

#include <storage/provider/ByteStream.hpp>
#include <storage/provider/StorageItem.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <memory>
#include <optional>

namespace foundation::storage::tool {

/// What becomes of a file that stands at the target already.
enum class Replace
{
    Never,
    Files,
};

/// A file that appears at its target whole, once it is committed, or not at all.
///
/// `Replace::Never` holds up to the last moment: the content is written beside the target, and takes its name only if
/// nothing has it by then, also on stores that cannot move without replacing. Failures are those of the store. One that
/// is dropped without a commit leaves nothing.
class AtomicFile
{
public:
    AtomicFile(provider::StorageItem const& target, Replace replace);
    ~AtomicFile();
    AtomicFile(AtomicFile const&) = delete;
    AtomicFile& operator=(AtomicFile const&) = delete;

    /// Writes all bytes, however many the store takes at a time; one that takes none fails with `IOError`.
    void write(char const* data, long count);

    /// Goes on as if `count` zeros had been written, and where the store is known to read zeros from places that were
    /// never written, leaves such a place.
    void writeZeros(long count);

    /// Checks that what was written has the expected size, and publishes it.
    void commit(long expectedSize);

    /// Removes what was written; answers whether that was possible. Does nothing after a commit.
    bool discard() noexcept;

private:
    provider::ByteStream& stream();
    void endHole();
    void publish();

    provider::StorageItem target_;
    std::optional<provider::StorageItem> scratch_;
    std::unique_ptr<provider::ByteStream> scratchStream_;
    std::unique_ptr<provider::TransactionalStream> transaction_;
    long hole_ = 0;
    bool isFinished_ = false;
};

} // namespace foundation::storage::tool
