#pragma once

// Sets or clears environment variables for one test and restores them.

#include <cstdlib>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace QX::test
{

class EnvironmentGuard
{
  public:
    EnvironmentGuard() = default;
    EnvironmentGuard(const EnvironmentGuard&) = delete;
    EnvironmentGuard& operator=(const EnvironmentGuard&) = delete;

    ~EnvironmentGuard()
    {
        for (auto it = saved_.rbegin(); it != saved_.rend(); ++it)
        {
            if (it->second)
            {
                setenv(it->first.c_str(), it->second->c_str(), 1);
            }
            else
            {
                unsetenv(it->first.c_str());
            }
        }
    }

    void set(const std::string& name, const std::string& value)
    {
        save(name);
        setenv(name.c_str(), value.c_str(), 1);
    }

    void unset(const std::string& name)
    {
        save(name);
        unsetenv(name.c_str());
    }

  private:
    void save(const std::string& name)
    {
        const char* value = std::getenv(name.c_str());
        saved_.emplace_back(name, value ? std::optional<std::string>(value)
                                        : std::nullopt);
    }

    std::vector<std::pair<std::string, std::optional<std::string>>> saved_;
};

} // namespace QX::test
