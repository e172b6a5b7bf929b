#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/readSome.hpp>

#include <memory>

namespace foundation::storage::tool {

namespace {

void requireReadable(Place const& file)
{
    Kind const kind = existingKindOf(file);
    if (leadsToFolder(kind))
        throw Failure{file.text(), "a folder"};
    if (kind == Kind::SpecialFile)
        throw Failure{file.text(), "a special file, not read"};
}

void writeContent(Session& session, Place const& file, std::vector<char>& buffer)
{
    requireReadable(file);
    auto const input = at(file, [&] { return file.item().openReadOnlyStream(); });
    for (std::string_view chunk = readSome(file, *input, buffer); !chunk.empty();
         chunk = readSome(file, *input, buffer)) {
        session.output().write(chunk);
        checkInterrupt();
    }
}

} // namespace

Action defineCat(CLI::App& app)
{
    auto const files = std::make_shared<std::vector<std::string>>();
    addOperands(app, "FILE...", "Files to write, one after the other", 1, *files);
    return [files](Session& session) {
        std::vector<char> buffer = makeTransferBuffer();
        session.forEachPlace(*files, [&](Place const& file) { writeContent(session, file, buffer); });
    };
}

} // namespace foundation::storage::tool
