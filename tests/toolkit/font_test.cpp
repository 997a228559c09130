// Fonts against a pixel-by-pixel oracle, through the natives.
#include <climits>

#include "support/frame_record.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

enum kind { mono, alpha, paletted };

struct glyph_data {
  bool present;
  int width, height, y_offset, x_offset;
  std::vector<jbyte> bytes;
};

struct mask_data {
  std::vector<jint> starts, lengths;
};

struct call {
  int glyph, x, y;
  unsigned int colour;
  bool solid, upwards, masked;
  int mask_x, mask_y;
};

// What a glyph byte makes of a target pixel.
unsigned int inked(kind font, unsigned int d, unsigned int g, const call& c, const std::vector<jint>& palette) {
  const auto mix = [&](unsigned int a, unsigned int ia) {
    const unsigned int rest = (((d & 0xFF00) * ia) & 0xFF0000) + (((d & 0xFF00FF) * ia) & 0xFF00FF00);
    const unsigned int own = (((c.colour & 0xFF00) * a) & 0xFF0000) + (((c.colour & 0xFF00FF) * a) & 0xFF00FF00);
    return (rest >> 8) + (own >> 8);
  };
  const unsigned int a = c.colour >> 24;
  if (g == 0) return d;
  if (font == alpha) return mix(g, 256 - g);
  if (font == paletted) return c.solid ? c.colour : static_cast<unsigned int>(palette[g]);
  if (a == 0) return d;
  return a == 255 ? c.colour : mix(a, 255 - a);
}

class font_test : public toolkit_fixture {
 public:
  struct natives {
    const char* class_name;
    decltype(&Java_m_UA) plot;
    decltype(&Java_m_MA) plot_masked;
    decltype(&Java_m_f) plot_upwards;
    decltype(&Java_m_ma) destroy;
  };
  static constexpr natives table[] = {{"m", Java_m_UA, Java_m_MA, Java_m_f, Java_m_ma},
                                      {"ea", Java_ea_UA, Java_ea_P, Java_ea_f, Java_ea_ma},
                                      {"ia", Java_ia_UA, Java_ia_GA, Java_ia_f, Java_ia_ma}};

  jobject load(kind font, const std::vector<glyph_data>& glyphs, const std::vector<jint>& palette) {
    std::vector<jobject> bitmaps;
    std::vector<jint> widths, heights, y_offsets, x_offsets;
    for (const glyph_data& g : glyphs) {
      bitmaps.push_back(g.present ? java.new_bytes(g.bytes) : nullptr);
      widths.push_back(g.width);
      heights.push_back(g.height);
      y_offsets.push_back(g.y_offset);
      x_offsets.push_back(g.x_offset);
    }
    jobject font_peer = java.new_object(table[font].class_name);
    const auto w = java.new_ints(widths), h = java.new_ints(heights);
    const auto yo = java.new_ints(y_offsets), xo = java.new_ints(x_offsets);
    if (font == paletted) {
      Java_ia_EA(env, font_peer, 0, pool_peer, java.new_objects(bitmaps), java.new_ints(palette), w, h, yo, xo);
    } else {
      (font == mono ? Java_m_n : Java_ea_n)(env, font_peer, 0, pool_peer, java.new_objects(bitmaps), w, h, yo, xo);
    }
    return font_peer;
  }

  void plot(kind font, jobject font_peer, jobject mask, const call& c) {
    const auto glyph = static_cast<jchar>(c.glyph);
    const auto ink = static_cast<jint>(c.colour);
    const natives& n = table[font];
    if (c.masked) {
      n.plot_masked(env, font_peer, glyph, c.x, c.y, ink, c.solid, mask, c.mask_x, c.mask_y);
    } else {
      (c.upwards ? n.plot_upwards : n.plot)(env, font_peer, glyph, c.x, c.y, ink, c.solid);
    }
  }

