#include "app/host/SaveMovie.h"

#include "app/host/EditorDirectory.h"
#include "app/host/ExitStatus.h"
#include "app/host/MediaTool.h"
#include "app/host/ProgressBar.h"
#include "app/host/Streams.h"
#include "linux/photos/VideoLibrary.h"
#include "linux/xdg/FileManager.h"

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <optional>
#include <system_error>
#include <utility>

namespace host {

namespace {

namespace fs = std::filesystem;

base::ErrorRef interrupted()
{
    return base::Error::fromErrno(ECANCELED, "cannot save the movie");
}

/// Writes the movie with all sound tracks as one. Null, or why not; ECANCELED when a signal came.
base::ErrorRef mix(MediaTool& tool, const std::shared_ptr<platform::Asset>& asset, const std::string& output,
                   ProgressBar& progress)
{
    const auto session = tool.media().exportSessionWithAsset(asset, platform::ExportPreset::HighestQuality);
    session->setOutputURL(base::Url::fromPath(output));
    session->setAudioMix(platform::audioMixOfAllTracks(*asset));

    // Its file must be gone before its directory, when it is given up.
    return tool.runExport(*session, [&] { progress.show(partOfSave(session->progress(), 0)); });
}

/// The first picture, for the file managers; nothing where there is none. It must not keep a save from ending.
std::optional<platform::Bitmap> firstPicture(MediaTool& tool, const std::shared_ptr<platform::Asset>& asset, int side)
{
    if (asset->tracksWithMediaType(platform::MediaType::Video).empty())
        return std::nullopt;
    platform::ImageRef picture;
    bool came = false;
    base::MainQueue& main = tool.system().mainQueue;
    const auto generator = tool.media().imageGeneratorWithAsset(asset);
    generator->setMaximumSize({static_cast<double>(side), static_cast<double>(side)});
    generator->generateImagesAsynchronouslyForTimes(
        {base::MediaTime::zero()}, [&](base::MediaTime, const platform::ImageRef& image, base::MediaTime, auto, auto&) {
            main.post([&, image] {
                picture = image;
                came = true;
            });
        });
    tool.runUntil([&] { return came; });
    return picture ? std::optional(picture->bitmap()) : std::nullopt;
}

photos::Recording recordingOf(MediaTool& tool, const SaveCommand& command)
{
    photos::Recording recording;
    recording.appName = command.appName.empty() ? fs::path(command.movie).stem().native() : command.appName;
    xdg::FileManager files(tool.system(), {});
    if (const auto attributes = files.attributesOfItem(command.movie))
        recording.date = attributes.value().creationDate;
    return recording;
}

/// Puts the file at `path` into the library; gives the new one's path.
base::Result<std::string> publish(MediaTool& tool, const std::string& path, photos::LibraryOptions options,
                                  ProgressBar& progress)
{
    std::atomic<bool> goOn{true};
    std::string published;
    base::ErrorRef failure;
    options.published = [&](const std::string& file) { published = file; };
    options.goOn = [&] { return goOn.load(); };

    photos::VideoLibrary library(std::move(options), tool.system().log, tool.works());
    library.performChanges(
        [&](platform::PhotoLibraryChange& change) { change.createAssetFromVideoAtFileURL(base::Url::fromPath(path)); },
        [&failure](bool /*the error says it*/, const base::ErrorRef& error) { failure = error; });
    // A signal that comes too late changes nothing: the movie is saved, and that is told.
    tool.finishWork([&goOn] { goOn = false; },
                    [&] { progress.show(partOfSave(1, tool.works().progress().value_or(0))); });
    if (failure)
        return failure;
    return published;
}

base::Result<std::string> save(MediaTool& tool, const SaveCommand& command)
{
    ProgressBar progress("Saving");
    const auto asset = tool.open(command.movie);
    if (!asset)
        return asset.error();
    const auto root = editorDirectoriesRoot();
    if (!root)
        return root.error();
    sweepEditorDirectories(root.value());
    const auto directory = EditorDirectory::make(root.value());
    if (!directory)
        return directory.error();

    std::string movie = directory.value().path() + "/mixed.mp4";
    const base::ErrorRef error = mix(tool, asset.value(), movie, progress);
    if (tool.interruption() != 0 && error)
        return error;
    progress.clear();
    tool.tellLog(base::MemoryLog::Line::Kind::Message); // what is left out of the mix
    if (error) {
        const bool isSilent = asset.value()->tracksWithMediaType(platform::MediaType::Audio).empty();
        complain((isSilent ? command.movie + " cannot be made into an MP4 movie ("
                           : "the sound of " + command.movie + " cannot be mixed (")
                 + error->description() + "); it is saved as it is");
        std::error_code ignored; // a relative path was opened a moment ago
        movie = fs::absolute(command.movie, ignored).native();
    }

    photos::LibraryOptions options;
    options.directories = photos::UserDirectories::ofUser();
    const photos::Recording recording = recordingOf(tool, command);
    options.recording = [&recording](const std::string&) { return recording; };
    const auto picture = firstPicture(tool, asset.value(), photos::kThumbnailSide);
    options.thumbnail = [&picture](const std::string&, int) { return picture; };
    if (tool.interruption() != 0)
        return interrupted();
    return publish(tool, movie, std::move(options), progress);
}

} // namespace

double partOfSave(double mixed, double copied)
{
    constexpr double kMixPart = 0.9; // of the time, as measured; the rest is copying
    return kMixPart * mixed + (1 - kMixPart) * copied;
}

int saveMovie(const SaveCommand& command)
{
    MediaTool tool;
    const auto saved = save(tool, command);
    if (!saved)
        return tool.fail(saved.error());
    tool.tellLog(base::MemoryLog::Line::Kind::Error); // what the library could not do beside it
    std::printf("%s\n", saved.value().c_str());
    return kExitDone;
}

} // namespace host
