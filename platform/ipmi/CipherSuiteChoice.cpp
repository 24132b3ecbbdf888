#include "CipherSuiteChoice.h"

#include "IpmiLog.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>

namespace QX::Ipmi
{

namespace
{

/** The suite a file remembers, when it holds one of the automatic ones. */
std::optional<std::uint8_t> remembered(const std::string& file)
{
    if (file.empty())
    {
        return std::nullopt;
    }
    std::ifstream in(file);
    unsigned suite = 0;
    if (!(in >> suite))
    {
        return std::nullopt;
    }
    const auto& order = CipherSuiteChoice::automaticOrder;
    if (std::find(std::begin(order), std::end(order), suite) == std::end(order))
    {
        return std::nullopt;
    }
    return static_cast<std::uint8_t>(suite);
}

} // namespace

CipherSuiteChoice CipherSuiteChoice::fixed(std::uint8_t suite)
{
    CipherSuiteChoice choice;
    choice.fixed_ = suite;
    return choice;
}

CipherSuiteChoice CipherSuiteChoice::automatic(std::string stateDirectory)
{
    CipherSuiteChoice choice;
    choice.automatic_ = true;
    choice.directory_ = std::move(stateDirectory);
    return choice;
}

void CipherSuiteChoice::rememberFor(const std::string& peerKey)
{
    if (!automatic_ || directory_.empty())
    {
        return;
    }
    file_ = directory_ + "/cipher-suite-" + peerKey;
    current_ = remembered(file_);
}

std::vector<std::uint8_t> CipherSuiteChoice::candidates() const
{
    if (fixed_)
    {
        return {*fixed_};
    }
    if (!automatic_)
    {
        return {};
    }
    std::vector<std::uint8_t> suites;
    if (current_)
    {
        suites.push_back(*current_);
    }
    for (const std::uint8_t suite : automaticOrder)
    {
        if (suite != current_)
        {
            suites.push_back(suite);
        }
    }
    return suites;
}

void CipherSuiteChoice::worked(std::uint8_t suite)
{
    const bool changed = current_ != suite;
    current_ = suite;
    if (!automatic_ || !changed || file_.empty())
    {
        return;
    }
    // Written aside and renamed, so a reader never sees half a file.
    std::error_code error;
    std::filesystem::create_directories(
        std::filesystem::path(file_).parent_path(), error);
    const std::string temporary = file_ + ".new";
    {
        std::ofstream out(temporary, std::ios::trunc);
        out << static_cast<unsigned>(suite) << "\n";
        if (!out)
        {
            logLine(logLevelFailure, "CipherSuiteChoice::worked", __LINE__,
                    "cannot write " + temporary +
                        ": the cipher suite is not remembered");
            return;
        }
    }
    std::filesystem::rename(temporary, file_, error);
    if (error)
    {
        logLine(logLevelFailure, "CipherSuiteChoice::worked", __LINE__,
                "cannot replace " + file_ + ": " + error.message());
        std::filesystem::remove(temporary, error);
    }
}

} // namespace QX::Ipmi
