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
/// leaves nothing. Local files that are to be synced are so either way: with a commit, and with the move of a scratch
/// file.
class AtomicFile final : public TargetFile
{
public:
    AtomicFile(provider::StorageItem const& target, Replace replace);
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
    bool isFinished_ = false;
};

} // namespace foundation::storage::tool
