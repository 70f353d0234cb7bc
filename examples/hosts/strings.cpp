// DWXString: a counted string copied by value.
#include <dwxcore/dwxstring.h>

#include <stdio.h>

int main() {
    DWXString path("/home/ana/pictures/harbour.jpg");
    int slash = path.ReverseFind('/');
    DWXString file = path.Right(path.GetLength() - slash - 1);
    DWXString stem = file.Left(file.Find('.'));

    DWXString title = stem + " (" + DWXFormat("%d", 3000) + " px)";
    title.MakeUpper();
    printf("%s\n", static_cast<const char*>(title));
    printf("folder %s, same file: %d\n", static_cast<const char*>(path.Left(slash)),
           file.CompareNoCase("HARBOUR.JPG") == 0);
    return 0;
}
