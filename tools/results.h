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
    const char *label;            ///< its name for people, or null: told to scripts alone
    nlohmann::ordered_json value; ///< a text, a number, a truth value or null
};

/** Facts that scripts find in an object of their own. */
struct fact_group {
    const char *key;
    std::vector<fact> facts;
};

/** A column of a table for people: the fact of each row that has this key. */
struct column {
    const char *key;
    const char *label;
};

/** Many things of a kind. Scripts get all facts of each, people those that have a column. */
struct result_table {
    const char *key; ///< the name of the rows in JSON
    std::vector<column> columns;
    std::vector<std::vector<fact>> rows;
};

enum class result_format { text, json };

/** How text is meant to be read: taken up by other programs as it is, shown by a terminal that must
 * not obey what the service sent, or shown in colours as well. */
enum class text_style { plain, terminal, colored };

/** The facts as lines of label and value, the values below one another. */
std::string facts_as_text(const std::vector<fact> &facts, text_style style);

/** The facts as one JSON object. */
std::string facts_as_json(const std::vector<fact> &facts);

/** The groups as lines of label and value, without those that nothing is known of. */
std::string groups_as_text(const std::vector<fact_group> &groups, text_style style);

/** The groups as an object of objects. */
std::string groups_as_json(const std::vector<fact_group> &groups);

/** The rows below a line of headings, numbers to the right; nothing for no rows. What is a folder
 * is coloured as one. */
std::string table_as_text(const result_table &shown, text_style style);

/** An object of the facts that are told about the whole, and an array of the rows. */
std::string table_as_json(const std::vector<fact> &about, const result_table &shown);

class results {
public:
    /** Takes standard output for itself: what others write to descriptor 1 is lost from now on. */
    results();

    void set_format(result_format format) { format_ = format; }
    result_format format() const { return format_; }

    /** Whether it is shown by a terminal. */
    bool is_terminal() const { return terminal_; }
    void set_colors(bool colored);
    text_style style() const { return style_; }

    void facts(const std::vector<fact> &facts);
    void groups(const std::vector<fact_group> &groups);

    /** What is told about the whole stands above the rows. */
    void rows(const std::vector<fact> &about, const result_table &shown);

    /** A line for each row for people; the rows for scripts. */
    void lines(const std::vector<std::string> &lines, const result_table &shown);

    /** A sentence for people; its facts for scripts. */
    void sentence(const std::string &sentence, const std::vector<fact> &facts);

    /** Writes the text as it is; a failure when standard output does not take it. */
    void write(std::string_view text);

private:
    descriptor output_;
    bool terminal_ = false;
    text_style style_ = text_style::plain;
    result_format format_ = result_format::text;
};

} // namespace quillmere::tools
