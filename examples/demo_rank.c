/* Median and morphology on every level. */
#include <stdio.h>

#include "zor.h"
#include "demo.h"

void demo_rank(void) {}
