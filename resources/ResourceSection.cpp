// The module's resource table: the blob that resgen built, placed into the
// section "archway_res" (allocated, read-only), where a host finds it by name
// in the file. The module finds it through the two hidden labels around it.
// They stand in for the linker's __start_/__stop_ symbols, which GNU ld puts
// into the dynamic symbol table of a shared library whatever their declared
// visibility, and the module exports nothing but its entry point.
// ARCHWAY_RESOURCE_BLOB is the blob's path, set by the build.

__asm__(
    ".pushsection archway_res,\"a\",@progbits\n"
    ".balign 16\n"
    ".globl archway_resources_begin\n"
    ".hidden archway_resources_begin\n"
    "archway_resources_begin:\n"
    ".incbin \"" ARCHWAY_RESOURCE_BLOB
    "\"\n"
    ".globl archway_resources_end\n"
    ".hidden archway_resources_end\n"
    "archway_resources_end:\n"
    ".popsection\n");