  // Draws the call pixel by pixel over the target's whole clip rectangle.
  void expect(kind font, std::vector<unsigned int>& image, const glyph_data& g, const mask_data& mask, const call& c,
              const std::vector<jint>& palette) {
    if (!g.present) return;
    const long long left = c.upwards ? c.x : static_cast<long long>(c.x) + g.x_offset;
    const long long top = c.upwards ? c.y : static_cast<long long>(c.y) + g.y_offset;
    for (int y = kit().clip_y0; y < kit().clip_y1; ++y) {
      for (int x = kit().clip_x0; x < kit().clip_x1; ++x) {
        const long long i = x - left, j = y - top;
        const int box_width = c.upwards ? g.height : g.width;
        const int box_height = c.upwards ? g.width : g.height;
        if (i < 0 || j < 0 || i >= box_width || j >= box_height) continue;
        if (c.masked) {
          const int r = y - c.mask_y;
          if (r < 0 || r >= static_cast<int>(mask.starts.size())) continue;
          const int start = c.mask_x + mask.starts[r];
          if (x < start || x >= start + mask.lengths[r]) continue;
        }
        const long long source = c.upwards ? i * g.width + (g.width - 1 - j) : j * g.width + i;
        unsigned int& d = image[static_cast<std::size_t>(y) * kit().width + x];
        d = inked(font, d, static_cast<unsigned char>(g.bytes[source]), c, palette);
      }
    }
  }
};

TEST_F(font_test, every_font_and_form_draws_as_told_over_random_calls) {
  test_random random(604);
  for (const kind font : {mono, alpha, paletted}) {
    std::vector<jint> palette;
    for (int i = 0; i < 200; ++i) palette.push_back(static_cast<jint>(random.word()));
    std::vector<glyph_data> glyphs;
    for (int i = 0; i < 24; ++i) {
      glyph_data g{!random.one_in(8),     random.between(0, 19), random.between(0, 19),
                   random.between(-5, 5), random.between(-5, 5), {}};
      // Rows may be longer than the glyph needs.
      for (int n = g.width * g.height + random.between(0, 3); n > 0; --n) {
        g.bytes.push_back(static_cast<jbyte>(random.one_in(2) ? 0 : random.between(0, 199)));
      }
      if (font == alpha && !g.bytes.empty()) g.bytes[0] = static_cast<jbyte>(255);
      glyphs.push_back(g);
    }
    jobject font_peer = load(font, glyphs, palette);
    ASSERT_EQ(java.take_exception(), "");

    for (int round = 0; round < 12; ++round) {
      make_target(random.between(20, 70), random.between(20, 70));
      for (std::size_t i = 0; i < colour.elements(); ++i) colour.data()[i] = random.word();
      mask_data mask;
      for (int r = random.between(0, 40); r > 0; --r) {
        mask.starts.push_back(random.between(-10, 30));
        mask.lengths.push_back(random.between(-4, 40));
      }
      jobject mask_peer = java.new_object("wa");
      Java_wa_l(env, mask_peer, 0, pool_peer, 40, 40, java.new_ints(mask.starts), java.new_ints(mask.lengths));
      kit().setclipping(random.between(-5, 15), random.between(-5, 15), random.between(10, 80), random.between(10, 80));
      std::vector<unsigned int> expected = colour.copy();
      for (int n = 0; n < 150; ++n) {
        call c{random.between(0, 23),
               random.between(-20, 75),
               random.between(-20, 75),
               random.word(),
               random.one_in(2),
               false,
               false,
               random.between(-20, 40),
               random.between(-20, 40)};
        if (random.one_in(3)) c.colour |= 0xFF000000u;
        if (random.one_in(9)) c.colour &= 0x00FFFFFFu;
        if (random.one_in(20)) c.x = random.one_in(2) ? INT_MAX - 2 : INT_MIN + 2;
        if (random.one_in(20)) c.y = random.one_in(2) ? INT_MAX - 2 : INT_MIN + 2;
        c.masked = random.one_in(3);
        c.upwards = !c.masked && random.one_in(2);
        plot(font, font_peer, mask_peer, c);
        expect(font, expected, glyphs[c.glyph], mask, c, palette);
        ASSERT_EQ(colour.copy(), expected) << "font " << font << ", call " << n << " of round " << round << ": glyph "
                                           << c.glyph << " at " << c.x << ", " << c.y;
      }
      frame_record::add(("fonts_" + std::to_string(font) + "_" + std::to_string(round)).c_str(), colour.data(),
                        colour.elements());
      Java_wa_ma(env, mask_peer);
    }
    table[font].destroy(env, font_peer);
    table[font].destroy(env, font_peer);  // only clears the field again
  }
  EXPECT_EQ(Java_ja_za(env, peer), 0);
}

