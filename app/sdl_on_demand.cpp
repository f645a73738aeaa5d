#include "sdl_on_demand.h"

#include <SDL.h>
#include <dlfcn.h>

const char *load_sdl() {
  // Global, so that the functions below find it behind whatever has been put in front of it.
  return dlopen("libSDL-1.2.so.0", RTLD_NOW | RTLD_GLOBAL) != nullptr ? nullptr : dlerror();
}

namespace {

template <typename Function>
Function *next(Function *, const char *name) {
  void *function = dlsym(RTLD_NEXT, name);
  if (function == nullptr && load_sdl() == nullptr) function = dlsym(RTLD_NEXT, name);
  return reinterpret_cast<Function *>(function);
}

}  // namespace

// What sdl.cpp calls. Weak: a program that has functions of these names itself is linked with its own.
// NOLINTBEGIN(bugprone-macro-parentheses): a parameter list and its arguments come in theirs.
#define FORWARD(result, name, parameters, arguments)  \
  [[gnu::weak]] result name parameters {              \
    static auto *const function = next(&name, #name); \
    return function arguments;                        \
  }
// NOLINTEND(bugprone-macro-parentheses)

extern "C" {
FORWARD(int, SDL_Init, (Uint32 flags), (flags))
FORWARD(void, SDL_Quit, (), ())
FORWARD(char *, SDL_GetError, (), ())
FORWARD(SDL_Surface *, SDL_SetVideoMode, (int width, int height, int bits, Uint32 flags),
        (width, height, bits, flags))
FORWARD(void, SDL_WM_SetCaption, (const char *title, const char *icon), (title, icon))
FORWARD(SDL_Overlay *, SDL_CreateYUVOverlay, (int width, int height, Uint32 format, SDL_Surface *surface),
        (width, height, format, surface))
FORWARD(void, SDL_FreeYUVOverlay, (SDL_Overlay * overlay), (overlay))
FORWARD(int, SDL_LockYUVOverlay, (SDL_Overlay * overlay), (overlay))
FORWARD(void, SDL_UnlockYUVOverlay, (SDL_Overlay * overlay), (overlay))
FORWARD(int, SDL_DisplayYUVOverlay, (SDL_Overlay * overlay, SDL_Rect *place), (overlay, place))
FORWARD(void, SDL_PumpEvents, (), ())
FORWARD(int, SDL_PollEvent, (SDL_Event * event), (event))
}
