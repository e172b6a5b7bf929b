#pragma once

#include <foundation/export.hpp>

#include <boost/exception/info.hpp>

#include <string>

namespace foundation::storage::provider {

struct FOUNDATION_API TagReason
{};

/// The entry under which an `Exception` may carry what happened, where its code alone would not tell.
///
/// Words for whoever reads messages, to stand behind the location: in small letters, without a full stop.
using ReasonInfo = boost::error_info<TagReason, std::u16string>;

} // namespace foundation::storage::provider
