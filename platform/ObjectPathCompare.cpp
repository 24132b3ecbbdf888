#include "ObjectPathCompare.h"

#include "Support.h"

#include <cmpift.h>

#include <cstdint>
#include <cstring>
#include <optional>
#include <vector>

namespace QX
{

namespace
{

/** References nested deeper than this are taken as unequal, which also
 *  ends the comparison of a path that refers to itself. */
constexpr int maxReferenceDepth = 16;

CMPIStatus okStatus()
{
    return CMPIStatus{CMPI_RC_OK, nullptr};
}

const char* textOf(const CMPIString* text)
{
    if (text == nullptr || text->ft == nullptr ||
        text->ft->getCharPtr == nullptr)
    {
        return nullptr;
    }
    CMPIStatus status = okStatus();
    const char* chars = text->ft->getCharPtr(text, &status);
    return status.rc == CMPI_RC_OK ? chars : nullptr;
}

using PathTextGetter = CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*);

const char* pathText(const CMPIObjectPath* path, PathTextGetter getter)
{
    if (getter == nullptr)
    {
        return nullptr;
    }
    CMPIStatus status = okStatus();
    const CMPIString* text = getter(path, &status);
    return status.rc == CMPI_RC_OK ? textOf(text) : nullptr;
}

bool namesEqual(const CMPIObjectPath* left, const CMPIObjectPath* right,
                PathTextGetter leftGetter, PathTextGetter rightGetter)
{
    const char* leftText = pathText(left, leftGetter);
    const char* rightText = pathText(right, rightGetter);
    return leftText != nullptr && rightText != nullptr &&
           textEqual(leftText, rightText);
}

bool isTextType(CMPIType type)
{
    return type == CMPI_string || type == CMPI_chars || type == CMPI_dateTime;
}

bool isIntegerType(CMPIType type)
{
    switch (type)
    {
        case CMPI_uint8:
        case CMPI_uint16:
        case CMPI_uint32:
        case CMPI_uint64:
        case CMPI_sint8:
        case CMPI_sint16:
        case CMPI_sint32:
        case CMPI_sint64:
            return true;
        default:
            return false;
    }
}

const char* keyText(const CMPIData& data)
{
    switch (data.type)
    {
        case CMPI_chars:
            return data.value.chars;
        case CMPI_string:
            return textOf(data.value.string);
        case CMPI_dateTime:
        {
            const CMPIDateTime* when = data.value.dateTime;
            if (when == nullptr || when->ft == nullptr ||
                when->ft->getStringFormat == nullptr)
            {
                return nullptr;
            }
            CMPIStatus status = okStatus();
            const CMPIString* text = when->ft->getStringFormat(when, &status);
            return status.rc == CMPI_RC_OK ? textOf(text) : nullptr;
        }
        default:
            return nullptr;
    }
}

/** An integer of any CMPI width as sign and magnitude. */
struct Integer
{
    bool negative;
    std::uint64_t magnitude;

    friend bool operator==(const Integer&, const Integer&) = default;
};

Integer integerOf(const CMPIData& data)
{
    const auto fromSigned = [](std::int64_t value)
    {
        const bool negative = value < 0;
        // Negate in unsigned arithmetic: defined even for INT64_MIN.
        const auto bits = static_cast<std::uint64_t>(value);
        return Integer{negative, negative ? ~bits + 1 : bits};
    };
    switch (data.type)
    {
        case CMPI_uint8:
            return Integer{false, data.value.uint8};
        case CMPI_uint16:
            return Integer{false, data.value.uint16};
        case CMPI_uint32:
            return Integer{false, data.value.uint32};
        case CMPI_uint64:
            return Integer{false, data.value.uint64};
        case CMPI_sint8:
            return fromSigned(data.value.sint8);
        case CMPI_sint16:
            return fromSigned(data.value.sint16);
        case CMPI_sint32:
            return fromSigned(data.value.sint32);
        default:
            return fromSigned(data.value.sint64);
    }
}

bool pathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right,
                bool compareHosts, int depth);

