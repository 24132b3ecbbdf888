#include "Text.h"

#include <memory>

namespace host
{

Text::Text(std::string_view text)
{
    if (text.size() <= inlineCapacity)
    {
        text.copy(bytes_.data(), text.size());
        setInlineSize(text.size());
        return;
    }
    const Heap record{std::allocator<char>().allocate(text.size() + 1),
                      text.size()};
    text.copy(record.chars, text.size());
    record.chars[text.size()] = '\0';
    std::memcpy(bytes_.data(), &record, sizeof record);
    bytes_[tagAt] = static_cast<char>(heapTag);
}

Text::Text(Text&& other) noexcept : bytes_(other.bytes_)
{
    other.setInlineSize(0);
}

Text& Text::operator=(const Text& other)
{
    if (this != &other)
    {
        *this = Text(other);
    }
    return *this;
}

Text& Text::operator=(Text&& other) noexcept
{
    if (this != &other)
    {
        freeHeap();
        bytes_ = other.bytes_;
        other.setInlineSize(0);
    }
    return *this;
}

Text::~Text()
{
    freeHeap();
}

void Text::freeHeap() noexcept
{
    if (onHeap())
    {
        const Heap record = heap();
        std::allocator<char>().deallocate(record.chars, record.size + 1);
    }
}

} // namespace host
