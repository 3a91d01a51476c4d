#include "linux/storefront/AppStreamStore.h"

#include <condition_variable>
#include <dlfcn.h>
#include <mutex>
#include <pthread.h>
#include <string>
#include <utility>
#include <vector>

namespace storefront {

namespace {

using Texts = std::optional<std::vector<std::string>>;

/// A source is made by a function of the library's.
std::function<std::unique_ptr<Source>()> maker(void* library, const char* name, const Options& options, base::Log& log)
{
    // A symbol's address comes as one of data.
    const auto make = reinterpret_cast<MakeSource>(::dlsym(library, name));
    return [make, &options, &log] { return std::unique_ptr<Source>(make ? make(options, log) : nullptr); };
}

/// What an installed application says of itself goes first, the catalogues say the rest. But a page that everybody finds
/// is better than any homepage.
platform::StoreItem merged(const Facts& installed, const Facts& published)
{
    const auto first = [](const auto& one, const auto& other) { return one ? one : other; };
    platform::StoreItem item;
    item.displayName = first(installed.name, published.name);
    item.artistName = first(installed.developer, published.developer);
    item.genreNames = first(installed.genres, published.genres);
    item.shortProductLink = first(first(installed.page, published.page), first(installed.homepage, published.homepage));
    return item;
}

} // namespace

/// What the catalogues say of a request's identifiers, in their order, once they have been asked.
struct AppStreamStore::Published {
    std::mutex mutex;
    std::condition_variable changed;
    bool isKnown = false;
    std::vector<std::optional<Facts>> facts;
};

AppStreamStore::AppStreamStore(base::Log& log, Options options, Makers makers)
    : m_log(log), m_options(std::move(options)), m_makers(std::move(makers)),
      m_reading([] { pthread_setname_np(pthread_self(), "catalogues"); }),
      m_answering([] { pthread_setname_np(pthread_self(), "store"); })
{
}

AppStreamStore::~AppStreamStore()
{
    end();
    m_answering.post([this] {
        m_installed.reset();
        m_reading.post([this] { m_published.reset(); });
    });
}

void AppStreamStore::prepare()
{
    m_answering.post([this] {
        if (m_ends || !makeSources())
            return;
        m_installed->load();
        m_reading.post([this] {
            if (m_published && !m_ends)
                m_published->load();
        });
    });
}

void AppStreamStore::start(platform::StoreLookupRequest request, Callback callback)
{
    m_answering.post([this, request = std::move(request), callback = std::move(callback)] {
        if (!m_ends)
            answer(request, callback);
    });
}

void AppStreamStore::answer(const platform::StoreLookupRequest& request, const Callback& callback)
{
    if (request.keyProfile != platform::kStoreKeyProfileProduct) {
        callback(std::nullopt, base::Error::make(kStoreErrorDomain, kStoreBadRequest,
                                                 "the store has no key profile “" + request.keyProfile + "”"));
        return;
    }
    if (!makeSources()) {
        callback(std::nullopt, base::Error::make(kStoreErrorDomain, kStoreUnavailable,
                                                 "nothing on this machine reads AppStream's catalogues"));
        return;
    }
    platform::StoreLookupResponse response{resultsFor(request)};
    if (m_ends)
        return;
    callback(std::move(response), nullptr);
    m_reading.post([this] {
        if (m_published && !m_ends)
            m_published->review();
    });
}

std::vector<platform::StoreItem> AppStreamStore::resultsFor(const platform::StoreLookupRequest& request)
{
    const auto asked = askCatalogues(request);
    std::vector<std::optional<Facts>> installed;
    for (const std::string& identifier : request.bundleIdentifiers)
        installed.push_back(m_installed->find(identifier, request.localizationStyle == 1));

    std::unique_lock lock(asked->mutex);
    asked->changed.wait_for(lock, m_options.patience, [&] { return asked->isKnown; });
    std::vector<platform::StoreItem> results;
    for (std::size_t i = 0; i < installed.size(); ++i) {
        const auto published = asked->isKnown ? asked->facts[i] : std::nullopt;
        if (installed[i] || published)
            results.push_back(merged(installed[i].value_or(Facts()), published.value_or(Facts())));
    }
    return results;
}

std::shared_ptr<AppStreamStore::Published> AppStreamStore::askCatalogues(const platform::StoreLookupRequest& request)
{
    auto published = std::make_shared<Published>();
    m_reading.post([this, request, published] {
        std::vector<std::optional<Facts>> facts;
        for (const std::string& identifier : request.bundleIdentifiers)
            facts.push_back(m_published && !m_ends ? m_published->find(identifier, request.localizationStyle == 1)
                                                   : std::nullopt);
        const std::lock_guard lock(published->mutex);
        published->facts = std::move(facts);
        published->isKnown = true;
        published->changed.notify_all();
    });
    return published;
}

/// False when there are none, which is tried once.
bool AppStreamStore::makeSources()
{
    if (std::exchange(m_asked, true))
        return m_installed != nullptr;
    if (!m_makers.installed)
        m_makers = makersOfLibrary();
    if (m_makers.installed)
        m_installed = m_makers.installed();
    if (m_installed)
        m_reading.post([this, make = m_makers.published] { m_published = make(); });
    return m_installed != nullptr;
}

AppStreamStore::Makers AppStreamStore::makersOfLibrary() const
{
    // The library is never unloaded: it has types that GLib knows for the life of the process.
    void* const library = ::dlopen(m_options.library.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!library) {
        const char* const why = ::dlerror(); // NOLINT(concurrency-mt-unsafe): glibc has one for each thread
        m_log.error("The store cannot be asked: " + std::string(why ? why : m_options.library));
        return {};
    }
    return {maker(library, kMakeInstalledSource, m_options, m_log),
            maker(library, kMakePublishedSource, m_options, m_log)};
}

} // namespace storefront
