#ifndef VORN_PLATFORM_VORN_SCHEDULE_H
#define VORN_PLATFORM_VORN_SCHEDULE_H

#ifdef __cplusplus
extern "C" {
#endif

/* The platform scheduler: one line per command in root's crontab ("/var/spool/cron/crontabs/root"
 * under the root prefix), in the user-crontab form "minute hour day-of-month month day-of-week
 * command". The file is replaced whole (mode 0600); lines of other commands are kept. */

/* Runs command at minute (0-59) of every hour from hourBegin to hourEnd (0-23, inclusive) on the
 * days of dayMask (bit 0 Sunday ... bit 6 Saturday; 127 every day). Replaces the line of the same
 * command. A command that is empty, has surrounding blanks, a line break, carriage return or '%',
 * an empty or too wide mask and hours or minute out of range are refused and change nothing.
 * 0 or -1. */
int VORNScheduleSet(const char* command, int dayMask, int hourBegin, int hourEnd, int minute);
/* Deletes the line of command; 0 also when there is none. -1 on error. */
int VORNScheduleRemove(const char* command);

#ifdef __cplusplus
}
#endif

#endif
