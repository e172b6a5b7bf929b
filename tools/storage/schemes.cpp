#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>

#include <fl/i18n/utf8.hpp>
#include <fmt/format.h>
#include <memory>
#include <nlohmann/json.hpp>
#include <storage/registry/Scheme.hpp>

namespace foundation::storage::tool {

namespace {

char const* kindName(registry::SchemeKind kind)
{
    return kind == registry::SchemeKind::Physical ? "physical" : "container";
}

std::string lineOf(registry::Scheme const& scheme, bool isJSON)
{
    std::string const name = fl::i18n::to_utf8(scheme.name, fl::i18n::Malformed::Replace);
    if (!isJSON)
        return fmt::format("{:<12}  {}", name, kindName(scheme.kind));
    return nlohmann::ordered_json{{"scheme", name}, {"kind", kindName(scheme.kind)}}.dump();
}

void list(Session& session, bool isJSON)
{
    for (registry::Scheme const& scheme : session.stores().registry().schemes()) {
        session.output().write(lineOf(scheme, isJSON));
        session.output().endLine();
    }
}

} // namespace

Action defineSchemes(CLI::App& app)
{
    auto const isJSON = std::make_shared<bool>(false);
    addFlag(app, "--json", *isJSON, "Print one JSON object a line for each scheme");
    return [isJSON](Session& session) { list(session, *isJSON); };
}

} // namespace foundation::storage::tool
