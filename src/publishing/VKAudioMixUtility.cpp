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
    base::MainQueue& main = platform.system.mainQueue;
    const auto begin = [&platform, movie = *movie, output = tempFileURL(platform), completion = std::move(completion)] {
        setUp(platform, movie, output, completion);
    };
    if (main.isCurrent())
        begin();
    else
        main.post(begin);
}

void VKAudioMixUtility::setUp(const platform::Platform& platform, const base::Url& movie, const base::Url& output,
                              const Completion& completion)
{
    base::MainQueue& main = platform.system.mainQueue;
    const auto asset = platform.media.assetWithURL(movie);
    const auto session = platform.media.exportSessionWithAsset(asset, platform::ExportPreset::HighestQuality);
    session->setOutputURL(output);
    const auto work = std::make_shared<Export>(
        Export{platform, completion, base::handedBackTo(main, asset), base::handedBackTo(main, session)});
    // The file is being opened: its tracks are known in a moment. The work keeps the asset until then.
    asset->whenLoaded([work] { start(work); });
}

void VKAudioMixUtility::start(const std::shared_ptr<Export>& work)
{
    work->session->setOutputFileType(platform::FileType::Mpeg4);
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
