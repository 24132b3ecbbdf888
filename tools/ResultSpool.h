// Results of one selprov request, formatted as the provider returns them.
#pragma once

#include "Outcome.h"

#include <cstdio>
#include <memory>
#include <ostream>
#include <string>
#include <string_view>

namespace selprov
{

/**
 * Formats each instance or object path as it arrives (MOF-like text or
 * JSON) and writes its text to an unnamed temporary file, to be printed
 * once the request has succeeded. A large enumeration is thus never held
 * as instances and as text at the same time, the text does not grow the
 * process at all, and nothing is printed for a failed request. Without a
 * temporary file (no writable temporary directory) the text is kept in
 * memory instead.
 */
class ResultSpool
{
  public:
    explicit ResultSpool(bool json);
    ResultSpool(const ResultSpool&) = delete;
    ResultSpool& operator=(const ResultSpool&) = delete;
    ~ResultSpool() = default;

    // Handlers for the host's request; valid while the spool lives.
    const host::ResultHandlers* handlers() const;
    // Instances separated by a blank line, paths one a line, or either as
    // one JSON array. Throws std::runtime_error when the text could not be
    // written to the temporary file or read back (a full disk).
    void print(std::ostream& out);

  private:
    struct FileCloser
    {
        void operator()(std::FILE* file) const
        {
            std::fclose(file);
        }
    };

    // Appends @p text, after @p separator unless it is the first result.
    void keep(std::string_view separator, const std::string& text);
    void append(std::string_view text);
    void copyTo(std::ostream& out);

    bool json_;
    std::size_t results_ = 0;
    std::unique_ptr<std::FILE, FileCloser> file_;
    std::string memory_; // used when there is no file
    int writeError_ = 0; // errno of the first failed write
    host::ResultHandlers handlers_;
};

} // namespace selprov
