#include "host/parser/pr_quantity.h"

#include <charconv>
#include <cmath>

namespace pr_detail {

namespace {

struct UnitName {
    std::string_view name;  // lower case
    Unit unit;
};

constexpr UnitName kUnits[] = {
    {"ps", {kTime, 0, 0}},         {"ns", {kTime, 3, 0}},         {"us", {kTime, 6, 0}},
    {"ms", {kTime, 9, 0}},         {"hz", {kFrequency, 0, 0}},    {"khz", {kFrequency, 3, 0}},
    {"mhz", {kFrequency, 6, 0}},   {"ghz", {kFrequency, 9, 0}},   {"%", {kPercent, 0, 0}},
    {"c", {kTemperature, 0, 'C'}}, {"f", {kTemperature, 0, 'F'}}, {"k", {kTemperature, 0, 'K'}},
    {"v", {kVoltage, 0, 0}},       {"mv", {kVoltage, -3, 0}},
};

inline bool is_digit(char c) {
    return c >= '0' && c <= '9';
}
inline char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c;
}

}  // namespace

const Unit* find_unit(std::string_view word) {
    if (word.empty() || word.size() > 3) return nullptr;
    for (const UnitName& u : kUnits) {
        if (u.name.size() != word.size()) continue;
        bool same = true;
        for (std::size_t i = 0; i < word.size() && same; ++i) same = lower(word[i]) == u.name[i];
        if (same) return &u.unit;
    }
    return nullptr;
}

bool split_number(std::string_view w, Number& out) {
    out = Number{};
    std::size_t i = 0;
    if (i < w.size() && (w[i] == '+' || w[i] == '-')) {
        out.has_sign = true;
        out.negative = w[i] == '-';
        ++i;
    }
    const std::size_t int_begin = i;
    while (i < w.size() && is_digit(w[i])) ++i;
    out.int_digits = w.substr(int_begin, i - int_begin);
    if (i + 1 < w.size() && w[i] == '.' && is_digit(w[i + 1])) {
        const std::size_t frac_begin = ++i;
        while (i < w.size() && is_digit(w[i])) ++i;
        out.has_point = true;
        out.frac_digits = w.substr(frac_begin, i - frac_begin);
    }
    if (out.int_digits.empty() && !out.has_point) return false;
    out.length = i;
    return true;
}

bool numeric_looking(std::string_view w) {
    if (w.empty()) return false;
    if (is_digit(w[0])) return true;
    if (w[0] == '.') return w.size() > 1 && is_digit(w[1]);
    if (w[0] == '+' || w[0] == '-') return w.size() > 1 && (is_digit(w[1]) || w[1] == '.');
    return false;
}

void shifted_digits(const Number& n, int shift, std::string& out) {
    const std::string_view a = n.int_digits;
    const std::string_view b = n.frac_digits;
    const long total = static_cast<long>(a.size() + b.size());
    const long point = static_cast<long>(a.size()) + shift;  // digits before the new point
    auto digit = [&](long i) -> char {
        if (i < 0 || i >= total) return '0';
        return i < static_cast<long>(a.size()) ? a[i] : b[i - a.size()];
    };
    out.clear();
    // Integer part: positions [0, point), padded with zeros past the written digits.
    long first = 0;
    while (first < point && digit(first) == '0') ++first;
    if (first >= point) {
        out.push_back('0');
    } else {
        for (long i = first; i < point; ++i) out.push_back(digit(i));
    }
    // Fraction: positions [point, total), with zeros before the written digits when the
    // point moved left past them.
    long last = total;
    while (last > point && digit(last - 1) == '0') --last;
    if (last > point) {
        out.push_back('.');
        for (long i = point; i < last; ++i) out.push_back(digit(i));
    }
}

bool decimal_to_double(std::string_view text, double& out) {
    double v = 0;
    auto r = std::from_chars(text.data(), text.data() + text.size(), v, std::chars_format::fixed);
    if (r.ec != std::errc() || r.ptr != text.data() + text.size() || !std::isfinite(v))
        return false;
    out = v;
    return true;
}

}  // namespace pr_detail
