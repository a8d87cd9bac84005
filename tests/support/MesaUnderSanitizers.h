#pragma once

// Leak checking for a test program that starts Mesa's OpenGL: include this
// in exactly one of its files. Mesa's EGL keeps a one-time allocation of its
// driver's start-up for the life of the process. The leak checker's scan of
// thread-local storage reads the driver libraries' dynamic thread-local
// blocks through a bogus bound and crashes, depending on how the libraries
// happen to load, so that scan is off; what only thread-local storage held
// then reads as lost, as the loader's own scope array, the text of the
// last dlerror() and the per-thread block of glib (which the framework's
// text layout loads) do. The slow unwinder is left to programs that need
// it: llvmpipe's shader compiler registers unwind tables under the
// unwinder's own lock, and in some programs a slow unwind of the driver's
// allocations deadlocks.
extern "C" const char* __lsan_default_options() { return "use_tls=0"; }
extern "C" const char* __lsan_default_suppressions() {
  return "leak:libEGL_mesa.so\nleak:add_to_global_resize\nleak:_dlerror_run\n"
         "leak:_dl_exception_create\nleak:libglib-2.0.so\n";
}
