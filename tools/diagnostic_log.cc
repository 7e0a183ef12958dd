#include "diagnostic_log.h"

#include <cerrno>

#include <fcntl.h>
#include <sys/stat.h>

#include "failure.h"

namespace quillmere::tools {

namespace {

descriptor open_log_file(const std::string &path)
{
    const int flags = O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC | O_NOCTTY;
    descriptor file(::open(path.c_str(), flags, 0600));
    if (!file)
        throw file_failure("cannot open the log file " + path, errno);
    // One that stood there before may have been open to others. Names of files are in the log even
    // when tokens are not.
    struct stat facts = {};
    if (::fstat(file.number(), &facts) == 0 && S_ISREG(facts.st_mode) &&
        ::fchmod(file.number(), 0600) != 0)
        throw file_failure("cannot protect the log file " + path, errno);
    return file;
}

extern "C" {
static ssize_t write_to_log(void *log, const char *bytes, size_t count)
{
    try {
        static_cast<diagnostic_log *>(log)->take(std::string_view(bytes, count));
    } catch (...) {
        // Nothing may be thrown through the C library; a log that lacks a piece is better.
    }
    return static_cast<ssize_t>(count);
}
}

} // namespace

diagnostic_log::diagnostic_log(bool verbose, const std::string &file) : verbose_(verbose)
{
    if (!file.empty())
        file_ = open_log_file(file);
    cookie_io_functions_t functions = {};
    functions.write = write_to_log;
    stream_ = ::fopencookie(this, "w", functions);
    if (stream_ == nullptr)
        throw file_failure("cannot open the log", errno);
    former_stdout_ = stdout;
    stdout = stream_;
}

diagnostic_log::~diagnostic_log()
{
    stdout = former_stdout_;
    std::fclose(stream_);
}

void diagnostic_log::take(std::string_view piece)
{
    watch_.feed(piece);
    std::string passed;
    filter_.feed(piece, passed);
    if (verbose_)
        write_all(STDERR_FILENO, passed);
    if (file_)
        write_all(file_.number(), passed);
}

} // namespace quillmere::tools
