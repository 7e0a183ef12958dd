// Form-encoded parameters: the query of a request, and the body of a POST.
#pragma once

#include <map>
#include <string>
#include <string_view>

namespace emulator {

/** The target of a request, cut at its first "?". */
struct split_target {
    std::string_view path;
    std::string_view query;
};

split_target split(std::string_view target);

using parameters = std::map<std::string, std::string>;

/**
 * Decodes "%xx" and "+". Throws a refusal when a "%" is not followed by two hexadecimal digits, or
 * when the result could not be written into a reply.
 */
std::string decode_form_text(std::string_view encoded);

/**
 * Adds the pairs of "name=value&name=value" to the parameters. Empty pairs are skipped, since
 * clients begin queries with "?&". A name that occurs twice is refused: which value counts would
 * be a guess, and a client that does it has a fault worth finding.
 */
void add_form_parameters(std::string_view form, parameters &to);

} // namespace emulator
