/* The smallest host: built against an installed tree, it creates a tool object, converts the
 * white of a profile that does not exist (an empty profile gives zeros) and frees it. */
#include <stdio.h>

#include <vantrel.h>

int main(void) {
    void* tool = NULL;
    if (dllInit(NULL, &tool, NULL) != 0 || !tool) return 1;
    const int cmyk[4] = {0, 0, 0, 0};
    int lab[3] = {-1, -1, -1}, xyz[3] = {-1, -1, -1};
    const int rc = Cmyk2Lab_Double(tool, "", 1, cmyk, 0, lab, 0, xyz);
    dllFree(tool);
    printf("tiny host: Cmyk2Lab_Double with no profile = %d\n", rc);
    return rc == -1 ? 0 : 1;
}
