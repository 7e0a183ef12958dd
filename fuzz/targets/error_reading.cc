// The error number and message of a refusal.
#include "support/library.h"
#include "support/reference_document.h"

namespace quillmere_fuzz {
namespace {

void try_error(std::string_view input)
{
    silence_log();
    std::string xml(input);
    int32_t number = 77;
    char *message = nullptr;
    within_budget(linear, input.size(),
                  [&] { get_error_from_xml(xml.c_str(), xml.size(), &number, &message); });
    owned_text owned(message);
    if (xml.size() > most_bytes_to_compare)
        return;

    reference_error expected = read_error(read_document(xml));
    expect(number == expected.number, "the error number");
    expect(as_optional(message) == expected.message, "the error message");
    expect(number != 0, "a refusal never looks like a success");

    int32_t number_alone = 77;
    get_error_from_xml(xml.c_str(), xml.size(), &number_alone, nullptr);
    expect(number_alone == number, "the number without the message");
}

const known_target error("error_reading", try_error);

} // namespace
} // namespace quillmere_fuzz
