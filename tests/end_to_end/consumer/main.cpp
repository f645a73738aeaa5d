#include <bit>
#include <cstdio>

#include "zv_lib.h"

int main() {
  HANDLE card = nullptr;
  if (zv_Open(&card) != ZV_OK) return 1;
  std::printf("%d channels with video\n", 16 - std::popcount(zv_GetVideoStatus(card)));
  return zv_Close(card);
}
