#include <storage/provider/StorageIRI.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <algorithm>
#include <cstddef>
#include <stdexcept>
#include <string>
#include <vector>

#include <foundation/network/IRI.hpp>
#include <tests/support/generators.hpp>
#include <tests/support/locations.hpp>

namespace foundation::storage::provider {
namespace {

using tests::support::hierarchical;
using tests::support::shown;
using tests::support::Text;

RC_GTEST_PROP(StorageIRI, NameToChildToTextToLocationToNameIsTheIdentity, ())
{
    StorageIRI const folder = *tests::support::anyLocation();
    Text const name = *tests::support::fileName();
    StorageIRI const child(folder, name);
    StorageIRI const parsed(child.toString());
    RC_ASSERT(shown(child.getName()) == shown(name.value));
    RC_ASSERT(shown(parsed.getName()) == shown(name.value));
    RC_ASSERT(shown(parsed.toString()) == shown(child.toString()));
    RC_ASSERT(parsed == child);
    RC_ASSERT(parsed.hashValue() == child.hashValue());
}

RC_GTEST_PROP(StorageIRI, ParentOfAChildIsTheFolder, ())
{
    StorageIRI const any = *tests::support::anyLocation();
    RC_PRE(any.hasPath());
    // Written as children are: parsed text may hold escapes that no child's parent has.
    StorageIRI const folder(any, any.getPath());
    StorageIRI const child(folder, *tests::support::fileName());
    RC_ASSERT(child.getParent() == folder);
    RC_ASSERT(child.hasParent());
    RC_ASSERT(folder.isAncestorOf(child));
    RC_ASSERT(!child.isAncestorOf(folder));
}

RC_GTEST_PROP(StorageIRI, TextLeadsBackToTheLocation, ())
{
    StorageIRI const location = hierarchical(*tests::support::hierarchicalStart(), *tests::support::normalPath());
    StorageIRI const parsed(location.toString());
    RC_ASSERT(shown(parsed.toString()) == shown(location.toString()));
    RC_ASSERT(shown(parsed.getPath()) == shown(location.getPath()));
    RC_ASSERT(shown(parsed.getHost()) == shown(location.getHost()));
    RC_ASSERT(parsed.getScheme() == location.getScheme());
}

RC_GTEST_PROP(StorageIRI, OfEveryKindIsPrintedAndParsedAsItIs, ())
{
    StorageIRI const location = *tests::support::anyLocation();
    StorageIRI const parsed(location.toString());
    RC_ASSERT(shown(parsed.toString()) == shown(location.toString()));
    RC_ASSERT(shown(parsed.getPath()) == shown(location.getPath()));
    RC_ASSERT(parsed.isOpaque() == location.isOpaque());
}

RC_GTEST_PROP(StorageIRI, EveryTextIsRefusedOrItsFormIsAFixedPoint, ())
{
    std::u16string const text = (*tests::support::scheme()).value + u":" + (*tests::support::iriText()).value +
                                *rc::gen::element<std::u16string>(u"", u"!/", u"!/d", u"!/d/", u"!d");
    try {
        std::u16string const form = StorageIRI(text).toString();
        RC_LOG() << shown(form) << '\n';
        RC_PRE(!form.ends_with(u'/') && form.find_first_of(u"?#") == std::u16string::npos);
        RC_ASSERT(shown(StorageIRI(form).toString()) == shown(form));
    } catch (std::runtime_error const& refused) {
        RC_ASSERT(std::string(refused.what()).starts_with("I"));
    } catch (std::invalid_argument const& refused) {
        RC_ASSERT(std::string(refused.what()).starts_with("The port"));
    }
}

RC_GTEST_PROP(StorageIRI, ParsedTextLeadsBackToItself, ())
{
    std::u16string const text = (*tests::support::hierarchicalStart()).value +
                                network::iri::encodePath((*tests::support::normalPath()).value) +
                                (*rc::gen::element<std::u16string>(u"", u"?q", u"#f", u"?#/"));
    RC_ASSERT(shown(StorageIRI(text).toString()) == shown(text));
}

RC_GTEST_PROP(StorageIRI, OneWrittenTrailingSlashMakesNoDifference, ())
{
    std::u16string const text = u"s://h/" + network::iri::encodePath((*tests::support::fileName()).value) +
                                *rc::gen::element<std::u16string>(u"", u"%2F", u"%2f", u"/%C3");
    RC_ASSERT(shown(StorageIRI(text + u"/").toString()) == shown(text));
    RC_ASSERT(StorageIRI(text + u"/") == StorageIRI(text));
}

/// Every '/' of the path is kept, those at its beginning too.
StorageIRI onHost(std::u16string const& path)
{
    return StorageIRI(u"s://h" + network::iri::encodePath(path));
}

/// The path without dot segments and without one trailing '/', worked out segment by segment.
std::u16string walked(std::u16string const& path)
{
    std::vector<std::u16string> kept;
    std::size_t end = 0;
    do {
        std::size_t const begin = end + 1;
        end = std::min(path.find(u'/', begin), path.size());
        std::u16string const segment = path.substr(begin, end - begin);
        bool const isDots = segment == u"." || segment == u"..";
        if (segment == u".." && !kept.empty())
            kept.pop_back();
        if (!isDots || end == path.size())
            kept.push_back(isDots ? std::u16string() : segment);
    } while (end != path.size());
    std::u16string result;
    for (std::u16string const& segment : kept)
        result.append(u"/").append(segment);
    return result.size() > 1 && result.ends_with(u'/') ? result.substr(0, result.size() - 1) : result;
}

RC_GTEST_PROP(StorageIRI, ResolvedPathIsWalkedSegmentBySegment, ())
{
    StorageIRI const location = onHost(*tests::support::absolutePath());
    RC_ASSERT(shown(location.getResolvedPath()) == shown(walked(location.getPath())));
}

RC_GTEST_PROP(StorageIRI, RelativePathLeadsBackFromTheFolder, ())
{
    std::u16string const folder = (*tests::support::absolutePath()).value;
    StorageIRI const location = onHost(folder + u"/" + (*tests::support::fileName()).value);
    std::u16string const basePath = (*tests::support::absolutePath()).value;
    StorageIRI const base = onHost(basePath.substr(0, std::max<std::size_t>(basePath.find_last_not_of(u'/') + 1, 1)));
    std::u16string const relative = location.makePathRelativeTo(base);
    RC_LOG() << shown(relative) << '\n';
    RC_ASSERT(shown(StorageIRI(base, relative).getResolvedPath()) == shown(location.getResolvedPath()));
}

} // namespace
} // namespace foundation::storage::provider
