#include "linux/appstream/DeveloperElement.h"

#include <glib.h>
#include <vector>

namespace appstream {

namespace {

struct Reading {
    std::vector<std::string> path; ///< the elements that are open
    bool isWanted = false;
    std::string name;
};

void open(GMarkupParseContext* /*context*/, const char* element, const char** attributes, const char** /*values*/,
          gpointer data, GError** /*error*/)
{
    auto& reading = *static_cast<Reading*>(data);
    reading.path.emplace_back(element);
    reading.isWanted = reading.path == std::vector<std::string>{"component", "developer", "name"};
    for (const char** attribute = attributes; *attribute; ++attribute)
        if (std::string_view(*attribute) == "xml:lang") // a translation
            reading.isWanted = false;
}

void close(GMarkupParseContext* /*context*/, const char* /*element*/, gpointer data, GError** /*error*/)
{
    auto& reading = *static_cast<Reading*>(data);
    reading.path.pop_back();
    reading.isWanted = false;
}

void takeText(GMarkupParseContext* /*context*/, const char* text, gsize length, gpointer data, GError** /*error*/)
{
    auto& reading = *static_cast<Reading*>(data);
    if (reading.isWanted)
        reading.name.append(text, length);
}

} // namespace

std::optional<std::string> developerElement(std::string_view xml)
{
    const GMarkupParser parser = {open, close, takeText, nullptr, nullptr};
    Reading reading;
    GMarkupParseContext* const context = g_markup_parse_context_new(&parser, GMarkupParseFlags(0), &reading, nullptr);
    const bool isXml = g_markup_parse_context_parse(context, xml.data(), gssize(xml.size()), nullptr) != FALSE
                       && g_markup_parse_context_end_parse(context, nullptr) != FALSE;
    g_markup_parse_context_free(context);
    return isXml && !reading.name.empty() ? std::optional(reading.name) : std::nullopt;
}

} // namespace appstream
