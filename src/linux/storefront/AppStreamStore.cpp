#include "linux/storefront/AppStreamStore.h"

#include <dlfcn.h>
#include <pthread.h>

#include <string>
#include <utility>

namespace storefront {

AppStreamStore::AppStreamStore(base::Log& log, Options options)
    : m_log(log), m_options(std::move(options)), m_worker([] { pthread_setname_np(pthread_self(), "store"); })
{
}

AppStreamStore::~AppStreamStore()
{
    end();
    m_worker.post([this] { m_catalogue.reset(); });
}

void AppStreamStore::prepare()
{
    m_worker.post([this] {
        if (m_ends)
            return;
        if (Catalogue* const known = catalogue())
            known->load();
    });
}

void AppStreamStore::start(platform::StoreLookupRequest request, Callback callback)
{
    m_worker.post([this, request = std::move(request), callback = std::move(callback)] {
        if (m_ends)
            return;
        answer(request, callback);
        if (m_catalogue && !m_ends)
            m_catalogue->review();
    });
}

void AppStreamStore::answer(const platform::StoreLookupRequest& request, const Callback& callback)
{
    if (request.keyProfile != platform::kStoreKeyProfileProduct) {
        callback(std::nullopt, base::Error::make(kStoreErrorDomain, kStoreBadRequest,
                                                 "the store has no key profile “" + request.keyProfile + "”"));
        return;
    }
    Catalogue* const known = catalogue();
    if (!known) {
        callback(std::nullopt, base::Error::make(kStoreErrorDomain, kStoreUnavailable,
                                                 "nothing on this machine reads AppStream's catalogues"));
        return;
    }
    platform::StoreLookupResponse response;
    for (const std::string& identifier : request.bundleIdentifiers) {
        if (m_ends)
            return;
        if (auto item = known->find(identifier, request.localizationStyle == 1))
            response.results.push_back(std::move(*item));
    }
    if (!m_ends)
        callback(std::move(response), nullptr);
}

/// Null when the library cannot be loaded, which is tried once.
Catalogue* AppStreamStore::catalogue()
{
    if (std::exchange(m_asked, true))
        return m_catalogue.get();
    // The library is never unloaded: it has types that GLib knows for the life of the process.
    void* const library = ::dlopen(m_options.library.c_str(), RTLD_NOW | RTLD_LOCAL);
    // A symbol's address comes as one of data.
    const auto make = library ? reinterpret_cast<MakeCatalogue>(::dlsym(library, kMakeCatalogue)) : nullptr;
    if (make) {
        m_catalogue.reset(make(m_options, m_log));
    } else {
        const char* const why = ::dlerror(); // NOLINT(concurrency-mt-unsafe): glibc has one for each thread
        m_log.error("The store cannot be asked: " + std::string(why ? why : m_options.library));
    }
    return m_catalogue.get();
}

} // namespace storefront
