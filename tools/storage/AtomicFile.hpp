#pragma once

#include <storage/provider/TransactionalStream.hpp>
#include <tools/storage/TargetFile.hpp>

#include <memory>
#include <optional>

namespace foundation::storage::tool {

/// A file that appears at its target whole, once it is committed, or not at all.
///
/// `Replace::Never` holds up to the last moment: the content is written beside the target, and takes its name only if
/// nothing has it by then, also on stores that cannot move without replacing. One that is dropped without a commit
/// leaves nothing.
class AtomicFile final : public TargetFile
{
public:
    /// `isSynced` has the content on the disk before it takes the name, in a store that was told to sync.
    AtomicFile(provider::StorageItem const& target, Replace replace, bool isSynced = false);
    ~AtomicFile() override;

    bool discard() noexcept override;
    char const* leftover() const override { return "what was written beside it could not be removed"; }

protected:
    provider::ByteStream& stream() override;
    void publish() override;

private:
    void moveToTarget();

    std::optional<provider::StorageItem> scratch_;
    std::unique_ptr<provider::ByteStream> scratchStream_;
    std::unique_ptr<provider::TransactionalStream> transaction_;
    bool isCommitted_ = false; ///< the transaction is through, though its file may not have the name yet
    bool isFinished_ = false;
};

} // namespace foundation::storage::tool
