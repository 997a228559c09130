// Whole images, compared bit for bit.
#pragma once

#include <gtest/gtest.h>

#include <bit>
#include <cstdint>
#include <cstdio>

#include "support/frame_record.h"
#include "support/toolkit_fixture.h"

// Tells the first element that differs, as its bits.
template <class T>
testing::AssertionResult same_image(guarded_image<T>& found, const T* expected) {
  for (std::size_t i = 0; i < found.elements(); ++i) {
    const auto is = std::bit_cast<std::uint32_t>(found.data()[i]), wanted = std::bit_cast<std::uint32_t>(expected[i]);
    if (is == wanted) continue;
    const int at = static_cast<int>(i);
    char text[80];
    std::snprintf(text, sizeof text, "(%d, %d): %08X, expected %08X", at % found.width, at / found.width, is, wanted);
    return testing::AssertionFailure() << text;
  }
  return found.intact() ? testing::AssertionSuccess() : testing::AssertionFailure() << "a write outside the image";
}

// What a frame adds to a frame_record of many.
template <class T>
std::uint32_t hash_of(guarded_image<T>& image) {
  return static_cast<std::uint32_t>(frame_record::hash(image.data(), sizeof(T) * image.elements()));
}
