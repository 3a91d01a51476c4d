#include "app/host/DeliverFiles.h"

#include "app/host/EditorDirectory.h"
#include "linux/posix/HandOver.h"

#include <cerrno>
#include <chrono>
#include <sys/stat.h>
#include <utility>

namespace host {

namespace {

constexpr std::chrono::seconds kLongCopy{1};

posix::CopyProgress progressFor(const DeliveryEvents& events, DetachedWork::Client& client, const base::Clock& clock)
{
    return [&, start = clock.now(), told = false](std::uint64_t, std::uint64_t total) mutable {
        if (!told && clock.now() - start > kLongCopy) {
            told = true;
            client.post([copying = events.copying, total] { copying(total); });
        }
        return client.isWaiting();
    };
}

base::Result<runtime::Value> deliverAttachment(const FileDelivery& delivery, const posix::CopyProgress& progress)
{
    if (!delivery.attachment)
        return runtime::Value(delivery.attachmentPath);
    const std::string& parent = delivery.attachmentDirectory;
    if (::mkdir(parent.c_str(), S_IRWXU) != 0)
        return base::Error::fromErrno(errno, "cannot make " + parent);
    const auto way = posix::handOver(delivery.attachment.get(), parent, delivery.attachmentName, progress);
    if (!way)
        return way.error();
    return runtime::Value(parent + "/" + delivery.attachmentName);
}

base::Result<runtime::Value> deliverMovie(const FileDelivery& delivery, const posix::CopyProgress& progress)
{
    const auto way = posix::handOver(delivery.movie.get(), delivery.movieDirectory, delivery.movieName, progress);
    if (!way)
        return way.error();
    return runtime::Value(kDeviceMovieDirectory + delivery.movieName);
}

} // namespace

void deliverFiles(const FileDelivery& delivery, const DeliveryEvents& events, DetachedWork::Client& client,
                  const base::Clock& clock)
{
    const posix::CopyProgress progress = progressFor(events, client, clock); // one for both: to the user it is one wait
    // The attachment first: the movie is the last that the editor waits for.
    if (delivery.attachmentArrived)
        client.post([arrived = delivery.attachmentArrived, path = deliverAttachment(delivery, progress)] {
            arrived->keep(path);
        });
    const auto movie = deliverMovie(delivery, progress);
    const bool isWanted = client.isWaiting(); // else it was stopped, which is no failure
    client.post([movie, isWanted, arrived = delivery.movieArrived, failed = events.failed] {
        arrived->keep(movie);
        if (!movie && isWanted)
            failed(movie.error());
    });
}

} // namespace host
