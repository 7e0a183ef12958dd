#include "interface/header_reader.h"

#include <cctype>
#include <string_view>

namespace quillmere_test {
namespace {

bool starts_with(const std::string &text, std::string_view start)
{
    return text.compare(0, start.size(), start) == 0;
}

bool is_name_letter(char letter)
{
    return std::isalnum(static_cast<unsigned char>(letter)) != 0 || letter == '_';
}

// The name that ends right before a position, spaces left out.
std::string name_before(const std::string &text, size_t end)
{
    while (end > 0 && !is_name_letter(text[end - 1]))
        --end;
    size_t start = end;
    while (start > 0 && is_name_letter(text[start - 1]))
        --start;
    return text.substr(start, end - start);
}

std::string declared_name(const std::string &text)
{
    return name_before(text, text.find_first_of("([;"));
}

// Walks over the header statement by statement, with the comment that is in force.
class reader {
public:
    explicit reader(const std::string &header) : header_(header) {}

    std::vector<declaration> read()
    {
        while (position_ < header_.size())
            step();
        return std::move(found_);
    }

private:
    void step()
    {
        if (header_.compare(position_, 2, "/*") == 0)
            take_comment();
        else if (header_[position_] == '#')
            skip_directive();
        else if (header_.compare(position_, 2, "\n\n") == 0)
            end_family();
        else if (std::isspace(static_cast<unsigned char>(header_[position_])) != 0)
            ++position_;
        else
            take_statement();
    }

    std::string comment_here()
    {
        size_t end = header_.find("*/", position_) + 2;
        std::string comment = header_.substr(position_, end - position_);
        position_ = end;
        return comment;
    }

    void take_comment()
    {
        std::string comment = comment_here();
        if (starts_with(comment, "/**<") && !found_.empty())
            found_.back().comment = comment;
        else if (starts_with(comment, "/**"))
            comment_ = comment;
        else
            comment_.clear();
        record_.clear();
    }

    void skip_directive()
    {
        do {
            position_ = header_.find('\n', position_);
        } while (header_[position_ - 1] == '\\' && ++position_);
    }

    // An empty line ends what belongs together, but not between a record's type and its functions.
    void end_family()
    {
        ++position_;
        if (record_.empty())
            comment_.clear();
    }

    // Up to the semicolon, or to a brace that only holds declarations together.
    void take_statement()
    {
        std::string text;
        for (int braces = 0; position_ < header_.size();) {
            if (header_.compare(position_, 2, "/*") == 0) {
                comment_here();
                continue;
            }
            char letter = header_[position_++];
            text += letter;
            braces += letter == '{' ? 1 : letter == '}' ? -1 : 0;
            if (letter == ';' && braces <= 0)
                break;
            if (starts_with(text, "extern \"C\" {") || text == "}")
                return;
        }
        note(text);
    }

    void note(const std::string &text)
    {
        if (starts_with(text, "typedef struct ") && text.find('{') == std::string::npos) {
            record_ = name_before(text, text.find(';'));
            return;
        }
        std::string name = declared_name(text);
        if (!record_.empty() && !starts_with(name, record_ + "_")) {
            record_.clear();
            comment_.clear();
        }
        if (text.find("QM_API") != std::string::npos)
            found_.push_back({name, text, comment_});
    }

    const std::string &header_;
    size_t position_ = 0;
    std::string comment_; // what documents the statements from here on
    std::string record_;  // the opaque record whose functions follow
    std::vector<declaration> found_;
};

} // namespace

std::vector<declaration> exported_declarations(const std::string &header)
{
    return reader(header).read();
}

std::vector<std::string> documented_parameters(const std::string &comment)
{
    constexpr std::string_view tag = "@param ";
    std::vector<std::string> names;
    for (size_t at = comment.find(tag); at != std::string::npos; at = comment.find(tag, at + 1)) {
        size_t start = at + tag.size();
        size_t end = start;
        while (is_name_letter(comment[end]))
            ++end;
        names.push_back(comment.substr(start, end - start));
    }
    return names;
}

} // namespace quillmere_test
