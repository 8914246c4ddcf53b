/* What the demo's parts share. Each part (vector, point, filter, rank, resize)
 * lives in its own file and is called from main in demo.c. */
#ifndef ZOR_DEMO_H
#define ZOR_DEMO_H

#include "zor.h"

double now_us(void);

/* Runs `op` once per runnable level (forcing the level), printing the best
 * of a few timings and what `report` says about the result; restores the
 * loader's choice afterwards. */
typedef void (*DemoOp)(void* ctx);
typedef void (*DemoReport)(void* ctx, const char* level);
void on_every_level(const char* title, DemoOp op, DemoReport report, void* ctx);

/* Writes an 8-bit grey image as binary PGM, viewable almost anywhere, into
 * the current directory (make demo runs in the build directory); prints
 * the file name; 0 on success. */
int write_pgm(const char* path, const Zor8u* pixels, int32_t step, int32_t width, int32_t height);

void demo_vectors(void);
void demo_elementwise(void);
void demo_point(void);
void demo_filter(void);
void demo_rank(void);
void demo_resize(void);

#endif
