#include "masking_filter.h"

#include <algorithm>
#include <iterator>

#include "text.h"

namespace quillmere::tools {

namespace {

constexpr std::string_view mask = "(masked)";
constexpr std::size_t longest_name = 128;

// Tokens, passwords and signatures go by many names, which share their endings.
constexpr std::string_view secret_endings[] = {"token", "password", "passwd", "signature",
                                               "secret"};
constexpr std::string_view secret_names[] = {"application_key", "app_key", "api_key", "secret_key",
                                             "pkey"};

bool is_name_letter(char letter)
{
    return (letter >= 'a' && letter <= 'z') || (letter >= 'A' && letter <= 'Z') ||
           (letter >= '0' && letter <= '9') || letter == '_' || letter == '-' || letter == ':';
}

bool is_blank_or_control(char letter)
{
    return static_cast<unsigned char>(letter) <= ' ' || letter == 0x7f;
}

// The library percent-encodes what it puts into a query, so none of these can be part of a value.
bool ends_value(char letter)
{
    return is_blank_or_control(letter) ||
           std::string_view("&\"'<>").find(letter) != std::string_view::npos;
}

} // namespace

bool is_secret_name(std::string_view name)
{
    const std::string lower = lower_case(name);
    const auto ends_so = [&](std::string_view ending) { return ends_with(lower, ending); };
    return std::any_of(std::begin(secret_endings), std::end(secret_endings), ends_so) ||
           std::find(std::begin(secret_names), std::end(secret_names), lower) !=
               std::end(secret_names);
}

void masking_filter::feed(std::string_view piece, std::string &passed)
{
    for (const char letter : piece) {
        switch (place_) {
        case place::text:
            feed_text(letter, passed);
            break;
        case place::secret_tag:
            feed_secret_tag(letter, passed);
            break;
        case place::value_start:
            feed_value_start(letter, passed);
            break;
        case place::value:
            feed_value(letter, passed);
            break;
        case place::quoted_value:
            feed_quoted_value(letter, passed);
            break;
        case place::element:
            feed_element(letter, passed);
            break;
        }
    }
}

void masking_filter::feed_text(char letter, std::string &passed)
{
    passed += letter;
    if (is_name_letter(letter))
        take_name_letter(letter);
    else
        end_name(letter, passed);
}

void masking_filter::take_name_letter(char letter)
{
    // Of an endless run of letters the last ones decide, since secret names are told by their ends.
    if (name_.size() == longest_name)
        name_.erase(0, longest_name / 2);
    name_ += letter;
}

void masking_filter::end_name(char letter, std::string &passed)
{
    if (letter == '=' && is_secret_name(name_))
        place_ = place::value_start;
    else
        end_tag_name(letter, passed);
    name_.clear();
    name_opens_tag_ = letter == '<';
}

void masking_filter::end_tag_name(char letter, std::string &passed)
{
    const bool ends = letter == '>' || is_blank_or_control(letter);
    if (!ends || !name_opens_tag_ || !is_secret_name(name_))
        return;
    closing_ = "</" + lower_case(name_);
    last_in_tag_ = 0;
    place_ = place::secret_tag;
    if (letter == '>')
        enter_element(passed);
}

void masking_filter::enter_element(std::string &passed)
{
    passed += mask;
    closing_match_ = 0;
    place_ = place::element;
}

// Attributes are left out: the replies have none that a reader of the log would miss.
void masking_filter::feed_secret_tag(char letter, std::string &passed)
{
    if (letter != '>') {
        last_in_tag_ = letter;
        return;
    }
    place_ = place::text;
    if (last_in_tag_ == '/')
        passed += "/>";
    else
        enter_element(passed += letter);
}

void masking_filter::feed_value_start(char letter, std::string &passed)
{
    if (letter == '"' || letter == '\'') {
        passed += letter;
        passed += mask;
        quote_ = letter;
        named_in_quotes_ = false;
        place_ = place::quoted_value;
        return;
    }
    place_ = place::value;
    if (!ends_value(letter))
        passed += mask;
    feed_value(letter, passed);
}

void masking_filter::feed_value(char letter, std::string &passed)
{
    if (!ends_value(letter))
        return;
    place_ = place::text;
    feed_text(letter, passed);
}

// The value may be cut off, and other secrets follow. So a quotation mark behind a secret's name
// opens rather than closes, and the tag of a secret element counts here too.
void masking_filter::feed_quoted_value(char letter, std::string &passed)
{
    if (is_name_letter(letter)) {
        named_in_quotes_ = false;
        take_name_letter(letter);
        return;
    }
    if (letter == quote_ && !named_in_quotes_) {
        place_ = place::text;
        passed += letter;
    }
    named_in_quotes_ = letter == '=' && is_secret_name(name_);
    end_tag_name(letter, passed);
    name_.clear();
    name_opens_tag_ = letter == '<';
}

// Only the element's own end tag ends it: not a child's, nor a "<" in a CDATA section. A reply that
// is cut off inside the element takes the log that follows with it, which is the safe side.
void masking_filter::feed_element(char letter, std::string &passed)
{
    const std::string lower = lower_case(std::string_view(&letter, 1));
    if (lower[0] == closing_[closing_match_])
        ++closing_match_;
    else
        closing_match_ = letter == '<' ? 1 : 0;
    if (closing_match_ < closing_.size())
        return;

    passed += closing_;
    place_ = place::text;
}

} // namespace quillmere::tools
