// What an applier does to the copy, or seems to do: its steps are the same whether they are taken
// or only foreseen.
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <tuple>
#include <vector>

#include "../transfers/linked_content.h"
#include "local_copy.h"

namespace quillmere::tools {

/** A name in a folder of the copy. */
struct location {
    std::string folder; ///< its key
    std::string name;

    bool operator<(const location &other) const
    {
        return std::tie(folder, name) < std::tie(other.folder, other.name);
    }
};

/** In place of a key: the mirror's own folder. */
constexpr const char *own_folder = "";

/** Where an entry is set aside. */
inline location aside(const std::string &key) { return {own_folder, local_copy::aside_name(key)}; }

/** A file whose bytes are to be brought. */
struct wanted_bytes {
    std::string key;
    std::string path; ///< in the account, for messages
    expected_content content;
};

/** Each member that changes something throws failure when it cannot, unless it says otherwise. */
class disk {
public:
    virtual ~disk() = default;

    virtual local_entry entry(const location &at) const = 0;
    /** Whether the file there has these bytes. */
    virtual bool has(const location &at, const expected_content &content) const = 0;
    virtual std::optional<file_stamp> stamp(entry_kind kind, const location &at) const = 0;

    /** Gives a thing another place, whose name must be free: false when it is not. */
    virtual bool move(const location &from, const location &to) = 0;
    /** The same, in place of the file that has the name. */
    virtual void move_over(const location &from, const location &to) = 0;
    virtual void make_folder(const location &at) = 0;
    /** Removes the folder of a key; false when it holds something. */
    virtual bool remove_folder(const std::string &key, const location &at) = 0;
    virtual void remove_file(const location &at) = 0;

    /** Makes ready for these files to be fetched, by their keys. */
    virtual void expect(const std::vector<std::string> &keys) = 0;
    /** Brings bytes into the mirror's own folder, from where they are to be put into place. */
    virtual void fetch(const wanted_bytes &file,
                       const std::function<void(const location &)> &put_into_place) = 0;
};

/** The disk as it is. */
class real_disk : public disk {
public:
    /** @param here where everything is, kept up to date from outside; all others outlive it, too */
    real_disk(const local_copy &copy, const std::string &root, const placements &here,
              linked_content &contents)
        : copy_(copy), folders_(copy, root, here), contents_(contents)
    {
    }

    local_entry entry(const location &at) const override;
    bool has(const location &at, const expected_content &content) const override;
    std::optional<file_stamp> stamp(entry_kind kind, const location &at) const override;
    bool move(const location &from, const location &to) override;
    void move_over(const location &from, const location &to) override;
    void make_folder(const location &at) override;
    bool remove_folder(const std::string &key, const location &at) override;
    void remove_file(const location &at) override;
    void expect(const std::vector<std::string> &keys) override;
    void fetch(const wanted_bytes &file,
               const std::function<void(const location &)> &put_into_place) override;

private:
    local_folder open(const std::string &key) const;

    const local_copy &copy_;
    copy_folders folders_;
    linked_content &contents_;
};

/** What would become of the disk. Nothing is changed on it, and nothing is fetched. */
class imagined_disk : public disk {
public:
    /** @param here as for the real one: at first it must tell where everything is on the disk */
    imagined_disk(const local_copy &copy, const std::string &root, const placements &here)
        : copy_(copy), here_(here), here_at_first_(here), folders_(copy, root, here_at_first_)
    {
    }

    local_entry entry(const location &at) const override { return look(at).entry; }
    bool has(const location &at, const expected_content &content) const override;
    std::optional<file_stamp> stamp(entry_kind kind, const location &at) const override;
    bool move(const location &from, const location &to) override;
    void move_over(const location &from, const location &to) override;
    void make_folder(const location &at) override;
    bool remove_folder(const std::string &key, const location &at) override;
    void remove_file(const location &at) override;
    void expect(const std::vector<std::string> &) override {}
    void fetch(const wanted_bytes &file,
               const std::function<void(const location &)> &put_into_place) override;

private:
    struct thing {
        local_entry entry = local_entry::nothing;
        std::optional<location> origin; ///< where it really is, if it is not new
    };

    thing look(const location &at) const;
    std::optional<local_folder> really(const std::string &key) const;

    const local_copy &copy_;
    const placements &here_;
    const placements here_at_first_;
    copy_folders folders_;
    std::map<location, thing> changed_;
};

} // namespace quillmere::tools
