/* Image point operations on every level. */
#include <stdio.h>

#include "zor.h"
#include "demo.h"

void demo_point(void) {}
