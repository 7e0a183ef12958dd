#include "support/reference_document.h"

#include <cstdlib>

#define XML_DTD // expat.h declares its guard against entity bombs only to those who say this
#include <expat.h>

#include "quillmere.h"

namespace quillmere_fuzz {

namespace {

// The library's guard against entities that unfold without end.
constexpr unsigned long long unguarded_expansion = 65536;

void add(void *events, happening what, std::string text)
{
    static_cast<std::vector<event> *>(events)->push_back({what, std::move(text)});
}

extern "C" {
static void on_start(void *events, const char *name, const char **)
{
    add(events, happening::start, name);
}

static void on_end(void *events, const char *name) { add(events, happening::end, name); }

static void on_text(void *events, const char *text, int length)
{
    add(events, happening::text, std::string(text, static_cast<size_t>(length)));
}
}

std::string path_below_root(const std::vector<std::string> &open)
{
    std::string path;
    for (size_t depth = 1; depth < open.size(); ++depth)
        path += "/" + open[depth];
    return path;
}

} // namespace

document read_document(std::string_view xml)
{
    document read = {{}, true};
    if (xml.empty())
        return read;
    XML_Parser parser = XML_ParserCreate("UTF-8");
    XML_SetBillionLaughsAttackProtectionActivationThreshold(parser, unguarded_expansion);
    XML_SetUserData(parser, &read.events);
    XML_SetElementHandler(parser, on_start, on_end);
    XML_SetCharacterDataHandler(parser, on_text);
    read.well_formed =
        XML_Parse(parser, xml.data(), static_cast<int>(xml.size()), XML_TRUE) == XML_STATUS_OK;
    XML_ParserFree(parser);
    return read;
}

std::optional<std::string> look_up(const document &in, const std::string &sought)
{
    std::optional<std::string> found;
    std::vector<std::string> open;
    bool collecting = false;
    for (const event &each : in.events) {
        switch (each.what) {
        case happening::start:
            open.push_back(each.text);
            if (sought == each.text || sought == path_below_root(open))
                collecting = true;
            break;
        case happening::end:
            open.pop_back();
            collecting = false;
            break;
        case happening::text:
            if (collecting)
                found = found.value_or("") + each.text;
            break;
        }
    }
    return found;
}

reference_error read_error(const document &in)
{
    std::optional<std::string> number = look_up(in, "/error");
    int32_t otherwise = in.well_formed ? QM_UNUSABLE_ERROR_NUMBER : QM_MALFORMED_REPLY;
    int32_t code = otherwise;
    if (number) {
        code = std::atoi(number->c_str());
        if (code == 0)
            code = QM_UNUSABLE_ERROR_NUMBER;
    }
    if (!in.well_formed)
        return {code, "Error parsing XML when trying to get error text"};
    return {code, look_up(in, "/message")};
}

} // namespace quillmere_fuzz
