package velmark5;

import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertThrows;

import java.awt.image.BufferedImage;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;

/** Sprites and depth buffers: how they are filled, and copies between them and the target. */
@Tag("headless")
class ImagesTest {
  private Toolkit toolkit;

  @BeforeEach
  void open() {
    toolkit = Toolkit.create();
  }

  @AfterEach
  void close() {
    toolkit.close();
  }

  private int[] pixels(Sprite sprite) {
    toolkit.drawTo(sprite, null);
    return toolkit.readArea(new Rect(0, 0, sprite.width(), sprite.height()));
  }

  @Test
  void fromPixelsPalettesAndImages() {
    int[] words = {0x00112233, 0, 0x80445566, -1, 5, -1};
    assertArrayEquals(
        new int[] {0x00112233, 0, -1, 5}, pixels(toolkit.createSprite(words, 2, 2, 3, false)));
    assertArrayEquals(
        new int[] {0xFF112233, 0, -1, 0xFF000005}, pixels(toolkit.createSprite(words, 2, 2, 3, true)));

    int[] palette = {0x010203, 0x40FF0000};
    byte[] indices = {0, 1, 1, 0};
    assertArrayEquals(
        new int[] {0, 0xFFFF0000, 0xFFFF0000, 0}, pixels(toolkit.createSprite(palette, indices, null, 2, 2, 2)));
    assertArrayEquals(
        new int[] {0xC8010203, 0x01FF0000, 0x00FF0000, 0xFF010203},
        pixels(toolkit.createSprite(palette, indices, new byte[] {(byte) 200, 1, 0, -1}, 2, 2, 2)));

    BufferedImage image = new BufferedImage(2, 1, BufferedImage.TYPE_INT_ARGB);
    image.setRGB(0, 0, 0x40102030);
    image.setRGB(1, 0, 0xFF0000FF);
    assertArrayEquals(new int[] {0x40102030, 0xFF0000FF}, pixels(toolkit.createSprite(image)));

    assertThrows(ArrayIndexOutOfBoundsException.class, () -> toolkit.createSprite(words, 2, 3, 3, false));
    assertThrows(
        ArrayIndexOutOfBoundsException.class,
        () -> toolkit.createSprite(palette, new byte[] {0, 2}, null, 2, 1, 2));
    assertThrows(IllegalArgumentException.class, () -> toolkit.createSprite(-1, 2));
    assertThrows(NullPointerException.class, () -> toolkit.createSprite(null, 1, 1, 1, false));
  }

  @Test
  void marginsAndPartialWrites() {
    Sprite sprite = toolkit.createSprite(new int[200], 10, 20, 10, false);
    assertEquals(Margins.NONE, sprite.margins());
    sprite.setMargins(new Margins(1, 2, 3, 4));
    assertEquals(new Margins(1, 2, 3, 4), sprite.margins());
    assertEquals(14, sprite.fullWidth());
    assertEquals(26, sprite.fullHeight());
    assertEquals(10, sprite.width());
    assertEquals(20, sprite.height());

    sprite.write(new Rect(8, 19, 2, 1), new int[] {0, 1, 0x22, 0x33}, 2, 2);
    int[] expected = new int[200];
    expected[198] = 0x22;
    expected[199] = 0x33;
    assertArrayEquals(expected, pixels(sprite));
    assertThrows(IllegalArgumentException.class, () -> sprite.write(new Rect(9, 0, 2, 1), new int[2], 0, 2));
    assertThrows(
        ArrayIndexOutOfBoundsException.class, () -> sprite.write(new Rect(0, 0, 2, 2), new int[3], 0, 2));
    assertArrayEquals(expected, pixels(sprite));
  }

