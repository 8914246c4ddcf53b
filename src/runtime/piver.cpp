// The version record of this level; zoriGetLibVersion hands out its address.
#include "variant.h"

ZOR_BEGIN

#if defined(ZOR_LEVEL_n8)
#define ZOR_BUILD_DATE "Oct  5 2018"
#else
#define ZOR_BUILD_DATE "Oct  4 2018"
#endif

#define ZOR_STR_(x) #x
#define ZOR_STR(x) ZOR_STR_(x)

static const ZorLibraryVersion version = {
    2019, 0, 1, 60629, ZOR_STR(ZOR_LEVEL), ZOR_LEVEL_TEXT, "2019.0.1 (r60629)", ZOR_BUILD_DATE,
};

ZOR_END

ZOR_ENTRY const ZorLibraryVersion* ZOR_NAME(zoriGetLibVersion)(void) {
    return &ZOR_NS::version;
}
