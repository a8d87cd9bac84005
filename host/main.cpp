// The stand-in host: the editor's side of the plug-in contract, as a program.

#include <cstdio>
#include <cstring>
#include <string>

namespace {

constexpr const char* kUsage =
    "Usage: archway <command> [options] <image>...\n"
    "\n"
    "Straightens what wide-angle, fisheye and panoramic photographs bend.\n"
    "\n"
    "Commands:\n"
    "  apply   correct the images silently, with the correction stored in an\n"
    "          action file (--action FILE) or from the default settings\n"
    "  edit    open the workspace on an image and correct it interactively\n"
    "\n"
    "Options:\n"
    "  --help  show this text\n";

}  // namespace

int main(int argc, char** argv) {
  if (argc < 2 || std::strcmp(argv[1], "--help") == 0 || std::strcmp(argv[1], "-h") == 0) {
    std::fputs(kUsage, argc < 2 ? stderr : stdout);
    return argc < 2 ? 2 : 0;
  }
  const std::string command = argv[1];
  if (command == "apply" || command == "edit") {
    std::fprintf(stderr,
                 "archway: '%s' needs the Archway module, which this build does not have yet\n",
                 command.c_str());
    return 1;
  }
  std::fprintf(stderr, "archway: unknown command '%s' (see archway --help)\n", command.c_str());
  return 2;
}
