#include "Addresses.hpp"

#include <fl/i18n/convert.hpp>

#include <array>
#include <cstdint>
#include <random>
#include <string_view>

namespace bench {

namespace {

constexpr auto folders = std::to_array<std::u16string_view>(
    {u"home",   u"projects",    u"documents", u"archive",      u"2023",         u"2024",    u"reports",
     u"photos", u"shared",      u"customer",  u"backup",       u"src",          u"include", u"resources",
     u"music",  u"invoices",    u"drafts",    u"export",       u"node_modules", u"var",     u"lib",
     u"cache",  u"release-1.4", u"build",     u"measurements", u"inbox",        u"team"});

constexpr auto names =
    std::to_array<std::u16string_view>({u"index", u"quarterly-report", u"IMG_20240317_101522", u"readme", u"minutes",
                                        u"budget_final", u"main", u"data-000417", u"thumbnail", u"contract",
                                        u"Makefile", u"test_results", u"presentation", u"summary", u"dump", u"letter"});

constexpr auto spacedNames = std::to_array<std::u16string_view>(
    {u"Meeting%20notes", u"My%20Documents", u"final%20version%20(2)", u"Annual%20Report%202023", u"New%20Folder"});

constexpr auto cjkNames = std::to_array<std::u16string_view>(
    {u"会議の議事録", u"写真", u"报告书", u"プロジェクト計画", u"자료", u"设计文档"});

constexpr auto escapedCjkNames =
    std::to_array<std::u16string_view>({u"%E5%86%99%E7%9C%9F", u"%E6%8A%A5%E5%91%8A%E4%B9%A6", u"%EC%9E%90%EB%A3%8C"});

constexpr auto endings = std::to_array<std::u16string_view>(
    {u".txt", u".pdf", u".jpg", u".cpp", u".hpp", u".tar.gz", u".xlsx", u".json", u".mp4", u"", u".docx", u".log"});

constexpr auto hosts = std::to_array<std::u16string_view>(
    {u"sftp://files.example.org:2222", u"https://dav.example.com:8443/remote.php", u"s3://media-archive-eu",
     u"ftp://mirror.example.net", u"smb://fileserver.office.example.com", u"https://cloud.example.org",
     u"sftp://backup@10.20.30.40:22", u"webdav://intranet.example.com:8080"});

class Maker
{
public:
    std::u16string address()
    {
        bool const isLocal = percent(70);
        std::u16string text(isLocal ? std::u16string_view(u"file://") : pick(hosts));
        std::size_t const depth = percent(21) ? 9 + below(6) : 3 + below(6);
        for (std::size_t i = 0; i != depth; ++i)
            append(text, folderName());
        append(text, fileName());
        text += pick(endings);
        if (!isLocal && percent(5))
            text += u"?version=" + number();
        return text;
    }

private:
    // The distributions of the standard library differ between implementations; the engines do not.
    std::size_t below(std::size_t bound) { return engine_() % bound; }
    bool percent(std::size_t share) { return below(100) < share; }

    std::u16string_view pick(auto const& choices) { return choices[below(choices.size())]; }

    std::u16string number()
    {
        std::string const digits = std::to_string(below(10'000));
        return std::u16string(digits.begin(), digits.end());
    }

    std::u16string folderName()
    {
        std::size_t const kind = below(1000);
        return std::u16string(kind < 6    ? pick(cjkNames)
                              : kind < 15 ? pick(escapedCjkNames)
                              : kind < 55 ? pick(spacedNames)
                                          : pick(folders));
    }

    std::u16string fileName()
    {
        std::size_t const kind = below(1000);
        std::u16string name(kind < 10    ? pick(cjkNames)
                            : kind < 25  ? pick(escapedCjkNames)
                            : kind < 150 ? pick(spacedNames)
                                         : pick(names));
        return name += u'-' + number();
    }

    static void append(std::u16string& text, std::u16string_view segment) { (text += u'/') += segment; }

    std::mt19937_64 engine_{20240317};
};

void appendByte(std::string& url, unsigned char byte)
{
    constexpr std::string_view digits = "0123456789ABCDEF";
    if (byte < 0x80)
        url += static_cast<char>(byte);
    else
        (url += '%').append({digits[byte >> 4], digits[byte & 0xF]});
}

} // namespace

std::vector<std::u16string> makeAddresses(std::size_t count)
{
    Maker maker;
    std::vector<std::u16string> addresses;
    for (std::size_t i = 0; i != count; ++i)
        addresses.push_back(maker.address());
    return addresses;
}

std::string toURL(std::u16string const& address)
{
    std::string url;
    for (char const byte : fl::i18n::to_string(address))
        appendByte(url, static_cast<unsigned char>(byte));
    return url;
}

std::size_t fingerprint(std::vector<std::u16string> const& addresses)
{
    std::uint64_t hash = 0xcbf29ce484222325U;
    for (std::u16string const& address : addresses) {
        for (char16_t const unit : address)
            hash = (hash ^ unit) * 0x100000001b3U;
    }
    return hash;
}

} // namespace bench