  @Test
  void capturesOfTheFrame() {
    Sprite frame = toolkit.createSprite(new int[] {0, 0x00123456, 0xFF654321, 0x00000001}, 2, 2, 2, false);
    toolkit.drawTo(frame, null);
    Sprite opaque = toolkit.captureSprite(new Rect(0, 0, 2, 2), true);
    Sprite column = toolkit.captureSprite(new Rect(1, 0, 1, 2), false);
    Sprite part = toolkit.createSprite(new int[] {7, 7, 7, 7}, 2, 2, 2, false);
    part.capture(new Rect(1, 1, 1, 1), 1, 0);
    Sprite[] masked = new Sprite[4];
    for (Channel channel : Channel.values()) {
      masked[channel.ordinal()] = toolkit.createSprite(new int[] {9, 9, 9, 9}, 2, 2, 2, false);
      masked[channel.ordinal()].captureAlpha(0, 0, channel);
    }
    assertThrows(IllegalArgumentException.class, () -> part.capture(new Rect(0, 0, 2, 2), 1, 0));
    assertThrows(IllegalArgumentException.class, () -> part.captureAlpha(0, 1, Channel.RED));
    assertThrows(IllegalArgumentException.class, () -> toolkit.captureSprite(new Rect(0, 0, 3, 1), true));

    assertArrayEquals(new int[] {0, 0xFF123456, 0xFF654321, 0xFF000001}, pixels(opaque));
    assertArrayEquals(new int[] {0x00123456, 1}, pixels(column));
    assertArrayEquals(new int[] {7, 7, 7, 0xFF123456}, pixels(part));
    assertArrayEquals(new int[] {9, 0x12000009, 0x65000009, 9}, pixels(masked[Channel.RED.ordinal()]));
    assertArrayEquals(new int[] {9, 0x34000009, 0x43000009, 9}, pixels(masked[Channel.GREEN.ordinal()]));
    assertArrayEquals(new int[] {9, 0x56000009, 0x21000009, 0x01000009}, pixels(masked[Channel.BLUE.ordinal()]));
    assertArrayEquals(
        new int[] {9, 0xFF000009, 0xFF000009, 0xFF000009}, pixels(masked[Channel.COVERAGE.ordinal()]));
  }

  @Test
  void copiesBetweenTargetAndImages() {
    Sprite frame = toolkit.createSprite(new int[] {1, 2, 3, 4, 5, 6}, 3, 2, 3, false);
    DepthBuffer frameDepth = toolkit.createDepthBuffer(3, 2);
    Sprite image = toolkit.createSprite(new int[4], 2, 2, 2, false);
    DepthBuffer imageDepth = toolkit.createDepthBuffer(2, 2);
    toolkit.drawTo(frame, frameDepth);
    toolkit.clearDepth();
    toolkit.copyFromTarget(image, imageDepth, new Rect(1, 0, 2, 2), 0, 0);
    // Far depths came along: a circle draws only where the stored depth is greater than 0.
    toolkit.drawTo(image, imageDepth);
    assertArrayEquals(new int[] {2, 3, 5, 6}, toolkit.readArea(new Rect(0, 0, 2, 2)));
    toolkit.fillCircle(0, 0, 0, 99, BlendMode.REPLACE);
    assertArrayEquals(new int[] {99, 3, 5, 6}, toolkit.readArea(new Rect(0, 0, 2, 2)));

    toolkit.drawTo(frame, frameDepth);
    toolkit.copyToTarget(image, null, new Rect(0, 0, 1, 2), 2, 0);
    assertArrayEquals(new int[] {1, 2, 99, 4, 5, 5}, toolkit.readArea(new Rect(0, 0, 3, 2)));
    toolkit.copyToTarget(null, imageDepth, new Rect(0, 0, 2, 2), 1, 0);
    toolkit.copyToTarget(image, imageDepth, new Rect(0, 0, 2, 0), 1, 0);
    assertArrayEquals(new int[] {1, 2, 99, 4, 5, 5}, toolkit.readArea(new Rect(0, 0, 3, 2)));
    Rect wide = new Rect(0, 0, 3, 1);
    assertThrows(IllegalArgumentException.class, () -> toolkit.copyToTarget(image, null, wide, 0, 0));
    assertThrows(IllegalArgumentException.class, () -> toolkit.copyFromTarget(image, null, wide, 0, 0));
    assertThrows(IllegalArgumentException.class, () -> toolkit.copyFromTarget(null, imageDepth, wide, 0, 0));
    DepthBuffer narrow = toolkit.createDepthBuffer(2, 2);
    assertThrows(IllegalArgumentException.class, () -> toolkit.drawTo(frame, narrow));
    assertThrows(IllegalArgumentException.class, () -> toolkit.drawTo(null, null));
  }

  @Test
  void aTargetOfDepthAlone() {
    DepthBuffer depth = toolkit.createDepthBuffer(5, 4);
    toolkit.drawTo(null, depth);
    assertEquals(new Rect(0, 0, 5, 4), toolkit.clip());
    toolkit.clearAll(-1);
    toolkit.fillRect(0, 0, 9, 9, -1, BlendMode.REPLACE);
    assertThrows(IllegalStateException.class, () -> toolkit.readArea(new Rect(0, 0, 1, 1)));
  }
}
