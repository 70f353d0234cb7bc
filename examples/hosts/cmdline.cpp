// DWXCmdLine: options with a single hyphen, each taking the values after it.
// Try: cmdline photo.jpg -size 800 600 -quality 90
#include <dwxcore/dwxcmdline.h>

#include <stdio.h>

int main(int argc, char** argv) {
    DWXCmdLine line(argc, argv);

    // Arguments before the first option belong to the program-name entry.
    const char* input = line.GetString(argv[0], "default.jpg", 0);
    int width = line.GetInt("-size", 1024, 0);
    int height = line.GetInt("-size", 768, 1);
    int quality = line.GetInt("-quality", 75);
    printf("%s at %dx%d, quality %d%s\n", input, width, height, quality,
           line.Exist("-verbose") ? ", verbose" : "");

    // A command string is split at blanks; negative numbers need "--".
    DWXCmdLine command("resize -by --10 -fit");
    printf("by %d, fit %d, fit values %d\n", command.GetInt("-by", 0), command.Exist("-FIT"),
           command.Count("-fit"));
    return 0;
}
