#include "SelCopyFile.h"

#include "AtomicFile.h"

#include <algorithm>
#include <array>
#include <stdexcept>

namespace QX::Ipmi
{

// The file, all numbers little-endian:
//
//   magic        8 bytes  "QXSELCPY"
//   version      u32      selCopyVersion
//   key length   u16      at most maxBmcKey
//   key          bytes    the BMC's key (IpmiSession::peerKey)
//   entries      u16      Get SEL Info: entries
//   free space   u16                    free space
//   addition     u32                    most recent addition time
//   erase        u32                    most recent erase time
//   flags        u8       bit 0 overflow, bit 1 reserve supported,
//                         bit 2 clear seen; other bits zero
//   count        u32      records that follow, at most maxKeptRecords
//   records      count x 16 bytes, in SEL order
//   texts key    u16 length (at most maxTextsKey) and bytes
//   text count   u32      0, or count: one text per record
//   texts        each u16 length (at most maxKeptText) and bytes
//   checksum     u64      FNV-1a over every byte before it
//
// A reader takes the file only when every field is in range, the file
// ends right after the checksum and the checksum matches; anything else
// (truncated, padded, bit flips, another version, another BMC) is no
// copy at all, so the caller reads the whole SEL instead.

namespace
{

constexpr std::string_view magic = "QXSELCPY";
constexpr std::uint8_t flagOverflow = 0x01;
constexpr std::uint8_t flagReserve = 0x02;
constexpr std::uint8_t flagClearSeen = 0x04;
constexpr std::uint8_t knownFlags = flagOverflow | flagReserve | flagClearSeen;
constexpr std::size_t recordSize = std::tuple_size_v<SelRecordBytes>;
constexpr std::size_t checksumSize = 8;
// Everything but the keys, the records and the texts.
constexpr std::size_t fixedSize =
    magic.size() + 4 + 2 + 2 + 2 + 4 + 4 + 1 + 4 + 2 + 4 + checksumSize;

bool textsFit(const KeptSel& copy)
{
    return copy.texts.size() == copy.records.size() &&
           copy.textsKey.size() <= maxTextsKey &&
           std::all_of(copy.texts.begin(), copy.texts.end(),
                       [](const std::string& text)
                       { return text.size() <= maxKeptText; });
}

std::uint64_t fnv1a(std::string_view bytes)
{
    std::uint64_t hash = 0xcbf29ce484222325ull;
    for (const char c : bytes)
    {
        hash ^= static_cast<unsigned char>(c);
        hash *= 0x100000001b3ull;
    }
    return hash;
}

void put(std::string& out, std::uint64_t value, unsigned size)
{
    for (unsigned i = 0; i < size; ++i)
    {
        out += static_cast<char>((value >> (8 * i)) & 0xFF);
    }
}

// Reads fields front to back; every read is checked against the end.
class Cursor
{
  public:
    explicit Cursor(std::string_view bytes) : bytes_(bytes) {}
    bool take(unsigned size, std::uint64_t& value)
    {
        if (bytes_.size() - at_ < size)
        {
            return false;
        }
        value = 0;
        for (unsigned i = 0; i < size; ++i)
        {
            value |= std::uint64_t{static_cast<unsigned char>(bytes_[at_ + i])}
                     << (8 * i);
        }
        at_ += size;
        return true;
    }
    bool take(std::size_t size, std::string_view& out)
    {
        if (bytes_.size() - at_ < size)
        {
            return false;
        }
        out = bytes_.substr(at_, size);
        at_ += size;
        return true;
    }
    std::size_t at() const
    {
        return at_;
    }

