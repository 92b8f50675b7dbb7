/* CMPI 2.0 platform selection (C and C++).
 *
 * A program may name its platform before including any CMPI header, as other
 * header sets demand; without one, Linux with a GNU-compatible compiler is
 * taken, the only platform that this project builds on. */
#ifndef CMPIPL_H
#define CMPIPL_H

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif

#endif
