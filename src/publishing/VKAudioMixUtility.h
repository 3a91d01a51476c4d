/// Makes the movie that is kept: the same pictures, with all sound tracks heard as one. Has no state.
#pragma once

#include "base/Error.h"
#include "base/Url.h"
#include "platform/hosting/Platform.h"

#include <functional>
#include <memory>
#include <optional>

class VKAudioMixUtility {
public:
    /// Either the new movie or an error, never both.
    using Completion = std::function<void(const std::optional<base::Url>& output, const base::ErrorRef& error)>;

    VKAudioMixUtility() = delete;

    /// Exports `movie` into the temporary store; the source is never touched. Any thread; returns at once.
    ///
    /// `completion` is called once: before this returns, with the error -5818, when there is no movie; otherwise on the
    /// thread of the export, with -5812 when that failed or was cancelled.
    static void mixAudioForMovie_withCompletionHandler(const platform::Platform& platform,
                                                       const std::optional<base::Url>& movie, Completion completion);

    /// A place in the temporary store, named after the second. Nothing is made there, and two calls in one second give
    /// the same.
    static base::Url tempFileURL(const platform::Platform& platform);

private:
    struct Export;
    static void setUp(const platform::Platform& platform, const base::Url& movie, const base::Url& output,
                      const Completion& completion);
    static void start(const std::shared_ptr<Export>& work);
    static void finish(const std::shared_ptr<Export>& work);
};
