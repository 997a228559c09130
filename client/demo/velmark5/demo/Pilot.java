package velmark5.demo;

import java.awt.Component;
import java.awt.event.KeyAdapter;
import java.awt.event.KeyEvent;
import java.awt.event.MouseAdapter;
import java.awt.event.MouseEvent;
import java.util.HashSet;
import java.util.Set;
import velmark5.Matrix;

/**
 * The camera. It flies around the village by itself until a key or the mouse takes over: drag to look, W A S D or the
 * arrow keys to move, Q and E for down and up, Shift to hurry, F to fly by itself again.
 */
final class Pilot {
  private static final double CLEARANCE = 130;
  private static final double LIMIT = 4200;
  private static final double CENTRE = 60;

  // Written by the thread of the window's events, read by the one that draws.
  private final Set<Integer> pressed = new HashSet<>();
  private double turn;
  private double tilt;
  private boolean manual;
  private int dragX;
  private int dragY;

  private double x;
  private double up = 600;
  private double z;
  private double heading;
  private double pitch;
  private double before;

  /** Listens to a window's component. */
  void attach(Component component) {
    component.addKeyListener(
        new KeyAdapter() {
          @Override
          public void keyPressed(KeyEvent e) {
            key(e.getKeyCode(), true);
          }

          @Override
          public void keyReleased(KeyEvent e) {
            key(e.getKeyCode(), false);
          }
        });
    MouseAdapter mouse =
        new MouseAdapter() {
          @Override
          public void mousePressed(MouseEvent e) {
            component.requestFocusInWindow();
            drag(e.getX(), e.getY(), false);
          }

          @Override
          public void mouseDragged(MouseEvent e) {
            drag(e.getX(), e.getY(), true);
          }
        };
    component.addMouseListener(mouse);
    component.addMouseMotionListener(mouse);
    component.setFocusable(true);
    component.requestFocusInWindow();
  }

  private synchronized void key(int code, boolean down) {
    if (code == KeyEvent.VK_F && down) {
      manual = false;
      pressed.clear();
    } else if (!down) {
      pressed.remove(code);
    } else if (pressed.add(code) && code != KeyEvent.VK_SHIFT) {
      manual = true;
    }
  }

  private synchronized void drag(int toX, int toY, boolean moves) {
    if (moves) {
      turn += (dragX - toX) * 0.004;
      tilt += (dragY - toY) * 0.004;
      manual = true;
    }
    dragX = toX;
    dragY = toY;
  }

  /** Brings the camera to its place at a time. */
  synchronized void move(double seconds) {
    double passed = Math.max(0, Math.min(0.1, seconds - before));
    before = seconds;
    if (manual) {
      steer(passed);
    } else {
      fly(seconds);
    }
    turn = 0;
    tilt = 0;
    up = Math.max(up, Math.max(0, Island.height(x, z)) + CLEARANCE);
  }

  /**
   * How far out its way goes: over the bay in the south, close to the village under the cliffs in the north, around the
   * mill in the west.
   */
  private static double orbit(double angle) {
    double west = Math.max(0, -Math.cos(angle));
    return 2120 - 660 * Math.sin(angle) + 430 * west * west;
  }

  /** How far a place is from the way on which the camera flies by itself. */
  static double wayDistance(double x, double z) {
    return Math.abs(Math.hypot(x - CENTRE, z - CENTRE) - orbit(Math.atan2(z - CENTRE, x - CENTRE)));
  }

  private void fly(double seconds) {
    double angle = -1.78 + seconds * 0.036;
    double far = orbit(angle);
    x = CENTRE + far * Math.cos(angle);
    z = CENTRE + far * Math.sin(angle);
    up = 930 + 120 * Math.sin(seconds * 0.06 - 0.4);
    for (double ahead = -300; ahead <= 300; ahead += 100) {
      up = Math.max(up, Island.height(x - ahead * Math.sin(angle), z + ahead * Math.cos(angle)) + 560 - Math.abs(ahead) * 0.4);
    }
    double dx = 90 - x;
    double dz = 60 - z;
    heading = Math.atan2(dx, dz);
    pitch = Math.atan2(260 - up, Math.hypot(dx, dz));
  }

  private void steer(double passed) {
    heading -= turn;
    pitch = Math.max(-1.2, Math.min(1.0, pitch + tilt));
    double speed = (pressed.contains(KeyEvent.VK_SHIFT) ? 1500 : 550) * passed;
    double ahead = axis(KeyEvent.VK_W, KeyEvent.VK_UP) - axis(KeyEvent.VK_S, KeyEvent.VK_DOWN);
    double aside = axis(KeyEvent.VK_D, KeyEvent.VK_RIGHT) - axis(KeyEvent.VK_A, KeyEvent.VK_LEFT);
    double rise = axis(KeyEvent.VK_E, KeyEvent.VK_PAGE_UP) - axis(KeyEvent.VK_Q, KeyEvent.VK_PAGE_DOWN);
    x += speed * (ahead * Math.sin(heading) * Math.cos(pitch) + aside * Math.cos(heading));
    z += speed * (ahead * Math.cos(heading) * Math.cos(pitch) - aside * Math.sin(heading));
    up = Math.min(2200, up + speed * (ahead * Math.sin(pitch) + rise));
    double far = Math.hypot(x, z);
    if (far > LIMIT) {
      x *= LIMIT / far;
      z *= LIMIT / far;
    }
  }

  private int axis(int key, int other) {
    return pressed.contains(key) || pressed.contains(other) ? 1 : 0;
  }

  /** From the world to the view. */
  Matrix camera() {
    double level = Math.cos(pitch);
    return Matrix.lookAt(
        x, -up, z, x + level * Math.sin(heading), -up - Math.sin(pitch), z + level * Math.cos(heading));
  }

  double x() {
    return x;
  }

  double z() {
    return z;
  }

  /** Where it looks, 0 for north and growing to the east. */
  double heading() {
    return heading;
  }

  /** How far it looks above the horizon. */
  double pitch() {
    return pitch;
  }
}
