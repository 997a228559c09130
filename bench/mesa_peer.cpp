#include "mesa_peer.h"

#define GL_GLEXT_PROTOTYPES
#include <GL/osmesa.h>
#include <signal.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

using triangle_scene::kind;

struct gl_vertex {
  float position[4];  // clip coordinates
  float colour[4];    // red, green, blue, alpha
  float texture[2];
  float weights[3];
  float fog;
};

double wall_seconds() {
  return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

}  // namespace

// One GL context and the scene that it drew last.
class mesa_renderer {
 public:
  using request = mesa_peer::request;

  bool start() {
    const int attributes[] = {
        OSMESA_FORMAT, OSMESA_BGRA, OSMESA_DEPTH_BITS, 24, OSMESA_PROFILE, OSMESA_COMPAT_PROFILE, 0};
    const OSMesaContext context = OSMesaCreateContextAttribs(attributes, nullptr);
    if (context == nullptr) return false;
    frame_.resize(static_cast<std::size_t>(triangle_scene::width * triangle_scene::height));
    if (!OSMesaMakeCurrent(context, frame_.data(), GL_UNSIGNED_BYTE, triangle_scene::width, triangle_scene::height)) {
      return false;
    }
    glEnable(GL_DEPTH_TEST);
    glDepthFunc(GL_LEQUAL);
    glClearColor(0, 0, 0, 0);
    glFogi(GL_FOG_MODE, GL_LINEAR);
    glFogi(GL_FOG_COORDINATE_SOURCE, GL_FOG_COORDINATE);
    glFogf(GL_FOG_START, 0.5f);
    glFogf(GL_FOG_END, 1);
    const float fog[] = {0.6f, 0.6f, 0.5f, 1};
    glFogfv(GL_FOG_COLOR, fog);
    for (int i = 0; i < 4; ++i) make_texture(i);
    program_ = make_blending_program();
    return program_ != 0;
  }

  mesa_peer::result draw_models(const model_scene::scene& scene, bool count_pixels) {
    if (model_program_ == 0) prepare(scene);
    glFinish();
    const double wall_begin = wall_seconds(), begin = triangle_scene::thread_seconds();
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    for (const model_scene::piece& m : scene.models) {
      glLoadMatrixf(m.transform.data());
      glDrawElements(GL_TRIANGLES, static_cast<GLsizei>(m.index_count), GL_UNSIGNED_INT,
                     reinterpret_cast<const void*>(m.first_index * sizeof(std::uint32_t)));
    }
    glFinish();
    const double seconds = triangle_scene::thread_seconds() - begin, wall = wall_seconds() - wall_begin;
    return {seconds, count_pixels ? covered() : 0, wall};
  }

  mesa_peer::result draw(const request& r) {
    if (size_ != r.size || what_ != r.what) prepare(r);
    const std::size_t count = vertices_.size() / 3;
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    glFinish();
    const double wall_begin = wall_seconds(), begin = triangle_scene::thread_seconds();
    if (r.count_pixels) {
      for (std::size_t i = 0; i < count; i += triangle_scene::sparse_step(r.size, count)) {
        glDrawArrays(GL_TRIANGLES, static_cast<GLint>(i * 3), 3);
      }
    } else {
      glDrawArrays(GL_TRIANGLES, 0, static_cast<GLsizei>(count * 3));
    }
    glFinish();
    const double seconds = triangle_scene::thread_seconds() - begin, wall = wall_seconds() - wall_begin;
    return {seconds, r.count_pixels ? covered() : 0, wall};
  }

 private:
  long covered() const {
    std::vector<float> depths(frame_.size());
    glReadPixels(0, 0, triangle_scene::width, triangle_scene::height, GL_DEPTH_COMPONENT, GL_FLOAT, depths.data());
    return static_cast<long>(depths.size()) - std::count(depths.begin(), depths.end(), 1.0f);
  }

