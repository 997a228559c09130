package velmark5;

import static org.junit.jupiter.api.Assertions.*;

import java.awt.image.BufferedImage;
import org.junit.jupiter.api.Test;

/** Sprites and depth buffers: how they are filled, and copies between them and the target. */
class ImagesTest extends ToolkitTest {
  @Test
  void fromPixelsPalettesAndImages() {
    int[] words = {0x00112233, 0, 0x80445566, -1, 5, -1};
    assertArrayEquals(new int[] {0x00112233, 0, -1, 5}, pixels(toolkit.createSprite(words, 2, 2, 3, false)));
    assertArrayEquals(new int[] {0xFF112233, 0, -1, 0xFF000005}, pixels(toolkit.createSprite(words, 2, 2, 3, true)));

    int[] palette = {0x010203, 0x40FF0000};
    byte[] indices = {0, 1, 1, 0};
    byte[] alphas = {(byte) 200, 1, 0, -1};
    assertArrayEquals(
        new int[] {0, 0xFFFF0000, 0xFFFF0000, 0}, pixels(toolkit.createSprite(palette, indices, null, 2, 2, 2)));
    assertArrayEquals(
        new int[] {0xC8010203, 0x01FF0000, 0x00FF0000, 0xFF010203},
        pixels(toolkit.createSprite(palette, indices, alphas, 2, 2, 2)));

    BufferedImage image = new BufferedImage(2, 1, BufferedImage.TYPE_INT_ARGB);
    image.setRGB(0, 0, 0x40102030);
    image.setRGB(1, 0, 0xFF0000FF);
    assertArrayEquals(new int[] {0x40102030, 0xFF0000FF}, pixels(toolkit.createSprite(image)));

    refuses(ArrayIndexOutOfBoundsException.class, () -> toolkit.createSprite(words, 2, 3, 3, false),
        () -> toolkit.createSprite(palette, new byte[] {0, 2}, null, 2, 1, 2));
    refuses(IllegalArgumentException.class, () -> toolkit.createSprite(-1, 2));
    refuses(NullPointerException.class, () -> toolkit.createSprite(null, 1, 1, 1, false));
  }

  @Test
  void marginsAndPartialWrites() {
    Sprite sprite = sprite(10, 20, new int[200]);
    assertEquals(Margins.NONE, sprite.margins());
    sprite.setMargins(new Margins(1, 2, 3, 4));
    assertEquals(new Margins(1, 2, 3, 4), sprite.margins());
    assertEquals(new Rect(10, 20, 14, 26),
        new Rect(sprite.width(), sprite.height(), sprite.fullWidth(), sprite.fullHeight()));

    sprite.write(new Rect(8, 19, 2, 1), new int[] {0, 1, 0x22, 0x33}, 2, 2);
    int[] expected = new int[200];
    expected[198] = 0x22;
    expected[199] = 0x33;
    refuses(IllegalArgumentException.class, () -> sprite.write(new Rect(9, 0, 2, 1), new int[2], 0, 2));
    refuses(ArrayIndexOutOfBoundsException.class, () -> sprite.write(new Rect(0, 0, 2, 2), new int[3], 0, 2));
    assertArrayEquals(expected, pixels(sprite));
  }

  @Test
  void capturesOfTheFrame() {
    toolkit.drawTo(sprite(2, 2, 0, 0x00123456, 0xFF654321, 0x00000001), null);
    Sprite opaque = toolkit.captureSprite(new Rect(0, 0, 2, 2), true);
    Sprite column = toolkit.captureSprite(new Rect(1, 0, 1, 2), false);
    Sprite part = sprite(2, 2, 7, 7, 7, 7);
    part.capture(new Rect(0, 1, 1, 1), 1, 0);
    Sprite[] masked = new Sprite[4];
    for (Channel channel : Channel.values()) {
      masked[channel.ordinal()] = sprite(2, 2, 9, 9, 9, 9);
      masked[channel.ordinal()].captureAlpha(0, 0, channel);
    }
    refuses(IllegalArgumentException.class, () -> part.capture(new Rect(0, 0, 2, 2), 1, 0),
        () -> part.captureAlpha(0, 1, Channel.RED), () -> toolkit.captureSprite(new Rect(0, 0, 3, 1), true));

    assertArrayEquals(new int[] {0, 0xFF123456, 0xFF654321, 0xFF000001}, pixels(opaque));
    assertArrayEquals(new int[] {0x00123456, 1}, pixels(column));
    assertArrayEquals(new int[] {7, 7, 0xFF123456, 7}, pixels(part));
    assertArrayEquals(new int[] {9, 0x12000009, 0x65000009, 9}, pixels(masked[Channel.RED.ordinal()]));
    assertArrayEquals(new int[] {9, 0x34000009, 0x43000009, 9}, pixels(masked[Channel.GREEN.ordinal()]));
    assertArrayEquals(new int[] {9, 0x56000009, 0x21000009, 0x01000009}, pixels(masked[Channel.BLUE.ordinal()]));
    assertArrayEquals(new int[] {9, 0xFF000009, 0xFF000009, 0xFF000009}, pixels(masked[Channel.COVERAGE.ordinal()]));
  }

  @Test
  void copiesBetweenTargetAndImages() {
    Sprite frame = sprite(3, 2, 1, 2, 3, 4, 5, 6);
    DepthBuffer frameDepth = toolkit.createDepthBuffer(3, 2);
    Sprite image = sprite(2, 2, 0, 0, 0, 0);
    DepthBuffer imageDepth = toolkit.createDepthBuffer(2, 2);
    toolkit.drawTo(frame, frameDepth);
    toolkit.clearDepth();
    toolkit.copyFromTarget(image, imageDepth, new Rect(1, 0, 2, 2), 0, 0);
    // Far depths came along: a circle draws only where the stored depth is greater than 0.
    toolkit.drawTo(image, imageDepth);
    assertArrayEquals(new int[] {2, 3, 5, 6}, pixels());
    toolkit.fillCircle(0, 0, 0, 99, BlendMode.REPLACE);
    assertArrayEquals(new int[] {99, 3, 5, 6}, pixels());

    toolkit.drawTo(frame, frameDepth);
    toolkit.copyToTarget(image, null, new Rect(0, 0, 1, 2), 2, 0);
    toolkit.copyToTarget(null, imageDepth, new Rect(0, 0, 2, 2), 1, 0);
    toolkit.copyToTarget(image, imageDepth, new Rect(0, 0, 2, 0), 1, 0);
    assertArrayEquals(new int[] {1, 2, 99, 4, 5, 5}, pixels());
    Rect wide = new Rect(0, 0, 3, 1);
    refuses(IllegalArgumentException.class, () -> toolkit.copyToTarget(image, null, wide, 0, 0),
        () -> toolkit.copyFromTarget(image, null, wide, 0, 0),
        () -> toolkit.copyFromTarget(null, imageDepth, wide, 0, 0), () -> toolkit.drawTo(frame, imageDepth),
        () -> toolkit.drawTo(null, null));
  }

  @Test
  void aTargetOfDepthAlone() {
    toolkit.drawTo(null, toolkit.createDepthBuffer(5, 4));
    assertEquals(new Rect(0, 0, 5, 4), toolkit.clip());
    toolkit.clearAll(-1);
    toolkit.fillRect(0, 0, 9, 9, -1, BlendMode.REPLACE);
    refuses(IllegalStateException.class, () -> at(0, 0));
  }
}
