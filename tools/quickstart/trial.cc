#include "trial.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

#include <fcntl.h>
#include <openssl/rand.h>
#include <unistd.h>

#include "../color.h"
#include "../failure.h"
#include "../private_file.h"
#include "../text.h"
#include "../transfers/sha256.h"

namespace quillmere::tools {

namespace {

namespace fs = std::filesystem;

constexpr std::string_view work_word = "$work";
constexpr const char *emulator_name = "quillmere-emulator";
constexpr const char *content = "Hello from quillmere";

/** What would lead the command line elsewhere than to the trial. */
constexpr const char *variables_in_the_way[] = {"QUILLMERE_SERVICE",      "QUILLMERE_PROFILE",
                                                "QUILLMERE_SESSION_FILE", "QUILLMERE_APP_ID",
                                                "QUILLMERE_APP_KEY",      "SSL_CERT_FILE"};

std::string new_password()
{
    unsigned char bytes[16];
    if (RAND_bytes(bytes, sizeof bytes) != 1)
        throw failure(exit_code::other, "there is no randomness for a password");
    return hex_of({reinterpret_cast<const char *>(bytes), sizeof bytes});
}

bool is_program(const std::string &path)
{
    return fs::is_regular_file(path) && ::access(path.c_str(), X_OK) == 0;
}

std::string digest_of(const std::string &path)
{
    sha256_sum sum;
    sum.add(read_small_file(path, "the file"));
    return hex_of(sum.finish());
}

std::string own_program()
{
    std::error_code problem;
    const fs::path path = fs::read_symlink("/proc/self/exe", problem);
    if (problem)
        throw file_failure("cannot tell where this program is", problem.value());
    return path.string();
}

} // namespace

scratch_folder::scratch_folder(const environment &surroundings)
    : path_(surroundings.value("TMPDIR").value_or("/tmp") + "/quillmere-quickstart.XXXXXX")
{
    if (::mkdtemp(path_.data()) == nullptr)
        throw file_failure("cannot make the folder " + path_, errno,
                           "name a folder that can be written in TMPDIR");
}

scratch_folder::~scratch_folder()
{
    std::error_code ignored;
    fs::remove_all(path_, ignored);
}

std::string find_emulator(const environment &surroundings, const std::string &own_program)
{
    const std::string folder = fs::path(own_program).parent_path().string();
    std::vector<std::string> folders = {folder, folder + "/../emulator"};
    std::string_view path;
    const std::string all = surroundings.value("PATH").value_or("");
    for (path = all; !path.empty();) {
        const std::size_t end = std::min(path.find(':'), path.size());
        if (path.substr(0, 1) == "/") // the working folder is nobody's choice
            folders.emplace_back(path.substr(0, end));
        path.remove_prefix(std::min(end + 1, path.size()));
    }
    for (const std::string &each : folders)
        if (const std::string program = each + "/" + emulator_name; is_program(program))
            return program;
    throw failure(exit_code::local_file, std::string(emulator_name) + " is not on this machine",
                  "install it, beside quillmere or in a folder of PATH");
}

trial::trial(command_context &context)
    : output_(context.output), surroundings_(context.surroundings), own_program_(own_program()),
      emulator_program_(find_emulator(surroundings_, own_program_)), work_(surroundings_)
{
}

void trial::run()
{
    const auto begun = std::chrono::steady_clock::now();
    say("work=$(mktemp -d)");
    make_account();
    start_service();
    use_service();
    exchange_file();
    compare();
    put_away();
    tell(std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() -
                                                               begun));
}

void trial::make_account()
{
    say("openssl rand -hex 16 >$work/password");
    write_private_file(in_work("$work/password"), new_password() + "\n", "the password's file");
    run(emulator_name, {"add-account", "--data", "$work/service", "--email", "ada@example.com",
                        "--password-file", "$work/password"});
}

void trial::start_service()
{
    say(std::string(emulator_name) + " --data $work/service --ready-file $work/ready.json &");
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0)
        throw file_failure("cannot make a pipe", errno);
    const descriptor ready(ends[0]);
    descriptor told(ends[1]);
    helper_command service =
        command_of(emulator_program_, {"--data", "$work/service", "--port", "0", "--http-port", "0",
                                       "--ready-file", "$work/ready.json", "--ready-fd", "3"});
    service.output = "/dev/null";
    service.messages = in_work("$work/service.log");
    service.kept_descriptor = told.number();
    service_ = std::make_unique<helper>(service, signals_);
    told = descriptor(); // so that the pipe ends with the service

    signals_.wait_for(ready.number());
    char letter = 0;
    if (::read(ready.number(), &letter, 1) != 1)
        throw failure(exit_code::other,
                      "the emulator did not start: " +
                          std::string(trimmed(read_small_file(service.messages, "its messages"))),
                      "try it by itself: " + emulator_program_);
}

