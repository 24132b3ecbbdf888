// An immutable string for the names and texts the broker keeps per value.
#pragma once

#include <array>
#include <cstddef>
#include <cstring>
#include <ostream>
#include <string>
#include <string_view>

namespace host
{

// Holds up to 30 characters inside its 32 bytes and longer texts in one
// heap block of their own. Property names, class names and CIM datetimes
// (25 characters) are mostly longer than the 15 characters std::string
// keeps inline, and a large request keeps tens of them for every instance
// it returns: each would be a heap block of its own, made and later freed
// one by one, where a Text is part of the value or list that holds it.
//
// Measured with std::string in its place (bench/scaling.sh and
// bench/selprov-rss.sh, release build): the names of 65,535 log entries took
// 6.15 instead of 4.65 us per entry in the host, 1.26 times the time per
// entry at 4,096 entries (1.19 with Text), and selprov peaked at 244 MB
// and 0.95 s of CPU instead of 221 MB and 0.85 s: at the edge of the
// large-log goals of 1.25, 250 MB and 1 s.
class Text
{
  public:
    static constexpr std::size_t inlineCapacity = 30;

    Text() noexcept
    {
        setInlineSize(0);
    }
    Text(std::string_view text); // NOLINT: reads as the text itself
    Text(const std::string& text) : Text(std::string_view(text)) {} // NOLINT
    Text(const char* text) :
        Text(text == nullptr ? std::string_view() : std::string_view(text))
    {
    }
    Text(const Text& other) : Text(other.view()) {}
    Text(Text&& other) noexcept;
    Text& operator=(const Text& other);
    Text& operator=(Text&& other) noexcept;
    ~Text();

    std::string_view view() const noexcept
    {
        return {data(), size()};
    }
    operator std::string_view() const noexcept // NOLINT: a view, not a copy
    {
        return view();
    }
    std::string str() const
    {
        return std::string(view());
    }
    // NUL-terminated.
    const char* data() const noexcept
    {
        return onHeap() ? heap().chars : bytes_.data();
    }
    const char* c_str() const noexcept
    {
        return data();
    }
    std::size_t size() const noexcept
    {
        return onHeap() ? heap().size
                        : static_cast<unsigned char>(bytes_[tagAt]);
    }
    bool empty() const noexcept
    {
        return size() == 0;
    }

    // One for each kind of text it meets, so that no comparison needs a
    // conversion to choose between them.
    friend bool operator==(const Text& a, const Text& b) noexcept
    {
        return a.view() == b.view();
    }
    friend bool operator==(const Text& a, std::string_view b) noexcept
    {
        return a.view() == b;
    }
    friend bool operator==(const Text& a, const std::string& b) noexcept
    {
        return a.view() == b;
    }
    friend bool operator==(const Text& a, const char* b) noexcept
    {
        return b != nullptr && a.view() == b;
    }
    friend std::string operator+(std::string left, const Text& right)
    {
        return left.append(right.view());
    }
    friend std::string operator+(const char* left, const Text& right)
    {
        return std::string(left).append(right.view());
    }
    friend std::string operator+(const Text& left, std::string_view right)
    {
        return left.str().append(right);
    }
    friend std::ostream& operator<<(std::ostream& out, const Text& text)
    {
        return out << text.view();
    }

  private:
    // Inline, bytes_ holds the characters, a NUL and, in its last byte,
    // the size. On the heap, it holds a Heap record and the tag heapTag.
    static constexpr std::size_t tagAt = inlineCapacity + 1;
    static constexpr unsigned char heapTag = 0xff;
    struct Heap
    {
        char* chars;
        std::size_t size;
    };

    bool onHeap() const noexcept
    {
        return static_cast<unsigned char>(bytes_[tagAt]) == heapTag;
    }
    Heap heap() const noexcept
    {
        Heap record{};
        std::memcpy(&record, bytes_.data(), sizeof record);
        return record;
    }
    void setInlineSize(std::size_t size) noexcept
    {
        bytes_[size] = '\0';
        bytes_[tagAt] = static_cast<char>(size);
    }
    void freeHeap() noexcept;

    alignas(Heap) std::array<char, tagAt + 1> bytes_;
};

static_assert(sizeof(Text) == 32);

} // namespace host
