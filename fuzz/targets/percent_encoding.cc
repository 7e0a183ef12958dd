// Percent-encoding, which must decode back to what was encoded.
#include "support/library.h"

namespace quillmere_fuzz {
namespace {

int digit_value(char digit)
{
    size_t value = std::string_view("0123456789abcdef").find(digit);
    expect(value != std::string_view::npos, "a lower-case hexadecimal digit");
    return static_cast<int>(value);
}

std::string decoded(const std::string &text)
{
    std::string out;
    for (size_t at = 0; at < text.size(); ++at) {
        if (text[at] != '%') {
            expect(url_acceptable_letter(text[at]) == 1, "a letter that may stand as it is");
            out += text[at];
            continue;
        }
        expect(at + 2 < text.size(), "two digits behind a percent sign");
        out += static_cast<char>(digit_value(text[at + 1]) * 16 + digit_value(text[at + 2]));
        expect(url_acceptable_letter(out.back()) == 0, "nothing is encoded without need");
        at += 2;
    }
    return out;
}

void try_encoding(std::string_view input)
{
    std::string text(input.substr(0, input.find('\0')));
    owned_buffer buffer(string_new(0));
    int64_t length = 0;
    within_budget(linear, input.size(),
                  [&] { length = string_append_urlencode(buffer.get(), text.c_str()); });

    std::string encoded = string_get(buffer.get());
    expect(length == static_cast<int64_t>(encoded.size()), "the new length");
    expect(decoded(encoded) == text, "what is encoded decodes back");

    string_append_urlencode_obfs(buffer.get(), text.c_str());
    expect(string_get(buffer.get()) == encoded + encoded, "a secret is encoded no differently");
    std::string view = string_get_obfs(buffer.get(), nullptr);
    expect(view == encoded + (text.empty() ? "" : "(omitted)"), "a secret is hidden whole");
}

const known_target encoding("percent_encoding", try_encoding);

} // namespace
} // namespace quillmere_fuzz
