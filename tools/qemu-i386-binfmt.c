/* The binfmt_misc interpreter for i386 programs: it runs them under qemu-i386-static with the
 * address space reserved the way 32-bit Wine needs it (without the reservation, Wine's loader
 * takes about fifty seconds to start a program instead of one to three).
 *
 * Registered with the flags P and F: the kernel passes the program's full path, then its
 * original argv[0] and arguments. qemu reads that same layout when its own name ends in
 * "-binfmt-P", so argv[0] is renamed accordingly. */
#include <stdio.h>
#include <stdlib.h>
#include <unistd.h>

#define QEMU "/usr/bin/qemu-i386-static"

int main(int argc, char** argv) {
    (void)argc;
    setenv("QEMU_RESERVED_VA", "0x7fff0000", 0);
    argv[0] = (char*)"qemu-i386-binfmt-P";
    execv(QEMU, argv);
    perror(QEMU);
    return 127;
}
