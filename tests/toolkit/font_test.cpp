// Fonts against a pixel-by-pixel oracle, through the natives.
#include <climits>

#include "support/frame_record.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

enum kind { mono, alpha, paletted };

struct glyph {
  bool present;
  int width, height, y_offset, x_offset;
  std::vector<jbyte> bytes;
};

struct call {
  int glyph, x, y;
  unsigned int colour;
  jboolean solid;
  bool upwards = false, masked = false;
  int mask_x = 0, mask_y = 0;
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
  if (font == paletted) return c.solid == 1 ? c.colour : static_cast<unsigned int>(palette[g]);
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

  jobject load(kind font, const std::vector<glyph>& glyphs, const std::vector<jint>& palette) {
    std::vector<jobject> rows;
    std::vector<jint> w, h, yo, xo;
    for (const glyph& g : glyphs) {
      rows.push_back(g.present ? java.new_bytes(g.bytes) : nullptr);
      w.push_back(g.width), h.push_back(g.height), yo.push_back(g.y_offset), xo.push_back(g.x_offset);
    }
    const jobject font_peer = java.new_object(table[font].class_name);
    const auto load_glyphs = [&](auto load_native, auto... palettes) {
      load_native(env, font_peer, 0, pool_peer, java.new_objects(rows), palettes..., java.new_ints(w), java.new_ints(h),
                  java.new_ints(yo), java.new_ints(xo));
    };
    if (font == paletted) load_glyphs(Java_ia_EA, java.new_ints(palette));
    if (font != paletted) load_glyphs(font == mono ? Java_m_n : Java_ea_n);
    return font_peer;
  }

  void plot(kind font, jobject font_peer, jobject mask, const call& c) {
    const auto code = static_cast<jchar>(c.glyph);
    const auto ink = static_cast<jint>(c.colour);
    const natives& n = table[font];
    if (c.masked) return n.plot_masked(env, font_peer, code, c.x, c.y, ink, c.solid, mask, c.mask_x, c.mask_y);
    (c.upwards ? n.plot_upwards : n.plot)(env, font_peer, code, c.x, c.y, ink, c.solid);
  }

