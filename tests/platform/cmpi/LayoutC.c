/* The binary layout of the CMPI headers, as C sees it. A wrong row does not
 * compile; the function exists so that the test runner can report the check. */
#include <cmpift.h>

#if __SIZEOF_POINTER__ == 8
#define LAYOUT_BYTES(wide, narrow) (wide)
#else
#define LAYOUT_BYTES(wide, narrow) (narrow)
#endif
#define LAYOUT_SIZE(type, wide, narrow) \
    _Static_assert(sizeof(type) == LAYOUT_BYTES(wide, narrow), #type);
#define LAYOUT_OFFSET(type, member, wide, narrow) \
    _Static_assert(offsetof(type, member) == LAYOUT_BYTES(wide, narrow), #type "." #member);
#include "layout.inc"
#undef LAYOUT_SIZE
#undef LAYOUT_OFFSET

#define LAYOUT_SIZE(type, wide, narrow) +1
#define LAYOUT_OFFSET(type, member, wide, narrow) +1
int layoutRowsCheckedAsC(void);
int layoutRowsCheckedAsC(void) {
    return 0
#include "layout.inc"
        ;
}
