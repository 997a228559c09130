import velmark5.TextureMetrics;
import velmark5.TextureSource;

/** The way of textures from a client's source into the library: the metrics of all at the start, pixels on demand. */
final class TextureFeed {
  private final ja toolkit;
  private final TextureSource source;

  /** A feed for a toolkit; the source may be null when there are no textures. */
  TextureFeed(ja toolkit, TextureSource source) {
    this.toolkit = toolkit;
    this.source = source;
  }

  void announce(int count) {
    for (int id = 0; id < count; id++) {
      upload(id, null, source.metrics(id));
    }
  }

  /** Uploads what the library asks for; false when the source has nothing. */
  boolean deliver(int id) {
    int[] pixels = source == null ? null : source.pixels(id);
    if (pixels != null) {
      upload(id, pixels, source.metrics(id));
    }
    return pixels != null;
  }

  /**
   * With pixels the texture itself, without them what is known of it. The library stores the attributes and reads none.
   */
  private void upload(int id, int[] pixels, TextureMetrics t) {
    short name = (short) id;
    short average = (short) t.averageHsl();
    int alpha = t.alpha().code();
    byte lighting = (byte) t.lighting();
    byte grey = (byte) t.greyBlend();
    byte bright = (byte) t.brighten();
    byte scrollU = (byte) t.scrollU();
    byte scrollV = (byte) t.scrollV();
    if (pixels == null) {
      toolkit.V(
          name, average, alpha, lighting, (byte) 0, 0, false, grey, bright, scrollU, scrollV, t.flatColour(),
          t.hidden(), false, t.wrapU(), t.wrapV(), (byte) 0, false, false, 0);
    } else {
      toolkit.F(
          name, pixels, average, alpha, lighting, (byte) 0, 0, false, grey, bright, scrollU, scrollV, t.flatColour(),
          t.hidden(), false, t.wrapU(), t.wrapV(), (byte) 0, false, false, 0);
    }
  }
}
