#include <storage/archive/detail/Packed.hpp>

#include <storage/archive/detail/Archive.hpp>
#include <storage/archive/detail/Fault.hpp>

#include <algorithm>
#include <new>
#include <utility>
#include <zlib.h>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t chunk = std::size_t{256} << 10;
constexpr int usualLevel = 6;

/// Finds less, and so packs zeros some two hundredfold, which every reader puts up with.
constexpr int modestLevel = 1;

/// Raw, as it stands in a zip.
constexpr int rawWindow = -15;
constexpr int usualMemory = 8;

unsigned char* bytes(char* data)
{
    return reinterpret_cast<unsigned char*>(data);
}

class Deflater
{
public:
    Deflater()
    {
        if (::deflateInit2(&stream, usualLevel, Z_DEFLATED, rawWindow, usualMemory, Z_DEFAULT_STRATEGY) != Z_OK)
            throw std::bad_alloc();
    }
    ~Deflater() { ::deflateEnd(&stream); }
    Deflater(Deflater const&) = delete;
    Deflater& operator=(Deflater const&) = delete;

    ::z_stream stream{};
};

class Inflater
{
public:
    Inflater()
    {
        if (::inflateInit2(&stream, rawWindow) != Z_OK)
            throw std::bad_alloc();
    }
    ~Inflater() { ::inflateEnd(&stream); }
    Inflater(Inflater const&) = delete;
    Inflater& operator=(Inflater const&) = delete;

    ::z_stream stream{};
};

class StoredContent final : public Content
{
public:
    explicit StoredContent(PackedPtr packed) : packed_(std::move(packed)) {}

    std::size_t read(char* buffer, std::size_t count) override
    {
        std::size_t const read = packed_->readPacked(position_, buffer, count);
        position_ += read;
        return read;
    }

    bool seek(std::uint64_t position) override
    {
        position_ = position;
        return true;
    }

    void restart() override { position_ = 0; }
    void finish() override {}

private:
    PackedPtr const packed_;
    std::uint64_t position_ = 0;
};

class DeflatedContent final : public Content
{
public:
    explicit DeflatedContent(PackedPtr packed) : packed_(std::move(packed)), input_(chunk) {}

    std::size_t read(char* buffer, std::size_t count) override
    {
        ::z_stream& stream = inflater_.stream;
        stream.next_out = bytes(buffer);
        stream.avail_out = static_cast<unsigned>(std::min<std::size_t>(count, chunk));
        unsigned const wanted = stream.avail_out;
        while (stream.avail_out == wanted) {
            if (stream.avail_in == 0)
                fill();
            int const result = ::inflate(&stream, Z_NO_FLUSH);
            if (result == Z_STREAM_END)
                break;
            if (result != Z_OK)
                throw Fault(Reason::Damaged);
        }
        return wanted - stream.avail_out;
    }

    bool seek(std::uint64_t /*position*/) override { return false; }

    void restart() override
    {
        ::inflateReset(&inflater_.stream);
        inflater_.stream.avail_in = 0;
        position_ = 0;
    }

    void finish() override {}

private:
    void fill()
    {
        std::size_t const read = packed_->readPacked(position_, input_.data(), input_.size());
        position_ += read;
        inflater_.stream.next_in = bytes(input_.data());
        inflater_.stream.avail_in = static_cast<unsigned>(read);
    }

    PackedPtr const packed_;
    std::vector<char> input_;
    std::uint64_t position_ = 0;
    Inflater inflater_;
};

} // namespace

/// Makes packed content of a draft.
class Packer
{
public:
    Packer(Draft const& draft, std::shared_ptr<PackStore> store, ArchiveLimits const& limits)
        : draft_(draft), store_(std::move(store)), limits_(limits)
    {
        if (draft_.size() > limits.entryBytes)
            throw Fault(Reason::EntryTooLarge);
        std::uint64_t const size = draft_.size();
        input_.resize(static_cast<std::size_t>(std::min<std::uint64_t>(chunk, size)));
        output_.resize(static_cast<std::size_t>(std::min<std::uint64_t>(chunk, size + size / 256 + 64)));
    }

    std::uint64_t version() const { return draft_.version(); }

    PackedPtr stored()
    {
        start();
        forEachChunk([&](std::size_t count) {
            packed_->append(input_.data(), count);
            return true;
        });
        return packed_;
    }

    /// Nothing where that is not smaller.
    PackedPtr deflated()
    {
        start();
        packed_->isStored_ = false;
        bool const isSmall = forEachChunk([&](std::size_t count) { return deflateChunk(count); });
        return isSmall && packed_->packedSize() < packed_->size() && isAllowed() ? packed_ : nullptr;
    }

private:
    void start()
    {
        packed_ = std::make_shared<Packed>(store_);
        packed_->size_ = draft_.size();
        packed_->checksum_ = static_cast<std::uint32_t>(::crc32(0, nullptr, 0));
        done_ = 0;
        filled_ = 0;
    }

