// A textured rectangle that faces the viewer, anchored at the centre of a face of its model.
#pragma once

// What models share.
struct billboard {
  billboard(unsigned short carrier, unsigned short w, unsigned short h, short texture_id,
            unsigned char colour_operation, unsigned char blend_mode, bool client_flag)
      : face(carrier),
        width(w),
        height(h),
        texture(texture_id),
        blend(blend_mode),
        colourop(colour_operation),
        flag(client_flag) {}

  // All of `from`, on another carrier face.
  void copy(const billboard& from, unsigned short carrier) {
    *this = from;
    face = carrier;
  }

  unsigned short face;    // carrier, in the model's numbering
  unsigned short width;   // along the view's x axis, model units
  unsigned short height;  // along the view's y axis
  short texture;
  unsigned char blend;     // Sprite_c's blend mode, 0 to 2
  unsigned char colourop;  // Sprite_c's colour operation, 0 to 4
  bool flag;               // the client's own
};

// One per billboard, private to a model that animates it. The last five fields are written by every draw.
struct billboard_properties {
  explicit billboard_properties(unsigned int colour) : billboard_properties(colour, 1, 1, 0, 0, 0) {}
  billboard_properties(unsigned int colour, float sx, float sy, float ox, float oy, int angle)
      : argb(colour), scalex(sx), scaley(sy), offsetx(ox), offsety(oy), rotation(angle) {}

  // All but the fields of the draw.
  void copy(const billboard_properties& from) {
    argb = from.argb;
    scalex = from.scalex;
    scaley = from.scaley;
    offsetx = from.offsetx;
    offsety = from.offsety;
    rotation = from.rotation;
  }

  unsigned int argb;
  float scalex, scaley;
  float offsetx, offsety;             // animated and carried; drawing does not read them
  int rotation;                       // the same
  int screenx = 0, screeny = 0;       // centre in pixels
  int halfwidth = 0, halfheight = 0;  // pixels, before scale
  float depth = 0;                    // screen depth of the centre
};
