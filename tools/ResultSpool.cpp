#include "ResultSpool.h"

#include "Printing.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>

namespace selprov
{

ResultSpool::ResultSpool(bool json) : json_(json), file_(std::tmpfile())
{
    handlers_.instance = [this](const host::Instance& instance)
    {
        if (json_)
        {
            keep(",\n ", selprov::jsonInstance(instance));
        }
        else
        {
            keep("\n", selprov::formatMof(instance));
        }
    };
    handlers_.path = [this](const host::ObjectPath& path)
    {
        if (json_)
        {
            keep(",\n ", selprov::jsonString(path.toString()));
        }
        else
        {
            keep("", path.toString() + "\n");
        }
    };
}

const host::ResultHandlers* ResultSpool::handlers() const
{
    return &handlers_;
}

void ResultSpool::keep(std::string_view separator, const std::string& text)
{
    if (results_++ > 0)
    {
        append(separator);
    }
    append(text);
}

void ResultSpool::append(std::string_view text)
{
    if (!file_)
    {
        memory_.append(text);
        return;
    }
    if (writeError_ == 0 &&
        std::fwrite(text.data(), 1, text.size(), file_.get()) != text.size())
    {
        writeError_ = errno != 0 ? errno : EIO;
    }
}

void ResultSpool::copyTo(std::ostream& out)
{
    if (!file_)
    {
        out << memory_;
        return;
    }
    std::FILE* file = file_.get();
    if (writeError_ == 0 && std::fflush(file) != 0)
    {
        writeError_ = errno != 0 ? errno : EIO;
    }
    if (writeError_ != 0)
    {
        throw std::runtime_error(std::string("cannot keep the results: ") +
                                 std::strerror(writeError_));
    }
    std::rewind(file);
    std::array<char, 65536> buffer{};
    std::size_t read = 0;
    while ((read = std::fread(buffer.data(), 1, buffer.size(), file)) > 0)
    {
        out.write(buffer.data(), static_cast<std::streamsize>(read));
    }
    if (std::ferror(file) != 0)
    {
        throw std::runtime_error("cannot read back the results");
    }
}

void ResultSpool::print(std::ostream& out)
{
    if (json_)
    {
        out << "[";
        copyTo(out);
        out << "]\n";
        return;
    }
    copyTo(out);
}

} // namespace selprov
