// Numbers and units of constraint files.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace pr_detail {

enum Family : std::uint8_t {
    kPlain = 0,  // a bare number: factor or integer
    kTime = 1,
    kFrequency = 2,
    kPercent = 4,
    kTemperature = 8,
    kVoltage = 16,
    kAllFamilies = 31
};

struct Unit {
    Family family;
    int shift;   // decimal places the point moves right to reach the base unit (ps, Hz, V)
    char scale;  // temperatures: 'C', 'F' or 'K'
};

// A unit word in any letter case, or null.
const Unit* find_unit(std::string_view word);

// The signed decimal number at the start of a word.
struct Number {
    bool has_sign = false;
    bool negative = false;
    bool has_point = false;
    std::string_view int_digits;   // may be empty (".5")
    std::string_view frac_digits;  // empty without a point
    std::size_t length = 0;        // bytes of the word taken by the number
};

// Splits off the longest prefix of `word` that is a signed number; false when there is none.
bool split_number(std::string_view word, Number& out);

// Starts with a digit, with '.' and a digit, or with a sign and a digit or '.'.
bool numeric_looking(std::string_view word);

// Writes the magnitude of `n` with its decimal point moved `shift` places to the right
// (left when negative): no leading zeros in the integer part (one "0" kept), no trailing
// zeros in the fraction, no point when no fraction is left.
void shifted_digits(const Number& n, int shift, std::string& out);

// Decimal text (digits and an optional point) to the nearest double; false when the value
// does not fit a finite double.
bool decimal_to_double(std::string_view text, double& out);

}  // namespace pr_detail
