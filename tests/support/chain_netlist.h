// A Yosys netlist of a hierarchy as deep as asked, made by the tests and the benchmarks of
// deep designs.
#pragma once

#include <string>

namespace lun_test {

// Modules m0 (the top) to m{levels-1}, each with an input port a, an output port y, a net w
// and, with bus > 0, a net bus of that many more bits. Each module but the last instantiates
// the next one through cell u (and, when twice, also through cell v, so that the design doubles
// at every level); the last holds one inverter gate.
inline std::string ChainNetlist(int levels, bool twice = false, int bus = 0) {
    std::string bus_bits;
    for (int i = 0; i < bus; ++i) bus_bits += (i ? "," : "") + std::to_string(5 + i);
    std::string text = "{\"modules\":{\n";
    for (int i = 0; i < levels; ++i) {
        const std::string next = std::to_string(i + 1);
        text += "\"m" + std::to_string(i) + "\":{";
        if (i == 0) text += "\"attributes\":{\"top\":1},";
        text += "\"ports\":{\"a\":{\"direction\":\"input\",\"bits\":[2]},\"y\":{\"direction\":\"output\",\"bits\":[3]}},"
                "\"cells\":{";
        if (i + 1 < levels) {
            text += "\"u\":{\"type\":\"m" + next + "\",\"connections\":{\"a\":[2],\"y\":[4]}}";
            if (twice) text += ",\"v\":{\"type\":\"m" + next + "\",\"connections\":{\"a\":[4],\"y\":[3]}}";
        } else {
            text += "\"g\":{\"type\":\"$_NOT_\",\"port_directions\":{\"A\":\"input\",\"Y\":\"output\"},"
                    "\"connections\":{\"A\":[2],\"Y\":[3]}}";
        }
        text += "},\"netnames\":{\"a\":{\"bits\":[2]},\"y\":{\"bits\":[3]},\"w\":{\"bits\":[4]}";
        if (bus) text += ",\"bus\":{\"bits\":[" + bus_bits + "]}";
        text += "}}";
        text += i + 1 < levels ? ",\n" : "\n";
    }
    return text + "}}\n";
}

}  // namespace lun_test
