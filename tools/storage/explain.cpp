#include <tools/storage/explain.hpp>

#include <fl/i18n/utf8.hpp>
#include <storage/provider/ReasonInfo.hpp>
#include <tools/storage/describe.hpp>

#include <boost/exception/get_error_info.hpp>

namespace foundation::storage::tool {

namespace {

template <typename Failure>
std::string wordsOf(Failure const& error)
{
    if (auto const* const reason = boost::get_error_info<provider::ReasonInfo>(error))
        return fl::i18n::to_utf8(*reason, fl::i18n::Malformed::Replace);
    return describe(error.getErrorCode());
}

} // namespace

std::string explain(provider::Exception const& error)
{
    return wordsOf(error);
}

std::string explain(provider::ByteStreamFailure const& error)
{
    return wordsOf(error);
}

} // namespace foundation::storage::tool
