// One pass over a reply, beside a pass for each question: lines that name what is sought, up to an
// empty one, then the reply.
#include <cstdio>

#include "support/choices.h"
#include "support/reference_document.h"
#include "support/target.h"
#include "xml/one_pass_comparison.h"

namespace quillmere_fuzz {
namespace {

std::vector<std::string> sought_lines(choices &chosen)
{
    std::vector<std::string> lines;
    for (std::string line = chosen.line(); !line.empty(); line = chosen.line())
        lines.push_back(line);
    return lines;
}

void try_one_pass(std::string_view input)
{
    choices chosen(input);
    std::vector<std::string> sought = sought_lines(chosen);
    std::string xml(chosen.rest());
    if (xml.size() > most_bytes_to_compare)
        return;

    std::string difference = quillmere_test::one_pass_difference(xml, sought);
    std::fputs(difference.c_str(), stderr);
    expect(difference.empty(), "one pass reads what separate passes read");
}

const known_target one_pass("one_pass", try_one_pass);

} // namespace
} // namespace quillmere_fuzz
