#include <storage/conformance/detail/hostileNames.hpp>

#include <algorithm>

namespace foundation::storage::conformance::detail {

namespace {

constexpr std::size_t usualLimit = 255;

std::vector<std::u16string> const always{
    u"a b",
    u" outer blanks ",
    u"\ttab\t",
    u"new\nline",
    u"return\r",
    u"\x01\x1f\x7f",
    u"%",
    u"%%",
    u"%41",
    u"A",
    u"%2F",
    u"%25",
    u"%zz",
    u"100%",
    u"a[1]",
    u"a{1}",
    u"*",
    u"?",
    u"!",
    u"a!b",
    u"#",
    u"a#b?c",
    u"::",
    u"c:",
    u"s:file",
    u"back\\slash",
    u"\"quoted\"",
    u"'quoted'",
    u"~",
    u"-r",
    u"$HOME",
    u"a&b=c;d,e+f@g",
    u"<a|b>",
    u".hidden",
    u"..hidden",
    u"...",
    u"trailing.",
    u"trailing..",
    u"con",
    u"\u00FF",
    u"\u03A9\u03BC\u03AD\u03B3\u03B1",
    u"\u4E2D\u6587",
    u"\u0627\u0644",
    u"\U0001F600",
    u"\U0001F469\u200D\U0001F52C",
    u"\u202Egnp.exe",
    u"\uFEFFbom",
    u"\uFFFD",
};

} // namespace

std::vector<std::u16string> namesOfLength(std::size_t bytes)
{
    std::u16string wide(bytes / 3, u'\u4E2D');
    wide.append(bytes % 3, u'a');
    return {std::u16string(bytes, u'a'), wide};
}

std::vector<std::u16string> hostileNamesFor(Capabilities const& capabilities)
{
    std::vector<std::u16string> names = always;
    for (std::u16string const& name : namesOfLength(capabilities.longestName.value_or(usualLimit)))
        names.push_back(name);
    if (capabilities.normalisationSensitive)
        names.insert(names.end(), {u"\u00E9t\u00E9", u"e\u0301te\u0301", u"\u1E9B\u0323", u"\u017F\u0323\u0307"});
    if (capabilities.caseSensitive)
        names.insert(names.end(), {u"a", u"%2f", u"CON", u"STRASSE", u"stra\u00DFe"});
    std::erase_if(names, [&](std::u16string const& name) { return capabilities.refusedNames.contains(name); });
    return names;
}

} // namespace foundation::storage::conformance::detail