  private:
    std::string_view bytes_;
    std::size_t at_ = 0;
};

// The Get SEL Info fields and the flags, in file order with their widths:
// the writer and the reader both go through this one list.
enum InfoField
{
    infoEntries,
    infoFreeSpace,
    infoAddition,
    infoErase,
    infoFlags,
    infoFieldCount,
};
constexpr std::array<unsigned, infoFieldCount> infoWidths{2, 2, 4, 4, 1};
using InfoFields = std::array<std::uint64_t, infoFieldCount>;

InfoFields infoFieldsOf(const KeptSel& copy)
{
    InfoFields fields{};
    fields[infoEntries] = copy.info.entries;
    fields[infoFreeSpace] = copy.info.freeSpace;
    fields[infoAddition] = copy.info.mostRecentAddition;
    fields[infoErase] = copy.info.mostRecentErase;
    fields[infoFlags] = (copy.info.overflow ? flagOverflow : 0) |
                        (copy.info.reserveSupported ? flagReserve : 0) |
                        (copy.clearSeen ? flagClearSeen : 0);
    return fields;
}

void applyInfoFields(const InfoFields& fields, KeptSel& copy)
{
    copy.info.entries = static_cast<std::uint16_t>(fields[infoEntries]);
    copy.info.freeSpace = static_cast<std::uint16_t>(fields[infoFreeSpace]);
    copy.info.mostRecentAddition =
        static_cast<std::uint32_t>(fields[infoAddition]);
    copy.info.mostRecentErase = static_cast<std::uint32_t>(fields[infoErase]);
    const std::uint64_t flags = fields[infoFlags];
    copy.info.overflow = (flags & flagOverflow) != 0;
    copy.info.reserveSupported = (flags & flagReserve) != 0;
    copy.clearSeen = (flags & flagClearSeen) != 0;
}

} // namespace

std::string formatSelCopy(const KeptSel& copy)
{
    if (copy.records.size() > maxKeptRecords)
    {
        throw std::invalid_argument("more SEL records than a SEL holds");
    }
    if (copy.bmcKey.size() > maxBmcKey)
    {
        throw std::invalid_argument("BMC key too long");
    }
    std::string out;
    out.reserve(fixedSize + copy.bmcKey.size() +
                copy.records.size() * recordSize);
    out += magic;
    put(out, selCopyVersion, 4);
    put(out, copy.bmcKey.size(), 2);
    out += copy.bmcKey;
    const InfoFields info = infoFieldsOf(copy);
    for (std::size_t i = 0; i < info.size(); ++i)
    {
        put(out, info[i], infoWidths[i]);
    }
    put(out, copy.records.size(), 4);
    for (const SelRecordBytes& record : copy.records)
    {
        out.append(reinterpret_cast<const char*>(record.data()), record.size());
    }
    // Texts that do not fit are not kept: the reader makes them again.
    const bool texts = !copy.textsKey.empty() && textsFit(copy);
    const std::string_view textsKey =
        texts ? std::string_view(copy.textsKey) : std::string_view();
    put(out, textsKey.size(), 2);
    out += textsKey;
    put(out, texts ? copy.texts.size() : 0, 4);
    if (texts)
    {
        for (const std::string& text : copy.texts)
        {
            put(out, text.size(), 2);
            out += text;
        }
    }
    put(out, fnv1a(out), checksumSize);
    return out;
}

std::optional<KeptSel> parseSelCopy(std::string_view bytes,
                                    const std::string& bmcKey,
                                    std::string& problem)
{
    Cursor cursor(bytes);
    std::string_view head;
    if (!cursor.take(magic.size(), head) || head != magic)
    {
        problem = "not a SEL copy";
        return std::nullopt;
    }
    std::uint64_t version = 0;
    std::uint64_t keySize = 0;
    std::string_view key;
    if (!cursor.take(4, version) || !cursor.take(2, keySize))
    {
        problem = "the file is truncated";
        return std::nullopt;
    }
    if (version != selCopyVersion)
    {
        problem = "format version " + std::to_string(version) + ", not " +
                  std::to_string(selCopyVersion);
        return std::nullopt;
    }
    if (keySize > maxBmcKey || !cursor.take(keySize, key))
    {
        problem = "the file is truncated";
        return std::nullopt;
    }
    // The checksum first: a damaged file says nothing reliable at all.
    if (bytes.size() < checksumSize)
    {
        problem = "the file is truncated";
        return std::nullopt;
    }
    const std::string_view body = bytes.substr(0, bytes.size() - checksumSize);
    Cursor tail(bytes.substr(body.size()));
    std::uint64_t checksum = 0;
    tail.take(checksumSize, checksum);

    KeptSel copy;
    InfoFields info{};
    std::uint64_t count = 0;
    for (std::size_t i = 0; i < info.size(); ++i)
    {
        if (!cursor.take(infoWidths[i], info[i]))
        {
            problem = "the file is truncated";
            return std::nullopt;
        }
    }
    if (!cursor.take(4, count))
    {
        problem = "the file is truncated";
        return std::nullopt;
    }
    if (cursor.at() > body.size())
    {
        problem = "the file is truncated";
        return std::nullopt;
    }
    if (fnv1a(body) != checksum)
    {
        problem = "the checksum does not match";
        return std::nullopt;
    }
    if (count > maxKeptRecords ||
        (body.size() - cursor.at()) / recordSize < count)
    {
        problem = "the length does not match the record count";
        return std::nullopt;
    }
    if ((info[infoFlags] & ~std::uint64_t{knownFlags}) != 0)
    {
        problem = "unknown flags";
        return std::nullopt;
    }
    if (key != bmcKey)
    {
        problem = "the copy is of another BMC (" + std::string(key) + ")";
        return std::nullopt;
    }
    copy.bmcKey = std::string(key);
    applyInfoFields(info, copy);
    copy.records.resize(count);
    for (SelRecordBytes& record : copy.records)
    {
        std::string_view raw;
        cursor.take(recordSize, raw);
        std::transform(raw.begin(), raw.end(), record.begin(),
                       [](char c) { return static_cast<std::uint8_t>(c); });
    }

    // The texts: within the body, every length checked before it is used.
    Cursor rest(body.substr(cursor.at()));
    std::uint64_t textsKeySize = 0;
    std::string_view textsKey;
    std::uint64_t textCount = 0;
    if (!rest.take(2, textsKeySize) || textsKeySize > maxTextsKey ||
        !rest.take(textsKeySize, textsKey) || !rest.take(4, textCount) ||
        (textCount != 0 && textCount != count))
    {
        problem = "the texts are malformed";
        return std::nullopt;
    }
    copy.texts.reserve(textCount);
    for (std::uint64_t i = 0; i < textCount; ++i)
    {
        std::uint64_t size = 0;
        std::string_view text;
        if (!rest.take(2, size) || size > maxKeptText || !rest.take(size, text))
        {
            problem = "the texts are malformed";
            return std::nullopt;
        }
        copy.texts.emplace_back(text);
    }
    if (rest.at() != body.size() - cursor.at())
    {
        problem = "the length does not match the contents";
        return std::nullopt;
    }
    copy.textsKey = textCount != 0 ? std::string(textsKey) : std::string();
    return copy;
}

std::optional<KeptSel> readSelCopy(const std::string& path,
                                   const std::string& bmcKey,
                                   std::string& problem)
{
    const std::size_t limit = fixedSize + maxBmcKey + maxTextsKey +
                              maxKeptRecords * (recordSize + 2 + maxKeptText);
    const std::optional<std::string> bytes =
        readSmallFile(path, limit, problem);
    if (!bytes)
    {
        return std::nullopt;
    }
    return parseSelCopy(*bytes, bmcKey, problem);
}

void writeSelCopy(const std::string& path, const KeptSel& copy)
{
    writeFileAtomically(path, formatSelCopy(copy));
}

} // namespace QX::Ipmi
