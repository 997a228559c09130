import java.awt.Canvas;
import java.awt.Dimension;
import java.awt.EventQueue;
import java.awt.Frame;
import java.awt.Graphics;
import java.awt.GraphicsConfiguration;
import java.awt.image.BufferStrategy;
import java.awt.image.BufferedImage;
import java.awt.image.DataBufferInt;
import java.awt.image.VolatileImage;
import java.io.BufferedReader;
import java.io.InputStreamReader;
import java.io.PrintWriter;
import java.util.Arrays;
import java.util.LinkedHashMap;
import java.util.Map;
import velmark5.Toolkit;

/**
 * Presents per second, in rounds in which every way has its turn, so that all see the same machine: the bare loop, a
 * velmark5 canvas, and the ways that Java 2D has for a frame that the processor drew into an array. Each turn ends when
 * the display has shown its last frame. A canvas waits for the display once a frame, in AWT; its equal is the bare loop
 * that does the same.
 *
 * <p>Arguments: the bare program, width, height, frames per turn, rounds.
 */
public final class PresentBench {
  /** Shows a number of frames. */
  private interface Way {
    void show(int frames);
  }

  private static final String[] BARE = {
    "bare loop, no wait but the last", "bare loop, XSync each frame", "bare loop, waiting as AWT does"
  };
  private static final int EQUAL = 2;

  private final int width;
  private final int height;
  private final Process bare;
  private final PrintWriter toBare;
  private final BufferedReader fromBare;

  private PresentBench(String program, int width, int height) throws Exception {
    this.width = width;
    this.height = height;
    bare =
        new ProcessBuilder(program, "" + width, "" + height).redirectError(ProcessBuilder.Redirect.INHERIT).start();
    toBare = new PrintWriter(bare.getOutputStream(), true);
    fromBare = new BufferedReader(new InputStreamReader(bare.getInputStream()));
  }

  public static void main(String[] arguments) throws Exception {
    int frames = Integer.parseInt(arguments[3]);
    int rounds = Integer.parseInt(arguments[4]);
    PresentBench bench =
        new PresentBench(arguments[0], Integer.parseInt(arguments[1]), Integer.parseInt(arguments[2]));
    bench.compare(frames, rounds);
    bench.toBare.close();
    bench.bare.waitFor();
    System.exit(0);
  }

  private double bareTurn(int frames, int wait) throws Exception {
    toBare.println(frames + " " + wait);
    return frames * 1e9 / Long.parseLong(fromBare.readLine());
  }

  private static double turn(Way way, int frames) {
    java.awt.Toolkit awt = java.awt.Toolkit.getDefaultToolkit();
    awt.sync();
    long start = System.nanoTime();
    way.show(frames);
    awt.sync();
    return frames * 1e9 / (System.nanoTime() - start);
  }

  private void compare(int frames, int rounds) throws Exception {
    Frame window = new Frame();
    window.setUndecorated(true);
    Canvas component = new Canvas();
    component.setIgnoreRepaint(true);
    component.setPreferredSize(new Dimension(width, height));
    EventQueue.invokeAndWait(
        () -> {
          window.add(component);
          window.pack();
          window.setVisible(true);
        });
    Thread.sleep(300);

    Toolkit toolkit = Toolkit.create();
    velmark5.Canvas canvas = toolkit.createCanvas(component, width, height);
    toolkit.drawTo(canvas);
    Map<String, Way> ways = new LinkedHashMap<>();
    ways.put(
        "velmark5 canvas",
        n -> {
          for (int i = 0; i < n; ++i) {
            canvas.present();
          }
        });
    javaWays(component, ways);

    Map<String, double[]> rates = new LinkedHashMap<>();
    for (String name : BARE) rates.put(name, new double[rounds]);
    for (String name : ways.keySet()) rates.put(name, new double[rounds]);
    for (int round = -1; round < rounds; ++round) {
      int slot = Math.max(round, 0); // the first round warms up
      for (int wait = 0; wait < BARE.length; ++wait) rates.get(BARE[wait])[slot] = bareTurn(frames, wait);
      for (Map.Entry<String, Way> way : ways.entrySet()) {
        rates.get(way.getKey())[slot] = turn(way.getValue(), frames);
      }
    }
    System.out.printf(
        "%dx%d, medians of %d rounds of %d frames; per cent of \"%s\"%n", width, height, rounds, frames, BARE[EQUAL]);
    double equal = median(rates.get(BARE[EQUAL]));
    rates.forEach(
        (name, perSecond) -> {
          double rate = median(perSecond);
          System.out.printf("  %-42s %7.0f /s  %6.1f %%%n", name, rate, 100 * rate / equal);
        });
    toolkit.close();
    EventQueue.invokeAndWait(window::dispose);
  }

  /** The frame is an array that is written to each time, so Java 2D must take it to the display each time. */
  private void javaWays(Canvas component, Map<String, Way> ways) {
    GraphicsConfiguration screen = component.getGraphicsConfiguration();
    component.createBufferStrategy(2);
    BufferStrategy strategy = component.getBufferStrategy();
    Map<String, BufferedImage> images = new LinkedHashMap<>();
    images.put("BufferedImage RGB", new BufferedImage(width, height, BufferedImage.TYPE_INT_RGB));
    images.put("BufferedImage ARGB", new BufferedImage(width, height, BufferedImage.TYPE_INT_ARGB));
    images.put("compatible image", screen.createCompatibleImage(width, height));
    images.forEach(
        (name, image) -> {
          int[] pixels = ((DataBufferInt) image.getRaster().getDataBuffer()).getData();
          Arrays.fill(pixels, 0xFF405060);
          ways.put(
              name + " on the component",
              n -> {
                Graphics graphics = component.getGraphics();
                for (int i = 0; i < n; ++i) {
                  pixels[i % pixels.length] = i;
                  graphics.drawImage(image, 0, 0, null);
                }
                graphics.dispose();
              });
          ways.put(
              name + " through BufferStrategy",
              n -> {
                for (int i = 0; i < n; ++i) {
                  pixels[i % pixels.length] = i;
                  Graphics graphics = strategy.getDrawGraphics();
                  graphics.drawImage(image, 0, 0, null);
                  graphics.dispose();
                  strategy.show();
                }
              });
        });
    BufferedImage image = images.get("BufferedImage RGB");
    int[] pixels = ((DataBufferInt) image.getRaster().getDataBuffer()).getData();
    VolatileImage middle = screen.createCompatibleVolatileImage(width, height);
    ways.put(
        "BufferedImage RGB through VolatileImage",
        n -> {
          Graphics graphics = component.getGraphics();
          for (int i = 0; i < n; ++i) {
            pixels[i % pixels.length] = i;
            middle.validate(screen);
            Graphics into = middle.createGraphics();
            into.drawImage(image, 0, 0, null);
            into.dispose();
            graphics.drawImage(middle, 0, 0, null);
          }
          graphics.dispose();
        });
  }

  private static double median(double[] values) {
    double[] sorted = values.clone();
    Arrays.sort(sorted);
    int half = sorted.length / 2;
    return sorted.length % 2 == 1 ? sorted[half] : (sorted[half - 1] + sorted[half]) / 2;
  }
}
