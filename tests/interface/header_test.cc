// The header against the library: what is declared is exported, and the other way round; and
// against itself: what is declared is documented.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "interface/header_reader.h"
#include "support/process.h"
#include "support/temporary_folder.h"

namespace quillmere_test {
namespace {

using names = std::set<std::string>;

std::vector<declaration> declarations_of_the_header()
{
    return exported_declarations(content_of(QUILLMERE_HEADER));
}

names declared_names()
{
    names declared;
    for (const declaration &each : declarations_of_the_header())
        declared.insert(each.name);
    return declared;
}

// What a build with instruments adds to every library is none of ours.
bool is_instrument(const std::string &name)
{
    for (const char *start : {"__asan", "__odr_asan", "__ubsan", "__tsan", "__gcov", "__llvm"})
        if (name.compare(0, std::string(start).size(), start) == 0)
            return true;
    return false;
}

names exported_names(const std::string &library)
{
    command list;
    list.program = "nm";
    list.arguments = {"-D", "--defined-only", "--format=posix", library};
    std::istringstream lines(run(list).out);
    names exported;
    for (std::string line; std::getline(lines, line);)
        if (!is_instrument(line))
            exported.insert(line.substr(0, line.find(' ')));
    return exported;
}

TEST(Library, ExportsExactlyWhatTheHeaderDeclares)
{
    names declared = declared_names();
    names exported = exported_names(QUILLMERE_LIBRARY);

    ASSERT_GT(declared.size(), 200u);
    EXPECT_THAT(exported, testing::ContainerEq(declared));
}

TEST(Library, ExportsNoCppSymbol)
{
    for (const std::string &name : exported_names(QUILLMERE_LIBRARY))
        EXPECT_NE(name.compare(0, 2, "_Z"), 0) << name;
}

TEST(Library, IsNamedAfterItsMajorVersion)
{
    command read;
    read.program = "readelf";
    read.arguments = {"--dynamic", QUILLMERE_LIBRARY};

    std::string out = run(read).out;

    EXPECT_THAT(out, testing::HasSubstr("Library soname: [libquillmere.so." QUILLMERE_MAJOR "]"));
}

TEST(Header, DeclaresEveryNameOnce)
{
    std::map<std::string, int> count;
    for (const declaration &each : declarations_of_the_header())
        ++count[each.name];

    for (const auto &[name, times] : count)
        EXPECT_EQ(times, 1) << name;
}

TEST(Header, DocumentsEveryDeclaration)
{
    for (const declaration &each : declarations_of_the_header())
        EXPECT_NE(each.comment, "") << each.text;
}

// Whether any declaration under this comment has a parameter of this name.
bool is_parameter(const std::string &name, const std::string &comment)
{
    for (const declaration &each : declarations_of_the_header())
        if (each.comment == comment &&
            testing::Matches(testing::ContainsRegex("[ *]" + name + "[,)]"))(each.text))
            return true;
    return false;
}

TEST(Header, DocumentsNoParameterThatDoesNotExist)
{
    std::set<std::string> comments;
    for (const declaration &each : declarations_of_the_header())
        comments.insert(each.comment);

    for (const std::string &comment : comments)
        for (const std::string &name : documented_parameters(comment))
            EXPECT_TRUE(is_parameter(name, comment)) << name << " in\n" << comment;
}

// The reader itself, so that the tests above are known to see what is missing.

std::vector<std::pair<std::string, std::string>> read(const std::string &header)
{
    std::vector<std::pair<std::string, std::string>> result;
    for (const declaration &each : exported_declarations(header))
        result.emplace_back(each.name, each.comment);
    return result;
}

using testing::ElementsAre;
using testing::Pair;

TEST(HeaderReader, FindsFunctionsAndVariables)
{
    EXPECT_THAT(
        read("/** a */\nQM_API const char *f(const char *x, int y) QM_PRINTF_LIKE(1, 2);\n"
             "\n/** b */\nextern QM_API const char *v;\n"
             "\n/** c */\nextern QM_API const char *list[4];\n"),
        ElementsAre(Pair("f", "/** a */"), Pair("v", "/** b */"), Pair("list", "/** c */")));
}

TEST(HeaderReader, MissesACommentThatIsNotThere)
{
    EXPECT_THAT(read("/** a */\nQM_API void f(void);\n\nQM_API void g(void);\n"),
                ElementsAre(Pair("f", "/** a */"), Pair("g", "")));
    EXPECT_THAT(read("/* no documentation */\nQM_API void f(void);\n"), ElementsAre(Pair("f", "")));
}

TEST(HeaderReader, KnowsAFamily)
{
    EXPECT_THAT(read("/** a */\nQM_API void f(void);\nQM_API void g(int x,\n    int y);\n"),
                ElementsAre(Pair("f", "/** a */"), Pair("g", "/** a */")));
    EXPECT_THAT(
        read("/** a */\ntypedef struct r r;\n\nQM_API r *r_new(void);\nQM_API void "
             "r_delete(r **x);\n\nQM_API void other(void);\n"),
        ElementsAre(Pair("r_new", "/** a */"), Pair("r_delete", "/** a */"), Pair("other", "")));
}

TEST(HeaderReader, KnowsACommentBehindADeclaration)
{
    EXPECT_THAT(read("extern QM_API int a; /**< first */\nextern QM_API int b;\n"),
                ElementsAre(Pair("a", "/**< first */"), Pair("b", "")));
}

TEST(HeaderReader, IsNotConfusedByWhatIsNotExported)
{
    EXPECT_THAT(read("#define QM_API x \\\n    y\n#ifdef __cplusplus\nextern \"C\" {\n#endif\n"
                     "/** s */\ntypedef struct s {\n    int a; /**< a */\n} s;\n\nQM_API void f(s "
                     "*x);\n#ifdef __cplusplus\n}\n#endif\n"),
                ElementsAre(Pair("f", "")));
}

TEST(HeaderReader, FindsTheDocumentedParameters)
{
    EXPECT_THAT(documented_parameters("/**\n * @param one   first\n * @param two_2 second\n */"),
                ElementsAre("one", "two_2"));
}

} // namespace
} // namespace quillmere_test
