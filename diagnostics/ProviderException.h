#pragma once

#include <exception>
#include <string>

namespace QX
{

/** The provider's own exception: one text, reported through what(). */
class ProviderException : public std::exception
{
  public:
    explicit ProviderException(const char* text) :
        message(text != nullptr ? text : "")
    {
    }
    ProviderException(const ProviderException&) = default;
    ProviderException& operator=(const ProviderException&) = default;
    ~ProviderException() override = default;

    const char* what() const noexcept override
    {
        return message.c_str();
    }

  private:
    std::string message;
};

} // namespace QX
