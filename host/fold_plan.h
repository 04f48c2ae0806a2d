// SPDX-License-Identifier: MIT
//
// What the fold-down of each speaker mask comes to. The rule table says where the sound of a missing speaker goes; from it a plan
// is drawn for each of the 256 subsets of the eight speakers, at compile time. A plan lists each destination with its sources in
// the order of the rules, because the order of the f32 additions is the order of the roundings.
//
// Every destination is a speaker of the mask and every source is none of it, so no sample is folded twice.
#pragma once

#include <array>
#include <cstdint>

#include "vxcomn/block.h"

namespace vxcomn {

// Kept: 0.7083 as written, not the square root of one half.
inline constexpr float kFoldHalf = 0.5F;
inline constexpr float kFoldSide = 0.7083F;

struct FoldTerm {
    uint8_t source;  // slot
    float coefficient;
};

struct FoldDestination {
    uint8_t slot;
    uint8_t terms;
    std::array<FoldTerm, VX_SLOT_COUNT> term;
};

struct FoldPlan {
    uint8_t destinations = 0;
    std::array<FoldDestination, VX_SLOT_COUNT> destination{};
};

namespace fold_detail {

inline constexpr uint32_t kSpeakerOfSlot[VX_SLOT_COUNT] = {
    VX_SPEAKER_FRONT_LEFT, VX_SPEAKER_FRONT_RIGHT, VX_SPEAKER_FRONT_CENTER, VX_SPEAKER_LOW_FREQUENCY,
    VX_SPEAKER_BACK_LEFT,  VX_SPEAKER_BACK_RIGHT,  VX_SPEAKER_SIDE_LEFT,    VX_SPEAKER_SIDE_RIGHT};

enum Slot : uint8_t { FL, FR, FC, LFE, BL, BR, SL, SR, none };

// One line of a rule group: if the mask has both destinations (or the first alone where the second is `none`), the source goes
// there.
struct Line {
    Slot first;
    Slot second;
    float coefficient;
};

struct Group {
    Slot source;
    std::array<Line, 10> lines;
    int count;
};

// Kept: the asymmetries. Sides go before backs for the fronts, fronts before backs for the sides, fronts before sides for the
// backs; centre and bass fall to the fronts with one half, to sides and backs with 0.7083.
inline constexpr Group kGroups[] = {
    {FL, {{{SL, none, kFoldSide}, {BL, none, kFoldSide}, {FC, none, kFoldHalf}, {LFE, none, kFoldHalf}}}, 4},
    {FR, {{{SR, none, kFoldSide}, {BR, none, kFoldSide}, {FC, none, kFoldHalf}, {LFE, none, kFoldHalf}}}, 4},
    {SL, {{{FL, none, kFoldSide}, {BL, none, kFoldSide}, {FC, none, kFoldHalf}, {LFE, none, kFoldHalf}}}, 4},
    {SR, {{{FR, none, kFoldSide}, {BR, none, kFoldSide}, {FC, none, kFoldHalf}, {LFE, none, kFoldHalf}}}, 4},
    {BL, {{{FL, none, kFoldSide}, {SL, none, kFoldSide}, {FC, none, kFoldHalf}, {LFE, none, kFoldHalf}}}, 4},
    {BR, {{{FR, none, kFoldSide}, {SR, none, kFoldSide}, {FC, none, kFoldHalf}, {LFE, none, kFoldHalf}}}, 4},
    {FC,
     {{{FL, FR, kFoldHalf},
       {FL, none, kFoldHalf},
       {FR, none, kFoldHalf},
       {SL, SR, kFoldSide},
       {SL, none, kFoldSide},
       {SR, none, kFoldSide},
       {BL, BR, kFoldSide},
       {BL, none, kFoldSide},
       {BR, none, kFoldSide},
       {LFE, none, kFoldSide}}},
     10},
    {LFE,
     {{{FC, none, kFoldSide},
       {FL, FR, kFoldHalf},
       {FL, none, kFoldHalf},
       {FR, none, kFoldHalf},
       {SL, SR, kFoldSide},
       {SL, none, kFoldSide},
       {SR, none, kFoldSide},
       {BL, BR, kFoldSide},
       {BL, none, kFoldSide},
       {BR, none, kFoldSide}}},
     10},
};

// `slots` has bit s set if the mask has the speaker of slot s.
constexpr bool has(uint32_t slots, Slot slot) {
    return slot == none || (slots >> slot & 1U) != 0;
}

constexpr void addTerm(FoldPlan &plan, Slot to, Slot from, float coefficient) {
    int i = 0;
    while (i < plan.destinations && plan.destination[i].slot != to) ++i;
    FoldDestination &destination = plan.destination[i];
    if (i == plan.destinations) {
        ++plan.destinations;
        destination.slot = to;
    }
    destination.term[destination.terms++] = {from, coefficient};
}

constexpr FoldPlan drawPlan(uint32_t slots) {
    FoldPlan plan;
    for (const Group &group : kGroups) {
        if (has(slots, group.source)) continue;
        for (int i = 0; i < group.count; ++i) {
            const Line &line = group.lines[i];
            if (!has(slots, line.first) || !has(slots, line.second)) continue;
            addTerm(plan, line.first, group.source, line.coefficient);
            if (line.second != none) addTerm(plan, line.second, group.source, line.coefficient);
            break;
        }
    }
    return plan;
}

constexpr std::array<FoldPlan, 256> drawAllPlans() {
    std::array<FoldPlan, 256> plans{};
    for (uint32_t slots = 0; slots < plans.size(); ++slots) plans[slots] = drawPlan(slots);
    return plans;
}

// Without a single speaker the right channel is added to the left one, unscaled.
constexpr FoldPlan drawNoMaskPlan() {
    FoldPlan plan;
    addTerm(plan, FL, FR, 1.0F);
    return plan;
}

}  // namespace fold_detail

// The plan of each subset of the eight speakers; bit s of the index stands for the speaker of slot s.
inline constexpr std::array<FoldPlan, 256> kFoldPlans = fold_detail::drawAllPlans();

// The plan of a mask of 0.
inline constexpr FoldPlan kNoMaskFoldPlan = fold_detail::drawNoMaskPlan();

// The index into kFoldPlans: bits 0 to 5 of the mask are slots 0 to 5, bits 9 and 10 are slots 6 and 7.
constexpr uint32_t foldPlanIndex(uint32_t channelMask) {
    return (channelMask & 0x3FU) | (channelMask >> 3 & 0xC0U);
}

}  // namespace vxcomn
