#pragma once

#include <string>

namespace testsupport
{

/** What a command line did: its standard output and how it ended. */
struct CommandRun
{
    /** Whether the shell could be started at all. */
    bool started = false;
    /** The exit status; -1 when it did not start or did not exit normally
     *  (killed by a signal). */
    int exitCode = -1;
    std::string output;
};

/**
 * Runs @p commandLine through the shell, as a user would type it, and
 * reads its standard output to the end. Redirections, environment
 * settings and a time limit (`timeout N ...`) are the caller's, written
 * into the command line.
 */
CommandRun runCommand(const std::string& commandLine);

} // namespace testsupport
