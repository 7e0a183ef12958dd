#include "form.h"

#include "errors.h"
#include "text.h"

namespace emulator {
namespace {

int hex_digit(char digit)
{
    if (digit >= '0' && digit <= '9')
        return digit - '0';
    if (digit >= 'a' && digit <= 'f')
        return digit - 'a' + 10;
    if (digit >= 'A' && digit <= 'F')
        return digit - 'A' + 10;
    return -1;
}

char decode_escape(std::string_view encoded, std::size_t percent)
{
    if (percent + 2 >= encoded.size())
        throw refusal(error::malformed_request, "a percent sign at the end of a parameter");
    const int high = hex_digit(encoded[percent + 1]);
    const int low = hex_digit(encoded[percent + 2]);
    if (high < 0 || low < 0)
        throw refusal(error::malformed_request,
                      "a percent sign without two hexadecimal digits in a parameter");
    return static_cast<char>(high * 16 + low);
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

std::string decode_form_text(std::string_view encoded)
{
    std::string decoded;
    decoded.reserve(encoded.size());
    for (std::size_t at = 0; at < encoded.size(); ++at) {
        if (encoded[at] == '%') {
            decoded += decode_escape(encoded, at);
            at += 2;
        } else {
            decoded += encoded[at] == '+' ? ' ' : encoded[at];
        }
    }
    if (!is_xml_text(decoded))
        throw refusal(error::malformed_request,
                      "a parameter is not UTF-8 or holds a control character");
    return decoded;
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
