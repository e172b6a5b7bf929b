#pragma once

#include <tools/storage/TargetFile.hpp>

#include <memory>

namespace foundation::storage::tool {

/// A file that is written at its target, where each piece is seen at once.
///
/// With `Replace::Files` an existing file keeps its identity, and loses its content at the start. One that is dropped
/// without a commit leaves nothing of a file that it made, and of another what was written so far.
class PlainFile final : public TargetFile
{
public:
    PlainFile(provider::StorageItem const& target, Replace replace);
    ~PlainFile() override;

    bool discard() noexcept override;
    char const* leftover() const override { return "incomplete, because it was being written in place"; }

protected:
    provider::ByteStream& stream() override { return *stream_; }
    void publish() override;

private:
    bool isNew_;
    bool isFinished_ = false;
    std::unique_ptr<provider::ByteStream> stream_;
};

} // namespace foundation::storage::tool
