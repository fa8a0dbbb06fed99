// The subcommands of qkimage. Each takes the arguments after its own name and
// returns the process exit status.
#ifndef QKIMAGE_COMMANDS_H
#define QKIMAGE_COMMANDS_H

int cmd_formats(int argc, char** argv);
int cmd_options(int argc, char** argv);
int cmd_convert(int argc, char** argv);
int cmd_rotate(int argc, char** argv);
int cmd_scale(int argc, char** argv);
int cmd_crop(int argc, char** argv);

#endif  // QKIMAGE_COMMANDS_H
