// A generated Yosys JSON netlist for the benchmarks of loading and of the whole job.
#pragma once

#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <string>

// Writes a netlist the way `yosys write_json` lays it out. Cells come in pairs: a LUT4 whose
// output drives the D input of a flip-flop; LUT inputs come from flip-flop outputs and the
// primary inputs. Flip-flop outputs form 32-bit public buses r<k>, LUT outputs have hidden
// generated names. Flat (modules = 0): the module "top" holds every cell. Hierarchical: "top"
// instantiates u0 .. u<modules-1>, each of a module of its own (sub0, ...) holding an equal
// share of the cells, all fed by the top's inputs, the first driving its outputs.
class NetlistFile {
public:
    // compact: without the layout's line breaks and indentation, about half the size.
    NetlistFile(int64_t cells, int modules, std::string path, bool compact = false)
        : path_(std::move(path)), modules_(modules), pairs_(cells / 2 / (modules ? modules : 1)), compact_(compact) {
        FILE* f = std::fopen(path_.c_str(), "wb");
        if (!f) return;
        out_ = f;
        buf_.reserve(1 << 20);
        Write();
        Flush();
        std::fclose(f);
        bytes_ = std::filesystem::file_size(path_);
    }
    ~NetlistFile() { std::filesystem::remove(path_); }
    const char* path() const { return path_.c_str(); }
    uint64_t bytes() const { return bytes_; }
    int64_t cells() const { return pairs_ * 2 * (modules_ ? modules_ : 1); }

private:
    static constexpr int kInputs = 64;
    static constexpr int kOutputs = 64;
    // Bit numbers: 2 clk, 3 rst, inputs, then per pair the LUT output and the flip-flop output.
    int64_t InputBit(int64_t i) const { return 4 + i; }
    int64_t LutBit(int64_t p) const { return 4 + kInputs + 2 * p; }
    int64_t FfBit(int64_t p) const { return 5 + kInputs + 2 * p; }
    int64_t OutputBit(int64_t i) const { return FfBit(pairs_ - 1 - (i % pairs_)); }

    uint64_t Next() {
        rng_ ^= rng_ << 13;
        rng_ ^= rng_ >> 7;
        rng_ ^= rng_ << 17;
        return rng_;
    }
    int64_t LutInput() {
        uint64_t r = Next();
        if (r % 16 == 0) return InputBit(static_cast<int64_t>((r >> 8) % kInputs));
        return FfBit(static_cast<int64_t>((r >> 8) % static_cast<uint64_t>(pairs_)));
    }

    void Put(const char* text) {
        if (compact_) {
            for (; *text; ++text)
                if (*text != ' ' && *text != '\n') buf_ += *text;
        } else {
            buf_ += text;
        }
        if (buf_.size() > (1 << 20) - 4096) Flush();
    }
    void Put(int64_t n) { buf_ += std::to_string(n); }
    void Put(int n) { Put(int64_t{n}); }
    void Flush() {
        std::fwrite(buf_.data(), 1, buf_.size(), out_);
        buf_.clear();
    }
    void Bits(int64_t first, int64_t count, int64_t step) {
        Put("[ ");
        for (int64_t i = 0; i < count; ++i) {
            if (i) Put(", ");
            Put(first + i * step);
        }
        Put(" ]");
    }

    void Write() {
        Put("{\n  \"creator\": \"Yosys-style-generator\",\n  \"modules\": {\n");
        if (!modules_) {
            Module("top", true);
        } else {
            for (int k = 0; k < modules_; ++k) {
                Module(("sub" + std::to_string(k)).c_str(), false);
                Put(",\n");
            }
            Top();
        }
        Put("\n  }\n}\n");
    }

    // The ports every module has: clk, rst, in and out, on the bits given.
    void Ports(bool top, const std::string& out_bits) {
        Put("      \"attributes\": {\n");
        if (top) Put("        \"top\": \"00000000000000000000000000000001\",\n");
        Put("        \"src\": \"gen.v:1.1-9.10\"\n      },\n      \"ports\": {\n");
        Put("        \"clk\": {\n          \"direction\": \"input\",\n          \"bits\": [ 2 ]\n        },\n");
        Put("        \"rst\": {\n          \"direction\": \"input\",\n          \"bits\": [ 3 ]\n        },\n");
        Put("        \"in\": {\n          \"direction\": \"input\",\n          \"bits\": ");
        Bits(InputBit(0), kInputs, 1);
        Put("\n        },\n        \"out\": {\n          \"direction\": \"output\",\n          \"bits\": [ ");
        Put(out_bits.c_str());
        Put(" ]\n        }\n      },\n");
    }

    // Ends the cells and starts the netnames with those of the inputs (the last one left open).
    void InputNetnames() {
        Put("\n      },\n      \"netnames\": {\n");
        Put("        \"clk\": {\n          \"hide_name\": 0,\n          \"bits\": [ 2 ]\n        },\n");
        Put("        \"rst\": {\n          \"hide_name\": 0,\n          \"bits\": [ 3 ]\n        },\n");
        Put("        \"in\": {\n          \"hide_name\": 0,\n          \"bits\": ");
        Bits(InputBit(0), kInputs, 1);
    }

