package velmark5;

/**
 * Where textures come from. The library keeps the pixels of the 200 textures that were used last and asks for others
 * when they are needed, in the middle of drawing and on the thread that draws. What it throws then goes to that
 * thread's uncaught exception handler, and the faces are drawn without the texture.
 */
public interface TextureSource {
  /** Columns and rows of every texture. */
  int SIZE = 128;

  /**
   * How a texture behaves. Asked once for each texture, when the toolkit is created, and again with its pixels.
   *
   * @param id which texture, from 0
   * @return its metrics
   */
  TextureMetrics metrics(int id);

  /**
   * A texture's pixels. The source must not draw.
   *
   * @param id which texture, from 0
   * @return {@link #SIZE} times {@link #SIZE} words 0xAARRGGBB, row after row, or null when it cannot be had now: then
   *     faces are drawn without it, and it is asked for again the next time
   */
  int[] pixels(int id);
}
