// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
/* usage: race RUNS <COMMANDS
 *
 * Starts each command, a line of words between blanks, RUNS times in turn with the others. Prints a line for each: the
 * tenth percentile of its time from start to end in microseconds, its largest resident set in KiB, how often it failed. */
#define _GNU_SOURCE
#include <fcntl.h>
#include <spawn.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <time.h>

enum { mostCommands = 64, mostWords = 64 };

struct Command {
  char* words[mostWords];
  int64_t* nanoseconds;
  long largest;
  int failures;
};

static int64_t now(void) {
  struct timespec time;
  clock_gettime(CLOCK_MONOTONIC, &time);
  return (int64_t)time.tv_sec * 1000000000 + time.tv_nsec;
}

static void takeWords(struct Command* command, char* line) {
  int count = 0;
  for (char* word = strtok(line, " \n"); word && count < mostWords - 1; word = strtok(NULL, " \n"))
    command->words[count++] = strdup(word);
}

static void run(struct Command* command, int round, const posix_spawn_file_actions_t* actions) {
  extern char** environ;
  struct rusage used;
  pid_t process;
  int status;
  const int64_t start = now();
  if (posix_spawnp(&process, command->words[0], actions, NULL, command->words, environ) != 0) exit(2);
  if (wait4(process, &status, 0, &used) != process) exit(2);
  command->nanoseconds[round] = now() - start;
  if (used.ru_maxrss > command->largest) command->largest = used.ru_maxrss;
  if (status != 0) ++command->failures;
}

static int compare(const void* left, const void* right) {
  const int64_t first = *(const int64_t*)left;
  const int64_t second = *(const int64_t*)right;
  return (first > second) - (first < second);
}

int main(int argc, char** argv) {
  const int runs = argc == 2 ? atoi(argv[1]) : 0;
  if (runs < 1) return 2;
  static struct Command commands[mostCommands];
  int count = 0;
  char* line = NULL;
  size_t length = 0;
  while (count < mostCommands && getline(&line, &length, stdin) > 0) {
    takeWords(&commands[count], line);
    commands[count++].nanoseconds = calloc((size_t)runs, sizeof(int64_t));
  }
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 2, "/dev/null", O_WRONLY, 0);
  for (int round = 0; round < runs; ++round)
    for (int index = 0; index < count; ++index) run(&commands[index], round, &actions);
  for (int index = 0; index < count; ++index) {
    qsort(commands[index].nanoseconds, (size_t)runs, sizeof(int64_t), compare);
    printf("%.1f %ld %d\n", (double)commands[index].nanoseconds[runs / 10] / 1000, commands[index].largest,
           commands[index].failures);
  }
  return 0;
}