    std::string OutputBits(int64_t first, int64_t step) {
        std::string bits;
        for (int i = 0; i < kOutputs; ++i) bits += (i ? ", " : "") + std::to_string(first + i * step);
        return bits;
    }

    // The top of a hierarchical netlist: one instance of each module, o<k> the outputs of u<k>.
    void Top() {
        Put("    \"top\": {\n");
        const int64_t outs = 4 + kInputs;  // bits of the instances' outputs
        Ports(true, OutputBits(outs, 1));
        Put("      \"cells\": {\n");
        for (int k = 0; k < modules_; ++k) {
            Put(k ? ",\n" : "");
            Put("        \"u");
            Put(k);
            Put("\": {\n          \"hide_name\": 0,\n          \"type\": \"sub");
            Put(k);
            Put("\",\n          \"parameters\": {\n          },\n          \"attributes\": {\n          },\n"
                "          \"connections\": {\n            \"clk\": [ 2 ],\n            \"rst\": [ 3 ],\n"
                "            \"in\": ");
            Bits(InputBit(0), kInputs, 1);
            Put(",\n            \"out\": ");
            Bits(outs + int64_t{k} * kOutputs, kOutputs, 1);
            Put("\n          }\n        }");
        }
        InputNetnames();
        Put("\n        }");
        for (int k = 0; k < modules_; ++k) {
            Put(",\n        \"");
            Put(k ? "o" : "out");
            if (k) Put(k);
            Put("\": {\n          \"hide_name\": 0,\n          \"bits\": ");
            Bits(outs + int64_t{k} * kOutputs, kOutputs, 1);
            Put("\n        }");
        }
        Put("\n      }\n    }");
    }

    void Module(const char* name, bool top) {
        Put("    \"");
        Put(name);
        Put("\": {\n");
        std::string out_bits;
        for (int i = 0; i < kOutputs; ++i) out_bits += (i ? ", " : "") + std::to_string(OutputBit(i));
        Ports(top, out_bits);
        Put("      \"cells\": {\n");
        for (int64_t p = 0; p < pairs_; ++p) {
            Put(p ? ",\n" : "");
            Put("        \"$abc$7$auto$lut");
            Put(p);
            Put("\": {\n          \"hide_name\": 1,\n          \"type\": \"LUT4\",\n          \"parameters\": {\n"
                "            \"INIT\": \"0110100110010110\"\n          },\n          \"attributes\": {\n"
                "          },\n          \"port_directions\": {\n            \"I0\": \"input\",\n"
                "            \"I1\": \"input\",\n            \"I2\": \"input\",\n            \"I3\": \"input\",\n"
                "            \"O\": \"output\"\n          },\n          \"connections\": {\n");
            const char* lut_pins[] = {"I0", "I1", "I2", "I3"};
            for (const char* pin : lut_pins) {
                Put("            \"");
                Put(pin);
                Put("\": [ ");
                Put(LutInput());
                Put(" ],\n");
            }
            Put("            \"O\": [ ");
            Put(LutBit(p));
            Put(" ]\n          }\n        },\n");
            Put("        \"r");
            Put(p / 32);
            Put("_reg[");
            Put(p % 32);
            Put("]\": {\n          \"hide_name\": 0,\n          \"type\": \"FDRE\",\n          \"parameters\": {\n"
                "            \"INIT\": \"0\"\n          },\n          \"attributes\": {\n"
                "            \"src\": \"gen.v:5.3-5.40\"\n          },\n          \"port_directions\": {\n"
                "            \"C\": \"input\",\n            \"CE\": \"input\",\n            \"D\": \"input\",\n"
                "            \"Q\": \"output\",\n            \"R\": \"input\"\n          },\n"
                "          \"connections\": {\n            \"C\": [ 2 ],\n            \"CE\": [ \"1\" ],\n"
                "            \"D\": [ ");
            Put(LutBit(p));
            Put(" ],\n            \"Q\": [ ");
            Put(FfBit(p));
            Put(" ],\n            \"R\": [ 3 ]\n          }\n        }");
        }
        InputNetnames();
        Put("\n        },\n        \"out\": {\n          \"hide_name\": 0,\n          \"bits\": [ ");
        Put(out_bits.c_str());
        Put(" ]\n        }");
        for (int64_t p = 0; p < pairs_; ++p) {
            Put(",\n        \"$abc$7$n");
            Put(LutBit(p));
            Put("\": {\n          \"hide_name\": 1,\n          \"bits\": [ ");
            Put(LutBit(p));
            Put(" ]\n        }");
        }
        for (int64_t p = 0; p < pairs_; p += 32) {
            int64_t width = pairs_ - p < 32 ? pairs_ - p : 32;
            Put(",\n        \"r");
            Put(p / 32);
            Put("\": {\n          \"hide_name\": 0,\n          \"bits\": ");
            Bits(FfBit(p), width, 2);
            Put(",\n          \"attributes\": {\n            \"src\": \"gen.v:3.14-3.15\"\n          }\n        }");
        }
        Put("\n      }\n    }");
    }

    std::string path_;
    int modules_;
    int64_t pairs_;
    bool compact_;
    FILE* out_ = nullptr;
    std::string buf_;
    uint64_t rng_ = 0x9E3779B97F4A7C15ull;
    uint64_t bytes_ = 0;
};

