// Reads a POD file into a tree of blocks, sharing nothing with the code that writes it.
#pragma once

#include <cstdint>
#include <cstring>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

struct PodBlock {
    uint32_t id = 0;
    std::vector<uint8_t> data;
    std::vector<PodBlock> children;

    std::vector<const PodBlock*> All(uint32_t childId) const {
        std::vector<const PodBlock*> found;
        for (const PodBlock& child : children)
            if (child.id == childId) found.push_back(&child);
        return found;
    }
    bool Has(uint32_t childId) const { return !All(childId).empty(); }
    const PodBlock& operator[](uint32_t childId) const {
        if (!Has(childId)) throw std::runtime_error("no block " + std::to_string(childId));
        return *All(childId)[0];
    }
    // The data as an array; the tests run on little-endian hosts.
    template <class T>
    std::vector<T> As() const {
        std::vector<T> values(data.size() / sizeof(T));
        if (!values.empty()) std::memcpy(values.data(), data.data(), values.size() * sizeof(T));
        return values;
    }
    uint32_t U32() const { return As<uint32_t>().at(0); }
    int32_t I32() const { return As<int32_t>().at(0); }
    std::vector<float> Floats() const { return As<float>(); }
    std::string Text() const { return reinterpret_cast<const char*>(data.data()); }
};

// Throws std::runtime_error where the nesting or a length is wrong.
class PodWalker {
  public:
    static PodBlock Walk(const std::vector<uint8_t>& bytes) {
        PodWalker walker{bytes};
        PodBlock file;
        while (walker.at_ < bytes.size()) file.children.push_back(walker.Block());
        return file;
    }

  private:
    explicit PodWalker(const std::vector<uint8_t>& bytes) : bytes_(bytes) {}

    static void Require(bool holds, uint32_t id, const char* what) {
        if (!holds) throw std::runtime_error("block " + std::to_string(id) + " " + what);
    }
    uint32_t PeekWord() const {
        Require(bytes_.size() - at_ >= 4, 0, "is cut off");
        return bytes_[at_] | bytes_[at_ + 1] << 8 | bytes_[at_ + 2] << 16 | uint32_t{bytes_[at_ + 3]} << 24;
    }
    uint32_t Word() {
        const uint32_t word = PeekWord();
        at_ += 4;
        return word;
    }
    PodBlock Block() {
        static const std::set<uint32_t> containers = {1001, 2010, 2011, 2012, 2013, 2014, 2015, 6003,
                                                      6006, 6007, 6008, 6009, 6010, 6011, 6012, 6013};
        PodBlock block;
        block.id = Word();
        const uint32_t length = Word(), end = block.id | 0x80000000u;
        const bool container = containers.count(block.id) != 0;
        Require(length <= (container ? 0 : bytes_.size() - at_), block.id, "is too long");
        const auto data = bytes_.begin() + static_cast<long>(at_);
        block.data.assign(data, data + length);
        at_ += length;
        while (container && PeekWord() != end) block.children.push_back(Block());
        Require(Word() == end && Word() == 0, block.id, "is not closed");
        return block;
    }

    const std::vector<uint8_t>& bytes_;
    size_t at_ = 0;
};
