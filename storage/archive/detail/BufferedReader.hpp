#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Source.hpp>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

namespace foundation::storage::archive::detail {

/// A position in a source, for whoever reads it in small pieces. For one thread at a time.
class FOUNDATION_API BufferedReader
{
public:
    explicit BufferedReader(std::shared_ptr<Source const> source) : source_(std::move(source)) {}

    /// Reads and moves on; answers fewer bytes than asked for only at the end. Throws `Fault`.
    std::size_t read(char* data, std::size_t count);

    void seek(std::uint64_t position) { position_ = position; }
    std::uint64_t position() const { return position_; }
    std::uint64_t size() const { return source_->size(); }

private:
    bool isBuffered() const;
    void fill();

    std::shared_ptr<Source const> source_;
    std::uint64_t position_ = 0;
    std::uint64_t bufferBegin_ = 0;
    std::vector<char> buffer_;
};

} // namespace foundation::storage::archive::detail
