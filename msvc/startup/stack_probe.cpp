// __chkstk, which the compiler calls before a function takes more than a page of stack: Windows
// grows a thread's stack one guard page at a time, so each page must be touched in order. Called
// with the size in eax; it touches the pages, moves esp down by the size and returns, as
// Microsoft's runtime does.
extern "C" __declspec(naked) void StackProbe() __asm__("__chkstk");
extern "C" __declspec(naked) void StackProbe() {
  __asm__ volatile(
      "pushl %ecx\n\t"
      "leal 8(%esp), %ecx\n\t"  // esp as the caller had it
      "cmpl $0x1000, %eax\n\t"
      "jb 2f\n"
      "1:\n\t"
      "subl $0x1000, %ecx\n\t"
      "testl %ecx, (%ecx)\n\t"
      "subl $0x1000, %eax\n\t"
      "cmpl $0x1000, %eax\n\t"
      "ja 1b\n"
      "2:\n\t"
      "subl %eax, %ecx\n\t"
      "testl %ecx, (%ecx)\n\t"
      "leal 4(%esp), %eax\n\t"  // where the return address is
      "movl %ecx, %esp\n\t"
      "movl -4(%eax), %ecx\n\t"
      "pushl (%eax)\n\t"
      "subl %esp, %eax\n\t"
      "ret");
}