  // Draws the call pixel by pixel over the target's whole clip rectangle.
  void expect(kind font, std::vector<unsigned int>& image, const glyph& g, const std::vector<jint>& starts,
              const std::vector<jint>& lengths, const call& c, const std::vector<jint>& palette) {
    if (!g.present) return;
    const long long left = c.upwards ? c.x : static_cast<long long>(c.x) + g.x_offset;
    const long long top = c.upwards ? c.y : static_cast<long long>(c.y) + g.y_offset;
    for (int y = kit().clip_y0; y < kit().clip_y1; ++y) {
      for (int x = kit().clip_x0; x < kit().clip_x1; ++x) {
        const long long i = x - left, j = y - top;
        if (i < 0 || j < 0 || i >= (c.upwards ? g.height : g.width) || j >= (c.upwards ? g.width : g.height)) continue;
        if (c.masked) {
          const int row = y - c.mask_y;
          if (row < 0 || row >= static_cast<int>(starts.size())) continue;
          const int start = c.mask_x + starts[row];
          if (x < start || x >= start + lengths[row]) continue;
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
    std::vector<jint> palette(200);
    for (jint& word : palette) word = static_cast<jint>(random.word());
    std::vector<glyph> glyphs;
    for (int i = 0; i < 24; ++i) {
      const int most = i < 21 ? 19 : 120;  // turned glyphs are drawn in tiles: a few have several
      const int w = random.between(0, most), h = random.between(0, most);
      glyph g{!random.one_in(8), w, h, random.between(-5, 5), random.between(-5, 5), {}};
      g.bytes.resize(static_cast<std::size_t>(w * h + random.between(0, 3)));  // rows may be longer than is needed
      for (jbyte& b : g.bytes) b = static_cast<jbyte>(random.one_in(2) ? 0 : random.between(0, 199));
      if (font == alpha && !g.bytes.empty()) g.bytes[0] = static_cast<jbyte>(255);
      glyphs.push_back(g);
    }
    const jobject font_peer = load(font, glyphs, palette);

    for (int round = 0; round < 12; ++round) {
      make_target(random.between(20, 100), random.between(20, 100));
      for (std::size_t i = 0; i < colour.elements(); ++i) colour.data()[i] = random.word();
      std::vector<jint> starts(static_cast<std::size_t>(random.between(0, 40))), lengths(starts.size());
      for (jint& start : starts) start = random.between(-10, 30);
      for (jint& length : lengths) length = random.between(-4, 40);
      const jobject mask = new_mask(starts, lengths);
      kit().setclipping(random.between(-5, 15), random.between(-5, 15), random.between(10, 110),
                        random.between(10, 110));
      std::vector<unsigned int> expected = colour.copy();
      for (int n = 0; n < 150; ++n) {
        const auto place = [&] {
          if (!random.one_in(20)) return random.between(-20, 75);
          return random.one_in(2) ? INT_MAX - 2 : INT_MIN + 2;
        };
        call c{random.between(0, 23), place(), place(), random.word(), static_cast<jboolean>(random.between(0, 2))};
        if (random.one_in(3)) c.colour |= 0xFF000000u;
        if (random.one_in(9)) c.colour &= 0x00FFFFFFu;
        c.masked = random.one_in(3);
        c.upwards = !c.masked && random.one_in(2);
        c.mask_x = random.between(-20, 40);
        c.mask_y = random.between(-20, 40);
        plot(font, font_peer, mask, c);
        expect(font, expected, glyphs[c.glyph], starts, lengths, c, palette);
        ASSERT_EQ(colour.copy(), expected) << "font " << font << ", call " << n << " of round " << round << ": glyph "
                                           << c.glyph << " at " << c.x << ", " << c.y;
      }
      frame_record::add(("fonts_" + std::to_string(font) + "_" + std::to_string(round)).c_str(), colour.data(),
                        colour.elements());
      Java_wa_ma(env, mask);
    }
    table[font].destroy(env, font_peer);
    table[font].destroy(env, font_peer);  // only clears the field again
  }
  EXPECT_EQ(Java_ja_za(env, peer), 0);
}

TEST_F(font_test, what_is_missing_draws_nothing_and_what_is_wrong_is_refused) {
  make_target(16, 16);
  const glyph solid{true, 4, 4, 0, 0, std::vector<jbyte>(16, 1)};
  const jobject font_peer = load(paletted, {solid}, {0, 0x123456});
  // Without metrics or palette there is a font, too, and it draws nothing.
  const jobject bare = java.new_object("ia");
  Java_ia_EA(env, bare, 0, pool_peer, java.new_objects({java.new_bytes(solid.bytes)}), nullptr, nullptr, nullptr,
             nullptr, nullptr);
  for (const bool upwards : {false, true}) {
    for (const int code : {-1, 1, 32767, -32768}) plot(paletted, font_peer, nullptr, {code, 2, 2, ~0u, 1, upwards});
    plot(paletted, bare, nullptr, {0, 2, 2, 0, 1, upwards});
  }
  EXPECT_EQ(colour.copy(), std::vector<unsigned>(256));
  Java_ia_ma(env, bare);
  expect_raised(null_pointer,
                {[&] {
                   plot(paletted, font_peer, nullptr, {0, 2, 2, 0, 0, false, true, 0, 0});
                 },
                 [&] {
                   plot(paletted, bare, nullptr, {0, 2, 2, 0, 1, true});
                 },
                 [&] { Java_m_n(env, bare, 0, nullptr, java.new_objects({}), nullptr, nullptr, nullptr, nullptr); }});
  Java_ia_ma(env, font_peer);

  jobject bad = nullptr;
  expect_raised(out_of_bounds + "glyphs[0]: length 15, 16 needed", {[&] {
                  bad = load(alpha, {{true, 4, 4, 0, 0, std::vector<jbyte>(15, 1)}}, {});
                }});
  expect_raised(out_of_bounds + "palette: length 1, but glyphs[0] uses index 1",
                {[&] { bad = load(paletted, {solid}, {5}); }});
  EXPECT_TRUE(java.nativeid(bad) == 0 && Java_ja_za(env, peer) == 0);
  // Bytes that are never drawn may be anything: past the bitmap, or of a glyph without a size.
  EXPECT_EQ(raised([&] { bad = load(paletted, {{true, 1, 1, 0, 0, {0, 9}}, {true, 0, 4, 0, 0, {9}}}, {5}); }), "");
  Java_ia_ma(env, bad);
}

}  // namespace
