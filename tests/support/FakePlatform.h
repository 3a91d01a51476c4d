/// Every role of the platform in memory, wired together, for tests of the editor and the extension. Main thread only.
#pragma once

#include "platform/hosting/Platform.h"
#include "platform/views/Canvas.h"
#include "platform/views/Window.h"
#include "support/EnglishWords.h"
#include "support/FakeBundles.h"
#include "support/FakeCalendar.h"
#include "support/FakeFileManager.h"
#include "support/FakeMedia.h"
#include "support/FakePhotoLibrary.h"
#include "support/FakeSharing.h"
#include "support/FakeStoreLookup.h"
#include "support/TestSystem.h"

#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace tests {

class FakeDevice final : public platform::Device {
public:
    std::optional<platform::InterfaceIdiom> idiom = platform::InterfaceIdiom::Phone;
    std::map<std::string, std::int32_t, std::less<>> integers;
    std::map<std::string, bool, std::less<>> booleans;
    std::int32_t quality = 100;
    /// What callers would take for an answer, by the key that they asked for.
    mutable std::vector<std::pair<std::string, std::int32_t>> fallbacks;

    std::optional<platform::InterfaceIdiom> userInterfaceIdiom() const override { return idiom; }
    std::int32_t integerAnswer(std::string_view key, std::int32_t fallback) const override
    {
        fallbacks.emplace_back(key, fallback);
        const auto found = integers.find(key);
        return found == integers.end() ? fallback : found->second;
    }
    bool booleanAnswer(std::string_view key) const override
    {
        const auto found = booleans.find(key);
        return found != booleans.end() && found->second;
    }
    std::int32_t graphicsQuality() const override { return quality; }
};

/// Masks of 80 by 80 points: the glyph is a black square in the middle, the disc mask opaque in its outer 10 points.
class FakeImages final : public platform::ImageCatalog {
public:
    explicit FakeImages(const platform::Screen& screen) : m_screen(screen) {}

    platform::ImageRef imageNamed(std::string_view name) override
    {
        platform::Canvas canvas({80, 80}, m_screen.scale());
        if (name == "VKVideoOverlayGlyphMask") {
            canvas.fill({{30, 30}, {20, 20}}, 0, 1);
        } else if (name == "VKVideoOverlayBackgroundMask") {
            canvas.fill({{0, 0}, {80, 80}}, 0, 1);
            canvas.fill({{10, 10}, {60, 60}}, 0, 0);
        } else {
            return nullptr;
        }
        ++drawn;
        return canvas.image();
    }

    int drawn = 0;

private:
    const platform::Screen& m_screen;
};

/// The order of the members is the order in which they are made.
struct FakePlatform {
    /// A phone held upright.
    static constexpr base::Size kPhone{360, 720};
    static constexpr base::Size kPad{1024, 768};

    TestSystem machine;
    runtime::NotificationCenter notifications;
    FakeDevice device;
    std::shared_ptr<platform::Window> window;
    FakeImages images;
    FakeFileManager files;
    FakeBundles bundles;
    EnglishWords words;
    FakeCalendar calendar;
    FakeMediaFramework media;
    FakePhotoLibrary photos;
    FakeStoreLookup store;
    FakeSharing sharing;
    platform::Platform platform;

    explicit FakePlatform(base::Size size = kPhone, double scale = 1)
        : window(std::make_shared<platform::Window>(machine.mainQueue, size, scale)), images(*window),
          files(machine.system),
          media(machine.mainQueue, notifications), platform{machine.system, notifications, device, *window,  images,
                                                            files,          bundles,       words,  calendar, media,
                                                            photos,         store,         sharing}
    {
    }
};

} // namespace tests
