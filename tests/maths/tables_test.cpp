// Sine, cosine and colour tables.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>

#include "maths/colourutils.h"
#include "maths/mymath.h"
#include "support/frame_record.h"

namespace {

TEST(tables, sine_and_cosine_are_right_to_the_last_bit_of_their_angle) {
  mymath::init();
  EXPECT_TRUE(mymath::sintabf[0] == 0 && mymath::costabf[0] == 1);
  for (unsigned int i = 1; i < 16384; ++i) {
    // The angle is a product in single precision, by a factor that is itself rounded.
    const float angle = static_cast<float>(i) * 0.0003834951969f;
    const double sine = std::sin(static_cast<double>(angle)), cosine = std::cos(static_cast<double>(angle));
    ASSERT_NEAR(mymath::sintabf[i], sine, std::fabs(sine) * 0x1p-23 + 1e-12) << i;
    ASSERT_NEAR(mymath::costabf[i], cosine, std::fabs(cosine) * 0x1p-23 + 1e-12) << i;
    ASSERT_NEAR(angle, i * (std::acos(-1.0) / 8192), 5e-7);
  }
  EXPECT_EQ(mymath::sin(4096), 1);
  EXPECT_EQ(mymath::cos(8192), -1);
  EXPECT_EQ(mymath::cos(16384u * 5 + 77), mymath::costabf[77]);
  EXPECT_EQ(mymath::sin(static_cast<unsigned int>(-1)), mymath::sintabf[16383]);
  EXPECT_EQ(mymath::TRIG_ANGLEREVERSEFACTOR, static_cast<double>(static_cast<float>(8192 / std::acos(-1.0))));
  frame_record::add("table_sine", mymath::sintabf, mymath::angles);
  frame_record::add("table_cosine", mymath::costabf, mymath::angles);
}

// The textbook conversion by chroma: how much of it each channel has is a trapezium over the hue.
unsigned int rgb_of(unsigned int word, int channel, bool& near_an_edge) {
  const double hue = 6 * ((word >> 10) / 64.0 + 1 / 128.0);
  const double saturation = (word >> 7 & 7) / 8.0 + 1 / 16.0;
  const double lightness = (word & 127) / 128.0;
  const double chroma = (1 - std::fabs(2 * lightness - 1)) * saturation;
  const double ramp = channel == 0   ? std::fabs(hue - 3) - 1
                      : channel == 1 ? 2 - std::fabs(hue - 2)
                                     : 2 - std::fabs(hue - 4);
  const double linear = lightness - chroma / 2 + chroma * std::clamp(ramp, 0.0, 1.0);
  const double scaled = std::pow(linear, static_cast<double>(0.7f)) * 256;
  near_an_edge = std::fabs(scaled - std::round(scaled)) < 1e-4;
  return static_cast<unsigned int>(near_an_edge ? std::round(scaled) : scaled);
}

TEST(tables, every_colour_word_is_its_colour) {
  colourutils::init();
  int at_edges = 0;
  for (unsigned int word = 0; word < 65536; ++word) {
    const unsigned int rgb = colourutils::hsl_2_rgb(word | 0xABCD0000u);
    ASSERT_LT(rgb, 0x01000000u);
    for (int channel = 0; channel < 3; ++channel) {
      bool near_an_edge = false;
      const unsigned int expected = rgb_of(word, channel, near_an_edge);
      const unsigned int got = rgb >> (16 - 8 * channel) & 255;
      // Where the exact value is a whole number, rounding decides between it and the one below.
      const bool right = got == expected || (near_an_edge && got + 1 == expected);
      ASSERT_TRUE(right) << "word " << word << " channel " << channel << ": " << got << ", not " << expected;
      at_edges += near_an_edge && expected != 0;
    }
  }
  EXPECT_LT(at_edges, 200);
  EXPECT_EQ(colourutils::hsl_2_rgb(0), 0u);
  frame_record::add("table_colours", colourutils::coltab, 65536);
}

TEST(tables, bits_of_a_number) {
  EXPECT_EQ(mymath::bitsrequired(0), 0u);
  for (unsigned int bits = 1; bits <= 32; ++bits) {
    const unsigned int lowest = 1u << (bits - 1);
    EXPECT_EQ(mymath::bitsrequired(lowest), bits);
    EXPECT_EQ(mymath::bitsrequired(lowest + (lowest - 1)), bits);
  }
}

}  // namespace
