package velmark5.demo;

import java.awt.Dimension;
import java.awt.Frame;
import java.awt.GraphicsEnvironment;
import java.awt.event.WindowAdapter;
import java.awt.event.WindowEvent;
import java.awt.image.BufferedImage;
import java.io.IOException;
import java.util.List;
import java.util.Locale;
import java.util.concurrent.CountDownLatch;
import java.util.concurrent.TimeUnit;
import javax.imageio.ImageIO;
import velmark5.Canvas;
import velmark5.DepthBuffer;
import velmark5.MemoryPool;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Toolkit;

/**
 * The demo's main program: opens a window, draws the scenes into it until it is closed, and says once a second how
 * fast. Without a display it draws into an image.
 */
public final class Demo {
  private static final double FRAMES_PER_SECOND = 60;

  private final Options options;
  private final Pilot pilot = new Pilot();
  private volatile boolean running = true;
  private int drawn;

  private Demo(Options options) {
    this.options = options;
  }

  /**
   * Starts the demo.
   *
   * @param arguments see {@code --help}
   * @throws Exception if the picture cannot be written
   */
  public static void main(String[] arguments) throws Exception {
    Options options;
    try {
      options = Options.parse(arguments);
    } catch (IllegalArgumentException e) {
      System.err.println(e.getMessage());
      System.err.println(Options.USAGE);
      System.exit(2);
      return;
    }
    Demo demo = new Demo(options);
    // Ended from outside, the program still gives back the memory that it shares with the display.
    CountDownLatch ended = new CountDownLatch(1);
    Runtime.getRuntime().addShutdownHook(new Thread(() -> demo.stopAndWait(ended)));
    try {
      if (GraphicsEnvironment.isHeadless()) {
        demo.runInImage();
      } else {
        demo.runInWindow();
      }
    } finally {
      ended.countDown();
    }
  }

  private void stopAndWait(CountDownLatch ended) {
    running = false;
    try {
      ended.await(5, TimeUnit.SECONDS);
    } catch (InterruptedException e) {
      Thread.currentThread().interrupt();
    }
  }

  private void runInWindow() throws IOException {
    java.awt.Canvas component = new java.awt.Canvas();
    component.setIgnoreRepaint(true);
    component.setPreferredSize(new Dimension(options.width(), options.height()));
    Frame window = new Frame("velmark5");
    window.setBackground(java.awt.Color.BLACK);
    window.add(component);
    window.addWindowListener(
        new WindowAdapter() {
          @Override
          public void windowClosing(WindowEvent e) {
            running = false;
          }
        });
    window.pack();
    window.setVisible(true);
    pilot.attach(component);
    try (Toolkit toolkit = Toolkit.create(new Textures(), Textures.COUNT)) {
      // The window's place on the screen may be smaller than what was asked for.
      Canvas canvas = toolkit.createCanvas(component, Math.max(1, component.getWidth()), Math.max(1, component.getHeight()));
      new Show(toolkit) {
        @Override
        Rect fit() {
          int width = Math.max(1, component.getWidth());
          int height = Math.max(1, component.getHeight());
          if (width != canvas.width() || height != canvas.height()) {
            canvas.resize(width, height);
          }
          return new Rect(0, 0, width, height);
        }

        @Override
        boolean steered() {
          return options.frames() == 0;
        }

        @Override
        void select() {
          toolkit.drawTo(canvas);
        }

        @Override
        void present() {
          canvas.present();
        }
      }.run();
    } finally {
      window.dispose();
    }
  }

  private void runInImage() throws IOException {
    System.out.println("No display: drawing into an image.");
    try (Toolkit toolkit = Toolkit.create(new Textures(), Textures.COUNT)) {
      Sprite image = toolkit.createSprite(options.width(), options.height());
      DepthBuffer depth = toolkit.createDepthBuffer(options.width(), options.height());
      new Show(toolkit) {
        @Override
        Rect fit() {
          return new Rect(0, 0, options.width(), options.height());
        }

        @Override
        void select() {
          toolkit.drawTo(image, depth);
          toolkit.clearAll(velmark5.Colour.BLACK);
        }

        @Override
        void present() {
          running &= options.frames() > 0;
        }
      }.run();
    }
  }

