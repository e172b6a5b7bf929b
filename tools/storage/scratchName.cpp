#include <tools/storage/scratchName.hpp>

#include <algorithm>
#include <boost/uuid/random_generator.hpp>
#include <boost/uuid/uuid_io.hpp>
#include <string_view>

namespace foundation::storage::tool {

namespace {

constexpr std::u16string_view suffix = u".tmp.bak";

/// `x` is any digit, `v` one of those that say that the UUID is of the usual variant.
constexpr std::u16string_view uuidForm = u"xxxxxxxx-xxxx-4xxx-vxxx-xxxxxxxxxxxx";

bool fits(char16_t c, char16_t form)
{
    bool const isDigit = (c >= u'0' && c <= u'9') || (c >= u'a' && c <= u'f');
    if (form == u'v')
        return c == u'8' || c == u'9' || c == u'a' || c == u'b';
    return form == u'x' ? isDigit : c == form;
}

} // namespace

std::u16string makeScratchName()
{
    std::string const uuid = boost::uuids::to_string(boost::uuids::random_generator()());
    return std::u16string(uuid.begin(), uuid.end()).append(suffix);
}

bool isScratchName(std::u16string const& name)
{
    return name.size() == uuidForm.size() + suffix.size() && name.ends_with(suffix) &&
           std::equal(uuidForm.begin(), uuidForm.end(), name.begin(),
                      [](char16_t form, char16_t c) { return fits(c, form); });
}

} // namespace foundation::storage::tool
