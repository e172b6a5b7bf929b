#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Content.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <memory>
#include <optional>
#include <string>
#include <system_error>

namespace foundation::storage::archive::detail {

/// A stream that is closed, or whose archive cannot be read: what was attempted, where, and why it failed.
class FOUNDATION_API ArchiveStreamFailure final : public provider::ByteStreamFailure
{
public:
    ArchiveStreamFailure(std::string const& attempt, provider::StorageIRI const& iri, std::errc error);
    ArchiveStreamFailure(std::string const& attempt, provider::StorageIRI const& iri, Fault const& fault);

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
};

/// Reads an entry at any place, by going over it again where the content can only be read forward.
///
/// The last bytes are handed out when the content has turned out to be whole and right, not before. After a failure the
/// stream fails in the same way until it is moved by `seek`, which has it read the entry anew.
class FOUNDATION_API EntryStream final : public provider::ByteStream
{
public:
    EntryStream(provider::StorageIRI const& iri, std::unique_ptr<Content> content, std::uint64_t size);
    ~EntryStream() override;

protected:
    long doRead(char* buffer, long count) override;
    [[noreturn]] long doWrite(char const* data, long count) override;

    /// Positions beyond the end are allowed. Nothing is read before the next `read`.
    long doSeek(long offset, std::ios_base::seekdir direction) override;
    void doClose() override;

private:
    void requireOpen(char const* attempt, long count = 0) const;
    std::size_t readContent(char* buffer, std::size_t count);
    std::size_t readAtPosition(char* buffer, std::size_t count);
    void restart();
    void goToPosition();
    void skip(std::uint64_t count);
    std::size_t readOn(char* buffer, std::size_t count);

    provider::StorageIRI const iri_;
    std::unique_ptr<Content> content_;
    std::uint64_t const size_;
    std::uint64_t position_ = 0;
    std::uint64_t contentPosition_ = 0;
    bool isFinished_ = false;
    bool mustRestart_ = false; ///< nobody knows where the content stands
    std::optional<Fault> failure_;
};

} // namespace foundation::storage::archive::detail
