// Standard output, kept for results: aligned text for people, JSON for scripts.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include <nlohmann/json.hpp>

#include "descriptor.h"

namespace quillmere::tools {

/** One thing that a command found out. */
struct fact {
    const char *key;              ///< its name in JSON
    const char *label;            ///< its name for people
    nlohmann::ordered_json value; ///< a text, a number, a truth value or null
};

enum class result_format { text, json };

/** The facts as lines of label and value, the values below one another. */
std::string facts_as_text(const std::vector<fact> &facts, bool for_terminal);

/** The facts as one JSON object. */
std::string facts_as_json(const std::vector<fact> &facts);

class results {
public:
    /** Takes standard output for itself: what others write to descriptor 1 is lost from now on. */
    results();

    void set_format(result_format format) { format_ = format; }
    result_format format() const { return format_; }

    void facts(const std::vector<fact> &facts);

    /** A sentence for people; its facts for scripts. */
    void sentence(const std::string &sentence, const std::vector<fact> &facts);

    /** Writes the text as it is; a failure when standard output does not take it. */
    void write(std::string_view text);

private:
    descriptor output_;
    bool terminal_ = false;
    result_format format_ = result_format::text;
};

} // namespace quillmere::tools
