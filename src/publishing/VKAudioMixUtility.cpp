#include "publishing/VKAudioMixUtility.h"

#include "base/HandBack.h"
#include "support/TempMovieNames.h"
#include "support/VKErrorExtensions.h"
#include "support/VKFileManagerExtensions.h"

#include <utility>

using platform::ExportSession;

/// One mix under way. The asset and the session go back to the main queue, on which they live.
struct VKAudioMixUtility::Export {
    const platform::Platform& platform;
    base::Url output;
    Completion completion;
    std::shared_ptr<platform::Asset> asset;
    std::shared_ptr<ExportSession> session;
};

void VKAudioMixUtility::mixAudioForMovie_withCompletionHandler(const platform::Platform& platform,
                                                               const std::optional<base::Url>& movie,
                                                               Completion completion)
{
    if (!movie) {
        completion(std::nullopt, VKExtensions::_vkUserErrorForCode_userInfo(VKErrorNoMovie));
        return;
    }
    const auto work =
        std::make_shared<Export>(Export{platform, tempFileURL(platform), std::move(completion), nullptr, nullptr});
    base::MainQueue& main = platform.system.mainQueue;
    if (main.isCurrent())
        setUp(work, *movie);
    else
        main.post([work, movie = *movie] { setUp(work, movie); });
}

void VKAudioMixUtility::setUp(const std::shared_ptr<Export>& work, const base::Url& movie)
{
    platform::MediaFramework& media = work->platform.media;
    base::MainQueue& main = work->platform.system.mainQueue;
    const auto asset = media.assetWithURL(movie);
    work->asset = base::handedBackTo(main, asset);
    work->session =
        base::handedBackTo(main, media.exportSessionWithAsset(asset, platform::ExportPreset::HighestQuality));
    work->session->setOutputURL(work->output);
    work->session->setOutputFileType(platform::FileType::Mpeg4);
    // The file is being opened: its tracks are known in a moment. The work keeps the asset until then.
    work->asset->whenLoaded([work] { start(work); });
}

void VKAudioMixUtility::start(const std::shared_ptr<Export>& work)
{
    work->session->setAudioMix(platform::audioMixOfAllTracks(*work->asset));
    work->session->exportAsynchronously([work] { finish(work); });
}

/// On the session's thread.
void VKAudioMixUtility::finish(const std::shared_ptr<Export>& work)
{
    const base::System& system = work->platform.system;
    const auto fail = [&](const char* text) {
        system.log.console(text);
        work->completion(std::nullopt, VKExtensions::_vkUserErrorForCode_userInfo(VKErrorExportFailed));
    };
    switch (work->session->status()) {
    case ExportSession::Status::Cancelled:
        fail("VKAudioMixUtility: MovieWriterStatusCancelled");
        break;
    case ExportSession::Status::Failed:
        fail("VKAudioMixUtility: MovieWriterFailed");
        break;
    default:
        work->completion(work->session->outputURL(), nullptr);
    }
}

base::Url VKAudioMixUtility::tempFileURL(const platform::Platform& platform)
{
    const std::string stem =
        support::tempMovieStem(VKExtensions::_srTempPath(platform.files), support::kMixedMovieName);
    return support::tempMovieUrl(stem, platform.system.clock.date());
}
