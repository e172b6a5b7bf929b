#include <tools/storage/FileCopier.hpp>

#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/readSome.hpp>

#include <cstring>

namespace foundation::storage::tool {

namespace {

/// Less is not worth a hole.
constexpr std::size_t minimumHole = 4096;

bool isAllZero(std::string_view chunk)
{
    return chunk.size() >= minimumHole && chunk.front() == '\0' &&
           std::memcmp(chunk.data(), chunk.data() + 1, chunk.size() - 1) == 0;
}

} // namespace

void requireFileTarget(Place const& target, Replace replace)
{
    switch (kindOf(target)) {
    case Kind::None:
        return;
    case Kind::RegularFolder:
    case Kind::SymlinkToFolder:
        throw Failure{target.text(), "a folder, which a file never replaces"};
    case Kind::SpecialFile:
        throw Failure{target.text(), "a special file, which a file never replaces"};
    case Kind::RegularFile:
    case Kind::SymlinkToFile:
    case Kind::BrokenSymlink:
        if (replace == Replace::Never)
            throw Failure{target.text(), "exists already (--replace replaces it)"};
    }
}

FileCopier::FileCopier(Session& session, CopyOptions const& options)
    : session_(session), options_(options), buffer_(makeTransferBuffer())
{}

void FileCopier::copy(Place const& source, Place const& target)
{
    requireFileTarget(target, options_.replace);
    copyToFreeTarget(source, target);
}

void FileCopier::copyToFreeTarget(Place const& source, Place const& target)
{
    checkInterrupt();
    transfer(source, target);
    session_.progress().addFile();
    if (options_.isVerbose)
        session_.printName(source.text() + " -> " + target.text());
}

void FileCopier::transfer(Place const& source, Place const& target)
{
    auto const input = at(source, [&] { return source.item().openReadOnlyStream(); });
    auto const output = at(target, [&] { return std::make_unique<AtomicFile>(target.item(), options_.replace); });
    try {
        long const size = copyBytes(source, *input, target, *output);
        at(target, [&] { output->commit(size); });
    } catch (...) {
        if (!output->discard())
            session_.complain({target.text(), "what was written beside it could not be removed"});
        throw;
    }
}

long FileCopier::copyBytes(Place const& source, provider::ByteStream& input, Place const& target, AtomicFile& output)
{
    long size = 0;
    for (std::string_view chunk = readSome(source, input, buffer_); !chunk.empty();
         chunk = readSome(source, input, buffer_))
    {
        auto const count = static_cast<long>(chunk.size());
        at(target, [&] { isAllZero(chunk) ? output.writeZeros(count) : output.write(chunk.data(), count); });
        size += count;
        session_.progress().addBytes(count);
        checkInterrupt();
    }
    return size;
}

} // namespace foundation::storage::tool
