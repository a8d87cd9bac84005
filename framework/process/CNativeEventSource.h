#pragma once

#include <cstdint>
#include <functional>

namespace Tarsa {

// A native window, as the native layer names it; 0 is none.
using CNativeWindowId = std::uint64_t;
// A native timer of the native layer; 0 is none (and a failed start).
using CNativeTimerId = std::uint32_t;

// The kinds of native event the process loop tells apart.
enum class ENativeKind : std::uint32_t {
  kNone = 0,
  kKeyDown,
  kKeyUp,
  kKeyChar,
  kSysKeyDown,
  kSysKeyUp,
  kSysKeyChar,
  kMouseMove,
  kMouseDown,
  kMouseUp,
  kMouseWheel,  // code: lines turned, as a signed 32-bit value, away from the user positive
  kTimer,       // a native tick; the pass goes on to idlers and timers after it
  kPaint,       // likewise
  kWindow,      // window moved, resized, closed, activated, ...
  kQuit,        // the user asked the application to end
  kWake,        // sent by Wake(); carries nothing
};

struct CNativePoint {
  std::int32_t x = 0;
  std::int32_t y = 0;
  friend bool operator==(const CNativePoint&, const CNativePoint&) = default;
};

// One native event: kind, window, time stamp and pointer and key state at the
// time, plus one code (key, button, ...) whose meaning depends on the kind.
struct CNativeEvent {
  ENativeKind kind = ENativeKind::kNone;
  CNativeWindowId window = 0;
  double time = 0.0;  // seconds, on the source's clock
  CNativePoint where;
  std::uint32_t modifiers = 0;
  std::uint32_t code = 0;
};

// Where the process loop gets native events, the time, the pointer and key
// state, window-bound timers and the keyboard focus from: the window layer
// on a desktop, an in-memory script in tests. Used from the main thread only,
// except Wake() and Now(), which any thread may call.
class CNativeEventSource {
 public:
  virtual ~CNativeEventSource() = default;

  // The next pending event, left in place.
  virtual bool Peek(CNativeEvent& event) = 0;
  // The next pending event, removed.
  virtual bool Take(CNativeEvent& event) = 0;
  // Blocks until an event is pending and removes it, or until the clock
  // reaches until (seconds), or until Wake(); false when no event came.
  virtual bool Wait(double until, CNativeEvent& event) = 0;
  // Ends a Wait() in progress or the next one; callable from any thread.
  virtual void Wake() = 0;

  // Seconds on a monotonic clock; callable from any thread.
  virtual double Now() const = 0;
  virtual CNativePoint Pointer() const = 0;
  virtual std::uint32_t Modifiers() const = 0;
  // The mouse buttons held now, one bit a button (ButtonBit in CKeyCodes.h).
  virtual std::uint32_t Buttons() const = 0;

  // A repeating timer on a window: tick(time) is called with the time of each
  // tick, in seconds, from the source's own event handling. 0 on failure.
  virtual CNativeTimerId StartTimer(CNativeWindowId window, double period,
                                    std::function<void(double)> tick) = 0;
  virtual void StopTimer(CNativeTimerId timer) = 0;

  virtual CNativeWindowId GetFocus() const = 0;
  virtual void SetFocus(CNativeWindowId window) = 0;

  // Takes the mouse for the window while a button is held, so that a drag
  // beyond its edge still reports; false releases it.
  virtual void CaptureMouse(bool capture) = 0;
};

}  // namespace Tarsa
