// A minimal host: links the installed libraries and uses both layers.
#include <dwxcore/dwxobject.h>
#include <services/utilhub.h>

#include <stdio.h>

int main() {
    char** words = Tokenize("installed \"package works\"");
    int count = CountStringList(words);
    DestroyStringList(words);
    if (count != 2) {
        fprintf(stderr, "unexpected token count %d\n", count);
        return 1;
    }
    printf("consumer ok\n");
    return 0;
}
