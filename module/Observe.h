/* What the module tells of itself to a program that has it loaded, beside CMPI.
 *
 * The function is found by its name:
 *     tavrin_fc_observe_t *observe = (tavrin_fc_observe_t *)dlsym(module, "tavrin_fc_observe");
 *
 * It may be called at any time from any thread, waits for nothing, starts nothing, and is cheap: a refresh neither
 * holds it up nor notices it. Later versions add members behind those of the earlier ones. */
#ifndef TAVRIN_FC_OBSERVE_H
#define TAVRIN_FC_OBSERVE_H

#include <stdint.h>

#ifdef __cplusplus
extern "C"
{
#endif

#define TAVRIN_FC_OBSERVE_VERSION 1

    struct tavrin_fc_observation
    {
        /* The newest version that the caller knows goes in, that of what was filled comes out. */
        uint32_t version;
        /* 1 where the libraries of the hardware are in use. 0 before the first provider is loaded, after the last one
         * is unloaded, and where they are missing. */
        uint32_t loaded;
        /* 1 while a refresh of the cache runs. */
        uint32_t refresh_running;
        /* 1 where the next enumeration starts a refresh however young the cache is: there was none yet, the last one
         * left something out, or a client changed what the cache shows. */
        uint32_t refresh_pending;
        /* Refreshes that have ended since the process began. */
        uint64_t refreshes;
        /* Microseconds since the last one ended, which is the age of the cache, and those it took. Nothing before the
         * first. The largest number as the age where the clock was set back since: an enumeration starts a refresh. */
        uint64_t cache_age;
        uint64_t refresh_length;
        /* Microseconds from which age on an enumeration starts a refresh; 0 where no provider is loaded. */
        uint64_t cache_timeout;
    };

    /* Takes how many calls of an entry point of the libraries failed since the process began. Each entry point that the
     * module calls, and whose answers tell a failure, comes once, in the order of a table; the name lives as long as
     * the module. Calls of absent entry points do not count, nor do answers that a host gives that is well, such as
     * that an adapter does not have what it was asked for. */
    typedef void tavrin_fc_call_failures_t(void* client, const char* entry_point, uint64_t failures);

    /* Fills `observation` and then calls `failures` for each entry point, unless that is null. 0, or 1 with nothing
     * done where the observation is null or its version is none. */
    typedef int tavrin_fc_observe_t(struct tavrin_fc_observation* observation, tavrin_fc_call_failures_t* failures,
                                    void* client);

#ifdef __cplusplus
}
#endif

#endif
