#ifndef VORN_PLATFORM_QLIBC_PROC_H
#define VORN_PLATFORM_QLIBC_PROC_H

#ifdef __cplusplus
extern "C" {
#endif

/* Flags of QLIBCExecl. Bits not listed are accepted and ignored. */
enum {
    QLIBC_EXEC_WAIT = 0x01,      /* wait for the program and report its exit status */
    QLIBC_EXEC_NO_STDOUT = 0x02, /* standard output to /dev/null */
    QLIBC_EXEC_NO_STDERR = 0x08, /* standard error to /dev/null */
    QLIBC_EXEC_NO_STDIN = 0x10   /* standard input from /dev/null */
};

/* Every call below that waits for a program bounds the wait by a deadline (60 s unless
 * QLIBCExecSetTimeout set another): a program still running then is killed with its whole
 * process group (it starts in a group of its own), the kill is logged naming the program, and
 * the call fails. */

/* Runs program with the argument words that follow flags, ending in a null pointer. An absolute
 * program is resolved under the root prefix; a bare name is searched on PATH. The program runs
 * through posix_spawn, never a shell, with argv[0] the program as given. Arguments are passed as
 * they are (callers root the paths they pass).
 * With QLIBC_EXEC_WAIT: 0 when it exited with status 0, else -1. Without: 0 once started (the
 * child is reaped in the background), -1 when it could not start. */
int QLIBCExecl(const char* program, int flags, ...);
/* Runs program with up to four arguments (a null argument ends the list early) and waits.
 * 0 on exit status 0, else -1. */
int QLIBCExec(const char* program, const char* arg1, const char* arg2, const char* arg3,
              const char* arg4);
/* Runs a shell command line (its absolute programs resolved under the root) through /bin/sh and
 * waits. 0 on exit status 0, else -1. */
int QLIBCSystem(const char* commandLine);
/* Sets the deadline of every program run from now on, process-wide; 0 or less restores the
 * default of 60000 ms. */
void QLIBCExecSetTimeout(int milliseconds);

/* Writes the calling process's id and a line end to path (replaced atomically). 0 or -1. */
int QLIBCProcPidFileCreate(const char* path);
/* The process id in path: above 0 when the file holds one, 0 when it holds none, -1 when it
 * cannot be read. */
int QLIBCReadPidFile(const char* path);
/* 1 when a process with that id exists, 0 when not or pid is not above 0. */
int QLIBCProcAlive(int pid);
/* Sends signal to the process named in the pid file. 0 or -1. */
int QLIBCProcSignalByPidFile(const char* path, int signal);
/* Sends signal to every live process of this host running the program of exactly that file name
 * (the name in /proc/PID/comm, and for names of 15 characters or more the file name of argv[0]).
 * The number of processes signalled (0 when none), -1 on a bad name, an unreadable /proc or a
 * refused signal. */
int QLIBCProcKillByName(const char* name, int signal);

#ifdef __cplusplus
}
#endif

#endif
