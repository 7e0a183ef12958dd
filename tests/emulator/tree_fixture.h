// Two accounts with their trees, asked through the router as a client would ask.
#pragma once

#include <map>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "router.h"
#include "scratch_directory.h"
#include "store/content.h"
#include "store/database.h"

using pairs = std::vector<std::pair<std::string, std::string>>;

/** The texts of all elements of this name, in their order. */
std::vector<std::string> elements(const std::string &reply, const std::string &name);

class Tree : public testing::Test {
protected:
    Tree();

    /** Asks with a session of the account; without one when its address is empty. */
    emulator::reply ask(const std::string &who, const std::string &action, const pairs &given = {});
    emulator::reply ask(const std::string &action, const pairs &given = {})
    {
        return ask(ann, action, given);
    }
    emulator::reply fetch(const std::string &target, const std::string &range = {},
                          const std::string &if_range = {}, const std::string &method = "GET");

    /** The error number of a reply, empty for a success. */
    std::string error_of(const std::string &who, const std::string &action, const pairs &given);
    std::string error_of(const std::string &action, const pairs &given)
    {
        return error_of(ann, action, given);
    }
    /** Does it, expects a success, and returns this element of the reply. */
    std::string done(const std::string &who, const std::string &action, const pairs &given,
                     const std::string &name = "result");

    std::string make_folder(const std::string &name, const std::string &parent = {},
                            const std::string &who = ann);
    std::string make_file(const std::string &name, const std::string &folder = {},
                          const std::string &who = ann);
    /** Gives a file its bytes. */
    void fill(const std::string &quick_key, const std::string &bytes);
    std::string root(const std::string &who = ann);

    std::string folder_says(const std::string &key, const std::string &name,
                            const std::string &who = ann);
    std::string file_says(const std::string &key, const std::string &name,
                          const std::string &who = ann);
    /** The names that a listing shows: folders, then files. */
    std::vector<std::string> names_in(const std::string &folder, const std::string &who = ann);
    std::uint64_t revision(const std::string &who = ann);

    static const std::string ann;
    static const std::string bob;
    static const std::string nobody;

    scratch_directory scratch;
    emulator::database store{scratch.path() / "store.sqlite"};
    emulator::content_store content{scratch.path() / "content"};
    std::int64_t time = 1'700'000'000;
    emulator::service state{store, content, [this] { return time; }, 1'000'000'000};
    std::map<std::string, std::string> sessions;
};

/** The part of a link behind scheme and host. */
std::string path_of(const std::string &link);

/** All bytes that a reply carries, be they in memory or in a file. */
std::string bytes_of(const emulator::reply &made);

std::string field_of(const emulator::reply &made, const std::string &name);
