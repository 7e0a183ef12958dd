#include "xml/one_pass_comparison.h"

#include "records/descriptions.h"
#include "support/log_capture.h"
#include "xml/lookup.h"
#include "xml/reply_reader.h"

namespace quillmere_test {

namespace {

using quillmere::element_index;
using quillmere::list_extraction;
using quillmere::reply_reader;

// The names in the form in which the library has them: an array, whose rest is empty.
struct sought_names {
    explicit sought_names(const std::vector<std::string> &sought)
    {
        for (size_t i = 0; i < sought.size() && i < most_sought; ++i)
            names[i] = sought[i].c_str();
    }

    const char *names[most_sought] = {"", "", "", "", "", "", "", ""};
};

// Such a name is left to a pass of its own.
bool unexpected(const std::string &name)
{
    const bool is_path = name.find('/') != std::string::npos;
    return name.empty() || (is_path && name.size() > quillmere::longest_path);
}

std::string as_text(const std::optional<std::string> &value) { return value.value_or("(none)"); }

// An extraction in words: what it logs, returns and hands out.
template <class Extract> std::string listed(const std::string &xml, Extract &&extract)
{
    log_capture log;
    std::string outcome = extract(xml.data(), xml.size());
    return log.text() + outcome;
}

template <class List> std::string in_words(const List *list, int64_t count)
{
    std::string words = " " + std::to_string(count) + ":";
    for (const std::string &each : descriptions_of(list))
        words += " {" + each + "}";
    return words;
}

template <class Extract> std::string content(const std::string &xml, Extract &&extract)
{
    return listed(xml, [&](const char *text, uint64_t length) {
        folder_list *folders = folder_info_list_new();
        file_list *files = file_info_list_new();
        int32_t folder_count = -1;
        int32_t file_count = -1;
        uint32_t failed = extract(text, length, folders, &folder_count, files, &file_count);
        std::string words =
            std::to_string(failed) + in_words(folders, folder_count) + in_words(files, file_count);
        delete_all_folder_list(&folders);
        delete_all_file_list(&files);
        return words;
    });
}

template <class Extract> std::string feed(const std::string &xml, Extract &&extract)
{
    return listed(xml, [&](const char *text, uint64_t length) {
        change_list *changes = change_list_new();
        uint32_t count = 77;
        uint32_t failed = extract(text, length, changes, &count);
        std::string words = std::to_string(failed) + in_words(changes, count);
        delete_all_change_list(&changes);
        return words;
    });
}

template <class Extract> std::string link_list(const std::string &xml, Extract &&extract)
{
    return listed(xml, [&](const char *text, uint64_t length) {
        file_links_list *links = file_links_list_new();
        int32_t count = -1;
        uint32_t failed = extract(text, length, links, &count);
        std::string words = std::to_string(failed) + in_words(links, count);
        delete_all_file_links_list(&links);
        return words;
    });
}

class comparison {
public:
    comparison(const std::string &xml, const std::vector<std::string> &sought)
        : xml_(xml), names_(sought), index_(names_.names)
    {
        log_capture log;
        for (const char *name : names_.names) {
            looked_up found = look_up(xml, name);
            values_.push_back(found.value);
            readable_ = readable_ && found.parse_failed == 0;
        }
    }

    std::string difference()
    {
        lookups_alone();
        with_list<quillmere::folder_content_extraction>(
            [](const std::string &xml, auto &&extract) { return content(xml, extract); },
            simple_extract_folders_content);
        with_list<quillmere::changes_extraction>(
            [](const std::string &xml, auto &&extract) { return feed(xml, extract); },
            simple_extract_changes);
        with_list<quillmere::links_extraction>(
            [](const std::string &xml, auto &&extract) { return link_list(xml, extract); },
            simple_extract_file_links);
        return difference_;
    }

private:
    void expect_same(const std::string &what, const std::string &one_pass,
                     const std::string &separate)
    {
        if (one_pass != separate)
            difference_ += what + ": " + one_pass + "\nbut by itself: " + separate + "\n";
    }

    void lookups_alone()
    {
        reply_reader reader;
        reader.expect(index_);
        read(reader, readable_);
    }

    template <class Extraction, class Describe, class... Arguments>
    void with_list(Describe &&describe, uint32_t (*exported)(Arguments...))
    {
        uint32_t failed = 0;
        std::string separate =
            describe(xml_, [&](auto... arguments) { return failed = exported(arguments...); });
        Extraction list;
        reply_reader reader;
        reader.expect(index_, &list);
        read(reader, readable_ && failed == 0);
        expect_same("the list",
                    describe(xml_, [&](auto... arguments) { return list.extract(arguments...); }),
                    separate);
    }

    void read(reply_reader &reader, bool readable)
    {
        log_capture log;
        // A text without bytes is left to the lookups, which find nothing in it.
        bool whole = reader.read(xml_.data(), xml_.size());
        expect_same("the log of the pass", log.text(), "");
        expect_same("whole", std::to_string(whole), std::to_string(readable && !xml_.empty()));
        if (whole)
            compare_values(reader);
    }

    void compare_values(reply_reader &reader)
    {
        for (size_t i = 0; i < most_sought; ++i) {
            const std::string name = names_.names[i];
            quillmere::heap_text text;
            bool taken = reader.take(names_.names[i], &text);
            expect_same(name + " was expected", std::to_string(taken),
                        std::to_string(!unexpected(name)));
            if (taken)
                expect_same(name, text ? text.get() : "(none)", as_text(values_[i]));
        }
    }

    const std::string &xml_;
    sought_names names_;
    element_index<most_sought> index_;
    std::vector<std::optional<std::string>> values_;
    bool readable_ = true;
    std::string difference_;
};

} // namespace

std::string one_pass_difference(const std::string &xml, const std::vector<std::string> &sought)
{
    return comparison(xml, sought).difference();
}

} // namespace quillmere_test
