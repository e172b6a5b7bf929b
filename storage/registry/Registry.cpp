#include <storage/registry/Registry.hpp>

#include <fl/i18n/utf8.hpp>
#include <storage/registry/FactoryException.hpp>
#include <storage/registry/OpenException.hpp>
#include <storage/registry/detail/schemeText.hpp>
#include <storage/registry/redactPassword.hpp>

#include <algorithm>
#include <exception>
#include <new>
#include <stdexcept>
#include <utility>

namespace foundation::storage::registry {

using namespace provider;
using boost::property_tree::ptree;
using Reason = OpenException::Reason;

namespace {

[[noreturn]] void throwInvalid(std::string const& scheme, char const* complaint)
{
    throw std::invalid_argument("The scheme \"" + scheme + "\" " + complaint + ".");
}

SchemeKind kindOf(StorageIRI const& location)
{
    return location.hasInnerIRI() ? SchemeKind::Container : SchemeKind::Physical;
}

Reason reasonAgainst(SchemeKind asked)
{
    return asked == SchemeKind::Physical ? Reason::ContainerNeedsContainer : Reason::PlainSchemeOfContainer;
}

StorageIRI rootOf(std::u16string_view scheme)
{
    return StorageIRI(std::u16string(scheme) + u":/");
}

/// Redacts behind every "//": a text that is no location has no path that could hold such words by right.
std::u16string redactEverywhere(std::u16string text)
{
    for (std::size_t at = text.find(u"//"); at != std::u16string::npos; at = text.find(u"//", at + 1)) {
        if (hasPassword(std::u16string_view(text).substr(at)))
            text.replace(at, std::u16string::npos, redactPassword(text.substr(at)));
    }
    return text;
}

/// Throws what is left of the exception in flight when nothing that it says may be repeated.
[[noreturn]] void rethrowWithoutWords(StorageIRI const& location)
{
    try {
        throw;
    } catch (Exception const& error) {
        throw FactoryException(error.getErrorCode(), location);
    } catch (std::bad_alloc const&) {
        throw std::bad_alloc();
    } catch (...) {
        throw FactoryException(ErrorCode::Unknown, location);
    }
}

/// Calls `action`; `hasSettings` is asked only after a failure, and so knows of settings that came meanwhile.
template <typename HasSettings, typename Action>
auto withholdingSettings(StorageIRI const& location, HasSettings const& hasSettings, Action const& action)
{
    try {
        return action();
    } catch (...) {
        if (!hasSettings())
            throw;
        rethrowWithoutWords(location);
    }
}

} // namespace

/// Does something for several factories or providers in turn, and throws the first failure at the end.
class Registry::Visit
{
public:
    template <typename Action>
    void attempt(Action const& action)
    {
        try {
            action();
        } catch (...) {
            if (!first_)
                first_ = std::current_exception();
        }
    }

