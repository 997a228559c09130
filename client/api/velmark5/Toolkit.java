package velmark5;

import java.awt.Component;
import java.awt.image.BufferedImage;
import java.util.Objects;
import velmark5.spi.Peers;

/**
 * The renderer: makes all other objects, chooses what is drawn to, and draws. There is one per process at a time.
 *
 * <p>Its calls belong to the control thread. Closing it closes everything that it made.
 */
public interface Toolkit extends Painter, Scene, AutoCloseable {
  /**
   * Loads the native library and starts the renderer. The calling thread is set to treat numbers too small for a normal
   * float as 0, and so are threads that it starts later.
   *
   * @return the toolkit
   * @throws IllegalStateException if a toolkit is open already
   * @throws UnsatisfiedLinkError if there is no library for this machine
   */
  static Toolkit create() {
    return Peers.instance().createToolkit(null, 0);
  }

  /**
   * Loads the native library and starts the renderer with textures. The source is asked for the metrics of all textures
   * before this returns.
   *
   * @param textures where textures come from
   * @param count how many there are, with ids from 0; at most 65535
   * @return the toolkit
   * @throws IllegalArgumentException if the count is out of range
   * @throws IllegalStateException if a toolkit is open already
   * @throws UnsatisfiedLinkError if there is no library for this machine
   */
  static Toolkit create(TextureSource textures, int count) {
    Objects.requireNonNull(textures, "textures");
    if (count < 0 || count > 65535) {
      throw new IllegalArgumentException("count: " + count + " is not 0 to 65535");
    }
    return Peers.instance().createToolkit(textures, count);
  }

  /**
   * Makes a pool. Call it before anything that lives in one.
   *
   * @param bytes its first size; it grows when needed
   * @return the pool
   * @throws IllegalArgumentException if the size is negative
   */
  MemoryPool createPool(int bytes);

  /**
   * Names the pool for what the library allocates on its own account.
   *
   * @param pool an open pool
   */
  void setPool(MemoryPool pool);

  /**
   * Sets what happens when a pool has no room left: the listener can close objects of which the client can do without.
   * It runs on the thread that allocates, in the middle of the allocation: it must neither allocate in a pool nor close
   * one. What it throws goes to the thread's uncaught exception handler.
   *
   * @param listener the listener, or null for none
   */
  void onMemoryPressure(Runnable listener);

  /**
   * Makes a canvas on a component. Loads the native parts of AWT at first use.
   *
   * @param component a displayable heavyweight component, for instance a {@link java.awt.Canvas} in a visible frame
   * @param width columns of the frame, at least 1
   * @param height rows of the frame, at least 1
   * @return the canvas
   * @throws IllegalStateException if the component is not displayable
   * @throws IllegalArgumentException if a size is less than 1
   * @throws java.awt.HeadlessException if there is no display
   */
  Canvas createCanvas(Component component, int width, int height);

  /**
   * Makes a model from a mesh.
   *
   * @param pool where its arrays live
   * @param mesh the mesh; it is copied
   * @param settings how it is built
   * @return the model
   * @throws IllegalArgumentException if a material's texture has no metrics, or a mapping's vertex does not exist
   */
  Model createModel(MemoryPool pool, Mesh mesh, ModelSettings settings);

  /**
   * Makes an empty sprite.
   *
   * @param width columns, not negative
   * @param height rows, not negative
   * @return the sprite; its pixels are undefined until something writes them
   * @throws IllegalArgumentException if a size is negative, or both together are too large
   */
  Sprite createSprite(int width, int height);

  /**
   * Makes a sprite from pixels.
   *
   * @param pixels 0xAARRGGBB words, row after row; they are copied
   * @param width columns
   * @param height rows
   * @param stride words from one row to the next
   * @param opaque true to make every word but 0 opaque, false to take alpha as it is
   * @return the sprite
   * @throws ArrayIndexOutOfBoundsException if the array is too short
   * @throws IllegalArgumentException if a size is negative
   */
  Sprite createSprite(int[] pixels, int width, int height, int stride, boolean opaque);

  /**
   * Makes a sprite from an image of Java 2D, alpha included.
   *
   * @param image the image
   * @return the sprite
   */
  default Sprite createSprite(BufferedImage image) {
    Objects.requireNonNull(image, "image");
    int width = image.getWidth();
    int height = image.getHeight();
    return createSprite(image.getRGB(0, 0, width, height, null, 0, width), width, height, width, false);
  }

  /**
   * Makes a sprite from bytes that stand for colours of a palette. The arrays are copied.
   *
   * @param palette the colours; their alpha does not count
   * @param indices one byte a pixel, 0 to 255 unsigned, row after row
   * @param alpha one byte a pixel, or null: then index 0 is transparent and all others are opaque
   * @param width columns
   * @param height rows
   * @param stride bytes from one row to the next, in both byte arrays
   * @return the sprite
   * @throws ArrayIndexOutOfBoundsException if an array is too short, or an index is outside the palette
   */
  Sprite createSprite(int[] palette, byte[] indices, byte[] alpha, int width, int height, int stride);

