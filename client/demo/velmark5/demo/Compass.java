package velmark5.demo;

import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Sprite;
import velmark5.ThreadResource;
import velmark5.Tint;
import velmark5.Toolkit;

/** A compass rose, drawn once into a sprite from triangles and then turned as a whole. */
final class Compass implements Scene {
  private final Toolkit toolkit;
  private final ThreadResource resource;
  private Sprite rose;
  private int centreX;
  private int centreY;
  private int radius;

  Compass(Toolkit toolkit) {
    this.toolkit = toolkit;
    resource = toolkit.createThreadResource();
  }

  @Override
  public void resize(int width, int height) {
    int margin = Math.max(8, Math.min(width, height) / 24);
    radius = Math.max(8, Math.min(width, height) / 15);
    centreX = width - margin - radius;
    centreY = margin + radius + Math.min(width, height) / 18;
    if (rose != null) {
      rose.close();
    }
    rose = toolkit.createSprite(2 * radius, 2 * radius);
    toolkit.drawTo(rose, null);
    toolkit.clear(Colour.TRANSPARENT);
    for (int i = 0; i < 36; i++) {
      double angle = 2 * Math.PI * i / 36;
      double r = radius * (i % 9 == 0 ? 0.80 : 0.88);
      toolkit.line(at(r, angle, true), at(r, angle, false), at(radius * 0.95, angle, true),
          at(radius * 0.95, angle, false), 0xFF9FB4D0, BlendMode.REPLACE);
    }
    for (int i = 0; i < 4; i++) {
      paintPoint(Math.PI / 4 + i * Math.PI / 2, 0.46, 0xFF6E7F9A, 0xFF2C3A52);
    }
    for (int i = 0; i < 4; i++) {
      boolean north = i == 3;
      paintPoint(i * Math.PI / 2, 0.76, north ? 0xFFFF7A5C : 0xFFE6EEF9, north ? 0xFF8E2A22 : 0xFF5C6C86);
    }
  }

  private int at(double r, double angle, boolean x) {
    return radius + (int) Math.round(r * (x ? Math.cos(angle) : Math.sin(angle)) - 0.5);
  }

  /** One point of the rose: a bright and a dark half. */
  private void paintPoint(double angle, double reach, int bright, int dark) {
    float tipX = (float) (radius + reach * radius * Math.cos(angle));
    float tipY = (float) (radius + reach * radius * Math.sin(angle));
    for (int side = -1; side <= 1; side += 2) {
      float footX = (float) (radius + 0.16 * radius * Math.cos(angle + side * Math.PI / 4));
      float footY = (float) (radius + 0.16 * radius * Math.sin(angle + side * Math.PI / 4));
      int colour = side < 0 ? bright : dark;
      int inner = Colour.withAlpha(Colour.scale(colour, 0.75), 255);
      resource.fillTriangle(radius, radius, inner, tipX, tipY, colour, footX, footY, inner);
    }
  }

  @Override
  public void paint(double seconds) {
    toolkit.fillCircle(centreX, centreY, radius, 0x70060C18, BlendMode.ALPHA);
    double angle = 0.35 * Math.sin(seconds * 0.5) + 0.12 * Math.sin(seconds * 2.1);
    rose.drawRotated(centreX, centreY, angle, 1, Tint.NONE, BlendMode.ALPHA);
  }
}
