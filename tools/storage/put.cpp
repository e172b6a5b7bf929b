#include <tools/storage/AtomicFile.hpp>
#include <tools/storage/FileCopier.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/readSome.hpp>
#include <tools/storage/standardInput.hpp>

#include <memory>

namespace foundation::storage::tool {

namespace {

constexpr provider::ByteStreamOpenOptions emptied{
    provider::ByteStreamAccess::WriteOnly, provider::ByteStreamCreate::Create,
    provider::ByteStreamTruncate::TruncateExisting, provider::ByteStreamAppend::Overwrite};

struct Options
{
    std::string target;
    bool replaces = false;
    bool isInPlace = false;
};

/// Passes standard input on in pieces, and answers how much it was.
template <typename Write>
long passInput(Session& session, Write const& write)
{
    std::vector<char> buffer = makeTransferBuffer();
    long size = 0;
    for (std::string_view chunk = readStandardInput(buffer); !chunk.empty(); chunk = readStandardInput(buffer)) {
        auto const count = static_cast<long>(chunk.size());
        write(chunk.data(), count);
        size += count;
        session.progress().addBytes(count);
    }
    return size;
}

void putWhole(Session& session, Place const& target, Replace replace)
{
    auto const output = at(target, [&] { return std::make_unique<AtomicFile>(target.item(), replace); });
    try {
        long const size =
            passInput(session, [&](char const* data, long count) { at(target, [&] { output->write(data, count); }); });
        at(target, [&] { output->commit(size); });
    } catch (...) {
        if (!output->discard())
            session.complain({target.text(), "what was written beside it could not be removed"});
        throw;
    }
}

void writeAll(provider::ByteStream& stream, char const* data, long count, Place const& target)
{
    while (count > 0) {
        long const written = at(target, [&] { return stream.write(data, count); });
        if (written <= 0 || written > count)
            throw Failure{target.text(), describe(provider::ErrorCode::IOError)};
        data += written;
        count -= written;
    }
}

void putInPlace(Session& session, Place const& target)
{
    auto const stream = at(target, [&] { return target.item().openStream(emptied); });
    passInput(session, [&](char const* data, long count) { writeAll(*stream, data, count, target); });
    at(target, [&] { stream->close(); });
}

void put(Session& session, Options const& options)
{
    Place const target = session.stores().open(options.target);
    Replace const replace = options.replaces || options.isInPlace ? Replace::Files : Replace::Never;
    requireFileTarget(target, replace);
    if (target.saysFolder())
        throw Failure{target.text(), "no such folder, and a file has no slash at the end"};
    requireParentFolder(target);
    if (options.isInPlace)
        putInPlace(session, target);
    else
        putWhole(session, target, replace);
}

} // namespace

Action definePut(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "--replace", options->replaces, "Replace a file that is there already");
    addFlag(app, "--in-place", options->isInPlace,
            "Write into the file itself, also an existing one: what fails half-way leaves half of it");
    addOperand(app, "TARGET", "The file that standard input becomes", options->target);
    return [options](Session& session) { put(session, *options); };
}

} // namespace foundation::storage::tool
