#pragma once

#include <string>

namespace QX
{

/**
 * @brief Name of the local computer system (the host name).
 *
 * Asks the system each time, unless a SystemNameScope is open on the
 * calling thread (see there).
 */
std::string getSystemName();

/**
 * @brief Lets one request name this system once.
 *
 * Reading the host name is a system call, and a request that builds an
 * instance per log entry names the system once per entry. While an object
 * of this type lives, getSystemName on the same thread answers every call
 * with the name it read at the first one. A host name that changes during
 * the scope is seen by the next scope; to the request this is the same as a
 * change just after it ended. Scopes nest: the outermost one decides. A
 * scope belongs to the thread that made it and must end on that thread.
 */
class SystemNameScope
{
  public:
    SystemNameScope();
    ~SystemNameScope();

    SystemNameScope(const SystemNameScope&) = delete;
    SystemNameScope& operator=(const SystemNameScope&) = delete;
};

/** @p text without leading and trailing blanks (space, tab, CR, LF, VT, FF)
 *  and cut at its first NUL character. */
std::string stripSpaces(std::string text);

/** Equality of two names, ignoring ASCII letter case, as CIM compares
 *  class and property names. Null pointers equal only each other. */
bool textEqual(const char* left, const char* right);

} // namespace QX
