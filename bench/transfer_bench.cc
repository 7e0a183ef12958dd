// Moving a large file to the local service and back, by the command line and by curl:
//
//   transfer_bench [MEBIBYTES]       1024 unless given
//
// Both move the same bytes to and from the same service in one run, in turns. Shown are the rates,
// their ratio, and the most memory that each process took. The command line makes a digest, before
// it sends the file and while it receives it; curl does not, and what making one costs is shown
// too.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include <csignal>
#include <fcntl.h>
#include <nlohmann/json.hpp>
#include <openssl/evp.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;
using words = std::vector<std::string>;

constexpr int rounds = 3;
constexpr const char *email = "bench@example.org";

/** What one run of a program took. */
struct cost {
    double seconds = 0;
    long peak_kibibytes = 0;
};

pid_t start(const words &command, const std::string &output = "/dev/null")
{
    std::vector<char *> pointers;
    for (const std::string &word : command)
        pointers.push_back(const_cast<char *>(word.c_str()));
    pointers.push_back(nullptr);
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    posix_spawn_file_actions_addopen(&files, STDOUT_FILENO, output.c_str(),
                                     O_WRONLY | O_CREAT | O_TRUNC, 0600);
    pid_t id = -1;
    const int problem = posix_spawnp(&id, pointers[0], &files, nullptr, pointers.data(), environ);
    posix_spawn_file_actions_destroy(&files);
    if (problem != 0)
        throw std::runtime_error("cannot start " + command.front());
    return id;
}

cost run(const words &command, const std::string &output = "/dev/null")
{
    const auto begun = std::chrono::steady_clock::now();
    const pid_t id = start(command, output);
    int status = 0;
    rusage usage = {};
    ::wait4(id, &status, 0, &usage);
    const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - begun;
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0)
        throw std::runtime_error(command.front() + " failed");
    return {taken.count(), usage.ru_maxrss};
}

std::string text_in(const std::string &path)
{
    std::ifstream file(path);
    return {std::istreambuf_iterator<char>(file), {}};
}

/** A folder that is gone in the end. */
class scratch {
public:
    scratch()
    {
        std::string name = (fs::temp_directory_path() / "transfer_bench-XXXXXX").string();
        if (::mkdtemp(name.data()) == nullptr)
            throw std::runtime_error("no scratch folder");
        path_ = name;
    }
    ~scratch() { fs::remove_all(path_); }
    scratch(const scratch &) = delete;
    scratch &operator=(const scratch &) = delete;

    std::string path_of(const std::string &name) const { return path_ + "/" + name; }

private:
    std::string path_;
};

/** The local service, with an account that the command line is signed in to. */
class emulator {
public:
    explicit emulator(const scratch &in) : data_(in.path_of("data"))
    {
        const std::string password = in.path_of("password");
        std::ofstream(password) << "a password\n";
        run({QUILLMERE_EMULATOR, "add-account", "--data", data_, "--email", email,
             "--password-file", password});
        const std::string pipe = in.path_of("ready");
        if (::mkfifo(pipe.c_str(), 0600) != 0)
            throw std::runtime_error("no pipe");
        const std::string ready = in.path_of("ready.json");
        id_ = start({"sh", "-c",
                     "exec \"$0\" --data \"$1\" --ready-file \"$2\" --ready-fd 3 3>\"$3\"",
                     QUILLMERE_EMULATOR, data_, ready, pipe});
        facts_ = nlohmann::json::parse(text_in(pipe)); // which ends when the service listens
        ::setenv("QUILLMERE_EMULATOR", ready.c_str(), 1);
        ::setenv("XDG_STATE_HOME", in.path_of("state").c_str(), 1);
        ::unsetenv("SSL_CERT_FILE");
        run({QUILLMERE_PROGRAM, "login", email, "--password-file", password});
        token_ = nlohmann::json::parse(text_in(in.path_of("state/quillmere/session.json")))
                     .at("session_token");
    }
    ~emulator()
    {
        ::kill(id_, SIGTERM);
        ::waitpid(id_, nullptr, 0);
    }
    emulator(const emulator &) = delete;
    emulator &operator=(const emulator &) = delete;

    std::string upload_url() const
    {
        return facts_.at("http_url").get<std::string>() +
               "/api/upload/upload.php?type=desktop&session_token=" + token_;
    }
    std::string root() const { return facts_.at("ca_file"); }

    long peak_kibibytes() const
    {
        std::ifstream status("/proc/" + std::to_string(id_) + "/status");
        for (std::string word; status >> word;)
            if (word == "VmHWM:" && status >> word)
                return std::stol(word);
        return 0;
    }

private:
    std::string data_;
    pid_t id_ = -1;
    nlohmann::json facts_;
    std::string token_;
};