    void finish() const
    {
        if (first_)
            std::rethrow_exception(first_);
    }

private:
    std::exception_ptr first_;
};

namespace {

std::shared_ptr<IProvider> requireProvider(std::shared_ptr<IProvider> provider, StorageIRI const& location)
{
    if (provider == nullptr)
        throw Exception(ErrorCode::InternalError, location);
    return provider;
}

/// The provider of a container's inside, which need not hold the container by itself, and goes before it.
struct InsideAndContainer
{
    StorageItem container;
    std::shared_ptr<IProvider> provider;
};

std::shared_ptr<IProvider> keepingContainer(std::shared_ptr<IProvider> provider, StorageItem const& container)
{
    auto const inside = std::make_shared<InsideAndContainer>(InsideAndContainer{container, std::move(provider)});
    return std::shared_ptr<IProvider>(inside, inside->provider.get());
}

} // namespace

Registry::Registry() = default;

Registry::~Registry() = default;

SchemeKind Registry::Entry::kind() const
{
    return std::holds_alternative<Physical>(factory) ? SchemeKind::Physical : SchemeKind::Container;
}

void Registry::add(std::u16string const& scheme, std::shared_ptr<PhysicalProviderFactory> factory)
{
    addFactory(scheme, std::move(factory));
}

void Registry::add(std::u16string const& scheme, std::shared_ptr<ContainerProviderFactory> factory)
{
    addFactory(scheme, std::move(factory));
}

void Registry::addFactory(std::u16string const& scheme, Factory factory)
{
    if (!detail::isScheme(scheme))
        throwInvalid(fl::i18n::to_utf8(scheme, fl::i18n::Malformed::Replace), "is malformed");
    if (std::visit([](auto const& pointer) { return pointer == nullptr; }, factory))
        throwInvalid(fl::i18n::to_utf8(scheme, fl::i18n::Malformed::Replace), "comes without a factory");
    if (!entries_.try_emplace(detail::lowerCased(scheme), std::move(factory)).second)
        throwInvalid(fl::i18n::to_utf8(scheme, fl::i18n::Malformed::Replace), "is served already");
}

StorageItem Registry::open(std::u16string const& text) const
{
    refusePassword(text);
    return open(parse(text));
}

StorageItem Registry::open(StorageIRI const& location) const
{
    refusePassword(location.toString());
    std::vector<Level> const levels = levelsOf(location);
    Level const& store = levels.back();
    auto const hasSettings = [&] { return store.entry.hasSettings.load(); };
    StorageItem item = withholdingSettings(store.location, hasSettings, [&] {
        auto const& factory = std::get<Physical>(store.entry.factory);
        return StorageItem(requireProvider(factory->buildProvider(store.location), store.location), store.location);
    });
    for (auto level = levels.rbegin() + 1; level != levels.rend(); ++level) {
        item = withholdingSettings(level->location, hasSettings, [&] {
            auto const& factory = std::get<Container>(level->entry.factory);
            auto inside = requireProvider(factory->buildProvider(item), level->location);
            remember(inside, *level, static_cast<std::size_t>(level - levels.rbegin()));
            return StorageItem(keepingContainer(std::move(inside), item), level->location);
        });
    }
    return item;
}

void Registry::remember(std::shared_ptr<IProvider> const& inside, Level const& level, std::size_t depth) const
{
    std::lock_guard const lock(mutex_);
    insides_.insert_or_assign(inside.get(), Inside{inside, level.location, depth});
    if (insides_.size() < insidesToTidy_)
        return;
    std::erase_if(insides_, [](auto const& entry) { return entry.second.provider.expired(); });
    insidesToTidy_ = 2 * insides_.size() + 64;
}

std::vector<Registry::Inside> Registry::insidesFromWithin() const
{
    std::vector<Inside> insides;
    {
        std::lock_guard const lock(mutex_);
        for (auto const& entry : insides_)
            insides.push_back(entry.second);
    }
    std::sort(insides.begin(), insides.end(), [](Inside const& a, Inside const& b) {
        return a.depth != b.depth ? a.depth > b.depth : a.location < b.location;
    });
    return insides;
}

void Registry::refusePassword(std::u16string const& text) const
{
    if (hasPassword(text))
        throw OpenException(Reason::CredentialsInLocation, parse(redactPassword(text)));
}

StorageIRI Registry::parse(std::u16string const& text) const
{
    try {
        return StorageIRI(text);
    } catch (std::exception const&) {
        requireServedSchemes(text);
        std::u16string const redacted = redactEverywhere(text);
        if (redacted == text)
            throw;
        throw OpenException(Reason::CredentialsInLocation, StorageIRI(redacted)); // which fails alike, as a rule
    }
}

/// Follows a text that is no location as far as schemes go, to say of "a:b" what helps, which is not that a '!' is
/// missing.
void Registry::requireServedSchemes(std::u16string_view text) const
{
    while (auto const scheme = detail::schemeOf(text)) {
        text.remove_prefix(scheme->size() + 1);
        SchemeKind const kind = text.starts_with(u'/') ? SchemeKind::Physical : SchemeKind::Container;
        find(*scheme, kind, rootOf(*scheme));
        if (kind == SchemeKind::Physical)
            return;
    }
}

/// From the outside in, as the text reads.
std::vector<Registry::Level> Registry::levelsOf(StorageIRI const& location) const
{
    std::vector<Level> levels;
    for (StorageIRI place = location;; place = place.getInnerIRI()) {
        levels.push_back({place, find(place.getScheme(), kindOf(place), place)});
        if (!place.hasInnerIRI())
            return levels;
    }
}

Registry::Entry const& Registry::find(std::u16string_view scheme, SchemeKind kind, StorageIRI const& location) const
{
    auto const found = entries_.find(detail::lowerCased(scheme));
    if (found == entries_.end())
        throw OpenException(Reason::UnknownScheme, location);
    if (found->second.kind() != kind)
        throw OpenException(reasonAgainst(kind), location);
    return found->second;
}

std::vector<Scheme> Registry::schemes() const
{
    std::vector<Scheme> schemes;
    for (auto const& [name, entry] : entries_)
        schemes.push_back({name, entry.kind()});
    return schemes;
}

void Registry::configure(ptree const& settings)
{
    std::map<std::u16string, ptree const*> parts;
    for (auto const& [key, part] : settings) {
        if (!parts.try_emplace(requireConfigurable(key), &part).second)
            throwInvalid(key, "has settings twice");
    }
    Visit visit;
    for (auto const& part : parts)
        visit.attempt([&] { configureScheme(part.first, *part.second); });
    visit.finish();
}

void Registry::configureScheme(std::u16string const& scheme, ptree const& settings)
{
    Entry& entry = entries_.at(scheme);
    entry.hasSettings = true;
    withholdingSettings(
        rootOf(scheme), [] { return true; }, [&] { std::get<Physical>(entry.factory)->configure(settings); });
}

/// Answers the scheme that a key of the settings means.
std::u16string const& Registry::requireConfigurable(std::string const& key) const
{
    auto const found = entries_.find(detail::lowerCased(fl::i18n::from_utf8(key, fl::i18n::Malformed::Replace)));
    if (found == entries_.end())
        throwInvalid(key, "has settings, but nothing serves it");
    auto const& [scheme, entry] = *found;
    if (entry.kind() == SchemeKind::Container)
        throwInvalid(key, "has settings, which schemes of containers do not take");
    return scheme;
}

void Registry::flush()
{
    Visit visit;
    for (Inside const& inside : insidesFromWithin()) {
        if (std::shared_ptr<IProvider> const provider = inside.provider.lock())
            visit.attempt([&] { provider->shutdown(); });
    }
    visit.finish();
}

void Registry::shutdown()
{
    Visit visit;
    for (Inside const& inside : insidesFromWithin()) {
        if (std::shared_ptr<IProvider> const provider = inside.provider.lock())
            visit.attempt([&] { shutdownInside(inside, *provider); });
    }
    for (auto const& served : entries_) {
        if (served.second.kind() == SchemeKind::Physical)
            visit.attempt([&] { shutdownScheme(served.first, served.second); });
    }
    visit.finish();
}

void Registry::shutdownInside(Inside const& inside, IProvider& provider)
{
    std::u16string const scheme = detail::lowerCased(inside.location.getScheme());
    withholdingSettings(
        rootOf(scheme), [&] { return mayRepeatSettings(entries_.at(scheme)); }, [&] { provider.shutdown(); });
}

void Registry::shutdownScheme(std::u16string const& scheme, Entry const& entry)
{
    withholdingSettings(
        rootOf(scheme), [&] { return mayRepeatSettings(entry); },
        [&] { std::get<Physical>(entry.factory)->shutdownProvider(); });
}

/// Containers may lie in any store, and pass on what it says.
bool Registry::mayRepeatSettings(Entry const& entry) const
{
    if (entry.kind() == SchemeKind::Physical)
        return entry.hasSettings;
    return std::any_of(entries_.begin(), entries_.end(),
                       [](auto const& served) { return served.second.hasSettings.load(); });
}

} // namespace foundation::storage::registry
