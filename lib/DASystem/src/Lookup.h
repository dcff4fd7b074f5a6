/// @file
/// The columns of constant tables, and a linear search in a column.
///
/// A table is written as rows of pointers to texts, which exist only during compilation. The library contains columns with the
/// texts themselves. These need no relocation, so no process writes to their pages.
#ifndef KIV_LOOKUP_H
#define KIV_LOOKUP_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <string_view>
#include <type_traits>

namespace kiv
{

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "the bytes of a packed text are the text");

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

/// The result of a search when no cell contains the key.
constexpr std::size_t kNoRow = SIZE_MAX;

/// A search first compares blocks of this many cells, for which the compiler uses vector instructions, and then finds the row in
/// the block.
constexpr std::size_t kBlock = 8;

/// Whether one of the cells of a block equals the wanted one.
template <class Word>
bool BlockHolds(const Word* block, Word wanted)
{
    Word found = 0;
    for (std::size_t i = 0; i < kBlock; ++i)
        found |= block[i] == wanted ? static_cast<Word>(-1) : 0;
    return found != 0;
}

/// A column of texts of 1 to 7 bytes. Each is stored in a cell as wide as an integer, so that one comparison suffices.
template <const auto& Rows, auto Cell>
class KeyColumn
{
    static constexpr std::size_t kRows = std::size(Rows);

    /// Whether every text fits into the integer together with its terminating zero.
    template <class Word>
    static constexpr bool Fits()
    {
        for (const auto& row : Rows)
        {
            const std::size_t length = std::string_view(row.*Cell).size();
            if (length == 0 || length >= sizeof(Word))
                return false;
        }
        return true;
    }

    using Word = std::conditional_t<Fits<std::uint32_t>(), std::uint32_t, std::uint64_t>;
    static_assert(Fits<Word>(), "a text is empty, or too long for the widest integer");

    static constexpr std::array<Word, std::size(Rows)> Packed()
    {
        std::array<Word, std::size(Rows)> column{};
        for (std::size_t row = 0; row < column.size(); ++row)
            column[row] = Pack<Word>(Rows[row].*Cell);
        return column;
    }

    alignas(16) std::array<Word, std::size(Rows)> cells_ = Packed();

public:
    /// Returns the text of a row, which lives as long as the process.
    const char* operator[](std::size_t row) const { return reinterpret_cast<const char*>(&cells_[row]); }

    /// Returns the first row that contains exactly this text; kNoRow for none or null.
    std::size_t FirstRow(const char* key) const
    {
        const Word wanted = Pack<Word>(key);

        std::size_t row = 0;
        while (row + kBlock <= kRows && !BlockHolds(&cells_[row], wanted))
            row += kBlock;
        for (; row < kRows; ++row)
        {
            if (cells_[row] == wanted)
                return row;
        }
        return kNoRow;
    }

    /// Like FirstRow(), but the last match.
    std::size_t LastRow(const char* key) const
    {
        const Word wanted = Pack<Word>(key);

        std::size_t end = kRows;
        while (end >= kBlock && !BlockHolds(&cells_[end - kBlock], wanted))
            end -= kBlock;
        for (; end > 0; --end)
        {
            if (cells_[end - 1] == wanted)
                return end - 1;
        }
        return kNoRow;
    }
};

/// A column of texts of any length, one after the other. It cannot be searched.
template <const auto& Rows, auto Cell>
class TextColumn
{
    static constexpr std::size_t Size()
    {
        std::size_t size = 0;
        for (const auto& row : Rows)
            size += std::string_view(row.*Cell).size() + 1;
        return size;
    }

    using Start = std::uint16_t;
    static_assert(Size() <= UINT16_MAX, "the texts are longer than a start can count");

    std::array<char, Size()> texts_{};
    std::array<Start, std::size(Rows)> starts_{};

public:
    constexpr TextColumn()
    {
        std::size_t end = 0;
        for (std::size_t row = 0; row < std::size(Rows); ++row)
        {
            starts_[row] = static_cast<Start>(end);
            for (const char ch : std::string_view(Rows[row].*Cell))
                texts_[end++] = ch;
            ++end; // skips the terminating zero, which is already there
        }
    }

    /// Returns the text of a row, which lives as long as the process.
    const char* operator[](std::size_t row) const { return &texts_[starts_[row]]; }
};

} // namespace kiv

#endif
