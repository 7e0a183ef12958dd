// quillmere-emulator: the web service on this machine alone, to develop and test against.
#include <csignal>

#include <sys/stat.h>

#include "command_line.h"

int main(int argc, char **argv)
{
    ::umask(077);               // the store holds keys and digests of passwords
    ::signal(SIGPIPE, SIG_IGN); // a reader of standard output that leaves is no reason to die
    return emulator::run_command_line(argc, argv);
}
