#include "platform/linux/desktop/PolkitAuthorization.h"

// Its exit status is the answer for the right that its one argument names.
int main(int count, char** arguments) {
    return count == 2 ? ventras::PolkitAuthorization().create(arguments[1]) : -1;
}