bool valuesEqual(const CMPIData& left, const CMPIData& right, bool compareHosts,
                 int depth)
{
    const auto unusable = CMPI_nullValue | CMPI_notFound | CMPI_badValue;
    if ((left.state & unusable) != 0 || (right.state & unusable) != 0)
    {
        return false;
    }
    if (isTextType(left.type) && isTextType(right.type))
    {
        const char* leftText = keyText(left);
        const char* rightText = keyText(right);
        return leftText != nullptr && rightText != nullptr &&
               std::strcmp(leftText, rightText) == 0;
    }
    if (isIntegerType(left.type) && isIntegerType(right.type))
    {
        return integerOf(left) == integerOf(right);
    }
    if (left.type != right.type)
    {
        return false;
    }
    switch (left.type)
    {
        case CMPI_boolean:
            return (left.value.boolean != 0) == (right.value.boolean != 0);
        case CMPI_char16:
            return left.value.char16 == right.value.char16;
        case CMPI_ref:
            return pathsEqual(left.value.ref, right.value.ref, compareHosts,
                              depth + 1);
        default:
            return false;
    }
}

std::optional<CMPICount> keyCount(const CMPIObjectPath* path)
{
    if (path->ft->getKeyCount == nullptr)
    {
        return std::nullopt;
    }
    CMPIStatus status = okStatus();
    const CMPICount count = path->ft->getKeyCount(path, &status);
    if (status.rc != CMPI_RC_OK)
    {
        return std::nullopt;
    }
    return count;
}

/** Key @p index of @p path with its name, or nothing on any failure. */
std::optional<std::pair<const char*, CMPIData>>
keyAt(const CMPIObjectPath* path, CMPICount index)
{
    if (path->ft->getKeyAt == nullptr)
    {
        return std::nullopt;
    }
    CMPIStatus status = okStatus();
    CMPIString* name = nullptr;
    const CMPIData data = path->ft->getKeyAt(path, index, &name, &status);
    const char* nameText = textOf(name);
    if (status.rc != CMPI_RC_OK || nameText == nullptr)
    {
        return std::nullopt;
    }
    return std::make_pair(nameText, data);
}

bool keysEqual(const CMPIObjectPath* left, const CMPIObjectPath* right,
               bool compareHosts, int depth)
{
    const auto leftCount = keyCount(left);
    const auto rightCount = keyCount(right);
    if (!leftCount || !rightCount || *leftCount != *rightCount)
    {
        return false;
    }
    // Each key of the left must match a distinct key of the right.
    std::vector<bool> matched(*rightCount, false);
    for (CMPICount i = 0; i < *leftCount; ++i)
    {
        const auto leftKey = keyAt(left, i);
        if (!leftKey)
        {
            return false;
        }
        bool found = false;
        for (CMPICount j = 0; j < *rightCount && !found; ++j)
        {
            if (matched[j])
            {
                continue;
            }
            const auto rightKey = keyAt(right, j);
            if (!rightKey)
            {
                return false;
            }
            if (textEqual(leftKey->first, rightKey->first))
            {
                if (!valuesEqual(leftKey->second, rightKey->second,
                                 compareHosts, depth))
                {
                    return false;
                }
                matched[j] = true;
                found = true;
            }
        }
        if (!found)
        {
            return false;
        }
    }
    return true;
}

bool pathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right,
                bool compareHosts, int depth)
{
    if (depth > maxReferenceDepth || left == nullptr || right == nullptr ||
        left->ft == nullptr || right->ft == nullptr)
    {
        return false;
    }
    if (!namesEqual(left, right, left->ft->getNameSpace,
                    right->ft->getNameSpace) ||
        !namesEqual(left, right, left->ft->getClassName,
                    right->ft->getClassName))
    {
        return false;
    }
    if (compareHosts &&
        !namesEqual(left, right, left->ft->getHostname, right->ft->getHostname))
    {
        return false;
    }
    return keysEqual(left, right, compareHosts, depth);
}

} // namespace

bool isObjPathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right,
                     bool compareHosts)
{
    return pathsEqual(left, right, compareHosts, 0);
}

} // namespace QX
