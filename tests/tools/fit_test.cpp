#include "terminal/fit.h"

#include <gtest/gtest.h>

#include "terminal/text.h"

namespace VANO::TESTS {
namespace {

using namespace CTL;

constexpr Style kAscii{};
constexpr Style kUtf8{true, false};

TEST(FitTest, WhatFitsStaysAsItIs) {
    EXPECT_EQ(Fit("", 0, kAscii), "");
    EXPECT_EQ(Fit("/photos", 7, kAscii), "/photos");
    EXPECT_EQ(Fit("/größe", 6, kUtf8), "/größe");
}

TEST(FitTest, LongTextsLoseTheirMiddle) {
    EXPECT_EQ(Fit("/photos/2016/trip", 11, kAscii), "/pho...trip");
    EXPECT_EQ(Fit("/photos/2016/trip", 12, kAscii), "/pho.../trip");
    EXPECT_EQ(Fit("/photos/2016/trip", 11, kUtf8), "/phot…/trip");
}

TEST(FitTest, HardlyAnyRoomIsFilledWithDots) {
    EXPECT_EQ(Fit("/photos", 3, kAscii), "...");
    EXPECT_EQ(Fit("/photos", 1, kUtf8), ".");
    EXPECT_EQ(Fit("/photos", 0, kUtf8), "");
}

TEST(FitTest, NeverTakesMoreColumnsThanThereAre) {
    // Wide characters, and marks that stand on the character before them.
    const std::string text = "/写真/e\xcc\x81te\xcc\x81/夏休み/2016";
    for (std::size_t columns = 0; columns < 30; ++columns) {
        for (const Style &style : {kAscii, kUtf8}) {
            const std::string fitted = Fit(text, columns, style);
            EXPECT_LE(Columns(fitted), columns) << fitted;
            EXPECT_EQ(Shown(fitted), fitted) << "no character was torn apart";
        }
    }
    EXPECT_EQ(Fit("e\xcc\x81xxxxxe\xcc\x81", 3, kUtf8), "e\xcc\x81…e\xcc\x81");
}

TEST(BarTest, FillsFromTheLeft) {
    EXPECT_EQ(Bar(0, 10, kAscii), "[--------]");
    EXPECT_EQ(Bar(0.5, 10, kAscii), "[####----]");
    EXPECT_EQ(Bar(1, 10, kAscii), "[########]");
    EXPECT_EQ(Bar(0.5, 4, kUtf8), "██░░");
}

TEST(BarTest, IsFullAtTheEndOnly) {
    EXPECT_EQ(Bar(0.999, 10, kAscii), "[#######-]");
    EXPECT_EQ(Bar(0.999, 4, kUtf8), "███░");
}

TEST(BarTest, StaysInsideItsRoomWhateverItIsAskedFor) {
    EXPECT_EQ(Bar(-1, 6, kAscii), "[----]");
    EXPECT_EQ(Bar(7, 6, kAscii), "[####]");
    EXPECT_EQ(Bar(0.5, 2, kAscii), "  ");
    EXPECT_EQ(Bar(0.5, 0, kUtf8), "");
}

} // namespace
} // namespace VANO::TESTS
