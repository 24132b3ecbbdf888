#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace QX::Ipmi
{

/**
 * Replaces the file at @p path atomically: @p content goes to a new
 * temporary file (owner-only, 0600) in the same directory, is flushed to
 * the disk, renamed over the old file, and the directory is flushed too,
 * so a crash leaves the old file or the new one, never a mix. Creates the
 * directory when needed. Two processes writing the same file each use
 * their own temporary file; the last rename wins. Throws
 * std::runtime_error.
 */
void writeFileAtomically(const std::string& path, std::string_view content);

/**
 * Reads the file at @p path, at most @p limit bytes: nothing, with the
 * reason in @p problem, when it is missing, unreadable or longer.
 */
std::optional<std::string>
readSmallFile(const std::string& path, std::size_t limit, std::string& problem);

} // namespace QX::Ipmi
