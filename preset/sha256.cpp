// SPDX-License-Identifier: MIT
#include "preset/sha256.h"

#include <bit>
#include <vector>

namespace vxcomn {
namespace {

constexpr size_t kBlockBytes = 64;
constexpr size_t kRounds = 64;

// The first 32 bits of the fraction of a prime's square or cube root, in whole numbers: the largest r with r^k <= p * 2^32k is the
// root times 2^32, and its low word is the fraction. The 64th prime is 311, so roots are below 2^5, and all products below 2^128.
__extension__ using Wide = unsigned __int128;

constexpr uint32_t rootFraction(uint32_t prime, int degree) {
    const Wide power = static_cast<Wide>(prime) << 32 * degree;
    Wide root = 0;
    for (int bit = degree == 2 ? 37 : 35; bit >= 0; --bit) {
        const Wide trial = root | Wide{1} << bit;
        if ((degree == 2 ? trial * trial : trial * trial * trial) <= power) root = trial;
    }
    return static_cast<uint32_t>(root);
}

template <size_t N>
constexpr std::array<uint32_t, N> rootTable(int degree) {
    std::array<uint32_t, N> table{};
    size_t found = 0;
    for (uint32_t number = 2; found < N; ++number) {
        bool prime = true;
        for (uint32_t divisor = 2; divisor * divisor <= number; ++divisor) prime = prime && number % divisor != 0;
        if (prime) table[found++] = rootFraction(number, degree);
    }
    return table;
}

constexpr std::array<uint32_t, 8> kInitial = rootTable<8>(2);
constexpr std::array<uint32_t, kRounds> kConstants = rootTable<kRounds>(3);

void digestBlock(std::array<uint32_t, 8> &hash, const uint8_t *block) {
    std::array<uint32_t, kRounds> schedule{};
    for (size_t t = 0; t < 16; ++t) {
        schedule[t] =
            uint32_t{block[4 * t]} << 24 | uint32_t{block[4 * t + 1]} << 16 | uint32_t{block[4 * t + 2]} << 8 | block[4 * t + 3];
    }
    for (size_t t = 16; t < kRounds; ++t) {
        const uint32_t a = schedule[t - 15], b = schedule[t - 2];
        schedule[t] = schedule[t - 16] + (std::rotr(a, 7) ^ std::rotr(a, 18) ^ a >> 3) + schedule[t - 7] +
                      (std::rotr(b, 17) ^ std::rotr(b, 19) ^ b >> 10);
    }
    auto [a, b, c, d, e, f, g, h] = hash;
    for (size_t t = 0; t < kRounds; ++t) {
        const uint32_t first =
            h + (std::rotr(e, 6) ^ std::rotr(e, 11) ^ std::rotr(e, 25)) + ((e & f) ^ (~e & g)) + kConstants[t] + schedule[t];
        const uint32_t second = (std::rotr(a, 2) ^ std::rotr(a, 13) ^ std::rotr(a, 22)) + ((a & b) ^ (a & c) ^ (b & c));
        h = g, g = f, f = e, e = d + first, d = c, c = b, b = a, a = first + second;
    }
    const std::array<uint32_t, 8> state{a, b, c, d, e, f, g, h};
    for (size_t i = 0; i < hash.size(); ++i) hash[i] += state[i];
}

}  // namespace

std::array<uint32_t, 8> sha256(std::span<const uint8_t> bytes) {
    std::array<uint32_t, 8> hash = kInitial;
    const uint64_t bits = uint64_t{bytes.size()} * 8;
    for (; bytes.size() >= kBlockBytes; bytes = bytes.subspan(kBlockBytes)) digestBlock(hash, bytes.data());
    // The end: a one bit, zeros, and the length in bits, filling one or two blocks.
    std::vector<uint8_t> end(bytes.begin(), bytes.end());
    end.push_back(0x80);
    end.resize(end.size() <= kBlockBytes - 8 ? kBlockBytes : 2 * kBlockBytes);
    for (size_t i = 0; i < 8; ++i) end[end.size() - 1 - i] = static_cast<uint8_t>(bits >> 8 * i);
    for (size_t at = 0; at < end.size(); at += kBlockBytes) digestBlock(hash, end.data() + at);
    return hash;
}

std::string sha256Text(std::span<const uint8_t> bytes) {
    std::string text;
    for (const uint32_t word : sha256(bytes)) {
        for (int shift = 28; shift >= 0; shift -= 4) text += "0123456789abcdef"[word >> shift & 0xF];
    }
    return text;
}

}  // namespace vxcomn
