#include <storage/archive/detail/LibArchive.hpp>

#include <archive.h>
#include <locale.h>
#include <new>
#include <vector>

namespace foundation::storage::archive::detail {

namespace {

using Support = int (*)(::archive*);

/// The answer is a warning where libarchive would start a program.
std::vector<Support> builtInCompression()
{
    std::vector<Support> builtIn;
    for (Support const support :
         {archive_read_support_filter_gzip, archive_read_support_filter_bzip2, archive_read_support_filter_xz,
          archive_read_support_filter_lzma, archive_read_support_filter_zstd})
    {
        if (support(newLibArchive().get()) == ARCHIVE_OK)
            builtIn.push_back(support);
    }
    return builtIn;
}

/// These live as long as the program. Without one, names in plain ASCII still come through.
locale_t localeFor(NameLocale::Names names)
{
    static locale_t const plain = ::newlocale(LC_CTYPE_MASK, "C", nullptr);
    static locale_t const utf8 = ::newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
    return names == NameLocale::Names::AsBytes ? plain : utf8;
}

} // namespace

void FreeLibArchive::operator()(::archive* reader) const
{
    archive_read_free(reader);
}

LibArchivePtr newLibArchive()
{
    LibArchivePtr reader(archive_read_new());
    if (reader == nullptr)
        throw std::bad_alloc();
    return reader;
}

void supportCompression(::archive* reader)
{
    static std::vector<Support> const builtIn = builtInCompression();
    for (Support const support : builtIn)
        support(reader);
}

NameLocale::NameLocale(Names names) : previous_(nullptr)
{
    locale_t const locale = localeFor(names);
    if (locale != nullptr)
        previous_ = ::uselocale(locale);
}

NameLocale::~NameLocale()
{
    if (previous_ != nullptr)
        ::uselocale(static_cast<locale_t>(previous_));
}

} // namespace foundation::storage::archive::detail
