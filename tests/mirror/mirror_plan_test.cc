// What is to be done, from what is here and what is wanted.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "mirror/plan.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::ElementsAre;
using testing::IsEmpty;

class Plan : public testing::Test {
protected:
    Plan() { wanted.root = "r"; }

    void want(const std::string &key, const std::string &parent, const std::string &name,
              const std::string &sha256 = "")
    {
        const auto kind = sha256.empty() ? entry_kind::folder : entry_kind::file;
        wanted.order.push_back(key);
        wanted.entries[key] = {kind, parent, name, {1, sha256}};
        wanted.keys[{parent, name}] = key;
    }

    placement &have(const std::string &key, const std::string &parent, const std::string &name,
                    const std::string &sha256 = "")
    {
        const auto kind = sha256.empty() ? entry_kind::folder : entry_kind::file;
        return here[key] = {kind, parent, name, {1, sha256}, {}};
    }

    plan made() const { return make_plan(wanted, here, unknown); }

    layout wanted;
    placements here;
    std::set<std::string> unknown;
};

} // namespace

TEST_F(Plan, IsEmptyWhereAllIsAsItIsWanted)
{
    want("f", "r", "folder");
    want("a", "f", "a.txt", "1");
    have("f", "r", "folder");
    have("a", "f", "a.txt", "1");

    EXPECT_TRUE(made().is_empty());
}

TEST_F(Plan, MakesFoldersAndBringsFilesThatAreMissing)
{
    want("f", "r", "folder");
    want("g", "f", "inner");
    want("a", "g", "a.txt", "1");

    const plan steps = made();

    EXPECT_THAT(steps.folders, ElementsAre("f", "g"));
    EXPECT_THAT(steps.missing, ElementsAre("a"));
    EXPECT_THAT(steps.set_aside, IsEmpty());
}

TEST_F(Plan, MovesWithoutBringingTheBytes)
{
    want("f", "r", "new name");
    want("a", "r", "a.txt", "1");
    have("f", "r", "folder");
    have("a", "f", "a.txt", "1");

    const plan steps = made();

    EXPECT_THAT(steps.set_aside, ElementsAre("a", "f"));
    EXPECT_THAT(steps.folders, ElementsAre("f"));
    EXPECT_THAT(steps.moved, ElementsAre("a"));
    EXPECT_THAT(steps.missing, IsEmpty());
}

TEST_F(Plan, LeavesWhatAMovedFolderHoldsInIt)
{
    want("f", "r", "new name");
    want("a", "f", "a.txt", "1");
    have("f", "r", "folder");
    have("a", "f", "a.txt", "1");

    const plan steps = made();

    EXPECT_THAT(steps.set_aside, ElementsAre("f"));
    EXPECT_THAT(steps.moved, IsEmpty());
}

TEST_F(Plan, BringsBytesThatChangedAlsoOfAFileThatMoves)
{
    want("a", "r", "a.txt", "2");
    want("b", "r", "new name", "2");
    have("a", "r", "a.txt", "1");
    have("b", "r", "b.txt", "1");

    const plan steps = made();

    EXPECT_THAT(steps.set_aside, ElementsAre("b"));
    EXPECT_THAT(steps.moved, ElementsAre("b"));
    EXPECT_THAT(steps.missing, ElementsAre("a", "b"));
}

TEST_F(Plan, RemovesTheInnermostFoldersFirst)
{
    have("a", "r", "outer");
    have("b", "a", "inner");
    have("c", "b", "file", "1");

    const plan steps = made();

    EXPECT_THAT(steps.set_aside, ElementsAre("c"));
    EXPECT_THAT(steps.left, ElementsAre("b", "a"));
}

TEST_F(Plan, LetsGoOfWhatWasChangedHere)
{
    want("a", "r", "a.txt", "1");
    have("a", "r", "a.txt", "1").changed_here = true;
    have("b", "r", "b.txt", "1").changed_here = true;

    const plan steps = made();

    EXPECT_THAT(steps.let_go, ElementsAre("a", "b"));
    EXPECT_THAT(steps.missing, ElementsAre("a"));
    EXPECT_THAT(steps.set_aside, IsEmpty());
}

TEST_F(Plan, GoesOnWithWhatWasSetAside)
{
    want("a", "r", "a.txt", "1");
    want("f", "r", "folder");
    have("a", "r", "old", "1").set_aside = true;
    have("f", "r", "old folder").set_aside = true;
    have("g", "r", "gone").set_aside = true;
    placement &changed = have("c", "r", "c.txt", "1");
    changed.set_aside = true;
    changed.changed_here = true;

    const plan steps = made();

    EXPECT_THAT(steps.set_aside, IsEmpty());
    EXPECT_THAT(steps.moved, ElementsAre("a"));
    EXPECT_THAT(steps.folders, ElementsAre("f"));
    EXPECT_THAT(steps.left, ElementsAre("g"));
    EXPECT_THAT(steps.rescued, ElementsAre("c"));
}

TEST_F(Plan, RemovesNothingOfWhichNobodyKnows)
{
    want("f", "r", "folder");
    have("f", "r", "folder");
    have("g", "f", "inner");
    have("a", "g", "a.txt", "1");
    unknown = {"f"};

    EXPECT_TRUE(made().is_empty());
}

} // namespace quillmere_test
