// Preloaded into ippeveprinter, which does not start without a DNS-SD service even when told to advertise
// nothing: answers its start-up questions as a service that is there and has nothing to do.
#include <avahi-client/client.h>
#include <avahi-common/thread-watch.h>
#include <stddef.h>

static int service;

AvahiThreadedPoll *avahi_threaded_poll_new(void) {
    return (AvahiThreadedPoll *)&service;
}

const AvahiPoll *avahi_threaded_poll_get(AvahiThreadedPoll *poll) {
    (void)poll;
    return (const AvahiPoll *)&service;
}

int avahi_threaded_poll_start(AvahiThreadedPoll *poll) {
    (void)poll;
    return 0;
}

void avahi_threaded_poll_lock(AvahiThreadedPoll *poll) {
    (void)poll;
}

void avahi_threaded_poll_unlock(AvahiThreadedPoll *poll) {
    (void)poll;
}

AvahiClient *avahi_client_new(const AvahiPoll *poll, AvahiClientFlags flags, AvahiClientCallback callback,
                              void *context, int *error) {
    (void)poll;
    (void)flags;
    (void)callback;
    (void)context;
    if (error != NULL)
        *error = 0;
    return (AvahiClient *)&service;
}

const char *avahi_client_get_host_name_fqdn(AvahiClient *client) {
    (void)client;
    return "localhost";
}

int avahi_client_errno(AvahiClient *client) {
    (void)client;
    return 0;
}