TEST_F(font_test, what_is_missing_draws_nothing_and_what_is_wrong_is_refused) {
  make_target(16, 16);
  const std::vector<unsigned int> black = colour.copy();
  const glyph_data solid{true, 4, 4, 0, 0, std::vector<jbyte>(16, 1)};
  jobject font_peer = load(paletted, {solid}, {0, 0x123456});
  for (const int glyph : {-1, 1, 32767, -32768}) {
    plot(paletted, font_peer, nullptr, {glyph, 2, 2, 0xFFFFFFFF, true, false, false, 0, 0});
    plot(paletted, font_peer, nullptr, {glyph, 2, 2, 0xFFFFFFFF, true, true, false, 0, 0});
  }
  EXPECT_EQ(colour.copy(), black);
  plot(paletted, font_peer, nullptr, {0, 2, 2, 0, false, false, true, 0, 0});
  EXPECT_EQ(java.take_exception(), "java.lang.NullPointerException: ");

  // solid is true for the value 1 alone.
  Java_ia_UA(env, font_peer, 0, 0, 0, 0x777777, 2);
  EXPECT_EQ(colour.at(0, 0), 0x123456u);
  Java_ia_ma(env, font_peer);

  const jint before = Java_ja_za(env, peer);
  jobject bad = load(alpha, {{true, 4, 4, 0, 0, std::vector<jbyte>(15, 1)}}, {});
  EXPECT_EQ(java.take_exception(), "java.lang.ArrayIndexOutOfBoundsException: glyphs[0]: length 15, 16 needed");
  EXPECT_EQ(java.nativeid(bad), 0);
  bad = load(paletted, {solid}, {5});
  EXPECT_EQ(java.take_exception(),
            "java.lang.ArrayIndexOutOfBoundsException: palette: length 1, but glyphs[0] uses index 1");
  // Bytes that are never drawn may be anything: past the bitmap, or of a glyph without a size.
  bad = load(paletted, {{true, 1, 1, 0, 0, {0, 9}}, {true, 0, 4, 0, 0, {9}}}, {5});
  EXPECT_EQ(java.take_exception(), "");
  Java_ia_ma(env, bad);
  Java_m_n(env, bad, 0, nullptr, java.new_objects({}), nullptr, nullptr, nullptr, nullptr);
  EXPECT_EQ(java.take_exception(), "java.lang.NullPointerException: ");
  EXPECT_EQ(Java_ja_za(env, peer), before);

  // Without metrics or palette there is a font, and it draws nothing.
  colour.fill(0);
  jobject bare = java.new_object("ia");
  Java_ia_EA(env, bare, 0, pool_peer, java.new_objects({java.new_bytes(solid.bytes)}), nullptr, nullptr, nullptr,
             nullptr, nullptr);
  EXPECT_EQ(java.take_exception(), "");
  plot(paletted, bare, nullptr, {0, 2, 2, 0, false, false, false, 0, 0});
  plot(paletted, bare, nullptr, {0, 2, 2, 0, true, true, false, 0, 0});
  EXPECT_EQ(colour.copy(), black);
  Java_ia_ma(env, bare);
  plot(paletted, bare, nullptr, {0, 2, 2, 0, true, true, false, 0, 0});
  EXPECT_EQ(java.take_exception(), "java.lang.NullPointerException: ");
}

}  // namespace
