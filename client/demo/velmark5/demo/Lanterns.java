package velmark5.demo;

import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Tint;
import velmark5.Toolkit;

/**
 * Paper lanterns that rise from the far shore: a halo, drawn once into a sprite and added at every size, around a warm
 * core.
 */
final class Lanterns implements Scene {
  private static final int COUNT = 30;
  private static final int RINGS = 26;

  private final Toolkit toolkit;
  private Sprite halo;
  private int width;
  private int height;

  Lanterns(Toolkit toolkit) {
    this.toolkit = toolkit;
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
    if (halo != null) {
      halo.close();
    }
    int reach = Math.max(2, height / 20);
    halo = toolkit.createSprite(2 * reach + 1, 2 * reach + 1);
    toolkit.drawTo(halo, null);
    toolkit.clear(Colour.TRANSPARENT);
    for (int i = RINGS; i > 0; i--) {
      double far = i / (double) RINGS;
      toolkit.fillCircle(reach, reach, (int) Math.round(reach * far * far), 0x00050301, BlendMode.ADD);
    }
  }

  @Override
  public void paint(double seconds) {
    for (int i = 0; i < COUNT; i++) {
      double near = 0.35 + 0.65 * Noise.hash(i * 5 + 31);
      double life = (seconds * 0.011 * (0.6 + near) + Noise.hash(i * 5 + 32)) % 1;
      double x = width * (0.10 + 0.50 * Noise.hash(i * 5 + 33) + life * 0.10)
          + Math.sin(seconds * 0.5 + i * 1.7) * height * 0.012;
      double y = height * (0.605 - life * (0.22 + 0.25 * near));
      double light = Math.min(1, life * 10) * Math.min(1, (1 - life) * 4) * (0.85 + 0.15 * Math.sin(seconds * 7 + i * 9));
      glow((int) x, (int) y, near * height / 46, light);
    }
  }

  private void glow(int x, int y, double radius, double light) {
    int reach = Math.max(2, (int) (radius * 2.2));
    int level = (int) (255 * light);
    halo.drawScaled(
        new Rect(x - reach, y - reach, 2 * reach + 1, 2 * reach + 1),
        Tint.multiply(Colour.rgb(level, level, level)),
        BlendMode.ADD);
    int core = Math.max(1, (int) (radius / 6));
    toolkit.fillRect(x - core, y - core - core / 2, 2 * core, 3 * core, Colour.scale(0xFFFFC070, light), BlendMode.ADD);
    toolkit.fillRect(x - core, y + core, 2 * core, core / 2 + 1, Colour.scale(0xFFFFE6B0, light), BlendMode.ADD);
  }
}