  // Textures 0 to 2 are the scene's, 3 is the light map.
  static void make_texture(int i) {
    std::vector<std::uint32_t> texels;
    for (int v = 0; v < 128; ++v) {
      for (int u = 0; u < 128; ++u) {
        texels.push_back(i < 3 ? triangle_scene::texel(i, u, v) : triangle_scene::light(u, v) * 0x10101u | 0xFF000000u);
      }
    }
    glBindTexture(GL_TEXTURE_2D, static_cast<GLuint>(i + 1));
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
    glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA8, 128, 128, 0, GL_BGRA, GL_UNSIGNED_BYTE, texels.data());
  }

  static GLuint make_program(const char* vertex_shader, const char* fragment_shader) {
    const GLuint program = glCreateProgram();
    const auto add = [program](GLenum type, const char* text) {
      const GLuint shader = glCreateShader(type);
      glShaderSource(shader, 1, &text, nullptr);
      glCompileShader(shader);
      glAttachShader(program, shader);
    };
    add(GL_VERTEX_SHADER, vertex_shader);
    add(GL_FRAGMENT_SHADER, fragment_shader);
    glLinkProgram(program);
    int linked = 0;
    glGetProgramiv(program, GL_LINK_STATUS, &linked);
    return linked ? program : 0;
  }

  static GLuint make_blending_program() {
    const GLuint program = make_program(
        "varying vec4 colour; varying vec2 uv; varying vec3 weights;\n"
        "void main() { gl_Position = gl_Vertex; colour = gl_Color; uv = gl_MultiTexCoord0.xy;\n"
        "  weights = gl_MultiTexCoord1.xyz; }\n",
        "varying vec4 colour; varying vec2 uv; varying vec3 weights; uniform sampler2D a, b, c;\n"
        "void main() { gl_FragColor = colour * (texture2D(a, uv) * weights.x + texture2D(b, uv) * weights.y\n"
        "  + texture2D(c, uv) * weights.z); }\n");
    if (program == 0) return 0;
    glUseProgram(program);
    const char* const samplers[] = {"a", "b", "c"};
    for (int i = 0; i < 3; ++i) glUniform1i(glGetUniformLocation(program, samplers[i]), i);
    glUseProgram(0);
    return program;
  }

  // Everything that stays from frame to frame: buffers, program, state. A context draws either models or triangles.
  void prepare(const model_scene::scene& scene) {
    const auto upload = [](GLenum target, const auto& data) {
      GLuint buffer = 0;
      glGenBuffers(1, &buffer);
      glBindBuffer(target, buffer);
      glBufferData(target, static_cast<GLsizeiptr>(data.size() * sizeof data[0]), data.data(), GL_STATIC_DRAW);
    };
    upload(GL_ARRAY_BUFFER, scene.vertices);
    upload(GL_ELEMENT_ARRAY_BUFFER, scene.indices);
    const auto stride = static_cast<GLsizei>(sizeof(model_scene::vertex));
    const auto offset = [](std::size_t bytes) { return reinterpret_cast<const void*>(bytes); };
    glEnableClientState(GL_VERTEX_ARRAY);
    glVertexPointer(3, GL_FLOAT, stride, offset(offsetof(model_scene::vertex, position)));
    glEnableClientState(GL_NORMAL_ARRAY);
    glNormalPointer(GL_FLOAT, stride, offset(offsetof(model_scene::vertex, normal)));
    glEnableClientState(GL_TEXTURE_COORD_ARRAY);
    glTexCoordPointer(2, GL_FLOAT, stride, offset(offsetof(model_scene::vertex, texture)));
    glEnable(GL_CULL_FACE);
    glFrontFace(GL_CW);
    glMatrixMode(GL_MODELVIEW);
    glBindTexture(GL_TEXTURE_2D, 1);
    model_program_ = make_program(
        "uniform vec3 base, sun, levels; varying vec3 colour; varying vec2 uv;\n"
        "void main() { gl_Position = gl_ModelViewMatrix * gl_Vertex; uv = gl_MultiTexCoord0.xy;\n"
        "  float d = dot(sun, gl_Normal); colour = base * (levels.x + d * (d > 0.0 ? levels.y : levels.z)); }\n",
        "varying vec3 colour; varying vec2 uv; uniform sampler2D texels;\n"
        "void main() { gl_FragColor = vec4(colour, 1.0) * texture2D(texels, uv); }\n");
    if (model_program_ == 0) std::abort();
    glUseProgram(model_program_);
    const auto set = [this](const char* name, float x, float y, float z) {
      glUniform3f(glGetUniformLocation(model_program_, name), x, y, z);
    };
    set("base", scene.colour[0], scene.colour[1], scene.colour[2]);
    set("sun", scene.sun[0], scene.sun[1], scene.sun[2]);
    set("levels", scene.ambient, scene.front, scene.back);
  }

  static void enable(GLenum capability, bool on) { on ? glEnable(capability) : glDisable(capability); }

  void prepare(const request& r) {
    size_ = r.size;
    what_ = r.what;
    vertices_.clear();
    for (const auto& t : triangle_scene::make(r.size, r.what == kind::textured_translucent)) {
      for (int i = 0; i < 3; ++i) {
        const auto& p = t[static_cast<std::size_t>(i)];
        // A perspective: w grows with depth.
        const float w = 1 + p.z;
        const auto channel = [&](int shift) { return static_cast<float>(p.colour >> shift & 0xFF) / 255; };
        vertices_.push_back({{(p.x / (triangle_scene::width / 2) - 1) * w, (1 - p.y / (triangle_scene::height / 2)) * w,
                              (2 * p.z - 1) * w, w},
                             {channel(16), channel(8), channel(0), channel(24)},
                             {p.u / 128, p.v / 128},
                             {i == 0 ? 1.0f : 0.0f, i == 1 ? 1.0f : 0.0f, i == 2 ? 1.0f : 0.0f},
                             p.z});
      }
    }
    const auto stride = static_cast<GLsizei>(sizeof(gl_vertex));
    const gl_vertex* const v = vertices_.data();
    glEnableClientState(GL_VERTEX_ARRAY);
    glVertexPointer(4, GL_FLOAT, stride, v->position);
    const bool coloured = r.what != kind::depth_only;
    coloured ? glEnableClientState(GL_COLOR_ARRAY) : glDisableClientState(GL_COLOR_ARRAY);
    glColorPointer(4, GL_FLOAT, stride, v->colour);
    glColorMask(coloured, coloured, coloured, coloured);
    r.what == kind::textured_fog ? glEnableClientState(GL_FOG_COORD_ARRAY) : glDisableClientState(GL_FOG_COORD_ARRAY);
    glFogCoordPointer(GL_FLOAT, stride, &v->fog);
    enable(GL_FOG, r.what == kind::textured_fog);
    enable(GL_BLEND, r.what == kind::textured_translucent || r.what == kind::pixel_alpha);
    glBlendFunc(GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA);
    glUseProgram(r.what == kind::three_textures ? program_ : 0);

    const bool textured = coloured && r.what != kind::smooth;
    for (int unit = 2; unit >= 0; --unit) {
      glActiveTexture(static_cast<GLenum>(GL_TEXTURE0 + unit));
      glBindTexture(GL_TEXTURE_2D, unit == 1 && r.what == kind::light_map ? 4 : static_cast<GLuint>(unit + 1));
      glTexEnvi(GL_TEXTURE_ENV, GL_TEXTURE_ENV_MODE, GL_MODULATE);
      enable(GL_TEXTURE_2D, (textured && unit == 0) || (r.what == kind::light_map && unit == 1));
      glClientActiveTexture(static_cast<GLenum>(GL_TEXTURE0 + unit));
      const bool weights = r.what == kind::three_textures && unit == 1;
      (textured && unit == 0) || weights || (r.what == kind::light_map && unit == 1)
          ? glEnableClientState(GL_TEXTURE_COORD_ARRAY)
          : glDisableClientState(GL_TEXTURE_COORD_ARRAY);
      glTexCoordPointer(weights ? 3 : 2, GL_FLOAT, stride, weights ? v->weights : v->texture);
    }
  }

  std::vector<std::uint32_t> frame_;
  std::vector<gl_vertex> vertices_;
  GLuint program_ = 0, model_program_ = 0;
  int size_ = 0;
  kind what_{};
};

