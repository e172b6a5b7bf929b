#include <tools/storage/transfers.hpp>

#include <fl/i18n/utf8.hpp>
#include <nlohmann/json.hpp>
#include <tools/storage/Stores.hpp>
#include <tools/storage/printable.hpp>

namespace foundation::storage::tool {

namespace {

std::string locationOf(Place const& place)
{
    return fl::i18n::to_utf8(shownLocation(place).toString(), fl::i18n::Malformed::Replace);
}

std::string errorOf(Failure const& failure)
{
    return printable(failure.location) + ": " + printable(failure.reason);
}

} // namespace

Transfer transferOf(Place const& source, Place const& target, char const* result, std::optional<std::uint64_t> bytes)
{
    return {locationOf(source), locationOf(target), result, bytes, {}};
}

Transfer failedTransfer(Place const& source, Place const& target, Failure const& failure)
{
    return {locationOf(source), locationOf(target), "failed", std::nullopt, errorOf(failure)};
}

Transfer failedTransfer(Place const& source, Failure const& failure)
{
    return {locationOf(source), {}, "failed", std::nullopt, errorOf(failure)};
}

Transfer failedTransfer(Failure const& failure)
{
    return {printable(failure.location), {}, "failed", std::nullopt, errorOf(failure)};
}

std::string toJSON(Transfer const& transfer)
{
    nlohmann::ordered_json object;
    object["source"] = transfer.source;
    if (!transfer.target.empty())
        object["target"] = transfer.target;
    object["result"] = transfer.result;
    if (transfer.bytes)
        object["bytes"] = *transfer.bytes;
    if (!transfer.error.empty())
        object["error"] = transfer.error;
    constexpr int onOneLine = -1;
    constexpr bool inASCII = true;
    return object.dump(onOneLine, ' ', inASCII);
}

} // namespace foundation::storage::tool