void trial::use_service()
{
    std::string in_the_way;
    for (const char *name : variables_in_the_way)
        if (surroundings_.value(name))
            in_the_way += std::string(" ") + name;
    if (!in_the_way.empty())
        say("unset" + in_the_way);
    say("export QUILLMERE_EMULATOR=$work/ready.json XDG_CONFIG_HOME=$work XDG_STATE_HOME=$work");
    run("quillmere", {"login", "ada@example.com", "--password-file", "$work/password"});
}

void trial::exchange_file()
{
    say(std::string("echo '") + content + "' >$work/hello.txt");
    write_private_file(in_work("$work/hello.txt"), std::string(content) + "\n", "the file");
    run("quillmere", {"mkdir", "/letters"});
    run("quillmere", {"put", "--quiet", "$work/hello.txt", "/letters"});
    run("quillmere", {"ls", "-l", "/letters"});
    run("quillmere", {"get", "--quiet", "/letters/hello.txt", "$work/back.txt"});
}

void trial::compare()
{
    say("sha256sum $work/hello.txt $work/back.txt");
    digest_ = digest_of(in_work("$work/hello.txt"));
    const std::string returned = digest_of(in_work("$work/back.txt"));
    print(digest_ + "  $work/hello.txt\n" + returned + "  $work/back.txt\n");
    if (returned != digest_)
        throw failure(exit_code::unreadable_answer,
                      "what came back is not what was sent: SHA-256 " + returned + " instead of " +
                          digest_);
}

void trial::put_away()
{
    say("kill $!; wait; rm -r $work");
    service_.reset();
}

void trial::say(const std::string &command)
{
    said_.push_back(command);
    const bool colored = output_.style() == text_style::colored;
    print((colored ? painted("$ " + command, paint::heading) : "$ " + command) + "\n");
}

void trial::print(const std::string &text)
{
    if (output_.format() == result_format::text)
        output_.write(text);
}

/** A word as it is said, with the folder that it means. */
std::string trial::in_work(const std::string &word) const
{
    if (!starts_with(word, work_word))
        return word;
    return work_.path() + word.substr(work_word.size());
}

helper_command trial::command_of(const std::string &program,
                                 const std::vector<std::string> &words) const
{
    helper_command what;
    what.program = program;
    for (const std::string &each : words)
        what.arguments.push_back(in_work(each));
    what.output = in_work("$work/output");
    for (const char *name : variables_in_the_way)
        what.environment[name] = std::nullopt;
    what.environment["QUILLMERE_EMULATOR"] = in_work("$work/ready.json");
    what.environment["XDG_CONFIG_HOME"] = work_.path();
    what.environment["XDG_STATE_HOME"] = work_.path();
    return what;
}

void trial::run(const std::string &name, const std::vector<std::string> &words)
{
    std::string line = name;
    for (const std::string &each : words)
        line += " " + each;
    say(line);
    const helper_command what =
        command_of(name == emulator_name ? emulator_program_ : own_program_, words);
    const int status = helper(what, signals_).wait();
    std::string shown = read_small_file(what.output, "what was printed");
    for (std::size_t at = 0; (at = shown.find(work_.path(), at)) != std::string::npos;)
        shown.replace(at, work_.path().size(), work_word);
    print(shown);
    if (status != 0)
        throw failure(exit_code::other,
                      name + " " + words.front() + " ended with exit code " +
                          std::to_string(status),
                      "what it said stands above");
}

void trial::tell(std::chrono::milliseconds time)
{
    const double seconds = static_cast<double>(time.count()) / 1000;
    char text[64];
    std::snprintf(text, sizeof text, "%.1f", seconds);
    output_.sentence("The file came back whole, and nothing is left behind, after " +
                         std::string(text) + " s",
                     {{"commands", nullptr, said_},
                      {"sha256", nullptr, digest_},
                      {"seconds", nullptr, seconds}});
}

} // namespace quillmere::tools