// What the process does until the pipe closes.
void mesa_peer::serve(int requests, int results, int vector_width, int threads, const model_scene::scene* models) {
  setenv("GALLIUM_DRIVER", "llvmpipe", 1);
  setenv("LP_NUM_THREADS", std::to_string(threads).c_str(), 1);
  setenv("LP_NATIVE_VECTOR_WIDTH", std::to_string(vector_width).c_str(), 1);
  mesa_renderer gl;
  const bool usable = gl.start();
  request r;
  while (read(requests, &r, sizeof r) == static_cast<ssize_t>(sizeof r)) {
    const result answer = !usable ? result{-1, 0, 0} : r.models ? gl.draw_models(*models, r.count_pixels) : gl.draw(r);
    if (write(results, &answer, sizeof answer) != static_cast<ssize_t>(sizeof answer)) break;
  }
  _exit(0);
}

mesa_peer::mesa_peer(int vector_width, int threads, const model_scene::scene* models) {
  int to[2], from[2];
  if (pipe(to) != 0 || pipe(from) != 0) std::abort();
  const pid_t child = fork();
  if (child < 0) std::abort();
  if (child == 0) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    close(to[1]);
    close(from[0]);
    serve(to[0], from[1], vector_width, threads, models);
  }
  close(to[0]);
  close(from[1]);
  requests_ = to[1];
  results_ = from[0];
}

mesa_peer::result mesa_peer::draw(kind what, int size, bool count_pixels) {
  return ask({what, size, count_pixels, false});
}

mesa_peer::result mesa_peer::draw_models(bool count_pixels) { return ask({{}, 0, count_pixels, true}); }

mesa_peer::result mesa_peer::ask(const request& r) {
  result answer{-1, 0, 0};
  if (write(requests_, &r, sizeof r) != static_cast<ssize_t>(sizeof r) ||
      read(results_, &answer, sizeof answer) != static_cast<ssize_t>(sizeof answer)) {
    return {-1, 0, 0};
  }
  return answer;
}