  /**
   * Makes a sprite from a part of the frame that the toolkit draws to.
   *
   * @param area the part, inside the target
   * @param opaque true to make every word but 0 opaque, false to take alpha as it is
   * @return the sprite
   * @throws IllegalArgumentException if the area is not inside the target
   * @throws IllegalStateException if the target has no frame
   */
  Sprite captureSprite(Rect area, boolean opaque);

  /**
   * Makes a depth buffer; its values are undefined until it is cleared.
   *
   * @param width columns, not negative
   * @param height rows, not negative
   * @return the depth buffer
   * @throws IllegalArgumentException if a size is negative, or both together are too large
   */
  DepthBuffer createDepthBuffer(int width, int height);

  /**
   * Makes a clipping mask.
   *
   * @param pool where it lives
   * @param spans its shape
   * @return the mask
   */
  ClippingMask createMask(MemoryPool pool, Spans spans);

  /**
   * Makes a font whose glyphs are on or off: the fastest kind.
   *
   * @param pool where it lives
   * @param glyphs its glyphs; every byte but 0 is on
   * @return the font; the alpha of a text's colour counts
   */
  Font createMonoFont(MemoryPool pool, Glyphs glyphs);

  /**
   * Makes a font with smooth edges.
   *
   * @param pool where it lives
   * @param glyphs its glyphs; a byte says how much of the pixel is covered, 0 to 255
   * @return the font; the alpha of a text's colour does not count
   */
  Font createSmoothFont(MemoryPool pool, Glyphs glyphs);

  /**
   * Makes a font of several colours.
   *
   * @param pool where it lives
   * @param glyphs its glyphs; a byte is an index of the palette, and 0 is a hole
   * @param palette the colours; entry 0 is not used
   * @return the font
   * @throws IllegalArgumentException if a glyph uses an index outside the palette
   */
  PalettedFont createPalettedFont(MemoryPool pool, Glyphs glyphs, int[] palette);

  /**
   * Makes what one thread needs to draw.
   *
   * @return the resource
   */
  ThreadResource createThreadResource();

  /**
   * Draws to a canvas from now on. Its frame is cleared to black and its depth to the farthest value; clip and viewport
   * become the whole canvas.
   *
   * @param canvas the canvas
   */
  void drawTo(Canvas canvas);

  /**
   * Draws to an image from now on. What it holds stays; clip and viewport become the whole image.
   *
   * @param sprite where colours go, or null for depth alone
   * @param depth where depths go, as wide as the sprite and at least as high, or null for none
   * @throws IllegalArgumentException if both are null or the depth buffer does not fit
   */
  void drawTo(Sprite sprite, DepthBuffer depth);

  /** Leaves the target: drawing does nothing until the next {@code drawTo}. */
  void drawToNothing();

  /**
   * Copies a part of the target into images, words as they are.
   *
   * @param sprite where colours go, or null for none
   * @param depth where depths go, or null for none
   * @param area the part of the target, inside it
   * @param x left edge in the images
   * @param y top edge in the images
   * @throws IllegalArgumentException if a rectangle is outside the target or an image
   */
  void copyFromTarget(Sprite sprite, DepthBuffer depth, Rect area, int x, int y);

  /**
   * Copies a part of images into the target, words as they are.
   *
   * @param sprite where colours come from, or null for none
   * @param depth where depths come from, or null for none
   * @param area the part of the images, inside them
   * @param x left edge in the target
   * @param y top edge in the target
   * @throws IllegalArgumentException if a rectangle is outside the target or an image
   */
  void copyToTarget(Sprite sprite, DepthBuffer depth, Rect area, int x, int y);

  /**
   * Where in the target projected points go.
   *
   * @return the viewport
   */
  Rect viewport();

  /**
   * Sets where in the target projected points go. Set the projection after it.
   *
   * @param area the viewport
   */
  void setViewport(Rect area);

  /** Makes the viewport the whole target; the depth range stays. */
  void resetViewport();

  /**
   * Sets the stored depths of the nearest and the farthest projected point.
   *
   * @param near depth of the projected depth -1, usually 0
   * @param far depth of the projected depth 1, usually 1
   */
  void setDepthRange(float near, float far);

  /**
   * Tells the library the time, once per frame: what moves by itself moves.
   *
   * @param milliseconds the client's clock, not negative
   */
  void advance(int milliseconds);

  /**
   * Memory that the library holds.
   *
   * @return bytes in use in all pools
   */
  int allocatedBytes();

  /**
   * Counts models.
   *
   * @return how many were drawn since the last call
   */
  int takeModelCount();

  /** Closes everything that the toolkit made, then the toolkit. Another one can be created afterwards. */
  @Override
  void close();
}
