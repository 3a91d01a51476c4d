#include "app/editor/EditorOptions.h"

#include "linux/xdg/DeviceProfile.h"

#include <charconv>

namespace app {

namespace {

base::ErrorRef usage(const std::string& words)
{
    return base::Error::make("clipsa-editor", 2, words);
}

} // namespace

base::Result<EditorOptions> EditorOptions::parse(const std::vector<std::string>& arguments)
{
    EditorOptions options;
    for (std::size_t i = 0; i < arguments.size(); ++i) {
        const std::string& name = arguments[i];
        if (name == "--verbose" || name == "--explain") {
            (name == "--verbose" ? options.verbose : options.explain) = true;
            continue;
        }
        if (i + 1 == arguments.size())
            return usage("\"" + name + "\" is no option, or lacks its value");
        const std::string& value = arguments[++i];
        if (name == "--connect") {
            options.address = value;
        } else if (name == "--device-root") {
            options.deviceRoot = value;
        } else if (name == "--device") {
            options.idiom = xdg::idiomNamed(value);
            if (!options.idiom)
                return usage("--device is phone or pad, not \"" + value + "\"");
        } else if (name == "--home-button") {
            if (value != "yes" && value != "no")
                return usage("--home-button is yes or no, not \"" + value + "\"");
            options.hasHomeButton = value == "yes";
        } else if (name == "--graphics-quality" || name == "--report") {
            std::int32_t number = 0;
            const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), number);
            if (error != std::errc() || end != value.data() + value.size())
                return usage("a number is needed for " + name + ", not \"" + value + "\"");
            (name == "--report" ? options.report : options.graphicsQuality) = number;
        } else {
            return usage("there is no option \"" + name + "\"");
        }
    }
    if (options.address.empty() || options.deviceRoot.empty())
        return usage("this program is started by `clipsa open MOVIE`; it needs --connect and --device-root");
    return options;
}

} // namespace app