  /** The loop, for whatever the frames are shown in. */
  private abstract class Show {
    private final Toolkit toolkit;
    private final Daylight day = new Daylight();
    private final List<Scene> scenes;
    private Rect laidOut = new Rect(0, 0, 0, 0);

    Show(Toolkit toolkit) {
      this.toolkit = toolkit;
      scenes = options.scene().equals("lake") ? lake() : village();
    }

    private List<Scene> lake() {
      MemoryPool pool = toolkit.createPool(1 << 20);
      Spectrum spectrum = new Spectrum(toolkit);
      Knot knot = new Knot(toolkit);
      Radar radar = new Radar(toolkit, pool);
      return List.of(
          new Sky(toolkit),
          new Hills(toolkit),
          new Lanterns(toolkit),
          new Stones(toolkit, pool, knot, false),
          knot,
          new Stones(toolkit, pool, knot, true),
          new Lake(toolkit),
          spectrum,
          radar,
          new Compass(toolkit),
          new Hud(toolkit, pool, spectrum, radar));
    }

    private List<Scene> village() {
      MemoryPool pool = toolkit.createPool(16 << 20);
      return List.of(
          new Firmament(toolkit, pilot, day),
          new Village(toolkit, pool, pilot, day),
          new Overlay(toolkit, pool, pilot, day, steered()));
    }

    /** Whether somebody can steer. */
    boolean steered() {
      return false;
    }

    /** Adapts the frame to what it is shown in, and returns its size. */
    abstract Rect fit();

    /** Makes the frame the target. */
    abstract void select();

    abstract void present();

    void run() throws IOException {
      long start = System.nanoTime();
      Meter console = new Meter(1);
      Meter shown = new Meter(0.5);
      while (true) {
        long began = System.nanoTime();
        // Decided before the frame is drawn, so that the last one fits the window as it was left.
        boolean last = !running || drawn + 1 == options.frames();
        // A counted run is the same in every run; else the clock leads.
        double seconds = options.start() + (options.frames() > 0 ? drawn / FRAMES_PER_SECOND : (began - start) / 1e9);
        draw(seconds);
        drawn++;
        // A present may exchange images, so the last frame is taken before it.
        BufferedImage picture = last && options.png() != null ? toolkit.snapshot() : null;
        present();
        long done = System.nanoTime();
        if (console.count(began, done, last)) {
          System.out.printf(
              Locale.ROOT,
              "frame %d: %.1f frames per second, %.2f ms each%n",
              drawn,
              console.framesPerSecond(),
              console.milliseconds());
        }
        if (shown.count(began, done, last)) {
          String reading =
              String.format(Locale.ROOT, "%.0f frames/s   %.1f ms", shown.framesPerSecond(), shown.milliseconds());
          scenes.forEach(scene -> scene.showRate(reading));
        }
        if (picture != null) {
          save(picture);
        }
        if (last) {
          break;
        }
        if (options.frames() == 0) {
          pause(began + (long) (1e9 / FRAMES_PER_SECOND));
        }
      }
    }

    private void draw(double seconds) {
      Rect size = fit();
      if (!size.equals(laidOut)) {
        scenes.forEach(scene -> scene.resize(size.width(), size.height()));
        laidOut = size;
      }
      toolkit.advance((int) ((long) (seconds * 1000) & Integer.MAX_VALUE));
      day.set(seconds);
      pilot.move(seconds);
      scenes.forEach(scene -> scene.prepare(seconds));
      select();
      scenes.forEach(scene -> scene.paint(seconds));
    }

    private void save(BufferedImage picture) throws IOException {
      if (!ImageIO.write(picture, "png", options.png().toAbsolutePath().toFile())) {
        throw new IOException("There is no writer of PNG files");
      }
    }

    private void pause(long until) {
      long left = until - System.nanoTime();
      if (left > 0) {
        try {
          TimeUnit.NANOSECONDS.sleep(left);
        } catch (InterruptedException e) {
          running = false;
        }
      }
    }
  }
}
