/// What stands at the top of a share sheet: the movie's picture, name, length and size, the files that go along, and the
/// text. All that has to be read is read elsewhere and shown when it comes; nothing moves for it. Main queue only.
#pragma once

#include "platform/files/FileManager.h"
#include "platform/files/MessageCatalog.h"
#include "platform/media/MediaFramework.h"
#include "platform/sharing/ShareItem.h"
#include "platform/views/ImageView.h"
#include "platform/views/Label.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

namespace platform {

class ShareSummary final : public View {
public:
    /// What it works with; all of them outlive it.
    struct Services {
        const MessageCatalog& words;
        MediaFramework& media;
        FileManager& files;
        base::MainQueue& mainQueue;
    };

    /// Of these items, the first file of which is the movie called `name`.
    ShareSummary(const Services& services, const ShareItems& items, const std::string& name);

    /// Begins to look at the movie.
    void load();

    /// Kept free at the end of the first line, for what stands there.
    void setTrailingInset(double inset);
    double heightThatFits(double width) const;
    void layoutSubviews() override;

    const std::shared_ptr<Label>& nameLabel() const { return here(m_name); }
    const std::shared_ptr<Label>& detailsLabel() const { return here(m_details); }
    const std::shared_ptr<Label>& filesLabel() const { return here(m_files); }
    const std::shared_ptr<Label>& textLabel() const { return here(m_text); }
    /// Null until there is one.
    const std::shared_ptr<ImageView>& picture() const { return here(m_picture); }

protected:
    void didMoveToWindow() override;

private:
    struct Heights {
        double name = 0;
        double files = 0;
        double text = 0;
        double head = 0; ///< of the picture and what stands beside it
    };

    Heights heightsFor(double width) const;
    void loadSize();
    void loadMovie();
    void showPicture(const ImageRef& image);
    void showDetails();

    Services m_services;
    std::optional<base::Url> m_movie;
    std::shared_ptr<Label> m_name = std::make_shared<Label>();
    std::shared_ptr<Label> m_details = std::make_shared<Label>();
    std::shared_ptr<Label> m_files = std::make_shared<Label>();
    std::shared_ptr<Label> m_text = std::make_shared<Label>();
    std::shared_ptr<View> m_pictureFrame = std::make_shared<View>();
    std::shared_ptr<ImageView> m_picture;
    std::shared_ptr<Asset> m_asset;
    std::shared_ptr<ImageGenerator> m_generator;
    std::optional<double> m_seconds;
    std::optional<std::int64_t> m_bytes;
    double m_trailingInset = 0;
};

} // namespace platform