void fill(const std::string &path, std::size_t mebibytes)
{
    std::mt19937_64 generator(1);
    std::vector<std::uint64_t> piece((1 << 20) / sizeof(std::uint64_t));
    std::ofstream file(path, std::ios::binary);
    for (std::size_t count = 0; count < mebibytes; ++count) {
        std::generate(piece.begin(), piece.end(), std::ref(generator));
        file.write(reinterpret_cast<const char *>(piece.data()), 1 << 20);
    }
}

/** The SHA-256 of a file as a header field has it. */
std::string digest_of(const std::string &path)
{
    const std::unique_ptr<EVP_MD_CTX, void (*)(EVP_MD_CTX *)> sum(EVP_MD_CTX_new(),
                                                                  EVP_MD_CTX_free);
    EVP_DigestInit_ex(sum.get(), EVP_sha256(), nullptr);
    std::ifstream file(path, std::ios::binary);
    std::vector<char> piece(256 * 1024);
    while (file.read(piece.data(), static_cast<std::streamsize>(piece.size())), file.gcount() > 0)
        EVP_DigestUpdate(sum.get(), piece.data(), static_cast<std::size_t>(file.gcount()));
    unsigned char digest[32];
    EVP_DigestFinal_ex(sum.get(), digest, nullptr);
    unsigned char text[45];
    EVP_EncodeBlock(text, digest, sizeof digest);
    return "sha-256=:" + std::string(reinterpret_cast<const char *>(text)) + ":";
}

cost median(std::vector<cost> all)
{
    long peak = 0;
    for (const cost &each : all)
        peak = std::max(peak, each.peak_kibibytes);
    std::sort(all.begin(), all.end(),
              [](const cost &one, const cost &other) { return one.seconds < other.seconds; });
    return {all[all.size() / 2].seconds, peak};
}

void show(const char *what, const cost &taken, std::size_t mebibytes)
{
    std::printf("%-24s %7.2f s  %7.0f MiB/s  at most %5.1f MiB resident\n", what, taken.seconds,
                static_cast<double>(mebibytes) / taken.seconds,
                static_cast<double>(taken.peak_kibibytes) / 1024);
}

void show_ratio(const char *what, const cost &ours, const cost &curl, double digest_seconds)
{
    std::printf("%s has %.2f of curl's rate, %.2f if making the digest counts for curl, too\n",
                what, curl.seconds / ours.seconds, (curl.seconds + digest_seconds) / ours.seconds);
}

double timed_digest(const std::string &file, std::string &digest)
{
    const auto begun = std::chrono::steady_clock::now();
    digest = digest_of(file);
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - begun).count();
}

void measure(std::size_t mebibytes)
{
    const scratch work;
    const emulator service(work);
    const std::string source = work.path_of("source");
    const std::string target = work.path_of("target");
    fill(source, mebibytes);
    std::string digest;
    digest_of(source); // so that all find the file in memory
    const double digest_seconds = timed_digest(source, digest);

    std::map<std::string, std::vector<cost>> costs;
    for (int round = 0; round < rounds; ++round) {
        const std::string number = std::to_string(round);
        costs["put"].push_back(run({QUILLMERE_PROGRAM, "put", "-q", source, "/put" + number}));
        costs["curl up"].push_back(run(
            {"curl", "-sSf", "-X", "POST", "-T", source, "-H", "Content-Digest: " + digest, "-H",
             "Content-Disposition: attachment; filename=curl" + number, service.upload_url()}));
        costs["get"].push_back(run({QUILLMERE_PROGRAM, "get", "-q", "/put" + number, target}));
        fs::remove(target);
        const std::string link = work.path_of("link");
        run({QUILLMERE_PROGRAM, "links", "--download", "/put" + number}, link);
        std::string url = text_in(link);
        url.pop_back(); // the line end
        costs["curl down"].push_back(
            run({"curl", "-sSf", "--cacert", service.root(), "-o", target, url}));
        fs::remove(target);
    }

    const cost put = median(costs["put"]);
    const cost get = median(costs["get"]);
    const cost up = median(costs["curl up"]);
    const cost down = median(costs["curl down"]);
    show("quillmere put", put, mebibytes);
    show("curl, upload", up, mebibytes);
    show("quillmere get", get, mebibytes);
    show("curl, download", down, mebibytes);
    std::printf("the digest alone         %7.2f s\n", digest_seconds);
    std::printf("the service itself       at most %5.1f MiB resident\n",
                static_cast<double>(service.peak_kibibytes()) / 1024);
    show_ratio("put", put, up, digest_seconds);
    show_ratio("get", get, down, digest_seconds);
}

} // namespace

int main(int count, char **given)
{
    try {
        measure(count > 1 ? std::stoul(given[1]) : 1024);
        return 0;
    } catch (const std::exception &problem) {
        std::fprintf(stderr, "transfer_bench: %s\n", problem.what());
        return 1;
    }
}
