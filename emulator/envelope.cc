#include "envelope.h"

#include <iostream>

namespace emulator {
namespace {

constexpr const char *current_api_version = "2.13";

} // namespace

void begin_envelope(xml_writer &xml, std::string_view action)
{
    xml.open("response");
    if (!action.empty())
        xml.element("action", action);
}

std::string end_envelope(xml_writer &xml, const char *result)
{
    xml.element("result", result);
    xml.element("current_api_version", current_api_version);
    xml.close();
    return xml.take();
}

reply refuse(const refusal &why, std::string_view action)
{
    xml_writer xml;
    begin_envelope(xml, action);
    xml.element("message", why.what());
    xml.element("error", static_cast<std::uint64_t>(why.number()));
    return {row_of(why.number()).http_status, end_envelope(xml, "Error")};
}

std::optional<reply> refusal_of(std::string_view path, std::string_view action,
                                const std::function<void()> &run)
{
    try {
        run();
        return std::nullopt;
    } catch (const refusal &why) {
        return refuse(why, action);
    } catch (const std::exception &problem) {
        // The client learns that it is not at fault, and no more than that.
        std::cerr << "quillmere-emulator: " << path << ": " << problem.what() << std::endl;
        return refuse(refusal(error::internal), action);
    }
}

} // namespace emulator
