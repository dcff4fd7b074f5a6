/// @file
/// One linear pass over a constant table.
#ifndef KIV_LOOKUP_H
#define KIV_LOOKUP_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <type_traits>

namespace kiv
{

/// A text packed into an integer, first byte lowest: equal integers mean equal texts. 0 for a text that is null, empty or longer
/// than the integer.
template <class Word>
constexpr Word Pack(const char* text)
{
    Word packed = 0;
    for (std::size_t i = 0; text != nullptr && i <= sizeof(Word); ++i)
    {
        if (text[i] == '\0')
            return packed;
        if (i < sizeof(Word))
            packed |= static_cast<Word>(static_cast<Word>(static_cast<unsigned char>(text[i])) << (8 * i));
    }
    return 0;
}

/// A key column of a table, packed when it is compiled, in row order: what a pass over the table reads.
template <const auto& Table, auto Key>
struct KeyColumn
{
    static constexpr std::size_t kRows = std::size(Table);

    /// Whether every key of the column can be told in such an integer.
    template <class Word>
    static constexpr bool Fits()
    {
        for (const auto& row : Table)
        {
            if (Pack<Word>(row.*Key) == 0)
                return false;
        }
        return true;
    }

    using Word = std::conditional_t<Fits<std::uint32_t>(), std::uint32_t, std::uint64_t>;
    static_assert(Fits<Word>(), "a key is empty, or longer than the widest integer");

    static constexpr std::array<Word, kRows> Packed()
    {
        std::array<Word, kRows> column{};
        for (std::size_t i = 0; i < kRows; ++i)
            column[i] = Pack<Word>(Table[i].*Key);
        return column;
    }

    static constexpr std::array<Word, kRows> kKeys = Packed();
};

/// A pass looks at blocks of so many keys at once, which the compiler turns into vector instructions, and then finds the row in its
/// block.
constexpr std::size_t kBlock = 16;

/// Whether one of the keys in the block from a row on is the wanted one.
template <class Column>
bool BlockHolds(std::size_t row, typename Column::Word wanted)
{
    unsigned found = 0;
    for (std::size_t i = 0; i < kBlock; ++i)
        found |= static_cast<unsigned>(Column::kKeys[row + i] == wanted);
    return found != 0;
}

/// The first row whose key equals this one to the letter; null when there is none, as for a null key.
template <const auto& Table, auto Key>
auto FirstRow(const char* key) -> decltype(&Table[0])
{
    using Column = KeyColumn<Table, Key>;
    const auto wanted = Pack<typename Column::Word>(key);

    std::size_t row = 0;
    if constexpr (Column::kRows >= kBlock)
    {
        while (row + kBlock <= Column::kRows && !BlockHolds<Column>(row, wanted))
            row += kBlock;
    }
    for (; row < Column::kRows; ++row)
    {
        if (Column::kKeys[row] == wanted)
            return &Table[row];
    }
    return nullptr;
}

/// The last row whose key equals this one; the same otherwise.
template <const auto& Table, auto Key>
auto LastRow(const char* key) -> decltype(&Table[0])
{
    using Column = KeyColumn<Table, Key>;
    const auto wanted = Pack<typename Column::Word>(key);

    std::size_t end = Column::kRows;
    if constexpr (Column::kRows >= kBlock)
    {
        while (end >= kBlock && !BlockHolds<Column>(end - kBlock, wanted))
            end -= kBlock;
    }
    for (; end > 0; --end)
    {
        if (Column::kKeys[end - 1] == wanted)
            return &Table[end - 1];
    }
    return nullptr;
}

} // namespace kiv

#endif
