#include "form.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "errors.h"
#include "text.h"

namespace emulator {
namespace {

// In a form a blank may be written as "+".
std::string without_plus(std::string_view encoded)
{
    std::string text(encoded);
    std::replace(text.begin(), text.end(), '+', ' ');
    return text;
}

void add_pair(std::string_view pair, parameters &to)
{
    const std::size_t equals = pair.find('=');
    const std::string name = decode_form_text(pair.substr(0, equals));
    std::string value;
    if (equals != std::string_view::npos)
        value = decode_form_text(pair.substr(equals + 1));
    if (!to.emplace(name, std::move(value)).second)
        throw refusal(error::malformed_request, "parameter " + name + " is given twice");
}

} // namespace

split_target split(std::string_view target)
{
    const std::size_t mark = target.find('?');
    if (mark == std::string_view::npos)
        return {target, {}};
    return {target.substr(0, mark), target.substr(mark + 1)};
}

std::string decode_form_text(std::string_view encoded)
{
    std::optional<std::string> decoded = percent_decoded(without_plus(encoded));
    if (!decoded)
        throw refusal(error::malformed_request,
                      "a percent sign without two hexadecimal digits in a parameter");
    if (!is_xml_text(*decoded))
        throw refusal(error::malformed_request,
                      "a parameter is not UTF-8 or holds a control character");
    return std::move(*decoded);
}

void add_form_parameters(std::string_view form, parameters &to)
{
    while (!form.empty()) {
        const std::size_t end = form.find('&');
        const std::string_view pair = form.substr(0, end);
        if (!pair.empty())
            add_pair(pair, to);
        if (end == std::string_view::npos)
            return;
        form.remove_prefix(end + 1);
    }
}

} // namespace emulator
