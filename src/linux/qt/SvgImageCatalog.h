/// The program's picture resources, drawn from vector files for the screen that they are shown on. GUI thread.
#pragma once

#include "base/Affinity.h"
#include "platform/views/Image.h"

#include <functional>
#include <map>
#include <string>
#include <utility>

namespace qtui {

class SvgImageCatalog final : public platform::ImageCatalog {
public:
    /// `scale` is asked each time: pixels per point of the screen.
    explicit SvgImageCatalog(std::function<double()> scale);

    /// The same object for the same name and scale.
    platform::ImageRef imageNamed(std::string_view name) override;

private:
    base::Affinity m_affinity;
    std::function<double()> m_scale;
    std::map<std::pair<std::string, double>, platform::ImageRef> m_images;
};

} // namespace qtui
