#include <fl/filesystem/volume.hpp>

#include <cerrno>
#include <cstdlib>
#include <memory>
#include <stdexcept>
#include <string>
#include <system_error>

#include <fl/filesystem/detail/system_error.hpp>
#include <fl/filesystem/exceptions.hpp>
#include <fl/filesystem/native_name.hpp>
#include <fl/filesystem/path_functions.hpp>
#include <fl/i18n/utf8.hpp>

namespace fl::filesystem {

namespace {

struct Free
{
    void operator()(char* memory) const noexcept { std::free(memory); }
};

std::string describe(upath const& path, std::string const& problem)
{
    return "'" + fl::i18n::to_utf8(path.string(), fl::i18n::Malformed::Replace) + "': " + problem;
}

std::string nativeBytes(upath const& path)
{
    if (!detail::is_absolute(path.string())) {
        throw InvalidArgument(describe(path, "the path is not absolute"));
    }
    if (path.string().find(u'\0') != std::u16string::npos) {
        throw InvalidArgument(describe(path, "the path holds a NUL"));
    }
    try {
        return to_native_bytes(path.string());
    } catch (std::range_error const& error) {
        throw InvalidArgument(describe(path, error.what()));
    }
}

} // namespace

upath get_pathname_from_volume(upath const& path, upath const& /*volume*/)
{
    std::string const bytes = nativeBytes(path);
    std::unique_ptr<char, Free> const resolved(::realpath(bytes.c_str(), nullptr));
    if (!resolved) {
        int const error = errno;
        detail::throw_system_error(error, describe(path, std::generic_category().message(error)));
    }
    return upath(from_native_bytes(resolved.get()));
}

} // namespace fl::filesystem
