/* Steering the simulated host from inside the process: for tests and for the command line.
 *
 * Link with libtvxsim.so, or open it by name: it is the very library that liblrmapi.so and
 * HBAAPI.so.2 share. All functions may be called from any thread; none throws.
 * A local port is named by its WWPN, as 16 hexadecimal digits or eight pairs with colons. */
#ifndef TVXSIM_TVXSIM_H
#define TVXSIM_TVXSIM_H

#ifdef __cplusplus
extern "C" {
#endif

/* Makes a new world of the file, and stays with it: TVX_SIM_SCENARIO is not looked at until this is
 * called with a null pointer, which goes back to the environment's scenario and reads it anew.
 * 0 on success; -1 if the scenario cannot be used: there are no adapters then. */
int tvxsim_load(const char* path);

/* The same from a text. */
int tvxsim_load_text(const char* json);

/* What was wrong with the last scenario or fault that was given by this thread; empty if nothing
 * was. The text stays until this thread's next call of these functions. */
const char* tvxsim_last_error(void);

/* Adds one fault, an object as in the "faults" of a scenario. 0, or -1 if it is malformed. */
int tvxsim_add_fault(const char* json);

/* Forgets all faults, those of the scenario too. */
void tvxsim_clear_faults(void);

/* How often an entry point was called since the world was made or the calls were forgotten, faults
 * included: through the given local port, or with a null pointer through all. LRM_X and RM_X are
 * one entry point. */
unsigned long tvxsim_calls(const char* entry_point, const char* wwpn);
void tvxsim_forget_calls(void);

/* Puts the clock of the counters forward, which moves with time otherwise. */
void tvxsim_advance(unsigned seconds);
/* Makes that clock show the seconds that it was put forward, and no time that passed; 0 lets time
 * count again. A new world starts with a clock that moves with time. */
void tvxsim_hold_clock(int held);

/* Changes the link of a port: an object with the members of a scenario's port that tell of its
 * link, such as {"state": "link down", "speed": "unknown"}. 0, or -1 if the port or the object is
 * wrong. */
int tvxsim_set_link(const char* wwpn, const char* json);

/* Calls the callbacks that were registered for events of the port, on this thread, and answers how
 * many there were; -1 for a malformed name. */
int tvxsim_post_event(const char* wwpn, unsigned type, unsigned fabric_port);

/* SNIA handles that are open at the moment. */
unsigned tvxsim_open_handles(void);

#ifdef __cplusplus
}
#endif

#endif
