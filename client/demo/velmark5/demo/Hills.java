package velmark5.demo;

import java.util.ArrayList;
import java.util.List;
import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Toolkit;

/**
 * Three ridges, each darker than the one behind it: snow on the farthest, mist at their feet, firs on the nearest. They
 * stand still, so they are drawn once into a sprite, and only the runs of pixels that they cover are copied each frame.
 */
final class Hills implements Scene {
  private record Ridge(int seed, double base, double rise, double detail, int rock, int foot) {}

  private static final Ridge[] RIDGES = {
    new Ridge(3, 0.535, 0.23, 2.1, 0xFF22345A, 0xFF8C8AA0),
    new Ridge(17, 0.565, 0.11, 2.7, 0xFF16233F, 0xFF465A78),
    new Ridge(41, 0.607, 0.05, 3.4, 0xFF081120, 0xFF13233B),
  };

  private final Toolkit toolkit;
  private final List<Rect> runs = new ArrayList<>();
  private Sprite picture;
  private int width;
  private int height;
  private int horizon;

  Hills(Toolkit toolkit) {
    this.toolkit = toolkit;
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
    horizon = Sky.horizon(height);
    if (picture != null) {
      picture.close();
    }
    picture = toolkit.createSprite(width, Math.max(1, horizon));
    toolkit.drawTo(picture, null);
    toolkit.clear(Colour.TRANSPARENT);
    int[] skyline = new int[width];
    java.util.Arrays.fill(skyline, horizon);
    for (int i = 0; i < RIDGES.length; i++) {
      int[] crest = outline(RIDGES[i], i == 0);
      if (i == 2) {
        plantTrees(crest);
      }
      for (int x = 0; x < width; x++) {
        skyline[x] = Math.min(skyline[x], crest[x]);
        toolkit.verticalLine(x, crest[x], horizon - crest[x], RIDGES[i].rock, BlendMode.REPLACE);
        if (i == 0) {
          paintSnow(x, crest[x]);
        } else if (i == 1) {
          toolkit.verticalLine(x, crest[x], 2, 0x20B7C9E8, BlendMode.ALPHA);
        }
      }
      paintMist(RIDGES[i], i, crest);
    }
    findRuns(skyline);
  }

  /** The top row of a ridge in each column; sharp peaks come from folded noise. */
  private int[] outline(Ridge ridge, boolean sharp) {
    int[] crest = new int[width];
    for (int x = 0; x < width; x++) {
      double u = (x - width / 2) / (double) height;
      double up = Noise.fractal(ridge.seed, u * ridge.detail + 100, 7) - 0.35;
      if (sharp) {
        up = 1.25 * Noise.creased(ridge.seed + 60, u * 1.5 + 40, 0.3, 6) - 0.22;
      }
      crest[x] = (int) (height * (ridge.base - ridge.rise * up));
    }
    return crest;
  }

  /** Light and shade of steep faces: snow where they turn to the moon, thinning out downwards. */
  private void paintSnow(int x, int crest) {
    double u = (x - width / 2) / (double) height;
    for (int y = crest; y < horizon; y++) {
      double v = y / (double) height;
      double down = v - crest / (double) height;
      double here = Noise.creased(9, u * 5 + v * 1.5, v * 6, 5);
      double beside = Noise.creased(9, (u + 0.006) * 5 + v * 1.5, (v - 0.004) * 6, 5);
      double lit = Math.max(0, Math.min(1, 0.40 + (here - beside) * 6.5));
      double line = 0.03 + 0.13 * Noise.creased(23, u * 4, v * 4, 3);
      double snow = Math.max(0, Math.min(1, (line - down) * 22 + 0.4 + 0.9 * (here - 0.5)));
      int rock = Colour.mix(0xFF16233F, 0xFF3A5078, lit);
      int white = Colour.mix(0xFF273A66, 0xFFA9BCE2, lit);
      toolkit.fillRect(x, y, 1, 1, Colour.mix(rock, white, snow), BlendMode.REPLACE);
    }
  }

  /** Firs of differing size break the line of the nearest ridge. */
  private void plantTrees(int[] crest) {
    int[] ground = crest.clone();
    for (int i = 0; i < width / 4; i++) {
      int x = (int) (Noise.hash(i * 3 + 7000) * width);
      double u = (x - width / 2) / (double) height;
      if (Noise.smooth(77, u * 5) < 0.4) {
        continue;
      }
      int tall = (int) (height * (0.014 + 0.034 * Noise.hash(i * 3 + 7001)));
      for (int dx = -tall / 4; dx <= tall / 4; dx++) {
        if (x + dx >= 0 && x + dx < width) {
          int ragged = (Math.abs(dx) & 1) == 0 ? 0 : 2;
          crest[x + dx] = Math.min(crest[x + dx], ground[x] - tall + Math.abs(dx) * 4 + ragged);
        }
      }
    }
  }

  private void paintMist(Ridge ridge, int index, int[] crest) {
    int deep = (int) (height * (0.16 - 0.06 * index));
    for (int x = 0; x < width; x++) {
      for (int y = Math.max(crest[x], horizon - deep); y < horizon; y++) {
        double thick = 1 - (horizon - y) / (double) deep;
        toolkit.fillRect(x, y, 1, 1, Colour.withAlpha(ridge.foot, (int) (150 * thick * thick)), BlendMode.ALPHA);
      }
    }
  }

  /** In each row the stretches that lie below the skyline. */
  private void findRuns(int[] skyline) {
    runs.clear();
    for (int y = 0; y < horizon; y++) {
      int start = -1;
      for (int x = 0; x <= width; x++) {
        boolean covered = x < width && skyline[x] <= y;
        if (covered && start < 0) {
          start = x;
        } else if (!covered && start >= 0) {
          runs.add(new Rect(start, y, x - start, 1));
          start = -1;
        }
      }
    }
    // Whole rows at the bottom go in one piece.
    int top = horizon;
    while (!runs.isEmpty() && runs.get(runs.size() - 1).width() == width) {
      top = runs.remove(runs.size() - 1).y();
    }
    if (top < horizon) {
      runs.add(new Rect(0, top, width, horizon - top));
    }
  }

  @Override
  public void paint(double seconds) {
    for (Rect run : runs) {
      toolkit.copyToTarget(picture, null, run, run.x(), run.y());
    }
  }
}
