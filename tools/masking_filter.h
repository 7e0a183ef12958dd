// Takes the secrets out of the library's log: values of secret parameters in queries, and the texts
// of secret elements in replies.
#pragma once

#include <string>
#include <string_view>

namespace quillmere::tools {

/** Whether a parameter or element of this name holds a secret. Case does not matter. */
bool is_secret_name(std::string_view name);

/**
 * A filter for a stream of text that may arrive in pieces of any size. It holds nothing back: names
 * are no secrets, so they pass at once, and what follows them is known to be one by then.
 */
class masking_filter {
public:
    /** Appends the piece to passed, each secret in it replaced by "(masked)". */
    void feed(std::string_view piece, std::string &passed);

private:
    enum class place { text, secret_tag, value_start, value, quoted_value, element };

    void feed_text(char letter, std::string &passed);
    void feed_secret_tag(char letter, std::string &passed);
    void feed_value_start(char letter, std::string &passed);
    void feed_value(char letter, std::string &passed);
    void feed_quoted_value(char letter, std::string &passed);
    void feed_element(char letter, std::string &passed);
    void take_name_letter(char letter);
    void end_name(char letter, std::string &passed);
    void end_tag_name(char letter, std::string &passed);
    void enter_element(std::string &passed);

    place place_ = place::text;
    std::string name_;              // what the letters since the last other character spell
    std::string closing_;           // "</" and the name of the secret element, in lower case
    bool name_opens_tag_ = false;   // a "<" stands before the name
    char quote_ = 0;                // closes the quoted value
    bool named_in_quotes_ = false;  // a secret's name and "=" end the quoted value so far
    char last_in_tag_ = 0;          // tells "<name/>" from "<name>"
    std::size_t closing_match_ = 0; // how much of closing_ the element's text ends with
};

} // namespace quillmere::tools
