#include "process.h"

#include <csignal>
#include <stdexcept>
#include <utility>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include "digest.h"
#include "files.h"
#include "scratch_directory.h"
#include "socket_client.h"

extern char **environ;

namespace {

constexpr int ready_descriptor = 3;

/** The descriptors that a child gets, each from the path or number given. */
class file_actions {
public:
    file_actions() { ::posix_spawn_file_actions_init(&actions_); }
    ~file_actions() { ::posix_spawn_file_actions_destroy(&actions_); }
    file_actions(const file_actions &) = delete;
    file_actions &operator=(const file_actions &) = delete;

    void open(int as, const std::string &path, int flags)
    {
        ::posix_spawn_file_actions_addopen(&actions_, as, path.c_str(), flags, 0600);
    }
    void give(int as, int number) { ::posix_spawn_file_actions_adddup2(&actions_, number, as); }
    const posix_spawn_file_actions_t *get() const { return &actions_; }

private:
    posix_spawn_file_actions_t actions_;
};

pid_t spawn(std::vector<std::string> arguments, const file_actions &files)
{
    arguments.insert(arguments.begin(), QUILLMERE_EMULATOR_PROGRAM);
    std::vector<char *> pointers;
    for (std::string &argument : arguments)
        pointers.push_back(argument.data());
    pointers.push_back(nullptr);
    pid_t id = -1;
    if (::posix_spawn(&id, pointers[0], files.get(), nullptr, pointers.data(), environ) != 0)
        throw std::runtime_error("posix_spawn");
    return id;
}

int wait_for(pid_t id)
{
    int status = 0;
    if (::waitpid(id, &status, 0) != id)
        throw std::runtime_error("waitpid");
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

} // namespace

server_process::server_process(const std::filesystem::path &data,
                               const std::vector<std::string> &options)
{
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0)
        throw std::runtime_error("pipe2");
    const emulator::descriptor reading(ends[0]);
    {
        // A number above the child's own: a copy onto itself would stay closed on exec.
        const emulator::descriptor first(ends[1]);
        const emulator::descriptor writing(::fcntl(ends[1], F_DUPFD_CLOEXEC, 10));
        file_actions files;
        files.open(STDOUT_FILENO, "/dev/null", O_WRONLY);
        files.give(ready_descriptor, writing.number());
        std::vector<std::string> arguments{"--data", data.string(), "--ready-fd",
                                           std::to_string(ready_descriptor)};
        arguments.insert(arguments.end(), options.begin(), options.end());
        id_ = spawn(std::move(arguments), files);
    }
    ready_line_ = emulator::read_descriptor(reading.number(), 65536);
    if (ready_line_.empty())
        throw std::runtime_error("the server ended with " +
                                 std::to_string(wait_for(std::exchange(id_, -1))));
}

server_process::~server_process()
{
    if (id_ > 0)
        stop(SIGKILL);
}

std::filesystem::path server_process::root() const
{
    const std::string key = "\"ca_file\": \"";
    const std::size_t begin = ready_line_.find(key) + key.size();
    return ready_line_.substr(begin, ready_line_.find('"', begin) - begin);
}

int server_process::stop(int signal)
{
    if (id_ <= 0) // a kill of -1 would reach every process there is
        throw std::logic_error("the server has ended already");
    ::kill(id_, signal);
    return wait_for(std::exchange(id_, -1));
}

std::uint16_t server_process::port_after(const std::string &key) const
{
    const std::size_t at = ready_line_.find(key);
    return static_cast<std::uint16_t>(std::stoul(ready_line_.substr(at + key.size())));
}

fed_process::fed_process(const std::vector<std::string> &arguments)
{
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0)
        throw std::runtime_error("pipe2");
    const emulator::descriptor reading(ends[0]);
    writing_ = std::make_unique<emulator::descriptor>(ends[1]);
    file_actions files;
    files.give(STDIN_FILENO, reading.number());
    files.open(STDOUT_FILENO, "/dev/null", O_WRONLY);
    id_ = spawn(arguments, files);
}

fed_process::~fed_process()
{
    if (id_ > 0)
        kill();
}

void fed_process::feed(const std::string &bytes) { emulator::write_all(writing_->number(), bytes); }

void fed_process::kill()
{
    if (id_ <= 0)
        throw std::logic_error("the process has ended already");
    ::kill(id_, SIGKILL);
    wait_for(std::exchange(id_, -1));
}

finished_process run_program(const std::vector<std::string> &arguments, const std::string &input)
{
    const scratch_directory scratch;
    const std::filesystem::path in = scratch.path() / "in";
    const std::filesystem::path out = scratch.path() / "out";
    const std::filesystem::path err = scratch.path() / "err";
    emulator::write_file(in, input, 0600);
    file_actions files;
    files.open(STDIN_FILENO, in, O_RDONLY);
    files.open(STDOUT_FILENO, out, O_WRONLY | O_CREAT);
    files.open(STDERR_FILENO, err, O_WRONLY | O_CREAT);
    const int exit_code = wait_for(spawn(arguments, files));
    return {exit_code, emulator::read_file(out, 1 << 20), emulator::read_file(err, 1 << 20)};
}

void add_ann(const std::string &data, const std::vector<std::string> &options)
{
    std::vector<std::string> arguments = {"add-account",     "--data",          data, "--email",
                                          "ann@example.org", "--password-file", "-"};
    arguments.insert(arguments.end(), options.begin(), options.end());
    const finished_process done = run_program(arguments, "secret\n");
    if (done.exit_code != 0)
        throw std::runtime_error(done.errors);
}

std::string log_in(std::uint16_t port)
{
    const std::string signature =
        emulator::sha1_hex("ann@example.orgsecret42quillmere-development-key");
    return element(get(port, "/api/user/get_session_token.php?application_id=42"
                             "&email=ann%40example.org&password=secret&signature=" +
                                 signature + "&version=2"),
                   "session_token");
}
