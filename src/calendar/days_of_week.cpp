#include <vaskel/calendar.h>
#include <vaskel/text.h>

#include <algorithm>
#include <cctype>
#include <cstddef>
#include <limits>

namespace vaskel {

int DaysOfWeek::DayToBit(EDayOfWeek day) {
    if (day == Sunday)
        return SundayBit;
    return day >= Monday && day <= Saturday ? MondayBit << (day - Monday) : 0;
}

EDayOfWeek DaysOfWeek::BitToDay(int bit) {
    if (bit == SundayBit)
        return Sunday;
    for (int day = Monday; day <= Saturday; ++day) {
        if (bit == MondayBit << (day - Monday))
            return static_cast<EDayOfWeek>(day);
    }
    return InvalidDay;
}

CString DaysOfWeek::ToString() const {
    if ((m_nDays & AllDaysBits) == 0)
        return CString();
    CString text('(');
    for (int bit = MondayBit; bit <= SundayBit; bit <<= 1) {
        if (m_nDays & bit) {
            if (text.GetLength() > 1)
                text += ',';
            text += DayOfWeekX::ToString(BitToDay(bit), true);
        }
    }
    text += ')';
    return text;
}

void DaysOfWeek::FromString(const char* text) {
    m_nDays = 0;
    if (!text)
        return;
    VKSkipWhiteSpaces(text);
    if (*text == '(')
        ++text;
    auto isLetter = [](char c) { return std::isalpha(static_cast<unsigned char>(c)) != 0; };
    while (*text != '\0') {
        VKSkipWhiteSpaces(text);
        const char* word = text;
        while (isLetter(*text))
            ++text;
        if (text == word)
            break;
        // Only the first few letters can match a name, so a longer word
        // compares the same with its length capped.
        size_t length =
            std::min<size_t>(static_cast<size_t>(text - word), std::numeric_limits<DWORD>::max());
        AddDay(DayOfWeekX::FromString(word, static_cast<DWORD>(length)));
        VKSkipWhiteSpaces(text);
        // One separator of any kind; a letter already starts the next word.
        if (*text != '\0' && !isLetter(*text))
            ++text;
    }
}

} // namespace vaskel