    template <typename Step>
    bool forEachChunk(Step const& step)
    {
        while (done_ < packed_->size()) {
            std::size_t const read = draft_.read(done_, input_.data(), input_.size());
            done_ += read;
            packed_->checksum_ = static_cast<std::uint32_t>(
                ::crc32(packed_->checksum_, bytes(input_.data()), static_cast<unsigned>(read)));
            if (!step(read))
                return false;
        }
        return true;
    }

    /// Answers false when there is nothing to be gained.
    bool deflateChunk(std::size_t count)
    {
        ::z_stream& stream = deflater_.stream;
        stream.next_in = bytes(input_.data());
        stream.avail_in = static_cast<unsigned>(count);
        deflateOn(done_ == packed_->size() ? Z_FINISH : Z_NO_FLUSH);
        std::uint64_t const soFar = packed_->packedSize() + filled_;
        if (done_ > limits_.bytesOfAnyRatio / 2 && done_ / limits_.ratio > soFar / 2)
            becomeModest();
        return done_ < 4 * chunk || soFar < done_;
    }

    void deflateOn(int flush)
    {
        ::z_stream& stream = deflater_.stream;
        for (;;) {
            stream.next_out = bytes(output_.data() + filled_);
            stream.avail_out = static_cast<unsigned>(output_.size() - filled_);
            int const result = ::deflate(&stream, flush);
            filled_ = output_.size() - stream.avail_out;
            bool const isDone = flush == Z_FINISH ? result == Z_STREAM_END : stream.avail_out > 0;
            if (filled_ == output_.size() || (isDone && flush == Z_FINISH))
                empty();
            if (isDone)
                return;
        }
    }

    void empty()
    {
        if (filled_ > 0)
            packed_->append(output_.data(), filled_);
        filled_ = 0;
    }

    void becomeModest()
    {
        if (std::exchange(isModest_, true))
            return;
        ::z_stream& stream = deflater_.stream;
        int result = Z_BUF_ERROR;
        while (result == Z_BUF_ERROR) { // which writes what it holds back
            if (filled_ == output_.size())
                empty();
            stream.next_out = bytes(output_.data() + filled_);
            stream.avail_out = static_cast<unsigned>(output_.size() - filled_);
            result = ::deflateParams(&stream, modestLevel, Z_DEFAULT_STRATEGY);
            filled_ = output_.size() - stream.avail_out;
        }
    }

    bool isAllowed() const
    {
        return packed_->size() <= limits_.bytesOfAnyRatio || packed_->size() / limits_.ratio <= packed_->packedSize();
    }

    Draft::Frozen const draft_;
    std::shared_ptr<PackStore> const store_;
    ArchiveLimits const& limits_;
    std::vector<char> input_;
    std::vector<char> output_;
    std::size_t filled_ = 0;
    std::uint64_t done_ = 0;
    bool isModest_ = false;
    std::shared_ptr<Packed> packed_;
    Deflater deflater_;
};

Packed::~Packed()
{
    for (PackStore::Piece const& piece : pieces_)
        store_->drop(piece);
}

void Packed::append(char const* data, std::size_t count)
{
    pieces_.push_back(store_->keep(data, count));
    packedSize_ += count;
}

std::size_t Packed::readPacked(std::uint64_t offset, char* buffer, std::size_t count) const
{
    std::size_t done = 0;
    while (done < count && offset < packedSize_) {
        PackStore::Piece const& piece = pieces_[static_cast<std::size_t>(offset / chunk)];
        std::size_t const within = static_cast<std::size_t>(offset % chunk);
        std::size_t const part = std::min(count - done, piece.size - within);
        store_->read(piece, within, buffer + done, part);
        done += part;
        offset += part;
    }
    return done;
}

PackedPtr pack(Draft const& draft, std::shared_ptr<PackStore> const& store, ArchiveLimits const& limits,
               Packing packing, std::uint64_t& version)
{
    Packer packer(draft, store, limits);
    version = packer.version();
    PackedPtr packed = packing == Packing::Smallest ? packer.deflated() : nullptr;
    return packed != nullptr ? packed : packer.stored();
}

std::unique_ptr<Content> openPacked(PackedPtr packed)
{
    if (packed->isStored())
        return std::make_unique<StoredContent>(std::move(packed));
    return std::make_unique<DeflatedContent>(std::move(packed));
}

} // namespace foundation::storage::archive::detail
