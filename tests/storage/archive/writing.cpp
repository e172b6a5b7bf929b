#include <tests/storage/archive/writing.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/FolderEntry.hpp>
#include <tests/storage/archive/archives.hpp>

#include <stdexcept>
#include <utility>
#include <zip.h>

namespace foundation::storage::archive {

using namespace provider;

namespace {

/// A zip in memory, opened by libzip.
class Opened
{
public:
    explicit Opened(std::string const& bytes)
        : zip_(zip_open_from_source(zip_source_buffer_create(bytes.data(), bytes.size(), 0, nullptr), ZIP_RDONLY,
                                    nullptr))
    {
        if (zip_ == nullptr)
            throw std::runtime_error("not a zip");
    }
    ~Opened() { zip_discard(zip_); }
    Opened(Opened const&) = delete;
    Opened& operator=(Opened const&) = delete;

    zip_t* get() const { return zip_; }

    zip_uint64_t find(std::string const& name) const
    {
        zip_int64_t const index = zip_name_locate(zip_, name.c_str(), 0);
        if (index < 0)
            throw std::runtime_error("not in the zip: " + name);
        return static_cast<zip_uint64_t>(index);
    }

private:
    zip_t* zip_;
};

class NoSpace final : public ByteStreamFailure
{
public:
    NoSpace() : ByteStreamFailure("No space.", std::make_error_code(std::io_errc::stream), ErrorCode::NoSpaceLeft) {}

    core::except::IException* clone() const override { return new NoSpace(*this); }
    [[noreturn]] void rethrow() const override { throw NoSpace(*this); }
};

} // namespace

std::uint32_t modeOf(std::string const& zip, std::string const& name)
{
    Opened const opened(zip);
    zip_uint8_t system = 0;
    zip_uint32_t attributes = 0;
    zip_file_get_external_attributes(opened.get(), opened.find(name), 0, &system, &attributes);
    return system == ZIP_OPSYS_UNIX ? attributes >> 16 : 0;
}

std::string decrypted(std::string const& zip, std::string const& name, std::string const& password)
{
    Opened const opened(zip);
    zip_file_t* const file = zip_fopen_index_encrypted(opened.get(), opened.find(name), 0, password.c_str());
    if (file == nullptr)
        throw std::runtime_error("cannot be decrypted");
    std::string content(1000, '\0');
    zip_int64_t const read = zip_fread(file, content.data(), content.size());
    zip_fclose(file);
    content.resize(read < 0 ? 0 : static_cast<std::size_t>(read));
    return content;
}

std::string readOnlyArchiveOf(std::string const& content)
{
    return makeArchive("ustar", "", {{.name = "a.zip", .content = content}});
}

ArchiveException::Reason reasonOf(std::function<void()> const& action)
{
    try {
        action();
    } catch (ArchiveException const& error) {
        return error.getReason();
    }
    throw std::logic_error("no ArchiveException");
}

class ArmedProvider::Transaction final : public TransactionalStream
{
public:
    Transaction(std::shared_ptr<ArmedProvider const> owner, std::unique_ptr<TransactionalStream> stream)
        : owner_(std::move(owner)), stream_(std::move(stream))
    {}

protected:
    long doWrite(char const* data, long count) override
    {
        failIfDue();
        return stream_->write(data, count);
    }

    long doSeek(long offset, std::ios_base::seekdir direction) override
    {
        if (!owner_->seeks_)
            throw NoSpace();
        failIfDue();
        return stream_->seek(offset, direction);
    }

    void doClose(StreamClosePolicy const& policy) override
    {
        failIfDue();
        stream_->close(policy);
        if (policy == StreamClosePolicy::Commit && owner_->failsAfterCommit_.exchange(false))
            throw NoSpace();
    }

    ByteStream* doByteStream() override { return stream_->byteStream(); }

private:
    void failIfDue() const
    {
        if (owner_->isDue())
            throw NoSpace();
    }

    std::shared_ptr<ArmedProvider const> owner_;
    std::unique_ptr<TransactionalStream> stream_;
};

StorageItem ArmedProvider::item()
{
    return StorageItem(shared_from_this(), file_);
}

void ArmedProvider::before(char const* /*operation*/, StorageIRI const& location) const
{
    if (isDue())
        throw Exception(ErrorCode::NoSpaceLeft, location);
}

std::unique_ptr<TransactionalStream> ArmedProvider::handOutTransaction(std::unique_ptr<TransactionalStream> stream,
                                                                       StorageIRI const& /*file*/) const
{
    return std::make_unique<Transaction>(shared_from_this(), std::move(stream));
}

} // namespace foundation::storage::archive
